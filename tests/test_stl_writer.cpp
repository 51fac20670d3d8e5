// STL output document, exporter and writer: facets unfolded from triangles,
// strips and fans, placements, the binary header and its count, the text
// form, the outcome messages, and files that other tools accept.
#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include <unistd.h>

#include "ZonCldSTLBinaryFormat.h"
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

namespace fs = std::filesystem;

namespace {

struct Facet {
    std::array<float, 3> normal;
    std::array<float, 9> vertices;
};

struct BinaryStl {
    std::array<char, 80> header{};
    std::uint32_t count = 0;
    std::vector<Facet> facets;
    std::size_t size = 0;
};

std::string Slurp(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

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
    auto real = [&](std::size_t at) {
        const std::uint32_t w = word(at);
        float f;
        std::memcpy(&f, &w, 4);
        return f;
    };
    std::memcpy(stl.header.data(), bytes.data(), 80);
    stl.count = word(80);
    for (std::size_t at = 84; at + 50 <= bytes.size(); at += 50) {
        Facet facet{};
        for (int i = 0; i < 3; ++i) facet.normal[i] = real(at + 4 * i);
        for (int i = 0; i < 9; ++i) facet.vertices[i] = real(at + 12 + 4 * i);
        EXPECT_EQ(bytes[at + 48], 0);
        EXPECT_EQ(bytes[at + 49], 0);
        stl.facets.push_back(facet);
    }
    return stl;
}

// Coordinates of vertex k (k = 0, 1, ...) are (k, k*k, 1): no three of them
// are collinear, so each facet is recognised by its vertices.
std::vector<float> DistinctCoords(int vertices)
{
    std::vector<float> coords;
    for (int k = 0; k < vertices; ++k) {
        coords.push_back(static_cast<float>(k));
        coords.push_back(static_cast<float>(k * k));
        coords.push_back(1.0f);
    }
    return coords;
}

std::array<float, 9> FacetOf(const std::vector<float>& coords, int a, int b, int c)
{
    std::array<float, 9> v{};
    for (int i = 0; i < 3; ++i) {
        v[i] = coords[3 * a + i];
        v[3 + i] = coords[3 * b + i];
        v[6 + i] = coords[3 * c + i];
    }
    return v;
}

ZonExchMemoryTessFace_var Face(std::vector<float> coords)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords(std::move(coords));
    return face;
}

// Vertex numbers to the offsets the documents use.
std::vector<unsigned> Offsets(std::vector<unsigned> vertices)
{
    for (unsigned& v : vertices) v *= 3;
    return vertices;
}

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

class StlWriterTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
        dir_ = fs::temp_directory_path() /
               (std::string("zon_stl_writer_") + info->name() + "_" + std::to_string(::getpid()));
        fs::remove_all(dir_);
        fs::create_directories(dir_);
        ZonSession::OpenSession();
        reporter_ = std::make_shared<ZonCollectingReporter>();
        ZonSession::GetPtrSession()->SetReporter(reporter_);
    }
    void TearDown() override { fs::remove_all(dir_); }

    std::string Path(const std::string& name) const { return (dir_ / name).string(); }

    // Runs the document's steps; the options are name/value pairs.
    void Export(ZonCldSTLOutputDocument& output, const ZonIExchInputDocument_var& document, const std::string& path,
                const std::vector<std::pair<std::string, std::string>>& options = {})
    {
        ZonListValZonString names, values;
        for (const auto& [name, value] : options) {
            names.push_back(name);
            values.push_back(value);
        }
        ASSERT_EQ(output.SetFileName(path), ZON_S_OK);
        ASSERT_EQ(output.SetOptions(names, values), ZON_S_OK);
        ASSERT_EQ(output.Open(), ZON_S_OK);
        ASSERT_EQ(output.Write(document), ZON_S_OK);
        ASSERT_EQ(output.Close(), ZON_S_OK);
        ASSERT_EQ(output.Release(), ZON_S_OK);
    }
    BinaryStl ExportBinary(const ZonIExchInputDocument_var& document,
                           std::vector<std::pair<std::string, std::string>> options = {})
    {
        ZonCldSTLOutputDocument output;
        const std::string path = Path("out.stl");
        Export(output, document, path, options);
        return ReadBinary(path);
    }

    fs::path dir_;
    std::shared_ptr<ZonCollectingReporter> reporter_;
};

TEST_F(StlWriterTest, StripOfFiveGivesThreeFacetsOfAlternatingOrientation)
{
    const auto coords = DistinctCoords(5);
    auto face = Face(coords);
    face->AddStrip(Offsets({0, 1, 2, 3, 4}));
    const BinaryStl stl = ExportBinary(Document({Node(ZonExchNodeSolid, {face})}));
    ASSERT_EQ(stl.count, 3u);
    ASSERT_EQ(stl.facets.size(), 3u);
    EXPECT_EQ(stl.facets[0].vertices, FacetOf(coords, 0, 1, 2));
    EXPECT_EQ(stl.facets[1].vertices, FacetOf(coords, 2, 1, 3));
    EXPECT_EQ(stl.facets[2].vertices, FacetOf(coords, 2, 3, 4));
}

TEST_F(StlWriterTest, FansTurnAroundTheirFirstVertex)
{
    const auto coords = DistinctCoords(5);
    auto three = Face(coords);
    three->AddFan(Offsets({4, 1, 2}));
    auto five = Face(coords);
    five->AddFan(Offsets({0, 1, 2, 3, 4}));
    const BinaryStl stl = ExportBinary(Document({Node(ZonExchNodeSolid, {three, five})}));
    ASSERT_EQ(stl.count, 4u);
    ASSERT_EQ(stl.facets.size(), 4u);
    EXPECT_EQ(stl.facets[0].vertices, FacetOf(coords, 4, 1, 2));
    EXPECT_EQ(stl.facets[1].vertices, FacetOf(coords, 0, 1, 2));
    EXPECT_EQ(stl.facets[2].vertices, FacetOf(coords, 0, 2, 3));
    EXPECT_EQ(stl.facets[3].vertices, FacetOf(coords, 0, 3, 4));
}

// Each face announces its own triangles; the header holds the sum, and
// strips or fans too short to make a facet add nothing.
TEST_F(StlWriterTest, CountInTheHeaderSumsTheFacesAndTheirTrianglesStripsAndFans)
{
    const auto coords = DistinctCoords(6);
    auto first = Face(coords);
    first->SetTriangles(Offsets({0, 1, 2, 3, 4, 5}));
    auto second = Face(coords);
    second->SetTriangles(Offsets({0, 2, 4}));
    second->AddStrip(Offsets({0, 1, 2, 3}));
    second->AddStrip(Offsets({0, 1}));
    second->AddFan(Offsets({5, 4, 3, 2}));
    const BinaryStl stl = ExportBinary(Document({Node(ZonExchNodeSolid, {first}), Node(ZonExchNodeSurface, {second})}));
    EXPECT_EQ(stl.count, 2u + 1u + 2u + 2u);
    EXPECT_EQ(stl.facets.size(), stl.count);
    EXPECT_EQ(stl.size, 84u + 50u * stl.count);
    EXPECT_EQ(stl.facets.back().vertices, FacetOf(coords, 5, 3, 2));
}

TEST_F(StlWriterTest, NormalIsTheUnitCrossProductOrZeroForADegenerateFacet)
{
    auto face = Face({0, 0, 0, 2, 0, 0, 0, 3, 0,    // counter-clockwise seen from +z
                      0, 0, 0, 1, 1, 1, 2, 2, 2});  // collinear
    face->SetTriangles(Offsets({0, 1, 2, 3, 4, 5}));
    const BinaryStl stl = ExportBinary(Document({Node(ZonExchNodeSolid, {face})}));
    ASSERT_EQ(stl.facets.size(), 2u);
    EXPECT_EQ(stl.facets[0].normal, (std::array<float, 3>{0, 0, 1}));
    EXPECT_EQ(stl.facets[1].normal, (std::array<float, 3>{0, 0, 0}));
}

TEST_F(StlWriterTest, ScalingMultipliesCoordinatesButNotNormals)
{
    auto face = Face({1, 0, 0, 0, 1, 0, 0, 0, 1});
    face->SetTriangles(Offsets({0, 1, 2}));
    auto document = Document({Node(ZonExchNodeSolid, {face})});
    const BinaryStl plain = ExportBinary(document);
    const BinaryStl scaled = ExportBinary(document, {{"Scaling", "25.4"}});
    ASSERT_EQ(scaled.facets.size(), 1u);
    for (int i = 0; i < 9; ++i)
        EXPECT_EQ(scaled.facets[0].vertices[i], static_cast<float>(plain.facets[0].vertices[i] * 25.4)) << i;
    EXPECT_EQ(scaled.facets[0].normal, plain.facets[0].normal);
    const float n = static_cast<float>(1 / std::sqrt(3.0));
    EXPECT_EQ(plain.facets[0].normal, (std::array<float, 3>{n, n, n}));
}

// Instances place their products, and nodes their children, each relative
// to its parent: positions compose from the root down.
TEST_F(StlWriterTest, PositionsOfInstancesAndNodesCompose)
{
    auto face = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    face->SetTriangles(Offsets({0, 1, 2}));
    auto body = Node(ZonExchNodeSolid, {face});
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
    EXPECT_EQ(stl.facets[0].vertices, (std::array<float, 9>{20, 100, 10, 20, 102, 10, 18, 100, 10}));
    EXPECT_EQ(stl.facets[0].normal, (std::array<float, 3>{0, 0, 1}));
}

TEST_F(StlWriterTest, DoubleCoordinatesAreReadOnlyInDoublePrecisionMode)
{
    auto face = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    face->SetCoordsDouble({0, 0, 7, 1, 0, 7, 0, 1, 7});
    face->SetTriangles(Offsets({0, 1, 2}));
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(Node(ZonExchNodeSolid, {face}));
    auto document = std::make_shared<ZonExchMemoryDocument>("d");
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);

    EXPECT_EQ(ExportBinary(document, {{"Precision", "precDouble"}}).facets.at(0).vertices[2], 0.0f)
        << "a representation without double precision is read in single precision";
    rep->SetDoublePrecision(true);
    EXPECT_EQ(ExportBinary(document, {{"Precision", "precDouble"}}).facets.at(0).vertices[2], 7.0f);
    EXPECT_EQ(ExportBinary(document, {{"Precision", ""}}).facets.at(0).vertices[2], 0.0f);
}

TEST_F(StlWriterTest, BinaryHeaderIsTheOriginTextCutTo79BytesAndZeroPadded)
{
    auto face = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    face->SetTriangles(Offsets({0, 1, 2}));
    auto document = Document({Node(ZonExchNodeSolid, {face})});
    const std::string origin = ZonCloudReadNLSTool::GeneratedBy().ToUtf8();

    std::array<char, 80> expected{};
    const std::string text = "STL " + origin;
    ASSERT_LT(text.size(), 80u);
    std::memcpy(expected.data(), text.data(), text.size());
    EXPECT_EQ(ExportBinary(document).header, expected);

    const std::string longOrigin(100, 'x');
    ZonMsgCatalog::SetText("ZonCloudImportExport", "ZonCloudReadNLSTool.GeneratedBy", longOrigin);
    const BinaryStl stl = ExportBinary(document);
    ZonMsgCatalog::SetText("ZonCloudImportExport", "ZonCloudReadNLSTool.GeneratedBy", origin);
    EXPECT_EQ(std::string(stl.header.data(), 79), "STL " + std::string(75, 'x'));
    EXPECT_EQ(stl.header[79], '\0');
}

TEST_F(StlWriterTest, TextFormIsWrittenLineByLine)
{
    auto face = Face({0, 0, 0, 2, 0, 0, 0, 0.5f, -1e-7f});
    face->SetTriangles(Offsets({0, 1, 2}));
    ZonCldSTLOutputDocument output;
    const std::string path = Path("text.stl");
    Export(output, Document({Node(ZonExchNodeSolid, {face})}, "50%% part"), path, {{"BinaryState", "0"}});
    char normal[128];
    const double n[3] = {0, 2e-7, 1.0};
    const double length = std::sqrt(n[1] * n[1] + n[2] * n[2]);
    // 0 * -1e-7 - 0 * 0.5 is -0, and the C library shows its sign.
    std::snprintf(normal, sizeof normal, "  facet normal %e %e %e\n", -0.0, n[1] / length, n[2] / length);
    char last[128];
    std::snprintf(last, sizeof last, "      vertex %e %e %e\n", 0.0, 0.5, static_cast<double>(-1e-7f));
    EXPECT_EQ(Slurp(path), "solid 50% part \n" + std::string(normal) +
                               "    outer loop\n"
                               "      vertex 0.000000e+00 0.000000e+00 0.000000e+00\n"
                               "      vertex 2.000000e+00 0.000000e+00 0.000000e+00\n" +
                               last +
                               "    endloop\n"
                               "  endfacet\n"
                               "endsolid\n");
}

struct OutcomeCase {
    const char* name;
    std::vector<int> nodeTypes;  // a mesh node (type 2) gets one triangle
    const char* code;            // null: no message
    int level;
    const char* secondLine;
    bool fileKept;
};

TEST_F(StlWriterTest, OutcomeMessagesFollowWhatWasMetAndSkipped)
{
    const std::vector<OutcomeCase> cases = {
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
    for (const auto& c : cases) {
        std::vector<ZonIExchTessNode_var> nodes;
        for (int type : c.nodeTypes) {
            auto face = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
            if (type > 0) face->SetTriangles(Offsets({0, 1, 2}));
            nodes.push_back(type == 2 || type == -2 ? Node(ZonExchNodeSolid, {face}) : Node(type));
        }
        reporter_->Clear();
        ZonCldSTLOutputDocument output;
        const std::string path = Path("outcome.stl");
        Export(output, Document(nodes), path);
        EXPECT_EQ(fs::exists(path), c.fileKept) << c.name;
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
        fs::remove(path);
    }
}

TEST_F(StlWriterTest, BrokenDocumentsRaiseInputErrors)
{
    auto good = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    good->SetTriangles(Offsets({0, 1, 2}));
    auto noCoords = std::make_shared<ZonExchMemoryTessFace>();
    noCoords->SetTriangles(Offsets({0, 1, 2}));
    auto outside = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    outside->SetTriangles(Offsets({0, 1, 3}));
    auto missingRep = std::make_shared<ZonExchMemoryProduct>();
    missingRep->SetTessellatedRep(nullptr);
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(missingRep);
    auto productDocument = std::make_shared<ZonExchMemoryDocument>();
    productDocument->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);
    auto lostRep = std::make_shared<ZonExchMemoryDocument>();
    lostRep->SetRepresentation(ZonIExchTessRep::RepresentationType, nullptr);

    struct Case {
        const char* name;
        ZonIExchInputDocument_var document;
        const char* key;
    };
    const std::vector<Case> cases = {
        {"face that cannot be obtained", Document({Node(ZonExchNodeSolid, {good, nullptr})}), "Fail to get the Face"},
        {"face without coordinates", Document({Node(ZonExchNodeSolid, {noCoords})}), "No Coords"},
        {"index outside the coordinates", Document({Node(ZonExchNodeSolid, {outside})}), "ERR_Failure"},
        {"product without its representation", productDocument, "No TessellatedRep"},
        {"document without its representation", lostRep, "No TessellatedRep"},
    };
    for (const auto& c : cases) {
        ZonCldSTLOutputDocument output;
        output.SetFileName(Path("broken.stl"));
        ASSERT_EQ(output.Open(), ZON_S_OK);
        try {
            output.Write(c.document);
            ADD_FAILURE() << c.name << ": no error";
        } catch (const ZonError& error) {
            EXPECT_EQ(error.GetMessageKey(), std::string("ZonCloudReadNLSTool.") + c.key) << c.name;
            EXPECT_EQ(error.GetSeverity(), 2) << c.name;  // input error
        }
    }
    ZonCldSTLOutputDocument notOpen;
    try {
        notOpen.Write(Document({Node(ZonExchNodeSolid, {good})}));
        ADD_FAILURE() << "no error without a file";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetMessageKey(), "ZonCloudReadNLSTool.No File");
    }
}

TEST_F(StlWriterTest, StepFailuresComeBackAsTheGenericFailure)
{
    ZonCldSTLOutputDocument output;
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

TEST_F(StlWriterTest, OptionsAreParsedAndUnknownNamesIgnored)
{
    ZonCldSTLOutputDocument output;
    EXPECT_TRUE(output.IsBinary());
    EXPECT_EQ(output.SetOptions({"Precision", "Scaling", "BinaryState", "Colour"}, {"", "2.5e1", "0", "red"}), ZON_S_OK);
    EXPECT_EQ(output.GetPrecision(), "precUnknown");
    EXPECT_EQ(output.GetScale(), 25.0);
    EXPECT_FALSE(output.IsBinary());
    EXPECT_EQ(output.SetOptions({"Scaling", "BinaryState"}, {"", "1"}), ZON_S_OK);
    EXPECT_EQ(output.GetScale(), 25.0);
    EXPECT_TRUE(output.IsBinary());
}

TEST_F(StlWriterTest, ExporterIsFoundByNameAndWritesTextUnlessToldBinary)
{
    auto exporter = ZonQueryInterface<ZonIExchExporter>(ZonObjectRegistry::CreateByLateType("STLExporter"));
    ASSERT_TRUE(exporter);
    auto face = Face({0, 0, 0, 1, 0, 0, 0, 1, 0});
    face->SetTriangles(Offsets({0, 1, 2}));
    auto document = Document({Node(ZonExchNodeSolid, {face}), Node(ZonExchNodeCloud)});

    const std::string text = Path("text.stl");
    ASSERT_EQ(exporter->Export(document, text, {}), ZON_S_OK);
    EXPECT_TRUE(Slurp(text).starts_with("solid part \n"));

    const std::string binary = Path("binary.stl");
    ASSERT_EQ(exporter->Export(document, binary, {{"BinaryState", "1"}, {"Scaling", "2"}}), ZON_S_OK);
    const BinaryStl stl = ReadBinary(binary);
    ASSERT_EQ(stl.count, 1u);
    EXPECT_EQ(stl.facets[0].vertices[3], 2.0f);
    const auto entries = reporter_->Entries();
    ASSERT_FALSE(entries.empty());
    EXPECT_EQ(entries.back().key, "ZonCldExportCmd.Partial");

    // A write that fails is reported and leaves no half-written file.
    reporter_->Clear();
    const std::string broken = Path("broken.stl");
    EXPECT_EQ(exporter->Export(Document({Node(ZonExchNodeSolid, {face, nullptr})}), broken, {{"BinaryState", "1"}}),
              ZON_E_FAIL);
    EXPECT_FALSE(fs::exists(broken));
    ASSERT_EQ(reporter_->Entries().size(), 1u);
    EXPECT_EQ(reporter_->Entries()[0].key, "ZonCloudReadNLSTool.Fail to get the Face");
}

// ---- The writer ------------------------------------------------------------

TEST_F(StlWriterTest, WriterAddsEachAnnouncementToTheCount)
{
    const std::string path = Path("writer.stl");
    const float a[9] = {0, 0, 0, 1, 0, 0, 0, 1, 0};
    const float b[9] = {0, 0, 0, 0, 2, 0, 2, 0, 0};
    {
        ZonCloudWriteStl writer(path);
        writer.BeginWriteTriangles(1);
        writer.WriteTriangle(a);
        writer.EndWriteTriangles();
        writer.BeginWriteTriangles(2);
        writer.WriteTriangle(b);
        writer.WriteTriangle(a);
        writer.EndWriteTriangles();
    }
    const BinaryStl stl = ReadBinary(path);
    EXPECT_EQ(stl.count, 3u);
    ASSERT_EQ(stl.facets.size(), 3u);
    EXPECT_EQ(stl.facets[0].normal, (std::array<float, 3>{0, 0, 1}));
    EXPECT_EQ(stl.facets[1].normal, (std::array<float, 3>{0, 0, -1}));
    EXPECT_EQ(stl.facets[1].vertices[4], 2.0f);
    EXPECT_EQ(std::string(stl.header.data()), "STL " + ZonCloudReadNLSTool::GeneratedBy().ToUtf8());
}

TEST_F(StlWriterTest, WriterInTheReversedByteOrderSwapsEveryNumberAlsoInAMultiPartFile)
{
    const std::string path = Path("reversed.stl");
    const float a[9] = {0, 0, 0, 1, 0, 0, 0, 1, 0};
    {
        ZonCloudWriteStl writer(path);
        writer.SetReverseByteOrder(true);
        ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
        writer.BeginWriteTriangles(1);
        writer.WriteTriangle(a);
        writer.BeginWriteTriangles(1);
        writer.WriteTriangle(a);
        writer.EndWriteTriangles();
        writer.EndMultiWrite();
    }
    const BinaryStl stl = ReadBinary(path, true);
    EXPECT_EQ(stl.count, 2u);
    ASSERT_EQ(stl.facets.size(), 2u);
    EXPECT_EQ(stl.facets[1].vertices, (std::array<float, 9>{0, 0, 0, 1, 0, 0, 0, 1, 0}));
    EXPECT_EQ(stl.facets[1].normal, (std::array<float, 3>{0, 0, 1}));
}

TEST_F(StlWriterTest, WriterMisuseRaises)
{
    const float a[9] = {};
    ZonCloudWriteStl unopened(Path("misuse.stl"));
    EXPECT_THROW(unopened.WriteTriangle(a), ZonError) << "no file open";
    ZonCloudWriteStl writer(Path("misuse.stl"));
    writer.BeginWriteTriangles(1);
    writer.WriteTriangle(a);
    try {
        writer.WriteTriangle(a);
        ADD_FAILURE() << "a triangle more than announced";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetMessageKey(), "ZonCloudReadNLSTool.ERR_Failure");
    }
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

// The twelve triangles of the unit cube, wound outwards.
ZonIExchInputDocument_var Cube()
{
    std::vector<float> coords;
    for (int x = 0; x < 2; ++x)
        for (int y = 0; y < 2; ++y)
            for (int z = 0; z < 2; ++z) coords.insert(coords.end(), {float(x), float(y), float(z)});
    auto face = Face(coords);
    face->SetTriangles(Offsets({0, 1, 3, 0, 3, 2, 4, 6, 7, 4, 7, 5, 0, 4, 5, 0, 5, 1, 2, 3, 7, 2, 7, 6}));
    auto fans = Face(coords);
    fans->AddFan(Offsets({0, 2, 6, 4}));  // two triangles as a fan
    fans->AddStrip(Offsets({1, 5, 3, 7}));  // two as a strip
    return Document({Node(ZonExchNodeSolid, {face, fans})}, "cube");
}

std::string RunTool(const std::string& command)
{
    std::string output;
    if (FILE* pipe = ::popen((command + " 2>&1").c_str(), "r")) {
        char buffer[4096];
        while (std::size_t n = std::fread(buffer, 1, sizeof buffer, pipe)) output.append(buffer, n);
        ::pclose(pipe);
    }
    return output;
}

bool HasTool(const char* name) { return std::system((std::string("command -v ") + name + " >/dev/null 2>&1").c_str()) == 0; }

class StlOracleTest : public StlWriterTest, public ::testing::WithParamInterface<const char*> {};

TEST_P(StlOracleTest, AssimpAndAdmeshReadOurFilesWithTheSameTriangleCount)
{
    const bool binary = std::string(GetParam()) == "1";
    const std::string path = Path(binary ? "cube_binary.stl" : "cube_text.stl");
    ZonCldSTLOutputDocument output;
    Export(output, Cube(), path, {{"BinaryState", GetParam()}});
    if (binary) {
        ASSERT_EQ(ReadBinary(path).count, 12u);
    }

    bool ran = false;
    if (HasTool("assimp")) {
        ran = true;
        const std::string report = RunTool("assimp info '" + path + "'");
        EXPECT_NE(report.find("Faces:              12\n"), std::string::npos) << report;
        EXPECT_NE(report.find("Primitive Types:    triangles"), std::string::npos) << report;
    }
    if (HasTool("admesh")) {
        ran = true;
        const std::string report = RunTool("admesh '" + path + "'");
        EXPECT_NE(report.find(binary ? "File type          : Binary STL file" : "File type          : ASCII STL file"),
                  std::string::npos)
            << report;
        EXPECT_NE(report.find("Number of facets                 :    12                  12"), std::string::npos)
            << report;
        // Our normals agree with the winding, and the cube is closed.
        EXPECT_NE(report.find("Normals fixed         :     0"), std::string::npos) << report;
        EXPECT_NE(report.find("Facets reversed       :     0"), std::string::npos) << report;
        EXPECT_NE(report.find("Total disconnected facets        :     0                   0"), std::string::npos)
            << report;
    }
    if (!ran) GTEST_SKIP() << "neither assimp (assimp-utils) nor admesh is installed";
}

INSTANTIATE_TEST_SUITE_P(BinaryAndText, StlOracleTest, ::testing::Values("1", "0"),
                         [](const auto& info) { return std::string(info.param) == "1" ? "Binary" : "Text"; });

}  // namespace
