#pragma once
#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchInstance.h"

// An instance held in memory: a product placed by a transformation.
class ZON_HOST_API ZonExchMemoryInstance : public ZonBaseUnknown, public ZonIExchInstance {
public:
    ZonExchMemoryInstance(ZonIExchProduct_var product, const ZonMathTransformation& position);

    ZonMathTransformation GetPosition() override { return _position; }
    ZonIExchProduct_var GetProduct() override { return _product; }

private:
    ZonIExchProduct_var _product;
    ZonMathTransformation _position;
};
using ZonExchMemoryInstance_var = std::shared_ptr<ZonExchMemoryInstance>;
