// Fuzzes the ASCII user format reader: the input's first line is the FDF, the
// rest the data; its first byte also picks the sampling and precision.
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <unistd.h>

#include "ZonCloudReadAsciiUserFormat.h"
#include "ZonError.h"

namespace {

std::string TempPath(const char* name)
{
    return "/tmp/zon_fuzz_auf_" + std::to_string(getpid()) + "_" + name;
}

void WriteFile(const std::string& path, const std::uint8_t* data, std::size_t size)
{
    FILE* out = std::fopen(path.c_str(), "wb");
    if (!out) __builtin_trap();
    if (size) std::fwrite(data, 1, size, out);
    std::fclose(out);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > 1 << 16) return 0;
    // The FDF can only be named by a path; the data is read from memory.
    static const std::string fdfPath = TempPath("columns.fdf");
    // Removed at exit, so that replaying the corpus in every build leaves nothing behind.
    static const int removal = std::atexit([] { std::remove(fdfPath.c_str()); });
    (void)removal;
    std::size_t cut = 0;
    while (cut < size && data[cut] != '\n') ++cut;
    const std::size_t fdfSize = cut < size ? cut + 1 : size;
    WriteFile(fdfPath, data, fdfSize);

    const std::uint8_t choice = size ? data[0] : 0;
    try {
        ZonCloudReadAsciiUserFormat reader{ZonUnicodeString("fuzz.asc_fmt")};
        reader.SetSourceMemory(data + fdfSize, size - fdfSize);
        reader.SetSamplingPercent(static_cast<float>(choice % 101));
        reader.SetDoublePrecision(choice & 0x80);
        reader.SetKeepColors(!(choice & 0x40));
        reader.SetFDFile(fdfPath);
        unsigned n = 0;
        const float* points = reader.GetPoints(n);
        float sum = 0.0f;
        for (unsigned i = 0; i < 3 * n; ++i) sum += points[i];
        const double* doubles = reader.GetPointsDouble(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += static_cast<float>(doubles[i]);
        const unsigned char* colors = reader.GetPointColors(n);
        for (unsigned i = 0; i < 3 * n; ++i) sum += colors[i];
        const auto* alphas = static_cast<const std::int32_t*>(reader.GetPointAttributes1(n));
        for (unsigned i = 0; i < n; ++i) sum += static_cast<float>(alphas[i]);
        const auto* symbols = static_cast<const std::int32_t*>(reader.GetPointAttributes2(n));
        for (unsigned i = 0; i < n; ++i) sum += static_cast<float>(symbols[i]);
        const auto* texts = static_cast<const std::string*>(reader.GetPointAttributes3(n));
        for (unsigned i = 0; i < n; ++i) sum += static_cast<float>(texts[i].size());
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
