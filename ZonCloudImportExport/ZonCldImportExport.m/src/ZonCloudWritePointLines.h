#pragma once
#include <cstddef>
#include <cstdint>

#include "ZonCloudTextBuffer.h"
#include "ZonCloudWriteFile.h"
#include "ZonICloudWritePointFile.h"

// Base of the writers that put one point per line. The four ways of handing
// a point (single or double, with or without a colour) and whole arrays of
// points come to one line formatter, with a null colour for a point given
// without one. Large arrays are formatted in blocks on the worker pool and
// written in order, so the file is the same as point by point.
class ZON_CLD_API ZonCloudWritePointLines : public ZonCloudWriteFile, public ZonICloudWritePointFile {
public:
    using ZonCloudWriteFile::ZonCloudWriteFile;

    // `count` points of three coordinates in single or double precision,
    // with a colour each or none, and a validity byte each or none (points
    // whose byte is 0 are skipped). defaultRgb is the colour of the points
    // given without one (null: none).
    struct Run {
        const float* single = nullptr;
        const double* dual = nullptr;
        const unsigned char* rgb = nullptr;
        const unsigned char* valid = nullptr;
        std::size_t count = 0;
        const unsigned char* defaultRgb = nullptr;
    };

    // ZonICloudWritePointFile
    void WritePoint(const float xyz[3]) final { WritePoints({xyz, nullptr, nullptr, nullptr, 1}); }
    void WritePointDouble(const double xyz[3]) final { WritePoints({nullptr, xyz, nullptr, nullptr, 1}); }
    void WritePointColor(const float xyz[3], const unsigned char rgb[3]) final
    {
        WritePoints({xyz, nullptr, rgb, nullptr, 1});
    }
    void WritePointColorDouble(const double xyz[3], const unsigned char rgb[3]) final
    {
        WritePoints({nullptr, xyz, rgb, nullptr, 1});
    }

    // The valid points of the run, as WritePoint* would write them one by one.
    void WritePoints(const Run& run);

protected:
    // Checks that `lines` more point lines may be written now (raising as
    // the format does otherwise), counts them as written, and returns the
    // number of the first; each further line has the next number.
    virtual std::uint64_t TakeLines(std::uint64_t lines) = 0;
    // Appends one point's line. Called on worker threads while the writer
    // waits: it only reads the writer.
    virtual void FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                            std::uint64_t number) const = 0;
    // Writes the run's lines, numbered from `first`, without taking them
    // (for formats that frame arrays of points themselves, as scans).
    void WriteLines(const Run& run, std::uint64_t first);
};
