// RGB point files: the colour rules, the count line, the decimal swap after
// 200 unknown lines, the writers' bytes and their round trip.
#include <gtest/gtest.h>

#include "ZonCldSettings.h"
#include "ZonCloudFactoryLeica.h"
#include "ZonCloudReadLeica.h"
#include "ZonCloudWriteLeica.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryInstance.h"
#include "ZonExchMemoryPointFace.h"
#include "ZonExchMemoryProduct.h"
#include "ZonExchMemoryProductStructure.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchOutputDocument.h"
#include "ZonIReporter.h"
#include "ZonObjectRegistry.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::PointsOf;
using zontest::Repeat;
using zontest::Slurp;
using Doubles = std::vector<double>;
using Ints = std::vector<int>;

Ints Colors(ZonICloudReadFile& reader)
{
    unsigned n = 0;
    const unsigned char* c = reader.GetPointColors(n);
    return Ints(c, c + 3 * n);
}

class RgbPoints : public zontest::FilesTest {};

TEST_F(RgbPoints, ColourRulesForThreeToSevenValues)
{
    const struct {
        std::string line;
        Ints color;
    } cases[] = {
        {"1 2 3 10 20 30", {10, 20, 30}},
        {"1 2 3 99 10 20 30", {10, 20, 30}},   // intensity, then the colour
        {"1 2 3 300 20 30", {255, 255, 255}},  // six values, the first out of range
        {"1 2 3 10 20 30 256", {255, 255, 255}},
        {"1 2 3 10 20 300", {10, 20, 255}},  // six values, the fourth in range: a component above 255 saturates
        {"1 2 3", {255, 255, 255}},
        {"1 2 3 10 20", {255, 255, 255}},
        {"1 2 3 1.5 20 30", {255, 255, 255}},  // the intensity ends the integers
    };
    for (const auto& c : cases) {
        ZonCloudReadLeica reader(Write("p.asc_rgb", c.line + "\n"));
        EXPECT_EQ(PointsOf(reader), (Doubles{1, 2, 3})) << c.line;
        EXPECT_EQ(Colors(reader), c.color) << c.line;
    }

    // The factory leaves colours out when the settings say so.
    ZonCldSettings::Instance().SetBool("KeepColors", false);
    unsigned n = 0;
    EXPECT_EQ(ZonCloudFactoryLeica().CreateReader(Path("p.asc_rgb"))->GetPointColors(n), nullptr);
    ZonCldSettings::Instance().ResetAll();
}

TEST_F(RgbPoints, CountLineEndLineEstimateAndSampling)
{
    ZonCloudReadLeica reader(Write("p.asc_rgb", "5\n1 1 1\n2 2 2\n3 3 3\n**end cloud**\n4 4 4\n"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1, 1, 1, 2, 2, 2, 3, 3, 3}));
    EXPECT_EQ(reader.GetCapacity(), 5u);
    EXPECT_EQ(reader.GetDataStartOffset(), 2);

    // Without a count line the room is the size over the average line length.
    ZonCloudReadLeica estimated(Write("e.asc_rgb", Repeat("1 2 3\n", 100)));
    EXPECT_EQ(estimated.GetNumberOfPoints(), 100);
    EXPECT_EQ(estimated.GetCapacity(), 100u);

    // Colours follow the sampled points; every point line counts.
    ZonCloudReadLeica sampled(Write("s.asc_rgb", Repeat("1 2 3 4 5 6\n", 10)));
    sampled.SetSamplingPercent(50.0f);
    EXPECT_EQ(Colors(sampled).size(), 15u);
    EXPECT_EQ(sampled.GetNumberOfPoints(), 10);
}

TEST_F(RgbPoints, DecimalSwapComesWithTheTwoHundredAndFirstUnknownLine)
{
    // Under the "C" locale a comma stops a number: every line is unknown,
    // and the 201st makes the reader start again with ',' as decimal point.
    const struct {
        std::string data, key;
        bool swapped;
        std::size_t values;
        Doubles second;  // the second point
    } cases[] = {
        // (a first line "1,5 ..." would be a count line, not an unknown one)
        {Repeat("0,5 2,25 3,125 10 20 30\n", 201), "", true, 603, {0.5, 2.25, 3.125}},
        {Repeat("0,5 2,5 3,5\n", 200), "ZonCloudReadNLSTool.ERR_NoPointFound", false, 0, {}},  // one short
        {Repeat("no point here\n", 201) + "1 2 3\n", "ZonCloudReadNLSTool.ERR_TooManyUnknownData", true, 0, {}},
        {Repeat("x\n", 150) + "1 2 3\n" + Repeat("x\n", 150) + "4 5 6\n", "", false, 6, {4, 5, 6}},  // a point starts the count again
    };
    for (const auto& c : cases) {
        ZonCloudReadLeica reader(Write("p.asc_rgb", c.data));
        Doubles points;
        EXPECT_EQ(ErrorKey([&] { points = PointsOf(reader); }), c.key);
        EXPECT_EQ(reader.IsDecimalPointSwapped(), c.swapped);
        ASSERT_EQ(points.size(), c.values);
        EXPECT_EQ(points.empty() ? Doubles{} : Doubles(points.begin() + 3, points.begin() + 6), c.second);
    }
}

TEST_F(RgbPoints, WriterBytesRoundTripAndToolConversion)
{
    ZonCloudWriteLeica writer(Path("out.asc_rgb"));
    writer.BeginWritePoints(2);
    const double a[3] = {1.5, -2, 0.125};
    const unsigned char rgb[3] = {10, 0, 255};
    writer.WritePointColorDouble(a, rgb);
    const float b[3] = {4, 5, 6};
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.WritePoint(b); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();
    EXPECT_EQ(Slurp(Path("out.asc_rgb")), "2\n1.500000 -2.000000 0.125000 10 0 255\n4.000000 5.000000 6.000000 255 255 255\n");
    ZonCloudReadLeica reader(Path("out.asc_rgb"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1.5, -2, 0.125, 4, 5, 6}));
    EXPECT_EQ(Colors(reader), (Ints{10, 0, 255, 255, 255, 255}));
    writer.BeginWritePoints(3);
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.EndWritePoints(); }), "ZonCloudReadNLSTool.ERR_Failure");

    // The tool picks the writer by the output's extension.
    const std::string in = Write("in.xyz_rgb", "1 2 3 10 20 30\n4 5 6\n");
    for (const char* out : {"tool.asc_rgb", "tool.cgo"})
        ASSERT_EQ(Run("convert " + zontest::Quote(in) + " " + zontest::Quote(Path(out))).status, 0) << out;
    EXPECT_EQ(Slurp(Path("tool.asc_rgb")), "2\n1.000000 2.000000 3.000000 10 20 30\n4.000000 5.000000 6.000000 255 255 255\n");
    EXPECT_EQ(Slurp(Path("tool.cgo")), "2\n1.000000 2.000000 3.000000\n4.000000 5.000000 6.000000\n**end cloud**\n");
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
    auto plain = std::make_shared<ZonExchMemoryTessFace>();  // no colour
    plain->SetCoords({0.5f, 0, 0});
    scan->AddFace(plain);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    for (const auto& node : {cloud, scan}) rep->AddTopNode(node);
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
    EXPECT_EQ(output->SetFileName(Path("doc.asc_rgb")), ZON_S_OK);
    EXPECT_EQ(output->SetOptions({"Scaling"}, {}), ZON_E_FAIL);
    EXPECT_EQ(output->SetOptions({"Scaling", "Precision"}, {"2", "precUnknown"}), ZON_S_OK);
    EXPECT_EQ(output->Open(), ZON_S_OK);
    EXPECT_EQ(output->Write(document), ZON_S_OK);
    EXPECT_EQ(output->Release(), ZON_S_OK);
    ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonStderrReporter>());
    EXPECT_EQ(Slurp(Path("doc.asc_rgb")),
              "-4.000000 4.000000 26.000000 10 20 30 \n"
              "-10.000000 10.000000 32.000000 40 50 60 \n"
              "0.000000 0.000000 22.000000 7 8 9 \n"
              "0.000000 1.000000 20.000000\n");
    ASSERT_EQ(reporter->Entries().size(), 1u);
    EXPECT_EQ(reporter->Entries()[0].key, "ZonCldExportCmd.ERR_FILESUCCESSFULL");

    // The file reads back: six values give the colour, three give white.
    ZonCloudReadLeica reader(Path("doc.asc_rgb"));
    EXPECT_EQ(Colors(reader), (Ints{10, 20, 30, 40, 50, 60, 7, 8, 9, 255, 255, 255}));
}

}  // namespace
