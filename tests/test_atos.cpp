// The fringe-projection measurement files: binary and text forms, holes by
// quality, raster steps, sampled rows, the decimal-point restart, bad headers,
// and the grids through the import and the tool.
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <clocale>

#include "ScannerFiles.h"
#include "ZonCldSettings.h"
#include "ZonCloudFactoryAtos.h"
#include "ZonCloudReadAtos.h"
#include "ZonTestFiles.h"

namespace {

using zontest::AtosBinary;
using zontest::AtosPatch;
using zontest::AtosPoint;
using zontest::ErrorKey;
using zontest::Repeat;
using Floats = std::vector<float>;
using Flags = std::vector<int>;

struct Row {
    Floats points;
    Flags valid;
};

// Every row of every grid, walked with the grid protocol.
std::vector<std::vector<Row>> Grids(ZonCloudReadAtos& reader)
{
    std::vector<std::vector<Row>> grids;
    reader.BeginGetGrid();
    while (reader.NextGrid()) {
        grids.emplace_back();
        reader.BeginGetGridPoints();
        unsigned n = 0;
        const unsigned char* valid = nullptr;
        while (const float* p = reader.GetGridPoints(n, valid))
            grids.back().push_back({Floats(p, p + 3 * n), Flags(valid, valid + n)});
    }
    return grids;
}

Flags Validity(const std::vector<Row>& rows)
{
    Flags all;
    for (const Row& row : rows) all.insert(all.end(), row.valid.begin(), row.valid.end());
    return all;
}

// A patch of `columns` x `rows` pixels with point (c, r, 0) of quality q(c, r).
template <class Quality>
AtosPatch Patch(std::uint32_t columns, std::uint32_t rows, Quality q, std::uint32_t step = 1)
{
    AtosPatch patch;
    patch.stepX = patch.stepY = step;
    for (std::uint32_t r = 0; r < rows; ++r)
        for (std::uint32_t c = 0; c < columns; ++c)
            patch.points.push_back({double(c), double(r), 0.0, c * (step ? step : 1), r * (step ? step : 1), q(c, r)});
    return patch;
}

class Atos : public zontest::FilesTest {
protected:
    std::string Text(const std::string& header, const std::vector<AtosPoint>& points)
    {
        std::string text = header;
        char line[160];
        for (const AtosPoint& p : points) {
            std::snprintf(line, sizeof line, "%g %g %g %u %u %g\n", p.x, p.y, p.z, p.column, p.row, p.quality);
            text += line;
        }
        return Write("patch.atos_ascii", text);
    }
};

TEST_F(Atos, BinaryPatchesAreGridsWithHolesWhereQualityIsNotAboveTheMinimum)
{
    // Quality 0 is a hole at the default minimum; the record order inside a
    // patch does not matter (the row index finds each row's records).
    AtosPatch first = Patch(3, 2, [](auto c, auto r) { return c == 1 && r == 0 ? 0.0 : 1.0; });
    std::swap(first.points[0], first.points[4]);
    AtosPatch second = Patch(2, 1, [](auto, auto) { return 0.5; });
    for (AtosPoint& p : second.points) p.column += 7, p.row += 4, p.x += 10;  // extents from 7 and 4, not 0
    ZonCloudReadAtos reader(Write("two.surf", AtosBinary({first, second})));

    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationGrids);
    EXPECT_TRUE(reader.IsBinary());
    EXPECT_EQ(reader.GetNumberOfGrids(), 2);
    EXPECT_EQ(reader.GetNumberOfPoints(), 7);
    const auto grids = Grids(reader);
    ASSERT_EQ(grids.size(), 2u);
    ASSERT_EQ(grids[0].size(), 2u);
    EXPECT_EQ(grids[0][0].valid, (Flags{1, 0, 1}));
    EXPECT_EQ(grids[0][0].points, (Floats{0, 0, 0, 0, 0, 0, 2, 0, 0}));  // a hole is (0, 0, 0)
    EXPECT_EQ(grids[0][1].points, (Floats{0, 1, 0, 1, 1, 0, 2, 1, 0}));
    ASSERT_EQ(grids[1].size(), 1u);
    EXPECT_EQ(grids[1][0].points, (Floats{10, 0, 0, 11, 0, 0}));
    double least = -1, greatest = -1;
    reader.GetQualityRange(least, greatest);
    EXPECT_EQ(least, 0.0);
    EXPECT_EQ(greatest, 1.0);

    // The cloud is the valid nodes in grid order.
    unsigned n = 0;
    const float* cloud = reader.GetPoints(n);
    EXPECT_EQ(n, 7u);
    EXPECT_EQ(Floats(cloud, cloud + 6), (Floats{0, 0, 0, 2, 0, 0}));

    // A quality equal to the minimum is a hole too; a new minimum counts again.
    reader.SetMinPointQuality(0.5f);
    EXPECT_EQ(reader.GetNumberOfPoints(), 5);
    EXPECT_EQ(Validity(Grids(reader)[1]), (Flags{0, 0}));
}

TEST_F(Atos, RowsStoredOutOfOrderReadTheSame)
{
    // Column by column, every row's records span the whole patch.
    const AtosPatch rows = Patch(40, 40, [](auto c, auto r) { return (c + r) % 3 ? 1.0 : 0.0; });
    AtosPatch columns = rows;
    for (std::size_t i = 0; i < columns.points.size(); ++i) columns.points[i] = rows.points[(i % 40) * 40 + i / 40];
    ZonCloudReadAtos byRow(Write("rows.surf", AtosBinary({rows})));
    ZonCloudReadAtos byColumn(Write("columns.surf", AtosBinary({columns})));
    const auto expected = Grids(byRow);
    const auto got = Grids(byColumn);
    ASSERT_EQ(got.size(), 1u);
    ASSERT_EQ(got[0].size(), 40u);
    for (std::size_t r = 0; r < 40; ++r) {
        EXPECT_EQ(got[0][r].points, expected[0][r].points) << r;
        EXPECT_EQ(got[0][r].valid, expected[0][r].valid) << r;
    }
}

TEST_F(Atos, RasterStepsDivideThePixelsAndAStepOfZeroIsOne)
{
    for (std::uint32_t step : {0u, 1u, 2u}) {
        ZonCloudReadAtos binary(Write("s.surf", AtosBinary({Patch(4, 2, [](auto, auto) { return 1.0; }, step)})));
        int rows = 0, columns = 0;
        binary.GetGridSize(1, rows, columns);
        EXPECT_EQ(rows, 2) << step;
        EXPECT_EQ(columns, 4) << step;
    }
    // Text: pixels 0, 3 and 6 with a step of 3 are grid columns 0 to 2; a step of 0 reads as 1.
    const std::vector<AtosPoint> points = {{0, 0, 0, 0, 0, 1}, {1, 0, 0, 3, 0, 1}, {2, 0, 0, 6, 0, 1}};
    for (const auto& [header, columns] : {std::pair<std::string, int>{"RasterX: 3\nRasterY: 3\n", 3},
                                          {"RasterX: 0\nRasterY: 0\n", 7}}) {
        ZonCloudReadAtos text(Text("Points: 3\n" + header, points));
        int rows = 0, n = 0;
        text.GetGridSize(1, rows, n);
        EXPECT_EQ(n, columns) << header;
        EXPECT_EQ(rows, 1);
    }
}

TEST_F(Atos, SamplingKeepsOneColumnPerSlot)
{
    ZonCloudReadAtos reader(Write("ten.surf", AtosBinary({Patch(10, 1, [](auto, auto) { return 1.0; })})));
    reader.SetSamplingPercent(50.0f);
    const auto grids = Grids(reader);
    ASSERT_EQ(grids.size(), 1u);
    ASSERT_EQ(grids[0][0].valid.size(), 6u);  // min(10, trunc(10 * 0.5 + 1))
    EXPECT_EQ(grids[0][0].valid, (Flags{1, 1, 1, 1, 1, 0}));
    EXPECT_EQ(grids[0][0].points[3], 2.0f);  // slot 1 holds column 2
    unsigned n = 0;
    reader.GetPoints(n);
    EXPECT_EQ(n, 5u);
}

TEST_F(Atos, TextFormRestartsWithAPointAfterTwoHundredUnknownLines)
{
    const std::string locale = std::setlocale(LC_NUMERIC, nullptr);
    const std::vector<AtosPoint> points = {{0.5, 1.25, 2, 0, 0, 1}, {1.5, 1.25, 2, 1, 0, 1}};
    const struct {
        int unknown;
        char native;
        std::string key;
        bool switched;
    } cases[] = {
        {200, '.', "", false},
        {201, '.', "ZonCloudReadNLSTool.ERR_TooManyUnknownData", false},
        // Under a decimal comma the points are unknown lines too: the reader starts again with '.'.
        {0, ',', "", true},
        {201, ',', "ZonCloudReadNLSTool.ERR_TooManyUnknownData", true},
    };
    for (const auto& c : cases) {
        std::string junk = Repeat("header line\n", c.unknown);
        if (c.native == ',') junk += Repeat("0.5 1.5 2.5 0 0 1\n", 201);  // more than 200 unreadable point lines
        ZonCloudReadAtos reader(Text(junk, points));
        reader.SetNativeDecimalPoint(c.native);
        std::vector<std::vector<Row>> grids;
        EXPECT_EQ(ErrorKey([&] { grids = Grids(reader); }), c.key) << c.unknown << c.native;
        EXPECT_EQ(reader.IsDecimalPointSwitched(), c.switched) << c.unknown << c.native;
        if (c.key.empty()) {
            ASSERT_EQ(grids.size(), 1u);
            EXPECT_EQ(grids[0].back().points, (Floats{0.5f, 1.25f, 2, 1.5f, 1.25f, 2}));
        }
    }
    EXPECT_EQ(std::setlocale(LC_NUMERIC, nullptr), locale);
}

TEST_F(Atos, BadHeadersAndOffsetsEndInCatalogErrors)
{
    const AtosPatch patch = Patch(2, 2, [](auto, auto) { return 1.0; });
    std::string farRecords = AtosBinary({patch});
    farRecords[512] = '\x7f';  // the first record's offset beyond the end
    std::string manyRecords = AtosBinary({patch});
    manyRecords[512 + 16] = '\x50';  // 80 records announced, 4 written
    std::string manyPatches = AtosBinary({patch});
    manyPatches.replace(16, 4, "\xff\xff\xff\x0f", 4);
    std::string farRow = AtosBinary({Patch(1, 1, [](auto, auto) { return 1.0; })});
    farRow.replace(farRow.size() - 12, 4, "\x00\x00\x00\x7f", 4);  // one record on row 2^30 against 1 column
    const struct {
        std::string name, bytes, key;
    } cases[] = {
        {"kind 256", AtosBinary({patch}, 40, 256), "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"kind 2", AtosBinary({patch}, 40, 2), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"version", AtosBinary({patch}, 40, 1, "v4.4.2"), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"short records", AtosBinary({patch}, 32), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"records beyond the end", farRecords, "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"more records than bytes", manyRecords, "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"more patches than bytes", manyPatches, "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"a grid of a billion holes", farRow, ""},  // one row: a single record is not a huge grid
        {"header cut", AtosBinary({patch}).substr(0, 20), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"no valid point", AtosBinary({Patch(2, 1, [](auto, auto) { return 0.0; })}),
         "ZonCloudReadNLSTool.ERR_NoPointFound"},
    };
    for (const auto& c : cases) {
        ZonCloudReadAtos reader(Write("bad.surf", c.bytes));
        EXPECT_EQ(ErrorKey([&] { Grids(reader); }), c.key) << c.name;
    }

    std::string sparse = AtosBinary({Patch(2, 1, [](auto, auto) { return 1.0; })});
    sparse.replace(sparse.size() - 12, 4, "\x00\x00\x00\x7f", 4);  // rows 0 and 2^30 in one patch of 2 records
    ZonCloudReadAtos reader(Write("sparse.surf", sparse));
    EXPECT_EQ(ErrorKey([&] { reader.GetTypeOfDigitization(); }), "ZonCloudReadNLSTool.ERR_UnknownData");

    ZonCloudReadAtos grids(Write("ok.surf", AtosBinary({patch})));
    EXPECT_EQ(ErrorKey([&] { grids.SelectGrid(2); }), "ZonCloudReadNLSTool.ERR_GridNumberIsInvalid");
    EXPECT_EQ(ErrorKey([&] { grids.SelectGrid(0); }), "ZonCloudReadNLSTool.ERR_GridNumberIsInvalid");
    grids.SelectGrid(1);
    unsigned n = 0;
    const unsigned char* valid = nullptr;
    EXPECT_NE(grids.GetGridPoints(n, valid), nullptr);
    EXPECT_EQ(n, 2u);
}

TEST_F(Atos, ToolImportsGridsWithTheMinimumQualityOption)
{
    AtosPatch patch = Patch(3, 2, [](auto c, auto) { return 0.25 * c; });  // qualities 0, 0.25, 0.5
    const std::string file = zontest::Quote(Write("p.surf", AtosBinary({patch, patch})));
    const auto info = nlohmann::json::parse(Run("info " + file + " --json").out);
    EXPECT_EQ(info["format"], "ATOS");
    EXPECT_EQ(info["grids"], 2);
    EXPECT_EQ(info["rows"], 4);
    EXPECT_EQ(info["valid"], 8);
    const auto strict = nlohmann::json::parse(Run("info " + file + " --min-quality 0.25 --json").out);
    EXPECT_EQ(strict["valid"], 4);

    const auto dump = nlohmann::json::parse(Run("dump " + file + " --json").out);
    ASSERT_EQ(dump["grids"].size(), 2u);
    EXPECT_EQ(dump["grids"][0]["rows"][1]["valid"], nlohmann::json::parse("[0, 1, 1]"));
    EXPECT_EQ(dump["grids"][0]["rows"][1]["points"][2], nlohmann::json::parse("[2, 1, 0]"));

    // The valid nodes go to the point formats.
    EXPECT_EQ(Run("convert " + file + " " + zontest::Quote(Path("out.asc"))).status, 0);
    const std::string out = zontest::Slurp(Path("out.asc"));
    EXPECT_NE(out.find("Total number of points = 8\n"), std::string::npos) << out;
}

}  // namespace
