#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonMath.h"

// Readers whose files hold sets of scans.
class ZON_CLD_API ZonICloudReadScanFile {
public:
    virtual ~ZonICloudReadScanFile() = default;
    virtual void BeginGetSetOfScans() = 0;
    virtual bool NextSetOfScans() = 0;
    virtual void BeginGetScan() = 0;
    virtual bool NextScan() = 0;
    virtual const float* GetScanPoints(unsigned& count) = 0;
    virtual const double* GetScanPointsDouble(unsigned& count) = 0;
    virtual const float* GetScanPointsInBox(const ZonMathBox& box, unsigned& count) = 0;
    virtual const double* GetScanPointsInBoxDouble(const ZonMathBox& box, unsigned& count) = 0;
};
using ZonICloudReadScanFile_var = std::shared_ptr<ZonICloudReadScanFile>;
