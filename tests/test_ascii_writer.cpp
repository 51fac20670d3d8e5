// The free ASCII writer: exact headers, points, scans, multi-part totals,
// misuse, and files that the free ASCII reader reads back.
#include <gtest/gtest.h>

#include <clocale>
#include <cstdlib>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "ZonCldImporter.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWriteAsciiLibre.h"
#include "ZonICloudReadOptDelimitor.h"
#include "ZonICloudReadScanFile.h"

namespace fs = std::filesystem;

namespace {

class AsciiWriterTest : public ::testing::Test {
protected:
    void SetUp() override
    {
        const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
        dir_ = fs::temp_directory_path() / (std::string("zon_ascii_writer_") + info->name() + "_" +
                                            std::to_string(::getpid()));
        fs::remove_all(dir_);
        fs::create_directories(dir_);
    }
    void TearDown() override { fs::remove_all(dir_); }

    std::string Path(const std::string& name) const { return (dir_ / name).string(); }
    static std::string Slurp(const std::string& path)
    {
        std::ifstream in(path, std::ios::binary);
        std::ostringstream text;
        text << in.rdbuf();
        return text.str();
    }
    static std::string Origin() { return ZonCloudReadNLSTool::GeneratedBy().ToUtf8(); }

    fs::path dir_;
};

std::string KeyOf(const std::function<void()>& action)
{
    try {
        action();
    } catch (const ZonError& error) {
        return error.GetMessageKey();
    }
    return "";
}

TEST_F(AsciiWriterTest, CloudFileHasTheCloudHeaderAndOneLinePerPoint)
{
    const std::string path = Path("cloud.asc");
    {
        ZonCloudWriteAsciiLibre writer(path);
        writer.BeginWritePoints(2);
        const float a[3] = {1.5f, -2.0f, 3.25f};
        const double b[3] = {0.1, 1e6, -0.0000004};
        writer.WritePoint(a);
        writer.WritePointDouble(b);
        writer.EndWritePoints();
    }
    EXPECT_EQ(Slurp(path), "!\n! ASCII " + Origin() +
                               "\n!\n"
                               "! Without Scans\n"
                               "! Point Format           = 'X %f Y %f Z %f'\n"
                               "!\n"
                               "! Total number of points = 2\n"
                               "!\n"
                               "X 1.500000 Y -2.000000 Z 3.250000\n"
                               "X 0.100000 Y 1000000.000000 Z -0.000000\n");
}

TEST_F(AsciiWriterTest, ScanFileHasTheScanHeaderAndNumbersScansFromOne)
{
    const std::string path = Path("scans.asc");
    {
        ZonCloudWriteAsciiLibre writer(path);
        const float s1[6] = {1, 2, 3, 4, 5, 6};
        const double s2[3] = {7, 8, 9};
        writer.BeginWriteScans(3);
        writer.WriteScan(s1, 2);
        writer.WriteScanDouble(s2, 1);
        writer.WriteScan(nullptr, 0);
        writer.EndWriteScans();
    }
    EXPECT_EQ(Slurp(path), "!\n! ASCII " + Origin() +
                               "\n!\n"
                               "! Begin Scan Delimitor  = G08\n"
                               "! End Scan Delimitor    = G09\n"
                               "! Point Format          = 'X %f Y %f Z %f'\n"
                               "!\n"
                               "! Total number of scans = 3\n"
                               "!\n"
                               "G08(1)\nX 1.000000 Y 2.000000 Z 3.000000\nX 4.000000 Y 5.000000 Z 6.000000\nG09\n"
                               "G08(2)\nX 7.000000 Y 8.000000 Z 9.000000\nG09\n"
                               "G08(3)\nG09\n");
}

TEST_F(AsciiWriterTest, EmptyCloudLeavesOnlyTheHeaderWithTotalZero)
{
    const std::string path = Path("empty.asc");
    ZonCloudWriteAsciiLibre writer(path);
    writer.BeginWritePoints(0);
    writer.EndWritePoints();
    const std::string text = Slurp(path);
    EXPECT_NE(text.find("! Total number of points = 0\n!\n"), std::string::npos);
    EXPECT_EQ(text.find("\nX "), std::string::npos);
}

TEST_F(AsciiWriterTest, MultiPartTotalIsFilledLeftJustifiedInTwelveColumns)
{
    const std::string path = Path("multi.asc");
    ZonCloudWriteAsciiLibre writer(path);
    ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
    const float p[3] = {1, 2, 3};
    writer.BeginWritePoints(3);
    for (int i = 0; i < 3; ++i) writer.WritePoint(p);
    writer.EndWritePoints();
    writer.BeginWritePoints(2);
    for (int i = 0; i < 2; ++i) writer.WritePoint(p);
    writer.EndWritePoints();
    ASSERT_EQ(writer.EndMultiWrite(), ZON_S_OK);

    const std::string text = Slurp(path);
    EXPECT_NE(text.find("! Without Scans\n! Point Format           = 'X %f Y %f Z %f'\n!\n"
                        "! Total number of points = 5           \n!\n"),
              std::string::npos)
        << text;
    EXPECT_EQ(text.size(), text.find("!\nX 1") + 2 + 5 * std::string("X 1.000000 Y 2.000000 Z 3.000000\n").size());
}

// Scans restart at 1 in each block; in a multi-part file their points count
// into the total, and the header stays the cloud header.
TEST_F(AsciiWriterTest, ScanNumbersRestartPerBlockAndCountIntoTheMultiPartTotal)
{
    const std::string path = Path("multiscans.asc");
    ZonCloudWriteAsciiLibre writer(path);
    ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
    const float pts[9] = {1, 1, 1, 2, 2, 2, 3, 3, 3};
    writer.BeginWriteScans(2);
    writer.WriteScan(pts, 3);
    writer.WriteScan(pts, 1);
    writer.EndWriteScans();
    writer.BeginWriteScans(1);
    writer.WriteScan(pts, 2);
    writer.EndWriteScans();
    writer.EndMultiWrite();

    const std::string text = Slurp(path);
    std::vector<std::string> delimiters;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);)
        if (line.starts_with("G08")) delimiters.push_back(line);
    EXPECT_EQ(delimiters, (std::vector<std::string>{"G08(1)", "G08(2)", "G08(1)"}));
    EXPECT_NE(text.find("! Total number of points = 6           \n"), std::string::npos);
    EXPECT_NE(text.find("! Without Scans\n"), std::string::npos);
}

TEST_F(AsciiWriterTest, MisuseRaisesFailure)
{
    const float p[3] = {0, 0, 0};
    const std::string path = Path("misuse.asc");
    struct Case {
        const char* name;
        std::function<void(ZonCloudWriteAsciiLibre&)> misuse;
    };
    const std::vector<Case> cases = {
        {"point before any begin", [&](auto& w) { w.WritePoint(p); }},
        {"one point more than announced",
         [&](auto& w) {
             w.BeginWritePoints(1);
             w.WritePoint(p);
             w.WritePointDouble(std::array<double, 3>{}.data());
         }},
        {"end with points still expected",
         [&](auto& w) {
             w.BeginWritePoints(2);
             w.WritePoint(p);
             w.EndWritePoints();
         }},
        {"scan while writing points",
         [&](auto& w) {
             w.BeginWritePoints(1);
             w.WriteScan(p, 1);
         }},
        {"points begun while writing scans",
         [&](auto& w) {
             w.BeginWriteScans(1);
             w.BeginWritePoints(1);
         }},
        {"scans begun while writing points",
         [&](auto& w) {
             w.BeginWritePoints(1);
             w.BeginWriteScans(1);
         }},
        {"one scan more than announced",
         [&](auto& w) {
             w.BeginWriteScans(1);
             w.WriteScan(p, 1);
             w.WriteScan(p, 1);
         }},
        {"end of scans with scans still expected",
         [&](auto& w) {
             w.BeginWriteScans(2);
             w.WriteScan(p, 1);
             w.EndWriteScans();
         }},
        {"end of points while writing scans",
         [&](auto& w) {
             w.BeginWriteScans(0);
             w.EndWritePoints();
         }},
    };
    for (const auto& c : cases) {
        ZonCloudWriteAsciiLibre writer(path);
        EXPECT_EQ(KeyOf([&] { c.misuse(writer); }), "ZonCloudReadNLSTool.ERR_Failure") << c.name;
    }
}

TEST_F(AsciiWriterTest, FailedEndStillResetsTheKind)
{
    ZonCloudWriteAsciiLibre writer(Path("reset.asc"));
    writer.BeginWritePoints(1);
    EXPECT_THROW(writer.EndWritePoints(), ZonError);
    EXPECT_NO_THROW(writer.BeginWriteScans(0));
    EXPECT_NO_THROW(writer.EndWriteScans());
}

TEST_F(AsciiWriterTest, OpenFailuresRaiseTheSystemMessageButMultiWriteReturnsFailure)
{
    const std::string path = Path("no/such/dir/file.asc");
    ZonCloudWriteAsciiLibre writer(path);
    try {
        writer.BeginWritePoints(1);
        FAIL() << "no error";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetCatalogName(), "ZonCldResOperError");
        EXPECT_EQ(error.GetSeverity(), 4);  // type 3
    }
    ZonCloudWriteAsciiLibre multi(path);
    EXPECT_EQ(multi.BeginMultiWrite(), ZON_E_FAIL);
    EXPECT_FALSE(multi.IsMultiWrite());
}

TEST(PrintFormat, FloatingConversionsUseADotAndMatchTheCLibraryOtherwise)
{
    struct Case {
        std::string got, expected;
    };
    const std::vector<Case> cases = {
        {ZonFormat("X %f Y %f Z %f", 1.5, -0.25, 1e-7), "X 1.500000 Y -0.250000 Z 0.000000"},
        {ZonFormat("%e|%E|%g|%.3f|%10.2f|%-8.1f|", 12345.678, 0.0, 1e20, 2.0004, 3.14159, -1.0),
         "1.234568e+04|0.000000E+00|1e+20|2.000|      3.14|-1.0    |"},
        {ZonFormat("%*.*f|%-12d|%5s|%c|%%|%lu|%lld|%x", 8, 2, 1.0, 5, "ab", 'z', 123456789UL, -5LL, 255u),
         "    1.00|5           |   ab|z|%|123456789|-5|ff"},
        {ZonFormat("%'d %.*f", 1234567, -1, 0.5), "1234567 0.500000"},
    };
    for (const auto& c : cases) EXPECT_EQ(c.got, c.expected);
    int count = 0;
    EXPECT_EQ(ZonFormat("abc%n%d", &count, 7), "abc7");
    EXPECT_EQ(count, 3);
}

// Writers never use the locale's decimal comma, and leave the locale alone.
TEST_F(AsciiWriterTest, PointsUseADotUnderACommaLocale)
{
    const char* commaLocales[] = {"de_DE.UTF-8", "de_DE.utf8", "fr_FR.UTF-8", "fr_FR.utf8"};
    const std::string previous = std::setlocale(LC_NUMERIC, nullptr);
    const char* found = nullptr;
    for (const char* name : commaLocales)
        if (std::setlocale(LC_NUMERIC, name)) {
            found = name;
            break;
        }
    if (!found) {
        // Build one for this test when the machine has the locale sources.
        const std::string command = "localedef -i de_DE -c -f UTF-8 '" + Path("de_DE.UTF-8") + "' >/dev/null 2>&1";
        if (std::system(command.c_str()) == 0) {
            ::setenv("LOCPATH", dir_.c_str(), 1);
            if (std::setlocale(LC_NUMERIC, "de_DE.UTF-8")) found = "de_DE.UTF-8";
            ::unsetenv("LOCPATH");
        }
    }
    if (!found) GTEST_SKIP() << "no locale with a decimal comma is available";
    ASSERT_STREQ(std::localeconv()->decimal_point, ",");
    const std::string path = Path("comma.asc");
    {
        ZonCloudWriteAsciiLibre writer(path);
        writer.BeginWritePoints(1);
        const double p[3] = {1.5, 2.25, -3.125};
        writer.WritePointDouble(p);
        writer.EndWritePoints();
    }
    EXPECT_STREQ(std::setlocale(LC_NUMERIC, nullptr), found);
    std::setlocale(LC_NUMERIC, previous.c_str());
    EXPECT_NE(Slurp(path).find("X 1.500000 Y 2.250000 Z -3.125000\n"), std::string::npos);
}

// ---- Read back through the free ASCII reader -------------------------------

ZonICloudReadFile_var CreateAsciiReader(const std::string& path)
{
    for (const auto& factory : ZonCldImporter::GetAllFactories())
        if (std::string(factory->GetRegistryName()) == "CloudFactoryAsciiLibre")
            return factory->CreateReader(ZonUnicodeString(path));
    return nullptr;
}

std::vector<std::vector<double>> ScansOf(const ZonICloudReadFile_var& reader)
{
    std::vector<std::vector<double>> scans;
    auto scanFile = ZonQueryInterface<ZonICloudReadScanFile>(reader);
    scanFile->BeginGetSetOfScans();
    while (scanFile->NextSetOfScans()) {
        scanFile->BeginGetScan();
        while (scanFile->NextScan()) {
            unsigned count = 0;
            const double* points = scanFile->GetScanPointsDouble(count);
            scans.emplace_back(points, points + 3 * count);
        }
    }
    return scans;
}

TEST_F(AsciiWriterTest, ScanFileReadsBackAsScansWithDelimitersAndAsACloudWithout)
{
    const std::string path = Path("roundtrip.asc");
    const std::vector<std::vector<double>> written = {{1, 2, 3, 4.5, 5.5, 6.5}, {-7, 8.25, 9}, {10, 11, 12, 13, 14, 15}};
    {
        ZonCloudWriteAsciiLibre writer(path);
        writer.BeginWriteScans(static_cast<unsigned>(written.size()));
        for (const auto& scan : written) writer.WriteScanDouble(scan.data(), static_cast<unsigned>(scan.size() / 3));
        writer.EndWriteScans();
    }
    ZonICloudReadFile_var reader = CreateAsciiReader(path);
    if (!reader) GTEST_SKIP() << "the free ASCII reader is not in this build";
    auto delimitor = ZonQueryInterface<ZonICloudReadOptDelimitor>(reader);
    ASSERT_TRUE(delimitor);
    delimitor->SetDelimiters("G08", "G09");
    reader->SetDoublePrecision(true);
    ASSERT_EQ(reader->GetTypeOfDigitization(), DigitizationScans);
    EXPECT_EQ(ScansOf(reader), written);

    ZonICloudReadFile_var cloud = CreateAsciiReader(path);
    EXPECT_EQ(cloud->GetTypeOfDigitization(), DigitizationCloud);
    unsigned count = 0;
    const double* points = cloud->GetPointsDouble(count);
    std::vector<double> all;
    for (const auto& scan : written) all.insert(all.end(), scan.begin(), scan.end());
    EXPECT_EQ(std::vector<double>(points, points + 3 * count), all);
}

TEST_F(AsciiWriterTest, MultiPartFileReadsBackAsACloudOfAllItsPoints)
{
    const std::string path = Path("multi_roundtrip.asc");
    const float cloud[6] = {1, 2, 3, 4, 5, 6};
    const float scan[3] = {7, 8, 9};
    {
        ZonCloudWriteAsciiLibre writer(path);
        ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
        writer.BeginWritePoints(2);
        writer.WritePoint(cloud);
        writer.WritePoint(cloud + 3);
        writer.EndWritePoints();
        writer.BeginWriteScans(1);
        writer.WriteScan(scan, 1);
        writer.EndWriteScans();
        writer.EndMultiWrite();
    }
    ZonICloudReadFile_var reader = CreateAsciiReader(path);
    if (!reader) GTEST_SKIP() << "the free ASCII reader is not in this build";
    EXPECT_EQ(reader->GetNumberOfPoints(), 3);
    unsigned count = 0;
    const float* points = reader->GetPoints(count);
    EXPECT_EQ(std::vector<float>(points, points + 3 * count), (std::vector<float>{1, 2, 3, 4, 5, 6, 7, 8, 9}));
}

}  // namespace
