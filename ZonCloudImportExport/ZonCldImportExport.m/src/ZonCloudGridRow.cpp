#include "ZonCloudGridRow.h"

#include <algorithm>
#include <limits>

#include "ZonCloudOwnedArrays.h"
#include "ZonCloudReadNLSTool.h"

std::uint64_t ZonCloudGridRow::SlotsFor(std::uint64_t columns, float percent)
{
    const float step = percent / 100.0f;
    if (step >= 1.0f) return columns;
    const auto slots = static_cast<std::uint64_t>(static_cast<float>(columns) * step + 1.0f);
    return std::min(columns, slots);
}

void ZonCloudGridRow::Start(std::uint64_t columns, float percent)
{
    _step = percent / 100.0f;
    _sampled = _step < 1.0f;
    _slots = static_cast<std::size_t>(SlotsFor(columns, percent));
    _points.assign(3 * _slots, 0.0f);
    _valid.assign(_slots, 0);
}

void ZonCloudGridRow::ListArrays(ZonCloudOwnedArrays& arrays)
{
    arrays.Add(_points);
    arrays.Add(_valid);
}

void ZonCloudGridRow::AppendValid(std::vector<float>& cloud) const
{
    for (std::size_t i = 0; i < _slots; ++i)
        if (_valid[i]) cloud.insert(cloud.end(), _points.begin() + 3 * i, _points.begin() + 3 * i + 3);
}

void ZonCloudGridRow::CheckSize(std::uint64_t rows, std::uint64_t columns, std::uint64_t records)
{
    // Sparse patches are normal (a thin part seen across a wide image), so the
    // allowance is generous; what it stops is a grid of billions of holes.
    constexpr std::uint64_t Floor = std::uint64_t{1} << 20;
    constexpr std::uint64_t HolesPerRecord = 256;
    const std::uint64_t allowed =
        std::max(Floor, records > std::numeric_limits<std::uint64_t>::max() / HolesPerRecord
                            ? std::numeric_limits<std::uint64_t>::max()
                            : records * HolesPerRecord);
    if (rows != 0 && columns > allowed / rows) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_UnknownData");
}
