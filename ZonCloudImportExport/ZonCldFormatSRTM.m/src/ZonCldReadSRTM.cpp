#include "ZonCldReadSRTM.h"

#include <cmath>
#include <limits>

namespace {
constexpr std::int16_t kVoid = -32768;
constexpr std::size_t kBlock = std::size_t(1) << 20;  // bytes read at a time, even
}  // namespace

ZonCldReadSRTM::ZonCldReadSRTM(const ZonUnicodeString& fileName) : ZonCloudReadGridMesh(fileName) {}

ZonICkeUnit_var ZonCldReadSRTM::GetLengthUnit() { return ZonICkeUnit::FromName("m"); }

unsigned ZonCldReadSRTM::GetRowLength()
{
    Analyse();
    return _side;
}

void ZonCldReadSRTM::AnalyseFile()
{
    ZonCloudByteSource& source = Source();
    const std::int64_t size = source.Size();
    // The size is all the file says; a pipe has none.
    const std::uint64_t count = size > 0 ? static_cast<std::uint64_t>(size) / 2 : 0;
    ReservePoints(count);
    _side = static_cast<std::uint32_t>(std::sqrt(static_cast<double>(count)));
    // The root of a double may land one off for large counts.
    while (static_cast<std::uint64_t>(_side) * _side > count) --_side;
    while (static_cast<std::uint64_t>(_side + 1) * (_side + 1) <= count) ++_side;

    _points.resize(3 * count);
    Resize(_valid, count);
    std::vector<unsigned char> buffer(static_cast<std::size_t>(std::min<std::uint64_t>(kBlock, 2 * count)));
    source.Seek(0);
    std::size_t done = 0;
    while (done < count) {
        const std::size_t samples = std::min<std::size_t>(buffer.size() / 2, count - done);
        source.Read(buffer.data(), 2 * samples);
        float* z = _points.data() + 3 * done + 2;
        unsigned char* valid = _valid.data() + done;
        for (std::size_t i = 0; i < samples; ++i, z += 3) {
            const auto value = ZonCloudByteSource::LoadBig<std::int16_t>(buffer.data() + 2 * i);
            *z = value;
            valid[i] = value != kVoid;
        }
        done += samples;
    }
    Place(_points.data(), count);
    BuildGridTriangles(_side, _side, count);
    FinishPoints();
}

// x and y of every sample from its index; z is already in place.
template <class T>
void ZonCldReadSRTM::Place(T* points, std::size_t count) const
{
    // A one-sample row spans nothing: the step is left at 1 rather than made infinite.
    const double step = _side > 1 ? 1.0 / (_side - 1) : 1.0;
    const std::size_t side = _side ? _side : 1;
    std::size_t k = 0;
    for (std::size_t r = 0; k < count; ++r) {
        // Rows past the last whole one go on southwards.
        const T y = static_cast<T>((static_cast<double>(side) - 1 - static_cast<double>(r)) * step);
        for (std::size_t c = 0; c < side && k < count; ++c, ++k) {
            points[3 * k] = static_cast<T>(static_cast<double>(c) * step);
            points[3 * k + 1] = y;
        }
    }
}

void ZonCldReadSRTM::ComputeDoublePoints(std::vector<double>& points)
{
    const std::size_t count = _points.size() / 3;
    points.resize(3 * count);
    for (std::size_t k = 0; k < count; ++k) points[3 * k + 2] = _points[3 * k + 2];
    Place(points.data(), count);
}
