// Any bytes as a fringe grid end in a grid or a catalog error; the rows and the
// cloud are walked in full, sampled and not, and agree.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadOptonBin.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, float percent)
{
    ZonCloudReadOptonBin reader{ZonUnicodeString("fuzz.xyz")};
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
        Check(rows == reader.GetNumberOfRows());
        unsigned n = 0;
        reader.GetPoints(n);
        Check(n == valid);
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ReadAll(data, size, 100.0f);
    ReadAll(data, size, 30.0f);
    return 0;
}
