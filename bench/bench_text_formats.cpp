// Read speed of the RGB point reader and of the ASCII user format reader on
// the same file of 5,000,000 points "x y z r g b" (about 190 MB, generated on
// first use in the temporary directory), the user format with the FDF
// "X Y Z R G B"; and of the Cgo reader on a file of the same points without
// colours. Throughput is reported as bytes_per_second.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>

#include "ZonCloudReadAsciiUserFormat.h"
#include "ZonCloudReadCgoAscii.h"
#include "ZonCloudReadLeica.h"

namespace fs = std::filesystem;

namespace {

constexpr int PointCount = 5'000'000;

fs::path Directory()
{
    const fs::path dir = fs::temp_directory_path() / "zon_bench_text_formats";
    fs::create_directories(dir);
    return dir;
}

// Points on a wavy surface with millimetre decimals, colours from 10 to 255
// (two or three digits, as scanners write them).
std::string MakeFile(const char* name, bool withColors)
{
    const fs::path path = Directory() / name;
    if (fs::exists(path)) return path.string();
    const fs::path partial = path.string() + ".part";
    FILE* out = std::fopen(partial.c_str(), "w");
    if (!out) return {};
    std::setvbuf(out, nullptr, _IOFBF, 1 << 20);
    for (int i = 0; i < PointCount; ++i) {
        const int row = i / 2500, column = i % 2500;
        const double x = column * 0.731, y = row * 0.913 - 250.0, z = 40.0 + ((row * 7 + column * 13) % 2000) * 0.0173;
        if (withColors)
            std::fprintf(out, "%.3f %.3f %.3f %d %d %d\n", x, y, z, 10 + column % 246, 10 + row % 246,
                         10 + (row + column) % 246);
        else
            std::fprintf(out, "%.3f %.3f %.3f\n", x, y, z);
    }
    std::fclose(out);
    fs::rename(partial, path);
    return path.string();
}

template <class Read>
void Run(benchmark::State& state, const std::string& path, Read read)
{
    if (path.empty()) {
        state.SkipWithError("cannot write the benchmark file");
        return;
    }
    const auto size = static_cast<std::int64_t>(fs::file_size(path));
    for (auto _ : state) {
        const unsigned count = read(path);
        if (count != PointCount) state.SkipWithError("wrong number of points");
        benchmark::DoNotOptimize(count);
    }
    state.SetBytesProcessed(size * state.iterations());
}

void RgbPoints(benchmark::State& state)
{
    const bool asDouble = state.range(0) != 0;
    Run(state, MakeFile("points.asc_rgb", true), [asDouble](const std::string& path) {
        ZonCloudReadLeica reader(path);
        unsigned n = 0;
        if (asDouble)
            reader.GetPointsDouble(n);
        else
            reader.GetPoints(n);
        unsigned colors = 0;
        reader.GetPointColors(colors);
        return colors == n ? n : 0u;
    });
}
BENCHMARK(RgbPoints)->Arg(0)->Arg(1)->ArgName("double")->Unit(benchmark::kMillisecond)->Iterations(3);

void UserFormat(benchmark::State& state)
{
    const std::string fdf = (Directory() / "xyzrgb.fdf").string();
    std::ofstream(fdf, std::ios::binary) << "X Y Z R G B\r\n";
    Run(state, MakeFile("points.asc_rgb", true), [&fdf](const std::string& path) {
        ZonCloudReadAsciiUserFormat reader(path);
        reader.SetFDFile(fdf);
        unsigned n = 0;
        reader.GetPoints(n);
        unsigned colors = 0;
        reader.GetPointColors(colors);
        return colors == n ? n : 0u;
    });
}
BENCHMARK(UserFormat)->Unit(benchmark::kMillisecond)->Iterations(3);

void CgoPoints(benchmark::State& state)
{
    Run(state, MakeFile("points.cgo", false), [](const std::string& path) {
        ZonCloudReadCgoAscii reader(path);
        unsigned n = 0;
        reader.GetPoints(n);
        return n;
    });
}
BENCHMARK(CgoPoints)->Unit(benchmark::kMillisecond)->Iterations(3);

}  // namespace

BENCHMARK_MAIN();
