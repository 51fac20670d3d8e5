#include "ZonCloudReadGridMesh.h"

#include <limits>

#include "ZonCloudReadNLSTool.h"

using Tool = ZonCloudReadNLSTool;

ZonCloudReadGridMesh::ZonCloudReadGridMesh(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName) {}

ZonCloudReadGridMesh::~ZonCloudReadGridMesh() = default;

void ZonCloudReadGridMesh::ReservePoints(std::uint64_t count)
{
    // Counts of points travel as int and unsigned.
    if (count > static_cast<std::uint64_t>(std::numeric_limits<int>::max())) RaiseMemoryError();
    _points.clear();
    Reserve(_points, 3 * count);
}

void ZonCloudReadGridMesh::BuildGridTriangles(std::uint64_t rows, std::uint64_t columns, std::uint64_t points)
{
    _triangles.clear();
    if (rows < 2 || columns < 2) return;
    // Rows of cells whose corners all exist are filled straight; in a cut
    // last row each triangle is checked. Only rows that reach the next row
    // have cells at all, so the loops are bounded by `points`.
    const auto below = [points](std::uint64_t corner) { return corner < points; };
    std::uint64_t count = 0;
    for (std::uint64_t r = 0; r + 1 < rows && below((r + 1) * columns); ++r) {
        if (below((r + 2) * columns - 1)) {
            count += 2 * (columns - 1);
            continue;
        }
        for (std::uint64_t b = r * columns, c = 0; c + 1 < columns; ++c, ++b)
            count += static_cast<std::uint64_t>(below(b + columns)) + below(b + columns + 1);
    }
    // Indices fit in 32 bits (ReservePoints); the count of corners must too.
    if (3 * count > std::numeric_limits<std::uint32_t>::max()) RaiseMemoryError();
    Resize(_triangles, 3 * count);
    std::uint32_t* out = _triangles.data();
    const auto w = static_cast<std::uint32_t>(columns);
    for (std::uint64_t r = 0; r + 1 < rows && below((r + 1) * columns); ++r) {
        const bool whole = below((r + 2) * columns - 1);
        auto b = static_cast<std::uint32_t>(r * columns);
        for (std::uint32_t c = 0; c + 1 < w; ++c, ++b) {
            if (whole || below(b + columns)) {
                out[0] = b;
                out[1] = b + w;
                out[2] = b + 1;
                out += 3;
            }
            if (whole || below(b + columns + 1)) {
                out[0] = b + 1;
                out[1] = b + w;
                out[2] = b + w + 1;
                out += 3;
            }
        }
    }
}

void ZonCloudReadGridMesh::FinishPoints()
{
    const std::size_t count = _points.size() / 3;
    if (!_valid.empty()) _valid.resize(count, 1);
    double low[3], high[3];
    for (int axis = 0; axis < 3; ++axis) {
        low[axis] = std::numeric_limits<double>::infinity();
        high[axis] = -std::numeric_limits<double>::infinity();
    }
    const float* p = _points.data();
    for (std::size_t i = 0; i < count; ++i, p += 3)
        for (int axis = 0; axis < 3; ++axis) {
            low[axis] = p[axis] < low[axis] ? p[axis] : low[axis];
            high[axis] = p[axis] > high[axis] ? p[axis] : high[axis];
        }
    _boundingBox.SetToEmpty();
    if (low[0] <= high[0] && low[1] <= high[1] && low[2] <= high[2])
        _boundingBox.SetLowHigh(ZonMathPoint(low[0], low[1], low[2]), ZonMathPoint(high[0], high[1], high[2]));
    if (count == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _numberOfPoints = static_cast<int>(count);
    _digitizationType = DigitizationPolygons;
    // Everything is in memory now.
    CloseSource();
}

void ZonCloudReadGridMesh::ComputeDoublePoints(std::vector<double>& points)
{
    points.assign(_points.begin(), _points.end());
}

const float* ZonCloudReadGridMesh::GetPoints(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_points.size() / 3);
    return _points.data();
}

const double* ZonCloudReadGridMesh::GetPointsDouble(unsigned& count)
{
    Analyse();
    if (_pointsDouble.size() != _points.size()) Allocating([this] { ComputeDoublePoints(_pointsDouble); });
    count = static_cast<unsigned>(_pointsDouble.size() / 3);
    return _pointsDouble.data();
}

const void* ZonCloudReadGridMesh::GetPointAttributes3(unsigned& count)
{
    Analyse();
    count = 0;
    if (_valid.empty()) return nullptr;
    // Made on request only: a text per sample costs more than the sample.
    if (_texts.size() != _valid.size())
        Allocating([this] {
            _texts.assign(_valid.size(), std::string());
            for (std::size_t i = 0; i < _valid.size(); ++i)
                if (!_valid[i]) _texts[i] = VoidText;
        });
    count = static_cast<unsigned>(_texts.size());
    return _texts.data();
}

void ZonCloudReadGridMesh::BeginGetPolygon()
{
    if (GetTypeOfDigitization() != DigitizationPolygons) Tool::Raise(Tool::Usage, "ERR_NotAPolygonDigit");
    if (_numberOfPoints <= 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _cursor.Begin(1);
}

bool ZonCloudReadGridMesh::NextPolygon()
{
    if (!_cursor.HasNext()) return false;
    _cursor.Advance();
    return true;
}

const unsigned* ZonCloudReadGridMesh::GetTriangles(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_triangles.size() / 3);
    return _triangles.data();
}

unsigned ZonCloudReadGridMesh::GetNumberOfTriangles()
{
    Analyse();
    return static_cast<unsigned>(_triangles.size() / 3);
}

const unsigned* ZonCloudReadGridMesh::NextTriangle()
{
    Analyse();
    return _cursor.NextTriangle(_triangles.data(), _triangles.size() / 3);
}

const unsigned* ZonCloudReadGridMesh::GetTrianglesInBox(const ZonMathBox& box, unsigned& count,
                                                        const float*& vertices, unsigned& vertexCount)
{
    Analyse();
    // The file's own box gives everything, void samples included.
    if (box.IsSameAs(_boundingBox))
        return ZonCloudSubMesh::Give(_cursor, count, vertices, vertexCount, _points.data(), _points.size() / 3,
                                     _triangles.data(), _triangles.size() / 3);
    if (!_sub.IsFor(box))
        Allocating([&] {
            _sub.Compute(box, _boundingBox, _points.data(), _points.size() / 3, _triangles.data(),
                         _triangles.size() / 3, _valid.empty() ? nullptr : _valid.data());
        });
    return _sub.Answer(_cursor, count, vertices, vertexCount);
}
