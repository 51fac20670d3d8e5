// Any bytes as an STL file end in a mesh or a catalog error. The mesh is read
// in single and double precision and queried in a box inside its own.
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>

#include "ZonCloudReadStl.h"
#include "ZonError.h"

namespace {

// A plain array, still there when the exit handler removes the file.
char gPath[64];

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(bool doublePrecision)
{
    ZonCloudReadStl reader{ZonUnicodeString(gPath)};
    reader.SetDoublePrecision(doublePrecision);
    try {
        reader.BeginGetPolygon();
        Check(reader.NextPolygon());
        unsigned nv = 0, nt = 0, nd = 0;
        reader.GetPolygonPoints(nv);
        const unsigned* triangles = reader.GetTriangles(nt);
        Check(nt > 0 && nt == reader.GetNumberOfTriangles());
        for (unsigned i = 0; i < 3 * nt; ++i) Check(triangles[i] < nv);
        if (doublePrecision) {
            reader.GetPointsDouble(nd);
            Check(nd == nv);
        }

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
    if (!gPath[0]) {
        std::snprintf(gPath, sizeof gPath, "/tmp/fuzz_stl_%d.stl", static_cast<int>(getpid()));
        std::atexit([] { std::remove(gPath); });
    }
    // The stream is closed at the end of the condition, before the file is read.
    if (!std::ofstream(gPath, std::ios::binary).write(reinterpret_cast<const char*>(data), std::streamsize(size)))
        return 0;
    for (bool doublePrecision : {false, true}) ReadAll(doublePrecision);
    return 0;
}
