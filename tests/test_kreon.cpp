// Range grids of the laser scanner: planar and cylindrical layouts, row
// centres, the placement, holes, sampled rows and the cloud, and what bad
// headers raise.
#include <gtest/gtest.h>

#include <cmath>
#include <numbers>

#include "RangeScannerFiles.h"
#include "ZonCloudReadKreonBin.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::ErrorKeyAndSeverity;
using zontest::KreonGrid;
using Floats = std::vector<float>;
using Flags = std::vector<int>;
using Reader = ZonCloudReadKreonBin;

constexpr float Hole = -32767.0f;

using Rows = zontest::GridRows;
Rows ReadRows(Reader& reader) { return zontest::ReadGridRows(reader); }

class Kreon : public zontest::FilesTest {
protected:
    std::string File(const KreonGrid& grid) { return Write("g" + std::to_string(files_++) + ".grk", zontest::KreonFile(grid)); }
    int files_ = 0;
};

TEST_F(Kreon, PlanarRowsRunDownwardWithHolesLeftOutOfTheCloud)
{
    KreonGrid grid;
    grid.columns = 3;
    grid.rows = 2;
    grid.x0 = 10;
    grid.columnStep = 2;
    grid.origin = 5;
    grid.rowStep = 0.5f;
    grid.values = {1, 2, Hole, 4, 5, 6};
    Reader reader(File(grid));
    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationGrids);
    EXPECT_EQ(reader.GetNumberOfPoints(), 6);
    const Rows rows = ReadRows(reader);
    EXPECT_EQ(rows.valid, (std::vector<Flags>{{1, 1, 0}, {1, 1, 1}}));
    EXPECT_EQ(rows.points[0], (Floats{10, 5, 1, 12, 5, 2, 0, 0, 0}));
    EXPECT_EQ(rows.points[1], (Floats{10, 4.5f, 4, 12, 4.5f, 5, 14, 4.5f, 6}));
    EXPECT_EQ(zontest::PointsOf<float>(reader),
              (Floats{10, 5, 1, 12, 5, 2, 10, 4.5f, 4, 12, 4.5f, 5, 14, 4.5f, 6}));
    ZonMathBox box;
    reader.GetBoundingBox(box);
    EXPECT_EQ(box.GetLow()[2], 1);  // the hole's value is no point

    // The placement as stored: model = rotation (rows) x local + translation.
    grid.rotation = {0, 1, 0, 1, 0, 0, 0, 0, -1};
    grid.translation = {100, 200, 300};
    Reader placed(File(grid));
    const Floats points = zontest::PointsOf<float>(placed);
    EXPECT_EQ(Floats(points.begin(), points.begin() + 3), (Floats{105, 210, 299}));
}

TEST_F(Kreon, CylindersTurnOnceAcrossTheColumns)
{
    KreonGrid grid;
    grid.kind = 2;
    grid.columns = 4;
    grid.rows = 2;
    grid.origin = 50;
    grid.rowStep = 10;
    grid.values = {2, 2, 2, 2, 3, 3, 3, 3};
    const auto near = [](const Floats& got, const Floats& want) {
        if (got.size() != want.size()) return false;
        for (std::size_t i = 0; i < got.size(); ++i)
            if (std::abs(got[i] - want[i]) > 1e-5f) return false;
        return true;
    };
    Reader reader(File(grid));
    Rows rows = ReadRows(reader);
    // Column 1 at angle 0, column N at 2 pi (N - 1) / N; row 2 one step lower.
    EXPECT_TRUE(near(rows.points[0], {2, 0, 50, 0, 2, 50, -2, 0, 50, 0, -2, 50}));
    EXPECT_TRUE(near(rows.points[1], {3, 0, 40, 0, 3, 40, -3, 0, 40, 0, -3, 40}));

    grid.kind = 6;
    grid.centres = {100, 0, 0, -100};
    Reader centred(File(grid));
    rows = ReadRows(centred);
    EXPECT_TRUE(near(rows.points[0], {102, 0, 50, 100, 2, 50, 98, 0, 50, 100, -2, 50}));
    EXPECT_TRUE(near(rows.points[1], {3, -100, 40, 0, -97, 40, -3, -100, 40, 0, -103, 40}));
}

TEST_F(Kreon, SamplingThinsEachRow)
{
    KreonGrid grid;
    grid.columns = 10;
    grid.rows = 2;
    for (int i = 0; i < 20; ++i) grid.values.push_back(i == 2 ? Hole : static_cast<float>(i));
    Reader reader(File(grid));
    reader.SetSamplingPercent(50);
    const Rows rows = ReadRows(reader);
    ASSERT_EQ(rows.valid.size(), 2u);
    // Six slots: columns 0, 2, 4, 6, 8, the last slot never reached.
    EXPECT_EQ(rows.valid[0], (Flags{1, 0, 1, 1, 1, 0}));
    Floats heights;
    const Floats cloud = zontest::PointsOf<float>(reader);
    for (std::size_t i = 2; i < cloud.size(); i += 3) heights.push_back(cloud[i]);
    EXPECT_EQ(heights, (Floats{0, 4, 6, 8, 10, 12, 14, 16, 18}));
}

TEST_F(Kreon, BadHeadersAndCallingOrder)
{
    KreonGrid good;
    good.columns = 2;
    good.rows = 1;
    good.values = {1, 2};
    const auto with = [&](auto change) {
        KreonGrid g = good;
        change(g);
        return zontest::KreonFile(g);
    };
    const std::string unknown = "ZonCloudReadNLSTool.ERR_UnknownData/4";
    const std::string full = zontest::KreonFile(good);
    const struct {
        const char* name;
        std::string bytes, error;
    } cases[] = {
        {"byte 30 not 1", with([](KreonGrid& g) { g.byte30 = 2; }), unknown},
        {"byte 31 not 0", with([](KreonGrid& g) { g.byte31 = 1; }), unknown},
        {"field 70 not 0", with([](KreonGrid& g) { g.field70 = 1; }), unknown},
        {"kind 3", with([](KreonGrid& g) { g.kind = 3; }), unknown},
        {"no row", with([](KreonGrid& g) { g.rows = 0; }), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
        {"header cut short", full.substr(0, 127), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"values cut short", full.substr(0, full.size() - 1), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"65535 x 65535 nodes", with([](KreonGrid& g) { g.rows = g.columns = 65535; }), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
        {"row centres missing", with([](KreonGrid& g) { g.kind = 6; }), "ZonCloudOperErrorTool.ERR_ENODATA/2"},
    };
    for (const auto& c : cases) {
        Reader reader(Write("bad.grk", c.bytes));
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader.GetNumberOfPoints(); }), c.error) << c.name;
    }

    Reader reader(Write("good.grk", full));
    unsigned n = 0;
    const unsigned char* v = nullptr;
    EXPECT_EQ(ErrorKey([&] { reader.GetGridPoints(n, v); }), "ZonCloudReadNLSTool.ERR_BeginGetGridNotDone");
    reader.BeginGetGrid();
    EXPECT_EQ(ErrorKey([&] { reader.BeginGetGridPoints(); }), "ZonCloudReadNLSTool.ERR_NextGridNotDone");
    EXPECT_TRUE(reader.NextGrid());
    EXPECT_FALSE(reader.NextGrid());
}

}  // namespace
