#pragma once
#include "ZonCldExport.h"

// Whether the importer computes a mesh's free edges. The reader only stores
// the flag (its factory sets it from the format's setting).
class ZON_CLD_API ZonICloudReadOptFreeEdges {
public:
    virtual ~ZonICloudReadOptFreeEdges() = default;
    virtual void SetFreeEdges(bool create) = 0;
    virtual void GetFreeEdges(bool& create) = 0;
};
