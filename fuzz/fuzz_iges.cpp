// Any bytes as an IGES file end in points or a catalog error. The cloud is
// read whole and sampled, and the scans are walked to their end.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "ZonCloudReadIges.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, float percent)
{
    ZonCloudReadIges reader{ZonUnicodeString("fuzz.igs")};
    reader.SetSourceMemory(data, size);
    try {
        reader.SetSamplingPercent(percent);
        const int total = reader.GetNumberOfPoints();
        unsigned count = 0;
        reader.GetPoints(count);
        Check(count > 0 && count <= static_cast<unsigned>(total));
        if (!reader.IsTypeOfDigitization(DigitizationScans)) return;
        unsigned scans = 0, inScans = 0;
        reader.BeginGetSetOfScans();
        Check(reader.NextSetOfScans());
        reader.BeginGetScan();
        while (reader.NextScan()) {
            unsigned n = 0;
            reader.GetScanPoints(n);
            inScans += n;
            ++scans;
        }
        Check(scans == reader.GetNumberOfScans() && inScans == count);
    } catch (const ZonError& error) {
        Check(!error.GetMessageKey().empty());
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    for (float percent : {100.0f, 37.0f}) ReadAll(data, size, percent);
    return 0;
}
