// Any bytes as a range grid, sampled and not: see ZonFuzzRangeGrid.h.
#include "ZonCloudReadKreonBin.h"
#include "ZonFuzzRangeGrid.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ZonFuzzRangeGrid<ZonCloudReadKreonBin>(data, size, "fuzz.grk", 100.0f);
    ZonFuzzRangeGrid<ZonCloudReadKreonBin>(data, size, "fuzz.grk", 30.0f);
    return 0;
}
