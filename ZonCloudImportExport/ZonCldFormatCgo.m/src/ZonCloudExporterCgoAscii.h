#pragma once
#include "ZonCloudPointExporter.h"

// Exporter of Cgo ASCII point files (".cgo") through ZonCloudWriteCgoAscii;
// the format has no colours.
class ZON_CLD_API ZonCloudExporterCgoAscii : public ZonCloudPointExporter {
public:
    ZonCloudExporterCgoAscii();

protected:
    ZonICloudWritePointFile_var CreateWriter(const ZonUnicodeString& fileName) override;
};
