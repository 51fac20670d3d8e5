// The fixed-column elevation-model reader: header fields (blank, Fortran
// exponents, unconvertible), profiles over several records, short records,
// the mapping to points and the triangles by index, and GDAL's files.
#include <gtest/gtest.h>

#include <cstdio>
#include <map>

#include "ZonCldReadDEM.h"
#include "ZonTerrainTests.h"

namespace {

using namespace zontest;

// Records of a model, written field by field at their offsets.
class DemBuilder {
public:
    DemBuilder(double yResolution = 30, double zResolution = 1, int profiles = 2)
    {
        Put(a_, 528, Int(2, 6));  // metres
        Put(a_, 534, Int(2, 6));
        Put(a_, 816, Real(30, 12));
        Put(a_, 828, Real(yResolution, 12));
        Put(a_, 840, Real(zResolution, 12));
        Put(a_, 852, Int(1, 6));
        Put(a_, 858, Int(profiles, 6));
    }
    // A profile at (x, y) with these elevations; longer ones go on in further records.
    DemBuilder& Profile(double x, double y, const std::vector<int>& elevations)
    {
        std::string first(1024, ' ');
        Put(first, 0, Int(1, 6) + Int(static_cast<int>(profiles_.size()) + 1, 6) +
                          Int(static_cast<int>(elevations.size()), 6) + Int(1, 6));
        Put(first, 24, Real(x, 24) + Real(y, 24) + Real(0, 24) + Real(0, 24) + Real(0, 24));
        std::string records = first;
        std::size_t offset = 144;  // within the last record
        for (int e : elevations) {
            if (offset + 6 > 1024) {
                records += std::string(1024, ' ');
                offset = 0;
            }
            Put(records, records.size() - 1024 + offset, Int(e, 6));
            offset += 6;
        }
        profiles_.push_back(records);
        return *this;
    }
    std::string& A() { return a_; }
    std::string Bytes() const
    {
        std::string bytes = a_;
        for (const auto& p : profiles_) bytes += p;
        return bytes;
    }

    static std::string Int(int v, int width)
    {
        char text[32];
        std::snprintf(text, sizeof text, "%*d", width, v);
        return text;
    }
    // As Fortran writes them: a "D" for the exponent.
    static std::string Real(double v, int width)
    {
        char text[48];
        std::snprintf(text, sizeof text, "%*.*E", width, width > 12 ? 15 : 6, v);
        std::string s = text;
        s[s.find('E')] = 'D';
        return s;
    }
    static void Put(std::string& record, std::size_t offset, const std::string& text)
    {
        record.replace(offset, text.size(), text);
    }

private:
    std::string a_ = std::string(1024, ' ');
    std::vector<std::string> profiles_;
};

class DemTest : public FilesTest {
protected:
    std::shared_ptr<ZonCldReadDEM> Reader(const std::string& bytes)
    {
        return std::make_shared<ZonCldReadDEM>(ZonUnicodeString(Write("m" + std::to_string(files_++) + ".dem", bytes)));
    }
    int files_ = 0;
};

TEST_F(DemTest, ProfilesBecomePointsAlongYAndTrianglesByIndex)
{
    DemBuilder dem(30, 0.1);
    dem.Profile(500000, 4000000, {1234, 1000, -7}).Profile(500030, 4000030, {10, 20});
    const Mesh mesh = ReadMesh(*Reader(dem.Bytes()));
    EXPECT_EQ(mesh.vertices, (std::vector<float>{500000, 4000000, 123.4f, 500000, 4000030, 100, 500000, 4000060, -0.7f,
                                                 500030, 4000030, 1, 500030, 4000060, 2}));
    // As if both profiles had three points: (0, 3, 1), (1, 3, 4), (1, 4, 2) and (2, 4, 5) without a point 5.
    EXPECT_EQ(mesh.triangles, (std::vector<unsigned>{0, 3, 1, 1, 3, 4, 1, 4, 2}));
}

TEST_F(DemTest, LongProfilesGoOnInFurtherRecords)
{
    std::vector<int> long1, long2;
    for (int k = 0; k < 200; ++k) long1.push_back(k);
    for (int k = 0; k < 400; ++k) long2.push_back(-k);
    DemBuilder dem;
    dem.Profile(0, 0, long1).Profile(30, 0, long2);
    const std::string bytes = dem.Bytes();
    ASSERT_EQ(bytes.size(), 1024u * (1 + 2 + 3));
    auto reader = Reader(bytes + std::string(1000, ' '));  // a trailing short record is ignored
    const std::vector<float> z = Heights(ReadMesh(*reader).vertices);
    ASSERT_EQ(z.size(), 600u);
    EXPECT_EQ(std::vector<float>(z.begin(), z.begin() + 200), std::vector<float>(long1.begin(), long1.end()));
    EXPECT_EQ(std::vector<float>(z.begin() + 200, z.end()), std::vector<float>(long2.begin(), long2.end()));
    // By index as if the first profile had 400 points too: only corners below 600 exist.
    EXPECT_EQ(reader->GetNumberOfTriangles(), 200u + 199u);
}

TEST_F(DemTest, HeaderFields)
{
    DemBuilder blank(30, 1, 1);
    blank.Profile(0, 0, {5, 6});
    DemBuilder::Put(blank.A(), 816, std::string(12, ' '));  // blank x resolution: 0
    DemBuilder::Put(blank.A(), 546, "            1.5E+02");  // an ordinary exponent
    auto reader = Reader(blank.Bytes());
    EXPECT_EQ(reader->GetHeader().resolution[0], 0.0);
    EXPECT_EQ(reader->GetHeader().resolution[1], 30.0);
    EXPECT_EQ(reader->GetNumberOfPoints(), 2);

    DemBuilder broken;
    broken.Profile(0, 0, {5});
    DemBuilder::Put(broken.A(), 852, "    x1");
    DemBuilder shortRecord;
    const struct {
        const char* what;
        std::string bytes;
        const char* key;
    } cases[] = {
        {"shorter than a record", std::string(1000, ' '), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"a field that does not convert", broken.Bytes(), "ZonCloudOperErrorTool.ERR_EINVAL/2"},
        {"no profile", shortRecord.Bytes(), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
    };
    for (const auto& c : cases) EXPECT_EQ(ErrorKeyAndSeverity([&] { ReadMesh(*Reader(c.bytes)); }), c.key) << c.what;
}

// GDAL writes a model from a grid of ours; each profile holds GDAL's column of heights, south to north.
TEST_F(DemTest, GdalModelsReadToGdalsValues)
{
    if (const std::string why = GdalMissing(); !why.empty()) GTEST_SKIP() << why;
    std::string grid = "ncols 6\nnrows 200\nxllcorner 500000\nyllcorner 4000000\ncellsize 30\n";
    for (int r = 0; r < 200; ++r) {
        for (int c = 0; c < 6; ++c) grid += std::to_string((r * 37 + c * 101) % 3000 - 40) + " ";
        grid += "\n";
    }
    const std::string source = Write("source.asc", grid), model = Path("gdal.dem"), xyz = Path("gdal.xyz");
    ASSERT_TRUE(Shell("gdal_translate -q -a_srs EPSG:32631 -of USGSDEM " + Quote(source) + " " + Quote(model), Path("log")))
        << Slurp(Path("log"));
    ASSERT_TRUE(Shell("gdal_translate -q -of XYZ " + Quote(model) + " " + Quote(xyz), Path("log")));
    // GDAL's columns by x, south to north; it pads its raster with void cells.
    std::map<double, std::vector<float>> columns;
    const std::vector<XyzLine> lines = ParseXyz(Slurp(xyz));
    for (auto line = lines.rbegin(); line != lines.rend(); ++line)
        if (line->z != -32767) columns[line->x].push_back(static_cast<float>(line->z));
    ASSERT_EQ(columns.size(), 6u);

    auto reader = Reader(Slurp(model));
    const Mesh mesh = ReadMesh(*reader);
    ASSERT_EQ(mesh.vertices.size(), 3u * 6 * 200);
    std::size_t i = 0;
    for (const auto& [x, heights] : columns) {
        ASSERT_EQ(heights.size(), 200u);
        for (std::size_t k = 0; k < heights.size(); ++k, ++i) {
            EXPECT_EQ(mesh.vertices[3 * i], x) << k;
            EXPECT_EQ(mesh.vertices[3 * i + 2], heights[k]) << "x " << x << " k " << k;
        }
    }
    EXPECT_EQ(mesh.vertices[4] - mesh.vertices[1], 30.0f);  // the y resolution
}

}  // namespace
