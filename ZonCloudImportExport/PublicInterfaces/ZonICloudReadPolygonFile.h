#pragma once
#include <memory>

#include "ZonCldExport.h"
#include "ZonMath.h"

// Readers whose files hold triangle meshes. Triangles are three zero-based
// vertex indices each.
class ZON_CLD_API ZonICloudReadPolygonFile {
public:
    virtual ~ZonICloudReadPolygonFile() = default;
    virtual void BeginGetPolygon() = 0;
    virtual bool NextPolygon() = 0;
    // Two yes/no queries of the mesh; every format read here answers false.
    virtual bool IsClosedPolygon() = 0;
    virtual bool IsOrientedPolygon() = 0;
    // The current polygon's vertices (x, y, z floats).
    virtual const float* GetPolygonPoints(unsigned& count) = 0;
    // The next triangle of the current polygon, or null at its end.
    virtual const unsigned* NextTriangle() = 0;
    // The next triangle of the last sub-box query, or null at its end.
    virtual const unsigned* NextTriangleInBox() = 0;
    virtual const unsigned* GetTriangles(unsigned& count) = 0;
    // The triangles whose three vertices lie in the box, renumbered into the
    // vertices inside it (given back through vertices / vertexCount).
    virtual const unsigned* GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                              unsigned& vertexCount) = 0;
    // The number of triangles, for statistics. A reader that knows it from its
    // analysis answers without reading the mesh; by default the mesh is read.
    virtual unsigned GetNumberOfTriangles()
    {
        unsigned count = 0;
        GetTriangles(count);
        return count;
    }
};
using ZonICloudReadPolygonFile_var = std::shared_ptr<ZonICloudReadPolygonFile>;
