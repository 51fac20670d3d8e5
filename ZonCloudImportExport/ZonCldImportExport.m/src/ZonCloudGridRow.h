#pragma once
#include <cstddef>
#include <cstdint>
#include <vector>

#include "ZonCldExport.h"

class ZonCloudOwnedArrays;

// One delivered row of a grid: points of three floats in slots, with a
// validity byte per slot (1 a measured node, 0 a hole). The sampling rule of
// every grid format lives here: with r = percent / 100 (a float), a row of C
// columns has min(C, trunc(C * r + 1)) slots; column c goes to slot
// trunc(c * r), and when sampling is on, a column whose slot is the one of
// the column before it is passed over, so that one column fills each slot.
class ZON_CLD_API ZonCloudGridRow {
public:
    static std::uint64_t SlotsFor(std::uint64_t columns, float percent);

    // Starts a row of `columns` columns sampled at `percent`: every slot a
    // hole at (0, 0, 0). The arrays are reused from row to row.
    void Start(std::uint64_t columns, float percent);
    // The slot of column c (from 0), or -1 when sampling passes it over.
    std::int64_t SlotOf(std::uint64_t column) const
    {
        if (!_sampled) return column < _slots ? static_cast<std::int64_t>(column) : -1;
        const auto slot = static_cast<std::int64_t>(static_cast<float>(column) * _step);
        // The first column always fills the first slot.
        if (column > 0 && static_cast<std::int64_t>(static_cast<float>(column - 1) * _step) == slot) return -1;
        return static_cast<std::uint64_t>(slot) < _slots ? slot : -1;
    }
    void Set(std::size_t slot, float x, float y, float z)
    {
        float* p = _points.data() + 3 * slot;
        p[0] = x;
        p[1] = y;
        p[2] = z;
        _valid[slot] = 1;
    }
    std::size_t Slots() const { return _slots; }
    bool IsValid(std::size_t slot) const { return _valid[slot] != 0; }
    const float* Point(std::size_t slot) const { return _points.data() + 3 * slot; }

    // The row as GetGridPoints answers it.
    const float* Deliver(unsigned& count, const unsigned char*& valid) const
    {
        count = static_cast<unsigned>(_slots);
        valid = _valid.data();
        return _points.data();
    }
    // False once an importer has taken the row's arrays over.
    bool IsWhole() const { return _points.size() == 3 * _slots && _valid.size() == _slots; }
    // The row's arrays, for a reader's hand-over.
    void ListArrays(ZonCloudOwnedArrays& arrays);
    // Appends the row's valid points to a cloud.
    void AppendValid(std::vector<float>& cloud) const;

    // A grid of rows x columns nodes that the file's records do not justify
    // (far more holes than records: a header or a stray record that makes the
    // grid huge) raises "ERR_UnknownData" before anything is allocated.
    static void CheckSize(std::uint64_t rows, std::uint64_t columns, std::uint64_t records);

private:
    std::vector<float> _points;
    std::vector<unsigned char> _valid;
    std::size_t _slots = 0;
    float _step = 1.0f;
    bool _sampled = false;
};
