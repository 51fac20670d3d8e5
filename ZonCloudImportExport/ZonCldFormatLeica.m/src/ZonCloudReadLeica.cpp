#include "ZonCloudReadLeica.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <limits>
#include <new>
#include <stdexcept>

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

unsigned char ColorByte(int value) { return static_cast<unsigned char>(std::clamp(value, 0, 255)); }

template <class Close>
struct ScopeExit {
    Close close;
    ~ScopeExit() { close(); }
};
template <class Close>
ScopeExit(Close) -> ScopeExit<Close>;

}  // namespace

ZonCloudReadLeica::ZonCloudReadLeica(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

void ZonCloudReadLeica::SetKeepColors(bool keep)
{
    if (keep == _keepColors) return;
    _keepColors = keep;
    Discard();
}

void ZonCloudReadLeica::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) Discard();
}

void ZonCloudReadLeica::Discard()
{
    _points.clear();
    _points.shrink_to_fit();
    _pointsDouble.clear();
    _pointsDouble.shrink_to_fit();
    _colors.clear();
    _colors.shrink_to_fit();
    _count = 0;
    _capacity = 0;
    _pointLines = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _analysed = false;
    ClearBoxCaches();
}

void ZonCloudReadLeica::Analyse()
{
    if (_analysed) return;
    Load(_doublePrecision);
}

void ZonCloudReadLeica::Reserve(std::uint64_t capacity)
{
    capacity = std::min(capacity, _mostPoints);
    if (capacity <= _capacity) capacity = _capacity + 1;
    if (_loadedAsDouble)
        ReserveOrThrow(_pointsDouble, 3 * capacity);
    else
        ReserveOrThrow(_points, 3 * capacity);
    if (_keepColors) ReserveOrThrow(_colors, 3 * capacity);
    _capacity = capacity;
}

void ZonCloudReadLeica::Load(bool asDouble)
{
    Discard();
    _loadedAsDouble = asDouble;
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

bool ZonCloudReadLeica::ReadPass(char decimalPoint, double ratio)
{
    static const ZonCloudScanFormat singleFormat("%f%f%f%d%d%d%d");
    static const ZonCloudScanFormat doubleFormat("%lf%lf%lf%d%d%d%d");
    static const ZonCloudScanFormat countFormat("%d");

    _points.clear();
    _pointsDouble.clear();
    _colors.clear();
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
        double x = 0.0, y = 0.0, z = 0.0;
        int c[4] = {-1, -1, -1, -1};
        int values;
        if (_loadedAsDouble) {
            values = doubleFormat(line, decimalPoint, &x, &y, &z, &c[0], &c[1], &c[2], &c[3]);
        } else {
            float fx = 0.0f, fy = 0.0f, fz = 0.0f;
            values = singleFormat(line, decimalPoint, &fx, &fy, &fz, &c[0], &c[1], &c[2], &c[3]);
            x = fx;
            y = fy;
            z = fz;
        }

        if (values < 3) {
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
            if (std::strstr(line, "**end cloud**")) break;
            if (++unknownInRow == UnknownLinesBeforeSwap) return false;
            continue;
        }

        unknownInRow = 0;
        ++_pointLines;
        box.AddPoint(x, y, z);
        const double whole = std::trunc(static_cast<double>(_pointLines - 1) * ratio);
        if (whole == previousWhole) continue;
        previousWhole = whole;

        if (_count >= std::numeric_limits<unsigned>::max()) ZonCloudOperErrorTool::ThrowInsufficientMemory();
        if (_count == _capacity) Reserve(_capacity == 0 && _estimate != 0 ? _estimate : _capacity + GrowthStep);
        if (_loadedAsDouble) {
            _pointsDouble.insert(_pointsDouble.end(), {x, y, z});
        } else {
            _points.insert(_points.end(), {static_cast<float>(x), static_cast<float>(y), static_cast<float>(z)});
        }
        if (_keepColors) {
            // The colour is the last three integers when they are a colour;
            // six values may be x y z R G B; anything else is white.
            int r = 255, g = 255, b = 255;
            if (values >= 6) {
                if (c[1] <= 255 && c[2] <= 255 && static_cast<unsigned>(c[3]) < 256u) {
                    r = c[1];
                    g = c[2];
                    b = c[3];
                } else if (values == 6 && c[3] == -1 && static_cast<unsigned>(c[0]) < 256u) {
                    r = c[0];
                    g = c[1];
                    b = c[2];
                }
            }
            _colors.insert(_colors.end(), {ColorByte(r), ColorByte(g), ColorByte(b)});
        }
        ++_count;
    }
    if (std::ferror(_file)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    if (_pointLines > 0) _boundingBox = box;
    return true;
}

const float* ZonCloudReadLeica::GetPoints(unsigned& count)
{
    count = 0;
    if (!_analysed || _loadedAsDouble) Load(false);
    count = static_cast<unsigned>(_count);
    return _points.data();
}

const double* ZonCloudReadLeica::GetPointsDouble(unsigned& count)
{
    count = 0;
    if (!_analysed || !_loadedAsDouble) Load(true);
    count = static_cast<unsigned>(_count);
    return _pointsDouble.data();
}

const unsigned char* ZonCloudReadLeica::GetPointColors(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_keepColors) return nullptr;
    count = static_cast<unsigned>(_count);
    return _colors.data();
}
