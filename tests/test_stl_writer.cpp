// STL output document, exporter and writer: facets unfolded from triangles,
// strips and fans, placements, the binary header and its count, the text
// form, the outcome messages, and files that other tools accept.
#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>

#include "ZonCldSTLExporter.h"
#include "ZonCldSTLOutputDocument.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWriteStl.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryInstance.h"
#include "ZonExchMemoryProduct.h"
#include "ZonExchMemoryProductStructure.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIReporter.h"
#include "ZonMsgCatalog.h"
#include "ZonObjectRegistry.h"
#include "ZonTestFiles.h"

namespace fs = std::filesystem;
using zontest::ErrorKey;
using zontest::Slurp;

namespace {

using Normal = std::array<float, 3>;
using Vertices = std::array<float, 9>;

struct Facet { Normal normal; Vertices vertices; };

struct BinaryStl {
    std::array<char, 80> header{};
    std::uint32_t count = 0;
    std::vector<Facet> facets;
    std::size_t size = 0;
};

BinaryStl ReadBinary(const std::string& path, bool reversed = false)
{
    const std::string bytes = Slurp(path);
    BinaryStl stl;
    stl.size = bytes.size();
    if (bytes.size() < 84) return stl;
    auto word = [&](std::size_t at) {
        std::uint32_t w;
        std::memcpy(&w, bytes.data() + at, 4);
        return reversed ? __builtin_bswap32(w) : w;
    };
    auto real = [&](std::size_t at) { return std::bit_cast<float>(word(at)); };
    std::memcpy(stl.header.data(), bytes.data(), 80);
    stl.count = word(80);
    for (std::size_t at = 84; at + 50 <= bytes.size(); at += 50) {
        Facet facet{};
        for (int i = 0; i < 3; ++i) facet.normal[i] = real(at + 4 * i);
        for (int i = 0; i < 9; ++i) facet.vertices[i] = real(at + 12 + 4 * i);
        EXPECT_EQ(bytes[at + 48] | bytes[at + 49], 0) << "attribute bytes";
        stl.facets.push_back(facet);
    }
    return stl;
}

// Vertex k is (k, k*k, 1): no three are collinear, so each facet is
// recognised by its vertices.
std::vector<float> DistinctCoords(int vertices)
{
    std::vector<float> coords;
    for (int k = 0; k < vertices; ++k) coords.insert(coords.end(), {float(k), float(k * k), 1.0f});
    return coords;
}
Vertices FacetOf(float a, float b, float c) { return {a, a * a, 1, b, b * b, 1, c, c * c, 1}; }

// Vertex numbers to the offsets the documents use.
std::vector<unsigned> Offsets(std::vector<unsigned> vertices)
{
    for (unsigned& v : vertices) v *= 3;
    return vertices;
}

ZonExchMemoryTessFace_var Face(std::vector<float> coords, const std::vector<unsigned>& triangles = {})
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords(std::move(coords));
    if (!triangles.empty()) face->SetTriangles(Offsets(triangles));
    return face;
}

const std::vector<float> kTriangle = {0, 0, 0, 1, 0, 0, 0, 1, 0};

ZonExchMemoryTessNode_var Node(int type, std::vector<ZonIExchTessFace_var> faces = {})
{
    auto node = std::make_shared<ZonExchMemoryTessNode>(type);
    for (auto& face : faces) node->AddFace(face);
    return node;
}

ZonExchMemoryDocument_var Document(std::vector<ZonIExchTessNode_var> nodes, const char* alias = "part")
{
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    for (auto& node : nodes) rep->AddTopNode(node);
    auto document = std::make_shared<ZonExchMemoryDocument>(alias);
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);
    return document;
}

class StlWriterTest : public zontest::FilesTest {
protected:
    void SetUp() override
    {
        FilesTest::SetUp();
        ZonSession::OpenSession();
        ZonSession::GetPtrSession()->SetReporter(reporter_);
    }

    // Runs the document's steps, each of which must succeed.
    void Export(const ZonIExchInputDocument_var& document, const std::string& path,
                const ZonListValZonString& names = {}, const ZonListValZonString& values = {})
    {
        ZonCldSTLOutputDocument output;
        ASSERT_EQ(output.SetFileName(path), ZON_S_OK);
        ASSERT_EQ(output.SetOptions(names, values), ZON_S_OK);
        ASSERT_EQ(output.Open(), ZON_S_OK);
        ASSERT_EQ(output.Write(document), ZON_S_OK);
        ASSERT_EQ(output.Close(), ZON_S_OK);
        ASSERT_EQ(output.Release(), ZON_S_OK);
    }
    BinaryStl ExportBinary(const ZonIExchInputDocument_var& document, const ZonListValZonString& names = {},
                           const ZonListValZonString& values = {})
    {
        Export(document, Path("out.stl"), names, values);
        return ReadBinary(Path("out.stl"));
    }

    std::shared_ptr<ZonCollectingReporter> reporter_ = std::make_shared<ZonCollectingReporter>();
};

// Strips alternate their orientation, fans turn about their first vertex,
// strips or fans too short for a facet add nothing, and within a face the
// triangles come first, then the strips, then the fans. Every face announces
// its own facets; the header holds their sum.
TEST_F(StlWriterTest, FacesUnfoldIntoFacetsAndTheHeaderCountSumsThem)
{
    const auto coords = DistinctCoords(6);
    auto strip = Face(coords), fanOfThree = Face(coords), fanOfFive = Face(coords), mixed = Face(coords, {0, 2, 4, 1, 3, 5});
    strip->AddStrip(Offsets({0, 1, 2, 3, 4}));
    fanOfThree->AddFan(Offsets({4, 1, 2}));
    fanOfFive->AddFan(Offsets({0, 1, 2, 3, 4}));
    for (const auto& list : {Offsets({0, 1, 2, 3}), Offsets({0, 1})}) mixed->AddStrip(list);
    for (const auto& list : {Offsets({5, 4, 3, 2}), Offsets({1})}) mixed->AddFan(list);
    const std::vector<Vertices> facets = {
        FacetOf(0, 1, 2), FacetOf(2, 1, 3), FacetOf(2, 3, 4),  // strip of five
        FacetOf(4, 1, 2),                                      // fan of three
        FacetOf(0, 1, 2), FacetOf(0, 2, 3), FacetOf(0, 3, 4),  // fan of five
        // mixed: two triangles, a strip of four, a fan of four
        FacetOf(0, 2, 4), FacetOf(1, 3, 5), FacetOf(0, 1, 2), FacetOf(2, 1, 3), FacetOf(5, 4, 3), FacetOf(5, 3, 2)};
    const BinaryStl stl = ExportBinary(
        Document({Node(ZonExchNodeSolid, {strip, fanOfThree}), Node(ZonExchNodeSurface, {fanOfFive, mixed})}));
    EXPECT_EQ(stl.count, facets.size());
    EXPECT_EQ(stl.size, 84u + 50u * facets.size());
    ASSERT_EQ(stl.facets.size(), facets.size());
    for (std::size_t f = 0; f < facets.size(); ++f) EXPECT_EQ(stl.facets[f].vertices, facets[f]) << f;
}

TEST_F(StlWriterTest, NormalsAreUnitCrossProductsZeroWhenDegenerateAndNeverScaled)
{
    auto face = Face({0, 0, 0, 2, 0, 0, 0, 3, 0,   // counter-clockwise seen from +z
                      0, 0, 0, 1, 1, 1, 2, 2, 2,   // collinear
                      1, 0, 0, 0, 1, 0, 0, 0, 1},  // tilted
                     {0, 1, 2, 3, 4, 5, 6, 7, 8});
    auto document = Document({Node(ZonExchNodeSolid, {face})});
    const float n = static_cast<float>(1 / std::sqrt(3.0));
    const std::vector<Normal> normals = {{0, 0, 1}, {0, 0, 0}, {n, n, n}};
    const BinaryStl plain = ExportBinary(document);
    const BinaryStl scaled = ExportBinary(document, {"Scaling"}, {"25.4"});
    ASSERT_EQ(plain.facets.size(), 3u);
    ASSERT_EQ(scaled.facets.size(), 3u);
    for (int f = 0; f < 3; ++f) {
        EXPECT_EQ(plain.facets[f].normal, normals[f]) << f;
        EXPECT_EQ(scaled.facets[f].normal, normals[f]) << f;
        for (int i = 0; i < 9; ++i)
            EXPECT_EQ(scaled.facets[f].vertices[i], static_cast<float>(plain.facets[f].vertices[i] * 25.4)) << f << i;
    }
}

// Instances place their products, and nodes their children, each relative
// to its parent: positions compose from the root down.
TEST_F(StlWriterTest, PositionsOfInstancesAndNodesCompose)
{
    auto body = Node(ZonExchNodeSolid, {Face(kTriangle, {0, 1, 2})});
    body->SetPosition({1, 0, 0, 0, 1, 0, 0, 0, 1}, {0, 0, 5});  // up 5
    auto group = Node(ZonExchNodeGroup);
    group->AddChild(body);
    group->SetPosition({0, -1, 0, 1, 0, 0, 0, 0, 1}, {0, 0, 0});  // quarter turn about z
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(group);
    auto part = std::make_shared<ZonExchMemoryProduct>("part");
    part->SetTessellatedRep(rep);
    auto assembly = std::make_shared<ZonExchMemoryProduct>("assembly");
    assembly->AddInstance(std::make_shared<ZonExchMemoryInstance>(part, ZonMathTransformation({1, 0, 0, 0, 1, 0, 0, 0, 1}, {10, 0, 0})));
    auto root = std::make_shared<ZonExchMemoryProduct>("root");
    root->AddInstance(std::make_shared<ZonExchMemoryInstance>(assembly, ZonMathTransformation({2, 0, 0, 0, 2, 0, 0, 0, 2}, {0, 100, 0})));
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(root);
    auto document = std::make_shared<ZonExchMemoryDocument>("doc");
    document->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);

    const BinaryStl stl = ExportBinary(document);
    ASSERT_EQ(stl.facets.size(), 1u);
    // p -> turn(p + (0,0,5)) -> + (10,0,0) -> * 2 + (0,100,0)
    EXPECT_EQ(stl.facets[0].vertices, (Vertices{20, 100, 10, 20, 102, 10, 18, 100, 10}));
    EXPECT_EQ(stl.facets[0].normal, (Normal{0, 0, 1}));
}

TEST_F(StlWriterTest, DoubleCoordinatesAreReadOnlyInDoublePrecisionMode)
{
    auto face = Face(kTriangle, {0, 1, 2});
    face->SetCoordsDouble({0, 0, 7, 1, 0, 7, 0, 1, 7});
    auto document = Document({Node(ZonExchNodeSolid, {face})});
    auto z = [&](const char* precision) {
        return ExportBinary(document, {"Precision"}, {precision}).facets.at(0).vertices[2];
    };
    EXPECT_EQ(z("precDouble"), 0.0f) << "a representation without double precision is read in single precision";
    std::dynamic_pointer_cast<ZonExchMemoryTessRep>(document->GetRepresentation(ZonIExchTessRep::RepresentationType))
        ->SetDoublePrecision(true);
    EXPECT_EQ(z("precDouble"), 7.0f);
    EXPECT_EQ(z(""), 0.0f);
}

TEST_F(StlWriterTest, BinaryHeaderIsTheOriginTextCutTo79BytesAndZeroPadded)
{
    auto document = Document({Node(ZonExchNodeSolid, {Face(kTriangle, {0, 1, 2})})});
    const std::string origin = ZonCloudReadNLSTool::GeneratedBy().ToUtf8();
    std::array<char, 80> expected{};
    const std::string text = "STL " + origin;
    ASSERT_LT(text.size(), 80u);
    std::memcpy(expected.data(), text.data(), text.size());
    EXPECT_EQ(ExportBinary(document).header, expected);

    ZonMsgCatalog::SetText("ZonCloudImportExport", "ZonCloudReadNLSTool.GeneratedBy", std::string(100, 'x'));
    const BinaryStl stl = ExportBinary(document);
    ZonMsgCatalog::SetText("ZonCloudImportExport", "ZonCloudReadNLSTool.GeneratedBy", origin);
    EXPECT_EQ(std::string(stl.header.data(), 79), "STL " + std::string(75, 'x'));
    EXPECT_EQ(stl.header[79], '\0');
}

TEST_F(StlWriterTest, TextFormIsWrittenLineByLine)
{
    const std::string path = Path("text.stl");
    auto face = Face({0, 0, 0, 2, 0, 0, 0, 0.5f, -1e-7f}, {0, 1, 2});
    Export(Document({Node(ZonExchNodeSolid, {face})}, "50%% part"), path, {"BinaryState"}, {"0"});
    const double length = std::hypot(2e-7, 1.0);
    // 0 * -1e-7 - 0 * 0.5 is -0, and the C library shows its sign.
    char normal[128], last[128];
    std::snprintf(normal, sizeof normal, "  facet normal %e %e %e\n", -0.0, 2e-7 / length, 1.0 / length);
    std::snprintf(last, sizeof last, "      vertex %e %e %e\n", 0.0, 0.5, static_cast<double>(-1e-7f));
    EXPECT_EQ(Slurp(path), "solid 50% part \n" + std::string(normal) +
                               "    outer loop\n"
                               "      vertex 0.000000e+00 0.000000e+00 0.000000e+00\n"
                               "      vertex 2.000000e+00 0.000000e+00 0.000000e+00\n" +
                               last + "    endloop\n  endfacet\nendsolid\n");
}

TEST_F(StlWriterTest, OutcomeMessagesFollowWhatWasMetAndSkipped)
{
    // Node types: 2 is a solid with one triangle, -2 one without; no code, no message.
    struct Case { const char* name; std::vector<int> nodeTypes; const char* code; int level; const char* secondLine; bool fileKept; };
    const std::vector<Case> cases = {
        {"mesh only", {2}, nullptr, 0, nullptr, true},
        {"mesh and cloud", {2, 9}, "ERR_NotInMeshFile_Cloud", 4, "ZonCldExportCmd.Partial", true},
        {"grid only", {10}, "ERR_NotInMeshFile_Grid", 4, "ZonCldExportCmd.Empty", false},
        {"scan only", {7}, "ERR_NotInMeshFile_Scan", 4, "ZonCldExportCmd.Empty", false},
        {"cloud, scan and grid", {9, 7, 10}, "ERR_NotInMeshFile_Cloud_Scan_Grid", 4, "ZonCldExportCmd.Empty", false},
        {"cloud and scan", {7, 9}, "ERR_NotInMeshFile_Cloud_Scan", 4, "ZonCldExportCmd.Empty", false},
        {"cloud and grid", {2, 10, 9}, "ERR_NotInMeshFile_Cloud_Grid", 4, "ZonCldExportCmd.Partial", true},
        {"scan and grid", {10, 7}, "ERR_NotInMeshFile_Scan_Grid", 4, "ZonCldExportCmd.Empty", false},
        {"nothing at all", {8}, "ERR_FILESUCCESSFULL", 1, "ZonCldExportCmd.Empty", false},
        {"mesh without triangles", {-2}, "ERR_NoActivePolygons", 4, "ZonCldExportCmd.Empty", true},
    };
    const std::string path = Path("outcome.stl");
    for (const auto& c : cases) {
        std::vector<ZonIExchTessNode_var> nodes;
        for (int type : c.nodeTypes)
            nodes.push_back(type == 2    ? Node(ZonExchNodeSolid, {Face(kTriangle, {0, 1, 2})})
                            : type == -2 ? Node(ZonExchNodeSolid, {Face(kTriangle)})
                                         : Node(type));
        reporter_->Clear();
        Export(Document(nodes), path);
        EXPECT_EQ(fs::exists(path), c.fileKept) << c.name;
        fs::remove(path);
        const auto entries = reporter_->Entries();
        if (!c.code) {
            EXPECT_TRUE(entries.empty()) << c.name;
            continue;
        }
        ASSERT_EQ(entries.size(), 2u) << c.name;
        EXPECT_EQ(entries[0].catalog, "ZonCldExportCmd");
        EXPECT_EQ(entries[0].key, std::string("ZonCldExportCmd.") + c.code) << c.name;
        EXPECT_EQ(entries[0].severity, c.level) << c.name;
        EXPECT_EQ(entries[0].parameters, std::vector<std::string>{path});
        EXPECT_NE(entries[0].message.find(path), std::string::npos) << entries[0].message;
        EXPECT_EQ(entries[1].key, c.secondLine) << c.name;
    }
}

TEST_F(StlWriterTest, BrokenDocumentsRaiseInputErrorsAndFailedStepsTheGenericFailure)
{
    auto good = Face(kTriangle, {0, 1, 2});
    auto noCoords = std::make_shared<ZonExchMemoryTessFace>();
    noCoords->SetTriangles(Offsets({0, 1, 2}));
    auto missingRep = std::make_shared<ZonExchMemoryProduct>();
    missingRep->SetTessellatedRep(nullptr);
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(missingRep);
    auto productDocument = std::make_shared<ZonExchMemoryDocument>();
    productDocument->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);
    auto lostRep = std::make_shared<ZonExchMemoryDocument>();
    lostRep->SetRepresentation(ZonIExchTessRep::RepresentationType, nullptr);

    const std::vector<std::tuple<const char*, ZonIExchInputDocument_var, const char*>> cases = {
        {"face that cannot be obtained", Document({Node(ZonExchNodeSolid, {good, nullptr})}), "Fail to get the Face"},
        {"face without coordinates", Document({Node(ZonExchNodeSolid, {noCoords})}), "No Coords"},
        {"index outside the coordinates", Document({Node(ZonExchNodeSolid, {Face(kTriangle, {0, 1, 3})})}), "ERR_Failure"},
        {"product without its representation", productDocument, "No TessellatedRep"},
        {"document without its representation", lostRep, "No TessellatedRep"},
    };
    for (const auto& [name, document, key] : cases) {
        ZonCldSTLOutputDocument output;
        output.SetFileName(Path("broken.stl"));
        ASSERT_EQ(output.Open(), ZON_S_OK);
        try {
            output.Write(document);
            ADD_FAILURE() << name << ": no error";
        } catch (const ZonError& error) {
            EXPECT_EQ(error.GetMessageKey(), std::string("ZonCloudReadNLSTool.") + key) << name;
            EXPECT_EQ(error.GetSeverity(), 2) << name;  // input error
        }
    }
    ZonCldSTLOutputDocument output;
    EXPECT_EQ(ErrorKey([&] { output.Write(Document({Node(ZonExchNodeSolid, {good})})); }), "ZonCloudReadNLSTool.No File");
    EXPECT_EQ(output.Open(), ZON_E_FAIL) << "no file name";
    EXPECT_EQ(output.SetOptions({"Scaling"}, {}), ZON_E_FAIL);
    output.SetFileName(Path("no/such/dir/x.stl"));
    EXPECT_EQ(output.Open(), ZON_E_FAIL);
    output.SetFileName(Path("x.stl"));
    ASSERT_EQ(output.Open(), ZON_S_OK);
    EXPECT_EQ(output.Write(nullptr), ZON_E_FAIL);
    auto rootless = std::make_shared<ZonExchMemoryDocument>();
    rootless->SetRepresentation(ZonIExchProductStructure::RepresentationType,
                                std::make_shared<ZonExchMemoryProductStructure>());
    EXPECT_EQ(output.Write(rootless), ZON_E_FAIL);
}

TEST_F(StlWriterTest, ExporterIsFoundByNameWritesTextByDefaultAndLeavesNoFileWhenItFails)
{
    auto exporter = ZonQueryInterface<ZonIExchExporter>(ZonObjectRegistry::CreateByLateType("STLExporter"));
    ASSERT_TRUE(exporter);
    auto face = Face(kTriangle, {0, 1, 2});
    auto document = Document({Node(ZonExchNodeSolid, {face}), Node(ZonExchNodeCloud)});
    ASSERT_EQ(exporter->Export(document, Path("text.stl"), {}), ZON_S_OK);
    EXPECT_TRUE(Slurp(Path("text.stl")).starts_with("solid part \n"));
    // A write that fails is reported and leaves no half-written file.
    reporter_->Clear();
    EXPECT_EQ(exporter->Export(Document({Node(ZonExchNodeSolid, {face, nullptr})}), Path("broken.stl"), {{"BinaryState", "1"}}),
              ZON_E_FAIL);
    EXPECT_FALSE(fs::exists(Path("broken.stl")));
    ASSERT_EQ(reporter_->Entries().size(), 1u);
    EXPECT_EQ(reporter_->Entries()[0].key, "ZonCloudReadNLSTool.Fail to get the Face");
}

// ---- The writer ------------------------------------------------------------

// Each announcement adds to the count, in one go or as parts of a multi-part
// file; the reversed byte order swaps every number, the count too.
TEST_F(StlWriterTest, WriterCountsEveryAnnouncementInEitherByteOrder)
{
    const float a[9] = {0, 0, 0, 1, 0, 0, 0, 1, 0};
    const float b[9] = {0, 0, 0, 0, 2, 0, 2, 0, 0};
    for (const bool reversed : {false, true}) {
        const std::string path = Path(reversed ? "reversed.stl" : "native.stl");
        {
            ZonCloudWriteStl writer(path);
            writer.SetReverseByteOrder(reversed);
            if (reversed) { ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK); }
            writer.BeginWriteTriangles(1);
            writer.WriteTriangle(a);
            if (!reversed) writer.EndWriteTriangles();
            writer.BeginWriteTriangles(2);
            writer.WriteTriangle(b);
            writer.WriteTriangle(a);
            writer.EndWriteTriangles();
            if (reversed) writer.EndMultiWrite();
        }
        const BinaryStl stl = ReadBinary(path, reversed);
        EXPECT_EQ(stl.count, 3u) << reversed;
        ASSERT_EQ(stl.facets.size(), 3u) << reversed;
        EXPECT_EQ(stl.facets[1].normal, (Normal{0, 0, -1})) << reversed;
        EXPECT_EQ(stl.facets[1].vertices, (Vertices{0, 0, 0, 0, 2, 0, 2, 0, 0})) << reversed;
        EXPECT_EQ(stl.facets[2].normal, (Normal{0, 0, 1})) << reversed;
        EXPECT_EQ(std::string(stl.header.data()), "STL " + ZonCloudReadNLSTool::GeneratedBy().ToUtf8());
    }
}

TEST_F(StlWriterTest, WriterMisuseRaises)
{
    const float a[9] = {};
    ZonCloudWriteStl unopened(Path("misuse.stl"));
    EXPECT_THROW(unopened.WriteTriangle(a), ZonError) << "no file open";
    ZonCloudWriteStl writer(Path("misuse.stl"));
    writer.BeginWriteTriangles(1);
    writer.WriteTriangle(a);
    EXPECT_EQ(ErrorKey([&] { writer.WriteTriangle(a); }), "ZonCloudReadNLSTool.ERR_Failure") << "one more than announced";
    writer.BeginWriteTriangles(2);
    EXPECT_THROW(writer.EndWriteTriangles(), ZonError) << "announced triangles missing";
    ZonCloudWriteStl nowhere(Path("no/such/dir/x.stl"));
    try {
        nowhere.BeginWriteTriangles(1);
        ADD_FAILURE() << "no error";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetCatalogName(), "ZonCldResOperError");
    }
}

// ---- Other tools read our files ---------------------------------------------

// The twelve triangles of the unit cube, wound outwards: eight as triangles,
// two as a fan and two as a strip.
ZonIExchInputDocument_var Cube()
{
    std::vector<float> coords;
    for (int x = 0; x < 2; ++x)
        for (int y = 0; y < 2; ++y)
            for (int z = 0; z < 2; ++z) coords.insert(coords.end(), {float(x), float(y), float(z)});
    auto face = Face(coords, {0, 1, 3, 0, 3, 2, 4, 6, 7, 4, 7, 5, 0, 4, 5, 0, 5, 1, 2, 3, 7, 2, 7, 6});
    auto fans = Face(coords);
    fans->AddFan(Offsets({0, 2, 6, 4}));
    fans->AddStrip(Offsets({1, 5, 3, 7}));
    return Document({Node(ZonExchNodeSolid, {face, fans})}, "cube");
}

bool HasTool(const std::string& name) { return std::system(("command -v " + name + " >/dev/null 2>&1").c_str()) == 0; }

class StlOracleTest : public StlWriterTest, public ::testing::WithParamInterface<bool> {
protected:
    std::string Report(const std::string& command) const
    {
        EXPECT_EQ(std::system((command + " >" + zontest::Quote(Path("report")) + " 2>&1 </dev/null").c_str()), 0) << command;
        return Slurp(Path("report"));
    }
};

TEST_P(StlOracleTest, AssimpAndAdmeshReadOurFilesWithTheSameTriangleCount)
{
    const bool binary = GetParam();
    const std::string path = Path("cube.stl");
    Export(Cube(), path, {"BinaryState"}, {binary ? "1" : "0"});
    if (binary) { ASSERT_EQ(ReadBinary(path).count, 12u); }

    const std::vector<std::pair<std::string, std::vector<std::string>>> tools = {
        {"assimp info", {"Faces:              12\n", "Primitive Types:    triangles"}},
        {"admesh",
         {binary ? "File type          : Binary STL file" : "File type          : ASCII STL file",
          "Number of facets                 :    12                  12",
          // Our normals agree with the winding, and the cube is closed.
          "Normals fixed         :     0", "Facets reversed       :     0",
          "Total disconnected facets        :     0                   0"}},
    };
    bool ran = false;
    for (const auto& [command, lines] : tools) {
        if (!HasTool(command.substr(0, command.find(' ')))) continue;
        ran = true;
        const std::string report = Report(command + " " + zontest::Quote(path));
        for (const auto& line : lines) EXPECT_NE(report.find(line), std::string::npos) << line << "\n" << report;
    }
    if (!ran) GTEST_SKIP() << "neither assimp (assimp-utils) nor admesh is installed";
}

INSTANTIATE_TEST_SUITE_P(BinaryAndText, StlOracleTest, ::testing::Bool(),
                         [](const auto& info) { return info.param ? "Binary" : "Text"; });

}  // namespace
