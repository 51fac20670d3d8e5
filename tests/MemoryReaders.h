// In-memory readers of every type of digitization, for the tests of the import
// engine and the import entry. They sample each run with the shared rule.
#pragma once
#include <algorithm>
#include <cstdint>
#include <string>
#include <vector>

#include "ZonCloudReadFile.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonTieCloudReadFile.h"

struct MemoryContent {
    struct Row {
        std::vector<float> points;
        std::vector<unsigned char> valid;  // empty: the reader answers a null validity
    };
    struct Mesh {
        std::vector<float> vertices;
        std::vector<unsigned> triangles;
    };

    int type = DigitizationCloud;
    std::vector<float> points{};  // the cloud; for other types the structure's points
    bool hasDouble = false;       // double queries answer, with doubleOffset added to tell them apart
    double doubleOffset = 0.0;
    std::vector<unsigned char> colors{};
    std::vector<std::int32_t> alphas{}, symbols{};
    std::vector<std::string> texts{};
    std::vector<std::vector<std::vector<float>>> sets{};  // type 2: sets of scans of points
    std::vector<std::vector<Row>> grids{};              // type 3: grids of rows
    std::vector<Mesh> meshes{};                         // type 4
    ZonICkeUnit_var unit{};                             // the file's own unit, if any
    bool openFile = false;                              // Analyse opens the file, as a file reader does
    bool failInPoints = false;                          // point queries raise "ERR_UnknownData"
};

// The cloud part only: every reader answers it, whatever its type.
class MemoryCloudReader : public ZonCloudReadFile {
public:
    MemoryCloudReader(const ZonUnicodeString& fileName, MemoryContent content)
        : ZonCloudReadFile(fileName), _content(std::move(content)), _all(_content.points)
    {
        const auto add = [this](const std::vector<float>& p) { _all.insert(_all.end(), p.begin(), p.end()); };
        for (const auto& set : _content.sets)
            for (const auto& scan : set) add(scan);
        for (const auto& grid : _content.grids)
            for (const auto& row : grid) add(row.points);
        for (const auto& mesh : _content.meshes) add(mesh.vertices);
    }

    const float* GetPoints(unsigned& count) override
    {
        Analyse();
        return Sampled(_all, count);
    }
    const double* GetPointsDouble(unsigned& count) override
    {
        return _content.hasDouble ? Widened(GetPoints(count), count, _cloudDouble) : nullptr;
    }
    bool HasDoublePrecision() override { return _content.hasDouble; }
    const unsigned char* GetPointColors(unsigned& count) override
    {
        return static_cast<const unsigned char*>(Attribute(_content.colors, count, 3));
    }
    const void* GetPointAttributes1(unsigned& count) override { return Attribute(_content.alphas, count); }
    const void* GetPointAttributes2(unsigned& count) override { return Attribute(_content.symbols, count); }
    const void* GetPointAttributes3(unsigned& count) override { return Attribute(_content.texts, count); }
    ZonICkeUnit_var GetLengthUnit() override { return _content.unit; }

protected:
    void AnalyseFile() override
    {
        if (_content.openFile) Source();
        _digitizationType = _content.type;
        _numberOfPoints = static_cast<int>(_all.size() / 3);
        for (std::size_t i = 0; i < _all.size(); i += 3) _boundingBox.AddPoint(_all[i], _all[i + 1], _all[i + 2]);
    }

    // The points of one run kept by the sampling rule, in a buffer of the reader.
    const float* Sampled(const std::vector<float>& run, unsigned& count)
    {
        if (_content.failInPoints) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_UnknownData");
        ZonCloudSampler sampler(_samplingPercent);
        sampler.Restart();
        _sampled.clear();
        for (std::size_t i = 0; i < run.size(); i += 3)
            if (sampler.Keep()) _sampled.insert(_sampled.end(), &run[i], &run[i] + 3);
        count = static_cast<unsigned>(_sampled.size() / 3);
        return count ? _sampled.data() : nullptr;
    }
    // The count is read after the points were fetched, whatever the order of the arguments.
    const double* Widened(const float* points, const unsigned& count, std::vector<double>& buffer) const
    {
        if (!points) return nullptr;
        buffer.assign(points, points + 3 * static_cast<std::size_t>(count));
        for (double& v : buffer) v += _content.doubleOffset;
        return buffer.data();
    }

    // A per-point array of `per` values a point; null when empty.
    template <class T>
    static const void* Attribute(const std::vector<T>& values, unsigned& count, std::size_t per = 1)
    {
        count = static_cast<unsigned>(values.size() / per);
        return count ? values.data() : nullptr;
    }

    MemoryContent _content;
    std::vector<float> _all, _sampled;  // _all: every point, the cloud's answer whatever the type
    std::vector<double> _cloudDouble, _partDouble;
};

// A reader that offers the interface of every type; its content chooses the type.
// Positions start before the first element, and reach only the content through
// at(): a call out of the protocol's order throws.
class MemoryReader : public MemoryCloudReader,
                     public ZonTieCloudReadScanFile<MemoryReader>,
                     public ZonTieCloudReadGridFile<MemoryReader>,
                     public ZonICloudReadPolygonFile,
                     public ZonICloudReadOptTriangles {
public:
    using MemoryCloudReader::MemoryCloudReader;

    void BeginGetSetOfScans() override { _set = -1; }
    bool NextSetOfScans() override { return ++_set < Size(_content.sets); }
    void BeginGetScan() override { _scan = -1; }
    bool NextScan() override { return ++_scan < Size(_content.sets.at(_set)); }
    const float* GetScanPoints(unsigned& count) override { return Sampled(_content.sets.at(_set).at(_scan), count); }
    const double* GetScanPointsDouble(unsigned& count) override
    {
        return Widened(GetScanPoints(count), count, _partDouble);
    }

    // Grids: one row per call, then null.
    void BeginGetGrid() override { _grid = -1; }
    bool NextGrid() override { return ++_grid < Size(_content.grids); }
    void BeginGetGridPoints() override { _row = 0; }
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override
    {
        const auto& rows = _content.grids.at(_grid);
        const MemoryContent::Row* row = _row < Size(rows) ? &rows.at(_row++) : nullptr;
        count = row ? static_cast<unsigned>(row->points.size() / 3) : 0;
        valid = row && !row->valid.empty() ? row->valid.data() : nullptr;
        return row ? row->points.data() : nullptr;
    }

    void BeginGetPolygon() override { _polygon = -1; }
    bool NextPolygon() override { return ++_polygon < Size(_content.meshes); }
    bool IsClosedPolygon() override { return false; }
    bool IsOrientedPolygon() override { return false; }
    const float* GetPolygonPoints(unsigned& count) override
    {
        count = static_cast<unsigned>(Mesh().vertices.size() / 3);
        return Mesh().vertices.data();
    }
    const unsigned* NextTriangle() override { return nullptr; }
    const unsigned* NextTriangleInBox() override { return nullptr; }
    const unsigned* GetTriangles(unsigned& count) override
    {
        count = static_cast<unsigned>(Mesh().triangles.size() / 3);
        return Mesh().triangles.data();
    }
    // The vertices in the box, renumbered, and the triangles whose three vertices are among them.
    const unsigned* GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                      unsigned& vertexCount) override
    {
        ZonMathBox fileBox;
        GetBoundingBox(fileBox);
        const std::vector<float>& all = Mesh().vertices;
        std::vector<unsigned> number(all.size() / 3, ~0u);  // ~0u: outside the box
        _boxVertices.clear();
        _boxTriangles.clear();
        for (std::size_t i = 0; i < all.size(); i += 3)
            if (IsInQueryBox(all[i], all[i + 1], all[i + 2], box, fileBox)) {
                number[i / 3] = static_cast<unsigned>(_boxVertices.size() / 3);
                _boxVertices.insert(_boxVertices.end(), &all[i], &all[i] + 3);
            }
        const std::vector<unsigned>& t = Mesh().triangles;
        for (std::size_t i = 0; i + 2 < t.size(); i += 3)
            if (std::max({number.at(t[i]), number.at(t[i + 1]), number.at(t[i + 2])}) != ~0u)
                _boxTriangles.insert(_boxTriangles.end(), {number[t[i]], number[t[i + 1]], number[t[i + 2]]});
        vertices = _boxVertices.data();
        vertexCount = static_cast<unsigned>(_boxVertices.size() / 3);
        count = static_cast<unsigned>(_boxTriangles.size() / 3);
        return _boxTriangles.data();
    }

    void SetTriangles(bool create) override { _createTriangles = create; }
    void GetTriangles(bool& create) override { create = _createTriangles; }

private:
    template <class C>
    static int Size(const C& c) { return static_cast<int>(c.size()); }
    const MemoryContent::Mesh& Mesh() const { return _content.meshes.at(_polygon); }

    bool _createTriangles = true;
    int _set = -2, _scan = -2, _grid = -2, _row = -2, _polygon = -2;  // -2: no Begin yet
    std::vector<float> _boxVertices;
    std::vector<unsigned> _boxTriangles;
};
