// Read speed of the GoCad reader on a surface of 1,000,000 triangles (about
// 55 MB) and of the IGES reader on 2,000,000 points in copious-data entities
// written as 80-column cards (about 120 MB), both generated on first use;
// each beside `cat FILE > /dev/null` and the whole `zoncloud info FILE`
// process on the same file. Throughput is reported as bytes_per_second.
#include <benchmark/benchmark.h>

#include <sys/wait.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>

#include "ZonCloudReadGoCad.h"
#include "ZonCloudReadIges.h"

namespace fs = std::filesystem;

namespace {

fs::path Directory()
{
    const fs::path dir = fs::temp_directory_path() / "zon_bench_gocad_iges";
    fs::create_directories(dir);
    return dir;
}

// A height field of 708 x 708 vertices, two triangles per cell, with
// coordinates as surveys write them.
std::string GoCadFile()
{
    const fs::path path = Directory() / "surface.ts";
    if (fs::exists(path)) return path.string();
    const fs::path partial = path.string() + ".part";
    FILE* out = std::fopen(partial.c_str(), "w");
    if (!out) return {};
    std::setvbuf(out, nullptr, _IOFBF, 1 << 20);
    constexpr int n = 708;
    std::fputs("GOCAD TSurf 1\nHEADER {\nname:field\n}\nTFACE\n", out);
    for (int y = 0; y < n; ++y)
        for (int x = 0; x < n; ++x)
            std::fprintf(out, "VRTX %d %.6f %.6f %.6f\n", y * n + x + 1, 512000.0 + 2.5 * x, 4310000.0 + 2.5 * y,
                         120.0 + 0.013 * ((x * 7 + y * 13) % 997));
    for (int y = 0; y + 1 < n; ++y)
        for (int x = 0; x + 1 < n; ++x) {
            const int a = y * n + x + 1;
            std::fprintf(out, "TRGL %d %d %d\nTRGL %d %d %d\n", a, a + 1, a + n, a + 1, a + n + 1, a + n);
        }
    std::fputs("END\n", out);
    std::fclose(out);
    fs::rename(partial, path);
    return path.string();
}

// 1000 copious-data entities (form 2) of 2000 points each, as cards with the
// directory pointer and the sequence number in the last columns.
std::string IgesFile()
{
    const fs::path path = Directory() / "points.igs";
    if (fs::exists(path)) return path.string();
    const fs::path partial = path.string() + ".part";
    FILE* out = std::fopen(partial.c_str(), "w");
    if (!out) return {};
    std::setvbuf(out, nullptr, _IOFBF, 1 << 20);
    int sequence = 0;
    std::string card;
    const auto flush = [&](int entity) {
        std::fprintf(out, "%-64s%8dP%7d\n", card.c_str(), 2 * entity + 1, ++sequence);
        card.clear();
    };
    std::fprintf(out, "%-72sS%7d\n", "generated points", 1);
    for (int e = 0; e < 1000; ++e) {
        card = "106,2,2000,";
        for (int i = 0; i < 2000; ++i) {
            const double v[3] = {0.731 * i, 0.913 * e - 250.0, 40.0 + ((e * 7 + i * 13) % 2000) * 0.0173};
            for (int k = 0; k < 3; ++k) {
                char value[32];
                const bool last = i == 1999 && k == 2;
                std::snprintf(value, sizeof value, "%.6E%c", v[k], last ? ';' : ',');
                if (card.size() + std::string(value).size() > 64) flush(e);
                card += value;
            }
        }
        flush(e);
    }
    std::fclose(out);
    fs::rename(partial, path);
    return path.string();
}

void RunCommand(benchmark::State& state, const std::string& path, const std::string& command)
{
    if (path.empty()) {
        state.SkipWithError("cannot write the benchmark file");
        return;
    }
    for (auto _ : state) {
        const int status = std::system(command.c_str());
        if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError(("failed: " + command).c_str());
            break;
        }
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(fs::file_size(path)) * state.iterations());
}

void Cat(benchmark::State& state, const std::string& path) { RunCommand(state, path, "cat '" + path + "' > /dev/null"); }

void ToolInfo(benchmark::State& state, const std::string& path)
{
    RunCommand(state, path, std::string("'") + ZON_TOOL_PATH + "' info '" + path + "' > /dev/null 2>&1");
}

void BM_GoCadCat(benchmark::State& state) { Cat(state, GoCadFile()); }
void BM_GoCadRead1MTriangles(benchmark::State& state)
{
    const std::string path = GoCadFile();
    unsigned triangles = 0;
    for (auto _ : state) {
        ZonCloudReadGoCad reader{ZonUnicodeString(path)};
        reader.BeginGetPolygon();
        reader.NextPolygon();
        unsigned vertices = 0;
        benchmark::DoNotOptimize(reader.GetPolygonPoints(vertices));
        benchmark::DoNotOptimize(reader.GetTriangles(triangles));
    }
    if (triangles != 2u * 707 * 707) state.SkipWithError("wrong number of triangles");
    state.SetBytesProcessed(static_cast<std::int64_t>(fs::file_size(path)) * state.iterations());
}
void BM_GoCadToolInfo(benchmark::State& state) { ToolInfo(state, GoCadFile()); }

void BM_IgesCat(benchmark::State& state) { Cat(state, IgesFile()); }
void BM_IgesRead2MPoints(benchmark::State& state)
{
    const std::string path = IgesFile();
    unsigned total = 0;
    for (auto _ : state) {
        ZonCloudReadIges reader{ZonUnicodeString(path)};
        total = 0;
        reader.BeginGetSetOfScans();
        reader.NextSetOfScans();
        reader.BeginGetScan();
        while (reader.NextScan()) {
            unsigned n = 0;
            benchmark::DoNotOptimize(reader.GetScanPoints(n));
            total += n;
        }
    }
    if (total != 2'000'000) state.SkipWithError("wrong number of points");
    state.SetBytesProcessed(static_cast<std::int64_t>(fs::file_size(path)) * state.iterations());
}
void BM_IgesToolInfo(benchmark::State& state) { ToolInfo(state, IgesFile()); }

}  // namespace

BENCHMARK(BM_GoCadCat)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_GoCadRead1MTriangles)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_GoCadToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_IgesCat)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_IgesRead2MPoints)->Unit(benchmark::kMillisecond)->UseRealTime();
BENCHMARK(BM_IgesToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime();

BENCHMARK_MAIN();
