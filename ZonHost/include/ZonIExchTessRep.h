#pragma once
#include <memory>

#include "ZonHostExport.h"
#include "ZonIExchTessNode.h"

// A tessellated representation: top nodes in order. Its faces always have
// single-precision coordinates, and double-precision ones too when
// HasDoublePrecision says so.
class ZON_HOST_API ZonIExchTessRep {
public:
    static constexpr const char* RepresentationType = "TessellatedRepresentation";

    virtual ~ZonIExchTessRep();
    virtual unsigned GetNumberOfTopNodes() = 0;
    virtual ZonIExchTessNode_var GetTopNode(unsigned node) = 0;
    virtual bool HasDoublePrecision() = 0;
};
using ZonIExchTessRep_var = std::shared_ptr<ZonIExchTessRep>;
