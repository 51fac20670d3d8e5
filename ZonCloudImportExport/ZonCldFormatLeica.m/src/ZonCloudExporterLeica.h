#pragma once
#include "ZonCloudPointExporter.h"

// Exporter of RGB point files (".asc_rgb", ".xyz_rgb") through ZonCloudWriteLeica.
class ZON_CLD_API ZonCloudExporterLeica : public ZonCloudPointExporter {
public:
    ZonCloudExporterLeica();

protected:
    ZonICloudWritePointFile_var CreateWriter(const ZonUnicodeString& fileName) override;
};
