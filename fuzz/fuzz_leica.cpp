// Fuzzes the RGB point reader; the input's first byte also picks the
// sampling, the precision and whether colours are kept.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>
#include <unistd.h>

#include "ZonCloudReadLeica.h"
#include "ZonError.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > 1 << 16) return 0;
    static const std::string path = "/tmp/zon_fuzz_rgb_" + std::to_string(getpid()) + ".asc_rgb";
    FILE* out = std::fopen(path.c_str(), "wb");
    if (!out) __builtin_trap();
    if (size) std::fwrite(data, 1, size, out);
    std::fclose(out);

    const std::uint8_t choice = size ? data[0] : 0;
    try {
        ZonCloudReadLeica reader(path);
        reader.SetSamplingPercent(static_cast<float>(choice % 101));
        reader.SetDoublePrecision(choice & 0x80);
        reader.SetKeepColors(!(choice & 0x40));
        unsigned n = 0;
        float sum = 0.0f;
        const double* doubles = reader.GetPointsDouble(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += static_cast<float>(doubles[i]);
        const float* points = reader.GetPoints(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += points[i];
        const unsigned char* colors = reader.GetPointColors(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += colors[i];
        ZonMathBox box;
        reader.GetBoundingBox(box);
        reader.GetPointsInBox(box, n);
        volatile float sink = sum;
        (void)sink;
    } catch (const ZonError&) {
        // A clear catalog error is an acceptable end for a broken file.
    }
    return 0;
}
