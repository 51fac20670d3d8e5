// zoncloud convert: imports a file as the host would, then writes the body in
// the format that the output file's extension names.
#include <cstdio>
#include <filesystem>
#include <iostream>
#include <limits>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudTool.h"
#include "ZonCloudWriteAsciiLibre.h"
#include "ZonExchBodyDocumentBuilder.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIExchExporter.h"
#include "ZonIReporter.h"
#include "ZonObjectRegistry.h"
#include "ZonToolPointFormats.h"

namespace {

struct ConvertOptions {
    std::string output;
    bool text = false;
    bool binary = false;
    std::optional<double> scale;
    bool doublePrecision = false;
    ZonToolUserFormatOptions userFormat;
};

// Shows the outcome messages as the host does, one line each.
void Show(const std::vector<ZonCollectingReporter::Entry>& entries)
{
    for (const auto& entry : entries) std::cout << entry.message << "\n";
}

bool HasKey(const std::vector<ZonCollectingReporter::Entry>& entries, const std::string& key)
{
    for (const auto& entry : entries)
        if (entry.key == key) return true;
    return false;
}

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

void ReportOutcome(const char* code, const std::string& file, int level)
{
    ZonSession* session = ZonSession::GetPtrSession();
    const ZonIReporter_var reporter = session ? session->GetReporter() : nullptr;
    if (!reporter) return;
    ZonError outcome(std::string("ZonCldExportCmd.") + code, "ZonCldExportCmd");
    outcome.SetSeverity(level);
    outcome.SetParameters({file});
    reporter->BeginReport();
    reporter->Report(outcome);
}

int NothingWritten(const std::string& file)
{
    std::cout << "nothing was written to " << file << "\n";
    return 1;
}

// ---- Free ASCII ---------------------------------------------------------------

unsigned Count32(std::size_t count)
{
    if (count > std::numeric_limits<unsigned>::max()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    return static_cast<unsigned>(count);
}

// A grid point without a validity byte counts as a hole.
bool IsValid(const std::vector<unsigned char>* valid, std::size_t i)
{
    return !valid || (i < valid->size() && (*valid)[i]);
}

void WritePoints(ZonCloudWriteAsciiLibre& writer, const ZonCldPointArray& points,
                 const std::vector<unsigned char>* valid = nullptr)
{
    const std::size_t n = points.GetNumberOfPoints();
    for (std::size_t i = 0; i < n; ++i) {
        if (!IsValid(valid, i)) continue;
        if (points.IsDoublePrecision()) writer.WritePointDouble(points.GetDoubles().data() + 3 * i);
        else writer.WritePoint(points.GetFloats().data() + 3 * i);
    }
}

std::size_t ValidPoints(const ZonCldGrid::Row& row)
{
    std::size_t n = 0;
    for (std::size_t i = 0; i < row.points.GetNumberOfPoints(); ++i) n += IsValid(&row.valid, i) ? 1 : 0;
    return n;
}

// Every point of the body that is not in a scan, as one cloud.
void WriteLoosePoints(ZonCloudWriteAsciiLibre& writer, const ZonCldBody& body, std::size_t count)
{
    writer.BeginWritePoints(Count32(count));
    for (const auto& cloud : body.GetClouds()) WritePoints(writer, cloud->Points());
    for (const auto& set : body.GetSetsOfGrids())
        for (const auto& grid : set->GetGrids())
            for (const auto& row : grid->GetRows()) WritePoints(writer, row.points, &row.valid);
    for (const auto& polygon : body.GetPolygons()) WritePoints(writer, polygon->Vertices());
    writer.EndWritePoints();
}

void WriteScans(ZonCloudWriteAsciiLibre& writer, const ZonCldBody& body)
{
    writer.BeginWriteScans(Count32(body.GetNumberOfScans()));
    for (const auto& set : body.GetSetsOfScans())
        for (const auto& scan : set->GetScans()) {
            const ZonCldPointArray& points = scan->Points();
            const unsigned n = Count32(points.GetNumberOfPoints());
            if (points.IsDoublePrecision()) writer.WriteScanDouble(points.GetDoubles().data(), n);
            else writer.WriteScan(points.GetFloats().data(), n);
        }
    writer.EndWriteScans();
}

// Scans as scans, and clouds, grids' valid points and mesh vertices as points:
// a scan file or a cloud file when the body holds only one kind, a multi-part
// file when it holds both.
int WriteFreeAscii(const ZonCldBody& body, const std::string& file, const ConvertOptions&)
{
    std::size_t loose = 0;
    for (const auto& cloud : body.GetClouds()) loose += cloud->GetNumberOfPoints();
    for (const auto& set : body.GetSetsOfGrids())
        for (const auto& grid : set->GetGrids())
            for (const auto& row : grid->GetRows()) loose += ValidPoints(row);
    for (const auto& polygon : body.GetPolygons()) loose += polygon->GetNumberOfVertices();
    const std::size_t scans = body.GetNumberOfScans();

    ReportCollector collector;
    if (loose == 0 && scans == 0) {
        ReportOutcome("ERR_NoActivePoints", file, 4);
        Show(collector.Entries());
        return NothingWritten(file);
    }
    {
        ZonCloudWriteAsciiLibre writer{ZonUnicodeString(file)};
        if (scans == 0) {
            WriteLoosePoints(writer, body, loose);
        } else if (loose == 0) {
            WriteScans(writer, body);
        } else {
            if (ZonFailed(writer.BeginMultiWrite())) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
            WriteLoosePoints(writer, body, loose);
            WriteScans(writer, body);
            writer.EndMultiWrite();
        }
    }
    ReportOutcome("ERR_FILESUCCESSFULL", file, 1);
    Show(collector.Entries());
    std::size_t scanPoints = 0;
    for (const auto& set : body.GetSetsOfScans()) scanPoints += set->GetNumberOfPoints();
    std::cout << file << ": ";
    if (loose) std::cout << loose << " points" << (scans ? " and " : "");
    if (scans) std::cout << scans << " scans of " << scanPoints << " points";
    std::cout << " (free ASCII)\n";
    return 0;
}

// ---- STL ----------------------------------------------------------------------

int WriteStl(const ZonCldBody& body, const std::string& file, const ConvertOptions& options, const std::string& alias)
{
    auto exporter = ZonQueryInterface<ZonIExchExporter>(ZonObjectRegistry::CreateByLateType("STLExporter"));
    if (!exporter) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_FormatNotImplemented");
    ZonIExchExporter::Parameters parameters;
    parameters["BinaryState"] = options.text ? "0" : "1";
    if (options.scale) parameters["Scaling"] = ZonFormat("%.17g", *options.scale);
    if (options.doublePrecision) parameters["Precision"] = "precDouble";

    ReportCollector collector;
    const ZonHResult result = exporter->Export(ZonExchBodyDocumentBuilder::Build(body, alias), file, parameters);
    const auto entries = collector.Entries();
    Show(entries);
    std::error_code error;
    if (ZonFailed(result) || HasKey(entries, "ZonCldExportCmd.Empty") || !std::filesystem::exists(file, error))
        return NothingWritten(file);
    std::cout << file << ": " << body.GetNumberOfTriangles() << " triangles (" << (options.text ? "text" : "binary")
              << " STL)\n";
    return 0;
}

// The writers by extension of the output file. A format that can be written
// adds its extensions and its function here.
struct Target {
    std::vector<std::string> extensions;
    std::function<int(const ZonCldBody&, const std::string&, const ConvertOptions&, const std::string& alias)> write;
};

const std::vector<Target>& Targets()
{
    static const std::vector<Target> targets = {
        {{".asc", ".libre", ".ascii"},
         [](const ZonCldBody& body, const std::string& file, const ConvertOptions& options, const std::string&) {
             return WriteFreeAscii(body, file, options);
         }},
        {{".stl"}, WriteStl},
        {{".asc_fmt"},
         [](const ZonCldBody& body, const std::string& file, const ConvertOptions& options, const std::string&) {
             return ZonToolWriteUserFormat(body, file, options.userFormat);
         }},
        {{".asc_rgb", ".xyz_rgb"},
         [](const ZonCldBody& body, const std::string& file, const ConvertOptions&, const std::string&) {
             return ZonToolWriteRgbPoints(body, file);
         }},
        {{".cgo"},
         [](const ZonCldBody& body, const std::string& file, const ConvertOptions&, const std::string&) {
             return ZonToolWriteCgo(body, file);
         }},
    };
    return targets;
}

const Target* TargetOf(const std::string& file)
{
    const std::string extension = ZonCldImportServices::ExtensionOf(ZonUnicodeString(file)).ToUtf8();
    for (const Target& target : Targets())
        for (const std::string& candidate : target.extensions)
            if (candidate == extension) return &target;
    return nullptr;
}

}  // namespace

ZonToolRun ZonToolAddConvert(CLI::App& app)
{
    auto* command = app.add_subcommand("convert", "Import a file as the host would and write it in another format");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto convert = std::make_shared<ConvertOptions>();
    options->AddTo(*command);
    command->add_option("OUT", convert->output, "File to write; its extension chooses the format (.asc .libre .ascii .stl .asc_fmt .asc_rgb .xyz_rgb .cgo)")
        ->required();
    auto* text = command->add_flag("--text", convert->text, "STL: write the text form");
    auto* binary = command->add_flag("--binary", convert->binary, "STL: write the binary form (the default)");
    text->excludes(binary);
    command->add_option("--scale", convert->scale, "STL: factor applied to every coordinate written");
    convert->userFormat.AddTo(*command);
    return [options, convert]() -> int {
        options->ApplyToSettings();
        convert->doublePrecision = options->doublePrecision;
        // Refuse an unknown target before reading a possibly large input.
        const Target* target = TargetOf(convert->output);
        if (!target) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, "ERR_UnknownExtension");

        ZonGeoFactoryProtected geometry;
        std::vector<ZonString> messages;
        const std::shared_ptr<ZonCldBody> body = options->Import(geometry, messages);
        if (!body) return NothingWritten(convert->output);
        // The document's name in the output is the input's file name without its extension.
        const std::string alias = std::filesystem::path(options->file).stem().string();
        return target->write(*body, convert->output, *convert, alias);
    };
}
