// Any bytes as a height tile end in a mesh or a catalog error.
#include "ZonCldReadSRTM.h"
#include "ZonFuzzGridMesh.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ZonFuzzGridMesh<ZonCldReadSRTM>(data, size, "fuzz.hgt");
    return 0;
}
