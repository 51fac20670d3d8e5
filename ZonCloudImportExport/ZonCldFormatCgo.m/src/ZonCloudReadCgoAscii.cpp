#include "ZonCloudReadCgoAscii.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <type_traits>

#include "DecimalPointGuard.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudReadTextTool.h"
#include "ZonCloudScanFormat.h"

namespace {

// Scans a line in the precision of T; the number of values converted.
template <class T>
int ScanPoint(const char* line, char decimalPoint, T xyz[3])
{
    static const ZonCloudScanFormat format(std::is_same_v<T, double> ? "%lf%lf%lf" : "%f%f%f");
    return format(line, decimalPoint, &xyz[0], &xyz[1], &xyz[2]);
}

}  // namespace

ZonCloudReadCgoAscii::ZonCloudReadCgoAscii(const ZonUnicodeString& fileName) : ZonCloudReadPointLines(fileName) {}

void ZonCloudReadCgoAscii::Discard()
{
    ZonCloudReadPointLines::Discard();
    _otherCount = 0;
    _otherRead = false;
}

bool ZonCloudReadCgoAscii::ScanLine(const char* line, char decimalPoint, double xyz[3], unsigned char*)
{
    if (_loadedAsDouble) return ScanPoint(line, decimalPoint, xyz) == 3;
    float single[3] = {0.0f, 0.0f, 0.0f};
    const int values = ScanPoint(line, decimalPoint, single);
    std::copy(single, single + 3, xyz);
    return values == 3;
}

template <class T>
void ZonCloudReadCgoAscii::ReadAgain(std::vector<T>& points)
{
    points.clear();
    _otherCount = 0;
    _otherRead = false;
    OpenFile();
    ZonCloudReadTextTool::FileCloser closer{_file};
    std::setvbuf(_file, nullptr, _IOFBF, 1 << 20);
    errno = 0;
    if (std::fseek(_file, _dataStart, SEEK_SET) != 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);

    DecimalPointGuard guard;
    if (IsDecimalPointSwapped()) guard.Switch();
    const double ratio = static_cast<float>(_samplingPercent / 100.0f);
    const auto lines = static_cast<std::uint64_t>(_pointLines);
    const std::uint64_t room = std::min(static_cast<std::uint64_t>(std::trunc(static_cast<double>(lines) * ratio)) + 1, lines);
    ZonCloudReadTextTool::Reserve(points, 3 * room);

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
