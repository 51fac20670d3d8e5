// The free ASCII reader: layouts found from the file, the decimal-point
// retry, the unknown-line limits, scans between delimiter lines, sampling,
// double precision, bad files, its factory, and the fast reading of point
// lines against the scan engine.
#include <gtest/gtest.h>

#include <cctype>
#include <clocale>
#include <cmath>
#include <cstdio>
#include <cstring>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonCloudAsciiLineFormat.h"
#include "ZonCloudFactoryAsciiLibre.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKeyAndSeverity;
using zontest::PointsOf;
using Floats = std::vector<float>;

const std::string kUnknown = "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter/4";

const char* const kTwoScans =
    "G08(1)\nX 0 Y 0 Z 0\nX 1 Y 0 Z 0\nX 2 Y 0 Z 0\nX 3 Y 0 Z 0\nX 4 Y 0 Z 0\nG09\n"
    "G08(2)\nX 0 Y 1 Z 0\nX 1 Y 1 Z 0\nX 2 Y 1 Z 0\nX 3 Y 1 Z 0\nG09\n";

std::string Repeat(const std::string& line, int n)
{
    std::string text;
    while (n-- > 0) text += line;
    return text;
}

// Every scan of the one set, as lists of coordinates.
std::vector<Floats> Scans(ZonCloudReadAsciiLibre& reader)
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

class AsciiLibreTest : public zontest::FilesTest {
protected:
    static std::shared_ptr<ZonCloudReadAsciiLibre> Reader(const std::string& path)
    {
        return std::make_shared<ZonCloudReadAsciiLibre>(ZonUnicodeString(path));
    }
    std::shared_ptr<ZonCloudReadAsciiLibre> Open(const std::string& content, const std::string& name = "points.asc")
    {
        return Reader(Write(name, content));
    }
};

TEST_F(AsciiLibreTest, LayoutsAreFoundFromTheFirstPointLines)
{
    const struct {
        const char *name, *content, *format;
        Floats points;
    } cases[] = {
        {"blanks", "1.5 2.0 3.25\n4 5 6\n", " %lf %lf %lf", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"labels", "X 1.5 Y 2.0 Z 3.25\nX 4 Y 5 Z 6\n", " X %lf Y %lf Z %lf", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"labels, no blanks", "X1Y2Z3\nX4Y5Z6\n", " X%lfY%lfZ%lf", {1, 2, 3, 4, 5, 6}},
        {"semicolons", "1.5;2.0;3.25\n-4;-5;-6\n", " %lf;%lf;%lf", {1.5f, 2.0f, 3.25f, -4, -5, -6}},
        {"commas between numbers", "1.5,2.5,3.5\n4,5,6\n", " %lf,%lf,%lf", {1.5f, 2.5f, 3.5f, 4, 5, 6}},
        {"tabs and CRLF", "1\t2\t3\r\n4\t5\t6\r\n", " %lf\t%lf\t%lf", {1, 2, 3, 4, 5, 6}},
        {"trailing text", "1.5 2.0 3.25 pt1\n4 5 6 pt2\n", " %lf %lf %lf%s", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"fourth number ignored", "1 2 3 9\n4 5 6 9\n", " %lf %lf %lf", {1, 2, 3, 4, 5, 6}},
        {"exponents", "1e-3 2E+2 -3.5e0\n+4 5. .5\n", " %lf %lf %lf", {1e-3f, 200, -3.5f, 4, 5, 0.5f}},
        {"header and blank lines", "measured points\n\nX,Y,Z\n1 2 3\n4 5 6\n", " %lf %lf %lf", {1, 2, 3, 4, 5, 6}},
        {"one point, no newline", "7 8 9", " %lf %lf %lf", {7, 8, 9}},
        {"a percent sign in a label", "%1 %2 %3\n%4 %5 %6\n", " %%%lf %%%lf %%%lf", {1, 2, 3, 4, 5, 6}},
        // "1 2 3 a" promises trailing text that the next line lacks: the search
        // goes on, and the points start where the confirmed layout was found.
        {"a layout must also read the next line", "1 2 3 a\n4 5 6\n7 8 9\n", " %lf %lf %lf", {4, 5, 6, 7, 8, 9}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(c.content);
        EXPECT_EQ(reader->GetTypeOfDigitization(), 1);
        EXPECT_EQ(reader->GetLineFormat(), c.format);
        EXPECT_EQ(reader->GetNumberOfPoints(), static_cast<int>(c.points.size() / 3));
        EXPECT_EQ(PointsOf<float>(*reader), c.points);
        EXPECT_FALSE(reader->IsDecimalPointSwitched());
    }
}

TEST(AsciiLibreLineFormat, LineAnalysisResults)
{
    // As if one blank stood before the line: a fifth separator run always comes before a fifth number.
    const std::pair<std::string, int> cases[] = {
        {"1 2 3\n", 1}, {"1 2 3 4 5\n", -2}, {"a1b2c3d4e\n", 1}, {"1 2 3 4 x y\n", -2}, {"abc\n", -3},
        {"\n", -3}, {"1\n", -3}, {"1 2   \n", -6}, {"1D5 2 3\n", 1},
        {"1 2\n", 1},  // no third label to cut: the format then fails on the line itself
        {"1" + std::string(79, '_') + "2 3", 1},  // the longest label a buffer holds
        {"1" + std::string(80, '_') + "2 3", -5},
    };
    ZonCloudAsciiLineFormat::Labels labels;
    for (const auto& [line, result] : cases)
        EXPECT_EQ(ZonCloudAsciiLineFormat::AnalyseLine(line.data(), line.data() + line.size(), '.', labels), result) << line;
}

TEST_F(AsciiLibreTest, DecimalCommaIsReadAfterSwitchingWithTheLocaleUntouched)
{
    const std::string locale = std::setlocale(LC_NUMERIC, nullptr);
    ASSERT_STREQ(std::localeconv()->decimal_point, ".");

    auto reader = Open("1,5 2,25 -3,125\n4,5 5,5 6,5\n");
    EXPECT_EQ(PointsOf(*reader), (std::vector<double>{1.5, 2.25, -3.125, 4.5, 5.5, 6.5}));
    EXPECT_TRUE(reader->IsDecimalPointSwitched());
    // Under '.', "1,5 2,5 3,5" holds six numbers: every line is unknown and
    // the limit of the search triggers the switch.
    auto many = Open(Repeat("1,5 2,5 3,5\n", 150), "many.asc");
    EXPECT_EQ(many->GetNumberOfPoints(), 150);
    EXPECT_TRUE(many->IsDecimalPointSwitched());

    EXPECT_EQ(std::setlocale(LC_NUMERIC, nullptr), locale);
    EXPECT_STREQ(std::localeconv()->decimal_point, ".");
}

TEST_F(AsciiLibreTest, UnknownLineLimitsAtTheirBoundaries)
{
    const std::string point = "1 2 3\n", junk = "junk\n", ends = Repeat("G09\n", 150);
    const struct {
        const char* name;
        std::string content, error;  // error: "" when the file reads
        int points;
        bool delimited = false;
    } cases[] = {
        {"100 before the first point", Repeat(junk, 100) + point + point, "", 2},
        {"101 before the first point", Repeat(junk, 101) + point + point, kUnknown, 0},
        {"100 in a row between points", point + point + Repeat(junk, 100) + point, "", 3},
        {"101 in a row between points", point + point + Repeat(junk, 101) + point, kUnknown, 0},
        {"101 in a row at the end", point + point + Repeat(junk, 101), kUnknown, 0},
        {"300 in all", point + point + Repeat(Repeat(junk, 100) + point, 3), "", 5},
        {"301 in all", point + point + Repeat(Repeat(junk, 100) + point, 3) + junk, kUnknown, 0},
        // Delimiter lines are not unknown lines, but only when delimiters are set.
        {"150 end lines, no delimiters", point + point + ends + point, kUnknown, 0},
        {"150 end lines, delimiters", point + point + ends + point, "", 3, true},
        // Lines arrive in pieces of 511 characters: the blanks after a point
        // are pieces of their own, each an unknown line.
        {"100 pieces of blanks", point + "4 5 6" + std::string(101 * 511 - 6, ' ') + "\n", "", 2},
        {"101 pieces of blanks", point + "4 5 6" + std::string(101 * 511 - 5, ' ') + "\n", kUnknown, 0},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(c.content);
        if (c.delimited) reader->SetDelimiters("G08", "G09");
        int points = 0;
        EXPECT_EQ(ErrorKeyAndSeverity([&] { points = reader->GetNumberOfPoints(); }), c.error);
        EXPECT_EQ(points, c.points);
    }
}

TEST_F(AsciiLibreTest, DelimitersCutTheFileIntoScans)
{
    const struct {
        const char *name, *begin, *end;
        std::string content;
        int points;
        std::vector<unsigned> sizes;  // empty: a cloud
    } cases[] = {
        {"begin and end lines", "G08", "G09", kTwoScans, 9, {5, 4}},
        {"empty delimiters", "", "", kTwoScans, 9, {}},
        {"delimiters the file does not hold", "S", "E", kTwoScans, 9, {}},
        // Without end lines, a begin line starts the next scan.
        {"begin lines only", "S", "", "S 1\n1 1 1\n2 2 2\nS 2\n3 3 3\nS 3\n4 4 4\n5 5 5\n", 5, {2, 1, 2}},
        // One text for both: each such line closes a scan.
        {"same text", "--", "--", "1 1 1\n2 2 2\n--\n3 3 3\n--\n4 4 4\n", 4, {2, 1, 1}},
        // A trailing end line leaves an empty last scan when the begin text is empty.
        {"end lines only", "", "E", "1 1 1\n2 2 2\nE\n3 3 3\nE\n", 3, {2, 1, 0}},
        // Lines between an end and the next begin are skipped.
        {"points between scans", "B", "E", "B\n1 1 1\n1 1 1\nE\n9 9 9\nB\n2 2 2\n2 2 2\nE\n", 5, {2, 2}},
        // With an end text, only an end line closes a scan: a stray begin line does not.
        {"begin line inside a scan", "B", "E", "B\n1 1 1\n1 1 1\nB\n2 2 2\nE\nB\n3 3 3\nE\n", 4, {3, 1}},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(c.content);
        reader->SetDelimiters(c.begin, c.end);
        EXPECT_EQ(reader->GetTypeOfDigitization(), c.sizes.empty() ? 1 : 2);
        EXPECT_EQ(reader->GetNumberOfPoints(), c.points);
        if (c.sizes.empty()) continue;
        std::vector<unsigned> sizes;
        for (const Floats& scan : Scans(*reader)) sizes.push_back(static_cast<unsigned>(scan.size() / 3));
        EXPECT_EQ(sizes, c.sizes);
    }
}

TEST_F(AsciiLibreTest, ScansHoldTheirPointsAndAreSampledEachFromItsFirstPoint)
{
    auto reader = Open(kTwoScans);
    reader->SetDelimiters("G08", "G09");
    const std::vector<Floats> scans = {{0, 0, 0, 1, 0, 0, 2, 0, 0, 3, 0, 0, 4, 0, 0}, {0, 1, 0, 1, 1, 0, 2, 1, 0, 3, 1, 0}};
    EXPECT_EQ(Scans(*reader), scans);
    EXPECT_EQ(Scans(*reader), scans);  // iteration can start again
    EXPECT_EQ(PointsOf<float>(*reader).size(), 27u);  // the whole file is still one cloud too

    reader->SetSamplingPercent(50.0f);
    EXPECT_EQ(Scans(*reader), (std::vector<Floats>{{0, 0, 0, 2, 0, 0, 4, 0, 0}, {0, 1, 0, 2, 1, 0}}));
    // The cloud restarts its sampling at every delimiter line as well.
    EXPECT_EQ(PointsOf<float>(*reader), (Floats{0, 0, 0, 2, 0, 0, 4, 0, 0, 0, 1, 0, 2, 1, 0}));
    reader->SetSamplingPercent(100.0f);
    EXPECT_EQ(PointsOf<float>(*reader).size(), 27u);

    // Without delimiters the file is one run.
    auto cloud = Open(kTwoScans, "cloud.asc");
    cloud->SetSamplingPercent(50.0f);
    EXPECT_EQ(PointsOf<float>(*cloud), (Floats{0, 0, 0, 2, 0, 0, 4, 0, 0, 1, 1, 0, 3, 1, 0}));
}

TEST_F(AsciiLibreTest, ScanProtocolIsEnforced)
{
    auto reader = Open(kTwoScans);
    reader->SetDelimiters("G08", "G09");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->NextSetOfScans(); }), "ZonCloudReadNLSTool.ERR_BeginGetSetOfScansNotDone/4");
    reader->BeginGetSetOfScans();
    EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->BeginGetScan(); }), "ZonCloudReadNLSTool.ERR_NextSetOfScansNotDone/1");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->NextScan(); }), "ZonCloudReadNLSTool.ERR_BeginGetScanNotDone/1");
    ASSERT_TRUE(reader->NextSetOfScans());
    reader->BeginGetScan();
    std::string answers;
    for (int i = 0; i < 4; ++i) answers += reader->NextScan() ? 'y' : 'n';
    EXPECT_EQ(answers, "yynn");
    EXPECT_FALSE(reader->NextSetOfScans());
    EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->NextSetOfScans(); }), "ZonCloudReadNLSTool.ERR_BeginGetSetOfScansNotDone/4");

    auto cloud = Open(kTwoScans, "cloud.asc");
    cloud->SetDelimiters("", "");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { cloud->BeginGetSetOfScans(); }), "ZonCloudReadNLSTool.ERR_NotAScanDigit/1");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { cloud->NextScan(); }), "ZonCloudReadNLSTool.ERR_NotAScanDigit/1");
}

TEST_F(AsciiLibreTest, KeptAndReReadPointsAgree)
{
    // The points kept by the analysis and those read again from the file must
    // be the same, for every precision and percent.
    std::mt19937 random(7);
    std::uniform_real_distribution<double> coordinate(-1000.0, 1000.0);
    std::string content = "S 1\n";
    char line[128];
    for (int i = 0; i < 2000; ++i) {
        if (i == 700 || i == 1500) content += "E\nS\n";
        std::snprintf(line, sizeof line, "%.9f %.9f %.9f\n", coordinate(random), coordinate(random), coordinate(random));
        content += line;
    }
    const std::string path = Write("points.asc", content);
    for (const float percent : {100.0f, 37.5f, 0.0f}) {
        for (const bool withScans : {false, true}) {
            SCOPED_TRACE(::testing::Message() << percent << (withScans ? " scans" : " cloud"));
            // Analysed in single precision then asked for doubles (read again), and the other way round.
            auto single = Reader(path), twice = Reader(path);
            twice->SetDoublePrecision(true);
            for (auto* r : {single.get(), twice.get()}) {
                if (withScans) r->SetDelimiters("S", "E");
                r->SetSamplingPercent(percent);
            }
            const auto floats = PointsOf<float>(*single);
            const auto doubles = PointsOf(*single);
            EXPECT_EQ(PointsOf(*twice), doubles);
            EXPECT_EQ(PointsOf<float>(*twice), floats);
            ASSERT_EQ(floats.size(), doubles.size());
            for (std::size_t k = 0; k < floats.size(); ++k) ASSERT_EQ(floats[k], static_cast<float>(doubles[k]));
        }
    }
}

TEST_F(AsciiLibreTest, DoublePrecisionKeepsAllDigits)
{
    auto reader = Open("0.1 123456789.123456789 -1e-300\n1 2 3\n");
    reader->SetDoublePrecision(true);
    EXPECT_EQ(PointsOf(*reader), (std::vector<double>{0.1, 123456789.123456789, -1e-300, 1, 2, 3}));
    EXPECT_EQ(PointsOf<float>(*reader), (Floats{0.1f, 123456789.123456789f, -0.0f, 1, 2, 3}));
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_EQ(box.GetHigh()[1], 123456789.123456789);
    EXPECT_EQ(box.GetLow()[2], -1e-300);
}

TEST_F(AsciiLibreTest, BadFilesEndInTheirErrors)
{
    std::string garbage(4096, '\0');
    std::mt19937 random(3);
    for (char& c : garbage) c = static_cast<char>(random() & 0xff);
    std::filesystem::create_directory(Path("folder.asc"));
    const std::string unknownData = "ZonCloudReadNLSTool.ERR_UnknownData/4";
    const std::pair<std::string, std::string> cases[] = {
        {Write("empty.asc", ""), unknownData},
        {Write("words.asc", "just words\nand more\n"), unknownData},
        {Write("garbage.asc", garbage), unknownData},
        {Write("long.asc", std::string(100 * 1024, 'a') + "\n1 2 3\n"), kUnknown},
        {Write("digits.asc", "1 2 3\n4 5 6\n" + std::string(100 * 1024, '7') + "\n"), kUnknown},
        {Path("folder.asc"), "ZonCloudOperErrorTool.ERR_EISDIR/4"},
        {Path("missing.asc"), "ZonCloudOperErrorTool.ERR_ENOENT/4"},
    };
    for (const auto& [path, error] : cases) {
        SCOPED_TRACE(path);
        auto reader = Reader(path);
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->GetTypeOfDigitization(); }), error);
        // Asking again raises again rather than answering from half a state.
        unsigned n = 0;
        EXPECT_EQ(ErrorKeyAndSeverity([&] { reader->GetPoints(n); }), error);
    }
}

TEST_F(AsciiLibreTest, FactoryAppliesTheDelimiterAndDirectionSettings)
{
    auto& settings = ZonCldSettings::Instance();
    settings.ResetAll();
    settings.SetValue("StartDelimitor", "G08");
    settings.SetValue("EndDelimitor", "G09");
    settings.SetInt("ScanDirection", 2);
    auto reader = ZonCloudFactoryAsciiLibre().CreateReader(Write("scans.asc", kTwoScans));
    settings.ResetAll();
    EXPECT_EQ(reader->GetTypeOfDigitization(), 2);
    int direction = 0;
    ZonQueryInterface<ZonICloudReadOptDirection>(reader)->GetScanDirection(direction);
    EXPECT_EQ(direction, 2);
}

// The fast reading of point lines must give exactly the scan engine's answers.
TEST(AsciiLibreLineFormat, FastReadingAgreesWithTheScanEngine)
{
    // Each layout gives the format; its digits are then replaced by number texts.
    const std::string layouts[] = {"1 2 3", "X 1 Y 2 Z 3", "1;2;3", "1 2 3 t"};
    const char* const numbers[] = {
        "0", "-0", "+1", "1.", ".5", "-.5", "1.5", "1e5", "1E-5", "1e+5", "1e", "1e+", "1.5e", "0x1p3", "0x",
        "inf", "-infinity", "nan", "NAN(12)", "-", "+", ".", "1.5.5", "1e5.5", "1e5e5", "00012.3400",
        "0.1000000000000000055511151231257827", "123456789012345678901234567890", "9007199254740993",
        "1e22", "1e23", "1e-22", "1e-23", "1e400", "-1e400", "1e-400", "4.9e-324", "2.2250738585072014e-308",
        "1D5", "1,5", "12345678901234567890.5", "0.000000000000000000000000000001", "7x", "1.7976931348623157e308",
        "1e99999999999999999999", "", " ",
    };
    std::mt19937 random(11);
    int fastDecisions = 0;
    for (const auto& layout : layouts) {
        ZonCloudAsciiLineFormat format;
        ZonCloudAsciiLineFormat::Labels labels;
        ASSERT_EQ(ZonCloudAsciiLineFormat::AnalyseLine(layout.data(), layout.data() + layout.size(), '.', labels), 1);
        format.Build(labels);
        const int expected = layout.back() == 't' ? 4 : 3;
        for (int trial = 0; trial < 3000; ++trial) {
            std::string line;
            for (const char c : layout) line += std::isdigit(c) ? numbers[random() % std::size(numbers)] : std::string(1, c);
            if (trial % 7 == 0) line += "\n";
            if (trial % 11 == 0) line.insert(random() % (line.size() + 1), 1, '\0');
            if (trial % 13 == 0) line.insert(random() % (line.size() + 1), 1, ' ');
            SCOPED_TRACE(::testing::Message() << "line \"" << line << "\" format \"" << format.Text() << "\"");
            double engine[3] = {0, 0, 0}, fast[3] = {0, 0, 0};
            const bool engineReads = format.ScanWithEngine(line.data(), line.data() + line.size(), '.', engine) == expected;
            ASSERT_EQ(format.Parse(line.data(), line.data() + line.size(), '.', fast), engineReads);
            if (!engineReads) continue;
            ++fastDecisions;
            for (int k = 0; k < 3; ++k)
                ASSERT_TRUE(std::isnan(engine[k]) ? std::isnan(fast[k]) : std::memcmp(&engine[k], &fast[k], sizeof(double)) == 0) << k;
        }
    }
    EXPECT_GT(fastDecisions, 1000);
}

}  // namespace
