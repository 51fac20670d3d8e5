#pragma once
#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudPolygonCursor.h"
#include "ZonMath.h"

// The part of a mesh inside a query box: the triangles whose three vertices
// are inside (by the box queries' inclusion rule), renumbered into the
// vertices inside, which keep their order. The last box and its answer are
// kept, so asking again for the same box costs nothing.
class ZON_CLD_API ZonCloudSubMesh {
public:
    bool IsFor(const ZonMathBox& box) const { return _valid && box.IsSameAs(_box); }
    void Clear() { *this = ZonCloudSubMesh(); }

    // `fileBox` is the mesh's own box (its upper faces are closed). With
    // `valid`, one byte per vertex, a vertex whose byte is 0 (a void sample of
    // a height grid) is never inside. An allocation failure leaves the
    // sub-mesh empty and raises std::bad_alloc.
    void Compute(const ZonMathBox& box, const ZonMathBox& fileBox, const float* vertices, std::size_t vertexCount,
                 const std::uint32_t* triangles, std::size_t triangleCount, const unsigned char* valid = nullptr);
    void Compute(const ZonMathBox& box, const ZonMathBox& fileBox, const double* vertices, std::size_t vertexCount,
                 const std::uint32_t* triangles, std::size_t triangleCount, const unsigned char* valid = nullptr);

    const std::vector<float>& Vertices() const { return _vertices; }
    const std::vector<std::uint32_t>& Triangles() const { return _triangles; }
    unsigned VertexCount() const { return static_cast<unsigned>(_vertices.size() / 3); }
    unsigned TriangleCount() const { return static_cast<unsigned>(_triangles.size() / 3); }

    // The answer of a mesh reader's GetTrianglesInBox: this sub-mesh, whose
    // triangles the cursor then walks one by one.
    const unsigned* Answer(ZonCloudPolygonCursor& cursor, unsigned& count, const float*& vertices,
                           unsigned& vertexCount) const
    {
        return Give(cursor, count, vertices, vertexCount, _vertices.data(), VertexCount(), _triangles.data(),
                    TriangleCount());
    }
    // The same answer for a query with the file's own box: the whole mesh, no copy.
    static const unsigned* Give(ZonCloudPolygonCursor& cursor, unsigned& count, const float*& vertices,
                                unsigned& vertexCount, const float* meshVertices, std::size_t meshVertexCount,
                                const std::uint32_t* triangles, std::size_t triangleCount)
    {
        vertices = meshVertices;
        vertexCount = static_cast<unsigned>(meshVertexCount);
        cursor.SetBoxTriangles(triangles, triangleCount);
        count = static_cast<unsigned>(triangleCount);
        return triangles;
    }

private:
    template <class T>
    void Build(const ZonMathBox& box, const ZonMathBox& fileBox, const T* vertices, std::size_t vertexCount,
               const std::uint32_t* triangles, std::size_t triangleCount, const unsigned char* valid);

    ZonMathBox _box;
    bool _valid = false;
    std::vector<float> _vertices;
    std::vector<std::uint32_t> _triangles;
};
