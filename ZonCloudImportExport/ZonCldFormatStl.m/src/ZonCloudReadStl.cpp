#include "ZonCloudReadStl.h"

#include <algorithm>
#include <bit>
#include <cerrno>
#include <cstring>
#include <limits>
#include <new>
#include <optional>

#include "DecimalPointGuard.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudVertexTable.h"
#include "ZonCloudWorkerPool.h"

namespace {

constexpr std::size_t kHeaderSize = 80;
constexpr long kCountOffset = 80;
constexpr std::size_t kRecordSize = 50;    // normal, three vertices, attribute word
constexpr std::size_t kRecordFloats = 48;  // a record counts once its floats are there
constexpr std::size_t kVertexOffset = 12;  // the normal comes first and is skipped
// The text form is read as fgets with a 512-byte buffer reads it: a longer
// line comes as several lines.
constexpr std::size_t kLineMax = 511;
constexpr int kKindTestLines = 100;
constexpr int kMaxConsecutiveFailures = 3;
constexpr std::size_t kBlockSize = std::size_t(1) << 20;
// Three corners per triangle must stay countable in 32 bits.
constexpr std::int64_t kMaxTriangles = std::numeric_limits<std::uint32_t>::max() / 3;

using Tool = ZonCloudReadNLSTool;

// Big blocks for big files, no more than needed for small ones (the line
// source sizes itself the same way).
std::size_t BlockSize(const ZonCloudByteSource& source, std::size_t largest)
{
    const std::int64_t size = source.Size();
    if (size < 0) return largest;
    return std::min<std::size_t>(largest, std::max<std::size_t>(static_cast<std::size_t>(size) + 1, 4096));
}

// A whole number of records.
std::size_t RecordBlockSize(const ZonCloudByteSource& source)
{
    const std::size_t size = BlockSize(source, kBlockSize) + kRecordSize;
    return size - size % kRecordSize;
}

const char* Find(const char* first, const char* last, const char* word)
{
    constexpr std::size_t length = 6;
    while (last - first >= static_cast<std::ptrdiff_t>(length)) {
        const void* hit = std::memchr(first, word[0], static_cast<std::size_t>(last - first) - (length - 1));
        if (!hit) return nullptr;
        first = static_cast<const char*>(hit);
        if (std::memcmp(first, word, length) == 0) return first;
        ++first;
    }
    return nullptr;
}

// Where the numbers of a vertex line start: just after its first "vertex",
// else after its first "VERTEX"; null for any other line. A keyword after a
// NUL is not on the line.
const char* AfterKeyword(const char* first, const char* last)
{
    for (const char* word : {"vertex", "VERTEX"}) {
        const char* hit = Find(first, last, word);
        if (hit && !std::memchr(first, '\0', static_cast<std::size_t>(hit - first))) return hit + 6;
    }
    return nullptr;
}

bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

const char* ParseNumber(const char* first, const char* last, char point, float& value)
{
    return ZonParseFloat(first, last, point, value);
}

const char* ParseNumber(const char* first, const char* last, char point, double& value)
{
    return ZonParseDouble(first, last, point, value);
}

// Three numbers as "%f%f%f" (or "%lf%lf%lf") read them. A number followed by
// white space or the end of the line reads the same with the number parser,
// which is the fast path; anything else ("1e+", "0x", "infinit", the other
// decimal point, a NUL) goes to the scan engine, which follows sscanf there
// too and ends the input at a NUL.
template <class T>
bool ParseVertex(const char* first, const char* last, char point, T* xyz)
{
    const char* p = first;
    for (int i = 0; i < 3; ++i) {
        const char* end = ParseNumber(p, last, point, xyz[i]);
        if (!end || (end < last && !IsSpace(*end))) {
            static const ZonCloudScanFormat format(std::is_same_v<T, float> ? "%f%f%f" : "%lf%lf%lf");
            void* const destinations[] = {xyz, xyz + 1, xyz + 2, nullptr};
            return format.Scan(first, last, point, destinations) == 3;
        }
        p = end;
    }
    return true;
}

// Records are little-endian as the format says; a file written by a
// big-endian machine is read in the other order.
template <bool Reverse>
void LoadCorners(const unsigned char* record, float corners[9])
{
    constexpr bool big = (std::endian::native == std::endian::little) == Reverse;
    for (int k = 0; k < 9; ++k) {
        const unsigned char* p = record + kVertexOffset + 4 * k;
        corners[k] = big ? ZonCloudByteSource::LoadBig<float>(p) : ZonCloudByteSource::LoadLittle<float>(p);
    }
}

// Hands each record from the current position to `onRecord`, at most
// `maxCount` of them, reading the file in big blocks; stops at the first
// short one. Returns how many were handed.
template <class OnRecord>
std::uint64_t ForEachRecord(ZonCloudByteSource& source, std::uint64_t maxCount, std::vector<unsigned char>& buffer,
                            OnRecord onRecord)
{
    const std::size_t perBlock = buffer.size() / kRecordSize;
    std::uint64_t done = 0;
    while (done < maxCount) {
        const std::size_t records = static_cast<std::size_t>(std::min<std::uint64_t>(perBlock, maxCount - done));
        const std::size_t wanted = records * kRecordSize;
        const std::size_t got = source.ReadSome(buffer.data(), wanted);
        std::size_t whole = got / kRecordSize;
        // The last record may lack its attribute word.
        if (got < wanted && got % kRecordSize >= kRecordFloats) ++whole;
        for (std::size_t i = 0; i < whole; ++i) onRecord(buffer.data() + i * kRecordSize);
        done += whole;
        if (got < wanted) break;
    }
    return done;
}

// Box of the coordinates seen; a NaN coordinate widens nothing.
template <class T>
struct BoxAccumulator {
    T low[3] = {std::numeric_limits<T>::infinity(), std::numeric_limits<T>::infinity(),
                std::numeric_limits<T>::infinity()};
    T high[3] = {-std::numeric_limits<T>::infinity(), -std::numeric_limits<T>::infinity(),
                 -std::numeric_limits<T>::infinity()};

    void Add(const T* v)
    {
        for (int i = 0; i < 3; ++i) {
            low[i] = v[i] < low[i] ? v[i] : low[i];
            high[i] = v[i] > high[i] ? v[i] : high[i];
        }
    }
    // Another box seen after this one: the first of equal values stays, as when adding one by one.
    void Merge(const BoxAccumulator& other)
    {
        for (int i = 0; i < 3; ++i) {
            low[i] = other.low[i] < low[i] ? other.low[i] : low[i];
            high[i] = other.high[i] > high[i] ? other.high[i] : high[i];
        }
    }
    bool IsEmpty() const { return !(low[0] <= high[0] && low[1] <= high[1] && low[2] <= high[2]); }
    ZonMathBox Box() const
    {
        ZonMathBox box;
        if (!IsEmpty()) box.SetLowHigh(ZonMathPoint(low[0], low[1], low[2]), ZonMathPoint(high[0], high[1], high[2]));
        return box;
    }
};

// The byte-order rule: which reading of the count word (n in this machine's
// order, s reversed) fits a file that can hold e records (-1: size unknown).
// The count is -1 when none fits.
struct CountChoice {
    std::int64_t count;
    bool native;
};

CountChoice ChooseCount(std::int64_t n, std::int64_t s, std::int64_t e)
{
    const auto capped = [e](std::int64_t c) { return e >= 1 && c > e ? e : c; };
    if (n < 0 && s < 0) return {e >= 1 ? e : -1, true};
    if (n > 0 && s < 0) return {capped(n), true};
    if (s > 0 && n < 0) return {capped(s), false};
    if (e < 0) return {n, true};
    if (n > e) {
        if (s > e) return {e, n <= s};
        return {s, false};
    }
    if (s > e) return {n, true};
    if (s > n) return {s, false};
    return {n, true};
}

}  // namespace

ZonCloudReadStl::ZonCloudReadStl(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName) {}

ZonCloudReadStl::~ZonCloudReadStl() = default;

// ---------------------------------------------------------------- analysis

void ZonCloudReadStl::Reset()
{
    Reanalyse();
    _digitizationType = DigitizationUnknown;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _isText = false;
    _separatorSwitched = false;
    _vertexCount = 0;
    _triangleCount = 0;
    _meshLoaded = false;
    _meshInDouble = false;
    _premerged = false;
    _premergedInDouble = false;
    _distinctCount = 0;
    _vertices = {};
    _verticesDouble = {};
    _triangles = {};
    _sub.Clear();
    _cursor.Reset();
}

void ZonCloudReadStl::AnalyseFile()
{
    Source();
    _isText = IsTextCandidate() && HasVertexLineNearStart();
    if (_isText)
        AnalyseText();
    else
        AnalyseBinary();
    _digitizationType = DigitizationPolygons;
    _numberOfPoints = static_cast<int>(std::min<std::uint32_t>(_vertexCount, std::numeric_limits<int>::max()));
}

bool ZonCloudReadStl::IsTextCandidate()
{
    char head[kLineMax + 1] = {};
    const std::size_t got = _source.ReadSome(head, kLineMax);
    const auto contains = [&](const char* word) {
        return std::search(head, head + got, word, word + 5) != head + got;
    };
    return contains("solid") || contains("SOLID");
}

// Binary headers often begin with "solid" too: only a vertex line near the
// start makes the file text.
bool ZonCloudReadStl::HasVertexLineNearStart()
{
    ZonCloudLineSource lines(kLineMax, BlockSize(_source, 64 * 1024));
    lines.Start(_source, 0);
    const char* first = nullptr;
    const char* last = nullptr;
    for (int without = 0; without < kKindTestLines && lines.Next(first, last); ++without)
        if (AfterKeyword(first, last)) return true;
    return false;
}

void ZonCloudReadStl::AnalyseText()
{
    if (const unsigned char* text = ZonCloudChunkedText::MapIfWorth(_source, 0)) {
        if (_doublePrecision)
            AnalyseTextInChunks(text, _verticesDouble);
        else
            AnalyseTextInChunks(text, _vertices);
        return;
    }
    DecimalPointGuard separator;
    bool otherTried = false;
    for (;;) {
        ZonCloudLineSource lines(kLineMax, BlockSize(_source, kBlockSize));
        lines.Start(_source, 0);
        BoxAccumulator<double> box;
        std::uint64_t found = 0;
        int failures = 0;
        bool retry = false;
        const char point = separator.DecimalPoint();
        const char* first = nullptr;
        const char* last = nullptr;
        while (lines.Next(first, last)) {
            const char* numbers = AfterKeyword(first, last);
            if (!numbers) continue;
            double xyz[3];
            bool parsed;
            if (_doublePrecision) {
                parsed = ParseVertex(numbers, last, point, xyz);
            } else {
                float f[3];
                parsed = ParseVertex(numbers, last, point, f);
                std::copy(f, f + 3, xyz);
            }
            if (parsed) {
                ++found;
                box.Add(xyz);
                failures = 0;
                continue;
            }
            if (++failures <= kMaxConsecutiveFailures) continue;
            // A file written with the other decimal separator fails on every
            // vertex line: try it once with the other one.
            if (otherTried || !separator.Switch()) Tool::Raise(Tool::Data, "ERR_TooManyUnknownData");
            otherTried = true;
            retry = true;
            break;
        }
        if (retry) continue;
        KeepTextAnalysis(found, box.Box(), separator.IsSwitched());
        return;
    }
}

void ZonCloudReadStl::KeepTextAnalysis(std::uint64_t corners, const ZonMathBox& box, bool separatorSwitched)
{
    if (corners == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _triangleCount = static_cast<std::uint32_t>(std::min<std::uint64_t>(corners / 3, kMaxTriangles));
    _vertexCount = static_cast<std::uint32_t>(std::min<std::uint64_t>(corners, 3 * kMaxTriangles));
    _boundingBox = box;
    _separatorSwitched = separatorSwitched;
}

void ZonCloudReadStl::AnalyseBinary()
{
    _source.Seek(0);
    unsigned char header[kHeaderSize];
    _source.Read(header, kHeaderSize, Tool::Data);
    unsigned char word[4];
    _source.Read(word, sizeof word);
    const auto stored = ZonCloudByteSource::LoadLittle<std::int32_t>(word);
    const auto reversed = ZonCloudByteSource::LoadBig<std::int32_t>(word);

    const std::int64_t size = _source.Size();
    const std::int64_t fits = size > 0 ? (size - 84) / static_cast<std::int64_t>(kRecordSize) : -1;

    const CountChoice choice = ChooseCount(stored, reversed, fits);
    _byteOrder = choice.native ? Current : Differ;
    _nativeOrder = choice.native;
    if (choice.count < 0) Tool::Raise(Tool::Input, "ERR_UnknownData");

    // The count word is only a bound: what counts is what the file holds.
    std::vector<unsigned char> buffer(RecordBlockSize(_source));
    BoxAccumulator<float> box;
    const auto widen = [&box](const float* corners) {
        box.Add(corners);
        box.Add(corners + 3);
        box.Add(corners + 6);
    };
    const std::uint64_t wanted = static_cast<std::uint64_t>(std::min(choice.count, kMaxTriangles));
    if (const unsigned char* mapped = ZonCloudChunkedText::MapIfWorth(_source, 0)) {
        // Whole records, and a last one that lacks only its attribute word.
        const std::uint64_t bytes = static_cast<std::uint64_t>(size) - 84;
        const std::uint64_t held = bytes / kRecordSize + (bytes % kRecordSize >= kRecordFloats ? 1 : 0);
        AnalyseBinaryInChunks(mapped, std::min(wanted, held));
        return;
    }
    std::uint64_t records;
    if (_nativeOrder)
        records = ForEachRecord(_source, wanted, buffer, [&](const unsigned char* record) {
            float corners[9];
            LoadCorners<false>(record, corners);
            widen(corners);
        });
    else
        records = ForEachRecord(_source, wanted, buffer, [&](const unsigned char* record) {
            float corners[9];
            LoadCorners<true>(record, corners);
            widen(corners);
        });
    _triangleCount = static_cast<std::uint32_t>(records);
    _vertexCount = 3 * _triangleCount;
    if (records == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");

    // Any 84 bytes can pass for a header and a count: a box of nothing or of
    // absurd size tells that the rest was not STL data.
    const double extent[3] = {double(box.high[0]) - box.low[0], double(box.high[1]) - box.low[1],
                              double(box.high[2]) - box.low[2]};
    const bool plausible = !box.IsEmpty() && extent[0] + extent[1] + extent[2] > 1e-6 &&
                           extent[0] * extent[1] * extent[2] < 3.4028234663852886e+38;
    if (!plausible) Tool::Raise(Tool::Input, "ERR_UnknownData");
    _boundingBox = box.Box();
}

bool ZonCloudReadStl::IsTextFile()
{
    Analyse();
    return _isText;
}

unsigned ZonCloudReadStl::GetNumberOfTriangles()
{
    Analyse();
    return _meshLoaded ? static_cast<unsigned>(_triangles.size() / 3) : _triangleCount;
}

void ZonCloudReadStl::SetBinaryFrom(int from)
{
    if (from < Unknown || from > Differ) Tool::Raise(Tool::Input, "ERR_Failure");
    if (from == _byteOrder) return;
    _byteOrder = from;
    _nativeOrder = from != Differ;
    Reset();
}

// ---------------------------------------------------------------- mesh

void ZonCloudReadStl::LoadMesh()
{
    Analyse();
    if (_meshLoaded) return;
    if (_premerged) {
        _premerged = false;
        if (_premergedInDouble == (_isText && _doublePrecision)) {
            _meshInDouble = _premergedInDouble;
            CloseSource();
            _meshLoaded = true;
            _numberOfPoints = static_cast<int>(std::min<std::size_t>(_distinctCount, std::numeric_limits<int>::max()));
            return;
        }
        // The precision changed since the analysis: read the mesh again.
        _vertices = {};
        _verticesDouble = {};
        _triangles = {};
        _distinctCount = 0;
    }
    try {
        Guarded([this] {
            Source();
            _meshInDouble = _isText && _doublePrecision;
            if (!_isText)
                ReadBinaryMesh();
            else if (_meshInDouble)
                ReadTextMesh(_verticesDouble);
            else
                ReadTextMesh(_vertices);
        });
    } catch (...) {
        _vertices = {};
        _verticesDouble = {};
        _triangles = {};
        throw;
    }
    // Everything is in memory now.
    CloseSource();
    _meshLoaded = true;
    _numberOfPoints = static_cast<int>(std::min<std::size_t>(_distinctCount, std::numeric_limits<int>::max()));
}

namespace {
// Room for the distinct vertices of a typical mesh, where each vertex is
// shared by about six triangles; the table and the array grow past it.
std::size_t ExpectedDistinct(std::uint32_t triangles) { return triangles / 2 + triangles / 32 + 16; }

template <class T>
void ShrinkIfLoose(std::vector<T>& v)
{
    if (v.capacity() - v.size() > v.size() / 4) v.shrink_to_fit();
}
}  // namespace

template <class T>
void ZonCloudReadStl::ReadTextMesh(std::vector<T>& vertices)
{
    DecimalPointGuard separator;
    if (_separatorSwitched) separator.Switch();
    const char point = separator.DecimalPoint();

    vertices.clear();
    vertices.reserve(3 * ExpectedDistinct(_triangleCount));
    _triangles.resize(3 * static_cast<std::size_t>(_triangleCount));
    ZonCloudVertexTable<T> table(vertices, ExpectedDistinct(_triangleCount));
    ZonCloudLineSource lines(kLineMax, BlockSize(_source, kBlockSize));
    lines.Start(_source, 0);
    T corners[9];
    int pending = 0;
    std::size_t stored = 0;
    const char* first = nullptr;
    const char* last = nullptr;
    while (stored < _triangleCount && lines.Next(first, last)) {
        const char* numbers = AfterKeyword(first, last);
        if (!numbers || !ParseVertex(numbers, last, point, corners + 3 * pending)) continue;
        if (++pending < 3) continue;
        pending = 0;
        std::uint32_t* triangle = _triangles.data() + 3 * stored;
        triangle[0] = table.Index(corners);
        triangle[1] = table.Index(corners + 3);
        triangle[2] = table.Index(corners + 6);
        ++stored;
    }
    _triangles.resize(3 * stored);
    ShrinkIfLoose(vertices);
    _distinctCount = vertices.size() / 3;
}

void ZonCloudReadStl::ReadBinaryMesh()
{
    _source.Seek(kCountOffset);
    unsigned char ignored[4];
    _source.Read(ignored, sizeof ignored);

    _vertices.clear();
    _vertices.reserve(3 * ExpectedDistinct(_triangleCount));
    _triangles.resize(3 * static_cast<std::size_t>(_triangleCount));
    ZonCloudVertexTable<float> table(_vertices, ExpectedDistinct(_triangleCount));
    std::vector<unsigned char> buffer(RecordBlockSize(_source));
    // Records are merged in small batches whose table slots are prefetched
    // together: on big meshes the table does not fit in the cache.
    constexpr std::size_t kBatch = 16;
    float corners[kBatch][9];
    std::uint32_t hashes[kBatch][3];
    std::size_t batched = 0;
    std::uint32_t* triangle = _triangles.data();
    const auto flush = [&] {
        for (std::size_t r = 0; r < batched; ++r)
            for (int k = 0; k < 3; ++k) {
                hashes[r][k] = table.HashOf(corners[r] + 3 * k);
                table.Prefetch(hashes[r][k]);
            }
        for (std::size_t r = 0; r < batched; ++r)
            for (int k = 0; k < 3; ++k) *triangle++ = table.Index(corners[r] + 3 * k, hashes[r][k]);
        batched = 0;
    };
    std::uint64_t stored;
    if (_nativeOrder)
        stored = ForEachRecord(_source, _triangleCount, buffer, [&](const unsigned char* record) {
            LoadCorners<false>(record, corners[batched]);
            if (++batched == kBatch) flush();
        });
    else
        stored = ForEachRecord(_source, _triangleCount, buffer, [&](const unsigned char* record) {
            LoadCorners<true>(record, corners[batched]);
            if (++batched == kBatch) flush();
        });
    flush();
    _triangles.resize(3 * static_cast<std::size_t>(stored));
    ShrinkIfLoose(_vertices);
    _distinctCount = _vertices.size() / 3;
}

namespace {

// Corners merged in file order, their table slots fetched a few corners ahead.
constexpr std::size_t kAhead = 8;

template <class T>
struct CornerChunk {
    std::vector<T> corners;          // three coordinates per parsed corner
    std::vector<std::uint32_t> hashes;
    std::vector<std::uint32_t> failures;  // text: corners parsed before each vertex line that failed
    BoxAccumulator<float> box;            // binary: the box of the chunk's corners
    // Binary: the chunk's own distinct corners in order of first appearance,
    // their hashes, the table that merged them (kept from chunk to chunk),
    // and where the chunk's corner numbers stand in the triangle array.
    std::vector<T> distinct;
    std::vector<std::uint32_t> distinctHashes;
    std::optional<ZonCloudVertexTable<T>> own;
    std::size_t at = 0, values = 0;

    // As a new chunk, with its arrays' memory kept.
    void Reuse()
    {
        corners.clear();
        hashes.clear();
        failures.clear();
        box = BoxAccumulator<float>();
        distinct.clear();
        distinctHashes.clear();
        at = values = 0;
    }
};

}  // namespace

template <class T>
void ZonCloudReadStl::AnalyseTextInChunks(const unsigned char* text, std::vector<T>& vertices)
{
    const std::uint64_t size = static_cast<std::uint64_t>(_source.Size());
    // About 250 bytes a facet in the usual layout; the table grows past it.
    const std::size_t expected = ExpectedDistinct(static_cast<std::uint32_t>(std::min<std::uint64_t>(size / 256, kMaxTriangles)));
    DecimalPointGuard separator;
    bool otherTried = false;
    for (;;) {
        vertices = {};
        _triangles = {};
        Reserve(vertices, 3 * expected);
        Reserve(_triangles, 6 * expected);
        ZonCloudVertexTable<T> table(vertices, expected);
        BoxAccumulator<double> box;
        std::uint64_t found = 0;
        int failures = 0;
        bool retry = false;
        const char point = separator.DecimalPoint();
        T pendingCorners[9];
        std::uint32_t pendingHashes[3];
        int pending = 0;

        const auto parse = [point](ZonCloudChunkLines& lines, CornerChunk<T>& chunk) {
            const char* first = nullptr;
            const char* last = nullptr;
            while (lines.Next(first, last)) {
                const char* numbers = AfterKeyword(first, last);
                if (!numbers) continue;
                T xyz[3];
                if (ParseVertex(numbers, last, point, xyz)) {
                    chunk.corners.insert(chunk.corners.end(), xyz, xyz + 3);
                    chunk.hashes.push_back(ZonCloudVertexTable<T>::HashOf(xyz));
                } else {
                    chunk.failures.push_back(static_cast<std::uint32_t>(chunk.hashes.size()));
                }
            }
        };
        const auto stitch = [&](CornerChunk<T>& chunk) {
            std::size_t taken = 0;
            // Corners as the line loop meets them: counted, boxed, and merged
            // three by three (a triangle may begin in an earlier chunk) while
            // the triangles stay countable.
            const auto take = [&](std::size_t upTo) {
                if (upTo == taken) return;
                failures = 0;
                for (std::size_t i = taken; i < upTo; ++i) {
                    const T* xyz = chunk.corners.data() + 3 * i;
                    const double corner[3] = {static_cast<double>(xyz[0]), static_cast<double>(xyz[1]),
                                              static_cast<double>(xyz[2])};
                    box.Add(corner);
                    if (i + kAhead < upTo) table.Prefetch(chunk.hashes[i + kAhead]);
                    std::copy(xyz, xyz + 3, pendingCorners + 3 * pending);
                    pendingHashes[pending] = chunk.hashes[i];
                    if (++pending < 3) continue;
                    pending = 0;
                    if (_triangles.size() / 3 >= static_cast<std::size_t>(kMaxTriangles)) continue;
                    for (int k = 0; k < 3; ++k) _triangles.push_back(table.Index(pendingCorners + 3 * k, pendingHashes[k]));
                }
                found += upTo - taken;
                taken = upTo;
            };
            for (const std::uint32_t failure : chunk.failures) {
                take(failure);
                if (++failures <= kMaxConsecutiveFailures) continue;
                // A file written with the other decimal separator fails on every
                // vertex line: try it once with the other one.
                if (otherTried || !separator.Switch()) Tool::Raise(Tool::Data, "ERR_TooManyUnknownData");
                otherTried = true;
                retry = true;
                return false;
            }
            take(chunk.hashes.size());
            return true;
        };
        ZonCloudChunkedText::Run<CornerChunk<T>>(_source, text, 0, kLineMax, parse, stitch);
        if (retry) continue;
        KeepTextAnalysis(found, box.Box(), separator.IsSwitched());
        ShrinkIfLoose(vertices);
        _distinctCount = vertices.size() / 3;
        _premerged = true;
        _premergedInDouble = std::is_same_v<T, double>;
        return;
    }
}

void ZonCloudReadStl::AnalyseBinaryInChunks(const unsigned char* mapped, std::uint64_t records)
{
    const std::size_t expected = ExpectedDistinct(static_cast<std::uint32_t>(records));
    _vertices = {};
    _triangles = {};
    Reserve(_vertices, 3 * expected);
    // Made by the first stitch, while the workers parse the first chunks.
    std::optional<ZonCloudVertexTable<float>> table;
    BoxAccumulator<float> box;
    const bool native = _nativeOrder;

    // Each chunk first merges its own corners on a worker, so the stitch looks
    // up only the chunk's distinct corners, in their order of first appearance:
    // the numbering is the one a single pass over every corner gives. The
    // workers write each corner's number within its chunk straight into the
    // triangle array; it becomes the global one once every chunk is stitched.
    Resize(_triangles, 3 * records);
    std::uint32_t* const triangles = _triangles.data();
    const unsigned char* const firstRecord = mapped + 84;
    const auto parse = [native, triangles, firstRecord](const unsigned char* record, std::size_t count,
                                                        CornerChunk<float>& chunk) {
        chunk.at = 3 * static_cast<std::size_t>((record - firstRecord) / kRecordSize);
        chunk.values = 3 * count;
        chunk.corners.resize(9 * count);
        chunk.distinct.clear();
        chunk.distinctHashes.clear();
        const std::size_t expectedHere = ExpectedDistinct(static_cast<std::uint32_t>(count));
        if (chunk.own)
            chunk.own->Reset(expectedHere);
        else
            chunk.own.emplace(chunk.distinct, expectedHere);
        std::uint32_t* numbers = triangles + chunk.at;
        for (std::size_t r = 0; r < count; ++r, record += kRecordSize) {
            float* corners = chunk.corners.data() + 9 * r;
            if (native)
                LoadCorners<false>(record, corners);
            else
                LoadCorners<true>(record, corners);
            for (int k = 0; k < 3; ++k) {
                const float* corner = corners + 3 * k;
                chunk.box.Add(corner);
                const std::uint32_t hash = ZonCloudVertexTable<float>::HashOf(corner);
                const std::uint32_t number = chunk.own->Index(corner, hash);
                if (number == chunk.distinctHashes.size()) chunk.distinctHashes.push_back(hash);
                *numbers++ = number;
            }
        }
    };
    // The stitch numbers each chunk's distinct corners; the corners themselves
    // are renumbered afterwards, chunk by chunk on the workers.
    struct Numbered {
        std::size_t at = 0, values = 0;
        std::vector<std::uint32_t> global;
    };
    std::vector<Numbered> numbered;
    const auto stitch = [&](CornerChunk<float>& chunk) {
        if (!table) table.emplace(_vertices, expected);
        box.Merge(chunk.box);
        const std::size_t distinct = chunk.distinctHashes.size();
        Numbered& n = numbered.emplace_back();
        n.at = chunk.at;
        n.values = chunk.values;
        n.global.resize(distinct);
        for (std::size_t i = 0; i < distinct; ++i) {
            if (i + kAhead < distinct) table->Prefetch(chunk.distinctHashes[i + kAhead]);
            n.global[i] = table->Index(chunk.distinct.data() + 3 * i, chunk.distinctHashes[i]);
        }
        return true;
    };
    ZonCloudChunkedText::RunRecords<CornerChunk<float>>(_source, mapped, 84, records, kRecordSize, parse, stitch);
    ZonCloudWorkerPool::Run(numbered.size(), [&](std::size_t c) {
        std::uint32_t* number = triangles + numbered[c].at;
        const std::uint32_t* global = numbered[c].global.data();
        for (std::size_t i = 0; i < numbered[c].values; ++i, ++number) *number = global[*number];
        numbered[c] = {};
    });
    numbered = {};

    _triangleCount = static_cast<std::uint32_t>(records);
    _vertexCount = 3 * _triangleCount;
    const auto forget = [this] {
        _vertices = {};
        _triangles = {};
    };
    if (records == 0) {
        forget();
        Tool::Raise(Tool::Data, "ERR_NoPointFound");
    }
    const double extent[3] = {double(box.high[0]) - box.low[0], double(box.high[1]) - box.low[1],
                              double(box.high[2]) - box.low[2]};
    const bool plausible = !box.IsEmpty() && extent[0] + extent[1] + extent[2] > 1e-6 &&
                           extent[0] * extent[1] * extent[2] < 3.4028234663852886e+38;
    if (!plausible) {
        forget();
        Tool::Raise(Tool::Input, "ERR_UnknownData");
    }
    _boundingBox = box.Box();
    ShrinkIfLoose(_vertices);
    _distinctCount = _vertices.size() / 3;
    _premerged = true;
    _premergedInDouble = false;
}

const float* ZonCloudReadStl::FloatVertices()
{
    if (_meshInDouble && _vertices.size() != 3 * _distinctCount) {
        Allocating([this] { _vertices.assign(_verticesDouble.begin(), _verticesDouble.end()); });
    }
    return _vertices.data();
}

const double* ZonCloudReadStl::DoubleVertices()
{
    if (!_meshInDouble && _verticesDouble.size() != 3 * _distinctCount) {
        Allocating([this] { _verticesDouble.assign(_vertices.begin(), _vertices.end()); });
    }
    return _verticesDouble.data();
}

int ZonCloudReadStl::GetNumberOfPoints()
{
    LoadMesh();
    return _numberOfPoints;
}

const float* ZonCloudReadStl::GetPoints(unsigned& count)
{
    LoadMesh();
    count = DistinctCount();
    return FloatVertices();
}

const double* ZonCloudReadStl::GetPointsDouble(unsigned& count)
{
    LoadMesh();
    count = DistinctCount();
    return DoubleVertices();
}

// ---------------------------------------------------------------- polygon protocol

void ZonCloudReadStl::BeginGetPolygon()
{
    if (GetTypeOfDigitization() != DigitizationPolygons) Tool::Raise(Tool::Usage, "ERR_NotAPolygonDigit");
    if (_vertexCount == 0 || _triangleCount == 0) {
        CloseSource();
        Tool::Raise(Tool::Data, "ERR_NoPointFound");
    }
    _cursor.Begin(1);
}

bool ZonCloudReadStl::NextPolygon()
{
    if (!_cursor.HasNext()) return false;
    LoadMesh();
    _cursor.Advance();
    return true;
}

const float* ZonCloudReadStl::GetPolygonPoints(unsigned& count) { return GetPoints(count); }

const unsigned* ZonCloudReadStl::GetTriangles(unsigned& count)
{
    LoadMesh();
    count = static_cast<unsigned>(_triangles.size() / 3);
    return _triangles.data();
}

const unsigned* ZonCloudReadStl::NextTriangle()
{
    LoadMesh();
    return _cursor.NextTriangle(_triangles.data(), _triangles.size() / 3);
}

const unsigned* ZonCloudReadStl::NextTriangleInBox() { return _cursor.NextTriangleInBox(); }

const unsigned* ZonCloudReadStl::GetTrianglesInBox(const ZonMathBox& box, unsigned& count, const float*& vertices,
                                                   unsigned& vertexCount)
{
    LoadMesh();
    if (box.IsSameAs(_boundingBox))
        return ZonCloudSubMesh::Give(_cursor, count, vertices, vertexCount, FloatVertices(), DistinctCount(), _triangles.data(),
                                     _triangles.size() / 3);
    if (!_sub.IsFor(box)) {
        Allocating([&] {
            if (_meshInDouble)
                _sub.Compute(box, _boundingBox, _verticesDouble.data(), _distinctCount, _triangles.data(),
                             _triangles.size() / 3);
            else
                _sub.Compute(box, _boundingBox, _vertices.data(), _distinctCount, _triangles.data(),
                             _triangles.size() / 3);
        });
    }
    return _sub.Answer(_cursor, count, vertices, vertexCount);
}
