// Any bytes, as a slice and as a ".dcz" archive of slices, end in a cloud or a
// catalog error. A cloud's colours are grey and its texts match its points.
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string>

#include "ZonCloudReadDicom.h"
#include "ZonError.h"

namespace {

void Check(bool condition)
{
    if (!condition) std::abort();
}

void ReadAll(const std::uint8_t* data, std::size_t size, const char* name)
{
    ZonCloudReadDicom reader{ZonUnicodeString(name)};
    reader.SetSourceMemory(data, size);
    try {
        unsigned points = 0, colors = 0, values = 0, texts = 0;
        reader.GetPoints(points);
        Check(points > 0);
        const unsigned char* rgb = reader.GetPointColors(colors);
        Check(colors == points);
        for (unsigned i = 0; i < colors; ++i) Check(rgb[3 * i] == rgb[3 * i + 1] && rgb[3 * i] == rgb[3 * i + 2]);
        ZonUnicodeString label;
        const std::int32_t* densities = reader.GetPointTextValues(values, label);
        const auto* strings = static_cast<const std::string*>(reader.GetPointAttributes3(texts));
        Check(values == points && texts == points);
        Check(strings[0] == label.ToUtf8() + std::to_string(densities[0]));
    } catch (const ZonError&) {
        // A catalog error is a valid answer to a broken file.
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    ReadAll(data, size, "fuzz.dcm");
    ReadAll(data, size, "fuzz.dcz");
    return 0;
}
