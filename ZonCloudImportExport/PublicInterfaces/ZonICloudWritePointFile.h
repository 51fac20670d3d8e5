#pragma once
#include <memory>

#include "ZonCldExport.h"

// Writers of clouds: announce the count, give exactly that many points, end.
class ZON_CLD_API ZonICloudWritePointFile {
public:
    virtual ~ZonICloudWritePointFile();
    virtual void BeginWritePoints(const unsigned& count) = 0;
    virtual void WritePoint(const float xyz[3]) = 0;
    virtual void WritePointDouble(const double xyz[3]) = 0;
    // The same with the point's colour (R, G, B, 0 to 255); writers of
    // formats without colours write the point alone.
    virtual void WritePointColor(const float xyz[3], const unsigned char rgb[3]) = 0;
    virtual void WritePointColorDouble(const double xyz[3], const unsigned char rgb[3]) = 0;
    virtual void EndWritePoints() = 0;
};
using ZonICloudWritePointFile_var = std::shared_ptr<ZonICloudWritePointFile>;
