// Speed and peak memory of the STL reader on a regular height field (every
// vertex shared by six triangles): a binary file of 1,000,000 triangles and a
// text file of 200,000 triangles, both about 50 MB, generated on first use.
#include <benchmark/benchmark.h>

#include <malloc.h>
#include <stdlib.h>
#include <sys/wait.h>

#include <atomic>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <new>
#include <string>

#include "ZonCloudReadStl.h"

#include "ZonBenchHeap.h"

using zonbench::gHeapInUse;
using zonbench::gHeapPeak;

namespace {

struct HeightField {
    int columns, rows;  // cells
    float At(int x, int y) const { return 10.0f * std::sin(0.011f * x) * std::cos(0.017f * y) + 0.001f * x; }
    template <class Facet>
    void ForEachFacet(Facet facet) const
    {
        for (int y = 0; y < rows; ++y)
            for (int x = 0; x < columns; ++x) {
                const float x0 = 0.5f * x, x1 = 0.5f * (x + 1), y0 = 0.5f * y, y1 = 0.5f * (y + 1);
                const float a[3] = {x0, y0, At(x, y)}, b[3] = {x1, y0, At(x + 1, y)};
                const float c[3] = {x0, y1, At(x, y + 1)}, d[3] = {x1, y1, At(x + 1, y + 1)};
                facet(a, b, c);
                facet(b, d, c);
            }
    }
};

// Removed at exit; a plain array so that it outlives every static object.
char gDirectory[] = "/tmp/bench_stl_XXXXXX";

const std::string& Directory()
{
    static const std::string dir = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        return std::string(gDirectory);
    }();
    return dir;
}

const std::string& BinaryFile()
{
    static const std::string path = [] {
        const std::string p = Directory() + "/field.stl";
        FILE* f = std::fopen(p.c_str(), "wb");
        char header[80] = "solid height field";
        std::fwrite(header, 1, 80, f);
        const HeightField field{1000, 500};
        const std::uint32_t count = 2u * field.columns * field.rows;
        std::fwrite(&count, 4, 1, f);
        field.ForEachFacet([f](const float* a, const float* b, const float* c) {
            float record[12] = {0, 0, 1, a[0], a[1], a[2], b[0], b[1], b[2], c[0], c[1], c[2]};
            std::fwrite(record, 4, 12, f);
            std::fwrite("\0\0", 1, 2, f);
        });
        std::fclose(f);
        return p;
    }();
    return path;
}

const std::string& TextFile()
{
    static const std::string path = [] {
        const std::string p = Directory() + "/field_text.stl";
        FILE* f = std::fopen(p.c_str(), "wb");
        std::fputs("solid height field\n", f);
        const HeightField field{500, 200};
        const auto vertex = [f](const float* v) {
            char line[128] = "      vertex";
            char* out = line + std::strlen(line);
            for (int i = 0; i < 3; ++i) {
                *out++ = ' ';
                out = std::to_chars(out, line + sizeof line, v[i], std::chars_format::scientific, 6).ptr;
            }
            *out++ = '\n';
            std::fwrite(line, 1, static_cast<std::size_t>(out - line), f);
        };
        field.ForEachFacet([&](const float* a, const float* b, const float* c) {
            std::fputs("  facet normal 0.000000e+00 0.000000e+00 1.000000e+00\n    outer loop\n", f);
            vertex(a);
            vertex(b);
            vertex(c);
            std::fputs("    endloop\n  endfacet\n", f);
        });
        std::fputs("endsolid height field\n", f);
        std::fclose(f);
        return p;
    }();
    return path;
}

void ReadMesh(benchmark::State& state, const std::string& path)
{
    const auto bytes = static_cast<std::int64_t>(std::filesystem::file_size(path));
    std::size_t arrays = 0, peak = 0, vertices = 0, triangles = 0;
    for (auto _ : state) {
        const std::size_t base = gHeapInUse.load();
        gHeapPeak = base;
        {
            ZonCloudReadStl reader{ZonUnicodeString(path)};
            reader.BeginGetPolygon();
            reader.NextPolygon();
            unsigned nv = 0, nt = 0;
            benchmark::DoNotOptimize(reader.GetPolygonPoints(nv));
            benchmark::DoNotOptimize(reader.GetTriangles(nt));
            vertices = nv;
            triangles = nt;
            arrays = 12 * static_cast<std::size_t>(nv) + 12 * static_cast<std::size_t>(nt);
        }
        peak = gHeapPeak.load() - base;
    }
    state.SetBytesProcessed(state.iterations() * bytes);
    state.counters["vertices"] = static_cast<double>(vertices);
    state.counters["triangles"] = static_cast<double>(triangles);
    state.counters["arrays_MB"] = static_cast<double>(arrays) / 1e6;
    state.counters["peak_heap_MB"] = static_cast<double>(peak) / 1e6;
    state.counters["peak_per_arrays"] = arrays ? static_cast<double>(peak) / static_cast<double>(arrays) : 0.0;
}

void BM_StlBinary1MTriangles(benchmark::State& state) { ReadMesh(state, BinaryFile()); }
void BM_StlText200kTriangles(benchmark::State& state) { ReadMesh(state, TextFile()); }

// The whole tool process on the binary file: start, analysis, reading, summary.
void BM_StlToolInfoBinary(benchmark::State& state)
{
    const std::string command = std::string(ZON_TOOL_PATH) + " info " + BinaryFile() + " > /dev/null 2>&1";
    for (auto _ : state) {
        const int status = std::system(command.c_str());
        if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError("zoncloud info failed on the binary file");
            break;
        }
    }
}

}  // namespace

BENCHMARK(BM_StlBinary1MTriangles)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_StlText200kTriangles)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_StlToolInfoBinary)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);

BENCHMARK_MAIN();
