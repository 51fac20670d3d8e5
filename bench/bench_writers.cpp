// Writing speed: one million points as a free ASCII cloud file, and one
// million triangles (a strip-free grid mesh) exported as binary and text STL
// through the output document. Figures are MB/s of file written.
#include <benchmark/benchmark.h>

#include <unistd.h>

#include <filesystem>
#include <random>
#include <string>
#include <vector>

#include "ZonCldSTLOutputDocument.h"
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

}  // namespace

BENCHMARK_MAIN();
