// The check shared by the range-grid fuzz targets: any bytes end in a grid or
// a catalog error; the rows and the cloud are walked in full, sampled and
// not, and agree.
#pragma once
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonError.h"

template <class Reader>
void ZonFuzzRangeGrid(const std::uint8_t* data, std::size_t size, const char* name, float percent)
{
    const auto check = [](bool condition) {
        if (!condition) std::abort();
    };
    Reader reader{ZonUnicodeString(name)};
    reader.SetSourceMemory(data, size);
    try {
        reader.SetSamplingPercent(percent);
        std::uint64_t valid = 0, rows = 0;
        reader.BeginGetGrid();
        while (reader.NextGrid()) {
            reader.BeginGetGridPoints();
            unsigned count = 0;
            const unsigned char* flags = nullptr;
            while (reader.GetGridPoints(count, flags)) {
                ++rows;
                for (unsigned i = 0; i < count; ++i) valid += flags[i] ? 1 : 0;
            }
        }
        check(rows == reader.GetNumberOfRows());
        unsigned n = 0;
        reader.GetPoints(n);
        check(n == valid);
    } catch (const ZonError& error) {
        check(!error.GetMessageKey().empty());
    }
}
