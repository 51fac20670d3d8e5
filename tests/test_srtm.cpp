// The raw height-tile reader: the side and the spacing from the file size,
// big-endian samples, void samples kept as points but left out of box
// queries, non-square files, double precision, and GDAL's tiles.
#include <gtest/gtest.h>

#include <cmath>

#include "ZonCldReadSRTM.h"
#include "ZonTerrainTests.h"

namespace {

using namespace zontest;
using Indices = std::vector<unsigned>;

std::string Samples(const std::vector<int>& values)
{
    std::string bytes;
    for (int v : values) {
        bytes += static_cast<char>((v >> 8) & 0xFF);
        bytes += static_cast<char>(v & 0xFF);
    }
    return bytes;
}

class SrtmTest : public FilesTest {
protected:
    std::shared_ptr<ZonCldReadSRTM> Reader(const std::string& bytes)
    {
        return std::make_shared<ZonCldReadSRTM>(ZonUnicodeString(Write("t" + std::to_string(files_++) + ".hgt", bytes)));
    }
    int files_ = 0;
};

TEST_F(SrtmTest, SamplesAreBigEndianAndVoidsStayPointsWithTheirText)
{
    // 0x80 0x00 is void, 0xFF 0xFF is -1, 0x01 0x00 is 256.
    const std::string bytes = std::string("\x80\x00\xFF\xFF\x01\x00", 6) + Samples({1, 2, 3, 4, 5, 6});
    auto reader = Reader(bytes);
    const Mesh mesh = ReadMesh(*reader);
    EXPECT_EQ(Heights(mesh.vertices), (std::vector<float>{-32768, -1, 256, 1, 2, 3, 4, 5, 6}));
    // Rows from north to south over one unit: the first sample at (0, 1).
    EXPECT_EQ(std::vector<float>(mesh.vertices.begin(), mesh.vertices.begin() + 6), (std::vector<float>{0, 1, -32768, 0.5f, 1, -1}));
    EXPECT_EQ(std::vector<float>(mesh.vertices.end() - 3, mesh.vertices.end()), (std::vector<float>{1, 0, 6}));
    EXPECT_EQ(mesh.triangles.size(), 3u * 8);
    unsigned count = 0;
    const auto* texts = static_cast<const std::string*>(reader->GetPointAttributes3(count));
    ASSERT_EQ(count, 9u);
    EXPECT_EQ(texts[0], "InvalidPoint");
    EXPECT_EQ(texts[1], "");
    EXPECT_EQ(reader->GetLengthUnit()->Name(), "m");

    // The tile's own box gives everything, the void too; any other box leaves it out with its triangles.
    ZonMathBox box;
    reader->GetBoundingBox(box);
    unsigned inside = 0;
    const float* vertices = nullptr;
    reader->GetTrianglesInBox(box, count, vertices, inside);
    EXPECT_EQ(inside, 9u);
    EXPECT_EQ(count, 8u);
    const unsigned* kept = reader->GetTrianglesInBox(ZonMathBox(0, 1, 0, 1, -40000, 300), count, vertices, inside);
    EXPECT_EQ(inside, 8u);
    EXPECT_EQ(Indices(kept, kept + 3 * count), (Indices{0, 2, 3, 0, 3, 1, 1, 3, 4, 2, 5, 3, 3, 5, 6, 3, 6, 4, 4, 6, 7}));
}

TEST_F(SrtmTest, TheSideAndTheSpacingComeFromTheSize)
{
    const struct {
        std::size_t bytes;
        unsigned side, points, triangles;
    } cases[] = {
        {2884802, 1201, 1201 * 1201, 2 * 1200 * 1200},
        {25934402, 3601, 3601 * 3601, 2 * 3600 * 3600},
        // Not a square: every sample is a point, the triangles cover the square part.
        {2 * 10 + 1, 3, 10, 8},
        {2, 1, 1, 0},
    };
    for (const auto& c : cases) {
        auto reader = Reader(std::string(c.bytes, '\0'));
        const Mesh mesh = ReadMesh(*reader);
        EXPECT_EQ(reader->GetRowLength(), c.side) << c.bytes;
        EXPECT_EQ(mesh.vertices.size(), 3u * c.points) << c.bytes;
        EXPECT_EQ(mesh.triangles.size(), 3u * c.triangles) << c.bytes;
        if (c.side > 1) {
            EXPECT_EQ(mesh.vertices[1], 1.0f) << c.bytes;
            EXPECT_EQ(mesh.vertices[3], static_cast<float>(1.0 / (c.side - 1))) << c.bytes;
        }
    }
    // The rows of a non-square file go on southwards.
    const Mesh ten = ReadMesh(*Reader(std::string(20, '\0')));
    EXPECT_EQ(ten.vertices[3 * 9 + 1], -0.5f);
    EXPECT_EQ(ErrorKeyAndSeverity([&] { ReadMesh(*Reader("")); }), "ZonCloudReadNLSTool.ERR_NoPointFound/4");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { ReadMesh(*Reader("x")); }), "ZonCloudReadNLSTool.ERR_NoPointFound/4");
}

TEST_F(SrtmTest, DoublePrecisionComputesTheSpacingInDoubles)
{
    auto reader = Reader(Samples({1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16}));
    reader->SetDoublePrecision(true);
    const std::vector<double> points = PointsOf(*reader);
    ASSERT_EQ(points.size(), 3u * 16);
    EXPECT_EQ(points[3], 1.0 / 3);
    EXPECT_EQ(points[1], 1.0);
    EXPECT_EQ(points[3 * 15 + 2], 16.0);
}

// GDAL writes a tile from a raster of ours; we read the heights GDAL reads back.
TEST_F(SrtmTest, GdalTilesReadToGdalsValues)
{
    if (const std::string why = GdalMissing(); !why.empty()) GTEST_SKIP() << why;
    const int n = 1201;
    std::string grid = "ncols 1201\nnrows 1201\nxllcorner 6.99958333333333\nyllcorner 44.9995833333333\n"
                       "cellsize 0.000833333333333333\n";
    for (int r = 0; r < n; ++r) {
        for (int c = 0; c < n; ++c) grid += std::to_string((r * 7 + c * 13) % 9000 - 500) + " ";
        grid += "\n";
    }
    const std::string source = Write("source.asc", grid), tile = Path("N45E007.hgt");
    ASSERT_TRUE(Shell("gdal_translate -q -a_srs EPSG:4326 -of SRTMHGT " + Quote(source) + " " + Quote(tile), Path("log")))
        << Slurp(Path("log"));
    // A few pixels through gdallocationinfo (column, row on each line).
    std::string where;
    const std::vector<std::pair<int, int>> pixels = {{0, 0}, {1200, 0}, {0, 1200}, {1200, 1200}, {517, 33}, {8, 999}};
    for (const auto& [c, r] : pixels) where += std::to_string(c) + " " + std::to_string(r) + "\n";
    const std::string values = Path("values");
    ASSERT_TRUE(Shell("(gdallocationinfo -valonly " + Quote(tile) + " <" + Quote(Write("where", where)) + ")", values));
    std::istringstream gdal(Slurp(values));
    auto reader = std::make_shared<ZonCldReadSRTM>(ZonUnicodeString(tile));
    const Mesh mesh = ReadMesh(*reader);
    ASSERT_EQ(mesh.vertices.size(), 3u * n * n);
    for (const auto& [c, r] : pixels) {
        double z = 0;
        ASSERT_TRUE(gdal >> z);
        const float* v = &mesh.vertices[3 * (static_cast<std::size_t>(r) * n + c)];
        EXPECT_EQ(v[2], z) << c << " " << r;
        EXPECT_EQ(v[0], static_cast<float>(c / 1200.0));
        EXPECT_EQ(v[1], static_cast<float>((1200 - r) / 1200.0));
    }
}

}  // namespace
