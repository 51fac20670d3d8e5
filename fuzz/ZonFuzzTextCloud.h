// The fuzz loop of the readers of text point clouds: any bytes as the file,
// read in both precisions with a sampling, a precision and an order picked by
// the input's first byte, end in points or a catalog error.
#pragma once
#include <cstddef>
#include <cstdint>

#include "ZonError.h"

namespace zonfuzz {

// Sums every value, so that the sanitizers see each one read.
template <class T>
float Sum(const T* values, unsigned count)
{
    float sum = 0.0f;
    for (unsigned i = 0; i < count; ++i) sum += static_cast<float>(values[i]);
    return sum;
}

// `configure` sets what only this format has, from the first byte. `name` is
// the reader's file name; the bytes are read from memory.
template <class Reader, class Configure>
int ReadTextCloud(const std::uint8_t* data, std::size_t size, const char* name, Configure configure)
{
    if (size > 1 << 16) return 0;
    const std::uint8_t choice = size ? data[0] : 0;
    try {
        Reader reader{ZonUnicodeString(name)};
        reader.SetSourceMemory(data, size);
        reader.SetSamplingPercent(static_cast<float>(choice % 101));
        reader.SetDoublePrecision(choice & 0x80);
        configure(reader, choice);
        unsigned n = 0;
        float sum = 0.0f;
        for (const bool doubles : {(choice & 0x20) != 0, (choice & 0x20) == 0}) {
            if (doubles) {
                const double* points = reader.GetPointsDouble(n);
                sum += Sum(points, 3 * n);
            } else {
                const float* points = reader.GetPoints(n);
                sum += Sum(points, 3 * n);
            }
        }
        const unsigned char* colors = reader.GetPointColors(n);
        sum += Sum(colors, 3 * n);
        ZonMathBox box;
        reader.GetBoundingBox(box);
        reader.GetPointsInBox(box, n);
        reader.GetPointsInBoxDouble(box, n);
        volatile float sink = sum;
        (void)sink;
    } catch (const ZonError&) {
        // A clear catalog error is an acceptable end for a broken file.
    }
    return 0;
}

}  // namespace zonfuzz
