#pragma once
#include <cstddef>
#include <cstdint>

#include "ZonCldExport.h"

// Where a mesh reader stands in the polygon protocol: BeginGetPolygon, one
// NextPolygon per polygon, then its triangles one by one, and the triangles of
// the last sub-box query one by one.
class ZON_CLD_API ZonCloudPolygonCursor {
public:
    // BeginGetPolygon: the walk starts again before the first of `polygons`.
    void Begin(std::size_t polygons = 1)
    {
        _begun = true;
        _polygons = polygons;
        _next = 0;
        _triangle = 0;
    }
    void Reset() { *this = ZonCloudPolygonCursor(); }
    // Whether NextPolygon has a polygon to give; raises the usage error
    // "ERR_BeginGetPolygonNotDone" before Begin.
    bool HasNext() const;
    // Moves to the next polygon (after HasNext said yes).
    void Advance()
    {
        ++_next;
        _triangle = 0;
    }
    // Index of the current polygon (the one the last Advance moved to).
    std::size_t Current() const { return _next == 0 ? 0 : _next - 1; }

    // The next of `count` triangles (three indices each), null past the last.
    const unsigned* NextTriangle(const std::uint32_t* triangles, std::size_t count)
    {
        if (!triangles || _triangle >= count) return nullptr;
        return triangles + 3 * _triangle++;
    }
    // The triangles of a sub-box query, walked by NextTriangleInBox.
    void SetBoxTriangles(const std::uint32_t* triangles, std::size_t count)
    {
        _box = triangles;
        _boxCount = count;
        _boxNext = 0;
    }
    const unsigned* NextTriangleInBox()
    {
        if (!_box || _boxNext >= _boxCount) return nullptr;
        return _box + 3 * _boxNext++;
    }

private:
    bool _begun = false;
    std::size_t _polygons = 0;
    std::size_t _next = 0;
    std::size_t _triangle = 0;
    const std::uint32_t* _box = nullptr;
    std::size_t _boxCount = 0;
    std::size_t _boxNext = 0;
};
