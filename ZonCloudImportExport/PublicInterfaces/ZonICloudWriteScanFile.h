#pragma once
#include <memory>

#include "ZonCldExport.h"

// Writers of scans: announce the count of scans, give each scan's points
// (x, y, z triples), end.
class ZON_CLD_API ZonICloudWriteScanFile {
public:
    virtual ~ZonICloudWriteScanFile();
    virtual void BeginWriteScans(const unsigned& count) = 0;
    virtual void WriteScan(const float* points, const unsigned& count) = 0;
    virtual void WriteScanDouble(const double* points, const unsigned& count) = 0;
    virtual void EndWriteScans() = 0;
};
using ZonICloudWriteScanFile_var = std::shared_ptr<ZonICloudWriteScanFile>;
