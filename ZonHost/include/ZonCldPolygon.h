#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldPointArray.h"
#include "ZonHostExport.h"

// A triangle mesh: vertices, and three zero-based vertex indices per
// triangle. A mesh imported without its triangles keeps only its vertices.
class ZON_HOST_API ZonCldPolygon : public ZonBaseUnknown {
public:
    ~ZonCldPolygon() override;

    ZonCldPointArray& Vertices() { return _vertices; }
    const ZonCldPointArray& Vertices() const { return _vertices; }
    std::vector<unsigned>& Triangles() { return _triangles; }
    const std::vector<unsigned>& Triangles() const { return _triangles; }
    std::size_t GetNumberOfVertices() const { return _vertices.GetNumberOfPoints(); }
    std::size_t GetNumberOfTriangles() const { return _triangles.size() / 3; }

private:
    ZonCldPointArray _vertices;
    std::vector<unsigned> _triangles;
};
using ZonCldPolygon_var = std::shared_ptr<ZonCldPolygon>;
