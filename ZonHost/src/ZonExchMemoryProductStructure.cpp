#include "ZonExchMemoryProductStructure.h"

ZonIExchProduct_var ZonExchMemoryProductStructure::GetRoot(unsigned root)
{
    return root < _roots.size() ? _roots[root] : nullptr;
}
