// The reader base: sampling rule, box clipping and its caches, protocol defaults.
#include <gtest/gtest.h>

#include <limits>
#include <vector>

#include "ZonCloudReadFile.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"
#include "ZonTieCloudReadFile.h"
#include "MemoryReaders.h"

namespace {

// Points on the integer lattice 0..2 on each axis: the box is [0,2]^3.
std::vector<float> Lattice()
{
    std::vector<float> p;
    for (int x = 0; x <= 2; ++x)
        for (int y = 0; y <= 2; ++y)
            for (int z = 0; z <= 2; ++z) p.insert(p.end(), {float(x), float(y), float(z)});
    return p;
}

// The lattice as a cloud (1), as one scan (2) or as one grid (3) that starts with
// an empty row and has every third point a hole.
std::shared_ptr<MemoryReader> LatticeReader(int type)
{
    MemoryContent content;
    content.type = type;
    content.hasDouble = true;
    if (type == 1) content.points = Lattice();
    if (type == 2) content.sets = {{Lattice()}};
    if (type == 3) {
        MemoryContent::Row empty, full{Lattice(), std::vector<unsigned char>(27, 1)};
        empty.points.reserve(3);  // an empty row that is not the end: a non-null array of no point
        for (std::size_t i = 2; i < 27; i += 3) full.valid[i] = 0;
        content.grids.push_back({});
        content.grids[0].push_back(std::move(empty));
        content.grids[0].push_back(std::move(full));
    }
    return std::make_shared<MemoryReader>("memory", std::move(content));
}

std::string KeyOf(const std::function<void()>& f)
{
    try {
        f();
    } catch (const ZonError& e) {
        return e.GetMessageKey() + "/" + std::to_string(e.GetSeverity());
    }
    return "none";
}

std::vector<bool> Sample(float percent, int n)
{
    ZonCloudSampler sampler(percent);
    sampler.Restart();
    std::vector<bool> kept;
    for (int i = 0; i < n; ++i) kept.push_back(sampler.Keep());
    return kept;
}

TEST(Sampling, KeepsByWholePartOfIndexTimesRate)
{
    EXPECT_EQ(Sample(100.0f, 5), std::vector<bool>({true, true, true, true, true}));
    EXPECT_EQ(Sample(50.0f, 6), std::vector<bool>({true, false, true, false, true, false}));
    EXPECT_EQ(Sample(0.0f, 4), std::vector<bool>({true, false, false, false}));
    // 30 %: whole parts 0,0,0,0(.9),1,1,1,2 -> kept at 0, 4, 7.
    EXPECT_EQ(Sample(30.0f, 8), std::vector<bool>({true, false, false, false, true, false, false, true}));
    ZonCloudSampler sampler(50.0f);
    EXPECT_EQ(sampler.CountKept(10), 5u);
    EXPECT_EQ(sampler.CountKept(11), 6u);
    // 100 % keeps every point, also past the runs a float index can count exactly.
    EXPECT_EQ(ZonCloudSampler(100.0f).CountKept((1u << 24) + 10), (1u << 24) + 10);
}

// The readers that take k * r in double keep other points than the float
// rule for some k and r: at 70 %, 10 * 0.7f is 7 in float but 6.99999988 in double.
TEST(Sampling, InDoubleTakesTheProductInDouble)
{
    ZonCloudSampler inFloat(70.0f);
    ZonCloudSampler inDouble = ZonCloudSampler::InDouble(70.0f);
    inFloat.Restart();
    inDouble.Restart();
    std::uint64_t keptInDouble = 0;
    for (int k = 0; k < 11; ++k) {
        const bool f = inFloat.Keep(), d = inDouble.Keep();
        keptInDouble += d ? 1 : 0;
        if (k == 10) {
            EXPECT_TRUE(f);
            EXPECT_FALSE(d);
        } else {
            EXPECT_EQ(f, d) << k;
        }
    }
    EXPECT_EQ(ZonCloudSampler::InDouble(70.0f).CountKept(11), keptInDouble);
}

TEST(Sampling, RestartKeepsTheFirstPointOfEachRun)
{
    ZonCloudSampler sampler(50.0f);
    sampler.Restart();
    EXPECT_TRUE(sampler.Keep());
    EXPECT_FALSE(sampler.Keep());
    sampler.Restart();
    EXPECT_TRUE(sampler.Keep());
}

TEST(ReaderBase, SamplingPercentRangeAndCacheSurvival)
{
    const auto reader = LatticeReader(1);
    EXPECT_EQ(KeyOf([&] { reader->SetSamplingPercent(-0.001f); }), "ZonCloudReadNLSTool.ERR_InvalidPercentValue/1");
    EXPECT_EQ(KeyOf([&] { reader->SetSamplingPercent(100.001f); }), "ZonCloudReadNLSTool.ERR_InvalidPercentValue/1");
    EXPECT_EQ(KeyOf([&] { reader->SetSamplingPercent(std::numeric_limits<float>::quiet_NaN()); }),
              "ZonCloudReadNLSTool.ERR_InvalidPercentValue/1");
    EXPECT_EQ(KeyOf([&] { reader->SetSamplingPercent(0.0f); }), "none");
    EXPECT_EQ(KeyOf([&] { reader->SetSamplingPercent(100.0f); }), "none");

    const ZonMathBox box(0, 1, 0, 1, 0, 1);
    unsigned n = 0;
    const float* first = reader->GetPointsInBox(box, n);
    reader->SetSamplingPercent(100.0f);  // same value: the cache survives
    unsigned m = 0;
    EXPECT_EQ(reader->GetPointsInBox(box, m), first);
    EXPECT_EQ(m, n);
    reader->SetSamplingPercent(50.0f);  // a new value clears it
    const float* again = reader->GetPointsInBox(box, m);
    EXPECT_EQ(m, n);
    EXPECT_NE(again, nullptr);
}

TEST(ReaderBase, BoxQueryWithTheFileBoxReturnsTheReadersOwnArray)
{
    const auto reader = LatticeReader(1);
    unsigned all = 0, n = 0;
    const float* points = reader->GetPoints(all);
    EXPECT_EQ(reader->GetPointsInBox(ZonMathBox(0, 2, 0, 2, 0, 2), n), points);
    EXPECT_EQ(n, 27u);
}

TEST(ReaderBase, BoxFacesAreHalfOpenExceptOnTheFilesHighFaces)
{
    struct Case {
        ZonMathBox box;
        unsigned expected;
    };
    const Case cases[] = {
        {ZonMathBox(0, 1, 0, 1, 0, 1), 1},      // only (0,0,0): highs at 1 are open
        {ZonMathBox(0, 2, 0, 1, 0, 1), 3},      // x high equals the file's: x = 2 kept
        {ZonMathBox(0, 1.9, 0, 2, 0, 2), 18},   // y and z closed, x = 2 excluded
        {ZonMathBox(-1, 2.5, -1, 2.5, -1, 2.5), 27},
        {ZonMathBox(5, 6, 5, 6, 5, 6), 0},      // does not touch the file's box
        {ZonMathBox(1, 1.5, 1, 1.5, 1, 1.5), 1},
    };
    for (const Case& c : cases) {
        const auto reader = LatticeReader(1);
        unsigned n = 99;
        reader->GetPointsInBox(c.box, n);
        EXPECT_EQ(n, c.expected);
        unsigned nd = 99;
        reader->GetPointsInBoxDouble(c.box, nd);
        EXPECT_EQ(nd, c.expected);
    }
}

TEST(ReaderBase, BoxCacheIsReusedForTheSameBoxAndDroppedForAnother)
{
    const auto reader = LatticeReader(1);
    const ZonMathBox a(0, 1, 0, 2, 0, 2), b(1, 2, 0, 2, 0, 2);
    unsigned n1 = 0, n2 = 0, n3 = 0;
    const float* r1 = reader->GetPointsInBox(a, n1);
    const float* r2 = reader->GetPointsInBox(a, n2);
    EXPECT_EQ(r1, r2);
    EXPECT_EQ(n1, n2);
    EXPECT_EQ(n1, 9u);
    reader->GetPointsInBox(b, n3);
    EXPECT_EQ(n3, 18u);
    for (unsigned i = 0; i < n3; ++i) EXPECT_GE(reader->GetPointsInBox(b, n3)[3 * i], 1.0f);
    // The precisions share the cached box: each answers for the box it was asked.
    reader->GetPointsInBox(a, n1);
    const double* d = reader->GetPointsInBoxDouble(b, n3);
    ASSERT_EQ(n3, 18u);
    for (unsigned i = 0; i < n3; ++i) EXPECT_GE(d[3 * i], 1.0);
    const float* f = reader->GetPointsInBox(b, n2);
    ASSERT_EQ(n2, 18u);
    for (unsigned i = 0; i < n2; ++i) EXPECT_GE(f[3 * i], 1.0f);
    const auto other = LatticeReader(1);
    other->GetPointsInBox(a, n1);
    EXPECT_EQ(other->GetPointsInBoxDouble(ZonMathBox(5, 6, 5, 6, 5, 6), n3), nullptr);
    EXPECT_EQ(n3, 0u);
}

TEST(ReaderBase, ScanBoxQuery)
{
    // Readers offering an interface are used through it or through the base.
    const auto cloudReader = LatticeReader(1);
    ZonCloudReadFile& cloud = *cloudReader;
    unsigned n = 0;
    EXPECT_EQ(KeyOf([&] { cloud.GetScanPointsInBox(ZonMathBox(0, 1, 0, 1, 0, 1), n); }),
              "ZonCloudReadNLSTool.ERR_NotAScanDigit/1");
    // The base's scan protocol does nothing on a cloud reader->
    EXPECT_EQ(KeyOf([&] { cloud.BeginGetSetOfScans(); }), "none");
    EXPECT_FALSE(cloud.NextSetOfScans());

    const auto scanReader = LatticeReader(2);
    ZonCloudReadFile& scans = *scanReader;
    scans.BeginGetSetOfScans();
    ASSERT_TRUE(scans.NextSetOfScans());
    scans.BeginGetScan();
    ASSERT_TRUE(scans.NextScan());
    EXPECT_EQ(scans.GetScanPointsInBox(ZonMathBox(5, 6, 5, 6, 5, 6), n), nullptr);
    EXPECT_EQ(n, 0u);
    const float* kept = scans.GetScanPointsInBox(ZonMathBox(0, 2, 0, 2, 0, 0.5), n);
    ASSERT_NE(kept, nullptr);
    EXPECT_EQ(n, 9u);
    const double* keptDouble = scans.GetScanPointsInBoxDouble(ZonMathBox(0, 2, 0, 2, 0, 0.5), n);
    ASSERT_NE(keptDouble, nullptr);
    EXPECT_EQ(n, 9u);
}

TEST(ReaderBase, GridBoxQuerySkipsEmptyRowsAndOnlyChangesValidity)
{
    const auto gridReader = LatticeReader(3);
    ZonCloudReadFile& grid = *gridReader;
    grid.BeginGetGrid();
    ASSERT_TRUE(grid.NextGrid());
    grid.BeginGetGridPoints();
    unsigned n = 0;
    const unsigned char* valid = nullptr;
    const float* points = grid.GetGridPointsInBox(ZonMathBox(0, 0.5, 0, 2, 0, 2), n, valid);
    ASSERT_NE(points, nullptr);
    ASSERT_EQ(n, 27u);
    for (unsigned i = 0; i < n; ++i) {
        const bool inBox = points[3 * i] < 0.5f;
        const bool wasValid = i % 3 != 2;
        EXPECT_EQ(valid[i], inBox && wasValid ? 1 : 0) << i;
    }
    EXPECT_EQ(grid.GetGridPointsInBox(ZonMathBox(0, 1, 0, 1, 0, 1), n, valid), nullptr);
    EXPECT_EQ(n, 0u);
    EXPECT_EQ(valid, nullptr);

    const auto cloudReader = LatticeReader(1);
    ZonCloudReadFile& cloud = *cloudReader;
    EXPECT_EQ(KeyOf([&] { cloud.GetGridPointsInBox(ZonMathBox(0, 1, 0, 1, 0, 1), n, valid); }),
              "ZonCloudReadNLSTool.ERR_NotAGridDigit/1");
}

TEST(ReaderBase, InterfacesAreOfferedOnlyByReadersThatDeriveFromThem)
{
    class CloudOnly : public ZonCloudReadFile {
    public:
        CloudOnly() : ZonCloudReadFile("x") {}
        const float* GetPoints(unsigned& count) override
        {
            count = 0;
            return nullptr;
        }

    protected:
        void AnalyseFile() override {}
    };
    ZonICloudReadFile_var cloud = std::make_shared<CloudOnly>();
    EXPECT_EQ(ZonQueryInterface<ZonICloudReadScanFile>(cloud), nullptr);
    ZonICloudReadFile_var scans = LatticeReader(2);
    auto scanInterface = ZonQueryInterface<ZonICloudReadScanFile>(scans);
    ASSERT_NE(scanInterface, nullptr);
    scanInterface->BeginGetSetOfScans();
    ASSERT_TRUE(scanInterface->NextSetOfScans());
    scanInterface->BeginGetScan();
    EXPECT_TRUE(scanInterface->NextScan());
    EXPECT_FALSE(scanInterface->NextScan());
    EXPECT_FALSE(scanInterface->NextSetOfScans());
    EXPECT_EQ(cloud->GetLengthUnit(), nullptr);
    EXPECT_FALSE(cloud->HasDoublePrecision());
    unsigned n = 7;
    EXPECT_EQ(cloud->GetPointColors(n), nullptr);
    EXPECT_EQ(n, 0u);
}

TEST(ReaderBase, OpeningAMissingFileRaisesTheSystemMessage)
{
    class FileReader : public ZonCloudReadFile {
    public:
        using ZonCloudReadFile::ZonCloudReadFile;
        const float* GetPoints(unsigned& count) override
        {
            Analyse();
            count = 0;
            return nullptr;
        }

    protected:
        void AnalyseFile() override { Source(); }
    };
    FileReader missing("/nonexistent/dir/file.asc");
    try {
        missing.GetNumberOfPoints();
        FAIL();
    } catch (const ZonError& e) {
        EXPECT_EQ(e.GetCatalogName(), "ZonCldResOperError");
        EXPECT_EQ(e.GetMessageKey(), "ZonCloudOperErrorTool.ERR_ENOENT");
        EXPECT_EQ(e.GetSeverity(), 4);
        EXPECT_NE(e.GetNLSMessage().find("No such file"), std::string::npos);
    }
    FileReader directory("/tmp");
    EXPECT_EQ(KeyOf([&] { directory.GetNumberOfPoints(); }), "ZonCloudOperErrorTool.ERR_EISDIR/4");
}

}  // namespace
