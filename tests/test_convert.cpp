// zoncloud convert end to end: round trips through the readers and writers,
// the choice of writer by extension, and conversions that write nothing.
#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <sys/wait.h>
#include <unistd.h>

#include "ZonCloudWriteAsciiLibre.h"
#include "ZonCloudWriteStl.h"

namespace fs = std::filesystem;

namespace {

struct Result {
    int status;
    std::string output;
};

std::string Slurp(const std::string& path)
{
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

// The vertices of every facet of a binary STL file, in order.
std::vector<std::array<float, 9>> Facets(const std::string& path)
{
    const std::string bytes = Slurp(path);
    std::vector<std::array<float, 9>> facets;
    for (std::size_t at = 84; at + 50 <= bytes.size(); at += 50) {
        std::array<float, 9> v{};
        std::memcpy(v.data(), bytes.data() + at + 12, sizeof v);
        facets.push_back(v);
    }
    return facets;
}

class ConvertTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
        dir_ = fs::temp_directory_path() / (std::string("zon_convert_") + info->name() + "_" + std::to_string(::getpid()));
        fs::remove_all(dir_);
        fs::create_directories(dir_);
    }
    void TearDown() override { fs::remove_all(dir_); }

    std::string Path(const std::string& name) const { return (dir_ / name).string(); }

    static Result Convert(const std::string& arguments)
    {
        Result result{-1, {}};
        const std::string command = std::string(ZON_TOOL_PATH) + " convert " + arguments + " 2>&1";
        if (FILE* pipe = ::popen(command.c_str(), "r")) {
            char buffer[4096];
            while (std::size_t n = std::fread(buffer, 1, sizeof buffer, pipe)) result.output.append(buffer, n);
            const int status = ::pclose(pipe);
            result.status = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
        }
        return result;
    }

    // A closed tetrahedron with vertices that are not whole numbers.
    std::string WriteTetrahedron()
    {
        const std::string path = Path("tetra.stl");
        const float p[4][3] = {{0.125f, 0, 0}, {10.5f, 0, 0}, {0, 7.75f, 0}, {0, 0, -3.3f}};
        const int faces[4][3] = {{0, 2, 1}, {0, 1, 3}, {1, 2, 3}, {0, 3, 2}};
        ZonCloudWriteStl writer(path);
        writer.BeginWriteTriangles(4);
        for (const auto& f : faces) {
            float v[9];
            for (int k = 0; k < 3; ++k)
                for (int i = 0; i < 3; ++i) v[3 * k + i] = p[f[k]][i];
            writer.WriteTriangle(v);
        }
        writer.EndWriteTriangles();
        return path;
    }

    fs::path dir_;
};

TEST_F(ConvertTest, StlRoundTripKeepsEveryFacetInBinaryAndText)
{
    const std::string in = WriteTetrahedron();
    const Result binary = Convert("'" + in + "' '" + Path("binary.stl") + "'");
    ASSERT_EQ(binary.status, 0) << binary.output;
    EXPECT_NE(binary.output.find("4 triangles (binary STL)"), std::string::npos) << binary.output;
    EXPECT_EQ(Facets(Path("binary.stl")), Facets(in));

    const Result text = Convert("'" + in + "' '" + Path("text.stl") + "' --text");
    ASSERT_EQ(text.status, 0) << text.output;
    EXPECT_TRUE(Slurp(Path("text.stl")).starts_with("solid tetra \n"));
    // The text form read back and written binary gives the same facets (six
    // digits after the point are enough for these coordinates).
    ASSERT_EQ(Convert("'" + Path("text.stl") + "' '" + Path("again.stl") + "'").status, 0);
    EXPECT_EQ(Facets(Path("again.stl")), Facets(in));
}

TEST_F(ConvertTest, ScaleMultipliesTheWrittenCoordinates)
{
    const std::string in = WriteTetrahedron();
    ASSERT_EQ(Convert("'" + in + "' '" + Path("scaled.stl") + "' --scale 2").status, 0);
    const auto original = Facets(in);
    const auto scaled = Facets(Path("scaled.stl"));
    ASSERT_EQ(scaled.size(), original.size());
    for (std::size_t f = 0; f < scaled.size(); ++f)
        for (int i = 0; i < 9; ++i) EXPECT_EQ(scaled[f][i], original[f][i] * 2) << f << " " << i;
}

// A file our writer made comes back byte for byte: same header, same points.
TEST_F(ConvertTest, AsciiRoundTripIsIdenticalForScansAndClouds)
{
    const std::string scans = Path("scans.asc");
    const std::string cloud = Path("cloud.asc");
    {
        ZonCloudWriteAsciiLibre writer(scans);
        const double a[6] = {1.25, -2, 3e3, 4, 5, 6}, b[3] = {-0.5, 0.001, 7};
        writer.BeginWriteScans(2);
        writer.WriteScanDouble(a, 2);
        writer.WriteScanDouble(b, 1);
        writer.EndWriteScans();
        ZonCloudWriteAsciiLibre points(cloud);
        points.BeginWritePoints(3);
        points.WritePointDouble(a);
        points.WritePointDouble(a + 3);
        points.WritePointDouble(b);
        points.EndWritePoints();
    }
    const Result s = Convert("'" + scans + "' '" + Path("scans_out.libre") + "' --delimiters G08 G09");
    ASSERT_EQ(s.status, 0) << s.output;
    EXPECT_NE(s.output.find("2 scans of 3 points (free ASCII)"), std::string::npos) << s.output;
    EXPECT_EQ(Slurp(Path("scans_out.libre")), Slurp(scans));

    const Result c = Convert("'" + cloud + "' '" + Path("cloud_out.ascii") + "'");
    ASSERT_EQ(c.status, 0) << c.output;
    EXPECT_EQ(Slurp(Path("cloud_out.ascii")), Slurp(cloud));
    // Without the delimiters the scan file is one cloud of all its points.
    ASSERT_EQ(Convert("'" + scans + "' '" + Path("flat.asc") + "'").status, 0);
    EXPECT_EQ(Slurp(Path("flat.asc")), Slurp(cloud));
}

TEST_F(ConvertTest, MeshToAsciiWritesItsVerticesAsPoints)
{
    const Result r = Convert("'" + WriteTetrahedron() + "' '" + Path("vertices.asc") + "'");
    ASSERT_EQ(r.status, 0) << r.output;
    const std::string text = Slurp(Path("vertices.asc"));
    EXPECT_NE(text.find("! Total number of points = 4\n"), std::string::npos) << text;
    EXPECT_NE(text.find("X 10.500000 Y 0.000000 Z 0.000000\n"), std::string::npos) << text;
}

TEST_F(ConvertTest, ConversionsThatWriteNothingSaySoAndFail)
{
    const std::string cloud = Path("cloud.asc");
    {
        ZonCloudWriteAsciiLibre writer(cloud);
        const float p[3] = {1, 2, 3};
        writer.BeginWritePoints(1);
        writer.WritePoint(p);
        writer.EndWritePoints();
    }
    const Result toMesh = Convert("'" + cloud + "' '" + Path("cloud.stl") + "'");
    EXPECT_EQ(toMesh.status, 1);
    EXPECT_NE(toMesh.output.find("clouds cannot be written to a mesh file"), std::string::npos) << toMesh.output;
    EXPECT_NE(toMesh.output.find("nothing was written"), std::string::npos) << toMesh.output;
    EXPECT_FALSE(fs::exists(Path("cloud.stl")));

    const Result vertices = Convert("'" + WriteTetrahedron() + "' '" + Path("none.stl") + "' --no-triangles");
    EXPECT_EQ(vertices.status, 1) << vertices.output;
    EXPECT_NE(vertices.output.find("there is no visible polygon"), std::string::npos) << vertices.output;

    const Result unknown = Convert("'" + cloud + "' '" + Path("cloud.xyz_unknown") + "'");
    EXPECT_EQ(unknown.status, 1);
    EXPECT_NE(unknown.output.find("ERR_UnknownExtension"), std::string::npos) << unknown.output;
}

}  // namespace
