// Grid files of the fringe-projection sensor: the header records, where the
// data start, holes, sampled rows and the cloud, and what bad headers raise.
// Also the tool's reading of ".xyz" files that are text.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "RangeScannerFiles.h"
#include "ZonCloudReadOptonBin.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKeyAndSeverity;
using zontest::OptonGrid;
using Floats = std::vector<float>;
using Flags = std::vector<int>;
using Reader = ZonCloudReadOptonBin;

using Rows = zontest::GridRows;
Rows ReadRows(Reader& reader) { return zontest::ReadGridRows(reader); }

// Two rows of three nodes; one not measured, one whose fourth value is close to -1 but not it.
OptonGrid TwoByThree()
{
    OptonGrid grid;
    grid.rows = 2;
    grid.columns = 3;
    grid.low = {9, 9, 9};  // the corners in either order
    grid.high = {-1, 0, 1};
    grid.records = {{1, 1, 1, 0}, {2, 2, 2, -1}, {3, 3, 3, -0.999f}, {4, 4, 4, 5}, {5, 5, 5, 0}, {6, 6, 6, 0}};
    return grid;
}

class Opton : public zontest::FilesTest {
protected:
    std::string File(const OptonGrid& grid) { return Write("o" + std::to_string(files_++) + ".xyz", zontest::OptonFile(grid)); }
    int files_ = 0;
};

TEST_F(Opton, RowsAndCloudLeaveOutNodesNotMeasured)
{
    Reader reader(File(TwoByThree()));
    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationGrids);
    EXPECT_EQ(reader.GetDataOffset(), 112u);
    ZonMathBox box;
    reader.GetBoundingBox(box);
    EXPECT_EQ(box.GetLow()[0], -1);
    EXPECT_EQ(box.GetHigh()[2], 9);
    EXPECT_EQ(reader.GetNumberOfPoints(), 6);

    const Rows rows = ReadRows(reader);
    EXPECT_EQ(rows.valid, (std::vector<Flags>{{1, 0, 1}, {1, 1, 1}}));
    EXPECT_EQ(rows.points[0], (Floats{1, 1, 1, 0, 0, 0, 3, 3, 3}));
    EXPECT_EQ(reader.GetNumberOfPoints(), 5);  // a whole read counts the measured nodes

    Reader cloud(File(TwoByThree()));
    EXPECT_EQ(zontest::PointsOf<float>(cloud), (Floats{1, 1, 1, 3, 3, 3, 4, 4, 4, 5, 5, 5, 6, 6, 6}));
    EXPECT_EQ(cloud.GetNumberOfPoints(), 5);
}

TEST_F(Opton, DataStartAfterTheTruncatedExtraRecords)
{
    // E = 2.7: the data start at byte 80, over header records 5 and 6, so
    // that the second point is the record of the counts.
    OptonGrid grid;
    grid.extra = 2.7f;
    grid.rows = 1;
    grid.columns = 3;
    grid.records = {{7, 8, 9, 0}, {3, 1, 3, 0}, {1, 2, 3, 0}};
    Reader reader(File(grid));
    EXPECT_EQ(reader.GetDataOffset(), 80u);
    EXPECT_EQ(zontest::PointsOf<float>(reader), (Floats{7, 8, 9, 3, 1, 3, 1, 2, 3}));
}

TEST_F(Opton, SamplingThinsEachRow)
{
    OptonGrid grid;
    grid.rows = 2;
    grid.columns = 10;
    for (int i = 0; i < 20; ++i) grid.records.push_back({0, 0, static_cast<float>(i), i == 2 ? -1.0f : 0.0f});
    Reader reader(File(grid));
    reader.SetSamplingPercent(50);
    const Rows rows = ReadRows(reader);
    EXPECT_EQ(rows.valid[0], (Flags{1, 0, 1, 1, 1, 0}));
    Floats heights;
    const Floats cloud = zontest::PointsOf<float>(reader);
    for (std::size_t i = 2; i < cloud.size(); i += 3) heights.push_back(cloud[i]);
    EXPECT_EQ(heights, (Floats{0, 4, 6, 8, 10, 12, 14, 16, 18}));
    EXPECT_EQ(reader.GetNumberOfPoints(), 19);  // measured nodes, sampled or not
}

TEST_F(Opton, BadHeadersAreRefused)
{
    const auto with = [](auto change) {
        OptonGrid g = TwoByThree();
        change(g);
        return zontest::OptonFile(g);
    };
    const std::string refused = "ZonCloudReadNLSTool.ERR_UnknownData/2";
    const std::string shortRead = "ZonCloudOperErrorTool.ERR_ENODATA/2";
    std::string notZero = zontest::OptonFile(TwoByThree());
    notZero[5] = 1;
    const struct {
        const char* name;
        std::string bytes, error;
    } cases[] = {
        {"record 0 not zero", notZero, refused},
        {"P not R x C", with([](OptonGrid& g) { g.points = 5; }), refused},
        {"half a row", with([](OptonGrid& g) { g.rows = 1.5f; g.points = 4.5f; }), refused},
        {"negative rows", with([](OptonGrid& g) { g.rows = -2; g.columns = -3; g.points = 6; }), refused},
        {"header cut short", notZero.substr(0, 111), shortRead},
        {"records cut short", with([](OptonGrid& g) { g.records.pop_back(); }), shortRead},
        {"a billion rows", with([](OptonGrid& g) { g.rows = 1e9f; g.points = 3e9f; }), shortRead},
        {"data before the file", with([](OptonGrid& g) { g.extra = -5; g.records.clear(); }), shortRead},
        {"no node", with([](OptonGrid& g) { g.rows = 0; g.records.clear(); }), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
    };
    for (const auto& c : cases) {
        Reader reader(Write("bad.xyz", c.bytes));
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader.GetNumberOfPoints(); }), c.error) << c.name;
    }
}

TEST_F(Opton, ToolReadsTextThatTheBinaryReaderRefusesAsText)
{
    const std::string text = zontest::Quote(Write("cloud.xyz", "1.5 2 3\n4 5 6.25\n"));
    zontest::ToolRun run = Run("info --json " + text);
    ASSERT_EQ(run.status, 0) << run.err;
    const auto summary = nlohmann::json::parse(run.out);
    EXPECT_EQ(summary["points"], 2);
    EXPECT_EQ(summary["format"], "ASCII FREE");
    EXPECT_NE(run.err.find("the OPTON reader refused it"), std::string::npos) << run.err;
    EXPECT_NE(run.err.find("read as text by the ASCII FREE reader"), std::string::npos) << run.err;
    run = Run("dump " + text);
    ASSERT_EQ(run.status, 0) << run.err;
    EXPECT_EQ(nlohmann::json::parse(run.out)["cloud"]["points"].size(), 2u);
    EXPECT_NE(run.err.find("ASCII FREE"), std::string::npos) << run.err;

    // No fallback: forced by --format, a binary file, or text that is no cloud either.
    const auto errorKey = [](const zontest::ToolRun& r) {
        return nlohmann::json::parse(r.out)["error"]["key"].get<std::string>();
    };
    // A text file shorter than the header is a short read.
    run = Run("info --json --format OPTON " + text);
    EXPECT_EQ(errorKey(run), "ZonCloudOperErrorTool.ERR_ENODATA");
    OptonGrid bad = TwoByThree();
    bad.points = 5;
    run = Run("info --json " + zontest::Quote(File(bad)));
    EXPECT_EQ(errorKey(run), "ZonCloudReadNLSTool.ERR_UnknownData");
    EXPECT_EQ(run.err, "");
    run = Run("info --json " + zontest::Quote(Write("words.xyz", "neither a header nor points\n")));
    EXPECT_EQ(errorKey(run), "ZonCloudOperErrorTool.ERR_ENODATA");
    EXPECT_EQ(run.err, "");
}

}  // namespace
