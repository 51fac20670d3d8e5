#include "ZonCldGrid.h"

#include <algorithm>

ZonCldGrid::Row& ZonCldGrid::AddRow(const unsigned char* valid, std::size_t count)
{
    Row& row = _rows.emplace_back();
    if (valid) {
        row.valid.resize(count);
        // Any non-zero byte is a valid point; keep the bytes as 0 and 1.
        std::transform(valid, valid + count, row.valid.begin(), [](unsigned char v) -> unsigned char { return v ? 1 : 0; });
    } else {
        row.valid.assign(count, 1);
    }
    return row;
}

std::size_t ZonCldGrid::GetNumberOfValidPoints() const
{
    std::size_t n = 0;
    for (const Row& row : _rows) n += static_cast<std::size_t>(std::count(row.valid.begin(), row.valid.end(), 1));
    return n;
}
