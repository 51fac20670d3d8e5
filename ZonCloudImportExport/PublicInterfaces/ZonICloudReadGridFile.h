#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonMath.h"

// Readers whose files hold regular grids; each point has a validity byte (1 valid, 0 hole).
class ZON_CLD_API ZonICloudReadGridFile {
public:
    virtual ~ZonICloudReadGridFile() = default;
    virtual void BeginGetGrid() = 0;
    virtual bool NextGrid() = 0;
    virtual void BeginGetGridPoints() = 0;
    virtual const float* GetGridPoints(unsigned& count, const unsigned char*& valid) = 0;
    virtual const double* GetGridPointsDouble(unsigned& count, const unsigned char*& valid) = 0;
    virtual const float* GetGridPointsInBox(const ZonMathBox& box, unsigned& count, const unsigned char*& valid) = 0;
    virtual const double* GetGridPointsInBoxDouble(const ZonMathBox& box, unsigned& count,
                                                   const unsigned char*& valid) = 0;
};
using ZonICloudReadGridFile_var = std::shared_ptr<ZonICloudReadGridFile>;
