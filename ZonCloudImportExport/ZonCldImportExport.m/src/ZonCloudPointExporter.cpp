#include "ZonCloudPointExporter.h"

#include <limits>

#include "ZonCldBody.h"
#include "ZonCloudExportOutcome.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWritePointLines.h"

namespace {

using Run = ZonCloudWritePointLines::Run;

// Every array of points of the body, in its own precision, with its colours
// and validity bytes if it has them.
template <class Visit>
void ForEachRun(const ZonCldBody& body, Visit visit)
{
    const auto points = [&](const ZonCldPointArray& array, const std::vector<unsigned char>* colors,
                            const std::vector<unsigned char>* valid) {
        Run run;
        run.count = array.GetNumberOfPoints();
        if (run.count == 0) return;
        if (array.IsDoublePrecision()) run.dual = array.GetDoubles().data();
        else run.single = array.GetFloats().data();
        if (colors && colors->size() >= 3 * run.count) run.rgb = colors->data();
        // A grid point without a validity byte counts as a hole.
        std::vector<unsigned char> padded;
        if (valid) {
            if (valid->size() < run.count) {
                padded.assign(valid->begin(), valid->end());
                padded.resize(run.count, 0);
                run.valid = padded.data();
            } else {
                run.valid = valid->data();
            }
        }
        visit(run);
    };
    for (const auto& cloud : body.GetClouds())
        if (cloud) points(cloud->Points(), &cloud->Colors(), nullptr);
    for (const auto& set : body.GetSetsOfScans())
        if (set)
            for (const auto& scan : set->GetScans())
                if (scan) points(scan->Points(), nullptr, nullptr);
    for (const auto& set : body.GetSetsOfGrids())
        if (set)
            for (const auto& grid : set->GetGrids())
                if (grid)
                    for (const auto& row : grid->GetRows()) points(row.points, nullptr, &row.valid);
    for (const auto& polygon : body.GetPolygons())
        if (polygon) points(polygon->Vertices(), nullptr, nullptr);
}

std::size_t Lines(const Run& run)
{
    if (!run.valid) return run.count;
    std::size_t n = 0;
    for (std::size_t i = 0; i < run.count; ++i) n += run.valid[i] != 0;
    return n;
}

// A writer of another kind gets the points one by one.
void WriteOneByOne(ZonICloudWritePointFile& writer, const Run& run)
{
    for (std::size_t i = 0; i < run.count; ++i) {
        if (run.valid && !run.valid[i]) continue;
        const unsigned char* rgb = run.rgb ? run.rgb + 3 * i : run.defaultRgb;
        if (run.dual) {
            if (rgb) writer.WritePointColorDouble(run.dual + 3 * i, rgb);
            else writer.WritePointDouble(run.dual + 3 * i);
        } else {
            if (rgb) writer.WritePointColor(run.single + 3 * i, rgb);
            else writer.WritePoint(run.single + 3 * i);
        }
    }
}

}  // namespace

std::optional<std::string> ZonCloudPointExporter::Export(const Request& request)
{
    std::size_t count = 0;
    bool anyColor = false;
    ForEachRun(request.body, [&](const Run& run) {
        const std::size_t lines = Lines(run);
        count += lines;
        anyColor |= lines > 0 && run.rgb != nullptr;
    });
    if (count == 0) {
        ZonCloudExportOutcome::Report("ERR_NoActivePoints", request.fileName, ZonCloudExportOutcome::NotWritten);
        return std::nullopt;
    }
    if (count > std::numeric_limits<unsigned>::max()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    static const unsigned char white[3] = {255, 255, 255};
    {
        const ZonICloudWritePointFile_var writer = CreateWriter(request.fileName);
        auto* lines = dynamic_cast<ZonCloudWritePointLines*>(writer.get());
        writer->BeginWritePoints(static_cast<unsigned>(count));
        ForEachRun(request.body, [&](Run run) {
            run.defaultRgb = anyColor ? white : nullptr;
            if (lines) lines->WritePoints(run);
            else WriteOneByOne(*writer, run);
        });
        writer->EndWritePoints();
    }
    ZonCloudExportOutcome::Report("ERR_FILESUCCESSFULL", request.fileName, ZonCloudExportOutcome::Written);
    return std::to_string(count) + " points" + (anyColor && _withColors ? " with colours" : "") + " (" + _formatName + ")";
}
