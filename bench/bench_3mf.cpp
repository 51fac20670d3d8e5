// The whole `zoncloud convert` process from a binary STL of 1,000,000
// triangles (a regular height field, every vertex shared by six triangles,
// written on first use) to a 3MF package, packing included; beside it, in the
// same run, `assimp export` of the same file to 3MF and the machine's floor
// (reading the input once with cat).
#include <benchmark/benchmark.h>
#include <sys/wait.h>

#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <string>

namespace {

// Removed at exit; a plain array so that it outlives every static object.
char gDirectory[] = "/tmp/bench_3mf_XXXXXX";

const std::string& Directory()
{
    static const std::string dir = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        return std::string(gDirectory);
    }();
    return dir;
}

float Height(int x, int y) { return 10.0f * std::sin(0.011f * x) * std::cos(0.017f * y) + 0.001f * x; }

const std::string& Input()
{
    static const std::string path = [] {
        const std::string p = Directory() + "/field.stl";
        FILE* f = std::fopen(p.c_str(), "wb");
        if (!f) std::abort();
        char header[80] = "solid height field";
        std::fwrite(header, 1, 80, f);
        const int columns = 1000, rows = 500;
        const std::uint32_t count = 2u * columns * rows;
        std::fwrite(&count, 4, 1, f);
        auto facet = [f](const float* a, const float* b, const float* c) {
            const float record[12] = {0, 0, 1, a[0], a[1], a[2], b[0], b[1], b[2], c[0], c[1], c[2]};
            std::fwrite(record, 4, 12, f);
            std::fwrite("\0\0", 1, 2, f);
        };
        for (int y = 0; y < rows; ++y)
            for (int x = 0; x < columns; ++x) {
                const float x0 = 0.5f * x, x1 = 0.5f * (x + 1), y0 = 0.5f * y, y1 = 0.5f * (y + 1);
                const float a[3] = {x0, y0, Height(x, y)}, b[3] = {x1, y0, Height(x + 1, y)};
                const float c[3] = {x0, y1, Height(x, y + 1)}, d[3] = {x1, y1, Height(x + 1, y + 1)};
                facet(a, b, c);
                facet(b, d, c);
            }
        std::fclose(f);
        return p;
    }();
    return path;
}

void RunCommand(benchmark::State& state, const std::string& command, const char* what)
{
    for (auto _ : state) {
        const int status = std::system((command + " > /dev/null 2>&1").c_str());
        if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError(what);
            break;
        }
    }
    const std::string out = Directory() + "/out.3mf";
    std::error_code error;
    if (std::filesystem::exists(out, error)) state.counters["package_MB"] = double(std::filesystem::file_size(out)) / 1e6;
    std::filesystem::remove(out, error);
}

void BM_3mfToolConvert1MTriangles(benchmark::State& state)
{
    RunCommand(state, std::string(ZON_TOOL_PATH) + " convert " + Input() + " " + Directory() + "/out.3mf",
               "zoncloud convert failed");
}

// The peer: the same conversion by assimp, when it is installed.
void BM_3mfAssimpExport1MTriangles(benchmark::State& state)
{
    if (std::system("command -v assimp > /dev/null 2>&1") != 0) {
        state.SkipWithError("assimp (assimp-utils) is not installed");
        return;
    }
    RunCommand(state, "assimp export " + Input() + " " + Directory() + "/out.3mf", "assimp export failed");
}

// The floor: reading the input once.
void BM_3mfCatInput(benchmark::State& state) { RunCommand(state, "cat " + Input(), "cat failed"); }

}  // namespace

BENCHMARK(BM_3mfToolConvert1MTriangles)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(3.0);
BENCHMARK(BM_3mfAssimpExport1MTriangles)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(1);
BENCHMARK(BM_3mfCatInput)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(1.0);

BENCHMARK_MAIN();
