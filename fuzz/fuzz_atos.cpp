// Any bytes as a measurement file end in grids or a catalog error: every grid
// is walked, sampled, queried in a box, and the cloud is read.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadAtos.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, float percent, char native)
{
    ZonCloudReadAtos reader{ZonUnicodeString("fuzz.surf")};
    reader.SetSourceMemory(data, size);
    reader.SetNativeDecimalPoint(native);
    try {
        reader.SetSamplingPercent(percent);
        reader.BeginGetGrid();
        std::uint64_t valid = 0;
        while (reader.NextGrid()) {
            reader.BeginGetGridPoints();
            unsigned n = 0;
            const unsigned char* flags = nullptr;
            while (const float* points = reader.GetGridPoints(n, flags)) {
                Check(flags != nullptr || n == 0);
                for (unsigned i = 0; i < n; ++i) valid += flags[i] ? 1 : 0;
                (void)points;
            }
        }
        unsigned count = 0;
        reader.GetPoints(count);
        Check(count == valid);

        ZonMathBox box;
        reader.GetBoundingBox(box);
        if (box.IsEmpty()) return;
        const ZonMathPoint &low = box.GetLow(), &high = box.GetHigh();
        const ZonMathBox half(low[0], (low[0] + high[0]) / 2, low[1], high[1], low[2], high[2]);
        reader.SelectGrid(1);
        const unsigned char* flags = nullptr;
        reader.GetGridPointsInBox(half, count, flags);
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ReadAll(data, size, 100.0f, '.');
    ReadAll(data, size, 50.0f, ',');
    return 0;
}
