// Speed and peak memory of the terrain readers: a text height grid of
// 3000 x 3000 cells and a raw height tile of 3601 x 3601 samples, read into
// points and triangles, and the whole `zoncloud info` process on each. Beside
// them, the machine's limit (reading the file's bytes) and GDAL reading the
// same raster (`gdalinfo -checksum`, no triangles), when GDAL is installed.
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
#include <vector>

#include "ZonCldReadArcInfoGrid.h"
#include "ZonCldReadSRTM.h"

#include "ZonBenchHeap.h"

using zonbench::gHeapInUse;
using zonbench::gHeapPeak;

namespace {

double Height(int r, int c) { return 800.0 + 300.0 * std::sin(0.003 * r) * std::cos(0.002 * c) + 0.01 * c; }

// Removed at exit; a plain array so that it outlives every static object.
char gDirectory[] = "/tmp/bench_terrain_XXXXXX";

const std::string& Directory()
{
    static const std::string dir = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        return std::string(gDirectory);
    }();
    return dir;
}

const std::string& GridFile()
{
    static const std::string path = [] {
        const std::string p = Directory() + "/grid.asc_grid";
        FILE* f = std::fopen(p.c_str(), "wb");
        const int n = 3000;
        std::fprintf(f, "ncols %d\nnrows %d\nxllcorner 500000\nyllcorner 4000000\ncellsize 25\nNODATA_value -9999\n", n, n);
        std::vector<char> line(16 * n);
        for (int r = 0; r < n; ++r) {
            char* out = line.data();
            for (int c = 0; c < n; ++c) {
                out = std::to_chars(out, line.data() + line.size(), std::round(Height(r, c) * 100) / 100,
                                    std::chars_format::fixed, 2).ptr;
                *out++ = ' ';
            }
            out[-1] = '\n';
            std::fwrite(line.data(), 1, static_cast<std::size_t>(out - line.data()), f);
        }
        std::fclose(f);
        return p;
    }();
    return path;
}

const std::string& TileFile()
{
    static const std::string path = [] {
        const std::string p = Directory() + "/N45E007.hgt";
        FILE* f = std::fopen(p.c_str(), "wb");
        const int n = 3601;
        std::vector<unsigned char> row(2 * n);
        for (int r = 0; r < n; ++r) {
            for (int c = 0; c < n; ++c) {
                const auto v = static_cast<std::uint16_t>(static_cast<std::int16_t>(Height(r, c)));
                row[2 * c] = static_cast<unsigned char>(v >> 8);
                row[2 * c + 1] = static_cast<unsigned char>(v & 0xFF);
            }
            std::fwrite(row.data(), 1, row.size(), f);
        }
        std::fclose(f);
        return p;
    }();
    return path;
}

template <class Reader>
void ReadMesh(benchmark::State& state, const std::string& path)
{
    const auto bytes = static_cast<std::int64_t>(std::filesystem::file_size(path));
    std::size_t arrays = 0, peak = 0, points = 0, triangles = 0;
    for (auto _ : state) {
        const std::size_t base = gHeapInUse.load();
        gHeapPeak = base;
        {
            Reader reader{ZonUnicodeString(path)};
            reader.BeginGetPolygon();
            reader.NextPolygon();
            unsigned nv = 0, nt = 0;
            benchmark::DoNotOptimize(reader.GetPolygonPoints(nv));
            benchmark::DoNotOptimize(reader.GetTriangles(nt));
            points = nv;
            triangles = nt;
            arrays = 12 * static_cast<std::size_t>(nv) + 12 * static_cast<std::size_t>(nt);
        }
        peak = gHeapPeak.load() - base;
    }
    state.SetBytesProcessed(state.iterations() * bytes);
    state.counters["points"] = static_cast<double>(points);
    state.counters["triangles"] = static_cast<double>(triangles);
    state.counters["arrays_MB"] = static_cast<double>(arrays) / 1e6;
    state.counters["peak_heap_MB"] = static_cast<double>(peak) / 1e6;
    state.counters["peak_per_arrays"] = arrays ? static_cast<double>(peak) / static_cast<double>(arrays) : 0.0;
}

void RunCommand(benchmark::State& state, const std::string& command, const char* failure)
{
    for (auto _ : state) {
        const int status = std::system((command + " > /dev/null 2>&1").c_str());
        if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError(failure);
            break;
        }
    }
}

void ToolInfo(benchmark::State& state, const std::string& path)
{
    RunCommand(state, std::string(ZON_TOOL_PATH) + " info '" + path + "'", "zoncloud info failed");
}

// The limit of the machine: the file's bytes, read and thrown away.
void ReadBytes(benchmark::State& state, const std::string& path)
{
    RunCommand(state, "cat '" + path + "'", "cat failed");
}

void GdalReads(benchmark::State& state, const std::string& path)
{
    if (std::system("command -v gdalinfo >/dev/null 2>&1") != 0) {
        state.SkipWithError("GDAL (gdal-bin) is not installed");
        for (auto _ : state) {
        }
        return;
    }
    RunCommand(state, "gdalinfo -checksum '" + path + "'", "gdalinfo failed");
}

void BM_ArcInfoGrid3000(benchmark::State& state) { ReadMesh<ZonCldReadArcInfoGrid>(state, GridFile()); }
void BM_ArcInfoGridToolInfo(benchmark::State& state) { ToolInfo(state, GridFile()); }
void BM_ArcInfoGridCat(benchmark::State& state) { ReadBytes(state, GridFile()); }
void BM_ArcInfoGridGdal(benchmark::State& state) { GdalReads(state, GridFile()); }
void BM_Srtm3601(benchmark::State& state) { ReadMesh<ZonCldReadSRTM>(state, TileFile()); }
void BM_SrtmToolInfo(benchmark::State& state) { ToolInfo(state, TileFile()); }
void BM_SrtmCat(benchmark::State& state) { ReadBytes(state, TileFile()); }
void BM_SrtmGdal(benchmark::State& state) { GdalReads(state, TileFile()); }

}  // namespace

BENCHMARK(BM_ArcInfoGrid3000)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_ArcInfoGridToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_ArcInfoGridCat)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(1.0);
BENCHMARK(BM_ArcInfoGridGdal)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_Srtm3601)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_SrtmToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_SrtmCat)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(1.0);
BENCHMARK(BM_SrtmGdal)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);

BENCHMARK_MAIN();
