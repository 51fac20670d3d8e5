#pragma once
#include <memory>

#include "ZonHostExport.h"
#include "ZonIExchProduct.h"

// The product structure of a document: its root products.
class ZON_HOST_API ZonIExchProductStructure {
public:
    static constexpr const char* RepresentationType = "ProductStructureRepresentation";

    virtual ~ZonIExchProductStructure();
    virtual unsigned GetNumberOfRoots() = 0;
    virtual ZonIExchProduct_var GetRoot(unsigned root) = 0;
};
using ZonIExchProductStructure_var = std::shared_ptr<ZonIExchProductStructure>;
