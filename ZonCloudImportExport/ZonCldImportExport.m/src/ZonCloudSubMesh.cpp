#include "ZonCloudSubMesh.h"

#include <limits>
#include <new>

#include "ZonCloudReadFile.h"

void ZonCloudSubMesh::Compute(const ZonMathBox& box, const ZonMathBox& fileBox, const float* vertices,
                              std::size_t vertexCount, const std::uint32_t* triangles, std::size_t triangleCount,
                              const unsigned char* valid)
{
    Build(box, fileBox, vertices, vertexCount, triangles, triangleCount, valid);
}

void ZonCloudSubMesh::Compute(const ZonMathBox& box, const ZonMathBox& fileBox, const double* vertices,
                              std::size_t vertexCount, const std::uint32_t* triangles, std::size_t triangleCount,
                              const unsigned char* valid)
{
    Build(box, fileBox, vertices, vertexCount, triangles, triangleCount, valid);
}

template <class T>
void ZonCloudSubMesh::Build(const ZonMathBox& box, const ZonMathBox& fileBox, const T* vertices,
                            std::size_t vertexCount, const std::uint32_t* triangles, std::size_t triangleCount,
                            const unsigned char* valid)
{
    Clear();
    _box = box;
    _valid = true;
    if (!box.Intersects(fileBox, 0.0)) return;
    constexpr std::uint32_t outside = std::numeric_limits<std::uint32_t>::max();
    try {
        std::vector<std::uint32_t> renumbered(vertexCount, outside);
        std::uint32_t inside = 0;
        for (std::size_t i = 0; i < vertexCount; ++i) {
            const T* v = vertices + 3 * i;
            if (valid && !valid[i]) continue;
            if (!ZonCloudReadFile::IsInQueryBox(v[0], v[1], v[2], box, fileBox)) continue;
            renumbered[i] = inside++;
            _vertices.insert(_vertices.end(),
                             {static_cast<float>(v[0]), static_cast<float>(v[1]), static_cast<float>(v[2])});
        }
        for (std::size_t t = 0; t < triangleCount; ++t) {
            const std::uint32_t* corner = triangles + 3 * t;
            const std::uint32_t a = renumbered[corner[0]];
            const std::uint32_t b = renumbered[corner[1]];
            const std::uint32_t c = renumbered[corner[2]];
            if (a == outside || b == outside || c == outside) continue;
            _triangles.insert(_triangles.end(), {a, b, c});
        }
    } catch (const std::bad_alloc&) {
        Clear();
        throw;
    }
}
