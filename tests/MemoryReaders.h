// In-memory readers of every type of digitization, for the tests of the import
// engine and the import entry. They check the protocol's order as file readers
// do and sample each run with the shared rule.
#pragma once
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

    int type = 1;
    std::vector<float> points;  // the cloud; for other types the structure's points are used
    bool hasDouble = false;     // double queries answer, with doubleOffset added to tell them apart
    double doubleOffset = 0.0;
    std::vector<unsigned char> colors;
    std::vector<std::int32_t> alphas, symbols;
    std::vector<std::string> texts;
    std::vector<std::vector<std::vector<float>>> sets;  // type 2: sets of scans of points
    std::vector<std::vector<Row>> grids;                // type 3: grids of rows
    std::vector<Mesh> meshes;                           // type 4
    ZonICkeUnit_var unit;                               // the file's own unit, if any
    bool openFile = false;                              // Analyse opens the file, as a file reader does
    bool failInPoints = false;                          // point queries raise "ERR_UnknownData"
};

// The cloud part only: every reader answers it, whatever its type.
class MemoryCloudReader : public ZonCloudReadFile {
public:
    MemoryCloudReader(const ZonUnicodeString& fileName, MemoryContent content)
        : ZonCloudReadFile(fileName), _content(std::move(content))
    {
    }

    const float* GetPoints(unsigned& count) override
    {
        Analyse();
        return Sampled(AllPoints(), count);
    }
    const double* GetPointsDouble(unsigned& count) override
    {
        if (!_content.hasDouble) return nullptr;
        const float* points = GetPoints(count);
        return Widened(points, count, _cloudDouble);
    }
    bool HasDoublePrecision() override { return _content.hasDouble; }
    const unsigned char* GetPointColors(unsigned& count) override
    {
        count = static_cast<unsigned>(_content.colors.size() / 3);
        return count ? _content.colors.data() : nullptr;
    }
    const void* GetPointAttributes1(unsigned& count) override { return Attribute(_content.alphas, count); }
    const void* GetPointAttributes2(unsigned& count) override { return Attribute(_content.symbols, count); }
    const void* GetPointAttributes3(unsigned& count) override { return Attribute(_content.texts, count); }
    ZonICkeUnit_var GetLengthUnit() override { return _content.unit; }

protected:
    void Analyse() override
    {
        if (_analysed) return;
        if (_content.openFile) OpenFile();
        _digitizationType = _content.type;
        const std::vector<float> all = AllPoints();
        _numberOfPoints = static_cast<int>(all.size() / 3);
        for (std::size_t i = 0; i < all.size(); i += 3) _boundingBox.AddPoint(all[i], all[i + 1], all[i + 2]);
        _analysed = true;
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
    const double* Widened(const float* points, unsigned count, std::vector<double>& buffer) const
    {
        if (!points) return nullptr;
        buffer.assign(points, points + 3 * static_cast<std::size_t>(count));
        for (double& v : buffer) v += _content.doubleOffset;
        return buffer.data();
    }

    std::vector<float> AllPoints() const
    {
        if (!_content.points.empty()) return _content.points;
        std::vector<float> all;
        const auto add = [&all](const std::vector<float>& p) { all.insert(all.end(), p.begin(), p.end()); };
        for (const auto& set : _content.sets)
            for (const auto& scan : set) add(scan);
        for (const auto& grid : _content.grids)
            for (const auto& row : grid) add(row.points);
        for (const auto& mesh : _content.meshes) add(mesh.vertices);
        return all;
    }

    template <class T>
    static const void* Attribute(const std::vector<T>& values, unsigned& count)
    {
        count = static_cast<unsigned>(values.size());
        return count ? values.data() : nullptr;
    }

    MemoryContent _content;
    std::vector<float> _sampled;
    std::vector<double> _cloudDouble, _partDouble;
};

// A reader that offers the interface of every type; its content chooses the type.
class MemoryReader : public MemoryCloudReader,
                     public ZonTieCloudReadScanFile<MemoryReader>,
                     public ZonTieCloudReadGridFile<MemoryReader>,
                     public ZonICloudReadPolygonFile,
                     public ZonICloudReadOptTriangles {
public:
    using MemoryCloudReader::MemoryCloudReader;

    // Scans.
    void BeginGetSetOfScans() override { _set = Begin(DigitizationScans, "ERR_NotAScanDigit"); }
    bool NextSetOfScans() override
    {
        if (_set == NotBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_BeginGetSetOfScansNotDone");
        _scan = NotBegun;
        return ++_set < static_cast<int>(_content.sets.size());
    }
    void BeginGetScan() override
    {
        if (_set < 0 || _set >= static_cast<int>(_content.sets.size()))
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextSetOfScansNotDone");
        _scan = -1;
    }
    bool NextScan() override
    {
        if (_scan == NotBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetScanNotDone");
        return ++_scan < static_cast<int>(_content.sets[_set].size());
    }
    const float* GetScanPoints(unsigned& count) override { return Sampled(_content.sets[_set][_scan], count); }
    const double* GetScanPointsDouble(unsigned& count) override
    {
        const float* points = GetScanPoints(count);
        return Widened(points, count, _partDouble);
    }

    // Grids: one row per call, then null.
    void BeginGetGrid() override { _grid = Begin(DigitizationGrids, "ERR_NotAGridDigit"); }
    bool NextGrid() override
    {
        if (_grid == NotBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetGridNotDone");
        _row = NotBegun;
        return ++_grid < static_cast<int>(_content.grids.size());
    }
    void BeginGetGridPoints() override
    {
        if (_grid < 0 || _grid >= static_cast<int>(_content.grids.size()))
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextGridNotDone");
        _row = 0;
    }
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override
    {
        count = 0;
        valid = nullptr;
        if (_row == NotBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextGridNotDone");
        if (_row >= static_cast<int>(_content.grids[_grid].size())) return nullptr;
        const MemoryContent::Row& row = _content.grids[_grid][_row++];
        count = static_cast<unsigned>(row.points.size() / 3);
        valid = row.valid.empty() ? nullptr : row.valid.data();
        return row.points.data();
    }
    const double* GetGridPointsDouble(unsigned& count, const unsigned char*& valid) override
    {
        const float* points = GetGridPoints(count, valid);
        return Widened(points, count, _partDouble);
    }

    // Polygons.
    void BeginGetPolygon() override { _polygon = Begin(DigitizationPolygons, "ERR_NotAPolygonDigit"); }
    bool NextPolygon() override
    {
        if (_polygon == NotBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetPolygonNotDone");
        return ++_polygon < static_cast<int>(_content.meshes.size());
    }
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
        std::vector<long> number(all.size() / 3, -1);
        _boxVertices.clear();
        _boxTriangles.clear();
        for (std::size_t i = 0; i < number.size(); ++i) {
            if (!IsInQueryBox(all[3 * i], all[3 * i + 1], all[3 * i + 2], box, fileBox)) continue;
            number[i] = static_cast<long>(_boxVertices.size() / 3);
            _boxVertices.insert(_boxVertices.end(), &all[3 * i], &all[3 * i] + 3);
        }
        const std::vector<unsigned>& triangles = Mesh().triangles;
        for (std::size_t t = 0; t < triangles.size(); t += 3) {
            const unsigned* v = &triangles[t];
            if (number.at(v[0]) >= 0 && number.at(v[1]) >= 0 && number.at(v[2]) >= 0)
                for (int k = 0; k < 3; ++k) _boxTriangles.push_back(static_cast<unsigned>(number[v[k]]));
        }
        vertices = _boxVertices.data();
        vertexCount = static_cast<unsigned>(_boxVertices.size() / 3);
        count = static_cast<unsigned>(_boxTriangles.size() / 3);
        return _boxTriangles.data();
    }

    // The triangles option, stored for the importer.
    void SetTriangles(bool create) override { _createTriangles = create; }
    void GetTriangles(bool& create) override { create = _createTriangles; }

private:
    static constexpr int NotBegun = -2;

    // The checks of a Begin operation; the position before the first element.
    int Begin(int type, const char* code)
    {
        if (!IsTypeOfDigitization(type)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, code);
        return -1;
    }
    const MemoryContent::Mesh& Mesh() const { return _content.meshes.at(static_cast<std::size_t>(_polygon)); }

    bool _createTriangles = true;
    int _set = NotBegun, _scan = NotBegun, _grid = NotBegun, _row = NotBegun, _polygon = NotBegun;
    std::vector<float> _boxVertices;
    std::vector<unsigned> _boxTriangles;
};
