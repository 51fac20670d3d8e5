// Cgo files: the count and end lines, sampling, the re-read in the other
// precision, and the writer's bytes with their round trip.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>
#include <vector>

#include "ZonCldImporter.h"
#include "ZonCloudFactoryCgoAscii.h"
#include "ZonCloudReadCgoAscii.h"
#include "ZonCloudWriteCgoAscii.h"
#include "ZonCldCgoOutputDocument.h"
#include "ZonError.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchTessRep.h"

namespace fs = std::filesystem;

namespace {

class Cgo : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_cgo_XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        dir_ = pattern;
    }
    void TearDown() override { fs::remove_all(dir_); }

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
    static std::vector<double> Points(ZonCloudReadCgoAscii& reader)
    {
        unsigned n = 0;
        const double* p = reader.GetPointsDouble(n);
        return std::vector<double>(p, p + 3 * n);
    }
    static std::vector<float> PointsSingle(ZonCloudReadCgoAscii& reader)
    {
        unsigned n = 0;
        const float* p = reader.GetPoints(n);
        return std::vector<float>(p, p + 3 * n);
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

TEST_F(Cgo, CountLinePointsAndEndLine)
{
    ZonCloudReadCgoAscii reader(Write("p.cgo", "3\n1 2 3 4\n4 5 6\n7 8 9\n**end cloud**\n10 11 12\n"));
    EXPECT_EQ(Points(reader), (std::vector<double>{1, 2, 3, 4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(reader.GetNumberOfPoints(), 3);
    EXPECT_EQ(reader.GetCapacity(), 3u);
    EXPECT_EQ(reader.GetDataStartOffset(), 2);
    ZonMathBox box;
    reader.GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(1, 7, 2, 8, 3, 9)));
}

TEST_F(Cgo, AnyLineThatIsNoPointMayStandFirst)
{
    ZonCloudReadCgoAscii titled(Write("t.cgo", "cloud from the scanner\n1 2 3\n"));
    EXPECT_EQ(Points(titled), (std::vector<double>{1, 2, 3}));
    ZonCloudReadCgoAscii bare(Write("b.cgo", "1 2 3\n"));
    EXPECT_EQ(Points(bare), (std::vector<double>{1, 2, 3}));
    ZonCloudReadCgoAscii empty(Write("e.cgo", "0\n**end cloud**\n"));
    EXPECT_EQ(ErrorKey([&] { Points(empty); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
}

TEST_F(Cgo, HalfOfTenLinesIsFiveAndTheOtherPrecisionFollowsTheSameRule)
{
    std::string data = "10\n";
    for (int i = 0; i < 10; ++i) data += std::to_string(i) + ".3 1 2\nnot a point\n";
    data += "**end cloud**\n99 99 99\n";
    ZonCloudReadCgoAscii reader(Write("p.cgo", data));
    reader.SetSamplingPercent(50.0f);
    reader.SetDoublePrecision(true);
    const std::vector<double> doubles = Points(reader);
    EXPECT_EQ(doubles, (std::vector<double>{0.3, 1, 2, 2.3, 1, 2, 4.3, 1, 2, 6.3, 1, 2, 8.3, 1, 2}));
    // The single-precision points are read again from the first point line.
    EXPECT_EQ(PointsSingle(reader),
              (std::vector<float>{0.3f, 1, 2, 2.3f, 1, 2, 4.3f, 1, 2, 6.3f, 1, 2, 8.3f, 1, 2}));
}

TEST_F(Cgo, DecimalCommaAfterTwoHundredUnknownLinesAndInTheReRead)
{
    std::string data;
    for (int i = 0; i < 250; ++i) data += std::to_string(i) + ",5 0,25 1\n";
    ZonCloudReadCgoAscii reader(Write("p.cgo", data));
    const std::vector<float> single = PointsSingle(reader);
    ASSERT_EQ(single.size(), 750u);
    EXPECT_EQ(single[3], 1.5f);
    EXPECT_TRUE(reader.IsDecimalPointSwapped());
    const std::vector<double> doubles = Points(reader);
    ASSERT_EQ(doubles.size(), 750u);
    EXPECT_EQ(doubles[4], 0.25);

    std::string junk;
    for (int i = 0; i < 201; ++i) junk += "?\n";
    ZonCloudReadCgoAscii unknown(Write("junk.cgo", junk));
    EXPECT_EQ(ErrorKey([&] { Points(unknown); }), "ZonCloudReadNLSTool.ERR_TooManyUnknownData");
}

TEST_F(Cgo, FactoryIsFoundByItsCatalogName)
{
    ZonUnicodeString name;
    ZonCloudFactoryCgoAscii().GetFormatName(name);
    EXPECT_EQ(name.ToUtf8(), "Cgo");
    EXPECT_NE(ZonCldImporter::GetFactory(name), nullptr);
}

TEST_F(Cgo, WriterBytesAndRoundTrip)
{
    const std::string path = (dir_ / "out.cgo").string();
    ZonCloudWriteCgoAscii writer(path);
    writer.BeginWritePoints(2);
    const double a[3] = {1.5, -2, 0.125};
    const float b[3] = {4, 5, 6};
    writer.WritePointDouble(a);
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.WritePoint(b); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();
    EXPECT_EQ(Read(path), "2\n1.500000 -2.000000 0.125000\n4.000000 5.000000 6.000000\n**end cloud**\n");
    ZonCloudReadCgoAscii reader(path);
    EXPECT_EQ(Points(reader), (std::vector<double>{1.5, -2, 0.125, 4, 5, 6}));
    EXPECT_EQ(reader.GetCapacity(), 2u);
}

TEST_F(Cgo, MultiPartFileGetsItsTotalOnThePlaceholderLine)
{
    const std::string path = (dir_ / "multi.cgo").string();
    ZonCloudWriteCgoAscii writer(path);
    ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
    const float p[3] = {1, 2, 3};
    for (const unsigned n : {3u, 2u}) {
        writer.BeginWritePoints(n);
        for (unsigned i = 0; i < n; ++i) writer.WritePoint(p);
        writer.EndWritePoints();
    }
    EXPECT_EQ(writer.EndMultiWrite(), ZON_S_OK);
    const std::string text = Read(path);
    EXPECT_EQ(text.substr(0, 13), "5           \n");
    EXPECT_EQ(text.substr(text.size() - 14), "**end cloud**\n");
    ZonCloudReadCgoAscii reader(path);
    EXPECT_EQ(reader.GetNumberOfPoints(), 5);
    EXPECT_EQ(reader.GetCapacity(), 5u);

    ZonCloudWriteCgoAscii nowhere((dir_ / "no" / "such" / "dir.cgo").string());
    EXPECT_EQ(nowhere.BeginMultiWrite(), ZON_E_FAIL);
}

TEST_F(Cgo, OutputDocumentOverwritesItsPlaceholderWithTheCount)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords({1, 2, 3, 4, 5, 6, 7, 8, 9});
    auto node = std::make_shared<ZonExchMemoryTessNode>(ZonExchNodeCloud);
    node->SetPosition({1, 0, 0, 0, 1, 0, 0, 0, 1}, {0, 0, 1});
    node->AddFace(face);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(node);
    auto document = std::make_shared<ZonExchMemoryDocument>();
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);

    const std::string path = (dir_ / "doc.cgo").string();
    ZonCldCgoOutputDocument output;
    output.SetFileName(path);
    output.SetOptions({"Scaling"}, {"0"});  // 0 leaves the coordinates as they are
    ASSERT_EQ(output.Open(), ZON_S_OK);
    ASSERT_EQ(output.Write(document), ZON_S_OK);
    ASSERT_EQ(output.Close(), ZON_S_OK);
    EXPECT_EQ(Read(path),
              "3           \n1.000000 2.000000 4.000000\n4.000000 5.000000 7.000000\n"
              "7.000000 8.000000 10.000000\n**end cloud**\n");
    ZonCloudReadCgoAscii reader(path);
    EXPECT_EQ(Points(reader), (std::vector<double>{1, 2, 4, 4, 5, 7, 7, 8, 10}));
    EXPECT_EQ(reader.GetCapacity(), 3u);

    ZonCldCgoOutputDocument nowhere;
    EXPECT_EQ(nowhere.Open(), ZON_E_FAIL);
    nowhere.SetFileName((dir_ / "no" / "dir.cgo").string());
    EXPECT_EQ(nowhere.Open(), ZON_E_FAIL);
}

}  // namespace
