#pragma once
#include <memory>

#include "ZonHostExport.h"
#include "ZonIExchProduct.h"
#include "ZonMath.h"

// One placed use of a product inside its parent product.
class ZON_HOST_API ZonIExchInstance {
public:
    virtual ~ZonIExchInstance();
    // Placement relative to the parent product.
    virtual ZonMathTransformation GetPosition() = 0;
    virtual ZonIExchProduct_var GetProduct() = 0;
};
