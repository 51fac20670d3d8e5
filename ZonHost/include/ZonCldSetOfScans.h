#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldScan.h"
#include "ZonHostExport.h"

// The scans of one pass of the sensor, in file order.
class ZON_HOST_API ZonCldSetOfScans : public ZonBaseUnknown {
public:
    void AddScan(ZonCldScan_var scan) { _scans.push_back(std::move(scan)); }
    const std::vector<ZonCldScan_var>& GetScans() const { return _scans; }
    std::size_t GetNumberOfScans() const { return _scans.size(); }
    std::size_t GetNumberOfPoints() const;

private:
    std::vector<ZonCldScan_var> _scans;
};
using ZonCldSetOfScans_var = std::shared_ptr<ZonCldSetOfScans>;
