// Out-of-line destructors anchor the exchange interfaces' type information in the host.
#include "ZonIExchExporter.h"
#include "ZonIExchInputDocument.h"
#include "ZonIExchInstance.h"
#include "ZonIExchOutputDocument.h"
#include "ZonIExchProduct.h"
#include "ZonIExchProductStructure.h"
#include "ZonIExchTessFace.h"
#include "ZonIExchTessNode.h"
#include "ZonIExchTessRep.h"

ZonIExchTessFace::~ZonIExchTessFace() = default;
ZonIExchTessNode::~ZonIExchTessNode() = default;

ZonMathTransformation ZonIExchTessNode::GetPositionTransformation()
{
    std::array<float, 9> matrix{};
    std::array<float, 3> translation{};
    GetPosition(matrix, translation);
    std::array<double, 9> m{};
    for (int i = 0; i < 9; ++i) m[i] = matrix[i];
    return ZonMathTransformation(m, {translation[0], translation[1], translation[2]});
}
ZonIExchTessRep::~ZonIExchTessRep() = default;
ZonIExchProduct::~ZonIExchProduct() = default;
ZonIExchInstance::~ZonIExchInstance() = default;
ZonIExchProductStructure::~ZonIExchProductStructure() = default;
ZonIExchInputDocument::~ZonIExchInputDocument() = default;
ZonIExchOutputDocument::~ZonIExchOutputDocument() = default;
ZonIExchExporter::~ZonIExchExporter() = default;
