// Any bytes as a text height grid end in a mesh or a catalog error.
#include "ZonCldReadArcInfoGrid.h"
#include "ZonFuzzGridMesh.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ZonFuzzGridMesh<ZonCldReadArcInfoGrid>(data, size, "fuzz.asc_grid");
    return 0;
}
