#include "ZonToolPointFormats.h"

#include <iostream>
#include <limits>
#include <vector>

#include "ZonCldBody.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWriteAsciiUserFormat.h"
#include "ZonCloudWriteCgoAscii.h"
#include "ZonCloudWriteLeica.h"
#include "ZonError.h"

void ZonToolUserFormatOptions::AddTo(CLI::App& command)
{
    command.add_option("--auf-header", header, ".asc_fmt: header text, N for none");
    command.add_option("--auf-name", name, ".asc_fmt: name text, N for none");
    command.add_option("--auf-row-sep", rowSeparator, ".asc_fmt: row separator text, N for none");
    command.add_option("--auf-col-sep", columnSeparator, ".asc_fmt: column separator text, N for none");
    command.add_option("--auf-numbers", pointNumbers, ".asc_fmt: point number column, Y or N")
        ->check(CLI::IsMember({"Y", "N"}));
    command.add_option("--auf-width", width, ".asc_fmt: column width")->check(CLI::Range(0, 1000));
    command.add_option("--auf-decimals", decimals, ".asc_fmt: decimal places")->check(CLI::Range(0, 100));
}

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

// Shows the export's outcome message as the host would.
void Report(const char* code, const std::string& file)
{
    ZonError outcome(std::string("ZonCldExportCmd.") + code, "ZonCldExportCmd");
    outcome.SetParameters({file});
    std::cout << outcome.GetNLSMessage() << "\n";
}

// Writes every point as one cloud; colourless points get white in a file
// whose other points have colours, so that every line has the same columns.
template <class Writer>
int WritePoints(Writer& writer, const ZonCldBody& body, const std::string& file, const char* formatName,
                bool formatHasColors)
{
    std::size_t count = 0;
    bool anyColor = false;
    ForEachPoint(body, [&](const PointSource& p) {
        ++count;
        anyColor |= p.rgb != nullptr;
    });
    if (count == 0) {
        Report("ERR_NoActivePoints", file);
        std::cout << "nothing was written to " << file << "\n";
        return 1;
    }
    if (count > std::numeric_limits<unsigned>::max()) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    static const unsigned char white[3] = {255, 255, 255};
    writer.BeginWritePoints(static_cast<unsigned>(count));
    ForEachPoint(body, [&](const PointSource& p) {
        const unsigned char* rgb = p.rgb ? p.rgb : anyColor ? white : nullptr;
        if (p.dual) {
            if (rgb) writer.WritePointColorDouble(p.dual, rgb);
            else writer.WritePointDouble(p.dual);
        } else {
            if (rgb) writer.WritePointColor(p.single, rgb);
            else writer.WritePoint(p.single);
        }
    });
    writer.EndWritePoints();
    Report("ERR_FILESUCCESSFULL", file);
    std::cout << file << ": " << count << " points" << (anyColor && formatHasColors ? " with colours" : "") << " (" << formatName
              << ")\n";
    return 0;
}

}  // namespace

int ZonToolWriteUserFormat(const ZonCldBody& body, const std::string& file, const ZonToolUserFormatOptions& options)
{
    ZonCloudWriteAsciiUserFormat writer{ZonUnicodeString(file)};
    writer.SetWriteSettings({options.header, options.name, options.rowSeparator, options.columnSeparator,
                             options.pointNumbers, options.width, options.decimals});
    return WritePoints(writer, body, file, "ASCII user format", true);
}

int ZonToolWriteRgbPoints(const ZonCldBody& body, const std::string& file)
{
    ZonCloudWriteLeica writer{ZonUnicodeString(file)};
    return WritePoints(writer, body, file, "RGB points", true);
}

int ZonToolWriteCgo(const ZonCldBody& body, const std::string& file)
{
    ZonCloudWriteCgoAscii writer{ZonUnicodeString(file)};
    return WritePoints(writer, body, file, "Cgo", false);
}
