// The format registry and the import entry: format order and look-ups, the
// choice of a format by extension, and the import of a file into a body with
// its settings, statistics and error reporting.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "MemoryReaders.h"
#include "ZonCldImportServices.h"
#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIReporter.h"

namespace {

// Test formats. Their registry names sort in another order than their format
// names, so the list order shows that formats are sorted by name.
MemoryContent Lattice()
{
    MemoryContent c;
    for (int x = 0; x <= 2; ++x)
        for (int y = 0; y <= 2; ++y)
            for (int z = 0; z <= 2; ++z) c.points.insert(c.points.end(), {float(x), float(y), float(z)});
    c.openFile = true;
    return c;
}

template <int Kind>
class TestFactory : public ZonCloudReadFileFactory {
public:
    TestFactory() : ZonCloudReadFileFactory(Describe()) {}
    static Description Describe();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override
    {
        MemoryContent content = Lattice();
        if (Kind == 3) content.failInPoints = true;
        if (Kind == 4) {
            content.type = 4;
            content.points.clear();
            content.meshes = {{{0, 0, 0, 1, 0, 0, 1, 1, 0}, {0, 1, 2}}};
        }
        auto reader = std::make_shared<MemoryReader>(fileName, content);
        // The mesh format applies its triangles setting to the reader, as a factory does.
        if (Kind == 4) reader->SetTriangles(ZonCldSettings::Instance().GetBool("TestMeshTriangles", true));
        return reader;
    }
};

// Kind: registry name, format name, filter, sampling, unit, options.
template <>
ZonCloudReadFileFactory::Description TestFactory<0>::Describe()
{
    return {"CloudFactoryTestA", "TestPoints", "*.tstpts;*.tstshared", true, false, false};
}
template <>
ZonCloudReadFileFactory::Description TestFactory<1>::Describe()
{
    return {"CloudFactoryTestB", "9TestLate", "*.tstlate", false, false, false};
}
template <>
ZonCloudReadFileFactory::Description TestFactory<2>::Describe()
{
    return {"CloudFactoryTestC", "TestAlpha RGB", "*.tstpts_rgb", false, true, true};
}
template <>
ZonCloudReadFileFactory::Description TestFactory<3>::Describe()
{
    return {"CloudFactoryTestD", "TestFailing", "*.tstfail", false, false, false};
}
template <>
ZonCloudReadFileFactory::Description TestFactory<4>::Describe()
{
    return {"CloudFactoryTestE", "TestMesh", "*.tstmesh;*.tstshared", false, false, true};
}
template <>
ZonCloudReadFileFactory::Description TestFactory<5>::Describe()
{
    return {"CloudFactoryTestF", "0TestEarly", "*.tstearly", false, false, false};
}

using TestPoints = TestFactory<0>;
using TestLate = TestFactory<1>;
using TestRgb = TestFactory<2>;
using TestFailing = TestFactory<3>;
using TestMesh = TestFactory<4>;
using TestEarly = TestFactory<5>;
ZON_REGISTER_CLOUD_FACTORY(TestPoints, "CloudFactoryTestA")
ZON_REGISTER_CLOUD_FACTORY(TestLate, "CloudFactoryTestB")
ZON_REGISTER_CLOUD_FACTORY(TestRgb, "CloudFactoryTestC")
ZON_REGISTER_CLOUD_FACTORY(TestFailing, "CloudFactoryTestD")
ZON_REGISTER_CLOUD_FACTORY(TestMesh, "CloudFactoryTestE")
ZON_REGISTER_CLOUD_FACTORY(TestEarly, "CloudFactoryTestF")

std::vector<std::string> FormatNames()
{
    ZonListValZonUnicodeString names;
    ZonListValZonString filters;
    ZonCldImporter::GetAvailableFormats(names, filters, true);
    EXPECT_EQ(names.size(), filters.size());
    std::vector<std::string> result;
    for (const auto& name : names) result.push_back(name.ToUtf8());
    return result;
}

bool StartsWithDigit(const std::string& s) { return !s.empty() && s[0] >= '0' && s[0] <= '9'; }

TEST(Registry, FormatsSortedByNameWithDigitNamesLast)
{
    const std::vector<std::string> all = FormatNames();
    std::vector<std::string> ours;
    std::copy_if(all.begin(), all.end(), std::back_inserter(ours),
                 [](const std::string& n) { return n.find("Test") != std::string::npos; });
    EXPECT_EQ(ours, (std::vector<std::string>{"TestAlpha RGB", "TestFailing", "TestMesh", "TestPoints", "0TestEarly",
                                              "9TestLate"}));
    // Whatever else is registered: names in order, and no name after a digit name begins with a letter.
    const auto firstDigit = std::find_if(all.begin(), all.end(), StartsWithDigit);
    EXPECT_TRUE(std::is_sorted(all.begin(), firstDigit));
    EXPECT_TRUE(std::is_sorted(firstDigit, all.end()));
    EXPECT_TRUE(std::all_of(firstDigit, all.end(), StartsWithDigit));
}

TEST(Registry, LookupsByName)
{
    EXPECT_TRUE(ZonCldImporter::IsFormatWithSampling("TestPoints"));
    EXPECT_FALSE(ZonCldImporter::IsFormatWithLengthUnit("TestPoints"));
    EXPECT_TRUE(ZonCldImporter::IsFormatWithLengthUnit("TestAlpha RGB"));
    EXPECT_TRUE(ZonCldImporter::IsFormatWithOptions("TestAlpha RGB"));
    const auto factory = ZonCldImporter::GetFactory("TestMesh");
    ASSERT_TRUE(factory);
    EXPECT_STREQ(factory->GetRegistryName(), "CloudFactoryTestE");

    ZonCldImporter importer("TestPoints");
    EXPECT_TRUE(importer.GetFactory());
    EXPECT_FALSE(importer.GetReader());
    const auto reader = importer.CreateReader("some.tstpts");
    ASSERT_TRUE(reader);
    EXPECT_EQ(importer.GetReader(), reader);
}

TEST(Registry, UnknownFormatNameGivesNothing)
{
    for (const char* name : {"NoSuchFormat", "", "testpoints"}) {
        SCOPED_TRACE(name);
        EXPECT_FALSE(ZonCldImporter::GetFactory(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithSampling(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithLengthUnit(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithOptions(name));
        ZonNotification* notification = reinterpret_cast<ZonNotification*>(0x1);
        EXPECT_EQ(ZonCldImporter::GetOptionsOfFormat(name, nullptr, notification), nullptr);
        EXPECT_EQ(notification, nullptr);
        ZonCldImporter importer(name);
        EXPECT_FALSE(importer.CreateReader("a.tstpts"));
    }
    ZonCldImporter::SetFormatForEdition("TestMesh");
    EXPECT_EQ(ZonCldImporter::GetFormatForEdition().ToUtf8(), "TestMesh");
}

TEST(Extension, LastDotLowerCased)
{
    const std::pair<const char*, const char*> cases[] = {
        {"a.TstPts", ".tstpts"}, {"/dir.with.dots/file", ""}, {"x.tar.GZ", ".gz"}, {"noext", ""},
        {"dir/.hidden", ".hidden"}, {"trailing.", "."},
    };
    for (const auto& [path, extension] : cases) EXPECT_EQ(ZonCldImportServices::ExtensionOf(path).ToUtf8(), extension) << path;
}

std::string KeyOf(const std::function<void()>& f)
{
    try {
        f();
    } catch (const ZonError& e) {
        return e.GetMessageKey();
    }
    return "none";
}

TEST(Extension, FirstFormatWhoseFilterHoldsItExactly)
{
    const std::pair<const char*, const char*> cases[] = {
        {"a.tstpts", "TestPoints"},        // not claimed by "*.tstpts_rgb", listed first
        {"A.TSTPTS", "TestPoints"},        // capitals
        {"b.tstpts_rgb", "TestAlpha RGB"},
        {"c.tstshared", "TestMesh"},       // claimed twice: the first in list order
        {"d.tstlate", "9TestLate"},
    };
    for (const auto& [file, format] : cases)
        EXPECT_EQ(ZonCldImportServices::FindFormatOfFile(file).ToUtf8(), format) << file;
    for (const char* file : {"e.tst", "f.pts", "g", "h.tstpts.bak", "i."})
        EXPECT_EQ(KeyOf([&] { ZonCldImportServices::FindFormatOfFile(file); }),
                  "ZonCloudReadNLSTool.ERR_UnknownExtension")
            << file;
}

// A fresh directory, settings at their defaults, and a collecting reporter.
class ImportEntry : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_import_XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        _dir = pattern;
        ZonCldSettings::Instance().ResetAll();
        ZonSession::OpenSession();
        ZonSession::GetPtrSession()->SetReporter(_reporter);
        ZonSession::GetPtrSession()->SetTerrainMode(false);
    }
    void TearDown() override
    {
        ZonCldSettings::Instance().ResetAll();
        ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonStderrReporter>());
        std::filesystem::remove_all(_dir);
    }
    std::string File(const std::string& name)
    {
        const std::string path = _dir + "/" + name;
        std::ofstream(path) << "content\n";
        return path;
    }

    struct Result {
        ZonCldBody_var body;
        ZonMathBox box;
        ZonMathTransformation inverse;
        std::vector<ZonString> messages;
    };
    Result Build(const std::string& path, const ZonMathBox& box = {},
                 const ZonMathTransformation& placement = ZonMathTransformation())
    {
        Result r;
        r.box = box;
        r.body = ZonCldImportServices::BuildCldBodyFromFile(_geometry, path, placement, r.inverse, r.box, r.messages);
        return r;
    }

    std::string _dir;
    ZonGeoFactoryProtected _geometry;
    std::shared_ptr<ZonCollectingReporter> _reporter = std::make_shared<ZonCollectingReporter>();
};

TEST_F(ImportEntry, BuildsTheBodyAndItsStatistics)
{
    const std::string path = File("lattice.TSTPTS");
    ZonCldSettings::Instance().SetImportSampling(50.0);
    const Result r = Build(path);
    ASSERT_TRUE(r.body);
    EXPECT_EQ(r.body->GetNumberOfPoints(), 14u);  // every other point of 27, the first kept
    EXPECT_TRUE(r.box.IsSameAs(r.body->GetBox()));
    ASSERT_EQ(r.messages.size(), 1u);
    const std::string& text = r.messages.back();
    EXPECT_EQ(text.rfind("Import statistics\nFile: " + path + "\nContent read\n  Format: TestPoints\n  Points: 27\n"
                         "Elements created\n  Points: 14\n",
                         0),
              0u)
        << text;
    EXPECT_NE(text.find("\nSampling (50)\n"), std::string::npos) << text;
}

TEST_F(ImportEntry, SettingsGiveScaleUnitAndPrecision)
{
    auto& settings = ZonCldSettings::Instance();
    settings.SetImportScaleFactor(2.0);
    settings.SetImportFileUnit("Inch");
    const Result r = Build(File("a.tstpts"));
    EXPECT_EQ(r.body->GetUnitName(), "Inch");
    EXPECT_EQ(r.box.GetLow(), ZonMathPoint(0, 0, 0));
    EXPECT_FLOAT_EQ(r.box.GetHigh()[0], 101.6f);  // 2 inches, doubled
    EXPECT_FLOAT_EQ(r.box.GetHigh()[2], 101.6f);
    settings.SetImportSampling(12.5);
    EXPECT_NE(Build(File("b.tstpts")).messages.back().find("Sampling (12.5)"), std::string::npos);
}

TEST_F(ImportEntry, ImportBoxClipsAndNothingInsideIsNoPointFound)
{
    Result r = Build(File("a.tstpts"), ZonMathBox(0, 1, 0, 1, 0, 2));
    EXPECT_EQ(r.body->GetNumberOfPoints(), 3u);  // z = 0, 1, 2 at x = y = 0; z closed on the file's high
    EXPECT_TRUE(r.box.IsSameAs(ZonMathBox(0, 0, 0, 0, 0, 2)));
    EXPECT_EQ(KeyOf([&] { Build(File("b.tstpts"), ZonMathBox(5, 6, 5, 6, 5, 6)); }),
              "ZonCloudReadNLSTool.ERR_NoPointFound");
}

TEST_F(ImportEntry, PlacementAndItsInverse)
{
    const ZonMathTransformation placement({0, -1, 0, 1, 0, 0, 0, 0, 1}, {10, 0, 0});
    const Result r = Build(File("a.tstpts"), {}, placement);
    EXPECT_EQ(r.body->GetPlacement(), placement);
    EXPECT_TRUE((r.inverse * placement).IsIdentity());
    EXPECT_TRUE(Build(File("b.tstpts")).inverse.IsIdentity());
    EXPECT_EQ(KeyOf([&] { Build(File("c.tstpts"), {}, ZonMathTransformation({0, 0, 0, 0, 1, 0, 0, 0, 1}, {0, 0, 0})); }),
              "ZonMathTransformation.ERR_NotInvertible");
}

TEST_F(ImportEntry, TrianglesFollowTheFormatsOption)
{
    EXPECT_EQ(Build(File("a.tstmesh")).body->GetNumberOfTriangles(), 1u);
    ZonCldSettings::Instance().SetBool("TestMeshTriangles", false);
    const Result r = Build(File("b.tstmesh"));
    EXPECT_EQ(r.body->GetNumberOfTriangles(), 0u);
    EXPECT_EQ(r.body->GetNumberOfPoints(), 3u);
}

TEST_F(ImportEntry, RoutesWithoutAReaderAndUnknownExtensions)
{
    const std::pair<const char*, const char*> cases[] = {
        {"a.obj", "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"b.KOVO", "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"c.mrp", "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {"d.unknownext", "ZonCloudReadNLSTool.ERR_UnknownExtension"},
        {"noextension", "ZonCloudReadNLSTool.ERR_UnknownExtension"},
    };
    for (const auto& [name, key] : cases) EXPECT_EQ(KeyOf([&] { Build(File(name)); }), key) << name;
    ZonCldSettings::Instance().SetImportSampling(150.0);
    EXPECT_EQ(KeyOf([&] { Build(File("e.tstpts")); }), "ZonCloudReadNLSTool.ERR_InvalidPercentValue");
}

TEST_F(ImportEntry, WithAFormatNamedByTheCaller)
{
    ZonMathTransformation inverse;
    ZonMathBox box;
    std::vector<ZonString> messages;
    const auto body = ZonCldImportServices::BuildCldBodyWithFormat(_geometry, "TestMesh", File("a.unknownext"),
                                                                   ZonMathTransformation(), inverse, box, messages);
    EXPECT_EQ(body->GetTypeOfDigitization(), 4);
    EXPECT_EQ(KeyOf([&] {
                  ZonCldImportServices::BuildCldBodyWithFormat(_geometry, "NoSuchFormat", File("b.tstpts"),
                                                               ZonMathTransformation(), inverse, box, messages);
              }),
              "ZonCloudReadNLSTool.ERR_Failure");
}

TEST_F(ImportEntry, ListVariantReportsOneErrorAndAppendsNothing)
{
    struct Case {
        std::string file;
        std::string key;
    };
    const Case cases[] = {
        {File("a.tstfail"), "ZonCloudReadNLSTool.ERR_UnknownData"},  // raised during the walk
        {_dir + "/missing.tstpts", "ZonCloudOperErrorTool.ERR_ENOENT"},
        {File("b.unknownext"), "ZonCloudReadNLSTool.ERR_UnknownExtension"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.file);
        _reporter->Clear();
        std::vector<ZonCldBody_var> bodies;
        ZonString statistics = "old";
        ZonMathBox box(0, 1, 0, 1, 0, 1);
        ZonMathTransformation inverse;
        ZonCldImportServices::BuildCldBodyListFromFile(_geometry, c.file, ZonMathTransformation(), inverse, box,
                                                       bodies, statistics);
        EXPECT_TRUE(bodies.empty());
        EXPECT_TRUE(statistics.empty());
        EXPECT_TRUE(box.IsEmpty());
        const auto entries = _reporter->Entries();
        ASSERT_EQ(entries.size(), 1u);
        EXPECT_EQ(entries[0].key, c.key);
        EXPECT_FALSE(entries[0].message.empty());
    }
}

TEST_F(ImportEntry, ListVariantAppendsTheBodyWithItsStatistics)
{
    std::vector<ZonCldBody_var> bodies;
    ZonString statistics;
    ZonMathBox box(5, 6, 5, 6, 5, 6);  // the list variant imports everything
    ZonMathTransformation inverse;
    ZonCldImportServices::BuildCldBodyListFromFile(_geometry, File("a.tstpts"), ZonMathTransformation(), inverse, box,
                                                   bodies, statistics);
    ASSERT_EQ(bodies.size(), 1u);
    EXPECT_EQ(bodies[0]->GetNumberOfPoints(), 27u);
    EXPECT_TRUE(box.IsSameAs(ZonMathBox(0, 2, 0, 2, 0, 2)));
    EXPECT_EQ(statistics.rfind("Import statistics\n", 0), 0u);
    EXPECT_TRUE(_reporter->Entries().empty());
}

TEST_F(ImportEntry, TerrainModeChangesTheStatisticsPrefix)
{
    ZonSession::GetPtrSession()->SetTerrainMode(true);
    const std::string text = Build(File("a.tstpts")).messages.back();
    EXPECT_EQ(text.rfind("Terrain import statistics\n", 0), 0u) << text;
    EXPECT_EQ(ZonCldImportServices::GetNLSStatFromKey("Triangles"), "Triangles");
    EXPECT_EQ(ZonCldImportServices::GetNLSStatFromKey("NoSuchKey"), "");
}

}  // namespace
