#pragma once
#include <functional>

#include "ZonHostExport.h"
#include "ZonIExchInputDocument.h"
#include "ZonMath.h"

// Walks the points of an exchange document for the exporters of point files:
// every vertex of every face of its tessellated representation, each placed
// by its representation's transformation (the instances of a product
// structure composed with the node positions), with its colour when the face
// gives one (ZonIExchPointColors: its own, else the representation's one).
class ZON_HOST_API ZonExchPointWalker {
public:
    // rgb is null for a point without colour.
    using Visit = std::function<void(const ZonMathPoint& point, const unsigned char* rgb)>;

    // readDouble: take the double-precision coordinates of representations
    // that have them. False when the document has no representation that
    // can be read (a product structure without roots, an unreadable one).
    static bool Walk(ZonIExchInputDocument& document, bool readDouble, const Visit& visit);
};
