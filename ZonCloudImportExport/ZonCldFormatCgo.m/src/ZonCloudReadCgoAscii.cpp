#include "ZonCloudReadCgoAscii.h"

#include <algorithm>
#include <type_traits>

#include "DecimalPointGuard.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudSampler.h"
#include "ZonCloudScanFormat.h"

namespace {

// The format that scans a point in the precision of T.
template <class T>
const ZonCloudScanFormat& PointFormat()
{
    static const ZonCloudScanFormat format(std::is_same_v<T, double> ? "%lf%lf%lf" : "%f%f%f");
    return format;
}

}  // namespace

ZonCloudReadCgoAscii::ZonCloudReadCgoAscii(const ZonUnicodeString& fileName) : ZonCloudReadPointLines(fileName) {}

void ZonCloudReadCgoAscii::Discard()
{
    ZonCloudReadPointLines::Discard();
    _otherCount = 0;
    _otherRead = false;
}

bool ZonCloudReadCgoAscii::ScanLine(const char* first, const char* last, char decimalPoint, double xyz[3],
                                    unsigned char*)
{
    if (_loadedAsDouble) return Scan(PointFormat<double>(), first, last, decimalPoint, &xyz[0], &xyz[1], &xyz[2]) == 3;
    float single[3] = {0.0f, 0.0f, 0.0f};
    const int values = Scan(PointFormat<float>(), first, last, decimalPoint, &single[0], &single[1], &single[2]);
    std::copy(single, single + 3, xyz);
    return values == 3;
}

template <class T>
void ZonCloudReadCgoAscii::ReadAgain(std::vector<T>& points)
{
    points.clear();
    _otherCount = 0;
    _otherRead = false;
    Guarded([&] {
        ZonCloudByteSource& source = Source();
        DecimalPointGuard guard;
        if (IsDecimalPointSwapped()) guard.Switch();
        // The same lines sampled the same way give the points that were
        // loaded, in the other precision: as many, and none after the last.
        Reserve(points, 3 * _count);
        ZonCloudSampler sampler = ZonCloudSampler::InDouble(_samplingPercent);
        ZonCloudLineSource lines(LinePiece);
        lines.Start(source, static_cast<std::uint64_t>(_dataStart));
        const char* first = nullptr;
        const char* last = nullptr;
        while (_otherCount < _count && lines.Next(first, last)) {
            T xyz[3] = {};
            if (Scan(PointFormat<T>(), first, last, guard.DecimalPoint(), &xyz[0], &xyz[1], &xyz[2]) != 3) {
                if (IsEndOfCloud(first, last)) break;
                continue;
            }
            if (!sampler.Keep()) continue;
            points.insert(points.end(), xyz, xyz + 3);
            ++_otherCount;
        }
        CloseSource();
    });
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
