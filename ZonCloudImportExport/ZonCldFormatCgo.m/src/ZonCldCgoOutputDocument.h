#pragma once
#include <cstdint>
#include <cstdio>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonIExchOutputDocument.h"

// Writes the points of an exchange document as a Cgo file (registered as
// "CLD_Cgo_OutputDocument"): a placeholder line of twelve blanks, one "x y z"
// line per point, placed by its representation's transformation and
// multiplied by the export scale factor (unless that is 0), then
// "**end cloud**"; closing puts the number of points, left-aligned, over the
// placeholder, so the line keeps its length.
class ZON_CLD_API ZonCldCgoOutputDocument : public ZonBaseUnknown, public ZonIExchOutputDocument {
public:
    ZonCldCgoOutputDocument() = default;
    ~ZonCldCgoOutputDocument() override;
    ZonCldCgoOutputDocument(const ZonCldCgoOutputDocument&) = delete;
    ZonCldCgoOutputDocument& operator=(const ZonCldCgoOutputDocument&) = delete;

    ZonHResult SetFileName(const ZonUnicodeString& fileName) override;
    // "Scaling" (the export scale factor, "C" notation) and "Precision"
    // ("precDouble" reads double-precision representations in double).
    ZonHResult SetOptions(const ZonListValZonString& names, const ZonListValZonString& values) override;
    ZonHResult Open() override;
    ZonHResult Write(const ZonIExchInputDocument_var& document) override;
    ZonHResult Close() override;
    // Reports "ERR_FILESUCCESSFULL", or "ERR_NoActivePoints" when no point was written.
    ZonHResult Release() override;

    std::uint64_t GetPointsWritten() const { return _written; }

private:
    void CloseStream();

    ZonUnicodeString _fileName;
    std::FILE* _stream = nullptr;
    double _scale = 1.0;
    bool _readDouble = false;
    std::uint64_t _count = 0;    // points of the file being written
    std::uint64_t _written = 0;  // points written since creation
};
