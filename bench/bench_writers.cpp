// Writing speed: one million points as a free ASCII cloud file (point by
// point, and as one array on one thread and on all), one million triangles
// (a strip-free grid mesh) exported as binary and text STL through the output
// document, and the whole `zoncloud convert in.asc out.asc` process on the
// 5 M-point free ASCII file of the reading benchmark beside fprintf writing
// the same lines in this process. Figures are MB/s of file written.
#include <benchmark/benchmark.h>

#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "ZonCldSTLOutputDocument.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonCloudWorkerPool.h"
#include "ZonCloudWriteAsciiLibre.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIReporter.h"

namespace {

namespace fs = std::filesystem;

constexpr int kPoints = 1'000'000;
constexpr unsigned kSide = 708;  // 707 x 707 cells x 2 = 999,698 triangles

std::string TempPath(const char* name)
{
    return (fs::temp_directory_path() / (std::string("zon_bench_") + name + "_" + std::to_string(::getpid()))).string();
}

void BM_AsciiCloud(benchmark::State& state)
{
    std::mt19937 random(7);
    std::uniform_real_distribution<double> coordinate(-1000.0, 1000.0);
    std::vector<double> points(3 * kPoints);
    for (double& v : points) v = coordinate(random);
    const std::string path = TempPath("cloud.asc");
    for (auto _ : state) {
        ZonCloudWriteAsciiLibre writer{ZonUnicodeString(path)};
        writer.BeginWritePoints(kPoints);
        for (int i = 0; i < kPoints; ++i) writer.WritePointDouble(points.data() + 3 * i);
        writer.EndWritePoints();
    }
    const auto bytes = static_cast<std::int64_t>(fs::file_size(path));
    state.SetBytesProcessed(bytes * state.iterations());
    state.counters["points"] = kPoints;
    fs::remove(path);
}
BENCHMARK(BM_AsciiCloud)->Unit(benchmark::kMillisecond)->UseRealTime();

// The same points handed as one array, on one thread and on the default count.
void BM_AsciiCloudArray(benchmark::State& state)
{
    std::mt19937 random(7);
    std::uniform_real_distribution<double> coordinate(-1000.0, 1000.0);
    std::vector<double> points(3 * kPoints);
    for (double& v : points) v = coordinate(random);
    const std::string path = TempPath("array.asc");
    ZonCloudWorkerPool::SetThreadCount(static_cast<unsigned>(state.range(0)));
    for (auto _ : state) {
        ZonCloudWriteAsciiLibre writer{ZonUnicodeString(path)};
        writer.BeginWritePoints(kPoints);
        writer.WritePoints({nullptr, points.data(), nullptr, nullptr, kPoints});
        writer.EndWritePoints();
    }
    ZonCloudWorkerPool::SetThreadCount(0);
    const auto bytes = static_cast<std::int64_t>(fs::file_size(path));
    state.SetBytesProcessed(bytes * state.iterations());
    state.counters["threads"] = static_cast<double>(state.range(0) ? state.range(0) : ZonCloudWorkerPool::ThreadCount());
    fs::remove(path);
}
BENCHMARK(BM_AsciiCloudArray)->Arg(1)->Arg(0)->ArgName("threads")->Unit(benchmark::kMillisecond)->UseRealTime();

ZonIExchInputDocument_var GridMesh()
{
    std::vector<float> coords;
    coords.reserve(3 * kSide * kSide);
    for (unsigned r = 0; r < kSide; ++r)
        for (unsigned c = 0; c < kSide; ++c) coords.insert(coords.end(), {float(c), float(r), float((r * c) % 17)});
    std::vector<unsigned> offsets;
    for (unsigned r = 0; r + 1 < kSide; ++r)
        for (unsigned c = 0; c + 1 < kSide; ++c) {
            const unsigned b = r * kSide + c;
            offsets.insert(offsets.end(), {3 * b, 3 * (b + kSide), 3 * (b + 1)});
            offsets.insert(offsets.end(), {3 * (b + 1), 3 * (b + kSide), 3 * (b + kSide + 1)});
        }
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords(std::move(coords));
    face->SetTriangles(std::move(offsets));
    auto node = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeSolid);
    node->AddFace(face);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(node);
    auto document = std::make_shared<ZonExchMemoryDocument>("grid");
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);
    return document;
}

void BM_StlExport(benchmark::State& state)
{
    const bool binary = state.range(0) != 0;
    const ZonIExchInputDocument_var document = GridMesh();
    const std::string path = TempPath(binary ? "binary.stl" : "text.stl");
    ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonCollectingReporter>());
    for (auto _ : state) {
        ZonCldSTLOutputDocument output;
        output.SetFileName(path);
        output.SetOptions({"BinaryState"}, {binary ? "1" : "0"});
        output.Open();
        output.Write(document);
        output.Close();
        output.Release();
    }
    const auto bytes = static_cast<std::int64_t>(fs::file_size(path));
    state.SetBytesProcessed(bytes * state.iterations());
    state.counters["triangles"] = 2.0 * (kSide - 1) * (kSide - 1);
    fs::remove(path);
}
BENCHMARK(BM_StlExport)->Arg(1)->Arg(0)->ArgName("binary")->Unit(benchmark::kMillisecond)->UseRealTime();

// ---- The whole convert process against fprintf ------------------------------

constexpr int kFilePoints = 5'000'000;

// Appends v / 1e6 with exactly six decimals.
char* WriteMicros(char* out, long long v)
{
    if (v < 0) {
        *out++ = '-';
        v = -v;
    }
    out += std::snprintf(out, 24, "%lld.%06lld", v / 1'000'000, v % 1'000'000);
    return out;
}

// The reading benchmark's "x y z" file of 5 M points (about 166 MB), made
// once in a temporary folder removed at exit.
class InputFile {
public:
    static InputFile& Get()
    {
        static InputFile file;
        return file;
    }
    const std::string& Path() const { return path_; }
    std::string Output(const char* name) const { return (dir_ / name).string(); }

private:
    InputFile()
    {
        std::string pattern = (fs::temp_directory_path() / "zon-bench-write-XXXXXX").string();
        if (!mkdtemp(pattern.data())) std::abort();
        dir_ = pattern;
        path_ = (dir_ / "plain.asc").string();
        std::unique_ptr<FILE, int (*)(FILE*)> out(std::fopen(path_.c_str(), "wb"), &std::fclose);
        if (!out) std::abort();
        std::mt19937_64 random(42);
        std::uniform_int_distribution<long long> micros(-1'000'000'000LL, 1'000'000'000LL);
        char line[128];
        for (int i = 0; i < kFilePoints; ++i) {
            char* p = line;
            for (int k = 0; k < 3; ++k) {
                if (k > 0) *p++ = ' ';
                p = WriteMicros(p, micros(random));
            }
            *p++ = '\n';
            std::fwrite(line, 1, static_cast<std::size_t>(p - line), out.get());
        }
    }
    ~InputFile()
    {
        std::error_code ignored;
        fs::remove_all(dir_, ignored);
    }

    fs::path dir_;
    std::string path_;
};

double Seconds(const std::function<void()>& run)
{
    const auto start = std::chrono::steady_clock::now();
    run();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

double LoadAverage()
{
    double load = 0;
    std::ifstream("/proc/loadavg") >> load;
    return load;
}

// What a plain C program does: the points the import gives (single
// precision, as convert reads them) written with fprintf, one line each.
void FprintfLines(const std::string& path, const float* xyz, unsigned count)
{
    FILE* out = std::fopen(path.c_str(), "w");
    if (!out) std::abort();
    for (unsigned i = 0; i < count; ++i)
        std::fprintf(out, "X %f Y %f Z %f\n", double{xyz[3 * i]}, double{xyz[3 * i + 1]}, double{xyz[3 * i + 2]});
    if (std::fclose(out) != 0) std::abort();
}

bool RunConvert(const std::string& in, const std::string& out)
{
    const pid_t child = fork();
    if (child == 0) {
        if (!std::freopen("/dev/null", "w", stdout) || !std::freopen("/dev/null", "w", stderr)) _exit(127);
        execl(ZON_TOOL_PATH, ZON_TOOL_PATH, "convert", in.c_str(), out.c_str(), static_cast<char*>(nullptr));
        _exit(127);
    }
    int status = 0;
    return child > 0 && waitpid(child, &status, 0) == child && WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

// Both in each iteration, so that the ratio is taken under the same load.
void BM_ConvertAgainstFprintf(benchmark::State& state)
{
    const InputFile& input = InputFile::Get();
    ZonCloudReadAsciiLibre reader{ZonUnicodeString(input.Path())};
    unsigned count = 0;
    const float* xyz = reader.GetPoints(count);
    if (count != static_cast<unsigned>(kFilePoints)) {
        state.SkipWithError("wrong number of points");
        return;
    }
    const std::string converted = input.Output("converted.asc"), printed = input.Output("printed.asc");
    double convertSeconds = 0, fprintfSeconds = 0;
    for (auto _ : state) {
        fprintfSeconds += Seconds([&] { FprintfLines(printed, xyz, count); });
        bool ok = true;
        convertSeconds += Seconds([&] { ok = RunConvert(input.Path(), converted); });
        if (!ok) {
            state.SkipWithError("zoncloud convert failed");
            return;
        }
    }
    // The same lines: the converted file is its header and then fprintf's lines.
    const auto convertedSize = fs::file_size(converted), printedSize = fs::file_size(printed);
    std::ifstream a(converted, std::ios::binary), b(printed, std::ios::binary);
    std::string tail(printedSize, '\0'), lines(printedSize, '\0');
    a.seekg(static_cast<std::streamoff>(convertedSize - printedSize));
    a.read(tail.data(), static_cast<std::streamsize>(printedSize));
    b.read(lines.data(), static_cast<std::streamsize>(printedSize));
    if (convertedSize < printedSize || tail != lines) state.SkipWithError("convert and fprintf wrote different lines");
    const double iterations = static_cast<double>(state.iterations());
    state.counters["convert s"] = convertSeconds / iterations;
    state.counters["fprintf s"] = fprintfSeconds / iterations;
    state.counters["fprintf/convert"] = convertSeconds > 0 ? fprintfSeconds / convertSeconds : 0.0;
    state.counters["out MB"] = static_cast<double>(convertedSize) * 1e-6;
    state.counters["load"] = LoadAverage();
    fs::remove(converted);
    fs::remove(printed);
}
BENCHMARK(BM_ConvertAgainstFprintf)->Unit(benchmark::kMillisecond)->Iterations(3)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
