#pragma once
#include "ZonCldExport.h"

// Whether the importer creates a mesh's triangles or only its vertices. The
// reader only stores the flag (its factory sets it from the format's setting);
// the import entry reads it and tells the host engine.
class ZON_CLD_API ZonICloudReadOptTriangles {
public:
    virtual ~ZonICloudReadOptTriangles() = default;
    virtual void SetTriangles(bool create) = 0;
    virtual void GetTriangles(bool& create) = 0;
};
