#include "ZonExchMemoryTessRep.h"

ZonIExchTessNode_var ZonExchMemoryTessRep::GetTopNode(unsigned node)
{
    return node < _nodes.size() ? _nodes[node] : nullptr;
}
