#pragma once
#include "ZonCloudExporter.h"

// Exporter of 3MF packages (".3mf"): builds the exchange document of the
// body and hands it to the 3MF exporter ("3MFExporter"), with an optional
// scale factor and the strict form. Only meshes are written; the output
// document reports the other parts as skipped.
class ZON_CLD_API ZonCloudExporter3MF : public ZonCloudExporter {
public:
    ZonCloudExporter3MF();
    std::optional<std::string> Export(const Request& request) override;
};
