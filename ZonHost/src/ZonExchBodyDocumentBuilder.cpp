#include "ZonExchBodyDocumentBuilder.h"

#include "ZonExchMemoryInstance.h"
#include "ZonExchMemoryProduct.h"
#include "ZonExchMemoryProductStructure.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchProductStructure.h"

namespace {

ZonIExchTessNode_var PolygonNode(const ZonCldPolygon& polygon)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    const ZonCldPointArray& vertices = polygon.Vertices();
    if (vertices.IsDoublePrecision()) {
        const std::vector<double>& doubles = vertices.GetDoubles();
        face->SetCoords(std::vector<float>(doubles.begin(), doubles.end()));
        face->SetCoordsDouble(doubles);
    } else {
        face->SetCoords(vertices.GetFloats());
    }
    std::vector<unsigned> offsets;
    offsets.reserve(polygon.Triangles().size());
    for (unsigned vertex : polygon.Triangles()) offsets.push_back(3 * vertex);
    face->SetTriangles(std::move(offsets));
    auto node = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeSolid);
    node->AddFace(face);
    return node;
}

}  // namespace

ZonExchMemoryDocument_var ZonExchBodyDocumentBuilder::Build(const ZonCldBody& body, const ZonUnicodeString& aliasName)
{
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    for (const auto& polygon : body.GetPolygons()) {
        if (!polygon) continue;
        rep->AddTopNode(PolygonNode(*polygon));
        if (polygon->Vertices().IsDoublePrecision()) rep->SetDoublePrecision(true);
    }
    for (const auto& cloud : body.GetClouds())
        if (cloud) rep->AddTopNode(std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeCloud));
    for (const auto& set : body.GetSetsOfScans())
        if (set)
            for (const auto& scan : set->GetScans())
                if (scan) rep->AddTopNode(std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeScan));
    for (const auto& set : body.GetSetsOfGrids())
        if (set)
            for (const auto& grid : set->GetGrids())
                if (grid) rep->AddTopNode(std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeGrid));

    auto document = std::make_shared<ZonExchMemoryDocument>(aliasName);
    if (body.GetPlacement().IsIdentity()) {
        document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);
        return document;
    }
    auto part = std::make_shared<ZonExchMemoryProduct>(aliasName);
    part->SetTessellatedRep(rep);
    auto root = std::make_shared<ZonExchMemoryProduct>(aliasName);
    root->AddInstance(std::make_shared<ZonExchMemoryInstance>(part, body.GetPlacement()));
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(root);
    document->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);
    return document;
}
