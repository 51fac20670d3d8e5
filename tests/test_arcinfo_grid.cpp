// The text height-grid reader: header lines and their whole numbers, the
// mapping of rows to x and columns to y, values across lines and read
// blocks, short and broken files, the sub-box query, and GDAL's files.
#include <gtest/gtest.h>

#include <cmath>

#include "ZonCldReadArcInfoGrid.h"
#include "ZonTerrainTests.h"

namespace {

using namespace zontest;
using Floats = std::vector<float>;
using Indices = std::vector<unsigned>;

class ArcInfoGridTest : public FilesTest {
protected:
    std::shared_ptr<ZonCldReadArcInfoGrid> Reader(const std::string& text, const std::string& extension = ".asc_grid")
    {
        return std::make_shared<ZonCldReadArcInfoGrid>(ZonUnicodeString(Write("g" + std::to_string(files_++) + extension, text)));
    }
    int files_ = 0;
};

const std::string kSix = "ncols 3\nnrows 2\nxllcorner 100.75\nyllcorner -20\ncellsize 10\nNODATA_value -9999\n";

TEST_F(ArcInfoGridTest, HeadersAndTheMappingOfRowsAndColumns)
{
    const Indices cells{0, 3, 1, 1, 3, 4, 1, 4, 2, 2, 4, 5};  // 2 rows of 3
    const struct {
        const char* what;
        std::string text;
        Floats vertices;
        Indices triangles;
    } cases[] = {
        // Rows along x from the cut corner, columns along y; values spread over lines at will.
        {"six lines", kSix + "1 2\n3 4.5 -9999\n  6\n",
         {100, -20, 1, 100, -10, 2, 100, 0, 3, 110, -20, 4.5f, 110, -10, -9999, 110, 0, 6}, cells},
        {"five lines, capitals, CR LF", "NCOLS 3\r\nNROWS 2\r\nXLLCORNER 0\r\nYLLCORNER 0\r\nCELLSIZE 2\r\n1 2 3\r\n4 5 6\r\n",
         {0, 0, 1, 0, 2, 2, 0, 4, 3, 2, 0, 4, 2, 2, 5, 2, 4, 6}, cells},
        // dy steps the rows (x), dx the columns (y).
        {"dx and dy", "ncols 3\nnrows 2\nxllcorner 0\nyllcorner 0\ndx 10\ndy 12\nNODATA_value -1\n1 2 3 4 5 6\n",
         {0, 0, 1, 0, 10, 2, 0, 20, 3, 12, 0, 4, 12, 10, 5, 12, 20, 6}, cells},
        // An unknown keyword still makes a header line, and leaves its value alone.
        {"xllcenter", "ncols 2\nnrows 1\nxllcenter 50\nyllcorner 7\ncellsize 1\nNODATA_value 0\n8 nan\n",
         {0, 7, 8, 0, 8, NAN}, {}},
        {"one column", "ncols 1\nnrows 3\nxllcorner 0\nyllcorner 0\ncellsize 1\n1 2 3", {0, 0, 1, 1, 0, 2, 2, 0, 3}, {}},
    };
    for (const auto& c : cases) {
        auto reader = Reader(c.text);
        const Mesh mesh = ReadMesh(*reader);
        ASSERT_EQ(mesh.vertices.size(), c.vertices.size()) << c.what;
        for (std::size_t i = 0; i < c.vertices.size(); ++i) {
            if (std::isnan(c.vertices[i])) continue;
            EXPECT_EQ(mesh.vertices[i], c.vertices[i]) << c.what << " at " << i;
        }
        EXPECT_EQ(mesh.triangles, c.triangles) << c.what;
    }
    EXPECT_EQ(Reader(kSix + "1 2 3 4 5 6")->GetHeader().xCorner, 100);
}

TEST_F(ArcInfoGridTest, BrokenFilesRaiseTheirError)
{
    const struct {
        const char* what;
        std::string text;
        const char* key;
    } cases[] = {
        {"fewer values than cells", kSix + "1 2 3 4 5\n", "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        // Refused before anything is allocated.
        {"a header far beyond the file", "ncols 2000000000\nnrows 2000000000\n1 2\n", "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"a value that does not convert", kSix + "1 2 3 4 x 6\n", "ZonCloudOperErrorTool.ERR_EINVAL/2"},
        {"a value followed by letters", kSix + "1 2 3 4 5e 6\n", "ZonCloudOperErrorTool.ERR_EINVAL/2"},
        {"no rows", "ncols 3\nnrows 0\n", "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"empty", "", "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
    };
    for (const auto& c : cases) EXPECT_EQ(ErrorKeyAndSeverity([&] { ReadMesh(*Reader(c.text)); }), c.key) << c.what;
}

// Values cut by the ends of the reader's blocks still read whole.
TEST_F(ArcInfoGridTest, LargeGridsReadAcrossBlocks)
{
    const int rows = 300, columns = 700;
    std::string text = "ncols " + std::to_string(columns) + "\nnrows " + std::to_string(rows) +
                       "\nxllcorner 0\nyllcorner 0\ncellsize 1\n";
    for (int r = 0; r < rows; ++r) {
        for (int c = 0; c < columns; ++c) text += std::to_string(r * 1000 + c) + (c % 7 ? ".25 " : "\t");
        text += "\n";
    }
    ASSERT_GT(text.size(), 1u << 20);  // more than one block
    const Mesh mesh = ReadMesh(*Reader(text));
    ASSERT_EQ(mesh.vertices.size(), 3u * rows * columns);
    EXPECT_EQ(mesh.triangles.size(), 6u * (rows - 1) * (columns - 1));
    for (int r = 0; r < rows; ++r)
        for (int c = 0; c < columns; ++c)
            ASSERT_EQ(mesh.vertices[3 * (r * columns + c) + 2], r * 1000 + c + (c % 7 ? 0.25f : 0.0f)) << r << " " << c;
}

TEST_F(ArcInfoGridTest, SubBoxKeepsWholeCellsRenumbered)
{
    auto reader = Reader(kSix + "1 2 3 4 5 6\n");
    ReadMesh(*reader);
    unsigned count = 0, inside = 0;
    const float* vertices = nullptr;
    // The column at y = 0 is the box's closed top face only when it is the grid's own.
    const unsigned* triangles = reader->GetTrianglesInBox(ZonMathBox(100, 110, -20, 0, 0, 10), count, vertices, inside);
    ASSERT_EQ(inside, 6u);
    EXPECT_EQ(Indices(triangles, triangles + 3 * count), (Indices{0, 3, 1, 1, 3, 4, 1, 4, 2, 2, 4, 5}));
    reader->GetTrianglesInBox(ZonMathBox(100, 110, -20, -1, 0, 10), count, vertices, inside);
    EXPECT_EQ(inside, 4u);
    EXPECT_EQ(count, 2u);
}

TEST_F(ArcInfoGridTest, ToolPicksTheFormatByExtensionAndHonoursTheTrianglesOption)
{
    const std::string grid = Write("g.asc_grid", kSix + "1 2 3 4 5 6\n");
    ToolRun run = Run("info --json " + Quote(grid));
    ASSERT_EQ(run.status, 0) << run.err;
    EXPECT_NE(run.out.find("\"format\": \"ArcInfoGrid\""), std::string::npos) << run.out;
    EXPECT_NE(run.out.find("\"triangles\": 4"), std::string::npos) << run.out;
    run = Run("info --json --no-triangles " + Quote(grid));
    EXPECT_NE(run.out.find("\"triangles\": 0"), std::string::npos) << run.out;
}

// GDAL writes grids (square cells, then dx/dy); we read the values GDAL reads back.
TEST_F(ArcInfoGridTest, GdalGridsReadToGdalsValues)
{
    if (const std::string why = GdalMissing(); !why.empty()) GTEST_SKIP() << why;
    const std::string source = Write("source.asc", "ncols 5\nnrows 4\nxllcorner 1000\nyllcorner 2000\ncellsize 25\n"
                                                   "NODATA_value -9999\n"
                                                   "1.5 2.25 -3 4 5\n6 7 8 9 10.125\n11 12 -9999 14 15\n16 17 18 19 20\n");
    for (const std::string options : {"", "-a_ullr 1000 2100 1125 2000"}) {
        const std::string grid = Path("gdal.asc_grid"), xyz = Path("gdal.xyz");
        ASSERT_TRUE(Shell("gdal_translate -q -of AAIGrid " + options + " " + Quote(source) + " " + Quote(grid), Path("log")));
        ASSERT_TRUE(Shell("gdal_translate -q -of XYZ " + Quote(grid) + " " + Quote(xyz), Path("log")));
        const std::vector<XyzLine> gdal = ParseXyz(Slurp(xyz));
        auto reader = std::make_shared<ZonCldReadArcInfoGrid>(ZonUnicodeString(grid));
        const Mesh mesh = ReadMesh(*reader);
        ASSERT_EQ(gdal.size(), 20u) << options;
        ASSERT_EQ(mesh.vertices.size(), 3 * gdal.size()) << options;
        const auto& header = reader->GetHeader();
        const double dx = gdal[1].x - gdal[0].x, dy = gdal[0].y - gdal[5].y;
        EXPECT_EQ(header.ColumnStep(), dx) << options;
        EXPECT_EQ(header.RowStep(), dy) << options;
        for (std::size_t i = 0; i < gdal.size(); ++i) {
            const float* v = &mesh.vertices[3 * i];
            EXPECT_EQ(v[2], static_cast<float>(gdal[i].z)) << options << " at " << i;
            // Our rows lie along x from the lower-left corner, our columns along y.
            EXPECT_EQ(v[0], 1000 + (i / 5) * dy) << options << " at " << i;
            EXPECT_EQ(v[1], gdal[i].x - dx / 2 - 1000 + 2000) << options << " at " << i;
        }
    }
}

}  // namespace
