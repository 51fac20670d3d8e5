// A series of 100 slices of 512 x 512 pixels (26 M points) packed in a ".dcz"
// archive, written on first use: the whole `zoncloud info FILE` process with
// its peak resident memory, the reader alone, and beside them `unzip -p FILE`,
// the machine's time to inflate the same members, as the limit.
#include <benchmark/benchmark.h>

#include <stdlib.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <zip.h>

#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <string>
#include <vector>

#include "ZonCloudReadDicom.h"

namespace {

constexpr int kSlices = 100;
constexpr int kSide = 512;

void Put16(std::string& s, std::uint32_t v)
{
    s += static_cast<char>(v & 0xFF);
    s += static_cast<char>((v >> 8) & 0xFF);
}

void Element(std::string& s, std::uint16_t group, std::uint16_t element, const char* vr, const std::string& value)
{
    Put16(s, group);
    Put16(s, element);
    s += vr;
    const bool isLong = std::string(vr) == "OW";
    if (isLong) {
        Put16(s, 0);
        Put16(s, static_cast<std::uint32_t>(value.size() & 0xFFFF));
        Put16(s, static_cast<std::uint32_t>(value.size() >> 16));
    } else {
        Put16(s, static_cast<std::uint32_t>(value.size()));
    }
    s += value;
}

std::string Even(std::string text) { return text.size() % 2 ? text + ' ' : text; }

// A CT-like slice: a disc of noisy soft tissue with a denser ring, in air;
// the noise keeps the archive about as large as a real series'.
std::string SliceBytes(int index)
{
    std::string s(128, '\0');
    s += "DICM";
    Element(s, 0x0002, 0x0010, "UI", std::string("1.2.840.10008.1.2.1") + '\0');
    Element(s, 0x0020, 0x0013, "IS", Even(std::to_string(kSlices - index)));
    Element(s, 0x0020, 0x0032, "DS", Even("-128\\-128\\" + std::to_string(2.5 * (kSlices - index))));
    Element(s, 0x0020, 0x0037, "DS", "1\\0\\0\\0\\1\\0 ");
    std::string us;
    Put16(us, 1);
    Element(s, 0x0028, 0x0002, "US", us);
    Element(s, 0x0028, 0x0004, "CS", "MONOCHROME2 ");
    us.clear();
    Put16(us, kSide);
    Element(s, 0x0028, 0x0010, "US", us);
    Element(s, 0x0028, 0x0011, "US", us);
    Element(s, 0x0028, 0x0030, "DS", "0.5\\0.5 ");
    us.clear();
    Put16(us, 16);
    Element(s, 0x0028, 0x0100, "US", us);
    Element(s, 0x0028, 0x1050, "DS", "40");
    Element(s, 0x0028, 0x1051, "DS", "400 ");
    Element(s, 0x0028, 0x1052, "DS", "-1024 ");
    Element(s, 0x0028, 0x1053, "DS", "1 ");
    std::string pixels;
    pixels.reserve(2 * kSide * kSide);
    std::uint32_t noise = 12345u + static_cast<std::uint32_t>(index);
    for (int y = 0; y < kSide; ++y)
        for (int x = 0; x < kSide; ++x) {
            const double r = std::hypot(x - 256.0, y - 256.0);
            noise = noise * 1664525u + 1013904223u;
            const int value = r > 200 ? 24 : r > 180 ? 2000 : 1000 + static_cast<int>((noise >> 16) % 120);
            Put16(pixels, static_cast<std::uint32_t>(value));
        }
    Element(s, 0x7FE0, 0x0010, "OW", pixels);
    return s;
}

char gDirectory[] = "/tmp/bench_dicom_XXXXXX";

const std::string& Archive()
{
    static const std::string path = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        const std::string file = std::string(gDirectory) + "/series.dcz";
        int error = 0;
        zip_t* archive = zip_open(file.c_str(), ZIP_CREATE | ZIP_TRUNCATE, &error);
        if (!archive) std::abort();
        std::vector<std::string> slices;
        slices.reserve(kSlices);
        for (int i = 0; i < kSlices; ++i) {
            slices.push_back(SliceBytes(i));
            zip_source_t* source = zip_source_buffer(archive, slices.back().data(), slices.back().size(), 0);
            const std::string name = "slice" + std::to_string(i) + ".dcm";
            if (!source || zip_file_add(archive, name.c_str(), source, 0) < 0) std::abort();
        }
        if (zip_close(archive) != 0) std::abort();
        return file;
    }();
    return path;
}

// Runs a command to its end; false when it fails. `peakKiB` gets its peak resident size.
bool RunChild(const std::vector<std::string>& arguments, long& peakKiB)
{
    const pid_t child = fork();
    if (child == 0) {
        if (!std::freopen("/dev/null", "w", stdout) || !std::freopen("/dev/null", "w", stderr)) _exit(127);
        std::vector<char*> argv;
        for (const std::string& a : arguments) argv.push_back(const_cast<char*>(a.c_str()));
        argv.push_back(nullptr);
        execvp(argv[0], argv.data());
        _exit(127);
    }
    int status = 0;
    rusage usage{};
    if (child < 0 || wait4(child, &status, 0, &usage) != child) return false;
    peakKiB = usage.ru_maxrss;
    return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

void RunTool(benchmark::State& state, const std::vector<std::string>& arguments)
{
    long peak = 0, worst = 0;
    for (auto _ : state) {
        if (!RunChild(arguments, peak)) {
            state.SkipWithError("the command failed");
            break;
        }
        worst = std::max(worst, peak);
    }
    state.counters["peak MB"] = static_cast<double>(worst) / 1024.0;
    state.counters["archive MB"] = static_cast<double>(std::filesystem::file_size(Archive())) * 1e-6;
}

void BM_ToolInfo(benchmark::State& state) { RunTool(state, {ZON_TOOL_PATH, "info", Archive()}); }
void BM_UnzipLimit(benchmark::State& state) { RunTool(state, {"unzip", "-p", Archive()}); }

void BM_Reader(benchmark::State& state)
{
    for (auto _ : state) {
        ZonCloudReadDicom reader{ZonUnicodeString(Archive())};
        unsigned count = 0;
        benchmark::DoNotOptimize(reader.GetPoints(count));
        if (count != static_cast<unsigned>(kSlices * kSide * kSide)) state.SkipWithError("wrong number of points");
    }
}

}  // namespace

BENCHMARK(BM_UnzipLimit)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_Reader)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_ToolInfo)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();

BENCHMARK_MAIN();
