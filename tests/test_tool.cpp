// The zoncloud tool as a user runs it: exit codes, the JSON of formats, info
// and dump, and the free ASCII format end to end.
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cmath>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <nlohmann/json.hpp>

namespace {

using nlohmann::json;

struct Outcome {
    int status = -1;
    std::string out, err;
    json Json() const { return json::parse(out); }
};

class Tool : public ::testing::Test {
protected:
    void SetUp() override
    {
        char pattern[] = "/tmp/zon_tool_XXXXXX";
        ASSERT_NE(mkdtemp(pattern), nullptr);
        _dir = pattern;
    }
    void TearDown() override { std::filesystem::remove_all(_dir); }

    std::string Write(const std::string& name, const std::string& content)
    {
        const std::string path = _dir + "/" + name;
        std::ofstream(path, std::ios::binary) << content;
        return path;
    }

    static std::string Slurp(const std::string& path)
    {
        std::ifstream in(path, std::ios::binary);
        std::stringstream s;
        s << in.rdbuf();
        return s.str();
    }

    Outcome Run(const std::string& arguments)
    {
        const std::string out = _dir + "/stdout", err = _dir + "/stderr";
        const std::string command = std::string("'") + ZON_TOOL_PATH + "' " + arguments + " >'" + out + "' 2>'" + err + "' </dev/null";
        const int raw = std::system(command.c_str());
        Outcome o;
        o.status = WIFEXITED(raw) ? WEXITSTATUS(raw) : -1;
        o.out = Slurp(out);
        o.err = Slurp(err);
        return o;
    }

    static std::string Quote(const std::string& path) { return "'" + path + "'"; }

    std::string _dir;
};

bool StartsWithDigit(const std::string& s) { return !s.empty() && s[0] >= '0' && s[0] <= '9'; }

TEST_F(Tool, FormatsListsEveryFactoryInRegistryOrder)
{
    const Outcome o = Run("formats --json");
    ASSERT_EQ(o.status, 0) << o.err;
    const json list = o.Json();
    ASSERT_TRUE(list.is_array());
    std::vector<std::string> names;
    for (const json& format : list) {
        ASSERT_EQ(format.size(), 7u) << format.dump();
        for (const char* key : {"name", "display", "registry", "filter"}) EXPECT_TRUE(format.at(key).is_string());
        for (const char* key : {"sampling", "unit", "options"}) EXPECT_TRUE(format.at(key).is_boolean());
        EXPECT_EQ(format["registry"].get<std::string>().rfind("CloudFactory", 0), 0u);
        EXPECT_EQ(format["filter"].get<std::string>().rfind("*.", 0), 0u);
        names.push_back(format["name"]);
    }
    const auto firstDigit = std::find_if(names.begin(), names.end(), StartsWithDigit);
    EXPECT_TRUE(std::is_sorted(names.begin(), firstDigit));
    EXPECT_TRUE(std::all_of(firstDigit, names.end(), StartsWithDigit));
}

TEST_F(Tool, UsageErrorsExitWithTwo)
{
    const std::string file = Quote(Write("a.asc", "1 2 3\n"));
    for (const std::string& arguments : {std::string(""), std::string("info"), "dump " + file + " --box 1 2 3",
                                         "info " + file + " --format NoSuchFormat", "info " + file + " --sampling x",
                                         std::string("nosuchcommand"), "info " + file + " --no-such-option"}) {
        const Outcome o = Run(arguments);
        EXPECT_EQ(o.status, 2) << arguments << "\n" << o.err;
    }
}

TEST_F(Tool, ModuleErrorsExitWithOneAndAnswerJsonWhenAsked)
{
    const std::string file = Quote(Write("a.unknownext", "1 2 3\n"));
    for (const char* command : {"info", "dump"}) {
        SCOPED_TRACE(command);
        Outcome o = Run(std::string(command) + " " + file + " --json");
        EXPECT_EQ(o.status, 1);
        const json error = o.Json().at("error");
        EXPECT_EQ(error.size(), 4u);
        EXPECT_EQ(error["catalog"], "ZonCloudImportExport");
        EXPECT_EQ(error["key"], "ZonCloudReadNLSTool.ERR_UnknownExtension");
        EXPECT_EQ(error["severity"], 2);
        EXPECT_FALSE(error["message"].get<std::string>().empty());

        o = Run(std::string(command) + " " + file);
        EXPECT_EQ(o.status, 1);
        EXPECT_TRUE(o.out.empty());
        EXPECT_NE(o.err.find("ERR_UnknownExtension"), std::string::npos);
    }
    const Outcome o = Run("info " + Quote(Write("b.obj", "v 0 0 0\n")) + " --json");
    EXPECT_EQ(o.status, 1);
    EXPECT_EQ(o.Json()["error"]["key"], "ZonCloudReadNLSTool.ERR_FormatNotImplemented");
}

TEST_F(Tool, MeshesEndToEnd)
{
    const json formats = Run("formats --json").Json();
    if (std::none_of(formats.begin(), formats.end(), [](const json& f) { return f["name"] == "STL"; }))
        GTEST_SKIP() << "the STL reader is not in this build";
    const std::string facet = "facet normal 0 0 1\nouter loop\nvertex 0 0 0\nvertex 1 0 0\nvertex 1 1 0\nendloop\nendfacet\n"
                              "facet normal 0 0 1\nouter loop\nvertex 0 0 0\nvertex 1 1 0\nvertex 0 1 0\nendloop\nendfacet\n";
    const std::string file = Quote(Write("square.stl", "solid s\n" + facet + "endsolid s\n"));
    json d = Run("dump " + file + " --json").Json();
    EXPECT_EQ(d["type"], 4);
    ASSERT_EQ(d["polygons"].size(), 1u);
    EXPECT_EQ(d["polygons"][0]["vertices"].size(), 4u);
    EXPECT_EQ(d["polygons"][0]["triangles"], json::parse("[[0,1,2],[0,2,3]]"));
    d = Run("dump " + file + " --box 0 0 0 1 0.5 1 --json").Json();  // the sub-mesh: two vertices, no triangle
    EXPECT_EQ(d["polygons"][0]["vertices"].size(), 2u);
    EXPECT_TRUE(d["polygons"][0]["triangles"].empty());

    EXPECT_EQ(Run("info " + file + " --json").Json()["triangles"], 2);
    const json i = Run("info " + file + " --no-triangles --json").Json();
    EXPECT_EQ(i["triangles"], 0);
    EXPECT_EQ(i["points"], 4);
}

// The free ASCII format, when this build has it.
class ToolAscii : public Tool {
protected:
    void SetUp() override
    {
        Tool::SetUp();
        const json formats = Run("formats --json").Json();
        const bool present = std::any_of(formats.begin(), formats.end(),
                                         [](const json& f) { return f["name"] == "ASCII FREE"; });
        if (!present) GTEST_SKIP() << "the free ASCII reader is not in this build";
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

const char* const Scans = "G08(1)\n1 2 3\n4 5 6\n7 8 9\nG09\nG08(2)\n10 11 12\n13 14 15\nG09\n";

TEST_F(ToolAscii, DumpGivesTheReadersAnswers)
{
    const std::string file = Write("plain.asc", "0.1 -2.5 1e-7\n123456.789 0 3\n-7 8.25 9\n");
    const Outcome o = Run("dump " + Quote(file) + " --json");
    ASSERT_EQ(o.status, 0) << o.err;
    const json d = o.Json();
    EXPECT_EQ(d["format"], "ASCII FREE");
    EXPECT_EQ(d["type"], 1);
    EXPECT_TRUE(d["unit"].is_null());
    EXPECT_EQ(d["points"], 3);
    EXPECT_EQ(Floats(d["cloud"]["points"]), (std::vector<float>{0.1f, -2.5f, 1e-7f, 123456.789f, 0, 3, -7, 8.25f, 9}));
    EXPECT_FALSE(d["cloud"].contains("colors"));
    EXPECT_EQ(Floats(json::array({d["bbox"]})), (std::vector<float>{-7, -2.5f, 1e-7f, 123456.789f, 8.25f, 9}));
    EXPECT_FALSE(d.contains("sets"));
    // Shortest texts that read back to the same float.
    EXPECT_NE(o.out.find("[0.1,-2.5,1e-07]"), std::string::npos) << o.out;
}

TEST_F(ToolAscii, DumpInDoublePrecision)
{
    const std::string file = Write("precise.asc", "0.1 1.0000000001 2\n3 4 5\n");
    const json d = Run("dump " + Quote(file) + " --double --json").Json();
    EXPECT_EQ(d["cloud"]["points"][0][0].get<double>(), 0.1);
    EXPECT_EQ(d["cloud"]["points"][0][1].get<double>(), 1.0000000001);
}

TEST_F(ToolAscii, DumpWalksScansAndBoxQueries)
{
    const std::string file = Quote(Write("scans.asc", Scans));
    json d = Run("dump " + file + " --delimiters G08 G09 --json").Json();
    EXPECT_EQ(d["type"], 2);
    EXPECT_EQ(d["points"], 5);
    ASSERT_EQ(d["sets"].size(), 1u);
    const json& scans = d["sets"][0];
    ASSERT_GE(scans.size(), 2u);
    EXPECT_EQ(Floats(scans[0]), (std::vector<float>{1, 2, 3, 4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(Floats(scans[1]), (std::vector<float>{10, 11, 12, 13, 14, 15}));
    for (std::size_t i = 2; i < scans.size(); ++i) EXPECT_TRUE(scans[i].empty());

    d = Run("dump " + file + " --delimiters G08 G09 --box 3 0 0 11 100 100 --json").Json();
    EXPECT_EQ(Floats(d["cloud"]["points"]), (std::vector<float>{4, 5, 6, 7, 8, 9, 10, 11, 12}));
    EXPECT_EQ(Floats(d["sets"][0][0]), (std::vector<float>{4, 5, 6, 7, 8, 9}));
    EXPECT_EQ(Floats(d["sets"][0][1]), (std::vector<float>{10, 11, 12}));

    d = Run("dump " + file + " --delimiters G08 G09 --sampling 50 --json").Json();
    EXPECT_EQ(Floats(d["sets"][0][0]), (std::vector<float>{1, 2, 3, 7, 8, 9}));  // per scan, first point kept
    EXPECT_EQ(Floats(d["sets"][0][1]), (std::vector<float>{10, 11, 12}));
}

TEST_F(ToolAscii, InfoImportsAsTheHostWould)
{
    const std::string file = Write("scans.ASC", Scans);  // capitals: still the free ASCII format
    Outcome o = Run("info " + Quote(file) + " --delimiters G08 G09 --json");
    ASSERT_EQ(o.status, 0) << o.err;
    json i = o.Json();
    EXPECT_EQ(i["format"], "ASCII FREE");  // ".asc" is claimed by two formats: the first one wins
    EXPECT_EQ(i["type"], 2);
    EXPECT_EQ(i["points"], 5);
    EXPECT_EQ(i["sets"], 1);
    EXPECT_EQ(i["scans"], 2);
    EXPECT_EQ(i["grids"], 0);
    EXPECT_EQ(i["polygons"], 0);
    EXPECT_EQ(i["unit"], "mm");
    EXPECT_EQ(i["bbox"], json::parse("[1, 2, 3, 13, 14, 15]"));
    const std::string statistics = i["statistics"];
    EXPECT_EQ(statistics.rfind("Import statistics\n", 0), 0u) << statistics;
    EXPECT_NE(statistics.find("Format: ASCII FREE"), std::string::npos);

    i = Run("info " + Quote(file) + " --box 0 0 0 5 100 100 --json").Json();
    EXPECT_EQ(i["type"], 1);  // no delimiters: one cloud
    EXPECT_EQ(i["points"], 2);

    o = Run("info " + Quote(file) + " --delimiters G08 G09");
    EXPECT_EQ(o.status, 0);
    EXPECT_NE(o.out.find("scans:     2"), std::string::npos) << o.out;
}

TEST_F(ToolAscii, BadInputEndsInACatalogErrorAndStatusOne)
{
    std::filesystem::create_directory(_dir + "/folder.asc");
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
        {_dir + "/missing.asc", "ZonCloudOperErrorTool.ERR_ENOENT"},
        {_dir + "/folder.asc", "ZonCloudOperErrorTool.ERR_EISDIR"},
    };
    for (const auto& [file, key] : cases) {
        for (const char* command : {"info", "dump"}) {
            SCOPED_TRACE(std::string(command) + " " + file);
            const Outcome o = Run(std::string(command) + " " + Quote(file) + " --json");
            EXPECT_EQ(o.status, 1) << o.out << o.err;
            const json error = o.Json().at("error");
            if (!key.empty()) {
                EXPECT_EQ(error["key"], key);
            }
            EXPECT_FALSE(error["message"].get<std::string>().empty());
        }
    }
}

}  // namespace
