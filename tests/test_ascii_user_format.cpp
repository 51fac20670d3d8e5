// ASCII user format: the FDF vocabulary and line rules of the reader, its
// factory options, and the fixed-width writer whose files read back.
#include <gtest/gtest.h>

#include <cmath>

#include <nlohmann/json.hpp>

#include "ZonCldSettings.h"
#include "ZonCloudFactoryAsciiUserFormat.h"
#include "ZonCloudReadAsciiUserFormat.h"
#include "ZonCloudScanFormat.h"
#include "ZonCloudWriteAsciiUserFormat.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::PointsOf;
using zontest::Quote;
using zontest::Repeat;
using zontest::Slurp;
using Doubles = std::vector<double>;
using Json = nlohmann::json;
using R = ZonCloudReadAsciiUserFormat;

class AsciiUserFormat : public zontest::FilesTest {
protected:
    // A reader of `data` whose FDF is `fdf` (written as given, line end included).
    std::shared_ptr<R> Reader(const std::string& fdf, const std::string& data)
    {
        auto reader = std::make_shared<R>(Write("data.asc_fmt", data));
        reader->SetFDFile(Write("columns.fdf", fdf));
        return reader;
    }
    std::vector<int> Colors(const std::string& fdf, const std::string& data)
    {
        const auto reader = Reader(fdf, data);
        unsigned n = 0;
        const unsigned char* rgb = reader->GetPointColors(n);
        return std::vector<int>(rgb, rgb + 3 * n);
    }
};

TEST_F(AsciiUserFormat, LineRules)
{
    const struct {
        std::string data;
        Doubles points;
    } cases[] = {
        // The character before the first newline is cut: an LF line loses its
        // last character, a CR LF line only the CR; a last line without newline is whole.
        {"1 2 34\n", {1, 2, 3}},
        {"1 2 34\r\n5 6 78", {1, 2, 34, 5, 6, 78}},
        // Short lines are skipped, long ones cut to the fields.
        {"1 2\r\n1 2 3 4 5\r\n7 8\r\n4 5 6\r\n", {1, 2, 3, 4, 5, 6}},
        {"1,5 2,5 3,5\r\n1.5 2.5 3.5\r\n", {1.5, 2.5, 3.5, 1.5, 2.5, 3.5}},  // whatever the locale
        {"!1 2 3\r\n  ! 4 5 6\r\n7 8 9 !x\r\n", {7, 8, 9}},  // "!" only as the first token
    };
    for (const auto& c : cases) EXPECT_EQ(PointsOf(*Reader("X Y Z", c.data)), c.points) << c.data;

    // Lines before the first point move the data start past them.
    const auto reader = Reader("X Y Z", "1 2\r\n! note\r\n1 2 3\r\n");
    EXPECT_EQ(reader->GetNumberOfPoints(), 1);
    EXPECT_EQ(reader->GetDataStartOffset(), 13);
    // Floats are the doubles narrowed; columns the FDF does not name give no array.
    EXPECT_EQ(PointsOf<float>(*Reader("X Y Z", "0.1 0.2 0.3\r\n")), (std::vector<float>{0.1f, 0.2f, 0.3f}));
    unsigned n = 0;
    EXPECT_EQ(Reader("X Y Z", "1 2 3\r\n")->GetPointAttributes1(n), nullptr);
    EXPECT_EQ(n, 0u);
}

TEST_F(AsciiUserFormat, FdfWordsGiveTheFieldList)
{
    const struct {
        std::string fdf;
        std::vector<int> fields;
    } cases[] = {
        {"X Y Foo Z", {R::FieldX, R::FieldY, R::FieldZ}},  // unknown words take no column
        {"x Y Z", {R::FieldY, R::FieldZ}},                 // keywords are case-sensitive
        {"X Y Z\n", {R::FieldX, R::FieldY}},  // the cut eats the Z of an LF line
        {"X  Y\tZ \nR G B", {R::FieldX, R::FieldY, R::FieldZ}},  // only the first line counts
        {"LABEL DX DY DZ X Y Z R G B A COLOR SYMBOL TEXT USELESS_INFO ",
         {R::FieldLabel, R::FieldDX, R::FieldDY, R::FieldDZ, R::FieldX, R::FieldY, R::FieldZ, R::FieldR, R::FieldG,
          R::FieldB, R::FieldA, R::FieldColor, R::FieldSymbol, R::FieldText, R::FieldUselessInfo}},
    };
    for (const auto& c : cases) EXPECT_EQ(Reader(c.fdf, "")->GetFieldList(), c.fields) << c.fdf;
}

TEST_F(AsciiUserFormat, ColumnsConvertAsScanfWould)
{
    // Real columns read "%le" and integer columns "%d" of the token, whatever
    // shortcut the reader takes; a column that does not convert reads 0 here.
    const char* tokens[] = {"1e5", "-2.5E-3", "+7", "0x1A", "inf", "-", "12abc", "1e", ".5", "007", "1,5e1",
                            "99999999999", "-2147483648", "2147483648", "nan", "1.2.3", "--1", "e3"};
    for (const char* token : tokens) {
        const Doubles p = PointsOf(*Reader("X Y Z", std::string(token) + " 0 0 \r\n"));
        ASSERT_EQ(p.size(), 3u) << token;
        std::string text = token;
        for (char& c : text)
            if (c == ',') c = '.';
        double x = 0.0;
        ZonScan(text.c_str(), '.', "%le", &x);
        if (std::isnan(x))
            EXPECT_TRUE(std::isnan(p[0])) << token;
        else
            EXPECT_EQ(p[0], x) << token;

        std::int32_t expected = 0;
        if (ZonScan(token, '.', "%d", &expected) != 1 || static_cast<std::uint32_t>(expected) > 255u) continue;
        EXPECT_EQ(Colors("X Y Z R G B", std::string("0 0 0 ") + token + " 0 0 \r\n"), (std::vector<int>{expected, 0, 0}))
            << token;
    }
}

TEST_F(AsciiUserFormat, OutOfRangeColoursAndIndicesAbortTheLoad)
{
    const struct {
        std::string fdf, line, key;
    } cases[] = {
        {"X Y Z R G B", "1 2 3 256 0 0", "ZonCloudReadNLSTool.ERR_RGBColorOutOfRange"},
        {"X Y Z R G B", "1 2 3 -1 0 0", "ZonCloudReadNLSTool.ERR_RGBColorOutOfRange"},
        {"X Y Z A", "1 2 3 300", "ZonCloudReadNLSTool.ERR_RGBColorOutOfRange"},
        {"X Y Z COLOR", "1 2 3 8", "ZonCloudReadNLSTool.ERR_ColorIndexOutOfRange"},
        {"X Y Z COLOR", "1 2 3 -1", "ZonCloudReadNLSTool.ERR_ColorIndexOutOfRange"},
        {"X Y Z SYMBOL", "1 2 3 9", "ZonCloudReadNLSTool.ERR_SymbolIndexOutOfRange"},
        {"X Y Z R G B", "1 2 3 255 255 255", ""},
        {"X Y Z COLOR SYMBOL", "1 2 3 7 8", ""},
        {"Foo", "1 2 3", "ZonCloudReadNLSTool.ERR_NoPointFound"},  // no column, so no complete line
    };
    for (const auto& c : cases) {
        const auto reader = Reader(c.fdf, "0 0 0 0 0 0\r\n" + c.line + "\r\n");
        EXPECT_EQ(ErrorKey([&] { PointsOf(*reader); }), c.key) << c.fdf << " / " << c.line;
    }
}

TEST_F(AsciiUserFormat, ColourColumnsAndThePalette)
{
    EXPECT_EQ(Colors("X Y Z R G B", "1 2 3 10 20 30\r\n"), (std::vector<int>{10, 20, 30}));
    EXPECT_EQ(Colors("X Y Z COLOR", "1 2 3 5\r\n"), (std::vector<int>{255, 255, 0}));
    // COLOR wins only as the last colour column; after it, R G B give the colour.
    EXPECT_EQ(Colors("X Y Z R G B COLOR", "1 2 3 10 20 30 6\r\n"), (std::vector<int>{255, 0, 255}));
    EXPECT_EQ(Colors("X Y Z COLOR R G B", "1 2 3 6 10 20 30\r\n"), std::vector<int>{});
    // R and G without B: no colour at all.
    EXPECT_EQ(Colors("X Y Z R G", "1 2 3 10 20\r\n"), std::vector<int>{});
}

TEST_F(AsciiUserFormat, OnlyTheFirstFdfCountsButEachOneReloads)
{
    ZonCloudReadAsciiUserFormat noFdf(Write("data.asc_fmt", "1 2 3\r\n"));
    unsigned n = 7;
    EXPECT_EQ(noFdf.GetPoints(n), nullptr);
    EXPECT_EQ(n, 0u);
    EXPECT_NE(ErrorKey([&] { noFdf.SetFDFile(Path("missing.fdf")); }), "");
    EXPECT_EQ(ErrorKey([&] { PointsOf(*Reader("X Y Z", "1 2\r\n")); }), "ZonCloudReadNLSTool.ERR_NoPointFound");

    const auto reader = Reader("X Y Z", "1 2 3\r\n");
    EXPECT_EQ(PointsOf(*reader), (Doubles{1, 2, 3}));
    Write("data.asc_fmt", "4 5 6\r\n");
    reader->SetFDFile(Write("other.fdf", "Z Y X"));
    EXPECT_EQ(PointsOf(*reader), (Doubles{4, 5, 6}));
}

TEST_F(AsciiUserFormat, SamplingAndCapacity)
{
    std::string data;
    for (int i = 0; i < 10; ++i) data += std::to_string(i) + " 0 0\r\n";
    const auto reader = Reader("X Y Z", data);
    reader->SetSamplingPercent(50.0f);
    EXPECT_EQ(PointsOf(*reader), (Doubles{0, 0, 0, 2, 0, 0, 4, 0, 0, 6, 0, 0, 8, 0, 0}));
    EXPECT_EQ(reader->GetNumberOfPoints(), 10);  // every complete line counts
    reader->SetSamplingPercent(0.0f);
    EXPECT_EQ(PointsOf(*reader), (Doubles{0, 0, 0}));
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(0, 9, 0, 0, 0, 0)));

    // 20 lines of 8 bytes in a file of 30 000 lines: room for 30 001 points,
    // then 8192 more when the estimate falls short.
    const auto estimated = Reader("X Y Z", Repeat("1 2 3 \r\n", 30000));
    EXPECT_EQ(PointsOf(*estimated).size(), 90000u);
    EXPECT_EQ(estimated->GetCapacity(), 30001u);
    const std::string longer = Repeat("1 2 3 ! a longer line\r\n", 20) + Repeat("1 2 3\r\n", 200);
    const auto grown = Reader("X Y Z", longer);
    EXPECT_EQ(PointsOf(*grown).size(), 660u);
    EXPECT_EQ(grown->GetCapacity(), longer.size() / 23 + 1 + 8192);
}

TEST_F(AsciiUserFormat, FactoryTakesTheFdfAndColourChoiceFromTheSettings)
{
    auto& settings = ZonCldSettings::Instance();
    settings.SetValue("ImportAUFFDF", Write("columns.fdf", "X Y Z R G B"));
    settings.SetBool("KeepColors", false);
    const auto reader = ZonCloudFactoryAsciiUserFormat().CreateReader(Write("data.asc_fmt", "1 2 3 4 5 6\r\n"));
    settings.ResetAll();
    unsigned n = 0;
    EXPECT_EQ(reader->GetNumberOfPoints(), 1);
    EXPECT_EQ(reader->GetPointColors(n), nullptr);

    ZonUnicodeString path;
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::OptionsToSettings({"Other", "FDFFileName"}, {"1", "a.fdf"}, path),
              ZON_S_OK);
    EXPECT_EQ(path.ToUtf8(), "a.fdf");
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::OptionsToSettings({"FDFFileName"}, {}, path), ZON_E_FAIL);
    ZonListValZonString keys, values;
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::SettingsToOptions("b.fdf", keys, values), ZON_S_OK);
    EXPECT_EQ(keys, ZonListValZonString{"FDFFileName"});
    EXPECT_EQ(values, ZonListValZonString{"b.fdf"});
}

// The writer's settings: header, name, row and column separators, numbers, width, decimals.
TEST_F(AsciiUserFormat, WriterLinesForEachShape)
{
    const double p[3] = {1, 2, 3};
    const unsigned char rgb[3] = {10, 200, 0};
    const struct {
        ZonListValZonString settings;
        bool color;
        std::string bytes;
    } cases[] = {
        {{"only", "three", "texts"}, false, "       1.000       2.000       3.000\r\n"},  // ignored: the defaults
        {{"N", "N", "N", "N", "N", "6", "1"}, true, "   1.0   2.0   3.0    10   200     0\r\n"},
        {{"N", "N", "N", "N", "Y", "6", "2"}, false, "    1  1.00  2.00  3.00\r\n"},
        {{"N", "N", "N", "N", "N", "-4", "1"}, false, " 1.0   2.0   3.0  \r\n"},  // a negative width left-aligns
        {{"N", "N", "N", ";", "N", "7", "2"}, false, "  1.00 ;  2.00 ;  3.00\r\n"},
        {{"N", "N", "N", "%", "Y", "5", "0"}, true, "   1 %   1 %   2 %   3 %  10 % 200 %   0\r\n"},
        {{"Head", "Cloud 1", "=", "N", "N", "2", "0"}, false,
         "! Head\r\n\r\n! Cloud 1\r\n\r\n!========" "=========\r\n 1 2 3\r\n!========\r\n"},
    };
    for (const auto& c : cases) {
        ZonCloudWriteAsciiUserFormat writer(Path("out.asc_fmt"));
        writer.SetWriteSettings(c.settings);
        writer.BeginWritePoints(1);
        if (c.color)
            writer.WritePointColorDouble(p, rgb);
        else
            writer.WritePointDouble(p);
        writer.EndWritePoints();
        EXPECT_EQ(Slurp(Path("out.asc_fmt")), c.bytes) << c.bytes;
    }
}

TEST_F(AsciiUserFormat, WriterChecksTheCountAndItsFilesReadBack)
{
    ZonCloudWriteAsciiUserFormat writer(Path("out.asc_fmt"));
    writer.SetWriteSettings({"Survey", "Cloud A", "-", "|", "Y", "12", "4"});
    const double points[2][3] = {{1.25, -2.5, 3.0625}, {100.5, 0.0001, -7}};
    const unsigned char colors[2][3] = {{1, 2, 3}, {250, 128, 0}};
    writer.BeginWritePoints(2);
    for (int i = 0; i < 2; ++i) writer.WritePointColorDouble(points[i], colors[i]);
    EXPECT_EQ(ErrorKey([&] { writer.WritePointDouble(points[0]); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();

    ZonCloudReadAsciiUserFormat reader(Path("out.asc_fmt"));
    reader.SetFDFile(Write("round.fdf", "LABEL USELESS_INFO X USELESS_INFO Y USELESS_INFO Z USELESS_INFO R "
                                        "USELESS_INFO G USELESS_INFO B\r\n"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1.25, -2.5, 3.0625, 100.5, 0.0001, -7}));
    unsigned n = 0;
    const unsigned char* rgb = reader.GetPointColors(n);
    ASSERT_EQ(n, 2u);
    EXPECT_EQ(std::vector<int>(rgb, rgb + 6), (std::vector<int>{1, 2, 3, 250, 128, 0}));

    writer.BeginWritePoints(2);
    writer.WritePointDouble(points[0]);
    EXPECT_EQ(ErrorKey([&] { writer.EndWritePoints(); }), "ZonCloudReadNLSTool.ERR_Failure");
}

// The tool: dump shows the per-point arrays, convert writes the layout asked for.
TEST_F(AsciiUserFormat, ToolDumpsTheArraysAndConverts)
{
    const std::string fdf = Quote(Write("c.fdf", "X Y Z R G B A SYMBOL TEXT TEXT LABEL\r\n"));
    const std::string data = Quote(Write("p.asc_fmt", "1 2 3 10 20 30 40 5 \"a b\" \"x\" L1\r\n"
                                                      "4 5 6 7 8 9 50 6 \"c\" none L2\r\n"));
    const auto dump = Run("dump --json --fdf " + fdf + " " + data);
    ASSERT_EQ(dump.status, 0) << dump.err;
    const Json cloud = Json::parse(dump.out)["cloud"];
    EXPECT_EQ(cloud["colors"], Json::parse("[[10,20,30],[7,8,9]]"));
    EXPECT_EQ(cloud["alpha"], Json::parse("[40,50]"));
    EXPECT_EQ(cloud["symbols"], Json::parse("[5,6]"));
    // Each TEXT column adds its quoted text, an empty one when unquoted.
    EXPECT_EQ(cloud["texts"], Json::parse(R"(["/a b%/x%","/c%/%"])"));

    const auto convert = Run("convert --fdf " + fdf + " " + data + " " + Quote(Path("out.asc_fmt")) +
                             " --auf-numbers Y --auf-width 8 --auf-decimals 1 --auf-row-sep N");
    ASSERT_EQ(convert.status, 0) << convert.err;
    EXPECT_EQ(Slurp(Path("out.asc_fmt")), "      1     1.0     2.0     3.0      10      20      30\r\n"
                                          "      2     4.0     5.0     6.0       7       8       9\r\n");
}

}  // namespace
