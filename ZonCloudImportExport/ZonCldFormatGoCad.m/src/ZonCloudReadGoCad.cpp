#include "ZonCloudReadGoCad.h"

#include <cstring>
#include <limits>
#include <type_traits>

#include "ZonCloudLineSource.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint32_t kUnset = std::numeric_limits<std::uint32_t>::max();
// Vertex indices and counts are 32-bit; the last value marks unset map entries.
constexpr std::uint64_t kMaxVertices = std::numeric_limits<int>::max();
constexpr std::uint64_t kMaxTriangles = std::numeric_limits<std::uint32_t>::max() / 3;

bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

// The first `word` in [first, last), or null.
template <std::size_t N>
const char* Find(const char* first, const char* last, const char (&word)[N])
{
    constexpr std::size_t length = N - 1;
    while (static_cast<std::size_t>(last - first) >= length) {
        const void* hit = std::memchr(first, word[0], static_cast<std::size_t>(last - first) - (length - 1));
        if (!hit) return nullptr;
        first = static_cast<const char*>(hit);
        if (std::memcmp(first, word, length) == 0) return first;
        ++first;
    }
    return nullptr;
}

// A "%d" the quick way: white space, sign, up to nine digits, then white
// space or the end. Anything else is left to the scan engine.
bool QuickInteger(const char*& p, const char* last, int& value)
{
    while (p < last && IsSpace(*p)) ++p;
    bool negative = false;
    if (p < last && (*p == '-' || *p == '+')) negative = *p++ == '-';
    const char* digits = p;
    int v = 0;
    while (p < last && *p >= '0' && *p <= '9' && p - digits < 9) v = v * 10 + (*p++ - '0');
    if (p == digits || (p < last && !IsSpace(*p))) return false;
    value = negative ? -v : v;
    return true;
}

bool QuickReal(const char*& p, const char* last, float& value)
{
    const char* end = ZonParseFloat(p, last, '.', value);
    if (!end || (end < last && !IsSpace(*end))) return false;
    p = end;
    return true;
}

bool QuickReal(const char*& p, const char* last, double& value)
{
    const char* end = ZonParseDouble(p, last, '.', value);
    if (!end || (end < last && !IsSpace(*end))) return false;
    p = end;
    return true;
}

// "%d%f%f%f" (or "%d%lf%lf%lf"): a file number and a point.
template <class T>
bool ParseVertex(const char* first, const char* last, int& number, T* xyz)
{
    const char* p = first;
    if (QuickInteger(p, last, number) && QuickReal(p, last, xyz[0]) && QuickReal(p, last, xyz[1]) &&
        QuickReal(p, last, xyz[2]))
        return true;
    static const ZonCloudScanFormat format(std::is_same_v<T, float> ? "%d%f%f%f" : "%d%lf%lf%lf");
    void* const destinations[] = {&number, xyz, xyz + 1, xyz + 2, nullptr};
    return format.Scan(first, last, '.', destinations) == 4;
}

// "%d%d" or "%d%d%d".
template <int N>
bool ParseNumbers(const char* first, const char* last, int* numbers)
{
    const char* p = first;
    bool quick = true;
    for (int i = 0; i < N && quick; ++i) quick = QuickInteger(p, last, numbers[i]);
    if (quick) return true;
    static const ZonCloudScanFormat format(N == 2 ? "%d%d" : "%d%d%d");
    void* const destinations[] = {numbers, numbers + 1, N == 3 ? numbers + 2 : nullptr, nullptr};
    return format.Scan(first, last, '.', destinations) == N;
}

}  // namespace

// The counting pass: per surface, how many numbers its map needs; in all,
// the vertex, control-node and triangle lines.
class ZonCloudReadGoCad::Counting {
public:
    void Open() { surfaces.emplace_back(); }
    void Close() {}
    void Name(const char*, const char*) {}
    void Vertex(const char*, const char*, bool controlNode)
    {
        ++surfaces.back().entries;
        ++vertices;
        controlNodes += controlNode ? 1 : 0;
    }
    void Atom(const char*, const char*) { ++surfaces.back().entries; }
    void Triangle(const char*, const char*) { ++triangles; }

    std::vector<SurfaceCount> surfaces;
    std::uint64_t vertices = 0, controlNodes = 0, triangles = 0;
};

// The reading pass: vertices in file order, triangles through each surface's
// map from file numbers to vertex indices, surfaces closed into parts.
template <class T>
class ZonCloudReadGoCad::Reading {
public:
    Reading(ZonCloudReadGoCad& reader, const std::vector<SurfaceCount>& surfaces, std::vector<T>& vertices)
        : _reader(reader), _surfaces(surfaces), _vertices(vertices), _capacity(vertices.size() / 3)
    {
    }

    void Open()
    {
        // The counts of this surface; a surface the counting did not see gets an empty map.
        const std::uint64_t entries = _surface < _surfaces.size() ? _surfaces[_surface].entries : 0;
        ++_surface;
        _map.assign(static_cast<std::size_t>(entries + 1), kUnset);
    }
    void Close()
    {
        _map = {};
        std::vector<ZonCloudPolygonPart>& parts = _reader._parts;
        const auto end = static_cast<unsigned>(_reader._triangles.size() / 3);
        // A surface that added no triangle adds no part, unless it is the first.
        if (!parts.empty() && parts.back().end == end) return;
        parts.push_back({_name, end, {-1, -1, -1, -1}, 0});
    }
    void Name(const char* first, const char* last)
    {
        // The word after "name:", as "%s" reads it.
        while (first < last && IsSpace(*first)) ++first;
        const char* end = first;
        while (end < last && *end != '\0' && !IsSpace(*end)) ++end;
        _name.assign(first, end);
    }
    void Vertex(const char* first, const char* last, bool controlNode)
    {
        int number = 0;
        T xyz[3];
        if (!ParseVertex(first, last, number, xyz) || !InMap(number) || _reader._vertexCount >= _capacity) return;
        const std::size_t index = _reader._vertexCount++;
        std::copy(xyz, xyz + 3, _vertices.data() + 3 * index);
        _map[static_cast<std::size_t>(number)] = static_cast<std::uint32_t>(index);
        if (controlNode) {
            ++_reader._controlNodes;
            _reader._labels[index] = "CNXYZ";
        }
    }
    void Atom(const char* first, const char* last)
    {
        int numbers[2];
        if (ParseNumbers<2>(first, last, numbers) && InMap(numbers[0]) && InMap(numbers[1]))
            _map[static_cast<std::size_t>(numbers[0])] = _map[static_cast<std::size_t>(numbers[1])];
    }
    void Triangle(const char* first, const char* last)
    {
        int numbers[3];
        if (!ParseNumbers<3>(first, last, numbers)) return;
        std::uint32_t corners[3];
        for (int k = 0; k < 3; ++k) {
            // A number the surface never gave a vertex leaves the triangle out.
            if (!InMap(numbers[k]) || _map[static_cast<std::size_t>(numbers[k])] == kUnset) return;
            corners[k] = _map[static_cast<std::size_t>(numbers[k])];
        }
        if (_reader._triangles.size() / 3 >= kMaxTriangles) return;
        _reader._triangles.insert(_reader._triangles.end(), corners, corners + 3);
    }

private:
    bool InMap(int number) const { return number >= 0 && static_cast<std::size_t>(number) < _map.size(); }

    ZonCloudReadGoCad& _reader;
    const std::vector<SurfaceCount>& _surfaces;
    std::vector<T>& _vertices;
    std::size_t _capacity;
    std::size_t _surface = 0;
    std::vector<std::uint32_t> _map;
    std::string _name;
};

// The keyword rules both passes share.
template <class Pass>
void ZonCloudReadGoCad::Walk(ZonCloudLineSource& lines, Pass& pass)
{
    bool inSurface = false;
    const char* first = nullptr;
    const char* last = nullptr;
    // A keyword after a NUL is not on the line, as a C string would end there.
    const auto find = [&]<std::size_t N>(const char(&word)[N]) -> const char* {
        const char* hit = Find(first, last, word);
        return hit && !std::memchr(first, '\0', static_cast<std::size_t>(hit - first)) ? hit : nullptr;
    };
    while (lines.Next(first, last)) {
        // Comments, and lines such as END_ORIGINAL_COORDINATE_SYSTEM that must not end a surface.
        if (first == last || *first == '#') continue;
        const char* end = find("END");
        if (end && Find(end, last, "END_") && find("END_")) continue;
        if (const char* name = find("name:")) pass.Name(name + 5, last);
        if (!inSurface) {
            // Any other object type is outside a surface, so skipped.
            if (find("GOCAD") && find("TSurf")) {
                pass.Open();
                inSurface = true;
            }
            continue;
        }
        // After the name: a name holding "END" ends its surface too.
        if (end) {
            pass.Close();
            inSurface = false;
        } else if (const char* vertex = find("VRTX")) {
            pass.Vertex(vertex + 4, last, find("CNXYZ") != nullptr);
        } else if (const char* atom = find("ATOM")) {
            pass.Atom(atom + 4, last);
        } else if (const char* triangle = find("TRGL")) {
            pass.Triangle(triangle + 4, last);
        }
    }
    // A last surface without its END still counts.
    if (inSurface) pass.Close();
}

ZonCloudReadGoCad::ZonCloudReadGoCad(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName) {}

ZonCloudReadGoCad::~ZonCloudReadGoCad() = default;

void ZonCloudReadGoCad::AnalyseFile()
{
    _vertexCount = 0;
    _vertices = {};
    _verticesDouble = {};
    _triangles = {};
    _parts = {};
    _labels = {};
    _controlNodes = 0;
    _sub.Clear();
    _cursor.Reset();
    _digitizationType = DigitizationPolygons;

    ZonCloudByteSource& source = Source();
    Counting counts;
    {
        ZonCloudLineSource lines(ZonCloudLineSource::FgetsPiece);
        lines.Start(source, 0);
        Walk(lines, counts);
    }
    if (counts.vertices == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    // Without a triangle there is no polygon to give; asking for it says so.
    if (counts.triangles > 0) {
        _inDouble = _doublePrecision;
        if (_inDouble)
            Read(source, counts, _verticesDouble);
        else
            Read(source, counts, _vertices);
    }
    CloseSource();
    _numberOfPoints = static_cast<int>(_vertexCount);
    if (counts.triangles > 0 && _boundingBox.IsEmpty()) Tool::Raise(Tool::Data, "ERR_NoPointFound");
}

template <class T>
void ZonCloudReadGoCad::Read(ZonCloudByteSource& source, const Counting& counts, std::vector<T>& vertices)
{
    // The counts come from the lines of the file, so the arrays are as large as the file justifies.
    const std::uint64_t capacity = std::min(counts.vertices, kMaxVertices);
    Resize(vertices, 3 * capacity);
    Reserve(_triangles, 3 * std::min(counts.triangles, kMaxTriangles));
    if (counts.controlNodes > 0) Resize(_labels, capacity);
    {
        Reading<T> reading(*this, counts.surfaces, vertices);
        ZonCloudLineSource lines(ZonCloudLineSource::FgetsPiece);
        lines.Start(source, 0);
        Walk(lines, reading);
    }
    vertices.resize(3 * _vertexCount);
    if (!_labels.empty()) _labels.resize(_vertexCount);
    _boundingBox.SetToEmpty();
    T low[3], high[3];
    bool any = false;
    for (std::size_t i = 0; i < _vertexCount; ++i) {
        const T* v = vertices.data() + 3 * i;
        // A NaN coordinate widens nothing.
        if (v[0] != v[0] || v[1] != v[1] || v[2] != v[2]) continue;
        for (int k = 0; k < 3; ++k) {
            low[k] = any && low[k] < v[k] ? low[k] : v[k];
            high[k] = any && high[k] > v[k] ? high[k] : v[k];
        }
        any = true;
    }
    if (any) _boundingBox.SetLowHigh(ZonMathPoint(low[0], low[1], low[2]), ZonMathPoint(high[0], high[1], high[2]));
}

const float* ZonCloudReadGoCad::FloatVertices()
{
    if (_inDouble && _vertices.size() != 3 * _vertexCount)
        Allocating([this] { _vertices.assign(_verticesDouble.begin(), _verticesDouble.end()); });
    return _vertexCount ? _vertices.data() : nullptr;
}

const double* ZonCloudReadGoCad::DoubleVertices()
{
    if (!_inDouble && _verticesDouble.size() != 3 * _vertexCount)
        Allocating([this] { _verticesDouble.assign(_vertices.begin(), _vertices.end()); });
    return _vertexCount ? _verticesDouble.data() : nullptr;
}

const float* ZonCloudReadGoCad::GetPoints(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_vertexCount);
    return FloatVertices();
}

const double* ZonCloudReadGoCad::GetPointsDouble(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_vertexCount);
    return DoubleVertices();
}

unsigned ZonCloudReadGoCad::GetNumberOfControlNodes()
{
    Analyse();
    return _controlNodes;
}

// ---------------------------------------------------------------- polygon protocol

void ZonCloudReadGoCad::BeginGetPolygon()
{
    if (GetTypeOfDigitization() != DigitizationPolygons) Tool::Raise(Tool::Usage, "ERR_NotAPolygonDigit");
    if (_vertexCount == 0 || _triangles.empty()) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _cursor.Begin(1);
}

bool ZonCloudReadGoCad::NextPolygon()
{
    if (!_cursor.HasNext()) return false;
    _cursor.Advance();
    return true;
}

unsigned ZonCloudReadGoCad::GetNumberOfTriangles()
{
    Analyse();
    return static_cast<unsigned>(_triangles.size() / 3);
}

const unsigned* ZonCloudReadGoCad::GetTriangles(unsigned& count)
{
    Analyse();
    count = static_cast<unsigned>(_triangles.size() / 3);
    return _triangles.data();
}

const unsigned* ZonCloudReadGoCad::NextTriangle()
{
    Analyse();
    return _cursor.NextTriangle(_triangles.data(), _triangles.size() / 3);
}

const unsigned* ZonCloudReadGoCad::GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                                     unsigned& vertexCount)
{
    Analyse();
    if (box.IsSameAs(_boundingBox))
        return ZonCloudSubMesh::Give(_cursor, count, vertices, vertexCount, FloatVertices(), _vertexCount, _triangles.data(),
                                     _triangles.size() / 3);
    if (!_sub.IsFor(box)) {
        Allocating([&] {
            if (_inDouble)
                _sub.Compute(box, _boundingBox, _verticesDouble.data(), _vertexCount, _triangles.data(),
                             _triangles.size() / 3);
            else
                _sub.Compute(box, _boundingBox, _vertices.data(), _vertexCount, _triangles.data(),
                             _triangles.size() / 3);
        });
    }
    return _sub.Answer(_cursor, count, vertices, vertexCount);
}

const std::vector<ZonCloudPolygonPart>& ZonCloudReadGoCad::GetPolygonParts()
{
    Analyse();
    return _parts;
}

const std::vector<std::string>& ZonCloudReadGoCad::GetVertexLabels()
{
    Analyse();
    return _labels;
}
