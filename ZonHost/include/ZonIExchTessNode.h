#pragma once
#include <array>
#include <memory>

#include "ZonHostExport.h"
#include "ZonIExchTessFace.h"
#include "ZonMath.h"
#include "ZonUnicodeString.h"

// Kinds of tessellated nodes.
enum ZonExchNodeType : int {
    ZonExchNodeGroup = 1,     // children only
    ZonExchNodeSolid = 2,     // bodies: faces, and children written one by one
    ZonExchNodeShell = 3,
    ZonExchNodeSurface = 4,
    ZonExchNodeLayer = 5,     // a second kind of group
    ZonExchNodeFace = 6,      // one face on its own
    ZonExchNodeScan = 7,
    ZonExchNodePolyline = 8,
    ZonExchNodeCloud = 9,
    ZonExchNodeGrid = 10,
};

class ZonIExchTessNode;
using ZonIExchTessNode_var = std::shared_ptr<ZonIExchTessNode>;

// A node of a tessellated representation: its type, its placement relative to
// its parent (single precision), its child nodes and its faces.
class ZON_HOST_API ZonIExchTessNode {
public:
    virtual ~ZonIExchTessNode();
    virtual int GetType() = 0;
    virtual ZonUnicodeString GetName() = 0;
    // Row-major 3 x 3 matrix and translation: p' = M p + t.
    virtual void GetPosition(std::array<float, 9>& matrix, std::array<float, 3>& translation) = 0;
    // The same placement widened to double precision.
    ZonMathTransformation GetPositionTransformation();
    virtual unsigned GetNumberOfChildren() = 0;
    virtual ZonIExchTessNode_var GetChild(unsigned child) = 0;
    virtual unsigned GetNumberOfFaces() = 0;
    // Null when the face cannot be obtained.
    virtual ZonIExchTessFace_var GetFace(unsigned face) = 0;
};
