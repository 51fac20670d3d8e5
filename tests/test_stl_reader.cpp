// The STL reader: text/binary decision, byte order and count of binary files,
// decimal separators of text files, vertex merging, sub-box queries, errors.
#include <gtest/gtest.h>

#include <dirent.h>
#include <stdlib.h>
#include <unistd.h>

#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <limits>
#include <optional>
#include <string>
#include <vector>

#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudReadStl.h"
#include "ZonError.h"

namespace {

using Corners = std::array<float, 9>;  // three vertices of one facet
const float kNaN = std::numeric_limits<float>::quiet_NaN();

// Bytes of a binary STL; every 4-byte number can be written in the other byte order.
struct BinaryStl {
    std::string header = std::string(80, ' ');
    std::vector<Corners> facets;
    std::optional<std::int32_t> count;  // the count word, when not the number of facets
    bool reversed = false;

    std::string Bytes() const
    {
        std::string out = header;
        out.resize(80, '\0');
        Put(out, static_cast<std::uint32_t>(count.value_or(static_cast<std::int32_t>(facets.size()))));
        for (const Corners& c : facets) {
            for (float n : {0.0f, 0.0f, 1.0f}) Put(out, std::bit_cast<std::uint32_t>(n));
            for (float v : c) Put(out, std::bit_cast<std::uint32_t>(v));
            out.append(2, '\0');
        }
        return out;
    }
    void Put(std::string& out, std::uint32_t word) const
    {
        if (reversed) word = __builtin_bswap32(word);
        out.append(reinterpret_cast<const char*>(&word), 4);
    }
};

// A regular grid of n x n points in the plane z = 0, two facets per cell.
std::vector<Corners> Grid(int n)
{
    std::vector<Corners> facets;
    for (int y = 0; y + 1 < n; ++y)
        for (int x = 0; x + 1 < n; ++x) {
            const float x0 = float(x), x1 = float(x + 1), y0 = float(y), y1 = float(y + 1);
            facets.push_back({x0, y0, 0, x1, y0, 0, x0, y1, 0});
            facets.push_back({x1, y0, 0, x1, y1, 0, x0, y1, 0});
        }
    return facets;
}

std::string TextFacet(const std::string& a, const std::string& b, const std::string& c)
{
    return "  facet normal 0 0 1\n    outer loop\n      vertex " + a + "\n      vertex " + b + "\n      vertex " + c +
           "\n    endloop\n  endfacet\n";
}

int OpenDescriptors()
{
    int n = 0;
    for ([[maybe_unused]] const auto& entry : std::filesystem::directory_iterator("/proc/self/fd")) ++n;
    return n;
}

class StlReaderTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/test_stl_XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
    }
    void TearDown() override { std::filesystem::remove_all(dir_); }

    std::shared_ptr<ZonCloudReadStl> Reader(const std::string& bytes)
    {
        const std::string path = dir_ + "/f" + std::to_string(files_++) + ".stl";
        std::ofstream(path, std::ios::binary) << bytes;
        return std::make_shared<ZonCloudReadStl>(ZonUnicodeString(path));
    }

    // Reads the whole mesh through the polygon protocol.
    struct Mesh {
        std::vector<float> vertices;
        std::vector<unsigned> triangles;
    };
    static Mesh Read(ZonCloudReadStl& reader)
    {
        reader.BeginGetPolygon();
        EXPECT_TRUE(reader.NextPolygon());
        unsigned nv = 0, nt = 0;
        const float* v = reader.GetPolygonPoints(nv);
        const unsigned* t = reader.GetTriangles(nt);
        EXPECT_FALSE(reader.NextPolygon());
        return {std::vector<float>(v, v + 3 * nv), std::vector<unsigned>(t, t + 3 * nt)};
    }

    // The catalog key of the error the reader raises when read, and checks that the file was closed.
    std::string ErrorOf(const std::string& bytes)
    {
        const int before = OpenDescriptors();
        auto reader = Reader(bytes);
        try {
            Read(*reader);
        } catch (const ZonError& error) {
            EXPECT_EQ(OpenDescriptors(), before) << "stream left open on " << error.GetMessageKey();
            return error.GetMessageKey();
        }
        return "no error";
    }

    std::string dir_;
    int files_ = 0;
};

TEST_F(StlReaderTest, BinaryWithSolidHeaderMergesSharedVertices)
{
    BinaryStl stl;
    stl.header = "solid made by a binary writer";
    stl.facets = Grid(2);
    auto reader = Reader(stl.Bytes());
    EXPECT_FALSE(reader->IsTextFile());
    EXPECT_EQ(reader->GetNumberOfTriangles(), 2u);
    const Mesh mesh = Read(*reader);
    EXPECT_EQ(mesh.vertices, (std::vector<float>{0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0}));
    EXPECT_EQ(mesh.triangles, (std::vector<unsigned>{0, 1, 2, 1, 3, 2}));
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(0, 1, 0, 1, 0, 0)));
    int from = -1;
    reader->GetBinaryFrom(from);
    EXPECT_EQ(from, ZonICloudReadOptBinMachine::Current);
}

TEST_F(StlReaderTest, CountWordIsOnlyABound)
{
    struct Case {
        std::int32_t count;
        int facetsInFile;
        int expected;  // triangles read
    } cases[] = {
        {1000, 12, 12},                                     // 684-byte file: capped by the size
        {std::numeric_limits<std::int32_t>::max(), 12, 12}, // capped by the size too
        {-5, 12, 12},                                       // both readings negative: the size decides
        {7, 12, 7},                                         // fewer announced than held
    };
    for (const Case& c : cases) {
        BinaryStl stl;
        stl.facets = Grid(4);
        stl.facets.resize(c.facetsInFile);
        stl.count = c.count;
        auto reader = Reader(stl.Bytes());
        EXPECT_EQ(Read(*reader).triangles.size(), 3u * c.expected) << "count " << c.count;
    }
    BinaryStl stl;
    stl.facets = Grid(4);
    stl.facets.resize(12);
    stl.count = 1000;
    EXPECT_EQ(stl.Bytes().size(), 684u);
}

TEST_F(StlReaderTest, BrokenBinaryFilesRaiseTheirErrorWithTheStreamClosed)
{
    BinaryStl grid;
    grid.facets = Grid(3);
    const std::string good = grid.Bytes();
    BinaryStl zero = grid;
    zero.count = 0;
    BinaryStl flat = grid;  // every vertex the same point
    for (Corners& c : flat.facets) c.fill(5.0f);
    BinaryStl huge = grid;  // extents whose product overflows a float
    huge.facets[0] = {-3e13f, -3e13f, -3e13f, 3e13f, 3e13f, 3e13f, 0, 0, 0};

    const struct {
        const char* what;
        std::string bytes;
        const char* key;
    } cases[] = {
        {"empty file", "", "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"short header", good.substr(0, 50), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"no count word", good.substr(0, 82), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"no whole record", good.substr(0, 84 + 47), "ZonCloudReadNLSTool.ERR_NoPointFound"},
        {"count 0", zero.Bytes(), "ZonCloudReadNLSTool.ERR_NoPointFound"},
        {"all vertices equal", flat.Bytes(), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"absurd box", huge.Bytes(), "ZonCloudReadNLSTool.ERR_UnknownData"},
    };
    for (const auto& c : cases) EXPECT_EQ(ErrorOf(c.bytes), c.key) << c.what;

    auto missing = std::make_shared<ZonCloudReadStl>(ZonUnicodeString(dir_ + "/missing.stl"));
    try {
        missing->GetTypeOfDigitization();
        ADD_FAILURE() << "no error for a missing file";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetMessageKey(), "ZonCloudOperErrorTool.ERR_ENOENT");
        EXPECT_EQ(error.GetSeverity(), 4);  // content error
    }
}

TEST_F(StlReaderTest, RecordWithoutAttributeWordCounts)
{
    // A count word whose other reading is negative is kept as it is when the
    // file cannot hold one whole record; what is there is read.
    BinaryStl stl;
    stl.facets = Grid(2);
    stl.facets.resize(1);
    stl.count = 128;
    const std::string bytes = stl.Bytes();
    EXPECT_EQ(Read(*Reader(bytes.substr(0, bytes.size() - 2))).triangles.size(), 3u);
    EXPECT_EQ(ErrorOf(bytes.substr(0, bytes.size() - 3)), "ZonCloudReadNLSTool.ERR_NoPointFound");
}

TEST_F(StlReaderTest, ReversedByteOrderIsDetected)
{
    BinaryStl native;
    native.facets = Grid(5);
    native.facets[3][4] = -2.75f;
    BinaryStl reversed = native;
    reversed.reversed = true;
    auto reader = Reader(reversed.Bytes());
    const Mesh mesh = Read(*reader);
    EXPECT_EQ(mesh.vertices, Read(*Reader(native.Bytes())).vertices);
    int from = -1;
    reader->GetBinaryFrom(from);
    EXPECT_EQ(from, ZonICloudReadOptBinMachine::Differ);
}

TEST_F(StlReaderTest, ByteOrderOption)
{
    BinaryStl stl;
    stl.facets = Grid(3);
    auto reader = Reader(stl.Bytes());
    EXPECT_THROW(reader->SetBinaryFrom(3), ZonError);
    reader->SetBinaryFrom(ZonICloudReadOptBinMachine::Differ);
    const Mesh first = Read(*reader);
    int from = -1;
    reader->GetBinaryFrom(from);
    EXPECT_EQ(from, ZonICloudReadOptBinMachine::Current);  // detection has the last word
    // A change after reading makes the reader analyse and read again.
    reader->SetBinaryFrom(ZonICloudReadOptBinMachine::Differ);
    EXPECT_EQ(Read(*reader).vertices, first.vertices);
}

TEST_F(StlReaderTest, TextForms)
{
    const std::string plain = "solid t\n" + TextFacet("0 0 0", "1 0 0", "0 1 0") +
                              TextFacet("1 0 0", "1 1 0", "0 1 0") + "endsolid t\n";
    const std::string commas = "solid t\n" + TextFacet("0,0 0,0 0,0", "1,5 0,0 0,0", "0,0 1,25 0,0") +
                               TextFacet("1,5 0,0 0,0", "1,5 1,25 0,0", "0,0 1,25 0,0") + "endsolid\n";
    const std::string upper = "SOLID T\nFACET NORMAL 0 0 1\nOUTER LOOP\nVERTEX 0 0 0\nVERTEX 2 0 0\nVERTEX 0 2 0\n";
    // Seven vertex lines: two triangles, the seventh is dropped.
    std::string stray = plain + "vertex 9 9 9\n";
    // Three unreadable vertex lines in a row are skipped.
    std::string garbage = "solid\n" + TextFacet("0 0 0", "1 0 0", "0 1 0");
    garbage += "vertex a b c\nvertex 1 2\nvertex -\n" + TextFacet("0 0 0", "2 0 0", "0 2 0");

    // A line ends at a NUL, as a C string does: the vertex behind it is not read.
    const std::string nul = "solid\n" + std::string("x\0vertex 9 9 9\n", 16) + TextFacet("0 0 0", "2 0 0", "0 2 0");

    const struct {
        const char* what;
        std::string text;
        std::vector<float> vertices;
        std::vector<unsigned> triangles;
    } cases[] = {
        {"plain", plain, {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0}, {0, 1, 2, 1, 3, 2}},
        {"decimal commas", commas, {0, 0, 0, 1.5f, 0, 0, 0, 1.25f, 0, 1.5f, 1.25f, 0}, {0, 1, 2, 1, 3, 2}},
        {"upper case", upper, {0, 0, 0, 2, 0, 0, 0, 2, 0}, {0, 1, 2}},
        {"3k+1 vertex lines", stray, {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0}, {0, 1, 2, 1, 3, 2}},
        {"NUL in a line", nul, {0, 0, 0, 2, 0, 0, 0, 2, 0}, {0, 1, 2}},
        {"some garbage", garbage, {0, 0, 0, 1, 0, 0, 0, 1, 0, 2, 0, 0, 0, 2, 0}, {0, 1, 2, 0, 3, 4}},
    };
    for (const auto& c : cases) {
        auto reader = Reader(c.text);
        EXPECT_TRUE(reader->IsTextFile()) << c.what;
        const Mesh mesh = Read(*reader);
        EXPECT_EQ(mesh.vertices, c.vertices) << c.what;
        EXPECT_EQ(mesh.triangles, c.triangles) << c.what;
    }
}

TEST_F(StlReaderTest, BrokenTextFiles)
{
    const std::string facet = TextFacet("0 0 0", "1 0 0", "0 1 0");
    EXPECT_EQ(ErrorOf("solid\n" + facet + "vertex a\nvertex b\nvertex c\nvertex d\n" + facet),
              "ZonCloudReadNLSTool.ERR_TooManyUnknownData");
    EXPECT_EQ(ErrorOf("solid\nvertex x y z\nendsolid\n"), "ZonCloudReadNLSTool.ERR_NoPointFound");
    // Two vertices make no triangle.
    EXPECT_EQ(ErrorOf("solid\nvertex 0 0 0\nvertex 1 1 1\n"), "ZonCloudReadNLSTool.ERR_NoPointFound");
}

TEST_F(StlReaderTest, SolidHeaderWithoutVertexLinesIsBinary)
{
    // A text-looking start whose vertex line comes after 100 other lines.
    // The first vertex line is line 100 of the file: text; line 101: binary,
    // and this text read as binary is no mesh.
    std::string early = "solid early\n";
    for (int i = 0; i < 96; ++i) early += "comment\n";
    EXPECT_TRUE(Reader(early + TextFacet("0 0 0", "1 0 0", "0 1 0"))->IsTextFile());
    EXPECT_EQ(ErrorOf("solid late\ncomment\n" + early.substr(12) + TextFacet("0 0 0", "1 0 0", "0 1 0")),
              "ZonCloudReadNLSTool.ERR_UnknownData");
}

TEST_F(StlReaderTest, MergingFollowsFloatingPointEquality)
{
    BinaryStl stl;
    stl.facets = Grid(40);  // far apart: the first and the last facet share no vertex, but
    stl.facets.push_back({0, 0, 0, 39, 39, 0, 0, 39, 0});  // this one shares three with early facets
    stl.facets.push_back({-0.0f, 0, -0.0f, 1, 0, 0, kNaN, 0, 0});
    stl.facets.push_back({kNaN, 0, 0, 1, 0, 0, 0, 1, 0});
    const Mesh mesh = Read(*Reader(stl.Bytes()));
    const std::size_t n = 3 * stl.facets.size();
    const std::vector<unsigned> tail(mesh.triangles.end() - 9, mesh.triangles.end());
    const unsigned grid = 40 * 40;
    ASSERT_EQ(mesh.triangles.size(), n);
    EXPECT_EQ(tail[0], 0u);  // first vertex of the file
    EXPECT_EQ(tail[1], grid - 1);
    EXPECT_EQ(tail[3], 0u);  // -0.0 is 0.0
    EXPECT_EQ(tail[4], 1u);
    EXPECT_EQ(tail[5], grid);  // a NaN is a vertex of its own, every time
    EXPECT_EQ(tail[6], grid + 1);
    EXPECT_EQ(mesh.vertices.size(), 3u * (grid + 2));
}

TEST_F(StlReaderTest, DoublePrecisionKeepsTextDigits)
{
    const std::string text =
        "solid\n" + TextFacet("0 0 0", "1 0 0", "0 1 0") + TextFacet("0.10000000001 0 0", "0.1 0 0", "0 1 0");
    auto single = Reader(text);
    EXPECT_EQ(Read(*single).vertices.size(), 3u * 4);  // the two near values are one float
    auto precise = Reader(text);
    precise->SetDoublePrecision(true);
    precise->BeginGetPolygon();
    precise->NextPolygon();
    unsigned n = 0;
    const double* v = precise->GetPointsDouble(n);
    ASSERT_EQ(n, 5u);
    EXPECT_EQ(v[9], 0.10000000001);
    EXPECT_EQ(v[12], 0.1);
}

TEST_F(StlReaderTest, SubBoxKeepsTrianglesWithAllVerticesInside)
{
    BinaryStl stl;
    stl.facets = Grid(3);  // points 0..2 on x and y, z = 0: a flat box
    auto reader = Reader(stl.Bytes());
    unsigned count = 0, nv = 0;
    const float* vertices = nullptr;

    // The file's own box: the whole mesh.
    ZonMathBox all;
    reader->GetBoundingBox(all);
    reader->GetTrianglesInBox(all, count, vertices, nv);
    EXPECT_EQ(count, 8u);
    EXPECT_EQ(nv, 9u);

    // x in [0, 1]: the upper face x = 1 is open, so only x = 0 points are
    // inside and no triangle; x in [1, 2]: the face x = 2 is the file's, closed.
    reader->GetTrianglesInBox(ZonMathBox(0, 1, 0, 2, 0, 0), count, vertices, nv);
    EXPECT_EQ(count, 0u);
    EXPECT_EQ(std::vector<float>(vertices, vertices + 3 * nv), (std::vector<float>{0, 0, 0, 0, 1, 0, 0, 2, 0}));

    const unsigned* t = reader->GetTrianglesInBox(ZonMathBox(1, 2, 0, 2, 0, 0), count, vertices, nv);
    ASSERT_EQ(count, 4u);
    EXPECT_EQ(std::vector<float>(vertices, vertices + 3 * nv),
              (std::vector<float>{1, 0, 0, 1, 1, 0, 2, 0, 0, 2, 1, 0, 1, 2, 0, 2, 2, 0}));
    EXPECT_EQ(std::vector<unsigned>(t, t + 12), (std::vector<unsigned>{0, 2, 1, 2, 3, 1, 1, 3, 4, 3, 5, 4}));
    unsigned walked = 0;
    while (reader->NextTriangleInBox()) ++walked;
    EXPECT_EQ(walked, 4u);

    // The same box again is answered from the cache.
    const unsigned* again = reader->GetTrianglesInBox(ZonMathBox(1, 2, 0, 2, 0, 0), count, vertices, nv);
    EXPECT_EQ(again, t);
    // A box beside the mesh holds nothing.
    reader->GetTrianglesInBox(ZonMathBox(5, 6, 5, 6, 0, 1), count, vertices, nv);
    EXPECT_EQ(count, 0u);
    EXPECT_EQ(nv, 0u);
}

TEST_F(StlReaderTest, PolygonProtocol)
{
    BinaryStl stl;
    stl.facets = Grid(2);
    auto reader = Reader(stl.Bytes());
    EXPECT_THROW(reader->NextPolygon(), ZonError);
    EXPECT_EQ(reader->GetTypeOfDigitization(), DigitizationPolygons);
    reader->BeginGetPolygon();
    ASSERT_TRUE(reader->NextPolygon());
    int triangles = 0;
    while (reader->NextTriangle()) ++triangles;
    EXPECT_EQ(triangles, 2);
    EXPECT_FALSE(reader->NextPolygon());
    EXPECT_EQ(reader->GetNumberOfPoints(), 4);
}

TEST_F(StlReaderTest, FactoryAppliesTheSettings)
{
    auto factory = ZonCldImporter::GetFactory(ZonUnicodeString("STL"));
    ASSERT_TRUE(factory);
    EXPECT_STREQ(factory->GetRegistryName(), "CloudFactoryStl");
    ZonString filter;
    factory->GetFileFilter(filter);
    EXPECT_EQ(filter, "*.stl");

    auto& settings = ZonCldSettings::Instance();
    settings.SetInt("BinaryFrom", 2);
    settings.SetImportSTLFacets(false);
    settings.SetBool("CreateFreeEdges", true);
    auto reader = factory->CreateReader(ZonUnicodeString(dir_ + "/any.stl"));
    settings.ResetAll();
    auto order = ZonQueryInterface<ZonICloudReadOptBinMachine>(reader);
    auto triangles = ZonQueryInterface<ZonICloudReadOptTriangles>(reader);
    auto edges = ZonQueryInterface<ZonICloudReadOptFreeEdges>(reader);
    ASSERT_TRUE(order && triangles && edges && ZonQueryInterface<ZonICloudReadPolygonFile>(reader));
    int from = 0;
    bool create = true, free = false;
    order->GetBinaryFrom(from);
    triangles->GetTriangles(create);
    edges->GetFreeEdges(free);
    EXPECT_EQ(from, 2);
    EXPECT_FALSE(create);
    EXPECT_TRUE(free);
}

}  // namespace
