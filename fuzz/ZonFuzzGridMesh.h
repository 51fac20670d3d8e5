// The check shared by the height-grid fuzz targets: the reader, fed from
// memory, ends in a mesh whose triangles index its points, or in a catalog
// error. The mesh is also asked in double precision, for its texts and for
// the part in a box inside its own.
#pragma once
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonError.h"

inline void ZonFuzzCheck(bool condition)
{
    if (!condition) std::abort();
}

template <class Reader>
void ZonFuzzGridMesh(const std::uint8_t* data, std::size_t size, const char* name)
{
    Reader reader{ZonUnicodeString(name)};
    reader.SetSourceMemory(data, size);
    try {
        reader.BeginGetPolygon();
        ZonFuzzCheck(reader.NextPolygon());
        unsigned nv = 0, nt = 0, nd = 0, texts = 0;
        reader.GetPolygonPoints(nv);
        const unsigned* triangles = reader.GetTriangles(nt);
        ZonFuzzCheck(nv > 0 && nt == reader.GetNumberOfTriangles());
        for (unsigned i = 0; i < 3 * nt; ++i) ZonFuzzCheck(triangles[i] < nv);
        reader.GetPointsDouble(nd);
        ZonFuzzCheck(nd == nv);
        if (reader.GetPointAttributes3(texts)) ZonFuzzCheck(texts == nv);

        ZonMathBox box;
        reader.GetBoundingBox(box);
        if (box.IsEmpty()) return;
        const ZonMathPoint &low = box.GetLow(), &high = box.GetHigh();
        const ZonMathBox half(low[0], (low[0] + high[0]) / 2, low[1], high[1], low[2], high[2]);
        unsigned count = 0, inside = 0, walked = 0;
        const float* vertices = nullptr;
        const unsigned* kept = reader.GetTrianglesInBox(half, count, vertices, inside);
        ZonFuzzCheck(count <= nt && inside <= nv);
        for (unsigned i = 0; i < 3 * count; ++i) ZonFuzzCheck(kept[i] < inside);
        while (reader.NextTriangleInBox()) ++walked;
        ZonFuzzCheck(walked == count);
    } catch (const ZonError& error) {
        ZonFuzzCheck(!error.GetMessageKey().empty());
    }
}
