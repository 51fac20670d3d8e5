// Speed and peak memory of the measurement-file reader on a binary file of 4
// patches of 1000 x 1000 pixels (4 M records, 160 MB, a tenth of them holes),
// written on first use: the reader alone walking every grid row, the whole
// `zoncloud info FILE` process (with its peak resident memory against the
// size of the resulting point and validity arrays), and `cat FILE` beside
// them as the machine's limit.
#include <benchmark/benchmark.h>

#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <string>
#include <vector>

#include "ZonCloudReadAtos.h"

namespace {

constexpr std::uint32_t Patches = 4, Side = 1000, RecordSize = 40;
constexpr double ArrayBytes = double(Patches) * Side * Side * (3 * sizeof(float) + 1);

char gDirectory[] = "/tmp/bench_atos_XXXXXX";

template <class T>
void Put(unsigned char*& out, T value)
{
    std::memcpy(out, &value, sizeof value);
    out += sizeof value;
}

const std::string& File()
{
    static const std::string path = [] {
        if (!mkdtemp(gDirectory)) std::abort();
        std::atexit([] { std::filesystem::remove_all(gDirectory); });
        const std::string p = std::string(gDirectory) + "/patches.surf";
        std::FILE* f = std::fopen(p.c_str(), "wb");
        std::vector<unsigned char> head(512 + 76 * Patches, 0);
        unsigned char* out = head.data();
        std::memcpy(out, "%ATOSBINv4.4.3", 14);
        out += 14;
        Put<std::uint16_t>(out, 1);
        Put<std::uint32_t>(out, Patches);
        Put<std::uint32_t>(out, 76);
        Put<std::uint32_t>(out, RecordSize);
        std::uint64_t offset = head.size();
        for (std::uint32_t i = 0; i < Patches; ++i) {
            out = head.data() + 512 + 76 * i;
            for (std::uint32_t v : {std::uint32_t(offset), 0u, Side, 0u, Side * Side, 1u, 1u}) Put(out, v);
            offset += std::uint64_t{Side} * Side * RecordSize;
        }
        std::fwrite(head.data(), 1, head.size(), f);
        std::vector<unsigned char> row(Side * RecordSize);
        for (std::uint32_t i = 0; i < Patches; ++i)
            for (std::uint32_t r = 0; r < Side; ++r) {
                out = row.data();
                for (std::uint32_t c = 0; c < Side; ++c) {
                    Put(out, 0.1 * c + 200.0 * i);
                    Put(out, 0.1 * r);
                    Put(out, 0.001 * double((c * 7 + r * 13) % 1000));
                    Put(out, c);
                    Put(out, r);
                    Put(out, (c + r) % 10 == 0 ? 0.0 : 0.5);
                }
                std::fwrite(row.data(), 1, row.size(), f);
            }
        std::fclose(f);
        return p;
    }();
    return path;
}

std::int64_t FileBytes() { return static_cast<std::int64_t>(std::filesystem::file_size(File())); }

void BM_AtosReadGrids(benchmark::State& state)
{
    std::uint64_t valid = 0;
    for (auto _ : state) {
        ZonCloudReadAtos reader{ZonUnicodeString(File())};
        reader.BeginGetGrid();
        valid = 0;
        while (reader.NextGrid()) {
            reader.BeginGetGridPoints();
            unsigned n = 0;
            const unsigned char* flags = nullptr;
            while (reader.GetGridPoints(n, flags))
                for (unsigned i = 0; i < n; ++i) valid += flags[i];
        }
    }
    state.SetBytesProcessed(state.iterations() * FileBytes());
    state.counters["valid_nodes"] = static_cast<double>(valid);
}

// Runs a command through the shell and returns its children's peak resident
// memory in kB (0 on failure).
long RunMeasured(const std::string& command)
{
    const pid_t pid = fork();
    if (pid == 0) {
        execl("/bin/sh", "sh", "-c", command.c_str(), static_cast<char*>(nullptr));
        _exit(127);
    }
    int status = 0;
    rusage usage{};
    if (wait4(pid, &status, 0, &usage) != pid || !WIFEXITED(status) || WEXITSTATUS(status) != 0) return 0;
    return usage.ru_maxrss;
}

void Process(benchmark::State& state, const std::string& command, bool arrays)
{
    long peak = 0;
    for (auto _ : state) {
        peak = RunMeasured(command);
        if (peak == 0) {
            state.SkipWithError(("failed: " + command).c_str());
            return;
        }
    }
    state.SetBytesProcessed(state.iterations() * FileBytes());
    state.counters["peak_rss_MB"] = peak / 1e3;
    if (arrays) {
        state.counters["arrays_MB"] = ArrayBytes / 1e6;
        state.counters["peak_per_arrays"] = peak * 1e3 / ArrayBytes;
    }
}

void BM_AtosToolInfo(benchmark::State& state)
{
    Process(state, std::string(ZON_TOOL_PATH) + " info '" + File() + "' > /dev/null", true);
}

void BM_CatFile(benchmark::State& state) { Process(state, "cat '" + File() + "' > /dev/null", false); }

}  // namespace

BENCHMARK(BM_AtosReadGrids)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_AtosToolInfo)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);
BENCHMARK(BM_CatFile)->Unit(benchmark::kMillisecond)->UseRealTime()->MinTime(2.0);

BENCHMARK_MAIN();
