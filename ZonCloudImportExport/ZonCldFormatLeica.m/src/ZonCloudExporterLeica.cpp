#include "ZonCloudExporterLeica.h"

#include "ZonCloudWriteLeica.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporterLeica, "CloudExporterLeica")

ZonCloudExporterLeica::ZonCloudExporterLeica()
    : ZonCloudPointExporter({"CloudExporterLeica", "*.asc_rgb;*.xyz_rgb", EveryKind}, "RGB points", true)
{
}

ZonICloudWritePointFile_var ZonCloudExporterLeica::CreateWriter(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudWriteLeica>(fileName);
}
