// Subset files of the fringe-projection scanner: record kinds, header
// keywords and their decimal separator, scan and pixel tables, the subset
// list and its kind rule, and what bad files raise.
#include <gtest/gtest.h>

#include "ScannerFiles.h"
#include "ZonCloudReadSteinbichler.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::SteinFile;
using zontest::SteinRecords;
using zontest::SteinSubset;
using Floats = std::vector<float>;
using Flags = std::vector<int>;
using Reader = ZonCloudReadSteinbichler;

std::string Pixels(const std::vector<std::pair<std::uint16_t, std::uint16_t>>& columnRows)
{
    std::string bytes;
    for (const auto& [column, row] : columnRows) {
        zontest::Put(bytes, column);
        zontest::Put(bytes, row);
    }
    return bytes;
}

std::string Scans(const std::vector<std::pair<std::uint32_t, std::uint32_t>>& firstCounts)
{
    std::string bytes;
    for (const auto& [first, count] : firstCounts) {
        zontest::Put(bytes, first);
        zontest::Put(bytes, count);
    }
    return bytes;
}

Floats Cloud(Reader& reader)
{
    unsigned n = 0;
    const float* p = reader.GetPoints(n);
    return Floats(p, p + 3 * n);
}

class Steinbichler : public zontest::FilesTest {
protected:
    std::string File(const std::vector<SteinSubset>& subsets) { return Write("s.ac", SteinFile(subsets)); }
};

TEST_F(Steinbichler, RecordsAreFloatsOrThousandths)
{
    Reader floats(File({{"NUMBER_OF_POINTS 2\nDATA_TYPE FLOAT\n", SteinRecords({1.5f, 2, 3, -4, 5, 6.25f})}}));
    EXPECT_EQ(floats.GetTypeOfDigitization(), DigitizationCloud);
    EXPECT_EQ(Cloud(floats), (Floats{1.5f, 2, 3, -4, 5, 6.25f}));

    Reader integers(File({{"NUMBER_OF_POINTS 1\nDATA_TYPE INTEGER\n", zontest::SteinIntegerRecords({1500, -250, 0})}}));
    EXPECT_EQ(Cloud(integers), (Floats{1.5f, -0.25f, 0}));

    Reader other(File({{"NUMBER_OF_POINTS 1\nDATA_TYPE DOUBLE\n", SteinRecords({1, 2, 3})}}));
    EXPECT_EQ(ErrorKey([&] { Cloud(other); }), "ZonCloudReadNLSTool.ERR_UnknownData");
}

TEST_F(Steinbichler, HeaderBoxSeparatorAndPlacement)
{
    const std::string points = "NUMBER_OF_POINTS 2\n";
    const std::string records = SteinRecords({0, 0, 0, 10, 20, 30});
    const std::string six = "MINIMUM_X 0\nMAXIMUM_X 100\nMINIMUM_Y 0\nMAXIMUM_Y 100\nMINIMUM_Z -1\n";
    const struct {
        std::string name, lines;
        char native;
        Reader::Separator separator;
        double highX;  // of the file's box
    } cases[] = {
        // The header box widened by 1e-5 of its extent.
        {"six bounds", six + "MAXIMUM_Z 1\n", '.', Reader::Separator::Undecided, 100.001},
        // Five bounds are no box: it comes from the points.
        {"five bounds", six, '.', Reader::Separator::Undecided, 10.0001},
        {"a keyword after blanks", six + " MAXIMUM_Z 1\n", '.', Reader::Separator::Undecided, 10.0001},
        {"fractions decide", six + "MAXIMUM_Z 1.5\n", '.', Reader::Separator::Native, 100.001},
        // Under a decimal comma, "1.5" reads as 1 natively and as 1.5 the "C" way.
        {"'.' under a comma", six + "MAXIMUM_Z 1.5\n", ',', Reader::Separator::C, 100.001},
        {"',' under a comma", six + "MAXIMUM_Z 1,5\n", ',', Reader::Separator::Native, 100.001},
    };
    for (const auto& c : cases) {
        Reader reader(File({{points + c.lines, records}}));
        reader.SetNativeDecimalPoint(c.native);
        ZonMathBox box;
        reader.GetBoundingBox(box);
        EXPECT_NEAR(box.GetHigh()[0], c.highX, 1e-9) << c.name;
        EXPECT_EQ(reader.GetSeparator(), c.separator) << c.name;
    }

    Reader placed(File({{points + "TRANSFORMATION_ROW1 1 0 0 5.5\nTRANSFORMATION_ROW2 0 1 0 6\n"
                                  "TRANSFORMATION_ROW3 0 0 1 7\nORIENTATION 0.5 0.5 0.5 0.5\nRASTER_X 0.25\n",
                         records}}));
    const Reader::Subset& subset = placed.GetSubsets().front();
    EXPECT_TRUE(subset.hasPlacement);
    EXPECT_EQ(subset.placement[0][3], 5.5);
    EXPECT_TRUE(subset.hasOrientation);
    EXPECT_EQ(subset.rasterX, 0.25);
    EXPECT_EQ(Cloud(placed), (Floats{0, 0, 0, 10, 20, 30}));  // coordinates as stored
}

TEST_F(Steinbichler, ScanTablesAreWalkedInOrderOneSetPerSubset)
{
    const SteinSubset first{"NUMBER_OF_POINTS 3\nNUMBER_OF_SCANS 2\n", SteinRecords({1, 1, 1, 2, 2, 2, 3, 3, 3}),
                            SteinSubset::Scans, Scans({{2, 1}, {0, 2}})};
    const SteinSubset second{"NUMBER_OF_POINTS 1\nNUMBER_OF_SCANS 1\n", SteinRecords({4, 4, 4}), SteinSubset::Scans,
                             Scans({{0, 1}})};
    Reader reader(File({first, second}));
    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationScans);
    std::vector<std::vector<Floats>> sets;
    reader.BeginGetSetOfScans();
    while (reader.NextSetOfScans()) {
        sets.emplace_back();
        reader.BeginGetScan();
        while (reader.NextScan()) {
            unsigned n = 0;
            const float* p = reader.GetScanPoints(n);
            sets.back().emplace_back(p, p + 3 * n);
        }
    }
    EXPECT_EQ(sets, (std::vector<std::vector<Floats>>{{{3, 3, 3}, {1, 1, 1, 2, 2, 2}}, {{4, 4, 4}}}));
    EXPECT_EQ(Cloud(reader), (Floats{3, 3, 3, 1, 1, 1, 2, 2, 2, 4, 4, 4}));
    EXPECT_EQ(ErrorKey([&] { reader.BeginGetGrid(); }), "ZonCloudReadNLSTool.ERR_NotAGridDigit");
}

TEST_F(Steinbichler, PixelTablesGiveRowsOfMaxXSlots)
{
    // Row 5 has columns 0 and 2, row 6 column 1; a third row is declared but not listed.
    const SteinSubset grid{"NUMBER_OF_POINTS 3\nPIXEL_TABLE_MAX_X 3\nPIXEL_TABLE_MAX_Y 3\n",
                           SteinRecords({1, 0, 0, 3, 0, 0, 2, 1, 0}), SteinSubset::Pixels,
                           Pixels({{0, 5}, {2, 5}, {1, 6}})};
    Reader reader(File({grid}));
    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationGrids);
    EXPECT_EQ(ErrorKey([&] { reader.NextGrid(); }), "ZonCloudReadNLSTool.ERR_BeginGetGridNotDone");
    reader.BeginGetGrid();
    EXPECT_EQ(ErrorKey([&] { reader.BeginGetGridPoints(); }), "ZonCloudReadNLSTool.ERR_NextGridNotDone");
    ASSERT_TRUE(reader.NextGrid());
    reader.BeginGetGridPoints();
    std::vector<Flags> valid;
    std::vector<Floats> rows;
    unsigned n = 0;
    const unsigned char* v = nullptr;
    while (const float* p = reader.GetGridPoints(n, v)) {
        rows.emplace_back(p, p + 3 * n);
        valid.emplace_back(v, v + n);
    }
    EXPECT_EQ(valid, (std::vector<Flags>{{1, 0, 1}, {0, 1, 0}, {0, 0, 0}}));
    EXPECT_EQ(rows[0], (Floats{1, 0, 0, 0, 0, 0, 3, 0, 0}));
    EXPECT_EQ(rows[1], (Floats{0, 0, 0, 2, 1, 0, 0, 0, 0}));
    EXPECT_FALSE(reader.NextGrid());

    // A column counts from 0: column 3 does not fit a row of 3 slots.
    SteinSubset beyond = grid;
    beyond.tableBytes = Pixels({{0, 5}, {3, 5}, {1, 6}});
    Reader bad(File({beyond}));
    EXPECT_EQ(ErrorKey([&] { bad.BeginGetGrid(); }), "ZonCloudReadNLSTool.ERR_Failure");
}

TEST_F(Steinbichler, BadFilesEndInCatalogErrors)
{
    const SteinSubset cloud{"NUMBER_OF_POINTS 1\n", SteinRecords({1, 2, 3})};
    const SteinSubset scanned{"NUMBER_OF_POINTS 1\nNUMBER_OF_SCANS 1\n", SteinRecords({1, 2, 3}), SteinSubset::Scans,
                              Scans({{0, 1}})};
    SteinSubset manyPoints = cloud;
    manyPoints.lines = "NUMBER_OF_POINTS 1000\n";
    SteinSubset badScan = scanned;
    badScan.tableBytes = Scans({{0, 2}});
    std::string loop = SteinFile({cloud, cloud});
    const std::size_t next = loop.find("NEXT_SUBSET");
    loop.replace(loop.find_first_of("0123456789", next), 10, "         4");  // back to the first subset
    const struct {
        std::string name, bytes, key;
    } cases[] = {
        {"big-endian", SteinFile({cloud}, "MM"), "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"no mark", SteinFile({cloud}, "XX"), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"a scanned subset after a plain one", SteinFile({cloud, scanned}),
         "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"more points than bytes", SteinFile({manyPoints}), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"a scan beyond its subset", SteinFile({badScan}), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"a malformed count", SteinFile({{"NUMBER_OF_POINTS one\n", ""}}), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"a subset list that loops", loop, "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"no point", SteinFile({{"COMMENT nothing\n", ""}}), "ZonCloudReadNLSTool.ERR_NoPointFound"},
        {"cut", std::string("I"), "ZonCloudOperErrorTool.ERR_ENODATA"},
    };
    for (const auto& c : cases) {
        Reader reader(Write("bad.ac", c.bytes));
        EXPECT_EQ(ErrorKey([&] { reader.GetTypeOfDigitization(); }), c.key) << c.name;
    }
}

}  // namespace
