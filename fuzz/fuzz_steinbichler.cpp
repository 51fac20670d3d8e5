// Any bytes as a subset file end in a cloud, scans or grids, or a catalog
// error; whatever the file holds is walked in full, sampled and not.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadSteinbichler.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, float percent, char native)
{
    ZonCloudReadSteinbichler reader{ZonUnicodeString("fuzz.ac")};
    reader.SetSourceMemory(data, size);
    reader.SetNativeDecimalPoint(native);
    try {
        reader.SetSamplingPercent(percent);
        unsigned n = 0;
        reader.GetPoints(n);
        // Scan and pixel tables may leave some of the declared points out.
        if (percent == 100.0f) Check(n <= static_cast<unsigned>(reader.GetNumberOfPoints()));
        if (reader.IsTypeOfDigitization(DigitizationScans)) {
            std::uint64_t total = 0;
            reader.BeginGetSetOfScans();
            while (reader.NextSetOfScans()) {
                reader.BeginGetScan();
                while (reader.NextScan()) {
                    unsigned count = 0;
                    reader.GetScanPoints(count);
                    total += count;
                }
            }
            if (percent == 100.0f) Check(total == n);
        }
        if (reader.IsTypeOfDigitization(DigitizationGrids)) {
            std::uint64_t valid = 0;
            reader.BeginGetGrid();
            while (reader.NextGrid()) {
                reader.BeginGetGridPoints();
                unsigned count = 0;
                const unsigned char* flags = nullptr;
                while (reader.GetGridPoints(count, flags))
                    for (unsigned i = 0; i < count; ++i) valid += flags[i] ? 1 : 0;
            }
            if (percent == 100.0f) Check(valid == n);
        }
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ReadAll(data, size, 100.0f, '.');
    ReadAll(data, size, 30.0f, ',');
    return 0;
}
