#pragma once
#include "ZonCldExport.h"

// Minimum point quality of the scanners that grade each point: a point is
// kept when its quality is strictly greater. Changing it makes the reader
// count its points again.
class ZON_CLD_API ZonICloudReadOptQuality {
public:
    virtual ~ZonICloudReadOptQuality() = default;
    virtual void SetMinPointQuality(float quality) = 0;
    virtual void GetMinPointQuality(float& quality) = 0;
    // The least and greatest quality found in the file (runs the analysis).
    virtual void GetQualityRange(double& least, double& greatest) = 0;
};
