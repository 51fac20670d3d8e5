// Cgo files: the count and end lines, sampling, the re-read in the other
// precision, and the writers' bytes with their round trip.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ZonCldCgoOutputDocument.h"
#include "ZonCldImporter.h"
#include "ZonCloudReadCgoAscii.h"
#include "ZonCloudWriteCgoAscii.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchTessRep.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;
using zontest::PointsOf;
using zontest::Slurp;
using Doubles = std::vector<double>;
using Floats = std::vector<float>;

class Cgo : public zontest::FilesTest {};

TEST_F(Cgo, CountLinePresizesAndEndLineStops)
{
    ZonCloudReadCgoAscii reader(Write("p.cgo", "3\n1 2 3 4\n4 5 6\n7 8 9\n**end cloud**\n10 11 12\n"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1, 2, 3, 4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(reader.GetNumberOfPoints(), 3);
    EXPECT_EQ(reader.GetCapacity(), 3u);
    EXPECT_EQ(reader.GetDataStartOffset(), 2);
    ZonMathBox box;
    reader.GetBoundingBox(box);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(1, 7, 2, 8, 3, 9)));

    // Any line that is no point may stand first; a file without points is an error.
    ZonCloudReadCgoAscii titled(Write("t.cgo", "cloud from the scanner\n1 2 3\n"));
    EXPECT_EQ(PointsOf(titled), (Doubles{1, 2, 3}));
    ZonCloudReadCgoAscii empty(Write("e.cgo", "0\n**end cloud**\n"));
    EXPECT_EQ(ErrorKey([&] { PointsOf(empty); }), "ZonCloudReadNLSTool.ERR_NoPointFound");
    EXPECT_NE(ZonCldImporter::GetFactory("Cgo"), nullptr);
}

TEST_F(Cgo, HalfOfTenLinesIsFiveInBothPrecisions)
{
    std::string data = "10\n";
    for (int i = 0; i < 10; ++i) data += std::to_string(i) + ".3 1 2\nnot a point\n";
    ZonCloudReadCgoAscii reader(Write("p.cgo", data + "**end cloud**\n99 99 99\n"));
    reader.SetSamplingPercent(50.0f);
    reader.SetDoublePrecision(true);
    EXPECT_EQ(PointsOf(reader), (Doubles{0.3, 1, 2, 2.3, 1, 2, 4.3, 1, 2, 6.3, 1, 2, 8.3, 1, 2}));
    // The single-precision points are read again from the first point line.
    EXPECT_EQ(PointsOf<float>(reader), (Floats{0.3f, 1, 2, 2.3f, 1, 2, 4.3f, 1, 2, 6.3f, 1, 2, 8.3f, 1, 2}));
}

TEST_F(Cgo, DecimalCommaFileIsReadAgainWithTheComma)
{
    std::string data;
    for (int i = 0; i < 250; ++i) data += std::to_string(i) + ",5 0,25 1\n";
    ZonCloudReadCgoAscii reader(Write("p.cgo", data));
    const Floats single = PointsOf<float>(reader);
    ASSERT_EQ(single.size(), 750u);
    EXPECT_EQ(single[3], 1.5f);
    EXPECT_TRUE(reader.IsDecimalPointSwapped());
    const Doubles doubles = PointsOf(reader);  // the re-read keeps the comma
    ASSERT_EQ(doubles.size(), 750u);
    EXPECT_EQ(doubles[4], 0.25);
}

TEST_F(Cgo, WriterBytesMultiPartTotalAndRoundTrip)
{
    ZonCloudWriteCgoAscii writer(Path("out.cgo"));
    writer.BeginWritePoints(2);
    const double a[3] = {1.5, -2, 0.125};
    const float b[3] = {4, 5, 6};
    writer.WritePointDouble(a);
    writer.WritePoint(b);
    EXPECT_EQ(ErrorKey([&] { writer.WritePoint(b); }), "ZonCloudReadNLSTool.ERR_Failure");
    writer.EndWritePoints();
    EXPECT_EQ(Slurp(Path("out.cgo")), "2\n1.500000 -2.000000 0.125000\n4.000000 5.000000 6.000000\n**end cloud**\n");
    ZonCloudReadCgoAscii reader(Path("out.cgo"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1.5, -2, 0.125, 4, 5, 6}));
    EXPECT_EQ(reader.GetCapacity(), 2u);

    // Several parts: the total goes over the placeholder line.
    ASSERT_EQ(writer.BeginMultiWrite(), ZON_S_OK);
    for (const unsigned n : {3u, 2u}) {
        writer.BeginWritePoints(n);
        for (unsigned i = 0; i < n; ++i) writer.WritePoint(b);
        writer.EndWritePoints();
    }
    EXPECT_EQ(writer.EndMultiWrite(), ZON_S_OK);
    const std::string text = Slurp(Path("out.cgo"));
    EXPECT_EQ(text.substr(0, 13), "5           \n");
    EXPECT_EQ(text.substr(text.size() - 14), "**end cloud**\n");
    ZonCloudReadCgoAscii multi(Path("out.cgo"));
    EXPECT_EQ(multi.GetNumberOfPoints(), 5);
    EXPECT_EQ(multi.GetCapacity(), 5u);
    EXPECT_EQ(ZonCloudWriteCgoAscii(Path("no/such/dir.cgo")).BeginMultiWrite(), ZON_E_FAIL);
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

    ZonCldCgoOutputDocument output;
    EXPECT_EQ(output.Open(), ZON_E_FAIL);  // no file name yet
    output.SetFileName(Path("doc.cgo"));
    output.SetOptions({"Scaling"}, {"0"});  // 0 leaves the coordinates as they are
    ASSERT_EQ(output.Open(), ZON_S_OK);
    ASSERT_EQ(output.Write(document), ZON_S_OK);
    ASSERT_EQ(output.Close(), ZON_S_OK);
    EXPECT_EQ(Slurp(Path("doc.cgo")),
              "3           \n1.000000 2.000000 4.000000\n4.000000 5.000000 7.000000\n"
              "7.000000 8.000000 10.000000\n**end cloud**\n");
    ZonCloudReadCgoAscii reader(Path("doc.cgo"));
    EXPECT_EQ(PointsOf(reader), (Doubles{1, 2, 4, 4, 5, 7, 7, 8, 10}));
    EXPECT_EQ(reader.GetCapacity(), 3u);
}

}  // namespace
