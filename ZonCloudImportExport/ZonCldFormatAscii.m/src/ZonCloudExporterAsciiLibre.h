#pragma once
#include "ZonCloudExporter.h"

// Exporter of free ASCII files (".asc", ".libre", ".ascii") through
// ZonCloudWriteAsciiLibre. Scans are written as scans; clouds, the valid
// points of grids and the vertices of meshes as one cloud. A body with only
// one of the two gives a scan file or a cloud file, a body with both a
// multi-part file.
class ZON_CLD_API ZonCloudExporterAsciiLibre : public ZonCloudExporter {
public:
    ZonCloudExporterAsciiLibre();
    std::optional<std::string> Export(const Request& request) override;
};
