// Any bytes as an STL file end in a mesh or a catalog error. The mesh is read
// in single and double precision and queried in a box inside its own.
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>

#include "ZonCloudReadStl.h"
#include "ZonError.h"

namespace {

// A plain array, still there when the exit handler removes the file.
char gPath[64];

const char* Path()
{
    if (!gPath[0]) {
        std::snprintf(gPath, sizeof gPath, "/tmp/fuzz_stl_%d.stl", static_cast<int>(getpid()));
        std::atexit([] { std::remove(gPath); });
    }
    return gPath;
}

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(bool doublePrecision)
{
    ZonCloudReadStl reader{ZonUnicodeString(Path())};
    reader.SetDoublePrecision(doublePrecision);
    try {
        reader.BeginGetPolygon();
        Check(reader.NextPolygon());
        unsigned nv = 0, nt = 0;
        reader.GetPolygonPoints(nv);
        const unsigned* triangles = reader.GetTriangles(nt);
        Check(nt > 0 && nt == reader.GetNumberOfTriangles());
        for (unsigned i = 0; i < 3 * nt; ++i) Check(triangles[i] < nv);
        if (doublePrecision) {
            unsigned nd = 0;
            reader.GetPointsDouble(nd);
            Check(nd == nv);
        }

        ZonMathBox box;
        reader.GetBoundingBox(box);
        if (box.IsEmpty()) return;
        const ZonMathPoint& low = box.GetLow();
        const ZonMathPoint& high = box.GetHigh();
        const ZonMathBox half(low[0], (low[0] + high[0]) / 2, low[1], high[1], low[2], high[2]);
        unsigned count = 0, inside = 0;
        const float* vertices = nullptr;
        const unsigned* kept = reader.GetTrianglesInBox(half, count, vertices, inside);
        Check(count <= nt && inside <= nv);
        for (unsigned i = 0; i < 3 * count; ++i) Check(kept[i] < inside);
        unsigned walked = 0;
        while (reader.NextTriangleInBox()) ++walked;
        Check(walked == count);
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    FILE* file = std::fopen(Path(), "wb");
    if (!file) return 0;
    if (size && std::fwrite(data, 1, size, file) != size) {
        std::fclose(file);
        return 0;
    }
    std::fclose(file);
    ReadAll(false);
    ReadAll(true);
    return 0;
}
