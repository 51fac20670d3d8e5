#pragma once
#include "ZonCloudPointExporter.h"

// Exporter of the ASCII user format (".asc_fmt") through
// ZonCloudWriteAsciiUserFormat, with the writer's seven layout settings taken
// from the settings store (each as the writer's own text, "N" for none).
class ZON_CLD_API ZonCloudExporterAsciiUserFormat : public ZonCloudPointExporter {
public:
    ZonCloudExporterAsciiUserFormat();

protected:
    ZonICloudWritePointFile_var CreateWriter(const ZonUnicodeString& fileName) override;
};
