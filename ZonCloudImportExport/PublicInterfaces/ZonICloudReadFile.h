#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonICkeUnit.h"
#include "ZonMath.h"
#include "ZonUnicodeString.h"

// What a file holds, as the analysis finds it. The interfaces carry it as an
// int and callers store it, so the values never change.
enum DigitizationType : int {
    DigitizationUnknown = 0,
    DigitizationCloud = 1,
    DigitizationScans = 2,
    DigitizationGrids = 3,
    DigitizationPolygons = 4,
};

// Every reader: the whole file as one cloud of points.
class ZON_CLD_API ZonICloudReadFile {
public:
    virtual ~ZonICloudReadFile() = default;
    virtual void GetFileName(ZonUnicodeString& name) = 0;
    virtual void SetSamplingPercent(float percent) = 0;
    virtual float GetSamplingPercent() = 0;
    virtual int GetNumberOfPoints() = 0;
    virtual const float* GetPoints(unsigned& count) = 0;
    virtual const double* GetPointsDouble(unsigned& count) = 0;
    virtual void SetDoublePrecision(bool on) = 0;
    virtual bool IsDoublePrecision() = 0;
    // R, G, B per point, 0 to 255.
    virtual const unsigned char* GetPointColors(unsigned& count) = 0;
    // Format-specific per-point arrays, one entry per point of GetPoints when
    // given. The importer reads them as: 1 alpha, 2 symbol index (one
    // std::int32_t per point each), 3 text (one std::string per point).
    virtual const void* GetPointAttributes1(unsigned& count) = 0;
    virtual const void* GetPointAttributes2(unsigned& count) = 0;
    virtual const void* GetPointAttributes3(unsigned& count) = 0;
    virtual void GetBoundingBox(ZonMathBox& box) = 0;
    virtual const float* GetPointsInBox(const ZonMathBox& box, unsigned& count) = 0;
    virtual const double* GetPointsInBoxDouble(const ZonMathBox& box, unsigned& count) = 0;
    virtual int GetTypeOfDigitization() = 0;
    virtual bool IsTypeOfDigitization(int type) = 0;
    virtual ZonICkeUnit_var GetLengthUnit() = 0;
    virtual bool HasDoublePrecision() = 0;
};
using ZonICloudReadFile_var = std::shared_ptr<ZonICloudReadFile>;
