#pragma once
#include <cstdint>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonCloudOutputFile.h"
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
    // One point, placed and scaled; rgb is null for a point without colour.
    virtual void WritePoint(double x, double y, double z, const unsigned char* rgb) = 0;
    // What comes after the points, the file still open.
    virtual void EndFile() {}

    ZonCloudOutputFile _output;

private:
    ZonUnicodeString _fileName;
    double _scale = 1.0;
    bool _readDouble = false;
    std::uint64_t _written = 0;  // points written since creation
};
