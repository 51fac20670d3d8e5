// Reading speed of free ASCII point files: 5 million points written as
// "x y z" and as "X x Y y Z z" with six decimals (about 166 MB and 196 MB),
// analysed and delivered with GetPoints by the reader itself, and read by the
// whole `zoncloud info FILE` process. Figures are MB/s of file read.
#include <benchmark/benchmark.h>

#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <memory>
#include <random>
#include <string>

#include "ZonCloudReadAsciiLibre.h"

namespace {

namespace fs = std::filesystem;

constexpr int kPoints = 5'000'000;

// Appends v / 1e6 with exactly six decimals.
char* WriteMicros(char* out, long long v)
{
    if (v < 0) {
        *out++ = '-';
        v = -v;
    }
    const long long whole = v / 1'000'000;
    const long long fraction = v % 1'000'000;
    out += std::snprintf(out, 24, "%lld", whole);
    *out++ = '.';
    for (long long div = 100'000; div > 0; div /= 10) *out++ = static_cast<char>('0' + (fraction / div) % 10);
    return out;
}

// The two test files, written once into a temporary folder removed at exit.
class Files {
public:
    static Files& Get()
    {
        static Files files;
        return files;
    }
    const std::string& Plain() const { return plain_; }
    const std::string& Labelled() const { return labelled_; }

private:
    Files()
    {
        std::string pattern = (fs::temp_directory_path() / "zon-bench-ascii-XXXXXX").string();
        if (!mkdtemp(pattern.data())) std::abort();
        dir_ = pattern;
        plain_ = (dir_ / "plain.asc").string();
        labelled_ = (dir_ / "labelled.asc").string();
        Generate();
    }
    ~Files()
    {
        std::error_code ignored;
        fs::remove_all(dir_, ignored);
    }

    void Generate() const
    {
        std::unique_ptr<FILE, int (*)(FILE*)> plain(std::fopen(plain_.c_str(), "wb"), &std::fclose);
        std::unique_ptr<FILE, int (*)(FILE*)> labelled(std::fopen(labelled_.c_str(), "wb"), &std::fclose);
        if (!plain || !labelled) std::abort();
        std::mt19937_64 random(42);
        std::uniform_int_distribution<long long> micros(-1'000'000'000LL, 1'000'000'000LL);  // +-1000.000000
        char a[128];
        char b[128];
        for (int i = 0; i < kPoints; ++i) {
            const long long v[3] = {micros(random), micros(random), micros(random)};
            char* p = a;
            char* q = b;
            static const char kLabels[3] = {'X', 'Y', 'Z'};
            for (int k = 0; k < 3; ++k) {
                if (k > 0) *p++ = ' ';
                if (k > 0) *q++ = ' ';
                *q++ = kLabels[k];
                *q++ = ' ';
                p = WriteMicros(p, v[k]);
                q = WriteMicros(q, v[k]);
            }
            *p++ = '\n';
            *q++ = '\n';
            std::fwrite(a, 1, static_cast<std::size_t>(p - a), plain.get());
            std::fwrite(b, 1, static_cast<std::size_t>(q - b), labelled.get());
        }
    }

    fs::path dir_;
    std::string plain_;
    std::string labelled_;
};

// Bytes per second of wall time, measured here so that the figure of the
// child process (whose CPU time the framework does not see) means the same.
void ReportSpeed(benchmark::State& state, const std::string& path, double seconds)
{
    const auto bytes = static_cast<std::int64_t>(fs::file_size(path));
    state.SetBytesProcessed(bytes * state.iterations());
    state.counters["MB/s"] = seconds > 0 ? static_cast<double>(bytes) * 1e-6 * state.iterations() / seconds : 0.0;
    state.counters["file MB"] = static_cast<double>(bytes) * 1e-6;
}

double Since(std::chrono::steady_clock::time_point start)
{
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// Analysis and GetPoints (or GetPointsDouble) in this process.
void ReadWithReader(benchmark::State& state, const std::string& path, bool doublePrecision)
{
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state) {
        ZonCloudReadAsciiLibre reader{ZonUnicodeString(path)};
        reader.SetDoublePrecision(doublePrecision);
        unsigned count = 0;
        if (doublePrecision)
            benchmark::DoNotOptimize(reader.GetPointsDouble(count));
        else
            benchmark::DoNotOptimize(reader.GetPoints(count));
        if (count != static_cast<unsigned>(kPoints)) state.SkipWithError("wrong number of points");
    }
    ReportSpeed(state, path, Since(start));
}

void BM_ReaderPlain(benchmark::State& state) { ReadWithReader(state, Files::Get().Plain(), false); }
void BM_ReaderLabelled(benchmark::State& state) { ReadWithReader(state, Files::Get().Labelled(), false); }
void BM_ReaderPlainDouble(benchmark::State& state) { ReadWithReader(state, Files::Get().Plain(), true); }

// The whole `zoncloud info FILE` process, start to exit.
void RunToolInfo(benchmark::State& state, const std::string& path)
{
    const auto start = std::chrono::steady_clock::now();
    for (auto _ : state) {
        const pid_t child = fork();
        if (child == 0) {
            // Only the exit status and the time matter here.
            if (!std::freopen("/dev/null", "w", stdout) || !std::freopen("/dev/null", "w", stderr)) _exit(127);
            execl(ZON_TOOL_PATH, ZON_TOOL_PATH, "info", path.c_str(), static_cast<char*>(nullptr));
            _exit(127);
        }
        int status = 0;
        if (child < 0 || waitpid(child, &status, 0) != child || !WIFEXITED(status) || WEXITSTATUS(status) != 0) {
            state.SkipWithError("zoncloud info failed");
            break;
        }
    }
    ReportSpeed(state, path, Since(start));
}

void BM_ToolInfoPlain(benchmark::State& state) { RunToolInfo(state, Files::Get().Plain()); }
void BM_ToolInfoLabelled(benchmark::State& state) { RunToolInfo(state, Files::Get().Labelled()); }

}  // namespace

BENCHMARK(BM_ReaderPlain)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_ReaderLabelled)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_ReaderPlainDouble)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_ToolInfoPlain)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();
BENCHMARK(BM_ToolInfoLabelled)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();

BENCHMARK_MAIN();
