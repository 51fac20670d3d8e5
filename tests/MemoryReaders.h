// In-memory readers of every type of digitization, for the tests of the import
// engine and the import entry. They follow the reader protocol with its order
// checks and honour sampling per run, as the file readers do.
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
    bool hasDouble = false;     // GetPointsDouble answers (points widened, plus doubleOffset)
    double doubleOffset = 0.0;  // lets a test tell the double array from the float one
    std::vector<unsigned char> colors;
    std::vector<std::int32_t> alphas, symbols;
    std::vector<std::string> texts;
    std::vector<std::vector<std::vector<float>>> sets;  // type 2: sets of scans of points
    std::vector<std::vector<Row>> grids;                // type 3: grids of rows
    std::vector<Mesh> meshes;                           // type 4
    ZonICkeUnit_var unit;                               // the file's own unit, if any
    bool openFile = false;                              // Analyse opens the file, as a file reader would
    bool failInPoints = false;                          // GetPoints and GetScanPoints raise "ERR_UnknownData"
};

// The cloud part: every reader answers it, whatever its type.
class MemoryCloudReader : public ZonCloudReadFile {
public:
    MemoryCloudReader(const ZonUnicodeString& fileName, MemoryContent content)
        : ZonCloudReadFile(fileName), _content(std::move(content))
    {
    }

    const float* GetPoints(unsigned& count) override
    {
        Analyse();
        Fail();
        Sample(AllPoints(), _sampled);
        count = static_cast<unsigned>(_sampled.size() / 3);
        return _sampled.data();
    }
    const double* GetPointsDouble(unsigned& count) override
    {
        if (!_content.hasDouble) return nullptr;
        unsigned n = 0;
        const float* points = GetPoints(n);
        _sampledDouble.assign(points, points + 3 * static_cast<std::size_t>(n));
        for (double& v : _sampledDouble) v += _content.doubleOffset;
        count = n;
        return _sampledDouble.data();
    }
    bool HasDoublePrecision() override { return _content.hasDouble; }
    const unsigned char* GetPointColors(unsigned& count) override
    {
        count = static_cast<unsigned>(_content.colors.size() / 3);
        return _content.colors.empty() ? nullptr : _content.colors.data();
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

    void Fail() const
    {
        if (_content.failInPoints) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_UnknownData");
    }

    // Keeps the points of one run by the shared sampling rule.
    void Sample(const std::vector<float>& run, std::vector<float>& kept) const
    {
        ZonCloudSampler sampler(_samplingPercent);
        sampler.Restart();
        kept.clear();
        for (std::size_t i = 0; i < run.size(); i += 3)
            if (sampler.Keep()) kept.insert(kept.end(), run.begin() + static_cast<long>(i), run.begin() + static_cast<long>(i) + 3);
    }

    std::vector<float> AllPoints() const
    {
        if (!_content.points.empty()) return _content.points;
        std::vector<float> all;
        for (const auto& set : _content.sets)
            for (const auto& scan : set) all.insert(all.end(), scan.begin(), scan.end());
        for (const auto& grid : _content.grids)
            for (const auto& row : grid) all.insert(all.end(), row.points.begin(), row.points.end());
        for (const auto& mesh : _content.meshes) all.insert(all.end(), mesh.vertices.begin(), mesh.vertices.end());
        return all;
    }

    template <class T>
    static const void* Attribute(const std::vector<T>& values, unsigned& count)
    {
        count = static_cast<unsigned>(values.size());
        return values.empty() ? nullptr : values.data();
    }

    MemoryContent _content;
    std::vector<float> _sampled;
    std::vector<double> _sampledDouble;
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
    void BeginGetSetOfScans() override
    {
        Require(DigitizationScans, "ERR_NotAScanDigit");
        _setBegun = true;
        _set = -1;
    }
    bool NextSetOfScans() override
    {
        if (!_setBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_BeginGetSetOfScansNotDone");
        _scan = -2;
        return ++_set < static_cast<int>(_content.sets.size());
    }
    void BeginGetScan() override
    {
        if (!_setBegun || _set < 0 || _set >= static_cast<int>(_content.sets.size()))
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextSetOfScansNotDone");
        _scan = -1;
    }
    bool NextScan() override
    {
        if (_scan == -2) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetScanNotDone");
        return ++_scan < static_cast<int>(_content.sets[_set].size());
    }
    const float* GetScanPoints(unsigned& count) override
    {
        Fail();
        Sample(_content.sets[_set][_scan], _scanPoints);
        count = static_cast<unsigned>(_scanPoints.size() / 3);
        return count ? _scanPoints.data() : nullptr;
    }
    const double* GetScanPointsDouble(unsigned& count) override
    {
        const float* points = GetScanPoints(count);
        if (!points) return nullptr;
        _scanDouble.assign(points, points + 3 * static_cast<std::size_t>(count));
        for (double& v : _scanDouble) v += _content.doubleOffset;
        return _scanDouble.data();
    }

    // Grids: one row per call, then null.
    void BeginGetGrid() override
    {
        Require(DigitizationGrids, "ERR_NotAGridDigit");
        _gridBegun = true;
        _grid = -1;
    }
    bool NextGrid() override
    {
        if (!_gridBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetGridNotDone");
        _row = -1;
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
        if (_row < 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextGridNotDone");
        if (_row >= static_cast<int>(_content.grids[_grid].size())) return nullptr;
        const MemoryContent::Row& row = _content.grids[_grid][_row++];
        count = static_cast<unsigned>(row.points.size() / 3);
        valid = row.valid.empty() ? nullptr : row.valid.data();
        return row.points.data();
    }
    const double* GetGridPointsDouble(unsigned& count, const unsigned char*& valid) override
    {
        const float* points = GetGridPoints(count, valid);
        if (!points) return nullptr;
        _rowDouble.assign(points, points + 3 * static_cast<std::size_t>(count));
        for (double& v : _rowDouble) v += _content.doubleOffset;
        return _rowDouble.data();
    }

    // Polygons.
    void BeginGetPolygon() override
    {
        Require(DigitizationPolygons, "ERR_NotAPolygonDigit");
        _polygonBegun = true;
        _polygon = -1;
    }
    bool NextPolygon() override
    {
        if (!_polygonBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetPolygonNotDone");
        return ++_polygon < static_cast<int>(_content.meshes.size());
    }
    bool IsClosedPolygon() override { return false; }
    bool IsOrientedPolygon() override { return false; }
    const float* GetPolygonPoints(unsigned& count) override
    {
        const auto& vertices = Mesh().vertices;
        count = static_cast<unsigned>(vertices.size() / 3);
        return vertices.data();
    }
    const unsigned* NextTriangle() override { return nullptr; }
    const unsigned* NextTriangleInBox() override { return nullptr; }
    const unsigned* GetTriangles(unsigned& count) override
    {
        const auto& triangles = Mesh().triangles;
        count = static_cast<unsigned>(triangles.size() / 3);
        return triangles.data();
    }
    // The vertices in the box, renumbered, and the triangles whose three vertices are among them.
    const unsigned* GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                      unsigned& vertexCount) override
    {
        const MemoryContent::Mesh& mesh = Mesh();
        ZonMathBox fileBox;
        GetBoundingBox(fileBox);
        std::vector<long> number(mesh.vertices.size() / 3, -1);
        _boxVertices.clear();
        _boxTriangles.clear();
        for (std::size_t i = 0; i < number.size(); ++i) {
            const float* p = &mesh.vertices[3 * i];
            if (!IsInQueryBox(p[0], p[1], p[2], box, fileBox)) continue;
            number[i] = static_cast<long>(_boxVertices.size() / 3);
            _boxVertices.insert(_boxVertices.end(), p, p + 3);
        }
        for (std::size_t t = 0; t < mesh.triangles.size(); t += 3) {
            const unsigned* v = &mesh.triangles[t];
            if (v[0] >= number.size() || v[1] >= number.size() || v[2] >= number.size()) continue;
            if (number[v[0]] < 0 || number[v[1]] < 0 || number[v[2]] < 0) continue;
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
    void Require(int type, const char* code)
    {
        if (!IsTypeOfDigitization(type)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, code);
        if (_numberOfPoints <= 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    }
    const MemoryContent::Mesh& Mesh() const { return _content.meshes.at(static_cast<std::size_t>(_polygon)); }

    bool _setBegun = false, _gridBegun = false, _polygonBegun = false, _createTriangles = true;
    int _set = -1, _scan = -2, _grid = -1, _row = -1, _polygon = -1;
    std::vector<float> _scanPoints, _boxVertices;
    std::vector<double> _scanDouble, _rowDouble;
    std::vector<unsigned> _boxTriangles;
};
