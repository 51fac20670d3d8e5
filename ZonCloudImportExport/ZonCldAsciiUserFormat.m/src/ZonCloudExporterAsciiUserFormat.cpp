#include "ZonCloudExporterAsciiUserFormat.h"

#include "ZonCloudWriteAsciiUserFormat.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporterAsciiUserFormat, "CloudExporterAsciiUserFormat")

namespace {
// In the writer's order of settings.
const ZonCloudSetting Settings[] = {
    {.key = "ExportAUFHeader", .option = "auf-header", .fallback = "N", .help = ".asc_fmt: header text, N for none"},
    {.key = "ExportAUFName", .option = "auf-name", .fallback = "N", .help = ".asc_fmt: name text, N for none"},
    {.key = "ExportAUFSepRowChar", .option = "auf-row-sep", .fallback = "N",
     .help = ".asc_fmt: row separator text, N for none"},
    {.key = "ExportAUFSepColChar", .option = "auf-col-sep", .fallback = "N",
     .help = ".asc_fmt: column separator text, N for none"},
    {.key = "ExportAUFPointNumber", .option = "auf-numbers", .fallback = "N",
     .help = ".asc_fmt: point number column, Y or N", .choices = "Y|N"},
    {.key = "ExportAUFColumWidth", .option = "auf-width", .fallback = "12", .help = ".asc_fmt: column width",
     .low = 0, .high = 1000},
    {.key = "ExportAUFDecimalPlace", .option = "auf-decimals", .fallback = "3", .help = ".asc_fmt: decimal places",
     .low = 0, .high = 100},
};
}  // namespace

ZonCloudExporterAsciiUserFormat::ZonCloudExporterAsciiUserFormat()
    : ZonCloudPointExporter({"CloudExporterAsciiUserFormat", "*.asc_fmt", EveryKind, Settings}, "ASCII user format", true)
{
}

ZonICloudWritePointFile_var ZonCloudExporterAsciiUserFormat::CreateWriter(const ZonUnicodeString& fileName)
{
    auto writer = std::make_shared<ZonCloudWriteAsciiUserFormat>(fileName);
    ZonListValZonString values;
    for (const ZonCloudSetting& setting : Settings) values.push_back(setting.Read());
    writer->SetWriteSettings(values);
    return writer;
}
