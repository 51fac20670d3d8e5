#pragma once
#include <cstdint>
#include <cstdio>

#include "ZonBaseUnknown.h"
#include "ZonCldExport.h"
#include "ZonIExchOutputDocument.h"

// Writes the points of an exchange document as an RGB point file
// (registered as "CLD_AsciiRGB_OutputDocument"): one line per point, placed
// by its representation's transformation and multiplied by the export scale
// factor (unless that is 0); "x y z" for points without colour, "x y z R G B "
// with the point's own colour or its representation's one.
class ZON_CLD_API ZonCldLeicaOutputDocument : public ZonBaseUnknown, public ZonIExchOutputDocument {
public:
    ZonCldLeicaOutputDocument() = default;
    ~ZonCldLeicaOutputDocument() override;
    ZonCldLeicaOutputDocument(const ZonCldLeicaOutputDocument&) = delete;
    ZonCldLeicaOutputDocument& operator=(const ZonCldLeicaOutputDocument&) = delete;

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
    std::uint64_t _written = 0;
};
