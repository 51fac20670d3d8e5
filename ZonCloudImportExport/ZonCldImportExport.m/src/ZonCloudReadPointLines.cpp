#include "ZonCloudReadPointLines.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>

#include "DecimalPointGuard.h"
#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudReadTextTool.h"
#include "ZonCloudScanFormat.h"

namespace {

constexpr int SampleLines = 20;
constexpr std::uint64_t GrowthStep = 8192;
// Unknown lines in a row after which the other decimal point is tried.
constexpr int UnknownLinesBeforeSwap = 201;
// A point line holds three numbers, so at least five characters ("1-2-3"):
// no file holds more points than a fifth of its size. Small files get a
// little room beyond that, so that a count line is honoured as written.
constexpr std::uint64_t MinimumRoom = 4096;

}  // namespace

ZonCloudReadPointLines::ZonCloudReadPointLines(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
}

void ZonCloudReadPointLines::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) Discard();
}

void ZonCloudReadPointLines::Discard()
{
    ZonCloudReadTextTool::Free(_points, _pointsDouble, _colors);
    _count = 0;
    _capacity = 0;
    _pointLines = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _analysed = false;
    ClearBoxCaches();
}

void ZonCloudReadPointLines::AnalyseFile()
{
    Load(_doublePrecision);
}

void ZonCloudReadPointLines::Reserve(std::uint64_t capacity)
{
    capacity = std::min(capacity, _mostPoints);
    if (capacity <= _capacity) capacity = _capacity + 1;
    if (_loadedAsDouble)
        ZonCloudReadTextTool::Reserve(_pointsDouble, 3 * capacity);
    else
        ZonCloudReadTextTool::Reserve(_points, 3 * capacity);
    if (_keepColors) ZonCloudReadTextTool::Reserve(_colors, 3 * capacity);
    _capacity = capacity;
}

void ZonCloudReadPointLines::Load(bool asDouble)
{
    Discard();
    _loadedAsDouble = asDouble;
    _decimalSwapped = false;
    OpenFile();
    ZonCloudReadTextTool::FileCloser closer{_file};
    std::setvbuf(_file, nullptr, _IOFBF, 1 << 20);

    DecimalPointGuard guard;
    const double ratio = static_cast<float>(_samplingPercent / 100.0f);

    const std::uint64_t size = ZonCloudReadTextTool::FileSize(_file);
    RewindFile();
    _mostPoints = std::max<std::uint64_t>(size / 5 + 1, MinimumRoom);
    // The estimate: the file size over the average length of the first lines.
    const std::uint64_t average = ZonCloudReadTextTool::AverageLineLength(_file, SampleLines, LineSize);
    _estimate = average > 0 ? size / average : 0;
    RewindFile();

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

bool ZonCloudReadPointLines::ReadPass(char decimalPoint, double ratio)
{
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
        double xyz[3] = {0.0, 0.0, 0.0};
        unsigned char rgb[3] = {255, 255, 255};
        if (!ScanLine(line, decimalPoint, xyz, rgb)) {
            if (_pointLines == 0) _dataStart = ZonCloudReadTextTool::LineEnd(_file);
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
        if (_keepColors) _colors.insert(_colors.end(), rgb, rgb + 3);
        ++_count;
    }
    if (std::ferror(_file)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    if (_pointLines > 0) _boundingBox = box;
    return true;
}
