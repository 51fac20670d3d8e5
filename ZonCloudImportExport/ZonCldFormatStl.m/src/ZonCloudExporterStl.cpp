#include "ZonCloudExporterStl.h"

#include <filesystem>

#include "ZonCldBody.h"
#include "ZonCldSTLExporter.h"
#include "ZonExchBodyDocumentBuilder.h"
#include "ZonIReporter.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporterStl, "CloudExporterStl")

namespace {

using Kind = ZonCloudSetting::Kind;
const ZonCloudSetting Text{.key = "ExportSTLBinaryState", .option = "text", .kind = Kind::Flag, .fallback = "1",
                           .help = "STL: write the text form", .given = "0"};
const ZonCloudSetting Binary{.key = "ExportSTLBinaryState", .option = "binary", .kind = Kind::Flag, .fallback = "1",
                             .help = "STL: write the binary form (the default)", .given = "1"};
const ZonCloudSetting Scaling{.key = "ExportSTLScaling", .option = "scale", .kind = Kind::Number,
                              .help = "STL: factor applied to every coordinate written"};
const ZonCloudSetting Settings[] = {Text, Binary, Scaling};

// While it lives, passes every report on to the session's reporter and
// notes whether the document said that no mesh was written.
class EmptyWatch : public ZonIReporter {
public:
    EmptyWatch() : _session(ZonSession::GetPtrSession())
    {
        if (!_session) return;
        _next = _session->GetReporter();
        _session->SetReporter(_self);
    }
    ~EmptyWatch() override
    {
        if (_session) _session->SetReporter(_next);
    }
    void BeginReport() override
    {
        if (_next) _next->BeginReport();
    }
    void Report(const ZonError& error) override
    {
        if (error.GetMessageKey() == "ZonCldExportCmd.Empty") _empty = true;
        if (_next) _next->Report(error);
    }
    bool Empty() const { return _empty; }

private:
    ZonSession* _session;
    ZonIReporter_var _next;
    // The session holds the watch without owning it.
    ZonIReporter_var _self{this, [](ZonIReporter*) {}};
    bool _empty = false;
};

}  // namespace

ZonCloudExporterStl::ZonCloudExporterStl() : ZonCloudExporter({"CloudExporterStl", "*.stl", Meshes, Settings}) {}

std::optional<std::string> ZonCloudExporterStl::Export(const Request& request)
{
    const bool binary = Text.Read() != "0";
    ZonIExchExporter::Parameters parameters;
    parameters["BinaryState"] = binary ? "1" : "0";
    if (const std::string scaling = Scaling.Read(); !scaling.empty()) parameters["Scaling"] = scaling;
    if (request.doublePrecision) parameters["Precision"] = "precDouble";

    ZonHResult result;
    bool empty;
    {
        EmptyWatch watch;
        result = std::make_shared<ZonCldSTLExporter>()->Export(
            ZonExchBodyDocumentBuilder::Build(request.body, request.documentName), request.fileName, parameters);
        empty = watch.Empty();
    }
    std::error_code error;
    if (ZonFailed(result) || empty || !std::filesystem::exists(request.fileName.ToUtf8(), error)) return std::nullopt;
    return std::to_string(request.body.GetNumberOfTriangles()) + " triangles (" + (binary ? "binary" : "text") + " STL)";
}
