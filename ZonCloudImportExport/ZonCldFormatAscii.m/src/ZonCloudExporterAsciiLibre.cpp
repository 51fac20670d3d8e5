#include "ZonCloudExporterAsciiLibre.h"

#include <limits>

#include "ZonCldBody.h"
#include "ZonCloudExportOutcome.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWriteAsciiLibre.h"

ZON_REGISTER_CLOUD_EXPORTER(ZonCloudExporterAsciiLibre, "CloudExporterAsciiLibre")

namespace {

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

// The whole array in one call, so that a large one is formatted on the worker pool.
void WritePoints(ZonCloudWriteAsciiLibre& writer, const ZonCldPointArray& points,
                 const std::vector<unsigned char>* valid = nullptr)
{
    ZonCloudWriteAsciiLibre::Run run;
    run.count = points.GetNumberOfPoints();
    if (run.count == 0) return;
    if (points.IsDoublePrecision()) run.dual = points.GetDoubles().data();
    else run.single = points.GetFloats().data();
    std::vector<unsigned char> padded;
    if (valid) {
        padded.resize(run.count);
        for (std::size_t i = 0; i < run.count; ++i) padded[i] = IsValid(valid, i) ? 1 : 0;
        run.valid = padded.data();
    }
    writer.WritePoints(run);
}

std::size_t ValidPoints(const ZonCldGrid::Row& row)
{
    std::size_t n = 0;
    for (std::size_t i = 0; i < row.points.GetNumberOfPoints(); ++i) n += IsValid(&row.valid, i) ? 1 : 0;
    return n;
}

std::size_t LoosePoints(const ZonCldBody& body)
{
    std::size_t loose = 0;
    for (const auto& cloud : body.GetClouds()) loose += cloud->GetNumberOfPoints();
    for (const auto& set : body.GetSetsOfGrids())
        for (const auto& grid : set->GetGrids())
            for (const auto& row : grid->GetRows()) loose += ValidPoints(row);
    for (const auto& polygon : body.GetPolygons()) loose += polygon->GetNumberOfVertices();
    return loose;
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

}  // namespace

ZonCloudExporterAsciiLibre::ZonCloudExporterAsciiLibre()
    : ZonCloudExporter({"CloudExporterAsciiLibre", "*.asc;*.libre;*.ascii", EveryKind})
{
}

std::optional<std::string> ZonCloudExporterAsciiLibre::Export(const Request& request)
{
    const ZonCldBody& body = request.body;
    const std::size_t loose = LoosePoints(body);
    const std::size_t scans = body.GetNumberOfScans();
    if (loose == 0 && scans == 0) {
        ZonCloudExportOutcome::Report("ERR_NoActivePoints", request.fileName, ZonCloudExportOutcome::NotWritten);
        return std::nullopt;
    }
    {
        ZonCloudWriteAsciiLibre writer{request.fileName};
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
    ZonCloudExportOutcome::Report("ERR_FILESUCCESSFULL", request.fileName, ZonCloudExportOutcome::Written);
    std::size_t scanPoints = 0;
    for (const auto& set : body.GetSetsOfScans()) scanPoints += set->GetNumberOfPoints();
    std::string summary;
    if (loose) summary += std::to_string(loose) + " points" + (scans ? " and " : "");
    if (scans) summary += std::to_string(scans) + " scans of " + std::to_string(scanPoints) + " points";
    return summary + " (free ASCII)";
}
