#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchProductStructure.h"

// A product structure held in memory.
class ZON_HOST_API ZonExchMemoryProductStructure : public ZonBaseUnknown, public ZonIExchProductStructure {
public:
    void AddRoot(ZonIExchProduct_var product) { _roots.push_back(std::move(product)); }

    unsigned GetNumberOfRoots() override { return static_cast<unsigned>(_roots.size()); }
    ZonIExchProduct_var GetRoot(unsigned root) override;

private:
    std::vector<ZonIExchProduct_var> _roots;
};
using ZonExchMemoryProductStructure_var = std::shared_ptr<ZonExchMemoryProductStructure>;
