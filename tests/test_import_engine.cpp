// The host import engine: its walk over readers of every type, through the
// reader interfaces only, and what it does with the box, scale and unit.
#include <gtest/gtest.h>

#include "MemoryReaders.h"
#include "ZonCldImportEngine.h"
#include "ZonCloudOwnedArrays.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonMsgCatalog.h"
#include "ZonTestFiles.h"

namespace {

using Floats = std::vector<float>;
using Ints = std::vector<std::int32_t>;
using Valid = std::vector<unsigned char>;

struct Import {
    ZonCldBody_var body;
    std::vector<std::string> messages;
    std::string statistics;
};

struct Settings {
    bool doublePrecision = false;
    ZonICkeUnit_var unit = ZonICkeUnit::FromName("mm");
    ZonMathBox box{};
    double scale = 1.0;
};

// The labels the import entry gives the engine.
std::string ModuleLabel(const std::string& key)
{
    return ZonMsgCatalog::Lookup(ZonCloudReadNLSTool::Catalog(), "ZonCldImportBuild.StatWindow." + key);
}

template <class Reader = MemoryReader>
Import Walk(const MemoryContent& content, const Settings& s = {}, const ZonCldStatLabeler& labeler = ModuleLabel)
{
    ZonGeoFactoryProtected factory;
    Import r{factory.CreateCldBody(), {}, {}};
    ZonCldImportEngine::InsertFile(*r.body, factory, std::make_shared<Reader>("f", content), s.doublePrecision, s.unit,
                                   s.box, s.scale, r.messages, r.statistics, true, labeler);
    return r;
}

Floats FloatsOf(const ZonCldPointArray& points)
{
    Floats v;
    for (std::size_t i = 0; i < points.GetNumberOfPoints(); ++i) {
        const ZonMathPoint p = points.GetPoint(i);
        v.insert(v.end(), {float(p[0]), float(p[1]), float(p[2])});
    }
    return v;
}

std::vector<std::string> TextsOf(const ZonCldCloud& cloud)
{
    std::vector<std::string> texts;
    for (std::size_t i = 0; i < cloud.GetNumberOfTexts(); ++i) texts.push_back(cloud.GetText(i).ToUtf8());
    return texts;
}

// Points (i, 2i, 3i) for i = start .. start + n - 1.
Floats Line(int n, float start = 0)
{
    Floats v;
    for (int i = 0; i < n; ++i) v.insert(v.end(), {start + i, 2 * (start + i), 3 * (start + i)});
    return v;
}

MemoryContent CloudContent()
{
    return {.points = Line(4), .colors = {10, 11, 12, 20, 21, 22, 30, 31, 32, 40, 41, 42}, .alphas = {1, 2, 3, 4},
            .symbols = {5, 6, 7, 8}, .texts = {"a", "b", "c", "d"}};
}
// The second scan of the first set is empty.
MemoryContent ScanContent() { return {.type = DigitizationScans, .sets = {{Line(3), {}, Line(2, 10)}, {Line(4, 20)}}}; }
// Grid 1: two rows of three, a hole in the second row. Grid 2: one row, no validity array.
MemoryContent GridContent()
{
    return {.type = DigitizationGrids, .grids = {{{Line(3), {}}, {Line(3, 5), {1, 0, 1}}}, {{Line(2, 30), {}}}}};
}
// A unit square in z = 0 made of two triangles, and a lone triangle at x = 5..6.
MemoryContent MeshContent()
{
    return {.type = DigitizationPolygons,
            .meshes = {{{0, 0, 0, 1, 0, 0, 1, 1, 0, 0, 1, 0}, {0, 1, 2, 0, 2, 3}},
                       {{5, 0, 0, 6, 0, 0, 6, 1, 0}, {0, 1, 2}}}};
}

TEST(ImportEngine, CloudKeepsItsPerPointArraysAndTheBoxNarrowsThem)
{
    Import r = Walk(CloudContent());
    ASSERT_EQ(r.body->GetClouds().size(), 1u);
    const ZonCldCloud* cloud = r.body->GetClouds()[0].get();
    EXPECT_EQ(r.body->GetTypeOfDigitization(), DigitizationCloud);
    EXPECT_EQ(FloatsOf(cloud->Points()), Line(4));
    EXPECT_EQ(cloud->Colors(), CloudContent().colors);
    EXPECT_EQ(cloud->Alphas(), (Ints{1, 2, 3, 4}));
    EXPECT_EQ(cloud->Symbols(), (Ints{5, 6, 7, 8}));
    EXPECT_EQ(TextsOf(*cloud), CloudContent().texts);

    r = Walk(CloudContent(), {.box = ZonMathBox(1, 2.5, 0, 10, 0, 10)});  // x in [1, 2.5): points 1 and 2
    ASSERT_EQ(r.body->GetClouds().size(), 1u);
    cloud = r.body->GetClouds()[0].get();
    EXPECT_EQ(FloatsOf(cloud->Points()), Line(2, 1));
    EXPECT_EQ(cloud->Colors(), (Valid{20, 21, 22, 30, 31, 32}));
    EXPECT_EQ(cloud->Alphas(), (Ints{2, 3}));
    EXPECT_EQ(TextsOf(*cloud), (std::vector<std::string>{"b", "c"}));

    MemoryContent odd = CloudContent();  // arrays of another length than the points are left out
    odd.colors.resize(9);
    odd.texts.pop_back();
    r = Walk(odd);
    cloud = r.body->GetClouds()[0].get();
    EXPECT_TRUE(cloud->Colors().empty());
    EXPECT_TRUE(cloud->Texts().empty());
    EXPECT_EQ(cloud->Alphas().size(), 4u);
}

TEST(ImportEngine, ScaleAndUnitConvertToMillimetres)
{
    const struct {
        const char* settingUnit;
        const char* fileUnit;  // the reader's own, or null
        double scale, factor;
        const char* unitName;
    } cases[] = {
        {"mm", nullptr, 1.0, 1.0, "mm"},   {"Inch", nullptr, 1.0, 25.4, "Inch"}, {"mm", nullptr, 0.5, 0.5, "mm"},
        {"m", nullptr, 2.0, 2000.0, "m"},  // a file that carries its unit wins over the setting:
        {"mm", "Inch", 1.0, 25.4, "Inch"}, {"m", "mm", 3.0, 3.0, "mm"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(std::string(c.settingUnit) + " " + (c.fileUnit ? c.fileUnit : "-"));
        const MemoryContent content{.points = {1, 2, 3, -4, 0.5f, 8},
                                    .unit = c.fileUnit ? ZonICkeUnit::FromName(c.fileUnit) : nullptr};
        const Import r = Walk(content, {.unit = ZonICkeUnit::FromName(c.settingUnit), .scale = c.scale});
        const ZonCldPointArray& points = r.body->GetClouds()[0]->Points();
        EXPECT_FLOAT_EQ(points.GetPoint(1)[0], float(-4 * c.factor));
        EXPECT_FLOAT_EQ(points.GetPoint(1)[1], float(0.5 * c.factor));
        EXPECT_FLOAT_EQ(points.GetPoint(0)[2], float(3 * c.factor));
        EXPECT_EQ(r.body->GetUnitName(), c.unitName);
    }
}

TEST(ImportEngine, DoublePrecisionOnlyWhenAskedAndOffered)
{
    const struct {
        bool offered, asked;
        double x;  // the first coordinate: the double array has 0.25 added
    } cases[] = {{true, true, 1.25}, {true, false, 1.0}, {false, true, 1.0}};
    for (const auto& c : cases) {
        const Import r = Walk({.points = {1, 2, 3}, .hasDouble = c.offered, .doubleOffset = 0.25},
                              {.doublePrecision = c.asked});
        const ZonCldPointArray& points = r.body->GetClouds()[0]->Points();
        EXPECT_EQ(points.IsDoublePrecision(), c.offered && c.asked);
        EXPECT_EQ(points.GetPoint(0)[0], c.x);
        EXPECT_EQ(points.GetNumberOfPoints(), 1u);
    }
}

TEST(ImportEngine, ScansAreWalkedSetBySetAndEmptyScansLeftOut)
{
    Import r = Walk(ScanContent());
    ASSERT_EQ(r.body->GetSetsOfScans().size(), 2u);
    ASSERT_EQ(r.body->GetSetsOfScans()[0]->GetNumberOfScans(), 2u);
    EXPECT_EQ(FloatsOf(r.body->GetSetsOfScans()[0]->GetScans()[0]->Points()), Line(3));
    EXPECT_EQ(FloatsOf(r.body->GetSetsOfScans()[0]->GetScans()[1]->Points()), Line(2, 10));
    EXPECT_EQ(FloatsOf(r.body->GetSetsOfScans()[1]->GetScans()[0]->Points()), Line(4, 20));
    EXPECT_TRUE(r.body->GetClouds().empty());
    EXPECT_EQ(r.body->GetNumberOfPoints(), 9u);

    // The box leaves out the scans with nothing inside. Double precision is
    // asked for: single from a reader without it, double from one with it.
    const Settings s{.doublePrecision = true, .box = ZonMathBox(9, 21.5, -100, 100, -100, 100)};
    r = Walk(ScanContent(), s);
    ASSERT_EQ(r.body->GetSetsOfScans().size(), 2u);
    ASSERT_EQ(r.body->GetSetsOfScans()[0]->GetNumberOfScans(), 1u);
    EXPECT_EQ(FloatsOf(r.body->GetSetsOfScans()[0]->GetScans()[0]->Points()), Line(2, 10));
    EXPECT_EQ(FloatsOf(r.body->GetSetsOfScans()[1]->GetScans()[0]->Points()), Line(2, 20));
    r = Walk({.type = DigitizationScans, .hasDouble = true, .doubleOffset = 0.25, .sets = ScanContent().sets}, s);
    const ZonCldPointArray& points = r.body->GetSetsOfScans()[1]->GetScans()[0]->Points();
    EXPECT_TRUE(points.IsDoublePrecision());
    EXPECT_EQ(points.GetPoint(0)[0], 20.25);
    EXPECT_EQ(points.GetNumberOfPoints(), 2u);
}

TEST(ImportEngine, GridsKeepRowsAndHolesAndTheBoxMakesHoles)
{
    Import r = Walk(GridContent());
    ASSERT_EQ(r.body->GetSetsOfGrids().size(), 1u);
    const auto* grids = &r.body->GetSetsOfGrids()[0]->GetGrids();
    ASSERT_EQ(grids->size(), 2u);
    ASSERT_EQ((*grids)[0]->GetNumberOfRows(), 2u);
    EXPECT_EQ((*grids)[0]->GetRows()[0].valid, (Valid{1, 1, 1}));
    EXPECT_EQ((*grids)[0]->GetRows()[1].valid, (Valid{1, 0, 1}));
    EXPECT_EQ(FloatsOf((*grids)[0]->GetRows()[1].points), Line(3, 5));
    EXPECT_EQ((*grids)[1]->GetNumberOfRows(), 1u);
    EXPECT_EQ(r.body->GetNumberOfPoints(), 7u);  // holes are not points
    EXPECT_EQ(r.body->GetNumberOfGrids(), 2u);

    r = Walk(GridContent(), {.box = ZonMathBox(1, 6.5, -100, 100, -100, 100)});
    grids = &r.body->GetSetsOfGrids()[0]->GetGrids();
    EXPECT_EQ((*grids)[0]->GetRows()[0].valid, (Valid{0, 1, 1}));
    EXPECT_EQ((*grids)[0]->GetRows()[1].valid, (Valid{1, 0, 0}));
    EXPECT_EQ((*grids)[0]->GetRows()[1].points.GetNumberOfPoints(), 3u);  // rows keep their length
    EXPECT_EQ((*grids)[1]->GetRows()[0].valid, (Valid{0, 0}));
    EXPECT_EQ(r.body->GetNumberOfPoints(), 3u);
}

TEST(ImportEngine, PolygonsTheirTrianglesAndTheReadersSubMesh)
{
    Import r = Walk(MeshContent());
    ASSERT_EQ(r.body->GetPolygons().size(), 2u);
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2, 0, 2, 3}));
    EXPECT_EQ(r.body->GetPolygons()[1]->GetNumberOfVertices(), 3u);
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 3u);

    r = Walk(MeshContent(), {.box = ZonMathBox(-1, 1, -1, 2, -1, 1)});  // x < 1: vertices 0 and 3 of the square only
    ASSERT_EQ(r.body->GetPolygons().size(), 1u);                         // the lone triangle has nothing inside
    EXPECT_EQ(r.body->GetPolygons()[0]->GetNumberOfVertices(), 2u);
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 0u);
    r = Walk(MeshContent(), {.box = ZonMathBox(-1, 6, -1, 1, -1, 1)});  // upper faces closed on the file's highs
    ASSERT_EQ(r.body->GetPolygons().size(), 2u);
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2, 0, 2, 3}));
    EXPECT_EQ(r.body->GetPolygons()[1]->GetNumberOfVertices(), 3u);

    MemoryContent broken = MeshContent();  // a triangle past the vertices is left out, with a note
    broken.meshes[0].triangles = {0, 1, 2, 0, 2, 4};
    r = Walk(broken);
    EXPECT_EQ(r.body->GetPolygons()[0]->Triangles(), (std::vector<unsigned>{0, 1, 2}));
    ASSERT_EQ(r.messages.size(), 1u);
    EXPECT_NE(r.messages[0].find(": 1"), std::string::npos);
}

// The same reader, offering its whole arrays to be taken over.
class HandingReader : public MemoryReader {
public:
    using MemoryReader::MemoryReader;
    std::size_t Held() const
    {
        std::size_t n = _sampled.size() + _content.colors.size() + _content.alphas.size();
        for (const auto& mesh : _content.meshes) n += mesh.vertices.size() + mesh.triangles.size();
        return n;
    }

protected:
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override
    {
        arrays.Add(_sampled);
        arrays.Add(_content.colors);
        arrays.Add(_content.alphas);
        for (auto& mesh : _content.meshes) {
            arrays.Add(mesh.vertices);
            arrays.Add(mesh.triangles);
        }
    }
};

TEST(ImportEngine, ArraysTakenOverGiveTheBodyThatCopiesGive)
{
    MemoryContent broken = MeshContent();
    broken.meshes[0].triangles = {0, 1, 2, 0, 2, 4, 2, 3, 0};
    const Settings box{.box = ZonMathBox(-1, 6, -1, 1, -1, 1)};
    for (const MemoryContent& content : {CloudContent(), MeshContent(), broken}) {
        // (The test reader's own box query needs valid triangles.)
        for (const Settings& s : {Settings{}, Settings{.scale = 2.5}, content.meshes.empty() ? box : Settings{}}) {
            const Import copied = Walk(content, s);
            ZonGeoFactoryProtected factory;
            Import taken{factory.CreateCldBody(), {}, {}};
            const auto reader = std::make_shared<HandingReader>("f", content);
            ZonCldImportEngine::InsertFile(*taken.body, factory, reader, false, s.unit, s.box, s.scale, taken.messages,
                                           taken.statistics, true, ModuleLabel);
            // Taken over when the whole file is imported; a box query copies what it kept.
            EXPECT_EQ(reader->Held() == 0, s.box.IsEmpty());
            EXPECT_EQ(taken.statistics, copied.statistics);
            EXPECT_EQ(taken.messages, copied.messages);
            ASSERT_EQ(taken.body->GetClouds().size(), copied.body->GetClouds().size());
            for (std::size_t i = 0; i < copied.body->GetClouds().size(); ++i) {
                const ZonCldCloud &a = *taken.body->GetClouds()[i], &b = *copied.body->GetClouds()[i];
                EXPECT_EQ(FloatsOf(a.Points()), FloatsOf(b.Points()));
                EXPECT_EQ(a.Colors(), b.Colors());
                EXPECT_EQ(a.Alphas(), b.Alphas());
                EXPECT_EQ(a.Symbols(), b.Symbols());
            }
            ASSERT_EQ(taken.body->GetPolygons().size(), copied.body->GetPolygons().size());
            for (std::size_t i = 0; i < copied.body->GetPolygons().size(); ++i) {
                const ZonCldPolygon &a = *taken.body->GetPolygons()[i], &b = *copied.body->GetPolygons()[i];
                EXPECT_EQ(FloatsOf(a.Vertices()), FloatsOf(b.Vertices()));
                EXPECT_EQ(a.Triangles(), b.Triangles());
            }
        }
    }
}

TEST(ImportEngine, AReaderWithoutTheInterfaceOfItsTypeIsReadAsACloud)
{
    const std::pair<MemoryContent, std::size_t> cases[] = {{ScanContent(), 9}, {GridContent(), 8}, {MeshContent(), 7}};
    for (const auto& [content, points] : cases) {
        const Import r = Walk<MemoryCloudReader>(content);
        ASSERT_EQ(r.body->GetClouds().size(), 1u);
        EXPECT_EQ(r.body->GetNumberOfPoints(), points);
        EXPECT_EQ(r.body->GetTypeOfDigitization(), content.type);
    }
}

TEST(ImportEngine, StatisticsNameWhatWasCreated)
{
    const Import r = Walk(ScanContent(), {.scale = 2.0});
    for (const char* line : {"  Points: 9\n", "  Sets of scans: 2\n", "  Scans: 3\n", "  Unit: mm\n",
                             "  Bounding box: 0 0 0 / 46 92 138\n"})
        EXPECT_NE(r.statistics.find(line), std::string::npos) << line << r.statistics;
    EXPECT_EQ(r.statistics.find("Grids"), std::string::npos);

    // Without a labeler the engine labels with the bare keys: it knows no catalog.
    const Import bare = Walk(ScanContent(), {}, {});
    EXPECT_NE(bare.statistics.find("  SetsOfScans: 2\n"), std::string::npos) << bare.statistics;
}

TEST(ImportEngine, ReaderErrorsPassThrough)
{
    MemoryContent c = ScanContent();
    c.failInPoints = true;
    EXPECT_EQ(zontest::ErrorKey([&] { Walk(c); }), "ZonCloudReadNLSTool.ERR_UnknownData");
}

}  // namespace
