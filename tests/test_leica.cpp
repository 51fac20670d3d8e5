// RGB point files: the colour rules, the count line, the decimal swap after
// 200 unknown lines, the writer's bytes and its round trip.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonCloudFactoryLeica.h"
#include "ZonCloudReadLeica.h"
#include "ZonCloudWriteLeica.h"
#include "ZonCldLeicaOutputDocument.h"
#include "ZonError.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryInstance.h"
#include "ZonExchMemoryPointFace.h"
#include "ZonExchMemoryProduct.h"
#include "ZonExchMemoryProductStructure.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchProductStructure.h"
#include "ZonIReporter.h"
#include "ZonObjectRegistry.h"

namespace fs = std::filesystem;

namespace {

class RgbPoints : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_rgb_XXXXXX";
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
    static std::vector<double> Points(ZonCloudReadLeica& reader)
    {
        unsigned n = 0;
        const double* p = reader.GetPointsDouble(n);
        return std::vector<double>(p, p + 3 * n);
    }
    static std::vector<int> Colors(ZonCloudReadLeica& reader)
    {
        unsigned n = 0;
        const unsigned char* c = reader.GetPointColors(n);
        return std::vector<int>(c, c + 3 * n);
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

TEST_F(RgbPoints, ColourRulesForThreeToSevenValues)
{
    const struct {
        std::string line;
        std::vector<int> color;
    } cases[] = {
        {"1 2 3 10 20 30", {10, 20, 30}},
        {"1 2 3 99 10 20 30", {10, 20, 30}},    // intensity, then the colour
        {"1 2 3 300 20 30", {255, 255, 255}},   // six values, the first out of range
        {"1 2 3 10 20 30 256", {255, 255, 255}},
        {"1 2 3 10 20 300", {10, 20, 255}},     // six values, the fourth in range: a component above 255 saturates
        {"1 2 3", {255, 255, 255}},
        {"1 2 3 10 20", {255, 255, 255}},
        {"1 2 3 1.5 20 30", {255, 255, 255}},   // the intensity ends the integers
    };
    for (const auto& c : cases) {
        ZonCloudReadLeica reader(Write("p.asc_rgb", c.line + "\n"));
        EXPECT_EQ(Points(reader), (std::vector<double>{1, 2, 3})) << c.line;
        EXPECT_EQ(Colors(reader), c.color) << c.line;
    }
}

TEST_F(RgbPoints, ColoursCanBeLeftOut)
{
    ZonCloudReadLeica reader(Write("p.asc_rgb", "1 2 3 10 20 30\n"));
    EXPECT_EQ(Colors(reader), (std::vector<int>{10, 20, 30}));
    reader.SetKeepColors(false);
    EXPECT_FALSE(reader.GetKeepColors());
    EXPECT_EQ(Colors(reader), std::vector<int>{});
    EXPECT_EQ(Points(reader), (std::vector<double>{1, 2, 3}));

    ZonCldSettings::Instance().SetBool("KeepColors", false);
    const auto fromFactory = ZonCloudFactoryLeica().CreateReader(Write("q.asc_rgb", "1 2 3 10 20 30\n"));
    unsigned n = 0;
    EXPECT_EQ(fromFactory->GetPointColors(n), nullptr);
    EXPECT_EQ(n, 0u);
}

TEST_F(RgbPoints, CountLinePresizesTheArrays)
{
    ZonCloudReadLeica reader(Write("p.asc_rgb", "5\n1 1 1\n2 2 2\n3 3 3\n4 4 4\n5 5 5\n"));
    EXPECT_EQ(reader.GetNumberOfPoints(), 5);
    EXPECT_EQ(reader.GetCapacity(), 5u);
    EXPECT_EQ(reader.GetDataStartOffset(), 2);

    // Without a count line the room is the size over the average line length.
    std::string data;
    for (int i = 0; i < 100; ++i) data += "1 2 3\n";
    ZonCloudReadLeica estimated(Write("e.asc_rgb", data));
    EXPECT_EQ(estimated.GetNumberOfPoints(), 100);
    EXPECT_EQ(estimated.GetCapacity(), 100u);
}

TEST_F(RgbPoints, EndCloudLineStopsTheReading)
{
    ZonCloudReadLeica reader(Write("p.asc_rgb", "1 2 3\n**end cloud**\n4 5 6\n"));
    EXPECT_EQ(Points(reader), (std::vector<double>{1, 2, 3}));
}

TEST_F(RgbPoints, DecimalCommaFilesAreReadAfterTwoHundredUnknownLines)
{
    // Under the "C" locale a comma stops a number: every line is unknown,
    // and the 201st makes the reader start again with ',' as decimal point.
    std::string comma;
    for (int i = 0; i < 201; ++i) comma += std::to_string(i) + ",5 2,25 3,125 10 20 30\n";
    ZonCloudReadLeica reader(Write("comma.asc_rgb", comma));
    const std::vector<double> points = Points(reader);
    ASSERT_EQ(points.size(), 603u);
    EXPECT_EQ(points[3], 1.5);
    EXPECT_EQ(points[5], 3.125);
    EXPECT_TRUE(reader.IsDecimalPointSwapped());
    EXPECT_EQ(Colors(reader)[5], 30);

    std::string shorter;
    for (int i = 0; i < 200; ++i) shorter += "1,5 2,5 3,5\n";
    ZonCloudReadLeica few(Write("few.asc_rgb", shorter));
    EXPECT_EQ(ErrorKey([&] { Points(few); }), "ZonCloudReadNLSTool.ERR_NoPointFound");

    std::string junk;
    for (int i = 0; i < 201; ++i) junk += "no point here\n";
    ZonCloudReadLeica unknown(Write("junk.asc_rgb", junk + "1 2 3\n"));
    EXPECT_EQ(ErrorKey([&] { Points(unknown); }), "ZonCloudReadNLSTool.ERR_TooManyUnknownData");

    // A point between unknown lines starts their count again.
    std::string mixed;
    for (int i = 0; i < 150; ++i) mixed += "x\n";
    mixed += "1 2 3\n";
    for (int i = 0; i < 150; ++i) mixed += "x\n";
    ZonCloudReadLeica reset(Write("mixed.asc_rgb", mixed));
    EXPECT_EQ(Points(reset), (std::vector<double>{1, 2, 3}));
    EXPECT_FALSE(reset.IsDecimalPointSwapped());
}

TEST_F(RgbPoints, SamplingAndSinglePrecision)
{
    std::string data;
    for (int i = 0; i < 10; ++i) data += std::to_string(i) + ".1 0 0 1 2 3\n";
    ZonCloudReadLeica reader(Write("p.asc_rgb", data));
    reader.SetSamplingPercent(50.0f);
    unsigned n = 0;
    const float* p = reader.GetPoints(n);
    ASSERT_EQ(n, 5u);
    EXPECT_EQ(p[3], 2.1f);
    EXPECT_EQ(reader.GetNumberOfPoints(), 10);
    EXPECT_EQ(Colors(reader).size(), 15u);
}

TEST_F(RgbPoints, WriterBytesAndRoundTrip)
{
    const std::string path = (dir_ / "out.asc_rgb").string();
    ZonCloudWriteLeica writer(path);
    writer.BeginWritePoints(2);
    const double a[3] = {1.5, -2, 0.125};
    const unsigned char rgb[3] = {10, 0, 255};
    writer.WritePointColorDouble(a, rgb);
    const float b[3] = {4, 5, 6};
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.WritePoint(b); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();
    EXPECT_EQ(Read(path), "2\n1.500000 -2.000000 0.125000 10 0 255\n4.000000 5.000000 6.000000 255 255 255\n");

    ZonCloudReadLeica reader(path);
    EXPECT_EQ(Points(reader), (std::vector<double>{1.5, -2, 0.125, 4, 5, 6}));
    EXPECT_EQ(Colors(reader), (std::vector<int>{10, 0, 255, 255, 255, 255}));
    EXPECT_EQ(reader.GetCapacity(), 2u);

    writer.BeginWritePoints(3);
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.EndWritePoints(); }), "ZonCloudReadNLSTool.ERR_Failure");
}

TEST_F(RgbPoints, ToolConvertsToRgbAndCgoFiles)
{
    const std::string in = Write("in.xyz_rgb", "1 2 3 10 20 30\n4 5 6\n");
    const std::string rgb = (dir_ / "out.asc_rgb").string();
    const std::string cgo = (dir_ / "out.cgo").string();
    for (const std::string& out : {rgb, cgo}) {
        const std::string command = std::string("'") + ZON_TOOL_PATH + "' convert '" + in + "' '" + out + "' >/dev/null 2>&1";
        ASSERT_EQ(std::system(command.c_str()), 0) << out;
    }
    EXPECT_EQ(Read(rgb), "2\n1.000000 2.000000 3.000000 10 20 30\n4.000000 5.000000 6.000000 255 255 255\n");
    EXPECT_EQ(Read(cgo), "2\n1.000000 2.000000 3.000000\n4.000000 5.000000 6.000000\n**end cloud**\n");
}

TEST_F(RgbPoints, OutputDocumentPlacesScalesAndColoursThePoints)
{
    // A cloud with a colour per point, moved by its node, and a scan with the
    // representation's one colour, under an instance that turns and shifts.
    auto colored = std::make_shared<ZonExchMemoryPointFace>();
    colored->SetCoords({1, 2, 3, 4, 5, 6});
    colored->SetPointColors({10, 20, 30, 40, 50, 60});
    auto cloud = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeCloud);
    cloud->SetPosition({1, 0, 0, 0, 1, 0, 0, 0, 1}, {1, 0, 0});
    cloud->AddFace(colored);
    auto single = std::make_shared<ZonExchMemoryPointFace>();
    single->SetCoords({0, 0, 1});
    single->SetSingleColor(7, 8, 9);
    auto scan = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeScan);
    scan->AddFace(single);
    auto plain = std::make_shared<ZonExchMemoryTessFace>();
    plain->SetCoords({0.5f, 0, 0});
    auto grid = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeGrid);
    grid->AddFace(plain);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    for (const auto& node : {cloud, scan, grid}) rep->AddTopNode(node);
    auto part = std::make_shared<ZonExchMemoryProduct>();
    part->SetTessellatedRep(rep);
    auto root = std::make_shared<ZonExchMemoryProduct>();
    root->AddInstance(std::make_shared<ZonExchMemoryInstance>(
        part, ZonMathTransformation({0, -1, 0, 1, 0, 0, 0, 0, 1}, {0, 0, 10})));
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(root);
    auto document = std::make_shared<ZonExchMemoryDocument>();
    document->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);

    auto reporter = std::make_shared<ZonCollectingReporter>();
    ZonSession::GetPtrSession()->SetReporter(reporter);
    const auto output = ZonQueryInterface<ZonIExchOutputDocument>(
        ZonObjectRegistry::CreateByLateType("CLD_AsciiRGB_OutputDocument"));
    ASSERT_NE(output, nullptr);
    const std::string path = (dir_ / "doc.asc_rgb").string();
    EXPECT_EQ(output->Open(), ZON_E_FAIL);  // no file name yet
    EXPECT_EQ(output->SetFileName(path), ZON_S_OK);
    EXPECT_EQ(output->SetOptions({"Scaling"}, {}), ZON_E_FAIL);
    EXPECT_EQ(output->SetOptions({"Scaling", "Precision"}, {"2", "precUnknown"}), ZON_S_OK);
    EXPECT_EQ(output->Open(), ZON_S_OK);
    EXPECT_EQ(output->Write(document), ZON_S_OK);
    EXPECT_EQ(output->Release(), ZON_S_OK);
    EXPECT_EQ(Read(path),
              "-4.000000 4.000000 26.000000 10 20 30 \n"
              "-10.000000 10.000000 32.000000 40 50 60 \n"
              "0.000000 0.000000 22.000000 7 8 9 \n"
              "0.000000 1.000000 20.000000\n");
    ASSERT_EQ(reporter->Entries().size(), 1u);
    EXPECT_EQ(reporter->Entries()[0].key, "ZonCldExportCmd.ERR_FILESUCCESSFULL");

    // The file reads back: six values give the colour, three give white.
    ZonCloudReadLeica reader(path);
    EXPECT_EQ(Colors(reader), (std::vector<int>{10, 20, 30, 40, 50, 60, 7, 8, 9, 255, 255, 255}));
    ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonStderrReporter>());
}

}  // namespace
