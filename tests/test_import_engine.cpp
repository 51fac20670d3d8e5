// The host import engine: its walk over readers of every type, through the
// reader interfaces only, and what it does with the box, scale and unit.
#include <gtest/gtest.h>

#include "MemoryReaders.h"
#include "ZonCldImportEngine.h"
#include "ZonError.h"

namespace {

struct Import {
    ZonCldBody_var body;
    std::vector<std::string> messages;
    std::string statistics;
};

struct Settings {
    bool doublePrecision = false;
    ZonICkeUnit_var unit = ZonICkeUnit::FromName("mm");
    ZonMathBox box;
    double scale = 1.0;
    bool triangles = true;
};

Import Walk(const std::shared_ptr<ZonICloudReadFile>& reader, const Settings& s = {})
{
    ZonGeoFactoryProtected factory;
    Import result;
    result.body = factory.CreateCldBody();
    ZonCldImportEngine::InsertFile(*result.body, factory, reader, s.doublePrecision, s.unit, s.box, s.scale,
                                   result.messages, result.statistics, s.triangles);
    return result;
}

std::vector<float> Floats(const ZonCldPointArray& points)
{
    std::vector<float> v;
    for (std::size_t i = 0; i < points.GetNumberOfPoints(); ++i) {
        const ZonMathPoint p = points.GetPoint(i);
        v.insert(v.end(), {float(p[0]), float(p[1]), float(p[2])});
    }
    return v;
}

// Points (i, 2i, 3i) for i = 0 .. n-1.
std::vector<float> Line(int n, float start = 0)
{
    std::vector<float> v;
    for (int i = 0; i < n; ++i) v.insert(v.end(), {start + i, 2 * (start + i), 3 * (start + i)});
    return v;
}

MemoryContent CloudContent()
{
    MemoryContent c;
    c.points = Line(4);
    c.colors = {10, 11, 12, 20, 21, 22, 30, 31, 32, 40, 41, 42};
    c.alphas = {1, 2, 3, 4};
    c.symbols = {5, 6, 7, 8};
    c.texts = {"a", "b", "c", "d"};
    return c;
}

TEST(ImportEngine, CloudKeepsPointsColoursAndAttributes)
{
    const Import r = Walk(std::make_shared<MemoryReader>("f", CloudContent()));
    ASSERT_EQ(r.body->GetClouds().size(), 1u);
    const ZonCldCloud& cloud = *r.body->GetClouds()[0];
    EXPECT_EQ(Floats(cloud.Points()), Line(4));
    EXPECT_FALSE(cloud.Points().IsDoublePrecision());
    EXPECT_EQ(cloud.Colors(), CloudContent().colors);
    EXPECT_EQ(cloud.Alphas(), (std::vector<std::int32_t>{1, 2, 3, 4}));
    EXPECT_EQ(cloud.Symbols(), (std::vector<std::int32_t>{5, 6, 7, 8}));
    ASSERT_EQ(cloud.Texts().size(), 4u);
    EXPECT_EQ(cloud.Texts()[3].ToUtf8(), "d");
    EXPECT_EQ(r.body->GetTypeOfDigitization(), 1);
    EXPECT_TRUE(r.body->GetSetsOfScans().empty());
}

TEST(ImportEngine, BoxClipsWithTheReadersQueryAndNarrowsPerPointArrays)
{
    Settings s;
    s.box = ZonMathBox(1, 2.5, 0, 10, 0, 10);  // x in [1, 2.5): points 1 and 2
    const Import r = Walk(std::make_shared<MemoryReader>("f", CloudContent()), s);
    ASSERT_EQ(r.body->GetClouds().size(), 1u);
    const ZonCldCloud& cloud = *r.body->GetClouds()[0];
    EXPECT_EQ(Floats(cloud.Points()), Line(2, 1));
    EXPECT_EQ(cloud.Colors(), (std::vector<unsigned char>{20, 21, 22, 30, 31, 32}));
    EXPECT_EQ(cloud.Alphas(), (std::vector<std::int32_t>{2, 3}));
    ASSERT_EQ(cloud.Texts().size(), 2u);
    EXPECT_EQ(cloud.Texts()[0].ToUtf8(), "b");
}

TEST(ImportEngine, PerPointArraysOfAnotherLengthAreLeftOut)
{
    MemoryContent c = CloudContent();
    c.colors.resize(9);  // three colours for four points
    c.texts.pop_back();
    const Import r = Walk(std::make_shared<MemoryReader>("f", c));
    const ZonCldCloud& cloud = *r.body->GetClouds()[0];
    EXPECT_TRUE(cloud.Colors().empty());
    EXPECT_TRUE(cloud.Texts().empty());
    EXPECT_EQ(cloud.Alphas().size(), 4u);
}

TEST(ImportEngine, ScaleAndUnitConvertToMillimetres)
{
    struct Case {
        const char* settingUnit;
        const char* fileUnit;  // the reader's own, or null
        double scale;
        double factor;
        const char* unitName;
    };
    const Case cases[] = {
        {"mm", nullptr, 1.0, 1.0, "mm"},
        {"Inch", nullptr, 1.0, 25.4, "Inch"},
        {"mm", nullptr, 0.5, 0.5, "mm"},
        {"m", nullptr, 2.0, 2000.0, "m"},
        {"mm", "Inch", 1.0, 25.4, "Inch"},  // a file that carries its unit wins over the setting
        {"m", "mm", 3.0, 3.0, "mm"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.settingUnit) + " " + (c.fileUnit ? c.fileUnit : "-"));
        MemoryContent content;
        content.points = {1, 2, 3, -4, 0.5f, 8};
        if (c.fileUnit) content.unit = ZonICkeUnit::FromName(c.fileUnit);
        Settings s;
        s.unit = ZonICkeUnit::FromName(c.settingUnit);
        s.scale = c.scale;
        const Import r = Walk(std::make_shared<MemoryReader>("f", content), s);
        const ZonCldPointArray& points = r.body->GetClouds()[0]->Points();
        EXPECT_FLOAT_EQ(points.GetPoint(1)[0], float(-4 * c.factor));
        EXPECT_FLOAT_EQ(points.GetPoint(1)[1], float(0.5 * c.factor));
        EXPECT_FLOAT_EQ(points.GetPoint(0)[2], float(3 * c.factor));
        EXPECT_EQ(r.body->GetUnitName(), c.unitName);
    }
}

TEST(ImportEngine, DoublePrecisionOnlyWhenAskedAndOffered)
{
    MemoryContent content;
    content.points = {1, 2, 3};
    content.hasDouble = true;
    content.doubleOffset = 0.25;  // the double array differs from the float one
    Settings s;
    s.doublePrecision = true;
    Import r = Walk(std::make_shared<MemoryReader>("f", content), s);
    const ZonCldPointArray& doubles = r.body->GetClouds()[0]->Points();
    EXPECT_TRUE(doubles.IsDoublePrecision());
    EXPECT_EQ(doubles.GetPoint(0)[0], 1.25);

    s.doublePrecision = false;
    r = Walk(std::make_shared<MemoryReader>("f", content), s);
    EXPECT_FALSE(r.body->GetClouds()[0]->Points().IsDoublePrecision());
    EXPECT_EQ(r.body->GetClouds()[0]->Points().GetPoint(0)[0], 1.0);

    content.hasDouble = false;  // asked for, but the reader has single precision only
    s.doublePrecision = true;
    r = Walk(std::make_shared<MemoryReader>("f", content), s);
    EXPECT_FALSE(r.body->GetClouds()[0]->Points().IsDoublePrecision());
    EXPECT_EQ(r.body->GetNumberOfPoints(), 1u);
}

MemoryContent ScanContent()
{
    MemoryContent c;
    c.type = 2;
    c.sets = {{Line(3), {}, Line(2, 10)}, {Line(4, 20)}};  // the second scan of the first set is empty
    return c;
}

TEST(ImportEngine, ScansAreWalkedSetBySetAndEmptyScansLeftOut)
{
    const Import r = Walk(std::make_shared<MemoryReader>("f", ScanContent()));
    ASSERT_EQ(r.body->GetSetsOfScans().size(), 2u);
    const auto& first = r.body->GetSetsOfScans()[0]->GetScans();
    ASSERT_EQ(first.size(), 2u);
    EXPECT_EQ(Floats(first[0]->Points()), Line(3));
    EXPECT_EQ(Floats(first[1]->Points()), Line(2, 10));
    EXPECT_EQ(Floats(r.body->GetSetsOfScans()[1]->GetScans()[0]->Points()), Line(4, 20));
    EXPECT_TRUE(r.body->GetClouds().empty());
    EXPECT_EQ(r.body->GetNumberOfPoints(), 9u);
}

TEST(ImportEngine, ScanBoxDropsScansWithNothingInside)
{
    Settings s;
    s.box = ZonMathBox(9, 21.5, -100, 100, -100, 100);
    s.doublePrecision = true;  // the reader has no double precision: single is used
    Import r = Walk(std::make_shared<MemoryReader>("f", ScanContent()), s);
    ASSERT_EQ(r.body->GetSetsOfScans().size(), 2u);
    ASSERT_EQ(r.body->GetSetsOfScans()[0]->GetNumberOfScans(), 1u);
    EXPECT_EQ(Floats(r.body->GetSetsOfScans()[0]->GetScans()[0]->Points()), Line(2, 10));
    EXPECT_EQ(Floats(r.body->GetSetsOfScans()[1]->GetScans()[0]->Points()), Line(2, 20));

    MemoryContent c = ScanContent();
    c.hasDouble = true;
    c.doubleOffset = 0.25;  // now it has: the double scans are taken
    r = Walk(std::make_shared<MemoryReader>("f", c), s);
    const ZonCldPointArray& points = r.body->GetSetsOfScans()[1]->GetScans()[0]->Points();
    EXPECT_TRUE(points.IsDoublePrecision());
    EXPECT_EQ(points.GetPoint(0)[0], 20.25);
    EXPECT_EQ(points.GetNumberOfPoints(), 2u);
}

MemoryContent GridContent()
{
    MemoryContent c;
    c.type = 3;
    // Grid 1: two rows of three, a hole in the second row. Grid 2: one row, no validity array.
    c.grids = {{{Line(3), {}}, {Line(3, 5), {1, 0, 1}}}, {{Line(2, 30), {}}}};
    return c;
}

TEST(ImportEngine, GridsKeepRowsAndHoles)
{
    const Import r = Walk(std::make_shared<MemoryReader>("f", GridContent()));
    ASSERT_EQ(r.body->GetSetsOfGrids().size(), 1u);
    const auto& grids = r.body->GetSetsOfGrids()[0]->GetGrids();
    ASSERT_EQ(grids.size(), 2u);
    ASSERT_EQ(grids[0]->GetNumberOfRows(), 2u);
    EXPECT_EQ(grids[0]->GetRows()[0].valid, (std::vector<unsigned char>{1, 1, 1}));
    EXPECT_EQ(grids[0]->GetRows()[1].valid, (std::vector<unsigned char>{1, 0, 1}));
    EXPECT_EQ(Floats(grids[0]->GetRows()[1].points), Line(3, 5));
    EXPECT_EQ(grids[1]->GetNumberOfRows(), 1u);
    EXPECT_EQ(r.body->GetNumberOfPoints(), 7u);  // holes are not points
    EXPECT_EQ(r.body->GetNumberOfGrids(), 2u);
}

TEST(ImportEngine, GridBoxTurnsOutsidePointsIntoHoles)
{
    Settings s;
    s.box = ZonMathBox(1, 6.5, -100, 100, -100, 100);
    const Import r = Walk(std::make_shared<MemoryReader>("f", GridContent()), s);
    const auto& grids = r.body->GetSetsOfGrids()[0]->GetGrids();
    EXPECT_EQ(grids[0]->GetRows()[0].valid, (std::vector<unsigned char>{0, 1, 1}));
    EXPECT_EQ(grids[0]->GetRows()[1].valid, (std::vector<unsigned char>{1, 0, 0}));
    EXPECT_EQ(grids[0]->GetRows()[1].points.GetNumberOfPoints(), 3u);  // rows keep their length
    EXPECT_EQ(grids[1]->GetRows()[0].valid, (std::vector<unsigned char>{0, 0}));
    EXPECT_EQ(r.body->GetNumberOfPoints(), 3u);
}

MemoryContent MeshContent()
{
    MemoryContent c;
    c.type = 4;
    // A unit square in z = 0 made of two triangles, and a lone triangle at x = 5..6.
    c.meshes = {{{0, 0, 0, 1, 0, 0, 1, 1, 0, 0, 1, 0}, {0, 1, 2, 0, 2, 3}}, {{5, 0, 0, 6, 0, 0, 6, 1, 0}, {0, 1, 2}}};
    return c;
}

TEST(ImportEngine, PolygonsWithAndWithoutTriangles)
{
    const auto reader = std::make_shared<MemoryReader>("f", MeshContent());
    Import r = Walk(reader);
    ASSERT_EQ(r.body->GetPolygons().size(), 2u);
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2, 0, 2, 3}));
    EXPECT_EQ(r.body->GetPolygons()[1]->GetNumberOfVertices(), 3u);
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 3u);

    Settings s;
    s.triangles = false;
    r = Walk(std::make_shared<MemoryReader>("f", MeshContent()), s);
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 0u);
    EXPECT_EQ(r.body->GetNumberOfPoints(), 7u);
}

TEST(ImportEngine, PolygonBoxUsesTheReadersSubMesh)
{
    Settings s;
    s.box = ZonMathBox(-1, 1, -1, 2, -1, 1);  // x < 1: vertices 0 and 3 of the square only
    Import r = Walk(std::make_shared<MemoryReader>("f", MeshContent()), s);
    ASSERT_EQ(r.body->GetPolygons().size(), 1u);  // the lone triangle has nothing inside
    EXPECT_EQ(r.body->GetPolygons()[0]->GetNumberOfVertices(), 2u);
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 0u);

    s.box = ZonMathBox(-1, 6, -1, 1, -1, 1);  // x and y upper faces closed on the file's highs
    r = Walk(std::make_shared<MemoryReader>("f", MeshContent()), s);
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2, 0, 2, 3}));
    EXPECT_EQ(r.body->GetPolygons()[1]->GetNumberOfVertices(), 3u);
}

TEST(ImportEngine, TrianglesPastTheVerticesAreLeftOutWithANote)
{
    MemoryContent c = MeshContent();
    c.meshes[0].triangles = {0, 1, 2, 0, 2, 4};
    const Import r = Walk(std::make_shared<MemoryReader>("f", c));
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2}));
    ASSERT_EQ(r.messages.size(), 1u);
    EXPECT_NE(r.messages[0].find(": 1"), std::string::npos);
}

TEST(ImportEngine, AReaderWithoutTheInterfaceOfItsTypeIsReadAsACloud)
{
    const std::pair<MemoryContent, std::size_t> cases[] = {{ScanContent(), 9}, {GridContent(), 8}, {MeshContent(), 7}};
    for (const auto& [content, points] : cases) {
        const Import r = Walk(std::make_shared<MemoryCloudReader>("f", content));
        ASSERT_EQ(r.body->GetClouds().size(), 1u);
        EXPECT_EQ(r.body->GetNumberOfPoints(), points);
        EXPECT_EQ(r.body->GetTypeOfDigitization(), content.type);
    }
}

TEST(ImportEngine, StatisticsNameWhatWasCreated)
{
    Settings s;
    s.scale = 2.0;
    const Import r = Walk(std::make_shared<MemoryReader>("f", ScanContent()), s);
    EXPECT_NE(r.statistics.find("  Points: 9\n"), std::string::npos) << r.statistics;
    EXPECT_NE(r.statistics.find("  Sets of scans: 2\n"), std::string::npos);
    EXPECT_NE(r.statistics.find("  Scans: 3\n"), std::string::npos);
    EXPECT_NE(r.statistics.find("  Unit: mm\n"), std::string::npos);
    EXPECT_NE(r.statistics.find("  Bounding box: 0 0 0 / 46 92 138\n"), std::string::npos);
    EXPECT_EQ(r.statistics.find("Grids"), std::string::npos);
}

TEST(ImportEngine, ReaderErrorsPassThrough)
{
    MemoryContent c = ScanContent();
    c.failInPoints = true;
    try {
        Walk(std::make_shared<MemoryReader>("f", c));
        FAIL() << "no error";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetMessageKey(), "ZonCloudReadNLSTool.ERR_UnknownData");
    }
}

}  // namespace
