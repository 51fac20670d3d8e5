#pragma once
#include <memory>

#include "ZonCldExport.h"

// Writers of triangle meshes: announce a number of triangles, then give each
// triangle as its three vertices (x, y, z each). Announcements may repeat;
// the file then holds the sum.
class ZON_CLD_API ZonICloudWritePolygonFile {
public:
    virtual ~ZonICloudWritePolygonFile();
    virtual void BeginWriteTriangles(const unsigned& count) = 0;
    virtual void WriteTriangle(const float vertices[9]) = 0;
    virtual void EndWriteTriangles() = 0;
};
using ZonICloudWritePolygonFile_var = std::shared_ptr<ZonICloudWritePolygonFile>;
