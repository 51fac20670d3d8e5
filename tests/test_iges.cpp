// The IGES point reader: which lines begin entities, the copious-data forms,
// lines cut at 511 characters, clouds against scans, sampling per run.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonCloudFactoryIges.h"
#include "ZonCloudReadIges.h"
#include "ZonCloudSampler.h"
#include "ZonTestFiles.h"

namespace {

using Floats = std::vector<float>;
using zontest::ErrorKey;

// A reader over text kept alive beside it.
struct Iges {
    explicit Iges(std::string bytes) : text(std::move(bytes)) { reader.SetSourceMemory(text.data(), text.size()); }
    Floats Cloud()
    {
        unsigned n = 0;
        const float* p = reader.GetPoints(n);
        return Floats(p, p + 3 * n);
    }
    std::vector<Floats> Scans()
    {
        std::vector<Floats> scans;
        reader.BeginGetSetOfScans();
        EXPECT_TRUE(reader.NextSetOfScans());
        reader.BeginGetScan();
        while (reader.NextScan()) {
            unsigned n = 0;
            const float* p = reader.GetScanPoints(n);
            scans.emplace_back(p, p + 3 * n);
        }
        return scans;
    }
    std::string text;
    ZonCloudReadIges reader{ZonUnicodeString("memory.igs")};
};

// A parameter-data line as CAD systems write it: 64 columns of data, the
// entity's directory pointer, "P" and the sequence number.
std::string Card(const std::string& data, int directory, int sequence)
{
    char tail[20];
    std::snprintf(tail, sizeof tail, "%8dP%7d\n", directory, sequence);
    return data + std::string(64 - data.size(), ' ') + tail;
}

struct Case {
    const char* name;
    std::string text;
    int type;
    std::vector<Floats> scans;  // a cloud: its points as one scan
};

TEST(IgesReader, ReadsPointAndCopiousEntities)
{
    const std::string longLine = [] {
        std::string line = "106,2,2,1.,2.,3.,";
        line.resize(511, ' ');
        return line + "116,4.,5.,6.;\n";
    }();
    const Case cases[] = {
        {"point entities", "116,1.,2.,3.,0;\n116,4,5,6;\n", 1, {{1, 2, 3, 4, 5, 6}}},
        {"cards with sequence numbers and exponents",
         "                                                                        S      1\n" +
             Card("116,1.0E+01,2.5E0,-3.0,0;", 1, 1) + Card("106,2,3,1.,2.,3.,4.,5.,6.,", 3, 2) +
             Card("7.5E-1,8.,9.;", 3, 3) + "S      1G      1D      4P      3" + std::string(40, ' ') + "T      1\n",
         2,
         {{10, 2.5f, -3, 1, 2, 3, 4, 5, 6, 0.75f, 8, 9}}},
        {"a continuation line beginning with a coordinate and ending the entity",
         "106,2,2,1.,2.,3.,\n106.25,5.,6.;\n", 2, {{1, 2, 3, 106.25f, 5, 6}}},
        {"form 1: a common z", "106,1,2,5.,1.,2.,3.,4.;\n", 2, {{1, 2, 5, 3, 4, 5}}},
        {"form 3: vectors dropped", "106,3,2,1,2,3,9,9,9,4,5,6,9,9,9;\n", 2, {{1, 2, 3, 4, 5, 6}}},
        {"other forms skipped", "106,4,1,7,8,9;\n116,1,2,3;\n", 1, {{1, 2, 3}}},
        {"the count ends an entity without ';'", "106,2,1,1,2,3,4,5,6\n116,7,8,9;\n", 2, {{1, 2, 3}, {7, 8, 9}}},
        {"isolated points join the next scan", "116,1,1,1;\n106,2,1,2,2,2;\n116,3,3,3;\n106,2,1,4,4,4;\n", 2,
         {{1, 1, 1, 2, 2, 2}, {3, 3, 3, 4, 4, 4}}},
        {"other entities and trailing commas ignored", "110,1,2,3,4,5,6;\n106,2,1,\n1,\n2,3;\n", 2, {{1, 2, 3}}},
        {"the tail of a line past 511 characters is a line", longLine, 2, {{1, 2, 3}, {4, 5, 6}}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Iges file(c.text);
        ASSERT_EQ(file.reader.GetTypeOfDigitization(), c.type);
        Floats all;
        for (const Floats& scan : c.scans) all.insert(all.end(), scan.begin(), scan.end());
        EXPECT_EQ(file.Cloud(), all);
        if (c.type == DigitizationScans) {
            EXPECT_EQ(file.Scans(), c.scans);
        }
        EXPECT_EQ(file.reader.GetNumberOfScans(), c.scans.size());
    }
}

TEST(IgesReader, FileOfPointsGivesOneScanThenRefuses)
{
    Iges file("116,1,2,3;\n116,4,5,6;\n");
    file.reader.BeginGetSetOfScans();
    ASSERT_TRUE(file.reader.NextSetOfScans());
    EXPECT_EQ(ErrorKey([&] { file.reader.NextScan(); }), "ZonCloudReadNLSTool.ERR_BeginGetScanNotDone");
    file.reader.BeginGetScan();
    ASSERT_TRUE(file.reader.NextScan());
    unsigned n = 0;
    file.reader.GetScanPoints(n);
    EXPECT_EQ(n, 2u);
    EXPECT_EQ(ErrorKey([&] { file.reader.NextScan(); }), "ZonCloudReadNLSTool.ERR_NotAScanDigit");
}

TEST(IgesReader, SamplesEachRunFromItsFirstPoint)
{
    // Ten isolated points, then a copious entity of ten points.
    std::string text;
    for (int i = 0; i < 10; ++i) text += "116," + std::to_string(i) + ",0,0;\n";
    text += "106,2,10";
    for (int i = 0; i < 10; ++i) text += "," + std::to_string(100 + i) + ",0,0";
    text += ";\n";
    Iges file(text);
    file.reader.SetSamplingPercent(30.0f);
    const Floats cloud = file.Cloud();
    const std::uint64_t perRun = ZonCloudSampler(30.0f).CountKept(10);
    ASSERT_EQ(cloud.size(), 3 * 2 * perRun);
    EXPECT_EQ(cloud[0], 0.0f);
    EXPECT_EQ(cloud[3 * perRun], 100.0f);
    EXPECT_EQ(file.reader.GetNumberOfPoints(), 20);
    // Back to every point: the file is not read again.
    file.reader.SetSamplingPercent(100.0f);
    EXPECT_EQ(file.Cloud().size(), 60u);
}

TEST(IgesReader, NoPointIsAnError)
{
    for (const char* text : {"", "S      1\n", "106,4,1,1,2,3;\n", "116,1,2;\n", "1,2,3;\n"}) {
        Iges file(text);
        EXPECT_EQ(ErrorKey([&] { file.reader.GetTypeOfDigitization(); }), "ZonCloudReadNLSTool.ERR_NoPointFound")
            << text;
    }
}

class IgesFiles : public zontest::FilesTest {};

TEST_F(IgesFiles, FactoryStoresTheDirectionAndTheToolReadsTheFile)
{
    const std::string path = Write("points.igs", "116,1,2,3;\n106,2,1,4,5,6;\n");
    auto& settings = ZonCldSettings::Instance();
    settings.ResetAll();
    settings.SetInt("OptionScanDirectionIges", 2);
    auto reader = ZonCloudFactoryIges().CreateReader(ZonUnicodeString(path));
    settings.ResetAll();
    int direction = 0;
    ZonQueryInterface<ZonICloudReadOptDirection>(reader)->GetScanDirection(direction);
    EXPECT_EQ(direction, 2);

    const zontest::ToolRun run = Run("dump " + zontest::Quote(path));
    ASSERT_EQ(run.status, 0) << run.err;
    EXPECT_NE(run.out.find("\"sets\":[[[[1.0,2.0,3.0],[4.0,5.0,6.0]]]]"), std::string::npos) << run.out;
}

}  // namespace
