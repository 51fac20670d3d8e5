// The free ASCII reader: layouts found from the file, the decimal-point
// retry, the unknown-line limits, scans between delimiter lines, sampling,
// double precision, box queries, bad files, and its factory.
#include <gtest/gtest.h>

#include <algorithm>
#include <clocale>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonCloudAsciiLineFormat.h"
#include "ZonCloudFactoryAsciiLibre.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonError.h"
#include "ZonObjectRegistry.h"

namespace {

namespace fs = std::filesystem;

class AsciiLibreTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        std::string pattern = (fs::temp_directory_path() / "zon-ascii-libre-XXXXXX").string();
        ASSERT_NE(mkdtemp(pattern.data()), nullptr);
        dir_ = pattern;
    }
    void TearDown() override
    {
        std::error_code ignored;
        fs::remove_all(dir_, ignored);
    }

    std::string Write(const std::string& content, const std::string& name = "points.asc")
    {
        const fs::path path = dir_ / name;
        std::ofstream out(path, std::ios::binary);
        out << content;
        return path.string();
    }
    static std::shared_ptr<ZonCloudReadAsciiLibre> Open(const std::string& path)
    {
        return std::make_shared<ZonCloudReadAsciiLibre>(ZonUnicodeString(path));
    }
    static std::vector<float> Points(ZonCloudReadAsciiLibre& reader)
    {
        unsigned n = 0;
        const float* p = reader.GetPoints(n);
        return p ? std::vector<float>(p, p + 3 * n) : std::vector<float>();
    }
    static std::vector<double> PointsDouble(ZonCloudReadAsciiLibre& reader)
    {
        unsigned n = 0;
        const double* p = reader.GetPointsDouble(n);
        return p ? std::vector<double>(p, p + 3 * n) : std::vector<double>();
    }
    // Every scan of the one set, as lists of coordinates.
    static std::vector<std::vector<float>> Scans(ZonCloudReadAsciiLibre& reader)
    {
        std::vector<std::vector<float>> scans;
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
    static std::string Repeat(const std::string& line, int n)
    {
        std::string text;
        for (int i = 0; i < n; ++i) text += line;
        return text;
    }

    fs::path dir_;
};

// Runs f and returns the key of the error it raises ("" when none) and its severity.
std::string ErrorKey(const std::function<void()>& f, int* severity = nullptr)
{
    try {
        f();
    } catch (const ZonError& error) {
        if (severity) *severity = error.GetSeverity();
        return error.GetMessageKey();
    }
    return "";
}

// ---------------------------------------------------------------------------
// Layouts

struct LayoutCase {
    const char* name;
    const char* content;
    const char* format;
    std::vector<float> points;
};

TEST_F(AsciiLibreTest, LayoutsAreFoundFromTheFirstPointLines)
{
    const LayoutCase cases[] = {
        {"blanks", "1.5 2.0 3.25\n4 5 6\n", " %lf %lf %lf", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"labels", "X 1.5 Y 2.0 Z 3.25\nX 4 Y 5 Z 6\n", " X %lf Y %lf Z %lf", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"labels, no blanks", "X1Y2Z3\nX4Y5Z6\n", " X%lfY%lfZ%lf", {1, 2, 3, 4, 5, 6}},
        {"semicolons", "1.5;2.0;3.25\n-4;-5;-6\n", " %lf;%lf;%lf", {1.5f, 2.0f, 3.25f, -4, -5, -6}},
        {"tabs and CRLF", "1\t2\t3\r\n4\t5\t6\r\n", " %lf\t%lf\t%lf", {1, 2, 3, 4, 5, 6}},
        {"trailing text", "1.5 2.0 3.25 pt1\n4 5 6 pt2\n", " %lf %lf %lf%s", {1.5f, 2.0f, 3.25f, 4, 5, 6}},
        {"fourth number ignored", "1 2 3 9\n4 5 6 9\n", " %lf %lf %lf", {1, 2, 3, 4, 5, 6}},
        {"exponents", "1e-3 2E+2 -3.5e0\n+4 5. .5\n", " %lf %lf %lf", {1e-3f, 200, -3.5f, 4, 5, 0.5f}},
        {"header and blank lines", "points of part 7\n\nX,Y,Z\n1 2 3\n4 5 6\n", " %lf %lf %lf", {1, 2, 3, 4, 5, 6}},
        {"one point, no newline", "7 8 9", " %lf %lf %lf", {7, 8, 9}},
        {"a percent sign in a label", "%1 %2 %3\n%4 %5 %6\n", " %%%lf %%%lf %%%lf", {1, 2, 3, 4, 5, 6}},
    };
    for (const LayoutCase& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(Write(c.content));
        EXPECT_EQ(reader->GetTypeOfDigitization(), 1);
        EXPECT_EQ(reader->GetLineFormat(), c.format);
        EXPECT_EQ(reader->GetNumberOfPoints(), static_cast<int>(c.points.size() / 3));
        EXPECT_EQ(Points(*reader), c.points);
        EXPECT_FALSE(reader->IsDecimalPointSwitched());
    }
}

TEST_F(AsciiLibreTest, LineAnalysisResults)
{
    struct Case {
        const char* line;
        int result;
    };
    const Case cases[] = {
        // With the leading blank, a fifth separator run always comes before a fifth number.
        {"1 2 3\n", 1},        {"1 2 3 4 5\n", -2},  {"a1b2c3d4e\n", 1},  {"1 2 3 4 x y\n", -2},
        {"abc\n", -3},         {"\n", -3},            {"1\n", -3},         {"1 2   \n", -6},
        {"1D5 2 3\n", 1},      {"1 2\n", 1},  // no third label to cut: the format then fails on the line itself
    };
    ZonCloudAsciiLineFormat::Labels labels;
    for (const Case& c : cases) {
        SCOPED_TRACE(c.line);
        EXPECT_EQ(ZonCloudAsciiLineFormat::AnalyseLine(c.line, c.line + std::strlen(c.line), '.', labels), c.result);
    }
    const std::string longLabel = "1 " + std::string(80, '_') + " 2 3";
    EXPECT_EQ(ZonCloudAsciiLineFormat::AnalyseLine(longLabel.data(), longLabel.data() + longLabel.size(), '.', labels),
              -5);
}

TEST_F(AsciiLibreTest, AFormatMustAlsoReadTheNextLine)
{
    // "1 2 3 a" promises trailing text that the next line lacks: the search
    // goes on, and the points start where the confirmed layout was found.
    auto reader = Open(Write("1 2 3 a\n4 5 6\n7 8 9\n"));
    EXPECT_EQ(reader->GetLineFormat(), "");
    EXPECT_EQ(reader->GetNumberOfPoints(), 2);
    EXPECT_EQ(reader->GetLineFormat(), " %lf %lf %lf");
    EXPECT_EQ(Points(*reader), (std::vector<float>{4, 5, 6, 7, 8, 9}));
}

// ---------------------------------------------------------------------------
// Decimal point

TEST_F(AsciiLibreTest, DecimalCommaIsReadAfterSwitchingWithTheLocaleUntouched)
{
    const std::string localeBefore = std::setlocale(LC_NUMERIC, nullptr);
    const std::string pointBefore = std::localeconv()->decimal_point;
    ASSERT_EQ(pointBefore, ".");

    auto reader = Open(Write("1,5 2,25 -3,125\n4,5 5,5 6,5\n"));
    EXPECT_EQ(reader->GetNumberOfPoints(), 2);
    EXPECT_TRUE(reader->IsDecimalPointSwitched());
    EXPECT_EQ(Points(*reader), (std::vector<float>{1.5f, 2.25f, -3.125f, 4.5f, 5.5f, 6.5f}));
    EXPECT_EQ(PointsDouble(*reader), (std::vector<double>{1.5, 2.25, -3.125, 4.5, 5.5, 6.5}));

    EXPECT_EQ(std::string(std::setlocale(LC_NUMERIC, nullptr)), localeBefore);
    EXPECT_EQ(std::string(std::localeconv()->decimal_point), pointBefore);

    // Commas between numbers written with points need no switch.
    auto points = Open(Write("1.5,2.5,3.5\n4,5,6\n", "commas.asc"));
    EXPECT_EQ(points->GetNumberOfPoints(), 2);
    EXPECT_FALSE(points->IsDecimalPointSwitched());
    EXPECT_EQ(Points(*points), (std::vector<float>{1.5f, 2.5f, 3.5f, 4, 5, 6}));
}

TEST_F(AsciiLibreTest, DecimalCommaAfterManyHeaderLines)
{
    // Under '.', "1,5 2,5 3,5" holds six numbers: every line is unknown and
    // the limit of the search triggers the switch.
    auto reader = Open(Write(Repeat("1,5 2,5 3,5\n", 150)));
    EXPECT_EQ(reader->GetNumberOfPoints(), 150);
    EXPECT_TRUE(reader->IsDecimalPointSwitched());
}

// ---------------------------------------------------------------------------
// Unknown lines

TEST_F(AsciiLibreTest, UnknownLineLimitsAtTheirBoundaries)
{
    const std::string point = "1 2 3\n";
    const std::string junk = "junk\n";
    struct Case {
        const char* name;
        std::string content;
        std::string key;  // "" when the file reads
        int points;
    };
    const Case cases[] = {
        {"100 before the first point", Repeat(junk, 100) + Repeat(point, 2), "", 2},
        {"101 before the first point", Repeat(junk, 101) + Repeat(point, 2),
         "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter", 0},
        {"100 in a row between points", Repeat(point, 2) + Repeat(junk, 100) + point, "", 3},
        {"101 in a row between points", Repeat(point, 2) + Repeat(junk, 101) + point,
         "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter", 0},
        {"300 in all", point + point + Repeat(Repeat(junk, 100) + point, 3), "", 5},
        {"301 in all", point + point + Repeat(Repeat(junk, 100) + point, 3) + junk,
         "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter", 0},
        {"101 in a row at the end", Repeat(point, 2) + Repeat(junk, 101),
         "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter", 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(Write(c.content));
        int severity = 0;
        int points = 0;
        EXPECT_EQ(ErrorKey([&] { points = reader->GetNumberOfPoints(); }, &severity), c.key);
        if (c.key.empty()) {
            EXPECT_EQ(points, c.points);
        } else {
            EXPECT_EQ(severity, 4);  // type 3
        }
    }
}

TEST_F(AsciiLibreTest, DelimiterLinesAreNotUnknownLines)
{
    // 150 delimiter lines in a row: an error without delimiters, scans with them.
    const std::string content = "1 2 3\n4 5 6\n" + Repeat("G09\n", 150) + "7 8 9\n";
    auto plain = Open(Write(content));
    EXPECT_EQ(ErrorKey([&] { plain->GetNumberOfPoints(); }), "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter");

    auto scans = Open(Write(content));
    scans->SetDelimiters("G08", "G09");
    EXPECT_EQ(scans->GetNumberOfPoints(), 3);
    EXPECT_EQ(scans->GetTypeOfDigitization(), 2);
}

// ---------------------------------------------------------------------------
// Scans

const char* const kTwoScans =
    "G08(1)\n"
    "X 0 Y 0 Z 0\nX 1 Y 0 Z 0\nX 2 Y 0 Z 0\nX 3 Y 0 Z 0\nX 4 Y 0 Z 0\n"
    "G09\n"
    "G08(2)\n"
    "X 0 Y 1 Z 0\nX 1 Y 1 Z 0\nX 2 Y 1 Z 0\nX 3 Y 1 Z 0\n"
    "G09\n";

TEST_F(AsciiLibreTest, DelimitersGiveScans)
{
    auto reader = Open(Write(kTwoScans));
    reader->SetDelimiters("G08", "G09");
    EXPECT_EQ(reader->GetTypeOfDigitization(), 2);
    EXPECT_EQ(reader->GetNumberOfPoints(), 9);
    ZonUnicodeString begin, end;
    reader->GetDelimiters(begin, end);
    EXPECT_EQ(begin.ToUtf8(), "G08");
    EXPECT_EQ(end.ToUtf8(), "G09");

    const auto scans = Scans(*reader);
    ASSERT_EQ(scans.size(), 2u);
    EXPECT_EQ(scans[0], (std::vector<float>{0, 0, 0, 1, 0, 0, 2, 0, 0, 3, 0, 0, 4, 0, 0}));
    EXPECT_EQ(scans[1], (std::vector<float>{0, 1, 0, 1, 1, 0, 2, 1, 0, 3, 1, 0}));
    // The whole file is still one cloud too; iteration can start again.
    EXPECT_EQ(Points(*reader).size(), 27u);
    EXPECT_EQ(Scans(*reader), scans);
}

TEST_F(AsciiLibreTest, EmptyDelimitersGiveACloud)
{
    auto reader = Open(Write(kTwoScans));
    reader->SetDelimiters("", "");
    EXPECT_EQ(reader->GetTypeOfDigitization(), 1);
    EXPECT_EQ(reader->GetNumberOfPoints(), 9);
    ZonUnicodeString begin("x"), end("y");
    reader->GetDelimiters(begin, end);
    EXPECT_TRUE(begin.IsNull() && end.IsNull());
    EXPECT_EQ(ErrorKey([&] { reader->BeginGetSetOfScans(); }), "ZonCloudReadNLSTool.ERR_NotAScanDigit");

    // Delimiters the file does not hold leave it a cloud as well.
    auto other = Open(Write(kTwoScans, "other.asc"));
    other->SetDelimiters("S", "E");
    EXPECT_EQ(other->GetTypeOfDigitization(), 1);
}

TEST_F(AsciiLibreTest, ScanVariants)
{
    struct Case {
        const char* name;
        const char* begin;
        const char* end;
        std::string content;
        std::vector<unsigned> sizes;
    };
    const Case cases[] = {
        // Without end lines, a begin line starts the next scan.
        {"begin lines only", "S", "", "S 1\n1 1 1\n2 2 2\nS 2\n3 3 3\nS 3\n4 4 4\n5 5 5\n", {2, 1, 2}},
        // One text for both: each such line closes a scan.
        {"same text", "--", "--", "1 1 1\n2 2 2\n--\n3 3 3\n--\n4 4 4\n", {2, 1, 1}},
        // Lines between an end and the next begin are skipped; a trailing end
        // line leaves an empty last scan when the begin text is empty.
        {"end lines only", "", "E", "1 1 1\n2 2 2\nE\n3 3 3\nE\n", {2, 1, 0}},
        {"points between scans skipped", "B", "E", "B\n1 1 1\n1 1 1\nE\n9 9 9\nB\n2 2 2\n2 2 2\nE\n", {2, 2}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(Write(c.content));
        reader->SetDelimiters(c.begin, c.end);
        ASSERT_EQ(reader->GetTypeOfDigitization(), 2);
        std::vector<unsigned> sizes;
        for (const auto& scan : Scans(*reader)) sizes.push_back(static_cast<unsigned>(scan.size() / 3));
        EXPECT_EQ(sizes, c.sizes);
    }
}

TEST_F(AsciiLibreTest, ScanProtocolIsEnforced)
{
    auto reader = Open(Write(kTwoScans));
    reader->SetDelimiters("G08", "G09");
    int severity = 0;
    EXPECT_EQ(ErrorKey([&] { reader->NextSetOfScans(); }, &severity),
              "ZonCloudReadNLSTool.ERR_BeginGetSetOfScansNotDone");
    EXPECT_EQ(severity, 4);
    reader->BeginGetSetOfScans();
    EXPECT_EQ(ErrorKey([&] { reader->BeginGetScan(); }, &severity), "ZonCloudReadNLSTool.ERR_NextSetOfScansNotDone");
    EXPECT_EQ(severity, 1);
    EXPECT_EQ(ErrorKey([&] { reader->NextScan(); }), "ZonCloudReadNLSTool.ERR_BeginGetScanNotDone");
    ASSERT_TRUE(reader->NextSetOfScans());
    reader->BeginGetScan();
    EXPECT_TRUE(reader->NextScan());
    EXPECT_TRUE(reader->NextScan());
    EXPECT_FALSE(reader->NextScan());
    EXPECT_FALSE(reader->NextScan());
    EXPECT_FALSE(reader->NextSetOfScans());
    EXPECT_EQ(ErrorKey([&] { reader->NextSetOfScans(); }), "ZonCloudReadNLSTool.ERR_BeginGetSetOfScansNotDone");

    auto cloud = Open(Write("1 2 3\n4 5 6\n", "cloud.asc"));
    EXPECT_EQ(ErrorKey([&] { cloud->NextScan(); }), "ZonCloudReadNLSTool.ERR_NotAScanDigit");
}

// ---------------------------------------------------------------------------
// Sampling and precision

TEST_F(AsciiLibreTest, SamplingHalfKeepsEachScansFirstPoint)
{
    auto reader = Open(Write(kTwoScans));
    reader->SetDelimiters("G08", "G09");
    reader->SetSamplingPercent(50.0f);
    const auto scans = Scans(*reader);
    ASSERT_EQ(scans.size(), 2u);
    EXPECT_EQ(scans[0], (std::vector<float>{0, 0, 0, 2, 0, 0, 4, 0, 0}));
    EXPECT_EQ(scans[1], (std::vector<float>{0, 1, 0, 2, 1, 0}));
    // The cloud restarts its sampling at every delimiter line as well.
    EXPECT_EQ(Points(*reader), (std::vector<float>{0, 0, 0, 2, 0, 0, 4, 0, 0, 0, 1, 0, 2, 1, 0}));

    // Without delimiters the file is one run.
    auto cloud = Open(Write(kTwoScans, "cloud.asc"));
    cloud->SetSamplingPercent(50.0f);
    EXPECT_EQ(Points(*cloud), (std::vector<float>{0, 0, 0, 2, 0, 0, 4, 0, 0, 1, 1, 0, 3, 1, 0}));

    // Back to 100: everything again.
    reader->SetSamplingPercent(100.0f);
    EXPECT_EQ(Points(*reader).size(), 27u);
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
        std::snprintf(line, sizeof line, "%.9f %.9f %.9f\n", coordinate(random), coordinate(random),
                      coordinate(random));
        content += line;
    }
    const std::string path = Write(content);
    for (const float percent : {100.0f, 37.5f, 0.0f}) {
        for (const bool withScans : {false, true}) {
            SCOPED_TRACE(::testing::Message() << percent << (withScans ? " scans" : " cloud"));
            // Analysed in single precision, then asked for doubles: read again.
            auto single = Open(path);
            auto twice = Open(path);
            twice->SetDoublePrecision(true);
            if (withScans) {
                single->SetDelimiters("S", "E");
                twice->SetDelimiters("S", "E");
            }
            single->SetSamplingPercent(percent);
            twice->SetSamplingPercent(percent);
            const auto floats = Points(*single);
            const auto doubles = PointsDouble(*single);
            EXPECT_EQ(PointsDouble(*twice), doubles);
            EXPECT_EQ(Points(*twice), floats);
            ASSERT_EQ(floats.size(), doubles.size());
            for (std::size_t k = 0; k < floats.size(); ++k) ASSERT_EQ(floats[k], static_cast<float>(doubles[k]));
        }
    }
}

TEST_F(AsciiLibreTest, DoublePrecisionKeepsAllDigits)
{
    auto reader = Open(Write("0.1 123456789.123456789 -1e-300\n1 2 3\n"));
    reader->SetDoublePrecision(true);
    EXPECT_TRUE(reader->HasDoublePrecision());
    const auto doubles = PointsDouble(*reader);
    ASSERT_EQ(doubles.size(), 6u);
    EXPECT_EQ(doubles[0], 0.1);
    EXPECT_EQ(doubles[1], 123456789.123456789);
    EXPECT_EQ(doubles[2], -1e-300);
    const auto floats = Points(*reader);
    EXPECT_EQ(floats[1], 123456789.123456789f);
    EXPECT_EQ(floats[2], -0.0f);
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_EQ(box.GetHigh()[1], 123456789.123456789);
    EXPECT_EQ(box.GetLow()[2], -1e-300);
}

// ---------------------------------------------------------------------------
// Box queries

TEST_F(AsciiLibreTest, BoxQueries)
{
    auto reader = Open(Write("0 0 0\n1 1 1\n2 2 2\n"));
    unsigned n = 0;
    const float* all = reader->GetPoints(n);
    ZonMathBox fileBox;
    reader->GetBoundingBox(fileBox);
    EXPECT_TRUE(fileBox.IsSameAs(ZonMathBox(0, 2, 0, 2, 0, 2)));

    unsigned inBox = 0;
    EXPECT_EQ(reader->GetPointsInBox(fileBox, inBox), all);
    EXPECT_EQ(inBox, 3u);
    // Half-open below the file's top: the point at 2 is out.
    const float* lower = reader->GetPointsInBox(ZonMathBox(0, 1.5, 0, 1.5, 0, 1.5), inBox);
    ASSERT_EQ(inBox, 2u);
    EXPECT_EQ(std::vector<float>(lower, lower + 6), (std::vector<float>{0, 0, 0, 1, 1, 1}));
    const double* upper = reader->GetPointsInBoxDouble(ZonMathBox(1, 2, 1, 2, 1, 2), inBox);
    ASSERT_EQ(inBox, 2u);
    EXPECT_EQ(std::vector<double>(upper, upper + 6), (std::vector<double>{1, 1, 1, 2, 2, 2}));
    reader->GetPointsInBox(ZonMathBox(5, 6, 5, 6, 5, 6), inBox);
    EXPECT_EQ(inBox, 0u);

    auto scans = Open(Write(kTwoScans, "scans.asc"));
    scans->SetDelimiters("G08", "G09");
    auto scanFile = ZonQueryInterface<ZonICloudReadScanFile>(ZonICloudReadFile_var(scans));
    ASSERT_TRUE(scanFile);
    scanFile->BeginGetSetOfScans();
    ASSERT_TRUE(scanFile->NextSetOfScans());
    scanFile->BeginGetScan();
    ASSERT_TRUE(scanFile->NextScan());
    scanFile->GetScanPointsInBox(ZonMathBox(1, 3, -1, 1, -1, 1), inBox);
    EXPECT_EQ(inBox, 2u);
    ASSERT_TRUE(scanFile->NextScan());
    EXPECT_EQ(scanFile->GetScanPointsInBox(ZonMathBox(0, 4, -1, 0.5, -1, 1), inBox), nullptr);
    EXPECT_EQ(inBox, 0u);
}

// ---------------------------------------------------------------------------
// Bad files

TEST_F(AsciiLibreTest, BadFilesEndInTheirErrors)
{
    std::string garbage(4096, '\0');
    std::mt19937 random(3);
    for (char& c : garbage) c = static_cast<char>(random() & 0xff);
    const std::string longLine = std::string(100 * 1024, 'a') + "\n1 2 3\n";
    const std::string longDigitLine = std::string(100 * 1024, '7') + "\n";
    fs::create_directory(dir_ / "folder.asc");

    struct Case {
        const char* name;
        std::string path;
        std::string key;
    };
    const Case cases[] = {
        {"empty", Write("", "empty.asc"), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"no numbers", Write("just words\nand more\n", "words.asc"), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"binary garbage", Write(garbage, "garbage.asc"), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"100 kB line", Write(longLine, "long.asc"), "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter"},
        {"100 kB line of digits after points", Write("1 2 3\n4 5 6\n" + longDigitLine, "digits.asc"),
         "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter"},
        {"directory", (dir_ / "folder.asc").string(), "ZonCloudOperErrorTool.ERR_EISDIR"},
        {"missing", (dir_ / "missing.asc").string(), "ZonCloudOperErrorTool.ERR_ENOENT"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        auto reader = Open(c.path);
        int severity = 0;
        EXPECT_EQ(ErrorKey([&] { reader->GetTypeOfDigitization(); }, &severity), c.key);
        EXPECT_EQ(severity, 4);
        // Asking again raises again rather than answering from half a state.
        unsigned n = 0;
        EXPECT_EQ(ErrorKey([&] { reader->GetPoints(n); }), c.key);
    }
}

TEST_F(AsciiLibreTest, LongLinesArriveInPiecesOf511Characters)
{
    // A point followed by enough blanks to fill the 512-character buffer: the
    // rest of the line is a piece of its own (one unknown line), the point stays.
    const std::string padded = "1 2 3" + std::string(600, ' ') + "\n";
    auto reader = Open(Write("4 5 6\n" + padded + padded));
    EXPECT_EQ(reader->GetNumberOfPoints(), 3);
    // 101 pieces of blanks after a point are 101 unknown lines in a row.
    auto tooLong = Open(Write("1 2 3\n4 5 6" + std::string(101 * 511 - 5, ' ') + "\n", "long.asc"));
    EXPECT_EQ(ErrorKey([&] { tooLong->GetNumberOfPoints(); }), "ZonCloudReadNLSTool.ERR_UnknownDataOrDelimiter");
}

// ---------------------------------------------------------------------------
// The fast reading of point lines against the scan engine

TEST(AsciiLibreLineFormat, FastReadingAgreesWithTheScanEngine)
{
    struct Layout {
        const char* line;  // gives the format
        std::vector<std::string> prefix;  // the labels before each number
        const char* suffix;
    };
    const Layout layouts[] = {
        {"1 2 3", {"", " ", " "}, ""},
        {"X 1 Y 2 Z 3", {"X ", " Y ", " Z "}, ""},
        {"1;2;3", {"", ";", ";"}, ""},
        {"1 2 3 t", {"", " ", " "}, " t"},
    };
    const std::vector<std::string> numbers = {
        "0", "-0", "+1", "1.", ".5", "-.5", "1.5", "1e5", "1E-5", "1e+5", "1e", "1e+", "1.5e", "0x1p3", "0x",
        "inf", "-infinity", "nan", "NAN(12)", "-", "+", ".", "1.5.5", "1e5.5", "1e5e5", "00012.3400",
        "0.1000000000000000055511151231257827", "123456789012345678901234567890", "9007199254740993",
        "1e22", "1e23", "1e-22", "1e-23", "1e400", "-1e400", "1e-400", "4.9e-324", "2.2250738585072014e-308",
        "1D5", "1,5", "12345678901234567890.5", "0.000000000000000000000000000001", "7x", "1.7976931348623157e308",
        "1e99999999999999999999", "", " ",
    };
    std::mt19937 random(11);
    int fastDecisions = 0;
    for (const Layout& layout : layouts) {
        ZonCloudAsciiLineFormat format;
        ZonCloudAsciiLineFormat::Labels labels;
        ASSERT_EQ(ZonCloudAsciiLineFormat::AnalyseLine(layout.line, layout.line + std::strlen(layout.line), '.',
                                                       labels),
                  1);
        format.Build(labels);
        const int expected = std::strlen(layout.suffix) > 0 ? 4 : 3;
        for (int trial = 0; trial < 4000; ++trial) {
            std::string line;
            for (int k = 0; k < 3; ++k) {
                line += layout.prefix[k];
                line += numbers[random() % numbers.size()];
            }
            line += layout.suffix;
            if (trial % 7 == 0) line += "\n";
            if (trial % 11 == 0) line.insert(random() % (line.size() + 1), 1, '\0');
            if (trial % 13 == 0) line.insert(random() % (line.size() + 1), 1, ' ');
            SCOPED_TRACE(::testing::Message() << "line \"" << line << "\" format \"" << format.Text() << "\"");
            double engine[3] = {0, 0, 0};
            double fast[3] = {0, 0, 0};
            const bool engineReads =
                format.ScanWithEngine(line.data(), line.data() + line.size(), '.', engine) == expected;
            const bool fastReads = format.Parse(line.data(), line.data() + line.size(), '.', fast);
            ASSERT_EQ(fastReads, engineReads);
            if (engineReads) {
                ++fastDecisions;
                for (int k = 0; k < 3; ++k) {
                    if (std::isnan(engine[k])) {
                        ASSERT_TRUE(std::isnan(fast[k]));
                    } else {
                        ASSERT_EQ(std::memcmp(&engine[k], &fast[k], sizeof(double)), 0) << k;
                    }
                }
            }
        }
    }
    EXPECT_GT(fastDecisions, 1000);
}

// ---------------------------------------------------------------------------
// Factory

TEST_F(AsciiLibreTest, FactoryDescribesTheFormatAndAppliesTheSettings)
{
    const auto classes = ZonObjectRegistry::ListImplementations(ZonICloudReadFileFactory::InterfaceName);
    EXPECT_NE(std::find(classes.begin(), classes.end(), "CloudFactoryAsciiLibre"), classes.end());

    ZonCloudFactoryAsciiLibre factory;
    ZonUnicodeString name;
    factory.GetFormatName(name);
    EXPECT_EQ(name.ToUtf8(), "ASCII FREE");
    ZonString filter;
    factory.GetFileFilter(filter);
    EXPECT_EQ(filter, "*.asc;*.libre;*.ascii");
    EXPECT_STREQ(factory.GetRegistryName(), "CloudFactoryAsciiLibre");

    auto& settings = ZonCldSettings::Instance();
    settings.ResetAll();
    const std::string path = Write(kTwoScans);
    auto cloud = factory.CreateReader(path);
    EXPECT_EQ(cloud->GetTypeOfDigitization(), 1);

    settings.SetValue("StartDelimitor", "G08");
    settings.SetValue("EndDelimitor", "G09");
    settings.SetInt("ScanDirection", 2);
    auto scans = factory.CreateReader(path);
    settings.ResetAll();
    EXPECT_EQ(scans->GetTypeOfDigitization(), 2);
    int direction = 0;
    ZonQueryInterface<ZonICloudReadOptDirection>(scans)->GetScanDirection(direction);
    EXPECT_EQ(direction, 2);
    ZonUnicodeString begin, end;
    ZonQueryInterface<ZonICloudReadOptDelimitor>(scans)->GetDelimiters(begin, end);
    EXPECT_EQ(begin.ToUtf8() + end.ToUtf8(), "G08G09");
}

}  // namespace
