// Import speed of a 5-million-point free ASCII file: through the import entry
// and the host engine (analysis, GetPoints and the body), and as the whole
// `zoncloud info FILE` process. Reports bytes per second of file.
#include <benchmark/benchmark.h>
#include <sys/wait.h>
#include <unistd.h>

#include <charconv>
#include <cstdio>
#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonCldSettings.h"
#include "ZonGeoFactoryProtected.h"

namespace {

constexpr int PointCount = 5'000'000;

// Writes the points with six decimals, plain ("x y z") or labelled ("X x Y y Z z").
std::string MakeFile(bool labelled)
{
    // One folder for the run, removed at exit: the two files take some 350 MB.
    struct Folder {
        std::string path;
        Folder()
        {
            char pattern[] = "/tmp/zon_bench_import_XXXXXX";
            if (mkdtemp(pattern)) path = pattern;
        }
        ~Folder()
        {
            if (!path.empty()) std::filesystem::remove_all(path);
        }
    };
    static const Folder folder;
    const std::string path = folder.path + (labelled ? "/labelled.asc" : "/plain.asc");
    if (std::filesystem::exists(path)) return path;
    std::FILE* file = std::fopen(path.c_str(), "wb");
    if (!file) return path;
    std::mt19937 random(42);
    std::uniform_real_distribution<double> coordinate(-1000.0, 1000.0);
    std::vector<char> buffer(1 << 20);
    std::size_t used = 0;
    const char* labels[3] = {"X ", " Y ", " Z "};
    for (int i = 0; i < PointCount; ++i) {
        if (buffer.size() - used < 128) {
            std::fwrite(buffer.data(), 1, used, file);
            used = 0;
        }
        char* out = buffer.data() + used;
        for (int axis = 0; axis < 3; ++axis) {
            const char* label = labelled ? labels[axis] : (axis ? " " : "");
            while (*label) *out++ = *label++;
            out = std::to_chars(out, buffer.data() + buffer.size(), coordinate(random), std::chars_format::fixed, 6).ptr;
        }
        *out++ = '\n';
        used = static_cast<std::size_t>(out - buffer.data());
    }
    std::fwrite(buffer.data(), 1, used, file);
    std::fclose(file);
    return path;
}

void ThroughTheImportEntry(benchmark::State& state)
{
    const std::string path = MakeFile(state.range(0) != 0);
    ZonCldSettings::Instance().ResetAll();
    for (auto _ : state) {
        ZonGeoFactoryProtected geometry;
        ZonMathTransformation inverse;
        ZonMathBox box;
        std::vector<ZonString> messages;
        const auto body = ZonCldImportServices::BuildCldBodyFromFile(geometry, ZonUnicodeString(path),
                                                                     ZonMathTransformation(), inverse, box, messages);
        if (body->GetNumberOfPoints() != PointCount) state.SkipWithError("wrong number of points");
        benchmark::DoNotOptimize(body);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(std::filesystem::file_size(path)));
}
BENCHMARK(ThroughTheImportEntry)->ArgName("labelled")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond)->UseRealTime();

void WholeInfoProcess(benchmark::State& state)
{
    const std::string path = MakeFile(state.range(0) != 0);
    const std::string command = std::string("'") + ZON_TOOL_PATH + "' info '" + path + "' >/dev/null";
    for (auto _ : state)
        if (const int status = std::system(command.c_str()); !WIFEXITED(status) || WEXITSTATUS(status) != 0)
            state.SkipWithError("zoncloud info failed");
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(std::filesystem::file_size(path)));
}
BENCHMARK(WholeInfoProcess)->ArgName("labelled")->Arg(0)->Arg(1)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
