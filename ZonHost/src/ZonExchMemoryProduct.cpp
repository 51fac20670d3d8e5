#include "ZonExchMemoryProduct.h"

ZonIExchInstance_var ZonExchMemoryProduct::GetInstance(unsigned instance)
{
    return instance < _instances.size() ? _instances[instance] : nullptr;
}
