// Fuzzes the Cgo reader, both precisions (the second is read again from the
// file); the input's first byte also picks the sampling and which comes first.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <string>
#include <unistd.h>

#include "ZonCloudReadCgoAscii.h"
#include "ZonError.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > 1 << 16) return 0;
    static const std::string path = "/tmp/zon_fuzz_cgo_" + std::to_string(getpid()) + ".cgo";
    FILE* out = std::fopen(path.c_str(), "wb");
    if (!out) __builtin_trap();
    if (size) std::fwrite(data, 1, size, out);
    std::fclose(out);

    const std::uint8_t choice = size ? data[0] : 0;
    try {
        ZonCloudReadCgoAscii reader(path);
        reader.SetSamplingPercent(static_cast<float>(choice % 101));
        reader.SetDoublePrecision(choice & 0x80);
        unsigned n = 0;
        float sum = 0.0f;
        const float* points = reader.GetPoints(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += points[i];
        const double* doubles = reader.GetPointsDouble(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += static_cast<float>(doubles[i]);
        ZonMathBox box;
        reader.GetBoundingBox(box);
        reader.GetPointsInBoxDouble(box, n);
        volatile float sink = sum;
        (void)sink;
    } catch (const ZonError&) {
        // A clear catalog error is an acceptable end for a broken file.
    }
    return 0;
}
