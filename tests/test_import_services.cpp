// The format registry and the import entry: format order and look-ups, the
// choice of a format by extension, and the import of a file into a body with
// its settings, statistics and error reporting.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>

#include "MemoryReaders.h"
#include "ZonCldImportServices.h"
#include "ZonCldImporter.h"
#include "ZonCldSettings.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIReporter.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;

// Test formats. Their registry names sort in another order than their format
// names, so the list order shows that formats are sorted by name.
const ZonCloudReadFileFactory::Description kFormats[] = {
    // registry name, format name, filter, sampling, unit, options
    {"CloudFactoryTestA", "TestPoints", "*.tstpts;*.tstshared", true, false, false},
    {"CloudFactoryTestB", "9TestLate", "*.tstlate", false, false, false},
    {"CloudFactoryTestC", "TestAlpha RGB", "*.tstpts_rgb", false, true, true},
    {"CloudFactoryTestD", "TestFailing", "*.tstfail", false, false, false},
    {"CloudFactoryTestE", "TestMesh", "*.tstmesh;*.tstshared", false, false, true},
    {"CloudFactoryTestF", "0TestEarly", "*.tstearly", false, false, false},
};
enum { Failing = 3, Mesh = 4 };

// Every format reads the 27 points of a 3 x 3 x 3 lattice, but for the mesh
// format (one triangle) and the failing one (raises during the walk).
template <int Kind>
class TestFactory : public ZonCloudReadFileFactory {
public:
    TestFactory() : ZonCloudReadFileFactory(kFormats[Kind]) {}
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override
    {
        MemoryContent content;
        content.openFile = true;
        content.failInPoints = Kind == Failing;
        if (Kind == Mesh) {
            content.type = 4;
            content.meshes = {{{0, 0, 0, 1, 0, 0, 1, 1, 0}, {0, 1, 2}}};
        } else {
            for (float x = 0; x <= 2; ++x)
                for (float y = 0; y <= 2; ++y)
                    for (float z = 0; z <= 2; ++z) content.points.insert(content.points.end(), {x, y, z});
        }
        auto reader = std::make_shared<MemoryReader>(fileName, content);
        // The mesh format applies its triangles setting to the reader, as a factory does.
        reader->SetTriangles(ZonCldSettings::Instance().GetBool("TestMeshTriangles", true));
        return reader;
    }
};

template <int Kind>
ZonRegistration Registration()
{
    return {kFormats[Kind].registryName, ZonICloudReadFileFactory::InterfaceName,
            [] { return std::make_shared<TestFactory<Kind>>(); }};
}
const ZonRegistration kRegistrations[] = {Registration<0>(), Registration<1>(), Registration<2>(),
                                          Registration<3>(), Registration<4>(), Registration<5>()};

TEST(Registry, FormatsSortedByNameWithDigitNamesLast)
{
    ZonListValZonUnicodeString names;
    ZonListValZonString filters;
    ZonCldImporter::GetAvailableFormats(names, filters, true);
    EXPECT_EQ(names.size(), filters.size());
    std::vector<std::string> all, ours;
    for (const auto& name : names) all.push_back(name.ToUtf8());
    std::copy_if(all.begin(), all.end(), std::back_inserter(ours),
                 [](const std::string& n) { return n.find("Test") != std::string::npos; });
    EXPECT_EQ(ours, (std::vector<std::string>{"TestAlpha RGB", "TestFailing", "TestMesh", "TestPoints", "0TestEarly",
                                              "9TestLate"}));
}

TEST(Registry, LookupsByNameAndUnknownNames)
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

    for (const char* name : {"NoSuchFormat", "", "testpoints"}) {
        SCOPED_TRACE(name);
        EXPECT_FALSE(ZonCldImporter::GetFactory(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithSampling(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithLengthUnit(name));
        EXPECT_FALSE(ZonCldImporter::IsFormatWithOptions(name));
        ZonNotification* notification = reinterpret_cast<ZonNotification*>(0x1);
        EXPECT_EQ(ZonCldImporter::GetOptionsOfFormat(name, nullptr, notification), nullptr);
        EXPECT_EQ(notification, nullptr);
        EXPECT_FALSE(ZonCldImporter(name).CreateReader("a.tstpts"));
    }
}

TEST(Extension, FirstFormatWhoseFilterHoldsTheLastExtensionExactly)
{
    const std::pair<const char*, const char*> cases[] = {
        {"a.tstpts", "TestPoints"},  // not claimed by "*.tstpts_rgb", listed first
        {"A.TSTPTS", "TestPoints"},  // capitals
        {"dir/.tstpts", "TestPoints"},
        {"b.tstpts_rgb", "TestAlpha RGB"},
        {"c.tstshared", "TestMesh"},  // claimed twice: the first in list order
        {"d.tstlate", "9TestLate"},
    };
    for (const auto& [file, format] : cases)
        EXPECT_EQ(ZonCldImportServices::FindFormatOfFile(file).ToUtf8(), format) << file;
    for (const char* file : {"e.tst", "f.pts", "g", "h.tstpts.bak", "i.", "/dir.tstpts/file"})
        EXPECT_EQ(ErrorKey([&] { ZonCldImportServices::FindFormatOfFile(file); }),
                  "ZonCloudReadNLSTool.ERR_UnknownExtension")
            << file;
}

// A fresh directory, settings at their defaults, and a collecting reporter.
class ImportEntry : public zontest::FilesTest {
protected:
    void SetUp() override
    {
        FilesTest::SetUp();
        ZonCldSettings::Instance().ResetAll();
        ZonSession::OpenSession();
        ZonSession::GetPtrSession()->SetReporter(_reporter);
        ZonSession::GetPtrSession()->SetTerrainMode(false);
    }
    void TearDown() override
    {
        ZonCldSettings::Instance().ResetAll();
        ZonSession::GetPtrSession()->SetReporter(std::make_shared<ZonStderrReporter>());
        FilesTest::TearDown();
    }
    std::string File(const std::string& name) { return Write(name, "content\n"); }

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
    // The list variant: bodies appended, the statistics, the box given back, and what was reported.
    struct ListResult {
        std::vector<ZonCldBody_var> bodies;
        ZonString statistics = "old";
        ZonMathBox box = ZonMathBox(5, 6, 5, 6, 5, 6);  // the list variant imports everything
        std::vector<ZonCollectingReporter::Entry> reported;
    };
    ListResult BuildList(const std::string& path)
    {
        ListResult r;
        ZonMathTransformation inverse;
        _reporter->Clear();
        ZonCldImportServices::BuildCldBodyListFromFile(_geometry, path, {}, inverse, r.box, r.bodies, r.statistics);
        r.reported = _reporter->Entries();
        return r;
    }

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

    ZonSession::GetPtrSession()->SetTerrainMode(true);
    ZonCldSettings::Instance().SetImportSampling(12.5);
    const std::string terrain = Build(File("b.tstpts")).messages.back();
    EXPECT_EQ(terrain.rfind("Terrain import statistics\n", 0), 0u) << terrain;
    EXPECT_NE(terrain.find("Sampling (12.5)"), std::string::npos) << terrain;
}

TEST_F(ImportEntry, SettingsGiveScaleUnitAndTriangles)
{
    auto& settings = ZonCldSettings::Instance();
    settings.SetImportScaleFactor(2.0);
    settings.SetImportFileUnit("Inch");
    const Result r = Build(File("a.tstpts"));
    EXPECT_EQ(r.body->GetUnitName(), "Inch");
    EXPECT_FLOAT_EQ(r.box.GetHigh()[2], 101.6f);  // 2 inches, doubled
    settings.ResetAll();

    EXPECT_EQ(Build(File("a.tstmesh")).body->GetNumberOfTriangles(), 1u);
    settings.SetBool("TestMeshTriangles", false);  // the reader's option reaches the walk
    const Result mesh = Build(File("b.tstmesh"));
    EXPECT_EQ(mesh.body->GetNumberOfTriangles(), 0u);
    EXPECT_EQ(mesh.body->GetNumberOfPoints(), 3u);
}

TEST_F(ImportEntry, ImportBoxAndPlacement)
{
    Result r = Build(File("a.tstpts"), ZonMathBox(0, 1, 0, 1, 0, 2));
    EXPECT_EQ(r.body->GetNumberOfPoints(), 3u);  // z = 0, 1, 2 at x = y = 0; z closed on the file's high
    EXPECT_TRUE(r.box.IsSameAs(ZonMathBox(0, 0, 0, 0, 0, 2)));
    EXPECT_TRUE(r.inverse.IsIdentity());

    const ZonMathTransformation placement({0, -1, 0, 1, 0, 0, 0, 0, 1}, {10, 0, 0});
    r = Build(File("b.tstpts"), {}, placement);
    EXPECT_EQ(r.body->GetPlacement(), placement);
    EXPECT_TRUE((r.inverse * placement).IsIdentity());
}

TEST_F(ImportEntry, ErrorsOfTheSingleVariantAreRaised)
{
    const ZonMathTransformation flat({0, 0, 0, 0, 1, 0, 0, 0, 1}, {0, 0, 0});
    const std::pair<std::function<void()>, const char*> cases[] = {
        {[&] { Build(File("a.obj")); }, "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {[&] { Build(File("b.KOVO")); }, "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {[&] { Build(File("c.mrp")); }, "ZonCloudReadNLSTool.ERR_FormatNotImplemented"},
        {[&] { Build(File("d.unknownext")); }, "ZonCloudReadNLSTool.ERR_UnknownExtension"},
        {[&] { Build(File("noextension")); }, "ZonCloudReadNLSTool.ERR_UnknownExtension"},
        {[&] { Build(File("e.tstpts"), ZonMathBox(5, 6, 5, 6, 5, 6)); }, "ZonCloudReadNLSTool.ERR_NoPointFound"},
        {[&] { Build(File("f.tstpts"), {}, flat); }, "ZonMathTransformation.ERR_NotInvertible"},
        {[&] {
             ZonCldSettings::Instance().SetImportSampling(150.0);
             Build(File("g.tstpts"));
         },
         "ZonCloudReadNLSTool.ERR_InvalidPercentValue"},
    };
    for (const auto& [build, key] : cases) EXPECT_EQ(ErrorKey(build), key);
}

TEST_F(ImportEntry, WithAFormatNamedByTheCaller)
{
    ZonMathTransformation inverse;
    ZonMathBox box;
    std::vector<ZonString> messages;
    const auto build = [&](const char* format, const std::string& file) {
        return ZonCldImportServices::BuildCldBodyWithFormat(_geometry, format, file, {}, inverse, box, messages);
    };
    EXPECT_EQ(build("TestMesh", File("a.unknownext"))->GetTypeOfDigitization(), 4);
    EXPECT_EQ(ErrorKey([&] { build("NoSuchFormat", File("b.tstpts")); }), "ZonCloudReadNLSTool.ERR_Failure");
}

TEST_F(ImportEntry, ListVariantAppendsTheBodyOrReportsOneErrorAndAppendsNothing)
{
    ListResult r = BuildList(File("a.tstpts"));
    ASSERT_EQ(r.bodies.size(), 1u);
    EXPECT_EQ(r.bodies[0]->GetNumberOfPoints(), 27u);
    EXPECT_TRUE(r.box.IsSameAs(ZonMathBox(0, 2, 0, 2, 0, 2)));
    EXPECT_EQ(r.statistics.rfind("Import statistics\n", 0), 0u);
    EXPECT_TRUE(r.reported.empty());

    const std::pair<std::string, const char*> cases[] = {
        {File("a.tstfail"), "ZonCloudReadNLSTool.ERR_UnknownData"},  // raised during the walk
        {Path("missing.tstpts"), "ZonCloudOperErrorTool.ERR_ENOENT"},
        {File("b.unknownext"), "ZonCloudReadNLSTool.ERR_UnknownExtension"},
    };
    for (const auto& [file, key] : cases) {
        SCOPED_TRACE(file);
        r = BuildList(file);
        EXPECT_TRUE(r.bodies.empty());
        EXPECT_TRUE(r.statistics.empty());
        EXPECT_TRUE(r.box.IsEmpty());
        ASSERT_EQ(r.reported.size(), 1u);
        EXPECT_EQ(r.reported[0].key, key);
        EXPECT_FALSE(r.reported[0].message.empty());
    }
}

}  // namespace
