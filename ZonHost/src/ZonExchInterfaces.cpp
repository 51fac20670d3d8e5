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
ZonIExchTessRep::~ZonIExchTessRep() = default;
ZonIExchProduct::~ZonIExchProduct() = default;
ZonIExchInstance::~ZonIExchInstance() = default;
ZonIExchProductStructure::~ZonIExchProductStructure() = default;
ZonIExchInputDocument::~ZonIExchInputDocument() = default;
ZonIExchOutputDocument::~ZonIExchOutputDocument() = default;
ZonIExchExporter::~ZonIExchExporter() = default;
