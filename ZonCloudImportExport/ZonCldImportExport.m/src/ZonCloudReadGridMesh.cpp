#include "ZonCloudReadGridMesh.h"

#include <algorithm>
#include <limits>
#include <mutex>

#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWorkerPool.h"

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
    // Rows of cells whose corners all exist come first; past them at most one
    // row reaches into a cut last row, and there each triangle is checked.
    const auto below = [points](std::uint64_t corner) { return corner < points; };
    std::uint64_t whole = 0;
    while (whole + 1 < rows && below((whole + 2) * columns - 1)) ++whole;
    const bool cut = whole + 1 < rows && below((whole + 1) * columns);
    const std::uint64_t perRow = 6 * (columns - 1);
    std::uint64_t count = whole * perRow;
    if (cut)
        for (std::uint64_t b = whole * columns, c = 0; c + 1 < columns; ++c, ++b)
            count += 3 * (static_cast<std::uint64_t>(below(b + columns)) + below(b + columns + 1));
    // Indices fit in 32 bits (ReservePoints); the count of corners must too.
    if (count > std::numeric_limits<std::uint32_t>::max()) RaiseMemoryError();
    Resize(_triangles, count);

    const auto w = static_cast<std::uint32_t>(columns);
    const auto fill = [&](std::uint64_t r, std::uint32_t* out) {
        auto b = static_cast<std::uint32_t>(r * columns);
        for (std::uint32_t c = 0; c + 1 < w; ++c, ++b, out += 6) {
            out[0] = b;
            out[1] = b + w;
            out[2] = b + 1;
            out[3] = b + 1;
            out[4] = b + w;
            out[5] = b + w + 1;
        }
    };
    // Whole rows in blocks on the workers: each row has its own place.
    constexpr std::uint64_t BlockRows = 64;
    ZonCloudWorkerPool::Run(static_cast<std::size_t>((whole + BlockRows - 1) / BlockRows), [&](std::size_t block) {
        const std::uint64_t first = block * BlockRows, last = std::min(whole, first + BlockRows);
        for (std::uint64_t r = first; r < last; ++r) fill(r, _triangles.data() + r * perRow);
    });
    if (!cut) return;
    std::uint32_t* out = _triangles.data() + whole * perRow;
    auto b = static_cast<std::uint32_t>(whole * columns);
    for (std::uint32_t c = 0; c + 1 < w; ++c, ++b) {
        if (below(b + columns)) {
            out[0] = b;
            out[1] = b + w;
            out[2] = b + 1;
            out += 3;
        }
        if (below(std::uint64_t(b) + columns + 1)) {
            out[0] = b + 1;
            out[1] = b + w;
            out[2] = b + w + 1;
            out += 3;
        }
    }
}

namespace {
// Lowest and highest value of each axis over n points, NaN ignored. Twelve
// lanes hold four points, so lane j always sees axis j % 3 and the loop
// vectorises; blocks of points go to the workers.
void AxisRanges(const float* p, std::size_t n, float low[3], float high[3])
{
    constexpr std::size_t Lanes = 12, BlockPoints = std::size_t(1) << 20;
    constexpr float Infinity = std::numeric_limits<float>::infinity();
    for (int a = 0; a < 3; ++a) {
        low[a] = Infinity;
        high[a] = -Infinity;
    }
    std::mutex mutex;
    ZonCloudWorkerPool::Run((n + BlockPoints - 1) / BlockPoints, [&](std::size_t block) {
        const std::size_t from = 3 * block * BlockPoints, to = 3 * std::min(n, (block + 1) * BlockPoints);
        float lo[Lanes], hi[Lanes];
        std::fill_n(lo, Lanes, Infinity);
        std::fill_n(hi, Lanes, -Infinity);
        std::size_t i = from;
        for (; i + Lanes <= to; i += Lanes)
            for (std::size_t j = 0; j < Lanes; ++j) {
                lo[j] = p[i + j] < lo[j] ? p[i + j] : lo[j];
                hi[j] = p[i + j] > hi[j] ? p[i + j] : hi[j];
            }
        for (std::size_t j = 0; i < to; ++i, ++j) {
            lo[j] = p[i] < lo[j] ? p[i] : lo[j];
            hi[j] = p[i] > hi[j] ? p[i] : hi[j];
        }
        std::lock_guard lock(mutex);
        for (std::size_t j = 0; j < Lanes; ++j) {
            low[j % 3] = std::min(low[j % 3], lo[j]);
            high[j % 3] = std::max(high[j % 3], hi[j]);
        }
    });
}
}  // namespace

void ZonCloudReadGridMesh::FinishPoints()
{
    const std::size_t count = _points.size() / 3;
    if (!_valid.empty()) _valid.resize(count, 1);
    float low[3], high[3];
    AxisRanges(_points.data(), count, low, high);
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
