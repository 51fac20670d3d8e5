// Helpers of the terrain readers' tests: the mesh as the polygon protocol
// gives it, and GDAL's command-line tools as the oracle.
#pragma once
#include <gtest/gtest.h>

#include <cstdlib>
#include <sstream>
#include <string>
#include <vector>

#include "ZonICloudReadPolygonFile.h"
#include "ZonTestFiles.h"

namespace zontest {

struct Mesh {
    std::vector<float> vertices;
    std::vector<unsigned> triangles;
};

inline Mesh ReadMesh(ZonICloudReadPolygonFile& reader)
{
    reader.BeginGetPolygon();
    EXPECT_TRUE(reader.NextPolygon());
    unsigned nv = 0, nt = 0;
    const float* v = reader.GetPolygonPoints(nv);
    const unsigned* t = reader.GetTriangles(nt);
    EXPECT_FALSE(reader.NextPolygon());
    return {std::vector<float>(v, v + 3 * nv), std::vector<unsigned>(t, t + 3 * nt)};
}

// The z of each vertex.
inline std::vector<float> Heights(const std::vector<float>& vertices)
{
    std::vector<float> z;
    for (std::size_t i = 2; i < vertices.size(); i += 3) z.push_back(vertices[i]);
    return z;
}

// Why GDAL cannot serve as the oracle here, or "" when it can.
inline std::string GdalMissing()
{
    const char* oracles = std::getenv("ZON_WITH_ORACLES");
    if (!oracles || std::string(oracles) != "1") return "ZON_WITH_ORACLES is not 1";
    if (std::system("command -v gdal_translate >/dev/null 2>&1 && command -v gdallocationinfo >/dev/null 2>&1") != 0)
        return "GDAL's tools (gdal-bin) are not installed";
    return "";
}

// The "x y z" lines of `gdal_translate -of XYZ` on a raster.
struct XyzLine {
    double x, y, z;
};
inline std::vector<XyzLine> ParseXyz(const std::string& text)
{
    std::vector<XyzLine> lines;
    std::istringstream in(text);
    in.imbue(std::locale::classic());
    XyzLine line{};
    while (in >> line.x >> line.y >> line.z) lines.push_back(line);
    return lines;
}

}  // namespace zontest

namespace zontest {

// A shell command with its output kept in `output`; true when it succeeded.
inline bool Shell(const std::string& command, const std::string& output)
{
    return std::system((command + " >" + Quote(output) + " 2>&1 </dev/null").c_str()) == 0;
}

}  // namespace zontest
