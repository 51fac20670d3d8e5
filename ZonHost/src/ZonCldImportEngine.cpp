#include "ZonCldImportEngine.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <new>
#include <stdexcept>
#include <type_traits>

// The engine talks to readers through the module's public interfaces only.
#include "ZonICloudReadFile.h"
#include "ZonICloudReadFileCounts.h"
#include "ZonICloudReadHandOver.h"
#include "ZonICloudReadPointTextValues.h"
#include "ZonICloudReadGridFile.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonICloudReadScanFile.h"
#include "ZonBaseUnknown.h"
#include "ZonCloudOperErrorTool.h"

namespace {

std::string Number(double value)
{
    char buffer[64];
    const auto [end, ec] = std::to_chars(buffer, buffer + sizeof buffer, value);
    return ec == std::errc() ? std::string(buffer, end) : std::string("?");
}

// The caller's text for a statistics label; without a labeler the key itself.
std::string Label(const ZonCldStatLabeler& labeler, const char* key)
{
    return labeler ? labeler(key) : std::string(key);
}

// Indices into `all` of the points of `kept`. A box query keeps points in
// file order, so they form a subsequence of all points, and equal points
// are kept or dropped together: the first match is always the right one.
template <class T>
std::vector<std::size_t> IndicesOfKept(const T* kept, std::size_t keptCount, const T* all, std::size_t allCount)
{
    std::vector<std::size_t> indices;
    indices.reserve(keptCount);
    std::size_t j = 0;
    for (std::size_t i = 0; i < keptCount; ++i) {
        const T* p = kept + 3 * i;
        while (j < allCount && !(all[3 * j] == p[0] && all[3 * j + 1] == p[1] && all[3 * j + 2] == p[2])) ++j;
        if (j == allCount) return {};  // not a subsequence: the reader's arrays do not match
        indices.push_back(j++);
    }
    return indices;
}

template <class T>
std::vector<T> SelectPerPoint(const T* values, std::size_t perPoint, const std::vector<std::size_t>* indices,
                              std::size_t count, ZonICloudReadHandOver* handOver)
{
    if (!indices) {
        std::vector<T> taken;
        if constexpr (requires { handOver->HandOver(values, count, taken); })
            if (handOver && handOver->HandOver(values, perPoint * count, taken)) return taken;
        return std::vector<T>(values, values + perPoint * count);
    }
    std::vector<T> selected;
    selected.reserve(perPoint * indices->size());
    for (std::size_t index : *indices)
        selected.insert(selected.end(), values + perPoint * index, values + perPoint * (index + 1));
    return selected;
}

class Walker {
public:
    Walker(ZonCldBody& body, ZonGeoFactoryProtected& factory, ZonICloudReadFile& reader,
           const std::shared_ptr<ZonICloudReadFile>& handle, const ZonMathBox& box, double factor,
           bool createTriangles, std::vector<std::string>& messages, const ZonCldStatLabeler& labeler)
        : _body(body), _factory(factory), _reader(reader), _handle(handle), _box(box), _clip(!box.IsEmpty()),
          _factor(factor), _createTriangles(createTriangles), _messages(messages), _labeler(labeler),
          _handOver(box.IsEmpty() ? ZonQueryInterface<ZonICloudReadHandOver>(handle) : nullptr)
    {
    }

    void Walk(int type, bool useDouble)
    {
        _double = useDouble;
        switch (type) {
            case DigitizationScans:
                if (auto scans = ZonQueryInterface<ZonICloudReadScanFile>(_handle)) return WalkScans(*scans);
                break;
            case DigitizationGrids:
                if (auto grids = ZonQueryInterface<ZonICloudReadGridFile>(_handle)) return WalkGrids(*grids);
                break;
            case DigitizationPolygons:
                if (auto polygons = ZonQueryInterface<ZonICloudReadPolygonFile>(_handle)) return WalkPolygons(*polygons);
                break;
            default: break;
        }
        WalkCloud();
    }

private:
    template <class T>
    const T* CloudPoints(unsigned& count)
    {
        count = 0;
        if constexpr (std::is_same_v<T, double>)
            return _clip ? _reader.GetPointsInBoxDouble(_box, count) : _reader.GetPointsDouble(count);
        else
            return _clip ? _reader.GetPointsInBox(_box, count) : _reader.GetPoints(count);
    }

    template <class T>
    const T* AllPoints(unsigned& count)
    {
        count = 0;
        if constexpr (std::is_same_v<T, double>)
            return _reader.GetPointsDouble(count);
        else
            return _reader.GetPoints(count);
    }

    void WalkCloud()
    {
        // A reader with no double array after all falls back to single precision; after
        // a box query a null array only means that no point was in the box.
        if (_double && (WalkCloudAs<double>() || _clip)) return;
        WalkCloudAs<float>();
    }

    // False when the reader gave no array at all in this precision.
    template <class T>
    bool WalkCloudAs()
    {
        unsigned count = 0;
        const T* points = CloudPoints<T>(count);
        if (!points) return false;
        if (count == 0) return true;
        ZonCldCloud_var cloud = _factory.CreateCloud();
        std::vector<T> kept;
        if (_clip) kept.assign(points, points + 3 * static_cast<std::size_t>(count));
        KeepPerPointArrays<T>(*cloud, kept, count);
        // The points last: once taken over, the reader no longer has them.
        std::vector<T> taken;
        if (_handOver && _handOver->HandOver(points, 3 * static_cast<std::size_t>(count), taken))
            cloud->Points().AdoptScaled(std::move(taken), _factor);
        else
            cloud->Points().AssignScaled(points, count, _factor);
        _body.AddCloud(std::move(cloud));
        return true;
    }

    // Colours and attributes index the reader's whole cloud; after a box
    // query they are narrowed to the points that were kept.
    template <class T>
    void KeepPerPointArrays(ZonCldCloud& cloud, const std::vector<T>& kept, unsigned keptCount)
    {
        unsigned colorCount = 0, alphaCount = 0, symbolCount = 0, textCount = 0, textValueCount = 0;
        const unsigned char* colors = _reader.GetPointColors(colorCount);
        const auto* alphas = static_cast<const std::int32_t*>(_reader.GetPointAttributes1(alphaCount));
        const auto* symbols = static_cast<const std::int32_t*>(_reader.GetPointAttributes2(symbolCount));
        // Texts given as label and values stay in that form; only other readers are asked for strings.
        ZonUnicodeString textLabel;
        const std::int32_t* textValues = nullptr;
        if (auto valued = ZonQueryInterface<ZonICloudReadPointTextValues>(_handle))
            textValues = valued->GetPointTextValues(textValueCount, textLabel);
        const auto* texts =
            textValues ? nullptr : static_cast<const std::string*>(_reader.GetPointAttributes3(textCount));
        if (!colors && !alphas && !symbols && !texts && !textValues) return;

        unsigned total = keptCount;
        std::vector<std::size_t> indices;
        const std::vector<std::size_t>* selection = nullptr;
        if (_clip) {
            const T* all = AllPoints<T>(total);
            if (!all) return;
            indices = IndicesOfKept(kept.data(), keptCount, all, total);
            if (indices.size() != keptCount) return;
            selection = &indices;
        }
        ZonICloudReadHandOver* handOver = _handOver.get();
        if (colors && colorCount == total) cloud.Colors() = SelectPerPoint(colors, 3, selection, total, handOver);
        if (alphas && alphaCount == total) cloud.Alphas() = SelectPerPoint(alphas, 1, selection, total, handOver);
        if (symbols && symbolCount == total) cloud.Symbols() = SelectPerPoint(symbols, 1, selection, total, handOver);
        if (textValues && textValueCount == total)
            cloud.SetTextValues(textLabel.ToUtf8(), SelectPerPoint(textValues, 1, selection, total, handOver));
        if (texts && textCount == total) {
            for (std::string& text : SelectPerPoint(texts, 1, selection, total, nullptr))
                cloud.Texts().emplace_back(std::move(text));
        }
    }

    template <class T>
    const T* ScanPoints(ZonICloudReadScanFile& scans, unsigned& count)
    {
        count = 0;
        if constexpr (std::is_same_v<T, double>)
            return _clip ? scans.GetScanPointsInBoxDouble(_box, count) : scans.GetScanPointsDouble(count);
        else
            return _clip ? scans.GetScanPointsInBox(_box, count) : scans.GetScanPoints(count);
    }

    void WalkScans(ZonICloudReadScanFile& scans)
    {
        scans.BeginGetSetOfScans();
        while (scans.NextSetOfScans()) {
            ZonCldSetOfScans_var set = _factory.CreateSetOfScans();
            scans.BeginGetScan();
            while (scans.NextScan()) {
                unsigned count = 0;
                ZonCldScan_var scan;
                if (_double) {
                    if (const double* points = ScanPoints<double>(scans, count); points && count > 0) {
                        scan = _factory.CreateScan();
                        scan->Points().AssignScaled(points, count, _factor);
                    }
                } else if (const float* points = ScanPoints<float>(scans, count); points && count > 0) {
                    scan = _factory.CreateScan();
                    scan->Points().AssignScaled(points, count, _factor);
                }
                // A scan with no point (or none in the box) is nothing to show.
                if (scan) set->AddScan(std::move(scan));
            }
            if (set->GetNumberOfScans() > 0) _body.AddSetOfScans(std::move(set));
        }
    }

    template <class T>
    const T* GridPoints(ZonICloudReadGridFile& grids, unsigned& count, const unsigned char*& valid)
    {
        count = 0;
        valid = nullptr;
        if constexpr (std::is_same_v<T, double>)
            return _clip ? grids.GetGridPointsInBoxDouble(_box, count, valid) : grids.GetGridPointsDouble(count, valid);
        else
            return _clip ? grids.GetGridPointsInBox(_box, count, valid) : grids.GetGridPoints(count, valid);
    }

    template <class T>
    void ReadGridRows(ZonICloudReadGridFile& grids, ZonCldGrid& grid)
    {
        // Rows come one per call until a null answer; a reader may give its whole grid as one row.
        for (;;) {
            unsigned count = 0;
            const unsigned char* valid = nullptr;
            const T* points = GridPoints<T>(grids, count, valid);
            if (!points) return;
            if (count == 0) continue;
            // A reader that builds each row in arrays of its own gives them
            // away: the row is never asked for again in this walk.
            std::vector<unsigned char> takenValid;
            std::vector<T> taken;
            const bool own = _handOver && valid && _handOver->HandOver(valid, count, takenValid);
            ZonCldGrid::Row& row = own ? grid.AddRow(std::move(takenValid)) : grid.AddRow(valid, count);
            if (own && _handOver->HandOver(points, 3 * static_cast<std::size_t>(count), taken))
                row.points.AdoptScaled(std::move(taken), _factor);
            else
                row.points.AssignScaled(points, count, _factor);
        }
    }

    void WalkGrids(ZonICloudReadGridFile& grids)
    {
        ZonCldSetOfGrids_var set = _factory.CreateSetOfGrids();
        grids.BeginGetGrid();
        while (grids.NextGrid()) {
            ZonCldGrid_var grid = _factory.CreateGrid();
            grids.BeginGetGridPoints();
            if (_double)
                ReadGridRows<double>(grids, *grid);
            else
                ReadGridRows<float>(grids, *grid);
            if (grid->GetNumberOfRows() > 0) set->AddGrid(std::move(grid));
        }
        if (set->GetNumberOfGrids() > 0) _body.AddSetOfGrids(std::move(set));
    }

    void WalkPolygons(ZonICloudReadPolygonFile& polygons)
    {
        polygons.BeginGetPolygon();
        while (polygons.NextPolygon()) {
            unsigned vertexCount = 0, triangleCount = 0;
            const float* vertices = nullptr;
            const unsigned* triangles = nullptr;
            if (_clip) {
                triangles = polygons.GetTrianglesInBox(_box, triangleCount, vertices, vertexCount);
            } else {
                vertices = polygons.GetPolygonPoints(vertexCount);
                if (_createTriangles) triangles = polygons.GetTriangles(triangleCount);
            }
            if (!vertices || vertexCount == 0) continue;
            ZonCldPolygon_var polygon = _factory.CreatePolygon();
            if (_createTriangles && triangles) KeepTriangles(*polygon, triangles, triangleCount, vertexCount);
            std::vector<float> taken;
            if (_handOver && _handOver->HandOver(vertices, 3 * static_cast<std::size_t>(vertexCount), taken))
                polygon->Vertices().AdoptScaled(std::move(taken), _factor);
            else
                polygon->Vertices().AssignScaled(vertices, vertexCount, _factor);
            _body.AddPolygon(std::move(polygon));
        }
    }

    void KeepTriangles(ZonCldPolygon& polygon, const unsigned* triangles, unsigned count, unsigned vertexCount)
    {
        std::vector<unsigned>& kept = polygon.Triangles();
        const std::size_t values = 3 * static_cast<std::size_t>(count);
        std::size_t skipped = 0;
        if (_handOver && _handOver->HandOver(triangles, values, kept)) {
            // Taken over: one pass finds whether any index is out of range
            // (readers almost never give one), and only then are the
            // triangles to leave out squeezed out in place.
            unsigned highest = 0;
            for (const unsigned index : kept) highest = index > highest ? index : highest;
            if (highest < vertexCount) return;
            std::size_t to = 0;
            for (std::size_t from = 0; from < values; from += 3) {
                const unsigned* v = kept.data() + from;
                if (v[0] >= vertexCount || v[1] >= vertexCount || v[2] >= vertexCount) {
                    ++skipped;
                    continue;
                }
                if (to != from) std::copy(v, v + 3, kept.data() + to);
                to += 3;
            }
            kept.resize(to);
        } else {
            kept.reserve(values);
            for (std::size_t t = 0; t < count; ++t) {
                const unsigned* v = triangles + 3 * t;
                // An index past the vertices would make the mesh unusable: leave that triangle out.
                if (v[0] >= vertexCount || v[1] >= vertexCount || v[2] >= vertexCount) {
                    ++skipped;
                    continue;
                }
                kept.insert(kept.end(), v, v + 3);
            }
        }
        if (skipped > 0)
            _messages.push_back(Label(_labeler, "InvalidTriangles") + ": " + std::to_string(skipped));
    }

    ZonCldBody& _body;
    ZonGeoFactoryProtected& _factory;
    ZonICloudReadFile& _reader;
    const std::shared_ptr<ZonICloudReadFile>& _handle;
    const ZonMathBox& _box;
    const bool _clip;
    const double _factor;
    const bool _createTriangles;
    std::vector<std::string>& _messages;
    const ZonCldStatLabeler& _labeler;
    // Offered by readers whose arrays may be taken over; never after a box query.
    const std::shared_ptr<ZonICloudReadHandOver> _handOver;
    bool _double = false;
};

using FileCounts = std::vector<std::pair<std::string, std::uint64_t>>;

void AddLine(std::string& text, const ZonCldStatLabeler& labeler, const char* key, const std::string& value)
{
    text += "  ";
    text += Label(labeler, key);
    text += ": ";
    text += value;
    text += '\n';
}

std::string Statistics(const ZonCldBody& body, const ZonCldStatLabeler& labeler, const FileCounts& fileCounts)
{
    std::string text;
    AddLine(text, labeler, "Points", std::to_string(body.GetNumberOfPoints()));
    for (const auto& [key, count] : fileCounts) AddLine(text, labeler, key.c_str(), std::to_string(count));
    if (!body.GetSetsOfScans().empty()) {
        AddLine(text, labeler, "SetsOfScans", std::to_string(body.GetSetsOfScans().size()));
        AddLine(text, labeler, "Scans", std::to_string(body.GetNumberOfScans()));
    }
    if (!body.GetSetsOfGrids().empty()) AddLine(text, labeler, "Grids", std::to_string(body.GetNumberOfGrids()));
    if (!body.GetPolygons().empty()) {
        AddLine(text, labeler, "Polygons", std::to_string(body.GetPolygons().size()));
        AddLine(text, labeler, "Triangles", std::to_string(body.GetNumberOfTriangles()));
    }
    AddLine(text, labeler, "Unit", body.GetUnitName());
    const ZonMathBox box = body.GetBox();
    if (!box.IsEmpty()) {
        const ZonMathPoint& low = box.GetLow();
        const ZonMathPoint& high = box.GetHigh();
        AddLine(text, labeler, "Box",
                Number(low[0]) + " " + Number(low[1]) + " " + Number(low[2]) + " / " + Number(high[0]) + " " +
                    Number(high[1]) + " " + Number(high[2]));
    }
    return text;
}

}  // namespace

void ZonCldImportEngine::InsertFile(ZonCldBody& body, ZonGeoFactoryProtected& factory,
                                    const std::shared_ptr<ZonICloudReadFile>& reader, bool doublePrecision,
                                    const ZonICkeUnit_var& unit, const ZonMathBox& box, double scale,
                                    std::vector<std::string>& messages, std::string& statistics, bool createTriangles,
                                    const ZonCldStatLabeler& labeler)
{
    if (!reader) return;
    try {
        // The precision is an option: it is set before the first question that needs content.
        reader->SetDoublePrecision(doublePrecision);
        const int type = reader->GetTypeOfDigitization();
        const bool useDouble = doublePrecision && reader->HasDoublePrecision();

        ZonICkeUnit_var fileUnit = reader->GetLengthUnit();
        if (!fileUnit) fileUnit = unit;
        const double factor = (fileUnit ? fileUnit->ToMillimetres() : 1.0) * scale;
        body.SetTypeOfDigitization(type);
        body.SetUnitName(fileUnit ? fileUnit->Name() : "mm");

        Walker(body, factory, *reader, reader, box, factor, createTriangles, messages, labeler).Walk(type, useDouble);
        FileCounts fileCounts;
        if (auto counts = ZonQueryInterface<ZonICloudReadFileCounts>(reader)) fileCounts = counts->GetFileCounts();
        statistics = Statistics(body, labeler, fileCounts);
    } catch (const std::bad_alloc&) {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    } catch (const std::length_error&) {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    }
}
