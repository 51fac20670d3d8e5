// Any bytes as a fringe grid, sampled and not: see ZonFuzzRangeGrid.h.
#include "ZonCloudReadOptonBin.h"
#include "ZonFuzzRangeGrid.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ZonFuzzRangeGrid<ZonCloudReadOptonBin>(data, size, "fuzz.xyz", 100.0f);
    ZonFuzzRangeGrid<ZonCloudReadOptonBin>(data, size, "fuzz.xyz", 30.0f);
    return 0;
}
