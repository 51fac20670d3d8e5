// Any bytes as a GoCad file end in a mesh or a catalog error: triangles index
// the vertices, the surfaces cover the triangles in order, labels match the
// vertices, and a box query inside the mesh's own box keeps its promises.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadGoCad.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, bool doublePrecision)
{
    ZonCloudReadGoCad reader{ZonUnicodeString("fuzz.ts")};
    reader.SetSourceMemory(data, size);
    reader.SetDoublePrecision(doublePrecision);
    try {
        reader.BeginGetPolygon();
        Check(reader.NextPolygon());
        unsigned nv = 0, nt = 0, nd = 0;
        reader.GetPolygonPoints(nv);
        const unsigned* triangles = reader.GetTriangles(nt);
        Check(nt > 0 && nt == reader.GetNumberOfTriangles());
        for (unsigned i = 0; i < 3 * nt; ++i) Check(triangles[i] < nv);
        reader.GetPointsDouble(nd);
        Check(nd == nv);
        unsigned end = 0;
        for (const ZonCloudPolygonPart& part : reader.GetPolygonParts()) {
            Check(part.end >= end && part.end <= nt);
            end = part.end;
        }
        Check(end == nt);
        const auto& labels = reader.GetVertexLabels();
        Check(labels.empty() || labels.size() == nv);

        ZonMathBox box;
        reader.GetBoundingBox(box);
        if (box.IsEmpty()) return;
        const ZonMathPoint &low = box.GetLow(), &high = box.GetHigh();
        const ZonMathBox half(low[0], (low[0] + high[0]) / 2, low[1], high[1], low[2], high[2]);
        unsigned count = 0, inside = 0, walked = 0;
        const float* vertices = nullptr;
        const unsigned* kept = reader.GetTrianglesInBox(half, count, vertices, inside);
        Check(count <= nt && inside <= nv);
        for (unsigned i = 0; i < 3 * count; ++i) Check(kept[i] < inside);
        while (reader.NextTriangleInBox()) ++walked;
        Check(walked == count);
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    for (bool doublePrecision : {false, true}) ReadAll(data, size, doublePrecision);
    return 0;
}
