#pragma once
#include "ZonCloudExporter.h"

// Exporter of STL files (".stl"): builds the exchange document of the body
// and hands it to the STL exporter ("STLExporter"), binary unless the
// settings ask for text, with an optional scale factor. Only meshes are
// written; the output document reports the other parts as skipped.
class ZON_CLD_API ZonCloudExporterStl : public ZonCloudExporter {
public:
    ZonCloudExporterStl();
    std::optional<std::string> Export(const Request& request) override;
};
