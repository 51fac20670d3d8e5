#pragma once
#include "ZonCldBody.h"
#include "ZonExchMemoryDocument.h"
#include "ZonHostExport.h"

// Presents a cloud body to the exporters as an exchange document: a
// tessellated representation whose top nodes are, in order, one solid node
// per polygon (one face holding its vertices and triangles), one cloud node
// per cloud, one scan node per scan and one grid node per grid. Clouds,
// scans and grids carry no faces: no exporter of meshes can use their points.
// A body placed by a transformation other than the identity is given as a
// product structure whose root holds one instance of the representation at
// that placement (in double precision, unlike node positions).
class ZON_HOST_API ZonExchBodyDocumentBuilder {
public:
    static ZonExchMemoryDocument_var Build(const ZonCldBody& body, const ZonUnicodeString& aliasName);
};
