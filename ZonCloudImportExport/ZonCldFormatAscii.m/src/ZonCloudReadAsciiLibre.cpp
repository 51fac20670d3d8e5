#include "ZonCloudReadAsciiLibre.h"

#include <algorithm>
#include <cfloat>
#include <climits>
#include <cstring>
#include <new>
#include <type_traits>

#include "DecimalPointGuard.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"

namespace {

// Lines that are neither points nor delimiters: tolerated before the first
// point layout is found, and between points (in a row, and in all).
constexpr int kMaxUnknownInSearch = 100;
constexpr int kMaxUnknownInARow = 100;
constexpr int kMaxUnknownInAll = 300;

// Callers run inside Guarded, which turns a failed allocation into the memory error.
template <class T>
void Push(std::vector<T>& v, const double xyz[3])
{
    v.push_back(static_cast<T>(xyz[0]));
    v.push_back(static_cast<T>(xyz[1]));
    v.push_back(static_cast<T>(xyz[2]));
}

// A first guess of the points a percent keeps; scans keep their first points on top.
std::size_t FirstCapacity(std::size_t points, float step, bool scans)
{
    const auto guess = static_cast<std::size_t>(static_cast<double>(points) * step) + 1 +
                       (scans && step != 1.0f ? 500 : 0);
    return std::min(points, guess);
}

template <class T>
void Free(std::vector<T>& v)
{
    v.clear();
    v.shrink_to_fit();
}

// The line buffer is kept only while a pass reads; this gives it back however the pass ends.
class ReleasedAtEnd {
public:
    explicit ReleasedAtEnd(ZonCloudLineSource& lines) : _lines(lines) {}
    ~ReleasedAtEnd() { _lines.Release(); }
    ReleasedAtEnd(const ReleasedAtEnd&) = delete;
    ReleasedAtEnd& operator=(const ReleasedAtEnd&) = delete;

private:
    ZonCloudLineSource& _lines;
};

}  // namespace

ZonCloudReadAsciiLibre::ZonCloudReadAsciiLibre(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

ZonCloudReadAsciiLibre::~ZonCloudReadAsciiLibre() = default;

// ---------------------------------------------------------------------------
// Analysis

void ZonCloudReadAsciiLibre::ResetAnalysis()
{
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _format.Reset();
    _dataStart = 0;
    _delimitersFound = false;
    DropKeptPoints();
    _keeping = false;
    _keptAll = false;
    Free(_runStarts);
}

void ZonCloudReadAsciiLibre::AnalyseFile()
{
    ZonCloudByteSource& source = Source();
    // Nothing of an earlier pass (a scan walk before new delimiters) is reused.
    _lines.Release();
    const ReleasedAtEnd released(_lines);

    DecimalPointGuard guard;
    double low[3];
    double high[3];
    for (int attempt = 0;; ++attempt) {
        // A file that cannot be read one way is tried once with the other decimal point.
        auto retryOrRaise = [&](const char* code) {
            if (attempt == 0 && guard.Switch()) return;
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, code);
        };
        ResetAnalysis();
        _lines.Start(source, 0);
        const Pass search = SearchFormat(guard.DecimalPoint());
        if (search == Pass::TooManyUnknown) {
            retryOrRaise("ERR_UnknownDataOrDelimiter");
            continue;
        }
        if (search == Pass::EndOfFile) {
            retryOrRaise("ERR_UnknownData");
            continue;
        }
        const unsigned char* text = ZonCloudChunkedText::MapIfWorth(source, _dataStart);
        // Usually still in the buffer of the search: no second read.
        if (!text) _lines.Start(source, _dataStart);
        const Pass counted = text ? CountPointsInChunks(text, guard.DecimalPoint(), low, high)
                                  : CountPoints(guard.DecimalPoint(), low, high);
        if (counted == Pass::TooManyUnknown) {
            retryOrRaise("ERR_UnknownDataOrDelimiter");
            continue;
        }
        break;
    }

    if (_numberOfPoints > 0 && low[0] <= high[0] && low[1] <= high[1] && low[2] <= high[2])
        _boundingBox = ZonMathBox(low[0], high[0], low[1], high[1], low[2], high[2]);
    if (_boundingBox.IsEmpty()) {
        ResetAnalysis();
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    }
    _decimalPointSwitched = guard.IsSwitched();
    _decimalPoint = guard.DecimalPoint();
}

ZonCloudReadAsciiLibre::Pass ZonCloudReadAsciiLibre::SearchFormat(char decimalPoint)
{
    // A layout is accepted when the line after the one it came from reads
    // with it too; otherwise the search goes on from that next line.
    ZonCloudAsciiLineFormat::Labels labels;
    int unknown = 0;
    bool candidate = false;
    bool candidateReadsItself = false;
    std::uint64_t candidateOffset = 0;
    const char* first = nullptr;
    const char* last = nullptr;
    double xyz[3];
    while (_lines.Next(first, last)) {
        if (candidate) {
            if (_format.Parse(first, last, decimalPoint, xyz)) {
                _dataStart = candidateOffset;
                return Pass::Done;
            }
            candidate = false;
            _format.Reset();
        }
        if (ZonCloudAsciiLineFormat::AnalyseLine(first, last, decimalPoint, labels) == 1) {
            _format.Build(labels);
            candidate = true;
            candidateReadsItself = _format.Parse(first, last, decimalPoint, xyz);
            candidateOffset = _lines.LineOffset();
        } else if (++unknown > kMaxUnknownInSearch) {
            return Pass::TooManyUnknown;
        }
    }
    // A layout found on the very last line has no next line to confirm it;
    // it stands when it reads its own line (a file of one point).
    if (candidate && candidateReadsItself) {
        _dataStart = candidateOffset;
        return Pass::Done;
    }
    _format.Reset();
    return Pass::EndOfFile;
}

ZonCloudReadAsciiLibre::Pass ZonCloudReadAsciiLibre::CountPoints(char decimalPoint, double low[3], double high[3])
{
    for (int axis = 0; axis < 3; ++axis) {
        low[axis] = DBL_MAX;
        high[axis] = -DBL_MAX;
    }
    // The counted points are worth keeping only while they take no more room
    // than the file they came from (of unknown size: not at all).
    const std::int64_t fileSize = std::max<std::int64_t>(_source.Size(), 0);
    const std::size_t pointSize = 3 * (_doublePrecision ? sizeof(double) : sizeof(float));
    _keepLimit = fileSize > 0 ? static_cast<std::size_t>(fileSize) / pointSize : 0;
    _keeping = _keepLimit > 0;

    const bool withDelimiters = !_beginDelimiter.empty() || !_endDelimiter.empty();
    int unknownInARow = 0;
    int unknownInAll = 0;
    std::int64_t count = 0;
    const char* first = nullptr;
    const char* last = nullptr;
    double xyz[3];
    bool reserved = false;
    while (_lines.Next(first, last)) {
        if (_format.Parse(first, last, decimalPoint, xyz)) {
            if (count == INT_MAX) RaiseMemoryError();
            if (!reserved && _keeping) {
                // Lines of a file tend to be alike: the first one tells how many may follow.
                ReserveKept(static_cast<std::size_t>(last - first));
                reserved = true;
            }
            ++count;
            for (int axis = 0; axis < 3; ++axis) {
                if (xyz[axis] < low[axis]) low[axis] = xyz[axis];
                if (xyz[axis] > high[axis]) high[axis] = xyz[axis];
            }
            if (_keeping) KeepPoint(xyz);
            unknownInARow = 0;
            continue;
        }
        if (withDelimiters && IsDelimiterLine(first, last)) {
            _delimitersFound = true;
            KeepRunStart(count);
            continue;
        }
        if (++unknownInARow > kMaxUnknownInARow || ++unknownInAll > kMaxUnknownInAll) return Pass::TooManyUnknown;
    }
    _numberOfPoints = static_cast<int>(count);
    _keptAll = _keeping;
    return Pass::Done;
}

void ZonCloudReadAsciiLibre::ReserveKept(std::size_t lineLength)
{
    const std::int64_t fileSize = std::max<std::int64_t>(_source.Size(), 0);
    const std::size_t estimate =
        static_cast<std::size_t>(std::max<std::int64_t>(fileSize - static_cast<std::int64_t>(_dataStart), 0)) /
            std::max<std::size_t>(lineLength, 1) +
        16;
    const std::size_t points = std::min(estimate + estimate / 16, _keepLimit);
    try {
        if (_doublePrecision)
            _keptPointsDouble.reserve(3 * points);
        else
            _keptPoints.reserve(3 * points);
    } catch (const std::bad_alloc&) {
        DropKeptPoints();
    }
}

void ZonCloudReadAsciiLibre::KeepRunStart(std::int64_t next)
{
    const auto start = static_cast<std::uint32_t>(next);
    if (_keeping && (_runStarts.empty() || _runStarts.back() != start)) {
        try {
            _runStarts.push_back(start);
        } catch (const std::bad_alloc&) {
            DropKeptPoints();
        }
    }
}

namespace {

// What a worker makes of one chunk: its points in the precision kept, their
// box, and a mark for each other line (which follows `pointsBefore` points).
struct AsciiChunk {
    struct Mark {
        std::uint32_t pointsBefore;
        bool delimiter;
    };
    std::vector<float> points;
    std::vector<double> pointsDouble;
    std::vector<Mark> marks;
    std::uint32_t count = 0;
    std::uint64_t bytes = 0;
    double low[3] = {DBL_MAX, DBL_MAX, DBL_MAX};
    double high[3] = {-DBL_MAX, -DBL_MAX, -DBL_MAX};
};

}  // namespace

ZonCloudReadAsciiLibre::Pass ZonCloudReadAsciiLibre::CountPointsInChunks(const unsigned char* text,
                                                                         char decimalPoint, double low[3],
                                                                         double high[3])
{
    for (int axis = 0; axis < 3; ++axis) {
        low[axis] = DBL_MAX;
        high[axis] = -DBL_MAX;
    }
    const std::int64_t fileSize = std::max<std::int64_t>(_source.Size(), 0);
    const std::size_t pointSize = 3 * (_doublePrecision ? sizeof(double) : sizeof(float));
    _keepLimit = static_cast<std::size_t>(fileSize) / pointSize;
    _keeping = _keepLimit > 0;

    const bool withDelimiters = !_beginDelimiter.empty() || !_endDelimiter.empty();
    const bool inDouble = _doublePrecision;
    int unknownInARow = 0;
    int unknownInAll = 0;
    std::int64_t count = 0;
    bool reserved = false;
    Pass result = Pass::Done;

    const auto parse = [&](ZonCloudChunkLines& lines, AsciiChunk& chunk) {
        const char* first = nullptr;
        const char* last = nullptr;
        double xyz[3];
        std::uint32_t n = 0;
        while (lines.Next(first, last)) {
            if (_format.Parse(first, last, decimalPoint, xyz)) {
                for (int axis = 0; axis < 3; ++axis) {
                    if (xyz[axis] < chunk.low[axis]) chunk.low[axis] = xyz[axis];
                    if (xyz[axis] > chunk.high[axis]) chunk.high[axis] = xyz[axis];
                }
                if (inDouble)
                    chunk.pointsDouble.insert(chunk.pointsDouble.end(), xyz, xyz + 3);
                else
                    chunk.points.insert(chunk.points.end(), {static_cast<float>(xyz[0]), static_cast<float>(xyz[1]),
                                                             static_cast<float>(xyz[2])});
                ++n;
                continue;
            }
            chunk.marks.push_back({n, withDelimiters && IsDelimiterLine(first, last)});
        }
        chunk.count = n;
        chunk.bytes = lines.NextOffset();
    };

    const auto stitch = [&](AsciiChunk& chunk) {
        std::uint32_t taken = 0;
        // The points of the chunk before its next other line, as the line loop takes them one by one.
        const auto takePoints = [&](std::uint32_t upTo) {
            const std::uint32_t n = upTo - taken;
            if (n == 0) return;
            if (count + n > INT_MAX) RaiseMemoryError();
            if (!reserved && _keeping) {
                ReserveKept(static_cast<std::size_t>(chunk.bytes / std::max<std::uint32_t>(chunk.count, 1)));
                reserved = true;
            }
            if (_keeping)
                KeepPoints(inDouble ? nullptr : chunk.points.data() + 3 * std::size_t{taken},
                           inDouble ? chunk.pointsDouble.data() + 3 * std::size_t{taken} : nullptr, n);
            count += n;
            unknownInARow = 0;
            taken = upTo;
        };
        for (const AsciiChunk::Mark& mark : chunk.marks) {
            takePoints(mark.pointsBefore);
            if (mark.delimiter) {
                _delimitersFound = true;
                KeepRunStart(count);
                continue;
            }
            if (++unknownInARow > kMaxUnknownInARow || ++unknownInAll > kMaxUnknownInAll) {
                result = Pass::TooManyUnknown;
                return false;
            }
        }
        takePoints(chunk.count);
        // Strict comparisons in file order: the first of equal values stays, as in the line loop.
        for (int axis = 0; axis < 3; ++axis) {
            if (chunk.low[axis] < low[axis]) low[axis] = chunk.low[axis];
            if (chunk.high[axis] > high[axis]) high[axis] = chunk.high[axis];
        }
        return true;
    };

    ZonCloudChunkedText::Run<AsciiChunk>(_source, text, _dataStart, ZonCloudLineSource::FgetsPiece, parse, stitch);
    if (result != Pass::Done) return result;
    _numberOfPoints = static_cast<int>(count);
    _keptAll = _keeping;
    return Pass::Done;
}

void ZonCloudReadAsciiLibre::KeepPoints(const float* points, const double* pointsDouble, std::size_t count)
{
    const std::size_t kept = (_doublePrecision ? _keptPointsDouble.size() : _keptPoints.size()) / 3;
    if (kept + count > _keepLimit) {
        DropKeptPoints();
        return;
    }
    try {
        if (pointsDouble)
            _keptPointsDouble.insert(_keptPointsDouble.end(), pointsDouble, pointsDouble + 3 * count);
        else
            _keptPoints.insert(_keptPoints.end(), points, points + 3 * count);
    } catch (const std::bad_alloc&) {
        DropKeptPoints();
    }
}

void ZonCloudReadAsciiLibre::KeepPoint(const double xyz[3])
{
    const std::size_t kept = (_doublePrecision ? _keptPointsDouble.size() : _keptPoints.size()) / 3;
    if (kept >= _keepLimit) {
        DropKeptPoints();
        return;
    }
    try {
        if (_doublePrecision) {
            _keptPointsDouble.insert(_keptPointsDouble.end(), xyz, xyz + 3);
        } else {
            const float point[3] = {static_cast<float>(xyz[0]), static_cast<float>(xyz[1]),
                                    static_cast<float>(xyz[2])};
            _keptPoints.insert(_keptPoints.end(), point, point + 3);
        }
    } catch (const std::bad_alloc&) {
        // Keeping is only a shortcut: without it the points are read again.
        DropKeptPoints();
    }
}

void ZonCloudReadAsciiLibre::DropKeptPoints()
{
    _keeping = false;
    _keptAll = false;
    Free(_keptPoints);
    Free(_keptPointsDouble);
    Free(_runStarts);
}

bool ZonCloudReadAsciiLibre::StartsWithDelimiter(const char* first, const char* last,
                                                 const std::string& delimiter) const
{
    const auto length = delimiter.size();
    return length > 0 && static_cast<std::size_t>(last - first) >= length &&
           std::memcmp(first, delimiter.data(), length) == 0;
}

bool ZonCloudReadAsciiLibre::IsDelimiterLine(const char* first, const char* last) const
{
    return StartsWithDelimiter(first, last, _endDelimiter) || StartsWithDelimiter(first, last, _beginDelimiter);
}

// ---------------------------------------------------------------------------
// Options

void ZonCloudReadAsciiLibre::SetDelimiters(const ZonUnicodeString& begin, const ZonUnicodeString& end)
{
    if (begin.IsNull() && end.IsNull()) {
        if (_digitizationType == DigitizationScans) {
            FreePointArrays();
            FreeScanArrays();
            _scanIndex = -1;
        }
        _digitizationType = DigitizationCloud;
        return;
    }
    if (begin.ToUtf8() != _beginDelimiter || end.ToUtf8() != _endDelimiter) {
        FreePointArrays();
        FreeScanArrays();
        _scanIndex = -1;
        // Delimiter lines are not unknown lines: what the analysis counted
        // depends on them, so new delimiters mean a new analysis.
        if (_analysed) {
            Reanalyse();
            ResetAnalysis();
        }
    }
    _beginDelimiter = begin.ToUtf8();
    _endDelimiter = end.ToUtf8();
    Analyse();
    const int type = _delimitersFound ? DigitizationScans : DigitizationCloud;
    if (type != _digitizationType) {
        FreePointArrays();
        FreeScanArrays();
        _scanIndex = -1;
        _digitizationType = type;
    }
}

void ZonCloudReadAsciiLibre::GetDelimiters(ZonUnicodeString& begin, ZonUnicodeString& end)
{
    if (_digitizationType == DigitizationScans) {
        begin = ZonUnicodeString(_beginDelimiter);
        end = ZonUnicodeString(_endDelimiter);
    } else {
        begin.Reset();
        end.Reset();
    }
}

void ZonCloudReadAsciiLibre::SetSamplingPercent(float percent)
{
    const bool changed = percent != _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (changed) FreePointArrays();
}

// ---------------------------------------------------------------------------
// The whole cloud

void ZonCloudReadAsciiLibre::FreePointArrays()
{
    Free(_points);
    Free(_pointsDouble);
    _deliveredPoints = nullptr;
    _deliveredPointsDouble = nullptr;
    _deliveredCount = 0;
    _deliveredCountDouble = 0;
}

const float* ZonCloudReadAsciiLibre::GetPoints(unsigned& count)
{
    return DeliverPoints(count, _points, _deliveredPoints, _deliveredCount);
}

const double* ZonCloudReadAsciiLibre::GetPointsDouble(unsigned& count)
{
    return DeliverPoints(count, _pointsDouble, _deliveredPointsDouble, _deliveredCountDouble);
}

template <class T>
const T* ZonCloudReadAsciiLibre::DeliverPoints(unsigned& count, std::vector<T>& store, const T*& delivered,
                                               unsigned& deliveredCount)
{
    Analyse();
    if (_numberOfPoints <= 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    if (!delivered) {
        Guarded([&] {
            if (!SampleKeptPoints(store, delivered, deliveredCount)) {
                ReadPoints(store);
                delivered = store.data();
                deliveredCount = static_cast<unsigned>(store.size() / 3);
            }
        });
    }
    count = deliveredCount;
    return delivered;
}

template <class T>
bool ZonCloudReadAsciiLibre::SampleKeptPoints(std::vector<T>& store, const T*& delivered, unsigned& deliveredCount)
{
    if (!_keptAll) return false;
    // Double points cannot be had back from floats.
    constexpr bool wantsDouble = std::is_same_v<T, double>;
    if (wantsDouble && _keptPointsDouble.empty()) return false;
    const bool fromDouble = !_keptPointsDouble.empty();
    const std::size_t n = static_cast<std::size_t>(_numberOfPoints);
    const float* keptFloat = _keptPoints.data();
    const double* keptDouble = _keptPointsDouble.data();

    if (_samplingPercent == 100.0f && fromDouble == wantsDouble) {
        if constexpr (wantsDouble)
            delivered = keptDouble;
        else
            delivered = keptFloat;
        deliveredCount = static_cast<unsigned>(n);
        return true;
    }

    ZonCloudSampler sampler(_samplingPercent);
    sampler.Restart();
    const bool scans = _digitizationType == DigitizationScans;
    store.clear();
    Reserve(store, 3 * FirstCapacity(n, sampler.Step(), scans));
    std::size_t run = 0;
    for (std::size_t i = 0; i < n; ++i) {
        if (scans) {
            bool restart = false;
            while (run < _runStarts.size() && _runStarts[run] == i) {
                restart = true;
                ++run;
            }
            if (restart) sampler.Restart();
        }
        if (!sampler.Keep()) continue;
        double xyz[3];
        for (int axis = 0; axis < 3; ++axis)
            xyz[axis] = fromDouble ? keptDouble[3 * i + axis] : static_cast<double>(keptFloat[3 * i + axis]);
        Push(store, xyz);
    }
    delivered = store.data();
    deliveredCount = static_cast<unsigned>(store.size() / 3);
    return true;
}

template <class T>
void ZonCloudReadAsciiLibre::ReadPoints(std::vector<T>& store)
{
    const std::size_t n = static_cast<std::size_t>(_numberOfPoints);
    const bool scans = _digitizationType == DigitizationScans;
    ZonCloudSampler sampler(_samplingPercent);
    sampler.Restart();
    store.clear();
    Reserve(store, 3 * FirstCapacity(n, sampler.Step(), scans));

    const ReleasedAtEnd released(_lines);
    _lines.Start(Source(), _dataStart);
    const char* first = nullptr;
    const char* last = nullptr;
    double xyz[3];
    while (store.size() / 3 < n && _lines.Next(first, last)) {
        if (_format.Parse(first, last, _decimalPoint, xyz)) {
            if (sampler.Keep()) Push(store, xyz);
        } else if (scans && IsDelimiterLine(first, last)) {
            sampler.Restart();
        }
    }
}

// ---------------------------------------------------------------------------
// Scans

void ZonCloudReadAsciiLibre::FreeScanArrays()
{
    Free(_scanPoints);
    Free(_scanPointsDouble);
    _scanHasFloats = false;
}

void ZonCloudReadAsciiLibre::RequireScans()
{
    if (_digitizationType != DigitizationScans)
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NotAScanDigit");
}

void ZonCloudReadAsciiLibre::BeginGetSetOfScans()
{
    RequireScans();
    Analyse();
    if (_numberOfPoints <= 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    _setBegun = true;
    _setDelivered = false;
    _scanBegun = false;
    _scanIndex = -1;
}

bool ZonCloudReadAsciiLibre::NextSetOfScans()
{
    if (!_setBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_BeginGetSetOfScansNotDone");
    if (!_setDelivered) {
        _setDelivered = true;
        return true;
    }
    _setBegun = false;
    _scanBegun = false;
    return false;
}

void ZonCloudReadAsciiLibre::BeginGetScan()
{
    if (!_setBegun || !_setDelivered)
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextSetOfScansNotDone");
    FreeScanArrays();
    Guarded([this] { _lines.Start(Source(), _dataStart); });
    _scanOffset = _dataStart;
    _scanIndex = 0;
    _scanBegun = true;
}

bool ZonCloudReadAsciiLibre::NextScan()
{
    RequireScans();
    if (!_scanBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetScanNotDone");
    FreeScanArrays();
    if (_scanIndex < 0) return false;
    Guarded([this] { ReadScan(); });
    return true;
}

void ZonCloudReadAsciiLibre::StartLines(std::uint64_t offset)
{
    // Go on from where the previous read ended, unless another read moved
    // away or a failure closed the source.
    const bool open = _source.IsOpen();
    ZonCloudByteSource& source = Source();
    if (!open || !_lines.IsAt(&source, offset)) _lines.Start(source, offset);
}

void ZonCloudReadAsciiLibre::ReadScan()
{
    StartLines(_scanOffset);
    ZonCloudSampler sampler(_samplingPercent);
    sampler.Restart();
    const std::size_t limit = static_cast<std::size_t>(_numberOfPoints);
    const bool endIsBegin = _beginDelimiter.empty() || _beginDelimiter == _endDelimiter;
    bool open = true;
    bool complete = false;
    const char* first = nullptr;
    const char* last = nullptr;
    double xyz[3];
    while (!complete && _lines.Next(first, last)) {
        if (open) {
            if (_format.Parse(first, last, _decimalPoint, xyz)) {
                if (sampler.Keep() && _scanPointsDouble.size() / 3 < limit) Push(_scanPointsDouble, xyz);
            } else if (StartsWithDelimiter(first, last, _endDelimiter)) {
                complete = endIsBegin;
                open = false;
            } else if (_endDelimiter.empty() && StartsWithDelimiter(first, last, _beginDelimiter) &&
                       !_scanPointsDouble.empty()) {
                // Without an end text nothing else could close a scan, so a
                // begin line after points starts the next one. With an end
                // text, only the end line closes the scan.
                complete = true;
            }
        } else if (StartsWithDelimiter(first, last, _beginDelimiter)) {
            complete = true;
        }
    }
    if (complete) {
        // The file stays at the first line of the next scan.
        _scanOffset = _lines.NextOffset();
        ++_scanIndex;
    } else {
        _scanIndex = -1;
        _lines.Release();
        if (_scanPointsDouble.empty()) FreeScanArrays();
    }
}

const double* ZonCloudReadAsciiLibre::GetScanPointsDouble(unsigned& count)
{
    RequireScans();
    if (!_scanBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetScanNotDone");
    count = static_cast<unsigned>(_scanPointsDouble.size() / 3);
    return count > 0 ? _scanPointsDouble.data() : nullptr;
}

const float* ZonCloudReadAsciiLibre::GetScanPoints(unsigned& count)
{
    RequireScans();
    if (!_scanBegun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetScanNotDone");
    count = static_cast<unsigned>(_scanPointsDouble.size() / 3);
    if (count == 0) return nullptr;
    if (!_scanHasFloats) {
        Reserve(_scanPoints, _scanPointsDouble.size());
        _scanPoints.assign(_scanPointsDouble.begin(), _scanPointsDouble.end());
        _scanHasFloats = true;
    }
    return _scanPoints.data();
}
