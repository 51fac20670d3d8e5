// zoncloud convert: imports a file as the host would, then writes the body
// with the exporter that the output file's extension names.
#include <filesystem>
#include <iostream>

#include "ZonCldBody.h"
#include "ZonCloudExporter.h"
#include "ZonCloudTool.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIReporter.h"

namespace {

struct ConvertOptions {
    std::string output;
    ZonToolSettingOptions exporterOptions;
};

// Collects what the exporters report while it lives, then puts the session's
// own reporter back.
class ReportCollector {
public:
    ReportCollector() : _session(ZonSession::GetPtrSession())
    {
        if (!_session) return;
        _previous = _session->GetReporter();
        _session->SetReporter(_collector);
    }
    ~ReportCollector()
    {
        if (_session) _session->SetReporter(_previous);
    }
    std::vector<ZonCollectingReporter::Entry> Entries() const { return _collector->Entries(); }

private:
    ZonSession* _session;
    ZonIReporter_var _previous;
    std::shared_ptr<ZonCollectingReporter> _collector = std::make_shared<ZonCollectingReporter>();
};

int NothingWritten(const std::string& file)
{
    std::cout << "nothing was written to " << file << "\n";
    return 1;
}

std::string Extensions()
{
    std::string list;
    for (const auto& exporter : ZonCloudExporter::GetAll())
        for (const std::string& extension : exporter->GetExtensions()) list += (list.empty() ? "" : " ") + extension;
    return list;
}

}  // namespace

ZonToolRun ZonToolAddConvert(CLI::App& app)
{
    auto* command = app.add_subcommand("convert", "Import a file as the host would and write it in another format");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto convert = std::make_shared<ConvertOptions>();
    options->AddTo(*command);
    command->add_option("OUT", convert->output, "File to write; its extension chooses the format (" + Extensions() + ")")
        ->required();
    convert->exporterOptions.AddTo(*command, ZonToolExporterSettings());
    return [options, convert]() -> int {
        options->ApplyToSettings();
        convert->exporterOptions.ApplyToSettings();
        // Refuse an unknown target before reading a possibly large input.
        const ZonCloudExporter_var exporter = ZonCloudExporter::ForFile(ZonUnicodeString(convert->output));

        ZonGeoFactoryProtected geometry;
        std::vector<ZonString> messages;
        const std::shared_ptr<ZonCldBody> body = options->Import(geometry, messages);
        if (!body) return NothingWritten(convert->output);
        // The document's name in the output is the input's file name without its extension.
        const std::string name = std::filesystem::path(options->file).stem().string();

        // The exporter's outcome messages, one line each, then what was written.
        std::optional<std::string> summary;
        {
            ReportCollector collector;
            summary = exporter->Export({*body, ZonUnicodeString(convert->output), name, options->doublePrecision});
            for (const auto& entry : collector.Entries()) std::cout << entry.message << "\n";
        }
        if (!summary) return NothingWritten(convert->output);
        std::cout << convert->output << ": " << *summary << "\n";
        return 0;
    };
}
