// ASCII user format: the FDF vocabulary and line rules of the reader, its
// factory options, and the fixed-width writer whose files read back.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonCloudFactoryAsciiUserFormat.h"
#include "ZonCloudReadAsciiUserFormat.h"
#include "ZonCloudScanFormat.h"
#include "ZonCloudWriteAsciiUserFormat.h"
#include "ZonError.h"

#include <nlohmann/json.hpp>

namespace fs = std::filesystem;

namespace {

class AsciiUserFormat : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_auf_XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
        ZonCldSettings::Instance().ResetAll();
    }
    void TearDown() override
    {
        fs::remove_all(dir_);
        ZonCldSettings::Instance().ResetAll();
    }

    std::string Write(const std::string& name, const std::string& content)
    {
        const std::string path = (dir_ / name).string();
        std::ofstream(path, std::ios::binary) << content;
        return path;
    }
    static std::string Read(const std::string& path)
    {
        std::ifstream in(path, std::ios::binary);
        std::stringstream text;
        text << in.rdbuf();
        return text.str();
    }
    // A reader of `data` whose FDF is `fdf` (written as given, line end included).
    std::shared_ptr<ZonCloudReadAsciiUserFormat> Reader(const std::string& fdf, const std::string& data)
    {
        auto reader = std::make_shared<ZonCloudReadAsciiUserFormat>(Write("data.asc_fmt", data));
        reader->SetFDFile(Write("columns.fdf", fdf));
        return reader;
    }
    static std::vector<double> Points(ZonCloudReadAsciiUserFormat& reader)
    {
        unsigned n = 0;
        const double* p = reader.GetPointsDouble(n);
        return std::vector<double>(p, p + 3 * n);
    }
    static std::string ErrorKey(const std::function<void()>& call)
    {
        try {
            call();
        } catch (const ZonError& error) {
            return error.GetMessageKey();
        }
        return "";
    }

    fs::path dir_;
};

TEST_F(AsciiUserFormat, TheCharacterBeforeEachNewlineIsCut)
{
    // An LF line loses its last character; a CR LF line loses only the CR.
    EXPECT_EQ(Points(*Reader("X Y Z", "1 2 34\n")), (std::vector<double>{1, 2, 3}));
    EXPECT_EQ(Points(*Reader("X Y Z", "1 2 34\r\n")), (std::vector<double>{1, 2, 34}));
    // The last line of a file without a newline is whole.
    EXPECT_EQ(Points(*Reader("X Y Z", "1 2 34\r\n5 6 78")), (std::vector<double>{1, 2, 34, 5, 6, 78}));
}

TEST_F(AsciiUserFormat, FdfWordsGiveTheFieldList)
{
    using R = ZonCloudReadAsciiUserFormat;
    const struct {
        std::string fdf;
        std::vector<int> fields;
    } cases[] = {
        {"X Y Z", {R::FieldX, R::FieldY, R::FieldZ}},
        {"X Y Foo Z", {R::FieldX, R::FieldY, R::FieldZ}},  // unknown words take no column
        {"x Y Z", {R::FieldY, R::FieldZ}},                 // keywords are case-sensitive
        {"X Y Z\r\n", {R::FieldX, R::FieldY, R::FieldZ}},
        {"X Y Z\n", {R::FieldX, R::FieldY}},  // the cut eats the Z of an LF line
        {"X  Y\tZ \nR G B", {R::FieldX, R::FieldY, R::FieldZ}},  // only the first line counts
        {"LABEL DX DY DZ X Y Z R G B A COLOR SYMBOL TEXT USELESS_INFO ",
         {R::FieldLabel, R::FieldDX, R::FieldDY, R::FieldDZ, R::FieldX, R::FieldY, R::FieldZ, R::FieldR, R::FieldG,
          R::FieldB, R::FieldA, R::FieldColor, R::FieldSymbol, R::FieldText, R::FieldUselessInfo}},
    };
    for (const auto& c : cases) {
        const auto reader = Reader(c.fdf, "");
        EXPECT_EQ(reader->GetFieldList(), c.fields) << c.fdf;
    }
}

TEST_F(AsciiUserFormat, ShortLinesAreSkippedAndLongLinesCutToTheFields)
{
    const std::string data = "1 2\r\n! note\r\n1 2 3 4 5\r\n7 8\r\n4 5 6\r\n";
    const auto reader = Reader("X Y Z", data);
    EXPECT_EQ(Points(*reader), (std::vector<double>{1, 2, 3, 4, 5, 6}));
    // Lines before the first point move the data start past them.
    EXPECT_EQ(reader->GetDataStartOffset(), static_cast<long>(std::string("1 2\r\n! note\r\n").size()));
    EXPECT_EQ(reader->GetNumberOfPoints(), 2);
}

TEST_F(AsciiUserFormat, DecimalCommasAndPointsGiveTheSamePoint)
{
    EXPECT_EQ(Points(*Reader("X Y Z", "1,5 2,5 3,5\r\n1.5 2.5 3.5\r\n")),
              (std::vector<double>{1.5, 2.5, 3.5, 1.5, 2.5, 3.5}));
}

TEST_F(AsciiUserFormat, ColumnsConvertAsScanfWould)
{
    // Real columns read "%le" and integer columns "%d" of the token, whatever
    // shortcut the reader takes; a column that does not convert reads 0 here.
    const char* tokens[] = {"1e5", "-2.5E-3", "+7", "0x1A", "inf", "-", "12abc", "1e", ".5", "007", "1,5e1",
                            "99999999999", "-2147483648", "2147483648", "nan", "1.2.3", "--1", "e3"};
    for (const char* token : tokens) {
        const auto reader = Reader("X Y Z", std::string(token) + " 0 0 \r\n");
        unsigned n = 0;
        const double* p = reader->GetPointsDouble(n);
        ASSERT_EQ(n, 1u) << token;
        std::string text = token;
        for (char& c : text)
            if (c == ',') c = '.';
        double x = 0.0;
        ZonScan(text.c_str(), '.', "%le", &x);
        if (std::isnan(x))
            EXPECT_TRUE(std::isnan(p[0])) << token;
        else
            EXPECT_EQ(p[0], x) << token;
    }
    for (const char* token : tokens) {
        std::int32_t expected = 0;
        if (ZonScan(token, '.', "%d", &expected) != 1 || static_cast<std::uint32_t>(expected) > 255u) continue;
        const auto reader = Reader("X Y Z R G B", std::string("0 0 0 ") + token + " 0 0 \r\n");
        unsigned n = 0;
        const unsigned char* rgb = reader->GetPointColors(n);
        ASSERT_EQ(n, 1u) << token;
        EXPECT_EQ(rgb[0], expected) << token;
    }
}

TEST_F(AsciiUserFormat, ExclamationMarkStartsACommentOnlyInTheFirstToken)
{
    const auto reader = Reader("X Y Z", "!1 2 3\r\n  ! 4 5 6\r\n7 8 9 !x\r\n");
    EXPECT_EQ(Points(*reader), (std::vector<double>{7, 8, 9}));
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
    };
    for (const auto& c : cases) {
        const auto reader = Reader(c.fdf, "0 0 0 0 0 0\r\n" + c.line + "\r\n");
        EXPECT_EQ(ErrorKey([&] { Points(*reader); }), c.key) << c.fdf << " / " << c.line;
    }
}

TEST_F(AsciiUserFormat, ColourColumnsAndThePalette)
{
    const auto colorsOf = [&](const std::string& fdf, const std::string& line) {
        const auto reader = Reader(fdf, line + "\r\n");
        unsigned n = 0;
        const unsigned char* rgb = reader->GetPointColors(n);
        std::vector<int> result(rgb, rgb + 3 * n);
        result.push_back(reader->GetKeepColors() ? 1 : 0);
        return result;
    };
    EXPECT_EQ(colorsOf("X Y Z R G B", "1 2 3 10 20 30"), (std::vector<int>{10, 20, 30, 1}));
    EXPECT_EQ(colorsOf("X Y Z COLOR", "1 2 3 5"), (std::vector<int>{255, 255, 0, 1}));
    // COLOR wins only as the last colour column; after it, R G B give the colour.
    EXPECT_EQ(colorsOf("X Y Z R G B COLOR", "1 2 3 10 20 30 6"), (std::vector<int>{255, 0, 255, 1}));
    EXPECT_EQ(colorsOf("X Y Z COLOR R G B", "1 2 3 6 10 20 30"), (std::vector<int>{0}));
    // R and G without B: no colour at all.
    EXPECT_EQ(colorsOf("X Y Z R G", "1 2 3 10 20"), (std::vector<int>{0}));
}

TEST_F(AsciiUserFormat, AlphaSymbolAndTextArrays)
{
    const auto reader = Reader("X Y Z A SYMBOL TEXT TEXT LABEL",
                               "1 2 3 40 7 \"two words\" \"x\" L1\r\n"
                               "4 5 6 50 8 \"one\" none L2\r\n");
    unsigned n = 0;
    const auto* alpha = static_cast<const std::int32_t*>(reader->GetPointAttributes1(n));
    ASSERT_EQ(n, 2u);
    EXPECT_EQ(alpha[0], 40);
    EXPECT_EQ(alpha[1], 50);
    const auto* symbol = static_cast<const std::int32_t*>(reader->GetPointAttributes2(n));
    ASSERT_EQ(n, 2u);
    EXPECT_EQ(symbol[1], 8);
    const auto* text = static_cast<const std::string*>(reader->GetPointAttributes3(n));
    ASSERT_EQ(n, 2u);
    EXPECT_EQ(text[0], "/two words%/x%");
    EXPECT_EQ(text[1], "/one%/%");  // a text column without quotes gives an empty text

    // Columns the FDF does not name give no array.
    const auto plain = Reader("X Y Z", "1 2 3\r\n");
    EXPECT_EQ(plain->GetPointAttributes1(n), nullptr);
    EXPECT_EQ(n, 0u);
    EXPECT_EQ(plain->GetPointAttributes3(n), nullptr);
    EXPECT_EQ(plain->GetPointColors(n), nullptr);
}

TEST_F(AsciiUserFormat, ASecondFdfKeepsTheFirstFieldListAndReloads)
{
    const auto reader = Reader("X Y Z", "1 2 3\r\n");
    EXPECT_EQ(Points(*reader), (std::vector<double>{1, 2, 3}));
    Write("data.asc_fmt", "4 5 6\r\n");
    reader->SetFDFile(Write("other.fdf", "Z Y X"));
    ZonUnicodeString path;
    reader->GetFDFile(path);
    EXPECT_EQ(path.ToUtf8(), (dir_ / "other.fdf").string());
    EXPECT_EQ(Points(*reader), (std::vector<double>{4, 5, 6}));
}

TEST_F(AsciiUserFormat, SamplingKeepsTheShareAskedFor)
{
    std::string data;
    for (int i = 0; i < 10; ++i) data += std::to_string(i) + " 0 0\r\n";
    const auto reader = Reader("X Y Z", data);
    reader->SetSamplingPercent(50.0f);
    EXPECT_EQ(Points(*reader), (std::vector<double>{0, 0, 0, 2, 0, 0, 4, 0, 0, 6, 0, 0, 8, 0, 0}));
    EXPECT_EQ(reader->GetNumberOfPoints(), 10);  // every complete line counts
    reader->SetSamplingPercent(0.0f);
    EXPECT_EQ(Points(*reader), (std::vector<double>{0, 0, 0}));
    ZonMathBox box;
    reader->GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(0, 9, 0, 0, 0, 0)));
}

TEST_F(AsciiUserFormat, CapacityComesFromTheFirstLinesAndGrowsInSteps)
{
    // 20 lines of 8 bytes in a file of 30 000 lines: room for 30 001 points,
    // then 8192 more when the estimate falls short.
    std::string data;
    for (int i = 0; i < 30000; ++i) data += "1 2 3 \r\n";
    const auto reader = Reader("X Y Z", data);
    EXPECT_EQ(Points(*reader).size(), 90000u);
    EXPECT_EQ(reader->GetCapacity(), 30001u);

    std::string longer;
    for (int i = 0; i < 20; ++i) longer += "1 2 3 ! a longer line\r\n";
    for (int i = 0; i < 200; ++i) longer += "1 2 3\r\n";
    const auto grown = Reader("X Y Z", longer);
    EXPECT_EQ(Points(*grown).size(), 660u);
    EXPECT_EQ(grown->GetCapacity(), longer.size() / 23 + 1 + 8192);
}

TEST_F(AsciiUserFormat, WithoutFdfThereIsNothingAndWithoutPointsAnError)
{
    ZonCloudReadAsciiUserFormat noFdf(Write("data.asc_fmt", "1 2 3\r\n"));
    unsigned n = 7;
    EXPECT_EQ(noFdf.GetPoints(n), nullptr);
    EXPECT_EQ(n, 0u);
    EXPECT_EQ(ErrorKey([&] { Points(*Reader("X Y Z", "1 2\r\n")); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
    EXPECT_EQ(ErrorKey([&] { Points(*Reader("Foo", "1 2 3\r\n")); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
    // Only the first FDF is read, so only a missing first FDF is an error.
    EXPECT_NE(ErrorKey([&] { noFdf.SetFDFile((dir_ / "missing.fdf").string()); }), "");
}

TEST_F(AsciiUserFormat, FloatsAreTheDoublesNarrowed)
{
    const auto reader = Reader("X Y Z", "0.1 0.2 0.3\r\n");
    unsigned n = 0;
    const float* p = reader->GetPoints(n);
    ASSERT_EQ(n, 1u);
    EXPECT_EQ(p[0], 0.1f);
    const double* d = reader->GetPointsDouble(n);
    ASSERT_EQ(n, 1u);
    EXPECT_EQ(d[2], 0.3);
}

TEST_F(AsciiUserFormat, FactoryTakesTheFdfAndColourChoiceFromTheSettings)
{
    auto& settings = ZonCldSettings::Instance();
    settings.SetImportAUFFDF(Write("columns.fdf", "X Y Z R G B"));
    settings.SetBool("KeepColors", false);
    ZonCloudFactoryAsciiUserFormat factory;
    ZonUnicodeString name;
    factory.GetFormatName(name);
    EXPECT_EQ(name.ToUtf8(), "ASCII User Format");
    const auto reader = factory.CreateReader(Write("data.asc_fmt", "1 2 3 4 5 6\r\n"));
    unsigned n = 0;
    EXPECT_NE(reader->GetPoints(n), nullptr);
    EXPECT_EQ(n, 1u);
    EXPECT_EQ(reader->GetPointColors(n), nullptr);

    ZonUnicodeString path;
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::OptionsToSettings({"Other", "FDFFileName"}, {"1", "a.fdf"}, path),
              ZON_S_OK);
    EXPECT_EQ(path.ToUtf8(), "a.fdf");
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::OptionsToSettings({"FDFFileName"}, {}, path), ZON_E_FAIL);
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::OptionsToSettings({"Other"}, {"x"}, path), ZON_E_FAIL);
    ZonListValZonString keys, values;
    EXPECT_EQ(ZonCloudFactoryAsciiUserFormat::SettingsToOptions("b.fdf", keys, values), ZON_S_OK);
    EXPECT_EQ(keys, ZonListValZonString{"FDFFileName"});
    EXPECT_EQ(values, ZonListValZonString{"b.fdf"});
}

// The writer.

ZonListValZonString Settings(const char* header, const char* name, const char* row, const char* col,
                             const char* number, const char* width, const char* decimals)
{
    return {header, name, row, col, number, width, decimals};
}

TEST_F(AsciiUserFormat, WriterLinesForEachShape)
{
    const double p[3] = {1, 2, 3};
    const unsigned char rgb[3] = {10, 200, 0};
    const struct {
        ZonListValZonString settings;
        bool color;
        std::string bytes;
    } cases[] = {
        {Settings("N", "N", "N", "N", "N", "10", "3"), false, "     1.000     2.000     3.000\r\n"},
        {Settings("N", "N", "N", "N", "N", "6", "1"), true, "   1.0   2.0   3.0    10   200     0\r\n"},
        {Settings("N", "N", "N", "N", "Y", "6", "2"), false, "    1  1.00  2.00  3.00\r\n"},
        {Settings("N", "N", "N", ";", "N", "7", "2"), false, "  1.00 ;  2.00 ;  3.00\r\n"},
        {Settings("N", "N", "N", "%", "Y", "5", "0"), true, "   1 %   1 %   2 %   3 %  10 % 200 %   0\r\n"},
        {Settings("Head", "Cloud 1", "=", "N", "N", "2", "0"), false,
         "! Head\r\n\r\n! Cloud 1\r\n\r\n!========" "=========\r\n 1 2 3\r\n!========\r\n"},
    };
    for (const auto& c : cases) {
        const std::string path = (dir_ / "out.asc_fmt").string();
        ZonCloudWriteAsciiUserFormat writer(path);
        writer.SetWriteSettings(c.settings);
        writer.BeginWritePoints(1);
        if (c.color)
            writer.WritePointColorDouble(p, rgb);
        else
            writer.WritePointDouble(p);
        writer.EndWritePoints();
        EXPECT_EQ(Read(path), c.bytes) << c.settings[3] << " " << c.settings[4] << " " << c.settings[5];
    }
}

TEST_F(AsciiUserFormat, WriterSettingsReadBackAndWrongListsAreIgnored)
{
    ZonCloudWriteAsciiUserFormat writer((dir_ / "out.asc_fmt").string());
    ZonListValZonString settings;
    writer.GetWriteSettings(settings);
    EXPECT_EQ(settings, Settings("N", "N", "N", "N", "N", "12", "3"));
    writer.SetWriteSettings({"only", "three", "texts"});
    writer.SetWriteSettings(Settings("H", "N", "-", "N", "Y", "8", "4"));
    writer.GetWriteSettings(settings);
    EXPECT_EQ(settings, Settings("H", "N", "-", "N", "Y", "8", "4"));
    EXPECT_EQ(writer.LineTemplate(false), "%7d %7.4f %7.4f %7.4f\n");
}

TEST_F(AsciiUserFormat, WriterNumbersPointsAndChecksTheCount)
{
    const std::string path = (dir_ / "out.asc_fmt").string();
    ZonCloudWriteAsciiUserFormat writer(path);
    writer.SetWriteSettings(Settings("N", "N", "N", "N", "Y", "4", "0"));
    writer.BeginWritePoints(5);
    for (int i = 0; i < 5; ++i) {
        const float p[3] = {float(i), 0, 0};
        writer.WritePoint(p);
    }
    const float extra[3] = {0, 0, 0};
    EXPECT_EQ(ErrorKey([&] { writer.WritePoint(extra); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();
    EXPECT_EQ(Read(path), "  1   0   0   0\r\n  2   1   0   0\r\n  3   2   0   0\r\n  4   3   0   0\r\n  5   4   0   0\r\n");

    writer.BeginWritePoints(2);
    writer.WritePoint(extra);
    EXPECT_EQ(ErrorKey([&] { writer.EndWritePoints(); }), "ZonCloudReadNLSTool.ERR_Failure");
}

TEST_F(AsciiUserFormat, WrittenFilesReadBackWithAnFdfNamingTheColumns)
{
    const std::string path = (dir_ / "round.asc_fmt").string();
    ZonCloudWriteAsciiUserFormat writer(path);
    writer.SetWriteSettings(Settings("Survey", "Cloud A", "-", "|", "Y", "12", "4"));
    const double points[2][3] = {{1.25, -2.5, 3.0625}, {100.5, 0.0001, -7}};
    const unsigned char colors[2][3] = {{1, 2, 3}, {250, 128, 0}};
    writer.BeginWritePoints(2);
    for (int i = 0; i < 2; ++i) writer.WritePointColorDouble(points[i], colors[i]);
    writer.EndWritePoints();

    ZonCloudReadAsciiUserFormat reader(path);
    reader.SetFDFile(Write("round.fdf", "LABEL USELESS_INFO X USELESS_INFO Y USELESS_INFO Z USELESS_INFO R "
                                        "USELESS_INFO G USELESS_INFO B\r\n"));
    EXPECT_EQ(Points(reader), (std::vector<double>{1.25, -2.5, 3.0625, 100.5, 0.0001, -7}));
    unsigned n = 0;
    const unsigned char* rgb = reader.GetPointColors(n);
    ASSERT_EQ(n, 2u);
    EXPECT_EQ(std::vector<int>(rgb, rgb + 6), (std::vector<int>{1, 2, 3, 250, 128, 0}));
}

// The tool: dump shows the per-point arrays, convert writes the layout asked for.
std::string RunTool(const std::string& arguments, int& status)
{
    std::string output;
    const std::string command = std::string("'") + ZON_TOOL_PATH + "' " + arguments + " 2>&1 </dev/null";
    FILE* pipe = ::popen(command.c_str(), "r");
    if (!pipe) return output;
    char buffer[4096];
    while (const std::size_t n = std::fread(buffer, 1, sizeof buffer, pipe)) output.append(buffer, n);
    status = ::pclose(pipe);
    return output;
}

TEST_F(AsciiUserFormat, ToolDumpsTheArraysAndConvertsBackAndForth)
{
    const std::string fdf = Write("c.fdf", "X Y Z R G B A SYMBOL TEXT\r\n");
    const std::string data = Write("p.asc_fmt", "1 2 3 10 20 30 40 5 \"a b\"\r\n4 5 6 7 8 9 50 6 \"c\"\r\n");
    int status = -1;
    const std::string json = RunTool("dump --json --fdf '" + fdf + "' '" + data + "'", status);
    ASSERT_EQ(status, 0) << json;
    const auto cloud = nlohmann::json::parse(json)["cloud"];
    EXPECT_EQ(cloud["colors"], nlohmann::json::parse("[[10,20,30],[7,8,9]]"));
    EXPECT_EQ(cloud["alpha"], nlohmann::json::parse("[40,50]"));
    EXPECT_EQ(cloud["symbols"], nlohmann::json::parse("[5,6]"));
    EXPECT_EQ(cloud["texts"], nlohmann::json::parse(R"(["/a b%","/c%"])"));

    const std::string out = (dir_ / "out.asc_fmt").string();
    const std::string report = RunTool("convert --fdf '" + fdf + "' '" + data + "' '" + out +
                                           "' --auf-numbers Y --auf-width 8 --auf-decimals 1 --auf-row-sep N",
                                       status);
    ASSERT_EQ(status, 0) << report;
    EXPECT_EQ(Read(out), "      1     1.0     2.0     3.0      10      20      30\r\n"
                         "      2     4.0     5.0     6.0       7       8       9\r\n");
    const std::string back = Write("back.fdf", "LABEL X Y Z R G B\r\n");
    const std::string again = RunTool("dump --json --fdf '" + back + "' '" + out + "'", status);
    ASSERT_EQ(status, 0) << again;
    EXPECT_EQ(nlohmann::json::parse(again)["cloud"]["points"], nlohmann::json::parse("[[1,2,3],[4,5,6]]"));
}

}  // namespace
