// Any bytes as an elevation model end in a mesh or a catalog error.
#include "ZonCldReadDEM.h"
#include "ZonFuzzGridMesh.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ZonFuzzGridMesh<ZonCldReadDEM>(data, size, "fuzz.dem");
    return 0;
}
