#include "ZonCloudExporterCgoAscii.h"

#include "ZonCloudWriteCgoAscii.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporterCgoAscii, "CloudExporterCgoAscii")

ZonCloudExporterCgoAscii::ZonCloudExporterCgoAscii()
    : ZonCloudPointExporter({"CloudExporterCgoAscii", "*.cgo", EveryKind}, "Cgo", false)
{
}

ZonICloudWritePointFile_var ZonCloudExporterCgoAscii::CreateWriter(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudWriteCgoAscii>(fileName);
}
