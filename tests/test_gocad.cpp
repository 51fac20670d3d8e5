// The GoCad surface reader: surfaces merged with their own numbering, atoms,
// control nodes, what is skipped, parts, box queries, the tool's view.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include <string>
#include <vector>

#include "ZonCloudReadGoCad.h"
#include "ZonCloudReadStl.h"
#include "ZonTestFiles.h"

namespace {

using Floats = std::vector<float>;
using Indices = std::vector<unsigned>;
using zontest::ErrorKey;

struct GoCad {
    explicit GoCad(std::string bytes, bool inDouble = false) : text(std::move(bytes))
    {
        reader.SetSourceMemory(text.data(), text.size());
        reader.SetDoublePrecision(inDouble);
    }
    Indices Triangles()
    {
        reader.BeginGetPolygon();
        EXPECT_TRUE(reader.NextPolygon());
        unsigned n = 0;
        const unsigned* t = reader.GetTriangles(n);
        return Indices(t, t + 3 * n);
    }
    std::vector<std::pair<std::string, unsigned>> Parts()
    {
        std::vector<std::pair<std::string, unsigned>> parts;
        for (const ZonCloudPolygonPart& part : reader.GetPolygonParts()) parts.emplace_back(part.name, part.end);
        return parts;
    }
    std::string text;
    ZonCloudReadGoCad reader{ZonUnicodeString("memory.ts")};
};

std::string Surface(const std::string& name, const std::string& body)
{
    return "GOCAD TSurf 1\nHEADER {\nname:" + name + "\n}\nTFACE\n" + body + "END\n";
}

const std::string kTriangle = "VRTX 1 0 0 0\nVRTX 2 1 0 0\nVRTX 3 0 1 0\nTRGL 1 2 3\n";

TEST(GoCadReader, MergesSurfacesEachNumberedFromOne)
{
    const std::string text = Surface("first",
                                     "VRTX 1 0 0 0\nVRTX 2 1 0 0\nVRTX 3 0 1 0 CNXYZ\nATOM 4 2\n"
                                     "TRGL 1 2 3\nTRGL 1 4 3\nTRGL 3 2 4\n") +
                             "GOCAD PLine 1\nVRTX 1 5 5 5\nSEG 1 2\nEND\n" + Surface("second", kTriangle);
    GoCad file(text);
    EXPECT_EQ(file.Triangles(), (Indices{0, 1, 2, 0, 1, 2, 2, 1, 1, 3, 4, 5}));
    unsigned n = 0;
    const float* v = file.reader.GetPolygonPoints(n);
    EXPECT_EQ(Floats(v, v + 3 * n), (Floats{0, 0, 0, 1, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 1, 0}));
    EXPECT_EQ(file.Parts(), (std::vector<std::pair<std::string, unsigned>>{{"first", 3}, {"second", 4}}));
    EXPECT_EQ(file.reader.GetVertexLabels(), (std::vector<std::string>{"", "", "CNXYZ", "", "", ""}));
    EXPECT_EQ(file.reader.GetNumberOfControlNodes(), 1u);
}

struct Case {
    const char* name;
    std::string text;
    Indices triangles;
    std::vector<std::pair<std::string, unsigned>> parts;
};

TEST(GoCadReader, SkipsWhatIsNotItsOwn)
{
    const Case cases[] = {
        {"END_ lines and comments do not end a surface",
         "GOCAD TSurf 1\nname:a\nEND_ORIGINAL_COORDINATE_SYSTEM\n# END\n" + kTriangle + "END\n", {0, 1, 2}, {{"a", 1}}},
        {"a surface without triangles after another adds no part",
         Surface("a", kTriangle) + Surface("b", "VRTX 1 0 0 0\n"), {0, 1, 2}, {{"a", 1}}},
        {"the first surface adds a part even without triangles",
         Surface("a", "VRTX 1 0 0 0\n") + Surface("b", kTriangle), {1, 2, 3}, {{"a", 0}, {"b", 1}}},
        {"numbers outside the surface's map, or never given, are skipped",
         Surface("a", kTriangle + "VRTX 99 1 1 1\nTRGL 1 2 99\nTRGL 1 2 4\nATOM 4 77\nTRGL 1 2 -1\n"), {0, 1, 2},
         {{"a", 1}}},
        {"lines outside surfaces and a surface without END", "VRTX 1 0 0 0\nTRGL 1 1 1\nGOCAD TSurf 1\n" + kTriangle,
         {0, 1, 2}, {{"", 1}}},
        {"a name holding END ends its surface", "GOCAD TSurf 1\n" + kTriangle + "name:THE_END\nTRGL 1 2 3\n",
         {0, 1, 2}, {{"THE_END", 1}}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        GoCad file(c.text);
        EXPECT_EQ(file.Triangles(), c.triangles);
        EXPECT_EQ(file.Parts(), c.parts);
        EXPECT_TRUE(file.reader.GetVertexLabels().empty());
    }
}

TEST(GoCadReader, NoVertexOrNoTriangleIsAnError)
{
    GoCad none("GOCAD TSurf 1\nTRGL 1 2 3\nEND\nVRTX 1 0 0 0\n");
    EXPECT_EQ(ErrorKey([&] { none.reader.GetTypeOfDigitization(); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
    GoCad flat(Surface("a", "VRTX 1 0 0 0\n"));
    EXPECT_EQ(flat.reader.GetTypeOfDigitization(), DigitizationPolygons);
    EXPECT_EQ(ErrorKey([&] { flat.reader.BeginGetPolygon(); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
}

TEST(GoCadReader, ReadsInThePrecisionAskedAndAnswersBoxQueries)
{
    const std::string text = Surface("a", "VRTX 1 0.1 0 0\nVRTX 2 1 0 0\nVRTX 3 0 1 0\nVRTX 4 1 1 0\n"
                                          "TRGL 1 2 3\nTRGL 2 4 3\n");
    GoCad inDouble(text, true);
    unsigned n = 0;
    EXPECT_EQ(inDouble.reader.GetPointsDouble(n)[0], 0.1);
    EXPECT_EQ(inDouble.reader.GetPoints(n)[0], 0.1f);

    GoCad file(text);
    file.Triangles();
    ZonMathBox box;
    file.reader.GetBoundingBox(box);
    unsigned count = 0, inside = 0;
    const float* vertices = nullptr;
    // The left half holds two corners and no whole triangle.
    const unsigned* kept = file.reader.GetTrianglesInBox(ZonMathBox(0, 0.5, 0, 1, 0, 0), count, vertices, inside);
    EXPECT_EQ(count, 0u);
    EXPECT_EQ(inside, 2u);
    kept = file.reader.GetTrianglesInBox(box, count, vertices, inside);
    EXPECT_EQ(Indices(kept, kept + 3 * count), (Indices{0, 1, 2, 1, 3, 2}));
    EXPECT_EQ(inside, 4u);
}

class GoCadFiles : public zontest::FilesTest {};

TEST_F(GoCadFiles, DumpShowsSurfacesAndConvertWritesTheMergedMesh)
{
    const std::string path =
        Write("two.ts", Surface("first", "VRTX 1 0 0 0\nVRTX 2 1 0 0\nVRTX 3 0 1 0 CNXYZ\nTRGL 1 2 3\n") +
                            Surface("second", "VRTX 1 0 0 1\nVRTX 2 1 0 1\nVRTX 3 0 1 1\nTRGL 1 2 3\n"));
    const zontest::ToolRun dump = Run("dump --json " + zontest::Quote(path));
    ASSERT_EQ(dump.status, 0) << dump.err;
    const nlohmann::json polygon = nlohmann::json::parse(dump.out)["polygons"][0];
    EXPECT_EQ(polygon["surfaces"], nlohmann::json::parse(R"([{"name":"first","end":1},{"name":"second","end":2}])"));
    EXPECT_EQ(polygon["labels"], nlohmann::json::parse(R"(["","","CNXYZ","","",""])"));

    const zontest::ToolRun convert = Run("convert " + zontest::Quote(path) + " " + zontest::Quote(Path("out.stl")));
    ASSERT_EQ(convert.status, 0) << convert.err;
    ZonCloudReadStl stl{ZonUnicodeString(Path("out.stl"))};
    stl.BeginGetPolygon();
    ASSERT_TRUE(stl.NextPolygon());
    unsigned triangles = 0, vertices = 0;
    stl.GetTriangles(triangles);
    stl.GetPolygonPoints(vertices);
    EXPECT_EQ(triangles, 2u);
    EXPECT_EQ(vertices, 6u);
}

}  // namespace
