#include "ZonCldReadSRTM.h"

#include <algorithm>
#include <cmath>
#include <limits>

#include "ZonCloudWorkerPool.h"

namespace {
constexpr std::int16_t kVoid = -32768;
constexpr std::size_t kBlock = std::size_t(1) << 18;  // samples placed at a time
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

    Resize(_points, 3 * count);
    Resize(_valid, count);
    // The whole file at once (it is small beside the points), then blocks of
    // samples on the workers.
    std::vector<unsigned char> bytes;
    Resize(bytes, 2 * count);
    source.Seek(0);
    source.Read(bytes.data(), bytes.size());
    ZonCloudWorkerPool::Run((count + kBlock - 1) / kBlock, [&](std::size_t block) {
        const std::size_t from = block * kBlock, to = std::min<std::size_t>(count, from + kBlock);
        float* z = _points.data() + 3 * from + 2;
        for (std::size_t i = from; i < to; ++i, z += 3) {
            const auto value = ZonCloudByteSource::LoadBig<std::int16_t>(bytes.data() + 2 * i);
            *z = value;
            _valid[i] = value != kVoid;
        }
        Place(_points.data(), from, to);
    });
    std::vector<unsigned char>().swap(bytes);
    BuildGridTriangles(_side, _side, count);
    FinishPoints();
}

template <class T>
void ZonCldReadSRTM::Place(T* points, std::size_t from, std::size_t to) const
{
    // A one-sample row spans nothing: the step is left at 1 rather than made infinite.
    const double step = _side > 1 ? 1.0 / (_side - 1) : 1.0;
    const std::size_t side = _side ? _side : 1;
    std::size_t r = from / side, c = from % side;
    for (std::size_t k = from; k < to; ++k) {
        // Rows past the last whole one go on southwards.
        points[3 * k] = static_cast<T>(static_cast<double>(c) * step);
        points[3 * k + 1] = static_cast<T>((static_cast<double>(side) - 1 - static_cast<double>(r)) * step);
        if (++c == side) {
            c = 0;
            ++r;
        }
    }
}

void ZonCldReadSRTM::ComputeDoublePoints(std::vector<double>& points)
{
    const std::size_t count = _points.size() / 3;
    points.resize(3 * count);
    for (std::size_t k = 0; k < count; ++k) points[3 * k + 2] = _points[3 * k + 2];
    Place(points.data(), 0, count);
}
