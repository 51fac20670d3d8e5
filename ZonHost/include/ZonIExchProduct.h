#pragma once
#include <memory>

#include "ZonHostExport.h"
#include "ZonIExchTessRep.h"
#include "ZonUnicodeString.h"

class ZonIExchInstance;
using ZonIExchInstance_var = std::shared_ptr<ZonIExchInstance>;

// A product of a product structure: its instances of other products, in
// order, and optionally a tessellated representation of its own.
class ZON_HOST_API ZonIExchProduct {
public:
    virtual ~ZonIExchProduct();
    virtual ZonUnicodeString GetName() = 0;
    virtual unsigned GetNumberOfInstances() = 0;
    virtual ZonIExchInstance_var GetInstance(unsigned instance) = 0;
    virtual bool HasTessellatedRep() = 0;
    // Null when the representation cannot be obtained.
    virtual ZonIExchTessRep_var GetTessellatedRep() = 0;
};
using ZonIExchProduct_var = std::shared_ptr<ZonIExchProduct>;
