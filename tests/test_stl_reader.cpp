// The STL reader: text/binary decision, byte order and count of binary files,
// decimal separators of text files, vertex merging, sub-box queries, errors.
#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <limits>
#include <optional>

#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadStl.h"
#include "ZonError.h"
#include "ZonTestFiles.h"

namespace {

using Corners = std::array<float, 9>;  // three vertices of one facet
using Floats = std::vector<float>;
using Indices = std::vector<unsigned>;
const float kNaN = std::numeric_limits<float>::quiet_NaN();

// Bytes of a binary STL; every 4-byte number can be written in the other byte order.
std::string Binary(const std::vector<Corners>& facets, std::optional<std::int32_t> count = {}, bool reversed = false,
                   std::string header = "")
{
    std::string out = std::move(header);
    out.resize(80, '\0');
    const auto put = [&out, reversed](std::uint32_t word) {
        if (reversed) word = __builtin_bswap32(word);
        out.append(reinterpret_cast<const char*>(&word), 4);
    };
    put(static_cast<std::uint32_t>(count.value_or(static_cast<std::int32_t>(facets.size()))));
    for (const Corners& c : facets) {
        for (float n : {0.0f, 0.0f, 1.0f}) put(std::bit_cast<std::uint32_t>(n));
        for (float v : c) put(std::bit_cast<std::uint32_t>(v));
        out.append(2, '\0');
    }
    return out;
}

// A regular grid of n x n points in the plane z = 0, two facets per cell.
std::vector<Corners> Grid(int n)
{
    std::vector<Corners> facets;
    for (float y = 0; y + 1 < n; ++y)
        for (float x = 0; x + 1 < n; ++x) {
            facets.push_back({x, y, 0, x + 1, y, 0, x, y + 1, 0});
            facets.push_back({x + 1, y, 0, x + 1, y + 1, 0, x, y + 1, 0});
        }
    return facets;
}

std::string TextFacet(const std::string& a, const std::string& b, const std::string& c)
{
    return "  facet normal 0 0 1\n    outer loop\n      vertex " + a + "\n      vertex " + b + "\n      vertex " + c +
           "\n    endloop\n  endfacet\n";
}

long OpenDescriptors() { return std::distance(std::filesystem::directory_iterator("/proc/self/fd"), {}); }

class StlReaderTest : public zontest::FilesTest {
protected:
    std::shared_ptr<ZonCloudReadStl> Reader(const std::string& bytes)
    {
        const std::string path = Write("f" + std::to_string(files_++) + ".stl", bytes);
        return std::make_shared<ZonCloudReadStl>(ZonUnicodeString(path));
    }

    // Reads the whole mesh through the polygon protocol.
    struct Mesh {
        Floats vertices;
        Indices triangles;
    };
    static Mesh Read(ZonCloudReadStl& reader)
    {
        reader.BeginGetPolygon();
        EXPECT_TRUE(reader.NextPolygon());
        unsigned nv = 0, nt = 0;
        const float* v = reader.GetPolygonPoints(nv);
        const unsigned* t = reader.GetTriangles(nt);
        EXPECT_FALSE(reader.NextPolygon());
        return {Floats(v, v + 3 * nv), Indices(t, t + 3 * nt)};
    }

    // "key/severity" of the error the reader raises when read, and checks that the file was closed.
    std::string ErrorOf(const std::string& bytes)
    {
        const long before = OpenDescriptors();
        auto reader = Reader(bytes);
        const std::string key = zontest::ErrorKeyAndSeverity([&] { Read(*reader); });
        EXPECT_EQ(OpenDescriptors(), before) << "stream left open on " << key;
        return key;
    }

    int files_ = 0;
};

TEST_F(StlReaderTest, EveryFormGivesTheMergedMesh)
{
    const Floats square{0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0}, triangle{0, 0, 0, 2, 0, 0, 0, 2, 0};
    const Indices two{0, 1, 2, 1, 3, 2}, one{0, 1, 2};
    const std::string plain = "solid t\n" + TextFacet("0 0 0", "1 0 0", "0 1 0") +
                              TextFacet("1 0 0", "1 1 0", "0 1 0") + "endsolid t\n";
    const std::string commas = "solid t\n" + TextFacet("0,0 0,0 0,0", "1,5 0,0 0,0", "0,0 1,25 0,0") +
                               TextFacet("1,5 0,0 0,0", "1,5 1,25 0,0", "0,0 1,25 0,0") + "endsolid\n";
    const std::string upper = "SOLID T\nFACET NORMAL 0 0 1\nOUTER LOOP\nVERTEX 0 0 0\nVERTEX 2 0 0\nVERTEX 0 2 0\n";
    // Three unreadable vertex lines in a row are skipped.
    const std::string garbage = "solid\n" + TextFacet("0 0 0", "1 0 0", "0 1 0") +
                                "vertex a b c\nvertex 1 2\nvertex -\n" + TextFacet("0 0 0", "2 0 0", "0 2 0");
    // A line ends at a NUL, as a C string does: the vertex behind it is not read.
    const std::string nul = "solid\n" + std::string("x\0vertex 9 9 9\n", 16) + TextFacet("0 0 0", "2 0 0", "0 2 0");
    std::string early = "solid\n";  // the first vertex line is line 100: still text
    for (int i = 0; i < 96; ++i) early += "comment\n";

    const struct {
        const char* what;
        std::string bytes;
        bool text;
        Floats vertices;
        Indices triangles;
    } cases[] = {
        {"binary with a solid header", Binary(Grid(2), {}, false, "solid made by a binary writer"), false, square, two},
        // Normals are read past, never swapped: only the vertices must come back.
        {"binary in the reversed byte order", Binary(Grid(2), {}, true), false, square, two},
        {"text", plain, true, square, two},
        {"decimal commas", commas, true, {0, 0, 0, 1.5f, 0, 0, 0, 1.25f, 0, 1.5f, 1.25f, 0}, two},
        {"upper case", upper, true, triangle, one},
        {"3k+1 vertex lines", plain + "vertex 9 9 9\n", true, square, two},
        {"NUL in a line", nul, true, triangle, one},
        {"some garbage", garbage, true, {0, 0, 0, 1, 0, 0, 0, 1, 0, 2, 0, 0, 0, 2, 0}, {0, 1, 2, 0, 3, 4}},
        {"vertex at line 100", early + TextFacet("0 0 0", "2 0 0", "0 2 0"), true, triangle, one},
    };
    for (const auto& c : cases) {
        auto reader = Reader(c.bytes);
        EXPECT_EQ(reader->IsTextFile(), c.text) << c.what;
        const Mesh mesh = Read(*reader);
        EXPECT_EQ(mesh.vertices, c.vertices) << c.what;
        EXPECT_EQ(mesh.triangles, c.triangles) << c.what;
    }
}

TEST_F(StlReaderTest, BinaryProtocolAndByteOrderOption)
{
    auto reader = Reader(Binary(Grid(2)));
    EXPECT_THROW(reader->NextPolygon(), ZonError);  // before BeginGetPolygon
    EXPECT_EQ(zontest::ErrorKeyAndSeverity([&] { reader->SetBinaryFrom(3); }), "ZonCloudReadNLSTool.ERR_Failure/2");
    EXPECT_EQ(reader->GetTypeOfDigitization(), DigitizationPolygons);
    EXPECT_EQ(reader->GetNumberOfTriangles(), 2u);
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(0, 1, 0, 1, 0, 0)));
    reader->SetBinaryFrom(ZonICloudReadOptBinMachine::Differ);
    const Mesh first = Read(*reader);
    EXPECT_EQ(reader->GetNumberOfPoints(), 4);
    int from = -1;
    reader->GetBinaryFrom(from);
    EXPECT_EQ(from, ZonICloudReadOptBinMachine::Current);  // detection has the last word
    // A change after reading makes the reader analyse and read again.
    reader->SetBinaryFrom(ZonICloudReadOptBinMachine::Differ);
    EXPECT_EQ(Read(*reader).vertices, first.vertices);
    reader->BeginGetPolygon();
    ASSERT_TRUE(reader->NextPolygon());
    int walked = 0;
    while (reader->NextTriangle()) ++walked;
    EXPECT_EQ(walked, 2);

    std::vector<Corners> facets = Grid(5);
    facets[3][4] = -2.75f;
    auto reversed = Reader(Binary(facets, {}, true));
    EXPECT_EQ(Read(*reversed).vertices, Read(*Reader(Binary(facets))).vertices);
    reversed->GetBinaryFrom(from);
    EXPECT_EQ(from, ZonICloudReadOptBinMachine::Differ);
}

TEST_F(StlReaderTest, CountWordIsOnlyABound)
{
    const struct {
        std::int32_t count;
        std::size_t facets, cut;  // facets in the file, bytes cut off its end
        unsigned expected;        // triangles read
    } cases[] = {
        {1000, 12, 0, 12},                                      // a 684-byte file: capped by the size
        {std::numeric_limits<std::int32_t>::max(), 12, 0, 12},  // capped by the size too
        {-5, 12, 0, 12},                                        // both readings negative: the size decides
        {7, 12, 0, 7},                                          // fewer announced than held
        // The other reading is negative and no whole record fits: the count is
        // kept as it is, and a record without its attribute word still counts.
        {128, 1, 2, 1},
    };
    for (const auto& c : cases) {
        std::vector<Corners> facets = Grid(4);
        facets.resize(c.facets);
        std::string bytes = Binary(facets, c.count);
        bytes.resize(bytes.size() - c.cut);
        EXPECT_EQ(Read(*Reader(bytes)).triangles.size(), 3u * c.expected) << "count " << c.count;
    }
}

TEST_F(StlReaderTest, BrokenFilesRaiseTheirErrorWithTheStreamClosed)
{
    const std::string good = Binary(Grid(3));
    std::vector<Corners> flat = Grid(3), huge = Grid(3);
    for (Corners& c : flat) c.fill(5.0f);                                // every vertex the same point
    huge[0] = {-3e13f, -3e13f, -3e13f, 3e13f, 3e13f, 3e13f, 0, 0, 0};  // extents whose product overflows a float
    const std::string one = Binary({Grid(2)[0]}, 128);
    const std::string facet = TextFacet("0 0 0", "1 0 0", "0 1 0");
    std::string late = "solid\ncomment\n";  // the first vertex line is line 101: binary, and no mesh
    for (int i = 0; i < 96; ++i) late += "comment\n";

    const struct {
        const char* what;
        std::string bytes;
        const char* key;
    } cases[] = {
        // Severity 4: content errors and failed opens; 2: input errors, the implausible binary data too.
        {"empty file", "", "ZonCloudOperErrorTool.ERR_ENODATA/4"},
        {"no count word", good.substr(0, 82), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"no whole record", good.substr(0, 84 + 47), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"record cut in its floats", one.substr(0, one.size() - 3), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"count 0", Binary(Grid(3), 0), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"all vertices equal", Binary(flat), "ZonCloudReadNLSTool.ERR_UnknownData/2"},
        {"absurd box", Binary(huge), "ZonCloudReadNLSTool.ERR_UnknownData/2"},
        {"vertex at line 101", late + facet, "ZonCloudReadNLSTool.ERR_UnknownData/2"},
        {"four garbage vertex lines in a row", "solid\n" + facet + "vertex a\nvertex b\nvertex c\nvertex d\n" + facet,
         "ZonCloudReadNLSTool.ERR_TooManyUnknownData/4"},
        {"only garbage", "solid\nvertex x y z\nendsolid\n", "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"two vertices, no triangle", "solid\nvertex 0 0 0\nvertex 1 1 1\n", "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
    };
    for (const auto& c : cases) EXPECT_EQ(ErrorOf(c.bytes), c.key) << c.what;
}

TEST_F(StlReaderTest, MergingFollowsFloatingPointEquality)
{
    std::vector<Corners> facets = Grid(40);  // far apart: the first and the last facet share no vertex, but
    facets.push_back({0, 0, 0, 39, 39, 0, 0, 39, 0});  // this one shares three with early facets
    facets.push_back({-0.0f, 0, -0.0f, 1, 0, 0, kNaN, 0, 0});
    facets.push_back({kNaN, 0, 0, 1, 0, 0, 0, 1, 0});
    const Mesh mesh = Read(*Reader(Binary(facets)));
    const unsigned grid = 40 * 40;
    ASSERT_EQ(mesh.triangles.size(), 3 * facets.size());
    // The far facet takes the file's first vertices; -0.0 is 0.0; a NaN is a vertex of its own, every time.
    const Indices tail(mesh.triangles.end() - 9, mesh.triangles.end());
    EXPECT_EQ((Indices{tail[0], tail[1], tail[3], tail[4], tail[5], tail[6]}),
              (Indices{0, grid - 1, 0, 1, grid, grid + 1}));
    EXPECT_EQ(mesh.vertices.size(), 3u * (grid + 2));
}

TEST_F(StlReaderTest, DoublePrecisionKeepsTextDigits)
{
    const std::string text =
        "solid\n" + TextFacet("0 0 0", "1 0 0", "0 1 0") + TextFacet("0.10000000001 0 0", "0.1 0 0", "0 1 0");
    EXPECT_EQ(Read(*Reader(text)).vertices.size(), 3u * 4);  // the two near values are one float
    auto precise = Reader(text);
    precise->SetDoublePrecision(true);
    precise->BeginGetPolygon();
    precise->NextPolygon();
    const std::vector<double> v = zontest::PointsOf(*precise);
    ASSERT_EQ(v.size(), 3u * 5);
    EXPECT_EQ(v[9], 0.10000000001);
    EXPECT_EQ(v[12], 0.1);
}

TEST_F(StlReaderTest, SubBoxKeepsTrianglesWithAllVerticesInside)
{
    auto reader = Reader(Binary(Grid(3)));  // points 0..2 on x and y, z = 0: a flat box
    unsigned count = 0, nv = 0;
    const float* vertices = nullptr;
    ZonMathBox all;  // the file's own box: the whole mesh
    reader->GetBoundingBox(all);
    reader->GetTrianglesInBox(all, count, vertices, nv);
    EXPECT_EQ(count, 8u);
    EXPECT_EQ(nv, 9u);

    // x in [0, 1]: the upper face x = 1 is open, so only x = 0 points are
    // inside and no triangle; x in [1, 2]: the face x = 2 is the file's, closed.
    reader->GetTrianglesInBox(ZonMathBox(0, 1, 0, 2, 0, 0), count, vertices, nv);
    EXPECT_EQ(count, 0u);
    EXPECT_EQ(Floats(vertices, vertices + 3 * nv), (Floats{0, 0, 0, 0, 1, 0, 0, 2, 0}));

    const unsigned* t = reader->GetTrianglesInBox(ZonMathBox(1, 2, 0, 2, 0, 0), count, vertices, nv);
    ASSERT_EQ(count, 4u);
    EXPECT_EQ(Floats(vertices, vertices + 3 * nv), (Floats{1, 0, 0, 1, 1, 0, 2, 0, 0, 2, 1, 0, 1, 2, 0, 2, 2, 0}));
    EXPECT_EQ(Indices(t, t + 12), (Indices{0, 2, 1, 2, 3, 1, 1, 3, 4, 3, 5, 4}));
    unsigned walked = 0;
    while (reader->NextTriangleInBox()) ++walked;
    EXPECT_EQ(walked, 4u);
    // The same box again is answered from the cache; a box beside the mesh holds nothing.
    EXPECT_EQ(reader->GetTrianglesInBox(ZonMathBox(1, 2, 0, 2, 0, 0), count, vertices, nv), t);
    reader->GetTrianglesInBox(ZonMathBox(5, 6, 5, 6, 0, 1), count, vertices, nv);
    EXPECT_EQ(count + nv, 0u);
}

TEST_F(StlReaderTest, FactoryAppliesTheSettings)
{
    auto& settings = ZonCldSettings::Instance();
    settings.SetInt("BinaryFrom", 2);
    settings.SetBool("ImportSTLFacets", false);
    settings.SetBool("CreateFreeEdges", true);
    auto reader = ZonCldImporter::GetFactory(ZonUnicodeString("STL"))->CreateReader(ZonUnicodeString(Path("any.stl")));
    settings.ResetAll();
    auto stl = std::dynamic_pointer_cast<ZonCloudReadStl>(reader);
    ASSERT_TRUE(stl);
    int from = 0;
    bool create = true, free = false;
    stl->GetBinaryFrom(from);
    stl->GetTriangles(create);
    stl->GetFreeEdges(free);
    EXPECT_EQ(from, 2);
    EXPECT_FALSE(create);
    EXPECT_TRUE(free);
}

}  // namespace
