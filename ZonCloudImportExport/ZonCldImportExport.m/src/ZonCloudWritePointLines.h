#pragma once
#include "ZonCloudWriteFile.h"
#include "ZonICloudWritePointFile.h"

// Base of the writers that put one point per line: the four ways of handing
// a point (single or double, with or without a colour) come to one line
// writer, with a null colour for a point given without one.
class ZON_CLD_API ZonCloudWritePointLines : public ZonCloudWriteFile, public ZonICloudWritePointFile {
public:
    using ZonCloudWriteFile::ZonCloudWriteFile;

    // ZonICloudWritePointFile
    void WritePoint(const float xyz[3]) final { WritePointLine(xyz[0], xyz[1], xyz[2], nullptr); }
    void WritePointDouble(const double xyz[3]) final { WritePointLine(xyz[0], xyz[1], xyz[2], nullptr); }
    void WritePointColor(const float xyz[3], const unsigned char rgb[3]) final
    {
        WritePointLine(xyz[0], xyz[1], xyz[2], rgb);
    }
    void WritePointColorDouble(const double xyz[3], const unsigned char rgb[3]) final
    {
        WritePointLine(xyz[0], xyz[1], xyz[2], rgb);
    }

protected:
    // One point; `rgb` is null when the point came without a colour.
    virtual void WritePointLine(double x, double y, double z, const unsigned char* rgb) = 0;
};
