#include "ZonCloudReadCgoAscii.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <limits>
#include <new>
#include <stdexcept>
#include <type_traits>

#include "DecimalPointGuard.h"
#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"

namespace {

constexpr int LineSize = 512;  // lines of at most 511 characters
constexpr int SampleLines = 20;
constexpr std::uint64_t GrowthStep = 8192;
// Unknown lines in a row after which the other decimal point is tried.
constexpr int UnknownLinesBeforeSwap = 201;
// A point line holds three numbers, so at least five characters ("1-2-3"):
// no file holds more points than a fifth of its size. Small files get a
// little room beyond that, so that a count line is honoured as written.
constexpr std::uint64_t MinimumRoom = 4096;
constexpr const char* EndOfCloud = "**end cloud**";

template <class T>
void ReserveOrThrow(std::vector<T>& v, std::uint64_t n)
{
    try {
        if (n > v.max_size()) ZonCloudOperErrorTool::ThrowInsufficientMemory();
        v.reserve(static_cast<std::size_t>(n));
    } catch (const std::bad_alloc&) {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    } catch (const std::length_error&) {
        ZonCloudOperErrorTool::ThrowInsufficientMemory();
    }
}

const ZonCloudScanFormat& SingleFormat()
{
    static const ZonCloudScanFormat format("%f%f%f");
    return format;
}

const ZonCloudScanFormat& DoubleFormat()
{
    static const ZonCloudScanFormat format("%lf%lf%lf");
    return format;
}

// Scans a line in the precision of T; the number of values converted.
template <class T>
int ScanPoint(const char* line, char decimalPoint, T xyz[3])
{
    if constexpr (std::is_same_v<T, double>)
        return DoubleFormat()(line, decimalPoint, &xyz[0], &xyz[1], &xyz[2]);
    else
        return SingleFormat()(line, decimalPoint, &xyz[0], &xyz[1], &xyz[2]);
}

template <class Close>
struct ScopeExit {
    Close close;
    ~ScopeExit() { close(); }
};
template <class Close>
ScopeExit(Close) -> ScopeExit<Close>;

}  // namespace

ZonCloudReadCgoAscii::ZonCloudReadCgoAscii(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

void ZonCloudReadCgoAscii::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) Discard();
}

void ZonCloudReadCgoAscii::Discard()
{
    _points.clear();
    _points.shrink_to_fit();
    _pointsDouble.clear();
    _pointsDouble.shrink_to_fit();
    _count = 0;
    _otherCount = 0;
    _otherRead = false;
    _capacity = 0;
    _pointLines = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _analysed = false;
    ClearBoxCaches();
}

void ZonCloudReadCgoAscii::Analyse()
{
    if (_analysed) return;
    Load();
}

void ZonCloudReadCgoAscii::Reserve(std::uint64_t capacity)
{
    capacity = std::min(capacity, _mostPoints);
    if (capacity <= _capacity) capacity = _capacity + 1;
    if (_loadedAsDouble)
        ReserveOrThrow(_pointsDouble, 3 * capacity);
    else
        ReserveOrThrow(_points, 3 * capacity);
    _capacity = capacity;
}

void ZonCloudReadCgoAscii::Load()
{
    Discard();
    _loadedAsDouble = _doublePrecision;
    _decimalSwapped = false;
    OpenFile();
    ScopeExit closer{[this] { CloseFile(); }};
    std::setvbuf(_file, nullptr, _IOFBF, 1 << 20);

    DecimalPointGuard guard;
    const double ratio = static_cast<float>(_samplingPercent / 100.0f);

    errno = 0;
    if (std::fseek(_file, 0, SEEK_END) != 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    const long size = std::ftell(_file);
    if (size < 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    RewindFile();
    _mostPoints = std::max<std::uint64_t>(static_cast<std::uint64_t>(size) / 5 + 1, MinimumRoom);

    // The estimate: the file size over the average length of the first lines.
    {
        char line[LineSize];
        std::uint64_t lines = 0;
        long offset = 0;
        while (lines < SampleLines && std::fgets(line, sizeof line, _file)) {
            ++lines;
            offset = std::ftell(_file);
        }
        const std::uint64_t average = lines > 0 && offset > 0 ? static_cast<std::uint64_t>(offset) / lines : 0;
        _estimate = average > 0 ? static_cast<std::uint64_t>(size) / average : 0;
        std::clearerr(_file);
        RewindFile();
    }

    while (!ReadPass(guard.DecimalPoint(), ratio)) {
        // Too many lines not understood: once, try the other decimal point.
        if (_decimalSwapped || !guard.Switch()) {
            CloseFile();
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_TooManyUnknownData");
        }
        _decimalSwapped = true;
        std::clearerr(_file);
        RewindFile();
    }

    if (_pointLines == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    _numberOfPoints = static_cast<int>(std::min<std::int64_t>(_pointLines, std::numeric_limits<int>::max()));
    _analysed = true;
}

bool ZonCloudReadCgoAscii::ReadPass(char decimalPoint, double ratio)
{
    static const ZonCloudScanFormat countFormat("%d");

    _points.clear();
    _pointsDouble.clear();
    _count = 0;
    _capacity = 0;
    _pointLines = 0;
    _dataStart = 0;
    ZonMathBox box;
    double previousWhole = 1.0;
    int unknownInRow = 0;
    bool firstLine = true;

    char line[LineSize];
    while (std::fgets(line, sizeof line, _file)) {
        const bool isFirstLine = firstLine;
        firstLine = false;
        double xyz[3] = {0.0, 0.0, 0.0};
        int values;
        if (_loadedAsDouble) {
            values = ScanPoint(line, decimalPoint, xyz);
        } else {
            float single[3] = {0.0f, 0.0f, 0.0f};
            values = ScanPoint(line, decimalPoint, single);
            std::copy(single, single + 3, xyz);
        }

        if (values != 3) {
            if (_pointLines == 0) {
                _dataStart = std::ftell(_file);
                if (_dataStart < 0) {
                    _dataStart = 0;
                    std::clearerr(_file);
                }
            }
            int announced = 0;
            if (isFirstLine && countFormat(line, decimalPoint, &announced) == 1 && announced >= 1) {
                Reserve(static_cast<std::uint64_t>(announced));
                continue;
            }
            if (std::strstr(line, EndOfCloud)) break;
            if (++unknownInRow == UnknownLinesBeforeSwap) return false;
            continue;
        }

        unknownInRow = 0;
        ++_pointLines;
        box.AddPoint(xyz[0], xyz[1], xyz[2]);
        const double whole = std::trunc(static_cast<double>(_pointLines - 1) * ratio);
        if (whole == previousWhole) continue;
        previousWhole = whole;

        if (_count >= std::numeric_limits<unsigned>::max()) ZonCloudOperErrorTool::ThrowInsufficientMemory();
        if (_count == _capacity) Reserve(_capacity == 0 && _estimate != 0 ? _estimate : _capacity + GrowthStep);
        if (_loadedAsDouble)
            _pointsDouble.insert(_pointsDouble.end(), xyz, xyz + 3);
        else
            _points.insert(_points.end(), {static_cast<float>(xyz[0]), static_cast<float>(xyz[1]),
                                           static_cast<float>(xyz[2])});
        ++_count;
    }
    if (std::ferror(_file)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    if (_pointLines > 0) _boundingBox = box;
    return true;
}

template <class T>
void ZonCloudReadCgoAscii::ReadAgain(std::vector<T>& points)
{
    points.clear();
    _otherCount = 0;
    _otherRead = false;
    OpenFile();
    ScopeExit closer{[this] { CloseFile(); }};
    std::setvbuf(_file, nullptr, _IOFBF, 1 << 20);
    errno = 0;
    if (std::fseek(_file, _dataStart, SEEK_SET) != 0) {
        points.clear();
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    }

    DecimalPointGuard guard;
    if (_decimalSwapped) guard.Switch();
    const double ratio = static_cast<float>(_samplingPercent / 100.0f);
    const auto lines = static_cast<std::uint64_t>(_pointLines);
    const std::uint64_t room = std::min(static_cast<std::uint64_t>(std::trunc(static_cast<double>(lines) * ratio)) + 1, lines);
    ReserveOrThrow(points, 3 * room);

    std::uint64_t index = 0;
    double previousWhole = 1.0;
    char line[LineSize];
    while (_otherCount < room && std::fgets(line, sizeof line, _file)) {
        T xyz[3] = {};
        if (ScanPoint(line, guard.DecimalPoint(), xyz) != 3) {
            if (std::strstr(line, EndOfCloud)) break;
            continue;
        }
        const double whole = std::trunc(static_cast<double>(index++) * ratio);
        if (whole == previousWhole) continue;
        previousWhole = whole;
        points.insert(points.end(), xyz, xyz + 3);
        ++_otherCount;
    }
    if (std::ferror(_file)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    _otherRead = true;
}

const float* ZonCloudReadCgoAscii::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (_loadedAsDouble) {
        if (!_otherRead) ReadAgain(_points);
        count = static_cast<unsigned>(_otherCount);
    } else {
        count = static_cast<unsigned>(_count);
    }
    return _points.data();
}

const double* ZonCloudReadCgoAscii::GetPointsDouble(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_loadedAsDouble) {
        if (!_otherRead) ReadAgain(_pointsDouble);
        count = static_cast<unsigned>(_otherCount);
    } else {
        count = static_cast<unsigned>(_count);
    }
    return _pointsDouble.data();
}
