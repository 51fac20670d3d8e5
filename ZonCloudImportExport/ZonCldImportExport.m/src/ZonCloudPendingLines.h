#pragma once
#include <cstddef>
#include <functional>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonCloudTextBuffer.h"

// Records of numbers (a placed point and its colour, a facet) that output
// documents gather as they walk a document, and whose text is written later:
// once enough are pending, they are formatted in blocks on the worker pool
// and written in order. Whatever else the document writes must come after a
// Flush, so the file is the same as record by record.
class ZON_CLD_API ZonCloudPendingLines {
public:
    // Appends the text of one record; runs on worker threads.
    using Format = std::function<void(ZonCloudTextBuffer& text, const double* record)>;

    ZonCloudPendingLines(std::size_t recordSize, Format format);

    // Room for the next record, to be filled at once; a full batch is
    // written to file first.
    double* Add(ZonCloudOutputFile& file);
    // Writes every pending record.
    void Flush(ZonCloudOutputFile& file);
    // Drops the pending records (the file is gone or abandoned).
    void Discard() { _records.clear(); }

private:
    std::size_t _recordSize;
    Format _format;
    std::vector<double> _records;
};
