#pragma once
#include <array>
#include <string>
#include <vector>

#include "ZonCldExport.h"

// One named part of a mesh reader's polygon (a file that holds several
// surfaces gives them merged, as one polygon, and tells them apart here).
struct ZonCloudPolygonPart {
    std::string name;
    unsigned end = 0;                           // one past the part's last triangle
    std::array<int, 4> color = {-1, -1, -1, -1};  // R, G, B, A from 0 to 255; -1: none
    int flags = 0;
};

// Optional for polygon readers: the parts of the current polygon and labels
// of its vertices, for formats that have them. Front ends ask for it with
// ZonQueryInterface and do without it when it is null.
class ZON_CLD_API ZonICloudReadPolygonParts {
public:
    virtual ~ZonICloudReadPolygonParts() = default;
    // In triangle order; the last part ends at the polygon's last triangle.
    virtual const std::vector<ZonCloudPolygonPart>& GetPolygonParts() = 0;
    // One label per vertex of the polygon, or none when the file labels no vertex.
    virtual const std::vector<std::string>& GetVertexLabels() = 0;
};
