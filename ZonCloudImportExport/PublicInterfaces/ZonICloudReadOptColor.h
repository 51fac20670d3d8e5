#pragma once
#include "ZonCldExport.h"

// Whether the colours a file gives its points are kept. A reader discards
// what it has loaded when the choice changes, so the next access reloads.
class ZON_CLD_API ZonICloudReadOptColor {
public:
    virtual ~ZonICloudReadOptColor() = default;
    virtual void SetKeepColors(bool keep) = 0;
    virtual bool GetKeepColors() = 0;
};
