// Fuzzes the RGB point reader; the input's first byte also picks whether
// colours are kept.
#include "ZonCloudReadLeica.h"
#include "ZonFuzzTextCloud.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    return zonfuzz::ReadTextCloud<ZonCloudReadLeica>(data, size, "fuzz.asc_rgb", [](ZonCloudReadLeica& reader, std::uint8_t choice) {
        reader.SetKeepColors(!(choice & 0x40));
    });
}
