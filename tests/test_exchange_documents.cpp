// Exchange documents built from a cloud body, as the exporters see them.
#include <gtest/gtest.h>

#include "ZonExchBodyDocumentBuilder.h"
#include "ZonExchMemoryDocument.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIExchInstance.h"
#include "ZonIExchProductStructure.h"
#include "ZonIExchTessRep.h"

namespace {

const double kXyz[12] = {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5};

ZonCldPolygon_var Polygon(ZonGeoFactoryProtected& factory, bool doublePrecision)
{
    auto polygon = factory.CreatePolygon();
    const float single[12] = {0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5f};
    if (doublePrecision)
        polygon->Vertices().AssignScaled(kXyz, 4, 1.0);
    else
        polygon->Vertices().AssignScaled(single, 4, 1.0);
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

// A polygon becomes a solid with one face of triangles, in both precisions
// when its vertices are doubles; clouds, scans and grids their node types.
TEST(BodyDocument, PolygonsBecomeSolidsWithOneFaceAndOtherEntitiesTheirNodeTypes)
{
    for (const bool doublePrecision : {false, true}) {
        SCOPED_TRACE(doublePrecision ? "double" : "single");
        ZonGeoFactoryProtected factory;
        ZonCldBody body;
        body.AddCloud(Cloud(factory));
        auto scans = factory.CreateSetOfScans();
        scans->AddScan(factory.CreateScan());
        scans->AddScan(factory.CreateScan());
        body.AddSetOfScans(scans);
        body.AddSetOfGrids(Grids(factory));
        body.AddPolygon(Polygon(factory, doublePrecision));

        auto document = ZonExchBodyDocumentBuilder::Build(body, "sample");
        EXPECT_EQ(document->GetAliasName(), ZonUnicodeString("sample"));
        EXPECT_FALSE(document->HasRepresentation(ZonIExchProductStructure::RepresentationType));
        auto rep = ZonQueryInterface<ZonIExchTessRep>(document->GetRepresentation(ZonIExchTessRep::RepresentationType));
        ASSERT_TRUE(rep);
        EXPECT_EQ(rep->HasDoublePrecision(), doublePrecision);
        EXPECT_EQ(TopNodeTypes(*rep), (std::vector<int>{ZonExchNodeSolid, ZonExchNodeCloud, ZonExchNodeScan,
                                                        ZonExchNodeScan, ZonExchNodeGrid}));

        auto solid = rep->GetTopNode(0);
        ASSERT_EQ(solid->GetNumberOfFaces(), 1u);
        auto face = solid->GetFace(0);
        unsigned values = 0, triangles = 0;
        const float* coords = face->GetCoords(values);
        ASSERT_EQ(values, 12u);
        EXPECT_EQ(std::vector<float>(coords, coords + values), (std::vector<float>{0, 0, 0, 1, 0, 0, 0, 1, 0, 1, 1, 0.5f}));
        const double* doubles = face->GetCoordsDouble(values);
        if (doublePrecision) {
            ASSERT_EQ(values, 12u);
            EXPECT_EQ(std::vector<double>(doubles, doubles + values), std::vector<double>(kXyz, kXyz + 12));
        } else {
            EXPECT_EQ(doubles, nullptr);
        }
        const unsigned* offsets = face->GetTriangles(triangles);
        ASSERT_EQ(triangles, 2u);
        EXPECT_EQ(std::vector<unsigned>(offsets, offsets + 6), (std::vector<unsigned>{0, 3, 6, 3, 9, 6}));
        EXPECT_EQ(face->GetNumberOfStrips() + face->GetNumberOfFans(), 0u);
    }
}

TEST(BodyDocument, PlacedBodyIsAProductStructureWithOneInstanceAtThePlacement)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    body.AddPolygon(Polygon(factory, false));
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

}  // namespace
