#include "ZonCldGrid.h"

#include <algorithm>

ZonCldGrid::Row& ZonCldGrid::AddRow(const unsigned char* valid, std::size_t count)
{
    Row& row = _rows.emplace_back();
    if (valid) {
        row.valid.resize(count);
        // Any non-zero byte is a valid point; keep the bytes as 0 and 1.
        std::size_t validCount = 0;
        for (std::size_t i = 0; i < count; ++i) {
            const unsigned char v = valid[i] ? 1 : 0;
            row.valid[i] = v;
            validCount += v;
        }
        _validPoints += validCount;
    } else {
        row.valid.assign(count, 1);
        _validPoints += count;
    }
    return row;
}

ZonCldGrid::Row& ZonCldGrid::AddRow(std::vector<unsigned char>&& valid)
{
    Row& row = _rows.emplace_back();
    row.valid = std::move(valid);
    std::size_t validCount = 0;
    for (unsigned char& v : row.valid) {
        v = v ? 1 : 0;
        validCount += v;
    }
    _validPoints += validCount;
    return row;
}
