// zoncloud dump: the reader's own answers, walked with the reader protocol
// (not through the import engine), as one JSON object.
#include <cstdint>
#include <iostream>

#include "ZonBaseUnknown.h"
#include "ZonCloudTool.h"
#include "ZonICloudReadGridFile.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonICloudReadPolygonParts.h"
#include "ZonICloudReadScanFile.h"

namespace {

template <class T>
nlohmann::json PointsJson(const T* xyz, unsigned count)
{
    nlohmann::json list = nlohmann::json::array();
    if (!xyz) return list;
    for (std::size_t i = 0; i < count; ++i) {
        const T* p = xyz + 3 * i;
        list.push_back({ZonToolNumber(p[0]), ZonToolNumber(p[1]), ZonToolNumber(p[2])});
    }
    return list;
}

class Dumper {
public:
    Dumper(const ZonICloudReadFile_var& reader, const ZonToolReaderOptions& options)
        : _reader(reader), _clip(options.HasBox()), _box(_clip ? options.Box() : ZonMathBox()),
          _double(options.doublePrecision && reader->HasDoublePrecision())
    {
    }

    nlohmann::json Run(const std::string& formatName)
    {
        nlohmann::json out;
        out["format"] = formatName;
        const int type = _reader->GetTypeOfDigitization();
        out["type"] = type;
        const ZonICkeUnit_var unit = _reader->GetLengthUnit();
        out["unit"] = unit ? nlohmann::json(unit->Name()) : nlohmann::json(nullptr);
        ZonMathBox box;
        _reader->GetBoundingBox(box);
        out["bbox"] = ZonToolBoxJson(box);
        out["points"] = _reader->GetNumberOfPoints();
        out["cloud"] = Cloud();
        if (type == DigitizationScans)
            if (auto scans = ZonQueryInterface<ZonICloudReadScanFile>(_reader)) out["sets"] = Sets(*scans);
        if (type == DigitizationGrids)
            if (auto grids = ZonQueryInterface<ZonICloudReadGridFile>(_reader)) out["grids"] = Grids(*grids);
        if (type == DigitizationPolygons)
            if (auto polygons = ZonQueryInterface<ZonICloudReadPolygonFile>(_reader)) out["polygons"] = Polygons(*polygons);
        return out;
    }

private:
    nlohmann::json Cloud()
    {
        nlohmann::json cloud;
        unsigned count = 0;
        if (_double) {
            const double* points = _clip ? _reader->GetPointsInBoxDouble(_box, count) : _reader->GetPointsDouble(count);
            cloud["points"] = PointsJson(points, count);
        } else {
            const float* points = _clip ? _reader->GetPointsInBox(_box, count) : _reader->GetPoints(count);
            cloud["points"] = PointsJson(points, count);
        }
        // Colours and per-point attributes index the whole cloud: a box query has no counterpart for them.
        if (_clip) return cloud;
        unsigned colorCount = 0;
        if (const unsigned char* colors = _reader->GetPointColors(colorCount); colors && colorCount > 0) {
            nlohmann::json list = nlohmann::json::array();
            for (std::size_t i = 0; i < colorCount; ++i)
                list.push_back({colors[3 * i], colors[3 * i + 1], colors[3 * i + 2]});
            cloud["colors"] = std::move(list);
        }
        AddPointAttributes(cloud);
        return cloud;
    }

    // Per-format extras of a cloud, by the importer's reading of the attribute
    // arrays: "alpha", "symbols" and "texts", present when the reader gives them.
    void AddPointAttributes(nlohmann::json& cloud)
    {
        unsigned count = 0;
        if (const auto* alphas = static_cast<const std::int32_t*>(_reader->GetPointAttributes1(count)); alphas && count)
            cloud["alpha"] = std::vector<std::int32_t>(alphas, alphas + count);
        count = 0;
        if (const auto* symbols = static_cast<const std::int32_t*>(_reader->GetPointAttributes2(count)); symbols && count)
            cloud["symbols"] = std::vector<std::int32_t>(symbols, symbols + count);
        count = 0;
        if (const auto* texts = static_cast<const std::string*>(_reader->GetPointAttributes3(count)); texts && count)
            cloud["texts"] = std::vector<std::string>(texts, texts + count);
    }

    nlohmann::json Sets(ZonICloudReadScanFile& scans)
    {
        nlohmann::json sets = nlohmann::json::array();
        scans.BeginGetSetOfScans();
        while (scans.NextSetOfScans()) {
            nlohmann::json set = nlohmann::json::array();
            scans.BeginGetScan();
            while (scans.NextScan()) {
                unsigned count = 0;
                if (_double) {
                    const double* points =
                        _clip ? scans.GetScanPointsInBoxDouble(_box, count) : scans.GetScanPointsDouble(count);
                    set.push_back(PointsJson(points, count));
                } else {
                    const float* points = _clip ? scans.GetScanPointsInBox(_box, count) : scans.GetScanPoints(count);
                    set.push_back(PointsJson(points, count));
                }
            }
            sets.push_back(std::move(set));
        }
        return sets;
    }

    template <class T>
    static nlohmann::json Row(const T* points, unsigned count, const unsigned char* valid)
    {
        // No validity array means no hole.
        std::vector<int> flags(count, 1);
        if (valid)
            for (std::size_t i = 0; i < count; ++i) flags[i] = valid[i] ? 1 : 0;
        return {{"points", PointsJson(points, count)}, {"valid", flags}};
    }

    nlohmann::json Grids(ZonICloudReadGridFile& grids)
    {
        nlohmann::json list = nlohmann::json::array();
        grids.BeginGetGrid();
        while (grids.NextGrid()) {
            nlohmann::json rows = nlohmann::json::array();
            grids.BeginGetGridPoints();
            for (;;) {
                unsigned count = 0;
                const unsigned char* valid = nullptr;
                if (_double) {
                    const double* points = _clip ? grids.GetGridPointsInBoxDouble(_box, count, valid)
                                                 : grids.GetGridPointsDouble(count, valid);
                    if (!points) break;
                    rows.push_back(Row(points, count, valid));
                } else {
                    const float* points =
                        _clip ? grids.GetGridPointsInBox(_box, count, valid) : grids.GetGridPoints(count, valid);
                    if (!points) break;
                    rows.push_back(Row(points, count, valid));
                }
            }
            list.push_back({{"rows", std::move(rows)}});
        }
        return list;
    }

    nlohmann::json Polygons(ZonICloudReadPolygonFile& polygons)
    {
        nlohmann::json list = nlohmann::json::array();
        polygons.BeginGetPolygon();
        while (polygons.NextPolygon()) {
            unsigned vertexCount = 0, triangleCount = 0;
            const float* vertices = nullptr;
            const unsigned* triangles = nullptr;
            if (_clip) {
                triangles = polygons.GetTrianglesInBox(_box, triangleCount, vertices, vertexCount);
            } else {
                vertices = polygons.GetPolygonPoints(vertexCount);
                triangles = polygons.GetTriangles(triangleCount);
            }
            nlohmann::json triangleList = nlohmann::json::array();
            if (triangles)
                for (std::size_t t = 0; t < triangleCount; ++t)
                    triangleList.push_back({triangles[3 * t], triangles[3 * t + 1], triangles[3 * t + 2]});
            nlohmann::json polygon = {{"vertices", PointsJson(vertices, vertexCount)},
                                      {"triangles", std::move(triangleList)}};
            if (!_clip) AddPolygonParts(polygon);
            list.push_back(std::move(polygon));
        }
        return list;
    }

    // Named parts ("surfaces": name and end, one past the last triangle) and
    // vertex labels of readers that have them. Both index the whole polygon:
    // a box query has no counterpart for them.
    void AddPolygonParts(nlohmann::json& polygon)
    {
        const auto parts = ZonQueryInterface<ZonICloudReadPolygonParts>(_reader);
        if (!parts) return;
        nlohmann::json surfaces = nlohmann::json::array();
        for (const ZonCloudPolygonPart& part : parts->GetPolygonParts())
            surfaces.push_back({{"name", part.name}, {"end", part.end}});
        polygon["surfaces"] = std::move(surfaces);
        if (const std::vector<std::string>& labels = parts->GetVertexLabels(); !labels.empty())
            polygon["labels"] = labels;
    }

    ZonICloudReadFile_var _reader;
    const bool _clip;
    const ZonMathBox _box;
    const bool _double;
};

}  // namespace

ZonToolRun ZonToolAddDump(CLI::App& app)
{
    auto* command = app.add_subcommand("dump", "Print the reader's own answers as one JSON object");
    auto options = std::make_shared<ZonToolReaderOptions>();
    auto json = std::make_shared<bool>(false);
    options->AddTo(*command);
    command->add_flag("--json", *json, "Report errors as JSON too (the answers always are)");
    // The flag is read by the error handler of main; the run keeps it alive.
    return [options, json]() -> int {
        options->ApplyToSettings();
        std::string formatName;
        const ZonICloudReadFile_var reader = options->CreateReader(formatName);
        const nlohmann::json out = Dumper(reader, *options).Run(formatName);
        std::cout << out.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace) << "\n";
        return 0;
    };
}
