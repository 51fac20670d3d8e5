#pragma once
#include <cstdint>

#include "ZonCloudWriteFile.h"
#include "ZonICloudWritePointFile.h"

// Writes RGB point files: the number of points on the first line, then one
// "x y z R G B" line per point, which the RGB point reader reads back with
// its colours. Points given without a colour are written white. In
// multi-part mode the clouds follow each other without count lines.
class ZON_CLD_API ZonCloudWriteLeica : public ZonCloudWriteFile, public ZonICloudWritePointFile {
public:
    explicit ZonCloudWriteLeica(const ZonUnicodeString& fileName);

    // ZonICloudWritePointFile
    void BeginWritePoints(const unsigned& count) override;
    void WritePoint(const float xyz[3]) override;
    void WritePointDouble(const double xyz[3]) override;
    void WritePointColor(const float xyz[3], const unsigned char rgb[3]) override;
    void WritePointColorDouble(const double xyz[3], const unsigned char rgb[3]) override;
    void EndWritePoints() override;

private:
    void PointLine(double x, double y, double z, const unsigned char rgb[3]);

    std::uint64_t _expected = 0;  // points still to come
};
