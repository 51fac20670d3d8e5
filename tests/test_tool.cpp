// The zoncloud tool as a user runs it: exit codes, the JSON of formats, info
// and dump, and the free ASCII format end to end.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "ZonTestFiles.h"

namespace {

using nlohmann::json;
using zontest::Quote;

class Tool : public zontest::FilesTest {
protected:
    json Json(const std::string& arguments) const
    {
        const zontest::ToolRun run = Run(arguments);
        EXPECT_EQ(run.status, 0) << arguments << "\n" << run.err;
        return json::parse(run.out);
    }
    bool HasFormat(const char* name) const
    {
        const json formats = Json("formats --json")["readers"];
        return std::any_of(formats.begin(), formats.end(), [name](const json& f) { return f["name"] == name; });
    }
    // Points as the JSON gives them, read back into floats.
    static std::vector<float> Floats(const json& points)
    {
        std::vector<float> v;
        for (const json& p : points)
            for (const json& c : p) v.push_back(static_cast<float>(c.get<double>()));
        return v;
    }
};

// The order is the registry's, tested with the registry.
TEST_F(Tool, FormatsJsonDescribesEveryFactoryAndWriter)
{
    const json formats = Json("formats --json");
    for (const json& writer : formats.at("writers")) {
        EXPECT_EQ(writer.size(), 4u) << writer.dump();
        EXPECT_FALSE(writer["extensions"].empty());
        EXPECT_FALSE(writer["accepts"].empty());
        EXPECT_NE(writer["display"], "") << writer.dump();
    }
    const json list = formats.at("readers");
    ASSERT_TRUE(list.is_array());
    EXPECT_FALSE(list.empty());
    for (const json& format : list) {
        ASSERT_EQ(format.size(), 7u) << format.dump();
        for (const char* key : {"name", "display", "registry", "filter"}) EXPECT_TRUE(format.at(key).is_string());
        for (const char* key : {"sampling", "unit", "options"}) EXPECT_TRUE(format.at(key).is_boolean());
        EXPECT_EQ(format["registry"].get<std::string>().rfind("CloudFactory", 0), 0u);
        EXPECT_EQ(format["filter"].get<std::string>().rfind("*.", 0), 0u);
    }
}

TEST_F(Tool, ExitCodesAndTheErrorJson)
{
    const std::string file = Quote(Write("a.unknownext", "1 2 3\n"));
    for (const std::string& arguments : {std::string(""), std::string("info"), "dump " + file + " --box 1 2 3",
                                         "info " + file + " --format NoSuchFormat", "info " + file + " --sampling x",
                                         std::string("nosuchcommand"), "info " + file + " --no-such-option"})
        EXPECT_EQ(Run(arguments).status, 2) << arguments;

    for (const char* command : {"info", "dump"}) {
        SCOPED_TRACE(command);
        zontest::ToolRun run = Run(std::string(command) + " " + file + " --json");
        EXPECT_EQ(run.status, 1);
        const json error = json::parse(run.out).at("error");
        EXPECT_EQ(error.size(), 4u);
        EXPECT_EQ(error["catalog"], "ZonCloudImportExport");
        EXPECT_EQ(error["key"], "ZonCloudReadNLSTool.ERR_UnknownExtension");
        EXPECT_EQ(error["severity"], 2);
        EXPECT_FALSE(error["message"].get<std::string>().empty());
        run = Run(std::string(command) + " " + file);
        EXPECT_EQ(run.status, 1);
        EXPECT_TRUE(run.out.empty());
        EXPECT_NE(run.err.find("ERR_UnknownExtension"), std::string::npos);
    }
}

TEST_F(Tool, VersionAndTheNotesOfTheReaderChoice)
{
    zontest::ToolRun run = Run("--version");
    EXPECT_EQ(run.status, 0);
    EXPECT_EQ(run.out.rfind("zoncloud ", 0), 0u) << run.out;

    // An unknown extension names the known ones, for reading and for writing.
    run = Run("info " + Quote(Write("a.unknownext", "1 2 3\n")));
    EXPECT_NE(run.err.find(".asc"), std::string::npos) << run.err;
    if (!HasFormat("ASCII FREE")) return;
    run = Run("convert " + Quote(Write("b.asc", "1 2 3\n")) + " " + Quote(Path("b.unknownext")));
    EXPECT_EQ(run.status, 1);
    EXPECT_NE(run.err.find(".stl"), std::string::npos) << run.err;

    // ".asc" is claimed by more than one format when the grid reader is built:
    // the note names the one used; standard error (not a terminal) has nothing else.
    run = Run("info " + Quote(Path("b.asc")) + " --json");
    EXPECT_EQ(run.status, 0);
    if (HasFormat("ArcInfoGrid")) {
        EXPECT_EQ(run.err, "note: .asc is read as ASCII FREE (also claimed by ArcInfoGrid; choose with --format)\n");
    }
    EXPECT_EQ(Run("info " + Quote(Path("b.asc")) + " --format \"ASCII FREE\"").err, "");
}

TEST_F(Tool, MeshesEndToEnd)
{
    if (!HasFormat("STL")) GTEST_SKIP() << "the STL reader is not in this build";
    const std::string facets =
        "facet normal 0 0 1\nouter loop\nvertex 0 0 0\nvertex 1 0 0\nvertex 1 1 0\nendloop\nendfacet\n"
        "facet normal 0 0 1\nouter loop\nvertex 0 0 0\nvertex 1 1 0\nvertex 0 1 0\nendloop\nendfacet\n";
    const std::string file = Quote(Write("square.stl", "solid s\n" + facets + "endsolid s\n"));
    json d = Json("dump " + file + " --json");
    EXPECT_EQ(d["type"], 4);
    ASSERT_EQ(d["polygons"].size(), 1u);
    EXPECT_EQ(d["polygons"][0]["vertices"].size(), 4u);
    EXPECT_EQ(d["polygons"][0]["triangles"], json::parse("[[0,1,2],[0,2,3]]"));
    d = Json("dump " + file + " --box 0 0 0 1 0.5 1 --json");  // the sub-mesh: two vertices, no triangle
    EXPECT_EQ(d["polygons"][0]["vertices"].size(), 2u);
    EXPECT_TRUE(d["polygons"][0]["triangles"].empty());

    EXPECT_EQ(Json("info " + file + " --json")["triangles"], 2);
    const json i = Json("info " + file + " --no-triangles --json");
    EXPECT_EQ(i["triangles"], 0);
    EXPECT_EQ(i["points"], 4);
}

const char* const Scans = "G08(1)\n1 2 3\n4 5 6\n7 8 9\nG09\nG08(2)\n10 11 12\n13 14 15\nG09\n";

TEST_F(Tool, FreeAsciiDumpGivesTheReadersAnswers)
{
    if (!HasFormat("ASCII FREE")) GTEST_SKIP() << "the free ASCII reader is not in this build";
    const zontest::ToolRun run = Run("dump " + Quote(Write("plain.asc", "0.1 -2.5 1e-7\n123456.789 0 3\n-7 8.25 9\n")) +
                                     " --json");
    ASSERT_EQ(run.status, 0) << run.err;
    json d = json::parse(run.out);
    EXPECT_EQ(d["format"], "ASCII FREE");
    EXPECT_EQ(d["type"], 1);
    EXPECT_TRUE(d["unit"].is_null());
    EXPECT_EQ(d["points"], 3);
    EXPECT_EQ(Floats(d["cloud"]["points"]), (std::vector<float>{0.1f, -2.5f, 1e-7f, 123456.789f, 0, 3, -7, 8.25f, 9}));
    EXPECT_FALSE(d["cloud"].contains("colors"));
    EXPECT_EQ(Floats(json::array({d["bbox"]})), (std::vector<float>{-7, -2.5f, 1e-7f, 123456.789f, 8.25f, 9}));
    EXPECT_FALSE(d.contains("sets"));
    EXPECT_NE(run.out.find("[0.1,-2.5,1e-07]"), std::string::npos) << run.out;  // shortest texts of the floats

    d = Json("dump " + Quote(Write("precise.asc", "0.1 1.0000000001 2\n3 4 5\n")) + " --double --json");
    EXPECT_EQ(d["cloud"]["points"][0][0].get<double>(), 0.1);
    EXPECT_EQ(d["cloud"]["points"][0][1].get<double>(), 1.0000000001);

    const std::string scans = Quote(Write("scans.asc", Scans)) + " --delimiters G08 G09";
    d = Json("dump " + scans + " --json");
    EXPECT_EQ(d["type"], 2);
    EXPECT_EQ(d["points"], 5);
    ASSERT_EQ(d["sets"].size(), 1u);
    ASSERT_GE(d["sets"][0].size(), 2u);
    EXPECT_EQ(Floats(d["sets"][0][0]), (std::vector<float>{1, 2, 3, 4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(Floats(d["sets"][0][1]), (std::vector<float>{10, 11, 12, 13, 14, 15}));
    for (std::size_t i = 2; i < d["sets"][0].size(); ++i) EXPECT_TRUE(d["sets"][0][i].empty());
    d = Json("dump " + scans + " --box 3 0 0 11 100 100 --json");
    EXPECT_EQ(Floats(d["cloud"]["points"]), (std::vector<float>{4, 5, 6, 7, 8, 9, 10, 11, 12}));
    EXPECT_EQ(Floats(d["sets"][0][0]), (std::vector<float>{4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(Floats(d["sets"][0][1]), (std::vector<float>{10, 11, 12}));
    d = Json("dump " + scans + " --sampling 50 --json");
    EXPECT_EQ(Floats(d["sets"][0][0]), (std::vector<float>{1, 2, 3, 7, 8, 9}));  // per scan, first point kept
    EXPECT_EQ(Floats(d["sets"][0][1]), (std::vector<float>{10, 11, 12}));
}

TEST_F(Tool, FreeAsciiInfoImportsAsTheHostWould)
{
    if (!HasFormat("ASCII FREE")) GTEST_SKIP() << "the free ASCII reader is not in this build";
    const std::string file = Quote(Write("scans.ASC", Scans));  // capitals: still the free ASCII format
    json i = Json("info " + file + " --delimiters G08 G09 --json");
    EXPECT_EQ(i["format"], "ASCII FREE");  // ".asc" is claimed by two formats: the first one wins
    for (const auto& [key, value] : {std::pair<const char*, int>{"type", 2}, {"points", 5}, {"sets", 1}, {"scans", 2},
                                     {"grids", 0}, {"polygons", 0}})
        EXPECT_EQ(i[key], value) << key;
    EXPECT_EQ(i["unit"], "mm");
    EXPECT_EQ(i["bbox"], json::parse("[1, 2, 3, 13, 14, 15]"));
    const std::string statistics = i["statistics"];
    EXPECT_EQ(statistics.rfind("Import statistics\n", 0), 0u) << statistics;
    EXPECT_NE(statistics.find("Format: ASCII FREE"), std::string::npos);

    i = Json("info " + file + " --box 0 0 0 5 100 100 --json");
    EXPECT_EQ(i["type"], 1);  // no delimiters: one cloud
    EXPECT_EQ(i["points"], 2);
    const zontest::ToolRun text = Run("info " + file + " --delimiters G08 G09");
    EXPECT_EQ(text.status, 0);
    EXPECT_NE(text.out.find("scans:     2"), std::string::npos) << text.out;
}

TEST_F(Tool, BadFreeAsciiInputEndsInACatalogErrorAndStatusOne)
{
    if (!HasFormat("ASCII FREE")) GTEST_SKIP() << "the free ASCII reader is not in this build";
    std::filesystem::create_directory(Path("folder.asc"));
    std::string garbage;
    // Bytes of every kind but the characters of numbers, so no line can pass for a point.
    for (int i = 0; i < 4096; ++i) {
        const char c = static_cast<char>((i * 7919) % 256);
        garbage += std::strchr("0123456789+-.eEDd", c) && c != 0 ? 'z' : c;
    }
    const std::pair<std::string, std::string> cases[] = {
        {Write("empty.asc", ""), ""},
        {Write("garbage.asc", garbage), ""},
        {Write("long.asc", std::string(100000, 'x') + "\n"), ""},
        {Path("missing.asc"), "ZonCloudOperErrorTool.ERR_ENOENT"},
        {Path("folder.asc"), "ZonCloudOperErrorTool.ERR_EISDIR"},
    };
    for (const auto& [file, key] : cases)
        for (const char* command : {"info", "dump"}) {
            SCOPED_TRACE(std::string(command) + " " + file);
            const zontest::ToolRun run = Run(std::string(command) + " " + Quote(file) + " --json");
            EXPECT_EQ(run.status, 1) << run.out << run.err;
            const json error = json::parse(run.out).at("error");
            if (!key.empty()) {
                EXPECT_EQ(error["key"], key);
            }
            EXPECT_FALSE(error["message"].get<std::string>().empty());
        }
}

}  // namespace
