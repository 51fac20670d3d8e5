// The exporter registry: the choice of exporter by the target's extension,
// what each exporter holds and declares, and bodies that only exporters see
// (grids with holes, nothing to write), which the tool cannot feed them.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <map>
#include <optional>
#include <set>

#include "ZonCldBody.h"
#include "ZonCldImporter.h"
#include "ZonCloudExporter.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonIReporter.h"
#include "ZonTestFiles.h"

namespace {

using zontest::ErrorKey;

std::string RegistryOf(const std::string& file)
{
    return ZonCloudExporter::ForFile(ZonUnicodeString(file))->GetRegistryName();
}

TEST(ExportRegistry, TheTargetsExtensionChoosesTheExporter)
{
    const struct { const char* file; const char* registry; } cases[] = {
        {"out.asc", "CloudExporterAsciiLibre"},   {"out.libre", "CloudExporterAsciiLibre"},
        {"OUT.ASCII", "CloudExporterAsciiLibre"}, {"dir.stl/out.asc", "CloudExporterAsciiLibre"},
        {"out.stl", "CloudExporterStl"},          {"out.asc_fmt", "CloudExporterAsciiUserFormat"},
        {"out.asc_rgb", "CloudExporterLeica"},    {"out.xyz_rgb", "CloudExporterLeica"},
        {"out.cgo", "CloudExporterCgoAscii"},     {"two.dots.cgo", "CloudExporterCgoAscii"},
        {"out.3mf", "CloudExporter3MF"},          {"OUT.3MF", "CloudExporter3MF"},
    };
    for (const auto& c : cases) EXPECT_EQ(RegistryOf(c.file), c.registry) << c.file;
    for (const char* file : {"out.xyz_unknown", "out", "dir.asc/out", "out.asc.", "out.cgo_ascii", ".asc_rgbx"})
        EXPECT_EQ(ErrorKey([&] { ZonCloudExporter::ForFile(ZonUnicodeString(file)); }),
                  "ZonCloudReadNLSTool.ERR_UnknownExtension")
            << file;
}

TEST(ExportRegistry, EachExtensionHasOneExporterAndEachExporterSaysWhatItHolds)
{
    using K = ZonCloudExporter::Kind;
    const std::map<std::string, unsigned> accepts = {
        {"CloudExporterAsciiLibre", K::EveryKind}, {"CloudExporterAsciiUserFormat", K::EveryKind},
        {"CloudExporterCgoAscii", K::EveryKind},   {"CloudExporterLeica", K::EveryKind},
        {"CloudExporterStl", K::Meshes},           {"CloudExporter3MF", K::Meshes},
    };
    std::map<std::string, unsigned> found;
    std::set<std::string> extensions;
    for (const auto& exporter : ZonCloudExporter::GetAll()) {
        found[exporter->GetRegistryName()] = exporter->GetAccepts();
        for (const std::string& extension : exporter->GetExtensions()) {
            EXPECT_TRUE(extensions.insert(extension).second) << extension << " is claimed twice";
            EXPECT_EQ(RegistryOf("file" + extension), exporter->GetRegistryName());
        }
    }
    EXPECT_EQ(found, accepts);
}

// A front end offers these declarations as they are: a default it would
// refuse, or a flag that stores nothing, is a slip in the declaration.
TEST(ExportRegistry, DeclaredSettingsAreUsable)
{
    std::vector<ZonCloudSetting> settings;
    for (const auto& exporter : ZonCloudExporter::GetAll())
        settings.insert(settings.end(), exporter->GetSettings().begin(), exporter->GetSettings().end());
    for (const auto& factory : ZonCldImporter::GetAllFactories())
        if (auto declared = ZonQueryInterface<ZonCloudReadFileFactory>(factory))
            settings.insert(settings.end(), declared->GetSettings().begin(), declared->GetSettings().end());
    ASSERT_GE(settings.size(), 15u);
    using Kind = ZonCloudSetting::Kind;
    for (const ZonCloudSetting& s : settings) {
        SCOPED_TRACE(s.key);
        ASSERT_TRUE(s.key && *s.key);
        if (s.option) {
            EXPECT_TRUE(s.help && *s.help);
        }
        if (s.kind == Kind::Flag && s.option) {
            EXPECT_TRUE(s.given);
        }
        const std::string choices = s.choices ? std::string("|") + s.choices + "|" : "";
        if (s.kind == Kind::Position) {
            EXPECT_LT(std::atoi(s.fallback), static_cast<int>(std::count(choices.begin(), choices.end(), '|')) - 1);
        }
        if (s.kind == Kind::Text && s.choices) {
            EXPECT_NE(choices.find(std::string("|") + s.fallback + "|"), std::string::npos);
        }
        if (s.low < s.high) {
            EXPECT_GE(std::atoi(s.fallback), s.low);
            EXPECT_LE(std::atoi(s.fallback), s.high);
        }
    }
}

class ExportBodies : public zontest::FilesTest {
protected:
    // Exports the body and keeps the exporter's summary and reported keys.
    std::optional<std::string> Export(const ZonCldBody& body, const std::string& file)
    {
        auto collector = std::make_shared<ZonCollectingReporter>();
        ZonSession* session = ZonSession::GetPtrSession();
        const ZonIReporter_var previous = session->GetReporter();
        session->SetReporter(collector);
        const auto summary =
            ZonCloudExporter::ForFile(ZonUnicodeString(file))->Export({body, ZonUnicodeString(file), "body"});
        session->SetReporter(previous);
        keys.clear();
        for (const auto& entry : collector->Entries()) keys.push_back(entry.key);
        return summary;
    }
    std::vector<std::string> keys;
};

// A grid's holes are not points: only its valid points are written, after
// the clouds, in every point format.
TEST_F(ExportBodies, GridHolesAreLeftOutAndEmptyBodiesWriteNothing)
{
    ZonGeoFactoryProtected factory;
    ZonCldBody body;
    auto cloud = factory.CreateCloud();
    const float cloudXyz[3] = {9, 9, 9};
    cloud->Points().AssignScaled(cloudXyz, 1, 1.0);
    body.AddCloud(cloud);
    auto grid = factory.CreateGrid();
    const unsigned char valid[3] = {1, 0, 1};
    const float gridXyz[9] = {1, 1, 1, 2, 2, 2, 3, 3, 3};
    grid->AddRow(valid, 3).points.AssignScaled(gridXyz, 3, 1.0);
    auto grids = factory.CreateSetOfGrids();
    grids->AddGrid(grid);
    body.AddSetOfGrids(grids);

    const struct { const char* file; const char* summary; const char* text; } cases[] = {
        {"grid.asc", "3 points (free ASCII)",
         "X 9.000000 Y 9.000000 Z 9.000000\nX 1.000000 Y 1.000000 Z 1.000000\nX 3.000000"},
        {"grid.cgo", "3 points (Cgo)", "3\n9.000000 9.000000 9.000000\n1.000000 1.000000 1.000000\n3.000000"},
    };
    for (const auto& c : cases) {
        SCOPED_TRACE(c.file);
        EXPECT_EQ(Export(body, Path(c.file)), c.summary);
        EXPECT_EQ(keys, std::vector<std::string>{"ZonCldExportCmd.ERR_FILESUCCESSFULL"});
        const std::string text = zontest::Slurp(Path(c.file));
        EXPECT_NE(text.find(c.text), std::string::npos) << text;
        EXPECT_EQ(text.find("2.000000"), std::string::npos) << text;
    }

    const ZonCldBody empty;
    for (const char* file : {"none.asc", "none.asc_fmt", "none.asc_rgb", "none.cgo"}) {
        EXPECT_EQ(Export(empty, Path(file)), std::nullopt) << file;
        EXPECT_EQ(keys, std::vector<std::string>{"ZonCldExportCmd.ERR_NoActivePoints"}) << file;
        EXPECT_FALSE(std::filesystem::exists(Path(file))) << file;
    }
}

}  // namespace
