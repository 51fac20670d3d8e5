#pragma once
#include <cstdint>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
#include "ZonCloudPendingLines.h"
#include "ZonCloudTextBuffer.h"
#include "ZonIExchOutputDocument.h"

// Base of the output documents that write the points of an exchange document
// as a text file, one line per point: each point is placed by its
// representation's transformation and multiplied by the export scale factor
// (unless that is 0). A format writes its own lines and what comes before and
// after them. A write or close that fails removes the file and raises the
// system's error; the document then reports no outcome.
class ZON_CLD_API ZonCldPointOutputDocument : public ZonBaseUnknown, public ZonIExchOutputDocument {
public:
    ~ZonCldPointOutputDocument() override = default;
    ZonCldPointOutputDocument(const ZonCldPointOutputDocument&) = delete;
    ZonCldPointOutputDocument& operator=(const ZonCldPointOutputDocument&) = delete;

    ZonHResult SetFileName(const ZonUnicodeString& fileName) override;
    // "Scaling" (the export scale factor, "C" notation) and "Precision"
    // ("precDouble" reads double-precision representations in double).
    ZonHResult SetOptions(const ZonListValZonString& names, const ZonListValZonString& values) override;
    ZonHResult Open() override;
    ZonHResult Write(const ZonIExchInputDocument_var& document) override;
    ZonHResult Close() override;
    // Reports "ERR_FILESUCCESSFULL", or "ERR_NoActivePoints" when no point
    // was written; a file lost to a failed write reports nothing and fails.
    ZonHResult Release() override;

    std::uint64_t GetPointsWritten() const { return _written; }

protected:
    ZonCldPointOutputDocument() = default;

    // What comes before the points of a new file.
    virtual void BeginFile() {}
    // Appends one point's line, placed and scaled; rgb is null for a point
    // without colour. Lines are formatted in blocks on worker threads: this
    // only reads the document.
    virtual void FormatPoint(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb) const = 0;
    // What comes after the points, the file still open and every line written.
    virtual void EndFile() {}
    // Points written into the file being written.
    std::uint64_t PointsInFile() const { return _inFile; }

    ZonCloudOutputFile _output;

private:
    ZonCloudPendingLines _pending{7, [this](ZonCloudTextBuffer& out, const double* r) {
                                      const unsigned char rgb[3] = {static_cast<unsigned char>(r[4]),
                                                                    static_cast<unsigned char>(r[5]),
                                                                    static_cast<unsigned char>(r[6])};
                                      FormatPoint(out, r, r[3] != 0 ? rgb : nullptr);
                                  }};
    ZonUnicodeString _fileName;
    double _scale = 1.0;
    bool _readDouble = false;
    std::uint64_t _written = 0;  // points written since creation
    std::uint64_t _inFile = 0;   // points written since the file was opened
};
