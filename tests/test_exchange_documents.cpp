// Exchange documents: the in-memory model and the document built from a
// cloud body, as the exporters see it.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <vector>

#include <unistd.h>

#include "ZonCldSTLOutputDocument.h"
#include "ZonExchBodyDocumentBuilder.h"
#include "ZonExchMemoryDocument.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIExchInstance.h"
#include "ZonIExchProductStructure.h"
#include "ZonIExchTessRep.h"
#include "ZonIReporter.h"

namespace fs = std::filesystem;

namespace {

ZonCldPolygon_var Triangle(ZonGeoFactoryProtected& factory, bool doublePrecision)
{
    auto polygon = factory.CreatePolygon();
    const double xyz[12] = {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5};
    if (doublePrecision) {
        polygon->Vertices().AssignScaled(xyz, 4, 1.0);
    } else {
        const float single[12] = {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5f};
        polygon->Vertices().AssignScaled(single, 4, 1.0);
    }
    polygon->Triangles() = {0, 1, 2, 1, 3, 2};
    return polygon;
}

ZonCldCloud_var Cloud(ZonGeoFactoryProtected& factory)
{
    auto cloud = factory.CreateCloud();
    const float xyz[6] = {5, 5, 5, 6, 6, 6};
    cloud->Points().AssignScaled(xyz, 2, 1.0);
    return cloud;
}

ZonCldSetOfGrids_var Grids(ZonGeoFactoryProtected& factory)
{
    auto grid = factory.CreateGrid();
    const unsigned char valid[2] = {1, 0};
    const float xyz[6] = {1, 1, 1, 2, 2, 2};
    grid->AddRow(valid, 2).points.AssignScaled(xyz, 2, 1.0);
    auto set = factory.CreateSetOfGrids();
    set->AddGrid(grid);
    return set;
}

std::vector<int> TopNodeTypes(ZonIExchTessRep& rep)
{
    std::vector<int> types;
    for (unsigned i = 0; i < rep.GetNumberOfTopNodes(); ++i) types.push_back(rep.GetTopNode(i)->GetType());
    return types;
}

ZonIExchTessRep_var TessRepOf(ZonIExchInputDocument& document)
{
    return ZonQueryInterface<ZonIExchTessRep>(document.GetRepresentation(ZonIExchTessRep::RepresentationType));
}

TEST(BodyDocument, PolygonsBecomeSolidsWithOneFaceAndOtherEntitiesTheirNodeTypes)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddCloud(Cloud(factory));
    auto scans = factory.CreateSetOfScans();
    scans->AddScan(factory.CreateScan());
    scans->AddScan(factory.CreateScan());
    body.AddSetOfScans(scans);
    body.AddSetOfGrids(Grids(factory));
    body.AddPolygon(Triangle(factory, false));

    auto document = ZonExchBodyDocumentBuilder::Build(body, "sample");
    EXPECT_EQ(document->GetAliasName(), ZonUnicodeString("sample"));
    EXPECT_FALSE(document->HasRepresentation(ZonIExchProductStructure::RepresentationType));
    auto rep = TessRepOf(*document);
    ASSERT_TRUE(rep);
    EXPECT_FALSE(rep->HasDoublePrecision());
    EXPECT_EQ(TopNodeTypes(*rep), (std::vector<int>{ZonExchNodeSolid, ZonExchNodeCloud, ZonExchNodeScan,
                                                    ZonExchNodeScan, ZonExchNodeGrid}));

    auto solid = rep->GetTopNode(0);
    ASSERT_EQ(solid->GetNumberOfFaces(), 1u);
    auto face = solid->GetFace(0);
    unsigned values = 0, triangles = 0;
    const float* coords = face->GetCoords(values);
    ASSERT_EQ(values, 12u);
    EXPECT_EQ(std::vector<float>(coords, coords + values), (std::vector<float>{0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5f}));
    const unsigned* offsets = face->GetTriangles(triangles);
    ASSERT_EQ(triangles, 2u);
    EXPECT_EQ(std::vector<unsigned>(offsets, offsets + 6), (std::vector<unsigned>{0, 3, 6, 3, 9, 6}));
    EXPECT_EQ(face->GetCoordsDouble(values), nullptr);
    EXPECT_EQ(face->GetNumberOfStrips() + face->GetNumberOfFans(), 0u);
}

TEST(BodyDocument, DoublePrecisionVerticesGiveBothCoordinateArrays)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddPolygon(Triangle(factory, true));
    auto rep = TessRepOf(*ZonExchBodyDocumentBuilder::Build(body, "d"));
    EXPECT_TRUE(rep->HasDoublePrecision());
    unsigned values = 0;
    const double* coords = rep->GetTopNode(0)->GetFace(0)->GetCoordsDouble(values);
    ASSERT_EQ(values, 12u);
    EXPECT_EQ(coords[11], 0.5);
    EXPECT_NE(rep->GetTopNode(0)->GetFace(0)->GetCoords(values), nullptr);
}

TEST(BodyDocument, PlacedBodyIsAProductStructureWithOneInstanceAtThePlacement)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddPolygon(Triangle(factory, false));
    const ZonMathTransformation placement({1, 0, 0, 0, 1, 0, 0, 0, 1}, {1e6 + 0.25, 0, 0});
    body.SetPlacement(placement);
    auto document = ZonExchBodyDocumentBuilder::Build(body, "placed");
    EXPECT_FALSE(document->HasRepresentation(ZonIExchTessRep::RepresentationType));
    auto structure = ZonQueryInterface<ZonIExchProductStructure>(
        document->GetRepresentation(ZonIExchProductStructure::RepresentationType));
    ASSERT_TRUE(structure);
    ASSERT_EQ(structure->GetNumberOfRoots(), 1u);
    auto root = structure->GetRoot(0);
    EXPECT_FALSE(root->HasTessellatedRep());
    ASSERT_EQ(root->GetNumberOfInstances(), 1u);
    auto instance = root->GetInstance(0);
    EXPECT_EQ(instance->GetPosition(), placement);  // kept in double precision
    ASSERT_TRUE(instance->GetProduct()->HasTessellatedRep());
    EXPECT_EQ(TopNodeTypes(*instance->GetProduct()->GetTessellatedRep()), std::vector<int>{ZonExchNodeSolid});
}

TEST(MemoryDocument, AnnouncedButMissingRepresentationsAndAttributes)
{
    ZonExchMemoryDocument document("doc");
    EXPECT_FALSE(document.HasRepresentation("TessellatedRepresentation"));
    document.SetRepresentation("TessellatedRepresentation", nullptr);
    EXPECT_TRUE(document.HasRepresentation("TessellatedRepresentation"));
    EXPECT_EQ(document.GetRepresentation("TessellatedRepresentation"), nullptr);
    EXPECT_EQ(document.GetAttribute("CAD_Format"), "");
    document.SetAttribute("CAD_Format", "3MF");
    EXPECT_EQ(document.GetAttribute("CAD_Format"), "3MF");
}

// What the STL export of a built body reports, and whether the file stays.
class BodyExportTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        dir_ = fs::temp_directory_path() / ("zon_body_export_" + std::to_string(::getpid()));
        fs::create_directories(dir_);
        ZonSession::OpenSession();
        ZonSession::GetPtrSession()->SetReporter(reporter_);
    }
    void TearDown() override { fs::remove_all(dir_); }

    std::vector<ZonCollectingReporter::Entry> Export(const ZonCldBody& body, const std::string& path)
    {
        reporter_->Clear();
        ZonCldSTLOutputDocument output;
        output.SetFileName(path);
        EXPECT_EQ(output.Open(), ZON_S_OK);
        EXPECT_EQ(output.Write(ZonExchBodyDocumentBuilder::Build(body, "body")), ZON_S_OK);
        output.Close();
        output.Release();
        return reporter_->Entries();
    }

    fs::path dir_;
    std::shared_ptr<ZonCollectingReporter> reporter_ = std::make_shared<ZonCollectingReporter>();
};

TEST_F(BodyExportTest, MeshAndCloudWritesTheMeshAndReportsTheSkippedCloud)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddPolygon(Triangle(factory, false));
    body.AddCloud(Cloud(factory));
    const std::string path = (dir_ / "mesh_cloud.stl").string();
    const auto entries = Export(body, path);
    ASSERT_EQ(entries.size(), 2u);
    EXPECT_EQ(entries[0].key, "ZonCldExportCmd.ERR_NotInMeshFile_Cloud");
    EXPECT_EQ(entries[0].severity, 4);
    EXPECT_EQ(entries[1].key, "ZonCldExportCmd.Partial");
    EXPECT_EQ(fs::file_size(path), 84u + 2 * 50u);
}

TEST_F(BodyExportTest, GridOnlyLeavesNoFileAndReportsTheSkippedGrid)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddSetOfGrids(Grids(factory));
    const std::string path = (dir_ / "grid.stl").string();
    const auto entries = Export(body, path);
    ASSERT_EQ(entries.size(), 2u);
    EXPECT_EQ(entries[0].key, "ZonCldExportCmd.ERR_NotInMeshFile_Grid");
    EXPECT_EQ(entries[1].key, "ZonCldExportCmd.Empty");
    EXPECT_FALSE(fs::exists(path));
}

}  // namespace
