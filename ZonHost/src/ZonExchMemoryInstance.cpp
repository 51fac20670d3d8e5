#include "ZonExchMemoryInstance.h"

ZonExchMemoryInstance::ZonExchMemoryInstance(ZonIExchProduct_var product, const ZonMathTransformation& position)
    : _product(std::move(product)), _position(position)
{
}
