#pragma once
#include "ZonBaseUnknown.h"
#include "ZonCldPointArray.h"
#include "ZonHostExport.h"

// One scan: an ordered line of points, as the sensor took them.
class ZON_HOST_API ZonCldScan : public ZonBaseUnknown {
public:
    ~ZonCldScan() override;

    ZonCldPointArray& Points() { return _points; }
    const ZonCldPointArray& Points() const { return _points; }
    std::size_t GetNumberOfPoints() const { return _points.GetNumberOfPoints(); }

private:
    ZonCldPointArray _points;
};
using ZonCldScan_var = std::shared_ptr<ZonCldScan>;
