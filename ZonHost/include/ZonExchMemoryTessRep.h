#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonHostExport.h"
#include "ZonIExchTessRep.h"

// A tessellated representation held in memory.
class ZON_HOST_API ZonExchMemoryTessRep : public ZonBaseUnknown, public ZonIExchTessRep {
public:
    void AddTopNode(ZonIExchTessNode_var node) { _nodes.push_back(std::move(node)); }
    void SetDoublePrecision(bool on) { _doublePrecision = on; }

    unsigned GetNumberOfTopNodes() override { return static_cast<unsigned>(_nodes.size()); }
    ZonIExchTessNode_var GetTopNode(unsigned node) override;
    bool HasDoublePrecision() override { return _doublePrecision; }

private:
    std::vector<ZonIExchTessNode_var> _nodes;
    bool _doublePrecision = false;
};
using ZonExchMemoryTessRep_var = std::shared_ptr<ZonExchMemoryTessRep>;
