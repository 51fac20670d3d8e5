// Speed of the profile, range-grid and fringe-grid readers, each on a file of
// 4 M points written on first use: the reader alone walking its scans or grid
// rows, the whole `zoncloud info FILE` process, and `cat FILE` beside them as
// the machine's limit.
#include <benchmark/benchmark.h>

#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include "../tests/RangeScannerFiles.h"
#include "ZonCloudReadHyscanBin.h"
#include "ZonCloudReadKreonBin.h"
#include "ZonCloudReadOptonBin.h"

namespace {

constexpr int Side = 2000;  // 2000 x 2000 = 4 M points

char gDirectory[] = "/tmp/bench_range_XXXXXX";

const std::string& Directory()
{
    static const std::string path = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        return std::string(gDirectory);
    }();
    return path;
}

std::string Save(const std::string& name, const std::string& bytes)
{
    const std::string path = Directory() + "/" + name;
    std::ofstream(path, std::ios::binary) << bytes;
    return path;
}

float Height(int row, int column) { return 0.001f * static_cast<float>((column * 7 + row * 13) % 1000); }

// 20 groups of 100 profiles of 2000 points, x y z each.
const std::string& HyscanPath()
{
    static const std::string path = [] {
        std::vector<zontest::HyscanGroup> groups(20);
        for (int p = 0; p < Side; ++p) {
            zontest::HyscanProfile profile{Side, {}};
            profile.values.reserve(3 * Side);
            for (int i = 0; i < Side; ++i)
                profile.values.insert(profile.values.end(), {0.1f * static_cast<float>(i), 0.1f * static_cast<float>(p), Height(p, i)});
            groups[static_cast<std::size_t>(p / 100)].push_back(std::move(profile));
        }
        return Save("profiles.hym", zontest::HyscanFile(groups));
    }();
    return path;
}

// A planar grid with a hole every tenth node.
const std::string& KreonPath()
{
    static const std::string path = [] {
        zontest::KreonGrid grid;
        grid.columns = grid.rows = Side;
        grid.columnStep = grid.rowStep = 0.1f;
        grid.values.reserve(std::size_t{Side} * Side);
        for (int r = 0; r < Side; ++r)
            for (int c = 0; c < Side; ++c) grid.values.push_back((r + c) % 10 == 0 ? -32767.0f : Height(r, c));
        return Save("grid.grk", zontest::KreonFile(grid));
    }();
    return path;
}

const std::string& OptonPath()
{
    static const std::string path = [] {
        zontest::OptonGrid grid;
        grid.rows = grid.columns = Side;
        grid.high = {200, 200, 1};
        grid.records.reserve(std::size_t{Side} * Side);
        for (int r = 0; r < Side; ++r)
            for (int c = 0; c < Side; ++c)
                grid.records.push_back({0.1f * static_cast<float>(c), 0.1f * static_cast<float>(r), Height(r, c),
                                        (r + c) % 10 == 0 ? -1.0f : 0.0f});
        return Save("grid.xyz", zontest::OptonFile(grid));
    }();
    return path;
}

std::int64_t Bytes(const std::string& path) { return static_cast<std::int64_t>(std::filesystem::file_size(path)); }

template <class Reader>
std::uint64_t WalkRows(Reader& reader)
{
    std::uint64_t valid = 0;
    reader.BeginGetGrid();
    while (reader.NextGrid()) {
        reader.BeginGetGridPoints();
        unsigned n = 0;
        const unsigned char* flags = nullptr;
        while (reader.GetGridPoints(n, flags))
            for (unsigned i = 0; i < n; ++i) valid += flags[i];
    }
    return valid;
}

void BM_HyscanReadScans(benchmark::State& state)
{
    std::uint64_t points = 0;
    for (auto _ : state) {
        ZonCloudReadHyscanBin reader{ZonUnicodeString(HyscanPath())};
        reader.BeginGetSetOfScans();
        points = 0;
        while (reader.NextSetOfScans()) {
            reader.BeginGetScan();
            while (reader.NextScan()) {
                unsigned n = 0;
                reader.GetScanPoints(n);
                points += n;
            }
        }
    }
    state.SetBytesProcessed(state.iterations() * Bytes(HyscanPath()));
    state.counters["points"] = static_cast<double>(points);
}

template <class Reader>
void ReadRows(benchmark::State& state, const std::string& path)
{
    std::uint64_t valid = 0;
    for (auto _ : state) {
        Reader reader{ZonUnicodeString(path)};
        valid = WalkRows(reader);
    }
    state.SetBytesProcessed(state.iterations() * Bytes(path));
    state.counters["valid_nodes"] = static_cast<double>(valid);
}

void BM_KreonReadRows(benchmark::State& state) { ReadRows<ZonCloudReadKreonBin>(state, KreonPath()); }
void BM_OptonReadRows(benchmark::State& state) { ReadRows<ZonCloudReadOptonBin>(state, OptonPath()); }

bool RunCommand(const std::string& command)
{
    const pid_t pid = fork();
    if (pid == 0) {
        execl("/bin/sh", "sh", "-c", command.c_str(), static_cast<char*>(nullptr));
        _exit(127);
    }
    int status = 0;
    return waitpid(pid, &status, 0) == pid && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

void Process(benchmark::State& state, const std::string& command, const std::string& path)
{
    for (auto _ : state)
        if (!RunCommand(command)) {
            state.SkipWithError(("failed: " + command).c_str());
            return;
        }
    state.SetBytesProcessed(state.iterations() * Bytes(path));
}

void Info(benchmark::State& state, const std::string& path)
{
    Process(state, std::string(ZON_TOOL_PATH) + " info '" + path + "' > /dev/null", path);
}
void Cat(benchmark::State& state, const std::string& path) { Process(state, "cat '" + path + "' > /dev/null", path); }

void BM_HyscanToolInfo(benchmark::State& state) { Info(state, HyscanPath()); }
void BM_HyscanCat(benchmark::State& state) { Cat(state, HyscanPath()); }
void BM_KreonToolInfo(benchmark::State& state) { Info(state, KreonPath()); }
void BM_KreonCat(benchmark::State& state) { Cat(state, KreonPath()); }
void BM_OptonToolInfo(benchmark::State& state) { Info(state, OptonPath()); }
void BM_OptonCat(benchmark::State& state) { Cat(state, OptonPath()); }

}  // namespace

BENCHMARK(BM_HyscanReadScans)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_HyscanToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_HyscanCat)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_KreonReadRows)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_KreonToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_KreonCat)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_OptonReadRows)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_OptonToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_OptonCat)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);

BENCHMARK_MAIN();
