// The number printer against the C library over millions of generated
// values, the decoded line formats against ZonPrint, and whole files written
// in blocks on several threads against the same lines printed one by one.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <limits>
#include <random>
#include <string>
#include <vector>

#include "ZonCldSTLBinaryFormat.h"
#include "ZonCldSTLOutputDocument.h"
#include "ZonCloudLineFormat.h"
#include "ZonCloudNumberPrinter.h"
#include "ZonCloudPrintFormat.h"
#include "ZonCloudWorkerPool.h"
#include "ZonCloudWriteAsciiLibre.h"
#include "ZonCloudWriteAsciiUserFormat.h"
#include "ZonCloudWriteLeica.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIReporter.h"
#include "ZonTestFiles.h"

namespace {

std::string FormatOf(const ZonNumberConversion& conv, const char* length = "")
{
    std::string format = "%";
    if (conv.left) format += '-';
    if (conv.plus) format += '+';
    if (conv.space) format += ' ';
    if (conv.zero) format += '0';
    if (conv.alt) format += '#';
    if (conv.width) format += std::to_string(conv.width);
    if (conv.precision >= 0) format += "." + std::to_string(conv.precision);
    return format + length + conv.letter;
}

// Compares the printer with snprintf (the tests run under the "C" locale)
// and keeps the first mismatches for the report.
class Differ {
public:
    template <class T>
    void Check(const ZonNumberConversion& conv, const std::string& format, T value)
    {
        char expected[2048];
        char actual[2048];
        std::snprintf(expected, sizeof expected, format.c_str(), value);
        *ZonCloudNumberPrinter::Print(actual, conv, value) = '\0';
        ++checked;
        if (std::strcmp(expected, actual) == 0) return;
        if (mismatches.size() < 10)
            mismatches.push_back(format + " of " + ZonFormat("%a", static_cast<double>(value)) + ": \"" + actual +
                                 "\" instead of \"" + expected + "\"");
        ++failed;
    }
    void Check(char conversion, int precision, double value)
    {
        ZonNumberConversion conv;
        conv.letter = conversion;
        conv.precision = precision;
        Check(conv, FormatOf(conv), value);
    }

    std::size_t checked = 0;
    std::size_t failed = 0;
    std::vector<std::string> mismatches;
};

std::string Report(const Differ& differ)
{
    std::string text = std::to_string(differ.failed) + " of " + std::to_string(differ.checked) + " differ:";
    for (const auto& line : differ.mismatches) text += "\n  " + line;
    return text;
}

double FromBits(std::uint64_t bits)
{
    double value;
    std::memcpy(&value, &bits, sizeof value);
    return value;
}

// Every flag combination, some widths and precisions, on values where text
// shapes change: signs, zeros, infinities, NaN, rounding carries, the ends of
// the exact integer path and of the double range.
TEST(NumberPrinter, EveryFlagWidthAndPrecisionPrintsAsTheCLibrary)
{
    const double inf = std::numeric_limits<double>::infinity();
    const double values[] = {0.0, -0.0, 1.0, -1.0, 0.5, 1.5, 2.5, -2.5, 0.05, 0.25, 9.5, 99.5, 999999.5, 0.0001,
                             1e-5, 123456.789, 1e15, 1e16, 1e17, 9.999999e22, 9.223372036854775e18, 1.8446744073709552e19,
                             std::ldexp(1.0, 63), std::ldexp(1.0, 63) - 1024, 1e300, std::numeric_limits<double>::max(),
                             std::numeric_limits<double>::min(), std::numeric_limits<double>::denorm_min(), inf, -inf,
                             std::nan(""), -std::nan("")};
    Differ differ;
    for (const char conversion : {'f', 'F', 'e', 'E', 'g', 'G'})
        for (int flags = 0; flags < 32; ++flags)
            for (const int width : {0, 1, 9, 30})
                for (const int precision : {-1, 0, 1, 3, 6, 17, 19, 20, 40}) {
                    ZonNumberConversion conv{conversion, (flags & 1) != 0, (flags & 2) != 0, (flags & 4) != 0,
                                       (flags & 8) != 0, (flags & 16) != 0, width, precision};
                    if (!ZonCloudNumberPrinter::Handles(conv)) continue;
                    const std::string format = FormatOf(conv);
                    for (const double value : values) differ.Check(conv, format, value);
                }
    const long long integers[] = {0, 1, -1, 7, -42, 1234567, std::numeric_limits<int>::max(),
                                  std::numeric_limits<long long>::min(), std::numeric_limits<long long>::max()};
    for (const char conversion : {'d', 'i', 'u'})
        for (int flags = 0; flags < 16; ++flags)
            for (const int width : {0, 1, 12, 25})
                for (const int precision : {-1, 0, 1, 5, 22}) {
                    ZonNumberConversion conv{conversion, (flags & 1) != 0, (flags & 2) != 0, (flags & 4) != 0,
                                       (flags & 8) != 0, false, width, precision};
                    const std::string format = FormatOf(conv, "ll");
                    for (const long long value : integers) {
                        if (conversion == 'u') differ.Check(conv, format, static_cast<unsigned long long>(value));
                        else differ.Check(conv, format, value);
                    }
                }
    EXPECT_EQ(differ.failed, 0u) << Report(differ);
}

// Millions of values in the writers' conversions: any bit pattern, numbers
// near short decimals (so that the last printed digit is decided close to a
// half), and exact halves, whose ties go to the even digit.
TEST(NumberPrinter, MillionsOfGeneratedValuesPrintAsTheCLibrary)
{
    std::mt19937_64 random(20240617);
    Differ differ;
    for (int i = 0; i < 400'000; ++i) {
        const double value = FromBits(random());
        differ.Check('f', -1, value);
        differ.Check('e', -1, value);
        differ.Check('g', -1, value);
    }
    for (int i = 0; i < 500'000; ++i) {
        const int decimals = static_cast<int>(random() % 16);
        const double value = static_cast<double>(random() % 2'000'000'000) / std::pow(10.0, decimals) *
                             ((random() & 1) ? -1 : 1);
        differ.Check('f', decimals, value);
        differ.Check('f', std::max(decimals - 1, 0), value);
        differ.Check('f', -1, value);
        differ.Check('e', static_cast<int>(random() % 12), value);
        differ.Check('g', static_cast<int>(random() % 12), value);
    }
    for (int i = 0; i < 300'000; ++i) {
        // An odd number over 2^j has exactly j decimals: one fewer is a tie.
        const int j = 1 + static_cast<int>(random() % 40);
        const double value = std::ldexp(static_cast<double>((random() % (1ULL << 40)) | 1), -j);
        differ.Check('f', j - 1, value);
        differ.Check('e', static_cast<int>(random() % 20), value);
    }
    for (int i = 0; i < 300'000; ++i) {
        ZonNumberConversion conv;
        conv.letter = 'd';
        const long long value = static_cast<long long>(random()) >> (random() % 64);
        differ.Check(conv, "%lld", value);
    }
    EXPECT_EQ(differ.failed, 0u) << Report(differ);
    EXPECT_GT(differ.checked, 4'000'000u);
}

// The writers' lines, decoded once, print what ZonPrint prints; what they do
// not decode is left to ZonPrint.
TEST(LineFormat, PrintsWhatZonPrintPrints)
{
    struct Case {
        const char* format;
        std::vector<double> values;
        std::string expected;
    };
    const double tiny = -0.000001, huge = 1e300;
    const Case cases[] = {
        {"X %f Y %f Z %f\n", {12.5, tiny, huge}, ZonFormat("X %f Y %f Z %f\n", 12.5, tiny, huge)},
        {"%f %f %f %d %d %d \n", {1, 2, 3, 255, 0, 17}, ZonFormat("%f %f %f %d %d %d \n", 1.0, 2.0, 3.0, 255, 0, 17)},
        {"%-5d|%11.3f|%-11.3f|%0.3f", {-3, 2.0005, tiny, 7}, ZonFormat("%-5d|%11.3f|%-11.3f|%0.3f", -3, 2.0005, tiny, 7.0)},
        {"%ld %lld %u %%|%+e|% g", {4, -5, 6, 0.1, 1e-5}, ZonFormat("%ld %lld %u %%|%+e|% g", 4L, -5LL, 6u, 0.1, 1e-5)},
        {"%#.0f %#.0e %010.2f %.0f%%", {2.5, 3.5, -1.25, 0.5}, ZonFormat("%#.0f %#.0e %010.2f %.0f%%", 2.5, 3.5, -1.25, 0.5)},
    };
    for (const auto& c : cases) {
        const ZonCloudLineFormat line(c.format);
        ASSERT_TRUE(line.IsValid()) << c.format;
        EXPECT_EQ(line.Arguments(), c.values.size()) << c.format;
        std::vector<char> text(line.Bound());
        EXPECT_EQ(std::string(text.data(), line.Print(text.data(), c.values.data())), c.expected) << c.format;
    }
    for (const char* format : {"%s", "%*d", "%c", "%#g", "%hd", "%Lf", "%.*f", "%5"})
        EXPECT_FALSE(ZonCloudLineFormat(format).IsValid()) << format;
}

// ---- Whole files ------------------------------------------------------------

class BlockWriting : public zontest::FilesTest {
protected:
    void TearDown() override
    {
        ZonCloudWorkerPool::SetThreadCount(0);
        FilesTest::TearDown();
    }
};

// Enough points for several blocks, of every kind of value, with colours and
// holes.
struct Cloud {
    std::vector<double> xyz;
    std::vector<unsigned char> rgb;
    std::vector<unsigned char> valid;
    explicit Cloud(std::size_t n)
    {
        std::mt19937_64 random(5);
        for (std::size_t i = 0; i < 3 * n; ++i)
            xyz.push_back(i % 97 == 0 ? FromBits(random()) : static_cast<double>(random() % 2'000'001) / 1000.0 - 1000.0);
        for (std::size_t i = 0; i < 3 * n; ++i) rgb.push_back(static_cast<unsigned char>(random()));
        for (std::size_t i = 0; i < n; ++i) valid.push_back(random() % 5 != 0);
    }
    std::size_t Count() const { return valid.size(); }
};

// The lines of the C library, one snprintf per point, against files written
// from whole arrays on one and several threads: free ASCII clouds and scans,
// RGB points with colours and holes.
TEST_F(BlockWriting, FilesAreTheCLibrarysLinesWhateverTheThreads)
{
    const Cloud cloud(40'000);
    std::string points, colored;
    std::size_t kept = 0;
    char line[1200];
    for (std::size_t i = 0; i < cloud.Count(); ++i) {
        const double* p = &cloud.xyz[3 * i];
        points.append(line, static_cast<std::size_t>(std::snprintf(line, sizeof line, "X %f Y %f Z %f\n", p[0], p[1], p[2])));
        if (!cloud.valid[i]) continue;
        ++kept;
        const unsigned char* c = &cloud.rgb[3 * i];
        colored.append(line, static_cast<std::size_t>(std::snprintf(line, sizeof line, "%f %f %f %d %d %d\n", p[0], p[1],
                                                                    p[2], c[0], c[1], c[2])));
    }
    const unsigned n = static_cast<unsigned>(cloud.Count());
    for (const unsigned threads : {1u, 3u}) {
        ZonCloudWorkerPool::SetThreadCount(threads);
        const std::string cloudPath = Path("cloud.asc"), scanPath = Path("scan.asc"), rgbPath = Path("points.asc_rgb");
        {
            ZonCloudWriteAsciiLibre writer{ZonUnicodeString(cloudPath)};
            writer.BeginWritePoints(n);
            writer.WritePoints({nullptr, cloud.xyz.data(), nullptr, nullptr, n});
            writer.EndWritePoints();
            ZonCloudWriteAsciiLibre scans{ZonUnicodeString(scanPath)};
            scans.BeginWriteScans(1);
            scans.WriteScanDouble(cloud.xyz.data(), n);
            scans.EndWriteScans();
            ZonCloudWriteLeica rgb{ZonUnicodeString(rgbPath)};
            rgb.BeginWritePoints(static_cast<unsigned>(kept));
            rgb.WritePoints({nullptr, cloud.xyz.data(), cloud.rgb.data(), cloud.valid.data(), n});
            rgb.EndWritePoints();
        }
        const std::string cloudText = zontest::Slurp(cloudPath), scanText = zontest::Slurp(scanPath);
        ASSERT_GE(cloudText.size(), points.size());
        EXPECT_TRUE(cloudText.compare(cloudText.size() - points.size(), points.size(), points) == 0) << threads;
        EXPECT_TRUE(scanText.find("G08(1)\n" + points + "G09\n") != std::string::npos) << threads;
        EXPECT_EQ(zontest::Slurp(rgbPath), std::to_string(kept) + "\n" + colored) << threads;
    }
}

// The user format numbers its lines through holes and over two parts of a
// file; its lines end with CR LF. Whole arrays on several threads write what
// points handed one by one write.
TEST_F(BlockWriting, UserFormatLinesAndNumbersAreThoseOfPointsWrittenOneByOne)
{
    const Cloud cloud(40'000);
    const unsigned n = static_cast<unsigned>(cloud.Count());
    unsigned kept = 0;
    for (const unsigned char v : cloud.valid) kept += v;
    const auto write = [&](const std::string& path, bool whole) {
        ZonCloudWriteAsciiUserFormat writer{ZonUnicodeString(path)};
        writer.SetWriteSettings({"Survey", "N", "-", "|", "Y", "14", "4"});
        EXPECT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
        writer.BeginWritePoints(kept);
        if (whole) {
            writer.WritePoints({nullptr, cloud.xyz.data(), cloud.rgb.data(), cloud.valid.data(), n});
        } else {
            for (std::size_t i = 0; i < cloud.Count(); ++i)
                if (cloud.valid[i]) writer.WritePointColorDouble(&cloud.xyz[3 * i], &cloud.rgb[3 * i]);
        }
        writer.EndWritePoints();
        writer.BeginWritePoints(n);
        if (whole) writer.WritePoints({nullptr, cloud.xyz.data(), nullptr, nullptr, n});
        else
            for (std::size_t i = 0; i < cloud.Count(); ++i) writer.WritePointDouble(&cloud.xyz[3 * i]);
        writer.EndWritePoints();
        writer.EndMultiWrite();
        return zontest::Slurp(path);
    };
    ZonCloudWorkerPool::SetThreadCount(1);
    const std::string expected = write(Path("one.asc_fmt"), false);
    EXPECT_NE(expected.find(ZonFormat("\r\n %12d | ", static_cast<int>(kept + n))), std::string::npos);
    ZonCloudWorkerPool::SetThreadCount(3);
    EXPECT_EQ(write(Path("whole.asc_fmt"), true), expected);
}

// Output documents gather their records and write them in blocks: a text
// STL file of two documents is the C library's facets in order whatever the
// threads.
TEST_F(BlockWriting, TextStlFacetsAreTheCLibrarysWhateverTheThreads)
{
    ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonCollectingReporter>());
    constexpr unsigned kTriangles = 40'000;
    std::mt19937 random(3);
    std::uniform_real_distribution<float> coordinate(1.0f, 1000.0f);
    std::vector<float> coords(9 * kTriangles);
    for (float& v : coords) v = coordinate(random);
    std::vector<unsigned> offsets(3 * kTriangles);
    for (unsigned i = 0; i < offsets.size(); ++i) offsets[i] = 3 * i;
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords(coords);
    face->SetTriangles(offsets);
    auto node = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeSolid);
    node->AddFace(face);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(node);
    auto document = std::make_shared<ZonExchMemoryDocument>("grid");
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);

    std::string facets;
    char text[2048];
    for (unsigned t = 0; t < kTriangles; ++t) {
        double v[9], n[3];
        for (int k = 0; k < 9; ++k) v[k] = coords[9 * t + static_cast<unsigned>(k)];
        ZonCldSTLBinaryFormat::Normal(v, n);
        const int size = std::snprintf(text, sizeof text,
                                       "  facet normal %e %e %e\n    outer loop\n      vertex %e %e %e\n"
                                       "      vertex %e %e %e\n      vertex %e %e %e\n    endloop\n  endfacet\n",
                                       n[0], n[1], n[2], v[0], v[1], v[2], v[3], v[4], v[5], v[6], v[7], v[8]);
        facets.append(text, static_cast<std::size_t>(size));
    }
    const std::string expected = "solid grid \n" + facets + "solid grid \n" + facets + "endsolid\n";
    for (const unsigned threads : {1u, 3u}) {
        ZonCloudWorkerPool::SetThreadCount(threads);
        const std::string path = Path("text.stl");
        ZonCldSTLOutputDocument output;
        output.SetFileName(path);
        output.SetOptions({"BinaryState"}, {"0"});
        ASSERT_EQ(output.Open(), ZON_S_OK);
        EXPECT_EQ(output.Write(document), ZON_S_OK);
        EXPECT_EQ(output.Write(document), ZON_S_OK);
        output.Close();
        output.Release();
        EXPECT_TRUE(zontest::Slurp(path) == expected) << threads << " threads";
    }
}

}  // namespace
