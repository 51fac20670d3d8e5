// Fuzzes the Cgo reader, whose second precision is read again from the file.
#include "ZonCloudReadCgoAscii.h"
#include "ZonFuzzTextCloud.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    return zonfuzz::ReadTextCloud<ZonCloudReadCgoAscii>(data, size, "fuzz.cgo", [](ZonCloudReadCgoAscii&, std::uint8_t) {});
}
