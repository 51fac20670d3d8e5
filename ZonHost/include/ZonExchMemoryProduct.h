#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchInstance.h"
#include "ZonIExchProduct.h"

// A product held in memory. Setting a null representation stands for one
// that the product announces but cannot give.
class ZON_HOST_API ZonExchMemoryProduct : public ZonBaseUnknown, public ZonIExchProduct {
public:
    explicit ZonExchMemoryProduct(ZonUnicodeString name = {}) : _name(std::move(name)) {}

    void AddInstance(ZonIExchInstance_var instance) { _instances.push_back(std::move(instance)); }
    void SetTessellatedRep(ZonIExchTessRep_var rep)
    {
        _rep = std::move(rep);
        _hasRep = true;
    }

    ZonUnicodeString GetName() override { return _name; }
    unsigned GetNumberOfInstances() override { return static_cast<unsigned>(_instances.size()); }
    ZonIExchInstance_var GetInstance(unsigned instance) override;
    bool HasTessellatedRep() override { return _hasRep; }
    ZonIExchTessRep_var GetTessellatedRep() override { return _rep; }

private:
    ZonUnicodeString _name;
    std::vector<ZonIExchInstance_var> _instances;
    ZonIExchTessRep_var _rep;
    bool _hasRep = false;
};
using ZonExchMemoryProduct_var = std::shared_ptr<ZonExchMemoryProduct>;
