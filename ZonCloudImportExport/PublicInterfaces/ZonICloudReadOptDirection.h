#pragma once
#include "ZonCldExport.h"

// Scan direction: 0 unknown, 1 one way, 2 zigzag. Stored for the caller only.
class ZON_CLD_API ZonICloudReadOptDirection {
public:
    virtual ~ZonICloudReadOptDirection() = default;
    virtual void SetScanDirection(int direction) = 0;
    virtual void GetScanDirection(int& direction) = 0;
};
