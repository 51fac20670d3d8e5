#include "ZonExchPointWalker.h"

#include <array>

#include "ZonIExchInstance.h"
#include "ZonIExchPointColors.h"
#include "ZonIExchProduct.h"
#include "ZonIExchProductStructure.h"
#include "ZonIExchTessRep.h"

namespace {

// Nesting deeper than this (or a product that holds itself) is not followed.
constexpr int MaxDepth = 256;

class Walker {
public:
    Walker(bool readDouble, const ZonExchPointWalker::Visit& visit) : _readDouble(readDouble), _visit(visit) {}

    void Product(ZonIExchProduct& product, const ZonMathTransformation& placement, int depth)
    {
        if (depth > MaxDepth) return;
        if (product.HasTessellatedRep())
            if (ZonIExchTessRep_var rep = product.GetTessellatedRep()) Representation(*rep, placement);
        for (unsigned i = 0; i < product.GetNumberOfInstances(); ++i) {
            ZonIExchInstance_var instance = product.GetInstance(i);
            if (!instance) continue;
            if (ZonIExchProduct_var child = instance->GetProduct())
                Product(*child, placement * instance->GetPosition(), depth + 1);
        }
    }

    void Representation(ZonIExchTessRep& rep, const ZonMathTransformation& placement)
    {
        const bool doubles = _readDouble && rep.HasDoublePrecision();
        for (unsigned i = 0; i < rep.GetNumberOfTopNodes(); ++i)
            if (ZonIExchTessNode_var node = rep.GetTopNode(i)) Node(*node, placement, doubles, 0);
    }

private:
    void Node(ZonIExchTessNode& node, const ZonMathTransformation& parent, bool doubles, int depth)
    {
        if (depth > MaxDepth) return;
        const ZonMathTransformation placement = parent * node.GetPositionTransformation();
        for (unsigned i = 0; i < node.GetNumberOfFaces(); ++i)
            if (ZonIExchTessFace_var face = node.GetFace(i)) Face(*face, placement, doubles);
        for (unsigned i = 0; i < node.GetNumberOfChildren(); ++i)
            if (ZonIExchTessNode_var child = node.GetChild(i)) Node(*child, placement, doubles, depth + 1);
    }

    void Face(ZonIExchTessFace& face, const ZonMathTransformation& placement, bool doubles)
    {
        unsigned values = 0;
        const double* coordsDouble = doubles ? face.GetCoordsDouble(values) : nullptr;
        const float* coords = coordsDouble ? nullptr : face.GetCoords(values);
        if (!coordsDouble && !coords) return;
        const unsigned points = values / 3;

        const unsigned char* colors = nullptr;
        unsigned char single[3] = {0, 0, 0};
        bool hasSingle = false;
        if (auto* colored = dynamic_cast<ZonIExchPointColors*>(&face)) {
            unsigned colorCount = 0;
            colors = colored->GetPointColors(colorCount);
            if (colorCount < points) colors = nullptr;
            if (!colors) hasSingle = colored->GetSingleColor(single);
        }
        for (unsigned i = 0; i < points; ++i) {
            const ZonMathPoint p = coordsDouble
                                       ? ZonMathPoint(coordsDouble[3 * i], coordsDouble[3 * i + 1], coordsDouble[3 * i + 2])
                                       : ZonMathPoint(coords[3 * i], coords[3 * i + 1], coords[3 * i + 2]);
            _visit(placement.Apply(p), colors ? colors + 3 * i : hasSingle ? single : nullptr);
        }
    }

    bool _readDouble;
    const ZonExchPointWalker::Visit& _visit;
};

}  // namespace

bool ZonExchPointWalker::Walk(ZonIExchInputDocument& document, bool readDouble, const Visit& visit)
{
    Walker walker(readDouble, visit);
    if (document.HasRepresentation(ZonIExchProductStructure::RepresentationType)) {
        auto structure = std::dynamic_pointer_cast<ZonIExchProductStructure>(
            document.GetRepresentation(ZonIExchProductStructure::RepresentationType));
        if (!structure || structure->GetNumberOfRoots() == 0) return false;
        for (unsigned r = 0; r < structure->GetNumberOfRoots(); ++r) {
            ZonIExchProduct_var root = structure->GetRoot(r);
            if (!root) return false;
            walker.Product(*root, ZonMathTransformation(), 0);
        }
        return true;
    }
    if (document.HasRepresentation(ZonIExchTessRep::RepresentationType)) {
        auto rep = std::dynamic_pointer_cast<ZonIExchTessRep>(document.GetRepresentation(ZonIExchTessRep::RepresentationType));
        if (!rep) return false;
        walker.Representation(*rep, ZonMathTransformation());
    }
    return true;
}
