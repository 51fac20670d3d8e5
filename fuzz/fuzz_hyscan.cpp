// Any bytes as a profile file end in scans or a catalog error; the scans and
// the cloud are walked in full, sampled and not, and agree.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadHyscanBin.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, float percent)
{
    ZonCloudReadHyscanBin reader{ZonUnicodeString("fuzz.hym")};
    reader.SetSourceMemory(data, size);
    try {
        reader.SetSamplingPercent(percent);
        unsigned n = 0;
        reader.GetPoints(n);
        if (percent == 100.0f) Check(n == static_cast<unsigned>(reader.GetNumberOfPoints()));
        Check(reader.GetLengthUnit() != nullptr);
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
        // The sampling runs over the whole file either way.
        Check(total == n);
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
