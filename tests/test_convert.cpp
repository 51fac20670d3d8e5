// zoncloud convert end to end: round trips through the readers and writers,
// the choice of writer by extension, and conversions that write nothing.
#include <gtest/gtest.h>

#include <array>
#include <cstring>

#include "ZonCloudWriteAsciiLibre.h"
#include "ZonCloudWriteStl.h"
#include "ZonTestFiles.h"

namespace {

using zontest::Quote;
using zontest::Slurp;

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

class ConvertTest : public zontest::FilesTest {
protected:
    // The exit status and everything the tool printed.
    std::pair<int, std::string> Convert(const std::string& in, const std::string& out, const std::string& options = "") const
    {
        const zontest::ToolRun run = Run("convert " + Quote(in) + " " + Quote(out) + options);
        return {run.status, run.out + run.err};
    }

    // A closed tetrahedron with vertices that are not whole numbers.
    std::string WriteTetrahedron() const
    {
        const std::string path = Path("tetra.stl");
        const float p[4][3] = {{0.125f, 0, 0}, {10.5f, 0, 0}, {0, 7.75f, 0}, {0, 0, -3.3f}};
        const int faces[4][3] = {{0, 2, 1}, {0, 1, 3}, {1, 2, 3}, {0, 3, 2}};
        ZonCloudWriteStl writer(path);
        writer.BeginWriteTriangles(4);
        for (const auto& f : faces) {
            float v[9];
            for (int k = 0; k < 9; ++k) v[k] = p[f[k / 3]][k % 3];
            writer.WriteTriangle(v);
        }
        writer.EndWriteTriangles();
        return path;
    }
};

TEST_F(ConvertTest, StlRoundTripKeepsEveryFacetInBinaryAndTextAndScaleMultipliesThem)
{
    const std::string in = WriteTetrahedron();
    const auto [status, output] = Convert(in, Path("binary.stl"));
    ASSERT_EQ(status, 0) << output;
    EXPECT_NE(output.find("4 triangles (binary STL)"), std::string::npos) << output;
    EXPECT_EQ(Facets(Path("binary.stl")), Facets(in));

    ASSERT_EQ(Convert(in, Path("text.stl"), " --text").first, 0);
    EXPECT_TRUE(Slurp(Path("text.stl")).starts_with("solid tetra \n"));
    // The text form read back and written binary gives the same facets (six
    // digits after the point are enough for these coordinates).
    ASSERT_EQ(Convert(Path("text.stl"), Path("again.stl")).first, 0);
    EXPECT_EQ(Facets(Path("again.stl")), Facets(in));

    ASSERT_EQ(Convert(in, Path("scaled.stl"), " --scale 2").first, 0);
    auto expected = Facets(in);
    for (auto& facet : expected)
        for (float& x : facet) x *= 2;
    EXPECT_EQ(Facets(Path("scaled.stl")), expected);
}

// A file our writer made comes back byte for byte: same header, same points.
TEST_F(ConvertTest, AsciiRoundTripIsIdenticalForScansAndClouds)
{
    const std::string scans = Path("scans.asc"), cloud = Path("cloud.asc");
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
    const auto [status, output] = Convert(scans, Path("scans_out.libre"), " --delimiters G08 G09");
    ASSERT_EQ(status, 0) << output;
    EXPECT_NE(output.find("2 scans of 3 points (free ASCII)"), std::string::npos) << output;
    EXPECT_EQ(Slurp(Path("scans_out.libre")), Slurp(scans));
    ASSERT_EQ(Convert(cloud, Path("cloud_out.ascii")).first, 0);
    EXPECT_EQ(Slurp(Path("cloud_out.ascii")), Slurp(cloud));
    // Without the delimiters the scan file is one cloud of all its points.
    ASSERT_EQ(Convert(scans, Path("flat.asc")).first, 0);
    EXPECT_EQ(Slurp(Path("flat.asc")), Slurp(cloud));
}

TEST_F(ConvertTest, MeshToAsciiWritesItsVerticesAsPoints)
{
    ASSERT_EQ(Convert(WriteTetrahedron(), Path("vertices.asc")).first, 0);
    const std::string text = Slurp(Path("vertices.asc"));
    EXPECT_NE(text.find("! Total number of points = 4\n"), std::string::npos) << text;
    EXPECT_NE(text.find("X 10.500000 Y 0.000000 Z 0.000000\n"), std::string::npos) << text;
}

TEST_F(ConvertTest, ConversionsThatWriteNothingSaySoAndFail)
{
    const std::string cloud = Write("cloud.asc", "1 2 3\n");
    // Kept: a mesh was met, even without a facet to write.
    struct Case { std::string in, out, options; std::vector<std::string> messages; bool kept; };
    const std::vector<Case> cases = {
        {cloud, Path("cloud.stl"), "", {"clouds cannot be written to a mesh file", "nothing was written"}, false},
        {WriteTetrahedron(), Path("none.stl"), " --no-triangles", {"there is no visible polygon"}, true},
        {cloud, Path("cloud.xyz_unknown"), "", {"ERR_UnknownExtension"}, false},
    };
    for (const auto& c : cases) {
        const auto [status, output] = Convert(c.in, c.out, c.options);
        EXPECT_EQ(status, 1) << c.out << "\n" << output;
        for (const auto& message : c.messages) EXPECT_NE(output.find(message), std::string::npos) << output;
        EXPECT_EQ(std::filesystem::exists(c.out), c.kept) << c.out;
    }
}

}  // namespace
