// Reading speed of large files on every core, beside what the machine allows
// in the same run: the free ASCII file of 5 M points ("x y z", six decimals,
// about 166 MB), the text STL of 200 k triangles and the binary STL of 1 M
// triangles (both about 50 MB) of the other benchmarks. For each file:
//   Cat        `cat FILE > /dev/null`: how fast the bytes come at all;
//   ParseLimit the file read whole and every number parsed with
//              std::from_chars on one core (text files);
//   Admesh     `admesh -c FILE` (binary STL, no merging), when installed;
//   Reader     the reader in this process, chunked on the worker pool, and
//              OneThread, the same on the line-by-line path;
//   ToolInfo   the whole `zoncloud info FILE` process.
// Figures are MB/s of file (wall time); run with a warm page cache.
#include <benchmark/benchmark.h>

#include <sys/wait.h>
#include <unistd.h>

#include <charconv>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "ZonCloudChunkedText.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonCloudReadStl.h"

namespace {

namespace fs = std::filesystem;

// Removed at exit; a plain array so that it outlives every static object.
char gDirectory[] = "/tmp/bench_parallel_XXXXXX";
std::string InDirectory(const char* name)
{
    static const std::string dir = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { fs::remove_all(gDirectory); });
        return std::string(gDirectory);
    }();
    return dir + "/" + name;
}

const std::string& AsciiFile()
{
    static const std::string path = [] {
        const std::string p = InDirectory("plain.asc");
        FILE* f = std::fopen(p.c_str(), "wb");
        std::mt19937_64 random(42);
        std::uniform_int_distribution<long long> micros(-1'000'000'000LL, 1'000'000'000LL);
        for (int i = 0; i < 5'000'000; ++i) {
            const long long v[3] = {micros(random), micros(random), micros(random)};
            std::fprintf(f, "%s%lld.%06lld %s%lld.%06lld %s%lld.%06lld\n", v[0] < 0 ? "-" : "", std::llabs(v[0]) / 1000000,
                         std::llabs(v[0]) % 1000000, v[1] < 0 ? "-" : "", std::llabs(v[1]) / 1000000,
                         std::llabs(v[1]) % 1000000, v[2] < 0 ? "-" : "", std::llabs(v[2]) / 1000000,
                         std::llabs(v[2]) % 1000000);
        }
        std::fclose(f);
        return p;
    }();
    return path;
}

// A regular height field, every vertex shared by six triangles.
template <class Facet>
void ForEachFacet(int columns, int rows, Facet facet)
{
    const auto at = [](int x, int y) { return 10.0f * std::sin(0.011f * x) * std::cos(0.017f * y) + 0.001f * x; };
    for (int y = 0; y < rows; ++y)
        for (int x = 0; x < columns; ++x) {
            const float x0 = 0.5f * x, x1 = 0.5f * (x + 1), y0 = 0.5f * y, y1 = 0.5f * (y + 1);
            const float a[3] = {x0, y0, at(x, y)}, b[3] = {x1, y0, at(x + 1, y)};
            const float c[3] = {x0, y1, at(x, y + 1)}, d[3] = {x1, y1, at(x + 1, y + 1)};
            facet(a, b, c);
            facet(b, d, c);
        }
}

const std::string& TextStlFile()
{
    static const std::string path = [] {
        const std::string p = InDirectory("field_text.stl");
        FILE* f = std::fopen(p.c_str(), "wb");
        std::fputs("solid height field\n", f);
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
        ForEachFacet(500, 200, [&](const float* a, const float* b, const float* c) {
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

const std::string& BinaryStlFile()
{
    static const std::string path = [] {
        const std::string p = InDirectory("field.stl");
        FILE* f = std::fopen(p.c_str(), "wb");
        char header[80] = "solid height field";
        std::fwrite(header, 1, 80, f);
        const std::uint32_t count = 1'000'000;
        std::fwrite(&count, 4, 1, f);
        ForEachFacet(1000, 500, [f](const float* a, const float* b, const float* c) {
            const float record[12] = {0, 0, 1, a[0], a[1], a[2], b[0], b[1], b[2], c[0], c[1], c[2]};
            std::fwrite(record, 4, 12, f);
            std::fwrite("\0\0", 1, 2, f);
        });
        std::fclose(f);
        return p;
    }();
    return path;
}

double Since(std::chrono::steady_clock::time_point start)
{
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

void Report(benchmark::State& state, const std::string& path, double seconds)
{
    const auto bytes = static_cast<double>(fs::file_size(path));
    state.counters["MB/s"] = seconds > 0 ? bytes * 1e-6 * static_cast<double>(state.iterations()) / seconds : 0.0;
    state.counters["file MB"] = bytes * 1e-6;
}

// A whole process with its output thrown away; false when it failed.
bool RunProcess(std::vector<const char*> argv)
{
    argv.push_back(nullptr);
    const pid_t child = fork();
    if (child == 0) {
        if (!std::freopen("/dev/null", "w", stdout) || !std::freopen("/dev/null", "w", stderr)) _exit(127);
        execvp(argv[0], const_cast<char* const*>(argv.data()));
        _exit(127);
    }
    int status = 0;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

void Process(benchmark::State& state, const std::string& path, std::vector<const char*> argv)
{
    argv.push_back(path.c_str());
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state)
        if (!RunProcess(argv)) {
            state.SkipWithError((std::string(argv[0]) + " failed or is not installed").c_str());
            return;
        }
    Report(state, path, Since(start));
}

// The file read whole, then every number in it parsed, on one core.
void ParseLimit(benchmark::State& state, const std::string& path)
{
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state) {
        std::string text(fs::file_size(path), '\0');
        FILE* f = std::fopen(path.c_str(), "rb");
        if (!f || std::fread(text.data(), 1, text.size(), f) != text.size()) std::abort();
        std::fclose(f);
        double sum = 0.0;
        const char* p = text.data();
        const char* end = p + text.size();
        while (p < end) {
            const char c = *p;
            if ((c >= '0' && c <= '9') || c == '-' || c == '+' || c == '.') {
                double value = 0.0;
                const auto result = std::from_chars(p, end, value);
                if (result.ec == std::errc()) {
                    sum += value;
                    p = result.ptr;
                    continue;
                }
            }
            ++p;
        }
        benchmark::DoNotOptimize(sum);
    }
    Report(state, path, Since(start));
}

void ReadAscii(benchmark::State& state, bool oneThread)
{
    const std::string& path = AsciiFile();
    ZonCloudChunkedText::SetThreshold(oneThread ? UINT64_MAX : 0);
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state) {
        ZonCloudReadAsciiLibre reader{ZonUnicodeString(path)};
        unsigned count = 0;
        benchmark::DoNotOptimize(reader.GetPoints(count));
        if (count != 5'000'000u) state.SkipWithError("wrong number of points");
    }
    Report(state, path, Since(start));
    ZonCloudChunkedText::SetThreshold(0);
}

void ReadStl(benchmark::State& state, const std::string& path, bool oneThread)
{
    ZonCloudChunkedText::SetThreshold(oneThread ? UINT64_MAX : 0);
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state) {
        ZonCloudReadStl reader{ZonUnicodeString(path)};
        reader.BeginGetPolygon();
        reader.NextPolygon();
        unsigned n = 0;
        benchmark::DoNotOptimize(reader.GetPolygonPoints(n));
        benchmark::DoNotOptimize(reader.GetTriangles(n));
    }
    Report(state, path, Since(start));
    ZonCloudChunkedText::SetThreshold(0);
}

void BM_AsciiCat(benchmark::State& s) { Process(s, AsciiFile(), {"cat"}); }
void BM_AsciiParseLimit(benchmark::State& s) { ParseLimit(s, AsciiFile()); }
void BM_AsciiOneThread(benchmark::State& s) { ReadAscii(s, true); }
void BM_AsciiReader(benchmark::State& s) { ReadAscii(s, false); }
void BM_AsciiToolInfo(benchmark::State& s) { Process(s, AsciiFile(), {ZON_TOOL_PATH, "info"}); }

void BM_TextStlCat(benchmark::State& s) { Process(s, TextStlFile(), {"cat"}); }
void BM_TextStlParseLimit(benchmark::State& s) { ParseLimit(s, TextStlFile()); }
void BM_TextStlOneThread(benchmark::State& s) { ReadStl(s, TextStlFile(), true); }
void BM_TextStlReader(benchmark::State& s) { ReadStl(s, TextStlFile(), false); }
void BM_TextStlToolInfo(benchmark::State& s) { Process(s, TextStlFile(), {ZON_TOOL_PATH, "info"}); }

void BM_BinaryStlCat(benchmark::State& s) { Process(s, BinaryStlFile(), {"cat"}); }
void BM_BinaryStlAdmesh(benchmark::State& s) { Process(s, BinaryStlFile(), {"admesh", "-c"}); }
void BM_BinaryStlOneThread(benchmark::State& s) { ReadStl(s, BinaryStlFile(), true); }
void BM_BinaryStlReader(benchmark::State& s) { ReadStl(s, BinaryStlFile(), false); }
void BM_BinaryStlToolInfo(benchmark::State& s) { Process(s, BinaryStlFile(), {ZON_TOOL_PATH, "info"}); }

}  // namespace

// Five runs of five: the medians are what to compare, this machine drifts by
// ten per cent from one minute to the next.
#define ZON_FIGURE(name) \
    BENCHMARK(name)->Unit(benchmark::kMillisecond)->UseRealTime()->Iterations(5)->Repetitions(5)->ReportAggregatesOnly(true)
ZON_FIGURE(BM_AsciiCat);
ZON_FIGURE(BM_AsciiParseLimit);
ZON_FIGURE(BM_AsciiOneThread);
ZON_FIGURE(BM_AsciiReader);
ZON_FIGURE(BM_AsciiToolInfo);
ZON_FIGURE(BM_TextStlCat);
ZON_FIGURE(BM_TextStlParseLimit);
ZON_FIGURE(BM_TextStlOneThread);
ZON_FIGURE(BM_TextStlReader);
ZON_FIGURE(BM_TextStlToolInfo);
ZON_FIGURE(BM_BinaryStlCat);
ZON_FIGURE(BM_BinaryStlAdmesh);
ZON_FIGURE(BM_BinaryStlOneThread);
ZON_FIGURE(BM_BinaryStlReader);
ZON_FIGURE(BM_BinaryStlToolInfo);

BENCHMARK_MAIN();
