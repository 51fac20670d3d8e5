#include "ZonCloudPointExporter.h"

#include <limits>

#include "ZonCldBody.h"
#include "ZonCloudExportOutcome.h"
#include "ZonCloudReadNLSTool.h"

namespace {

// One point of the body, in its own precision, with its colour if it has one.
struct PointSource {
    const float* single = nullptr;
    const double* dual = nullptr;
    const unsigned char* rgb = nullptr;
};

template <class Visit>
void ForEachPoint(const ZonCldBody& body, Visit visit)
{
    const auto points = [&](const ZonCldPointArray& array, const std::vector<unsigned char>* colors,
                            const std::vector<unsigned char>* valid) {
        const std::size_t n = array.GetNumberOfPoints();
        const bool colored = colors && colors->size() >= 3 * n;
        for (std::size_t i = 0; i < n; ++i) {
            // A grid point without a validity byte counts as a hole.
            if (valid && !(i < valid->size() && (*valid)[i])) continue;
            PointSource p;
            if (array.IsDoublePrecision()) p.dual = array.GetDoubles().data() + 3 * i;
            else p.single = array.GetFloats().data() + 3 * i;
            if (colored) p.rgb = colors->data() + 3 * i;
            visit(p);
        }
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

}  // namespace

std::optional<std::string> ZonCloudPointExporter::Export(const Request& request)
{
    std::size_t count = 0;
    bool anyColor = false;
    ForEachPoint(request.body, [&](const PointSource& p) {
        ++count;
        anyColor |= p.rgb != nullptr;
    });
    if (count == 0) {
        ZonCloudExportOutcome::Report("ERR_NoActivePoints", request.fileName, ZonCloudExportOutcome::NotWritten);
        return std::nullopt;
    }
    if (count > std::numeric_limits<unsigned>::max()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    static const unsigned char white[3] = {255, 255, 255};
    {
        const ZonICloudWritePointFile_var writer = CreateWriter(request.fileName);
        writer->BeginWritePoints(static_cast<unsigned>(count));
        ForEachPoint(request.body, [&](const PointSource& p) {
            const unsigned char* rgb = p.rgb ? p.rgb : anyColor ? white : nullptr;
            if (p.dual) {
                if (rgb) writer->WritePointColorDouble(p.dual, rgb);
                else writer->WritePointDouble(p.dual);
            } else {
                if (rgb) writer->WritePointColor(p.single, rgb);
                else writer->WritePoint(p.single);
            }
        });
        writer->EndWritePoints();
    }
    ZonCloudExportOutcome::Report("ERR_FILESUCCESSFULL", request.fileName, ZonCloudExportOutcome::Written);
    return std::to_string(count) + " points" + (anyColor && _withColors ? " with colours" : "") + " (" + _formatName + ")";
}
