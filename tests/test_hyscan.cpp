// Profile files of the laser line scanner: byte order, stored axes, unit,
// groups and profiles as scans, sampling over the whole file, and what bad
// files raise. Also the unit as the tool shows and applies it.
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "RangeScannerFiles.h"
#include "ZonCloudReadHyscanBin.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKeyAndSeverity;
using zontest::HyscanFile;
using zontest::HyscanHeader;
using zontest::HyscanProfile;
using Floats = std::vector<float>;
using Reader = ZonCloudReadHyscanBin;

std::vector<Floats> Scans(Reader& reader)
{
    std::vector<Floats> scans;
    reader.BeginGetSetOfScans();
    while (reader.NextSetOfScans()) {
        reader.BeginGetScan();
        while (reader.NextScan()) {
            unsigned n = 0;
            const float* p = reader.GetScanPoints(n);
            scans.emplace_back(p, p + 3 * n);
        }
    }
    return scans;
}

class Hyscan : public zontest::FilesTest {
protected:
    std::string File(const std::vector<zontest::HyscanGroup>& groups, const HyscanHeader& header = {},
                     const std::string& tail = {})
    {
        return Write("p" + std::to_string(files_++) + ".hym", HyscanFile(groups, header) + tail);
    }
    int files_ = 0;
};

TEST_F(Hyscan, ByteOrderIsProbedByWordAOrWordC)
{
    const struct {
        const char* name;
        std::uint32_t a, c;
        bool reversed;
    } cases[] = {
        {"A = 65536 is native", 0x00010000, 0, false},
        {"A = 2 x 65536 is reversed", 0x00020000, 0, true},
        {"A = 65536 + 1 is native", 0x00010001, 0, false},
        {"A = 0 leaves it to C", 0, 0x00030000, true},
    };
    for (const auto& c : cases) {
        HyscanHeader header;
        header.wordA = c.a;
        header.wordC = c.c;
        header.reversed = c.reversed;
        Reader reader(File({{{2, {1.5f, -2, 3, 4, 5, 6.25f}}}}, header));
        EXPECT_EQ(reader.IsByteReversed(), c.reversed) << c.name;
        EXPECT_EQ(zontest::PointsOf<float>(reader), (Floats{1.5f, -2, 3, 4, 5, 6.25f})) << c.name;
    }
}

TEST_F(Hyscan, StoredAxesComeFromTheDescriptorAndTheOthersAreZero)
{
    const struct {
        std::string axes;
        Reader::AxisKind kind;
        Floats values, points;
    } cases[] = {
        {"-----------XYZ", Reader::AxesXYZ, {1, 2, 3}, {1, 2, 3}},
        {"-----------YZ", Reader::AxesYZ, {2, 3}, {0, 2, 3}},
        {"-----------XZ", Reader::AxesXZ, {1, 3}, {1, 0, 3}},
        {"-----------XY", Reader::AxesXY, {1, 2}, {1, 2, 0}},
        {"-----------Z", Reader::AxisZ, {3}, {0, 0, 3}},
        {"-----------Y", Reader::AxisY, {2}, {0, 2, 0}},
        {"-----------X", Reader::AxisX, {1}, {1, 0, 0}},
    };
    for (const auto& c : cases) {
        HyscanHeader header;
        header.axes = c.axes;
        Reader reader(File({{{1, c.values}}}, header));
        EXPECT_EQ(reader.GetAxisKind(), c.kind) << c.axes;
        EXPECT_EQ(zontest::PointsOf<float>(reader), c.points) << c.axes;
    }

    const struct {
        std::string axes, error;
    } refused[] = {
        {"-----------ABC", "ZonCloudReadNLSTool.ERR_FormatNotImplemented/4"},
        // Four values per point for three stored axes.
        {"----------TXYZ", "ZonCloudReadNLSTool.ERR_UnknownData/2"},
        // Characters after the NUL do not count: one value for two axes.
        {std::string("-----------Y\0Z", 14), "ZonCloudReadNLSTool.ERR_UnknownData/2"},
    };
    for (const auto& c : refused) {
        HyscanHeader header;
        header.axes = c.axes;
        Reader reader(File({{{1, {1, 2, 3}}}}, header));
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader.GetNumberOfPoints(); }), c.error) << c.axes;
    }
}

TEST_F(Hyscan, UnitIsInchOnlyForCapitalInch)
{
    for (const auto& [unit, name] : std::vector<std::pair<std::string, std::string>>{
             {"INCH", "Inch"}, {"INCHS", "Inch"}, {"inch", "mm"}, {"mm", "mm"}, {"", "mm"}}) {
        HyscanHeader header;
        header.unit = unit;
        Reader reader(File({{{1, {1, 2, 3}}}}, header));
        EXPECT_EQ(reader.GetLengthUnit()->Name(), name) << unit;
    }
}

TEST_F(Hyscan, ProfilesAreScansSampledOverTheWholeFile)
{
    // Two groups; a trailing partial group header is not a group.
    const std::string file = File({{{3, {0, 0, 0, 1, 1, 1, 2, 2, 2}}, {0, {}}}, {{3, {3, 3, 3, 4, 4, 4, 5, 5, 5}}}},
                                  {}, std::string(121, 'g'));
    Reader reader(file);
    EXPECT_EQ(reader.GetTypeOfDigitization(), DigitizationScans);
    EXPECT_EQ(reader.GetNumberOfProfiles(), 3u);
    EXPECT_EQ(reader.GetNumberOfPoints(), 6);
    EXPECT_EQ(Scans(reader), (std::vector<Floats>{{0, 0, 0, 1, 1, 1, 2, 2, 2}, {}, {3, 3, 3, 4, 4, 4, 5, 5, 5}}));
    ZonMathBox box;
    reader.GetBoundingBox(box);
    EXPECT_EQ(box.GetHigh()[2], 5);

    // At 50 % the running index goes on from one profile to the next: 0, 2, 4.
    Reader sampled(file);
    sampled.SetSamplingPercent(50);
    EXPECT_EQ(Scans(sampled), (std::vector<Floats>{{0, 0, 0, 2, 2, 2}, {}, {4, 4, 4}}));
    EXPECT_EQ(zontest::PointsOf<float>(sampled), (Floats{0, 0, 0, 2, 2, 2, 4, 4, 4}));

    EXPECT_EQ(zontest::ErrorKey([&] { reader.NextScan(); }), "ZonCloudReadNLSTool.ERR_BeginGetScanNotDone");
}

TEST_F(Hyscan, CountsTheFileCannotHoldAreShortReads)
{
    const std::string shortRead = "ZonCloudOperErrorTool.ERR_ENODATA/2";
    const std::string one = HyscanFile({{{1, {1, 2, 3}}}});
    const auto withProfiles = [&](std::uint32_t profiles) {
        std::string bytes = one;
        std::memcpy(bytes.data() + 96 + 94, &profiles, 4);
        return bytes;
    };
    const auto withPoints = [&](std::uint32_t points) {
        std::string bytes = one;
        std::memcpy(bytes.data() + 96 + 122 + 36, &points, 4);
        return bytes;
    };
    const struct {
        const char* name;
        std::string bytes, error;
    } cases[] = {
        {"a header cut short", one.substr(0, 95), shortRead},
        {"4 billion profiles", withProfiles(0xFFFFFFFF), shortRead},
        {"a second profile missing", withProfiles(2), shortRead},
        {"4 billion points", withPoints(0xFFFFFFFF), shortRead},
        {"values cut short", one.substr(0, one.size() - 1), shortRead},
        {"no profile", HyscanFile({{}}), "ZonCloudReadNLSTool.ERR_NoPointFound/4"},
    };
    for (const auto& c : cases) {
        Reader reader(Write("bad.hym", c.bytes));
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader.GetNumberOfPoints(); }), c.error) << c.name;
    }
}

TEST_F(Hyscan, ToolShowsTheUnitAndTheEngineConvertsIt)
{
    HyscanHeader header;
    header.unit = "INCH";
    const std::string file = zontest::Quote(File({{{2, {1, 2, 3, -1, 0, 0.5f}}}}, header));
    const zontest::ToolRun info = Run("info --json " + file);
    ASSERT_EQ(info.status, 0) << info.err;
    const auto summary = nlohmann::json::parse(info.out);
    EXPECT_EQ(summary["unit"], "Inch");
    EXPECT_EQ(summary["scans"], 1);
    EXPECT_FLOAT_EQ(summary["bbox"][3].get<float>(), 25.4f);
    EXPECT_FLOAT_EQ(summary["bbox"][5].get<float>(), 76.2f);

    const zontest::ToolRun dump = Run("dump " + file);
    ASSERT_EQ(dump.status, 0) << dump.err;
    EXPECT_EQ(nlohmann::json::parse(dump.out)["unit"], "Inch");
}

}  // namespace
