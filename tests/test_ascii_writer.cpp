// The free ASCII writer: exact headers, points, scans, multi-part totals,
// misuse, numbers whatever the locale, and files that the free ASCII reader
// reads back.
#include <gtest/gtest.h>

#include <clocale>
#include <cmath>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>

#include "ZonCldImporter.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudWriteAsciiLibre.h"
#include "ZonICloudReadOptDelimitor.h"
#include "ZonICloudReadScanFile.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::Slurp;
using Writer = ZonCloudWriteAsciiLibre;

std::string Origin() { return "!\n! ASCII " + ZonCloudReadNLSTool::GeneratedBy().ToUtf8() + "\n!\n"; }
const std::string k123 = "X 1.000000 Y 2.000000 Z 3.000000\n";

std::string CloudHeader(const std::string& total)
{
    return Origin() + "! Without Scans\n! Point Format           = 'X %f Y %f Z %f'\n!\n! Total number of points = " +
           total + "\n!\n";
}

class AsciiWriterTest : public zontest::FilesTest {};

// The three headers keep their own alignment; a multi-part total is filled in
// left-justified over twelve columns, and scans count from 1 in each block.
TEST_F(AsciiWriterTest, FilesAreWrittenByteForByte)
{
    const float p[9] = {1, 2, 3, 1, 2, 3, 1, 2, 3}, a[3] = {1.5f, -2.0f, 3.25f};
    const double b[3] = {0.1, 1e6, -0.0000004}, q[3] = {7, 8, 9};
    struct Case {
        const char* name;
        bool multiPart;
        std::function<void(Writer&)> write;
        std::string expected;
    };
    const std::vector<Case> cases = {
        {"cloud", false, [&](Writer& w) { w.BeginWritePoints(2), w.WritePoint(a), w.WritePointDouble(b), w.EndWritePoints(); },
         CloudHeader("2") + "X 1.500000 Y -2.000000 Z 3.250000\nX 0.100000 Y 1000000.000000 Z -0.000000\n"},
        {"empty cloud", false, [](Writer& w) { w.BeginWritePoints(0), w.EndWritePoints(); }, CloudHeader("0")},
        {"scans", false,
         [&](Writer& w) { w.BeginWriteScans(3), w.WriteScan(p, 2), w.WriteScanDouble(q, 1), w.WriteScan(nullptr, 0), w.EndWriteScans(); },
         Origin() + "! Begin Scan Delimitor  = G08\n! End Scan Delimitor    = G09\n"
                    "! Point Format          = 'X %f Y %f Z %f'\n!\n! Total number of scans = 3\n!\n"
                    "G08(1)\n" + k123 + k123 + "G09\nG08(2)\nX 7.000000 Y 8.000000 Z 9.000000\nG09\nG08(3)\nG09\n"},
        {"multi-part of 3 + 2 points", true,
         [&](Writer& w) {
             for (unsigned n : {3u, 2u}) {
                 w.BeginWritePoints(n);
                 for (unsigned i = 0; i < n; ++i) w.WritePoint(p);
                 w.EndWritePoints();
             }
         },
         CloudHeader("5           ") + zontest::Repeat(k123, 5)},
        {"multi-part of scans", true,
         [&](Writer& w) {
             w.BeginWriteScans(2), w.WriteScan(p, 3), w.WriteScan(p, 1), w.EndWriteScans();
             w.BeginWriteScans(1), w.WriteScan(p, 2), w.EndWriteScans();
         },
         CloudHeader("6           ") + "G08(1)\n" + k123 + k123 + k123 + "G09\nG08(2)\n" + k123 + "G09\nG08(1)\n" + k123 +
             k123 + "G09\n"},
    };
    for (const auto& c : cases) {
        const std::string path = Path(std::string(c.name) + ".asc");
        {
            Writer writer(path);
            EXPECT_TRUE(!c.multiPart || writer.BeginMultiWrite() == ZON_S_OK);
            c.write(writer);
            EXPECT_TRUE(!c.multiPart || writer.EndMultiWrite() == ZON_S_OK);
        }
        EXPECT_EQ(Slurp(path), c.expected) << c.name;
    }
}

TEST_F(AsciiWriterTest, MisuseRaisesFailure)
{
    const float p[3] = {0, 0, 0};
    const double d[3] = {0, 0, 0};
    const std::vector<std::pair<const char*, std::function<void(Writer&)>>> cases = {
        {"point before any begin", [&](Writer& w) { w.WritePoint(p); }},
        {"one point more than announced", [&](Writer& w) { w.BeginWritePoints(1), w.WritePoint(p), w.WritePointDouble(d); }},
        {"end with points still expected", [&](Writer& w) { w.BeginWritePoints(2), w.WritePoint(p), w.EndWritePoints(); }},
        {"scan while writing points", [&](Writer& w) { w.BeginWritePoints(1), w.WriteScan(p, 1); }},
        {"points begun while writing scans", [&](Writer& w) { w.BeginWriteScans(1), w.BeginWritePoints(1); }},
        {"scans begun while writing points", [&](Writer& w) { w.BeginWritePoints(1), w.BeginWriteScans(1); }},
        {"one scan more than announced", [&](Writer& w) { w.BeginWriteScans(1), w.WriteScan(p, 1), w.WriteScan(p, 1); }},
        {"end of scans with scans still expected", [&](Writer& w) { w.BeginWriteScans(2), w.WriteScan(p, 1), w.EndWriteScans(); }},
        {"end of points while writing scans", [&](Writer& w) { w.BeginWriteScans(0), w.EndWritePoints(); }},
    };
    for (const auto& [name, misuse] : cases) {
        Writer writer(Path("misuse.asc"));
        EXPECT_EQ(ErrorKey([&] { misuse(writer); }), "ZonCloudReadNLSTool.ERR_Failure") << name;
    }
    // A failed end still ends the kind of block.
    Writer writer(Path("reset.asc"));
    writer.BeginWritePoints(1);
    EXPECT_THROW(writer.EndWritePoints(), ZonError);
    EXPECT_NO_THROW(writer.BeginWriteScans(0));
    EXPECT_NO_THROW(writer.EndWriteScans());
}

TEST_F(AsciiWriterTest, OpenFailuresRaiseTheSystemMessageButMultiWriteReturnsFailure)
{
    const std::string path = Path("no/such/dir/file.asc");
    Writer writer(path);
    try {
        writer.BeginWritePoints(1);
        FAIL() << "no error";
    } catch (const ZonError& error) {
        EXPECT_EQ(error.GetCatalogName(), "ZonCldResOperError");
        EXPECT_EQ(error.GetSeverity(), 4);  // type 3
    }
    Writer multi(path);
    EXPECT_EQ(multi.BeginMultiWrite(), ZON_E_FAIL);
    EXPECT_FALSE(multi.IsMultiWrite());
}

// ---- Numbers whatever the locale -------------------------------------------

// The C library's text for the same call under the "C" locale.
std::string CFormat(const char* format, ...)
{
    const locale_t c = ::newlocale(LC_ALL_MASK, "C", nullptr);
    const locale_t previous = ::uselocale(c);
    char text[512];
    std::va_list args;
    va_start(args, format);
    std::vsnprintf(text, sizeof text, format, args);
    va_end(args);
    ::uselocale(previous);
    ::freelocale(c);
    return text;
}

void ExpectTheCLibrarysText()
{
#define ZON_EXPECT_AS_C(...) EXPECT_EQ(ZonFormat(__VA_ARGS__), CFormat(__VA_ARGS__)) << #__VA_ARGS__
    ZON_EXPECT_AS_C("X %f Y %f Z %f", 1.5, -0.25, 1e-7);
    ZON_EXPECT_AS_C("%f|%f|%f|%.0f|%.0f|%.3f|%10.2f|%-8.1f|%+f", -0.0, 1e300, 0.5e-6, 0.5, 2.5, 2.0004, 3.14159, -1.0, 2.0);
    ZON_EXPECT_AS_C("%e|%E|%e|%.2e|%+.0e|%e", 12345.678, 0.0, -1e-300, 9.995, -0.0, 5e-324);
    ZON_EXPECT_AS_C("%g|%G|%g|%g|%g|%#g|%.10g|%g", 1e20, 1e-5, 100000.0, 1e6, 0.0001, 1.0, 1.0 / 3, 123.456);
    ZON_EXPECT_AS_C("%f %e %g %f %E", INFINITY, -INFINITY, NAN, -NAN, NAN);
    ZON_EXPECT_AS_C("%d|%-12d|%-12d|%ld|%ld|%5d|%05d|%i", -42, 5, -2147483647 - 1, -1234567890123L, 0L, 7, -7, 3);
    ZON_EXPECT_AS_C("%*.*f|%5s|%c|%%|%lu|%lld|%x|%o|%'d|%.*f", 8, 2, 1.0, "ab", 'z', 123456789UL, -5LL, 255u, 8u, 1234567, -1, 0.5);
#undef ZON_EXPECT_AS_C
    int count = 0;
    EXPECT_EQ(ZonFormat("abc%n%d", &count, 7), "abc7");
    EXPECT_EQ(count, 3);
}

// A locale with a decimal comma, built for the test when the machine has the
// locale sources but not the locale; null when there is none.
const char* UseCommaLocale(const std::string& dir)
{
    for (const char* name : {"de_DE.UTF-8", "de_DE.utf8", "fr_FR.UTF-8", "fr_FR.utf8"})
        if (std::setlocale(LC_NUMERIC, name)) return name;
    const std::string command = "localedef -i de_DE -c -f UTF-8 " + zontest::Quote(dir + "/de_DE.UTF-8") + " >/dev/null 2>&1";
    if (std::system(command.c_str()) != 0) return nullptr;
    ::setenv("LOCPATH", dir.c_str(), 1);
    const char* name = std::setlocale(LC_NUMERIC, "de_DE.UTF-8") ? "de_DE.UTF-8" : nullptr;
    ::unsetenv("LOCPATH");
    return name;
}

// Files must read back on any machine: writers print as the C library does
// under "C", never with the locale's decimal comma, and leave the locale alone.
TEST_F(AsciiWriterTest, NumbersArePrintedAsUnderTheCLocaleWhateverTheProcessLocale)
{
    ExpectTheCLibrarysText();
    const std::string previous = std::setlocale(LC_NUMERIC, nullptr);
    const char* comma = UseCommaLocale(dir_);
    if (!comma) GTEST_SKIP() << "no locale with a decimal comma is available";
    const std::string decimalPoint = std::localeconv()->decimal_point;
    ExpectTheCLibrarysText();
    {
        Writer writer(Path("comma.asc"));
        writer.BeginWritePoints(1);
        const double p[3] = {1.5, 2.25, -3.125};
        writer.WritePointDouble(p);
        writer.EndWritePoints();
    }
    const std::string after = std::setlocale(LC_NUMERIC, nullptr);
    std::setlocale(LC_NUMERIC, previous.c_str());
    EXPECT_EQ(decimalPoint, ",");
    EXPECT_EQ(after, comma);
    EXPECT_EQ(Slurp(Path("comma.asc")), CloudHeader("1") + "X 1.500000 Y 2.250000 Z -3.125000\n");
}

// ---- Read back through the free ASCII reader -------------------------------

ZonICloudReadFile_var CreateAsciiReader(const std::string& path)
{
    for (const auto& factory : ZonCldImporter::GetAllFactories())
        if (std::string(factory->GetRegistryName()) == "CloudFactoryAsciiLibre")
            return factory->CreateReader(ZonUnicodeString(path));
    return nullptr;
}

// A scan file reads back as its scans with the delimiters and as one cloud
// without them; a multi-part file of a cloud and a scan as one cloud.
TEST_F(AsciiWriterTest, FilesReadBackThroughTheFreeAsciiReader)
{
    const std::vector<std::vector<double>> written = {{1, 2, 3, 4.5, 5.5, 6.5}, {-7, 8.25, 9}, {10, 11, 12, 13, 14, 15}};
    {
        Writer scans(Path("scans.asc"));
        scans.BeginWriteScans(3);
        for (const auto& scan : written) scans.WriteScanDouble(scan.data(), static_cast<unsigned>(scan.size() / 3));
        scans.EndWriteScans();
        Writer multi(Path("multi.asc"));
        ASSERT_EQ(multi.BeginMultiWrite(), ZON_S_OK);
        multi.BeginWritePoints(2);
        multi.WritePointDouble(written[0].data());
        multi.WritePointDouble(written[0].data() + 3);
        multi.EndWritePoints();
        multi.BeginWriteScans(1);
        multi.WriteScanDouble(written[1].data(), 1);
        multi.EndWriteScans();
        multi.EndMultiWrite();
    }
    ZonICloudReadFile_var reader = CreateAsciiReader(Path("scans.asc"));
    if (!reader) GTEST_SKIP() << "the free ASCII reader is not in this build";
    auto delimitor = ZonQueryInterface<ZonICloudReadOptDelimitor>(reader);
    ASSERT_TRUE(delimitor);
    delimitor->SetDelimiters("G08", "G09");
    reader->SetDoublePrecision(true);
    ASSERT_EQ(reader->GetTypeOfDigitization(), DigitizationScans);
    std::vector<std::vector<double>> scans;
    auto scanFile = ZonQueryInterface<ZonICloudReadScanFile>(reader);
    for (scanFile->BeginGetSetOfScans(); scanFile->NextSetOfScans();)
        for (scanFile->BeginGetScan(); scanFile->NextScan();) {
            unsigned count = 0;
            const double* points = scanFile->GetScanPointsDouble(count);
            scans.emplace_back(points, points + 3 * count);
        }
    EXPECT_EQ(scans, written);

    ZonICloudReadFile_var cloud = CreateAsciiReader(Path("scans.asc"));
    EXPECT_EQ(cloud->GetTypeOfDigitization(), DigitizationCloud);
    std::vector<double> all;
    for (const auto& scan : written) all.insert(all.end(), scan.begin(), scan.end());
    EXPECT_EQ(zontest::PointsOf(*cloud), all);

    ZonICloudReadFile_var multi = CreateAsciiReader(Path("multi.asc"));
    EXPECT_EQ(multi->GetNumberOfPoints(), 3);
    EXPECT_EQ(zontest::PointsOf<float>(*multi), (std::vector<float>{1, 2, 3, 4.5, 5.5, 6.5, -7, 8.25, 9}));
}

}  // namespace
