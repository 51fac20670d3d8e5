#include "ZonCloudExporter3MF.h"

#include <filesystem>

#include "ZonCld3MFExporter.h"
#include "ZonCldBody.h"
#include "ZonExchBodyDocumentBuilder.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporter3MF, "CloudExporter3MF")

namespace {

using Kind = ZonCloudSetting::Kind;
const ZonCloudSetting Scaling{.key = "Export3MFScaling", .option = "scale", .kind = Kind::Number,
                              .help = "3MF: factor applied to every coordinate written"};
const ZonCloudSetting Strict{.key = "Export3MFStrict", .option = "3mf-strict", .kind = Kind::Flag, .fallback = "0",
                             .help = "3MF: number objects from 1 and name the document in a Title metadata, "
                                     "as strict 3MF readers require",
                             .given = "1"};
const ZonCloudSetting Settings[] = {Scaling, Strict};

}  // namespace

ZonCloudExporter3MF::ZonCloudExporter3MF() : ZonCloudExporter({"CloudExporter3MF", "*.3mf", Meshes, Settings}) {}

std::optional<std::string> ZonCloudExporter3MF::Export(const Request& request)
{
    ZonIExchExporter::Parameters parameters;
    if (const std::string scaling = Scaling.Read(); !scaling.empty()) parameters["Scaling"] = scaling;
    parameters["Strict"] = std::string(Strict.ReadBool() ? "1" : "0");

    const ZonHResult result = std::make_shared<ZonCld3MFExporter>()->Export(
        ZonExchBodyDocumentBuilder::Build(request.body, request.documentName), request.fileName, parameters);
    std::error_code error;
    if (ZonFailed(result) || !std::filesystem::exists(request.fileName.ToUtf8(), error)) return std::nullopt;
    return std::to_string(request.body.GetNumberOfTriangles()) + " triangles (3MF)";
}
