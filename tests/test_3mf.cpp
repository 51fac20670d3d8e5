// 3MF export: the package's members and lines, merged vertices, placements
// in the build items, strips and fans, the strict form, failures that must
// leave nothing behind, and packages that other readers accept.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>
#include <zip.h>

#include <charconv>
#include <clocale>
#include <csignal>
#include <cstdio>

#if defined(__SANITIZE_ADDRESS__)
#include <sanitizer/lsan_interface.h>
#endif

#include "ZonCld3MFExporter.h"
#include "ZonCld3MFOutputDocument.h"
#include "ZonCloudReadStl.h"
#include "ZonCloudWriteStl.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryInstance.h"
#include "ZonExchMemoryProduct.h"
#include "ZonExchMemoryProductStructure.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIReporter.h"
#include "ZonTestFiles.h"

namespace fs = std::filesystem;

namespace {

using Members = std::vector<std::pair<std::string, std::string>>;

// The archive's members in stored order, with their content; empty when it cannot be opened.
Members ReadPackage(const std::string& path)
{
    Members members;
    zip_t* archive = zip_open(path.c_str(), ZIP_RDONLY, nullptr);
    if (!archive) return members;
    for (zip_int64_t i = 0; i < zip_get_num_entries(archive, 0); ++i) {
        zip_stat_t stat;
        zip_stat_index(archive, i, 0, &stat);
        std::string content(stat.size, '\0');
        zip_file_t* file = zip_fopen_index(archive, i, 0);
        if (file && zip_fread(file, content.data(), stat.size) != static_cast<zip_int64_t>(stat.size)) content = "?";
        if (file) zip_fclose(file);
        members.emplace_back(stat.name, content);
    }
    zip_close(archive);
    return members;
}

std::string Model(const std::string& path)
{
    for (const auto& [name, content] : ReadPackage(path))
        if (name == "3D/3dmodel.model") return content;
    return "";
}

ZonExchMemoryTessFace_var Face(std::vector<float> coords, std::vector<unsigned> triangles)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    face->SetCoords(std::move(coords));
    for (unsigned& v : triangles) v *= 3;  // the documents give offsets
    face->SetTriangles(std::move(triangles));
    return face;
}

ZonExchMemoryTessNode_var Node(int type, std::vector<ZonIExchTessFace_var> faces)
{
    auto node = std::make_shared<ZonExchMemoryTessNode>(type);
    for (auto& face : faces) node->AddFace(face);
    return node;
}

ZonExchMemoryTessRep_var Rep(std::vector<ZonIExchTessNode_var> nodes)
{
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    for (auto& node : nodes) rep->AddTopNode(node);
    return rep;
}

ZonExchMemoryDocument_var Document(std::vector<ZonIExchTessNode_var> nodes, const char* alias = "part")
{
    auto document = std::make_shared<ZonExchMemoryDocument>(alias);
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, Rep(std::move(nodes)));
    return document;
}

// Two triangles sharing the edge (1,0,0)-(0,1,0), given as two faces of one body.
ZonExchMemoryDocument_var TwoFaces(const char* alias = "part")
{
    return Document({Node(ZonExchNodeSolid, {Face({0, 0, 0, 1, 0, 0, 0, 1, 0}, {0, 1, 2}),
                                             Face({1, 0, 0, 0, 1, 0, 1, 1, 0.5f}, {0, 2, 1})})},
                    alias);
}

const std::string Declaration = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";
const std::string CoreNamespace = "http://schemas.microsoft.com/3dmanufacturing/core/2015/02";

class ThreeMFTest : public zontest::FilesTest {
protected:
    void SetUp() override
    {
        FilesTest::SetUp();
        ZonSession::OpenSession();
        ZonSession::GetPtrSession()->SetReporter(reporter_);
    }
    ZonHResult Export(const ZonIExchInputDocument_var& document, const std::string& path,
                      const ZonIExchExporter::Parameters& parameters = {}) const
    {
        return ZonCld3MFExporter().Export(document, path, parameters);
    }
    // What the test directory holds besides the tool's captured output.
    std::set<std::string> Listing() const
    {
        std::set<std::string> names;
        for (const auto& entry : fs::directory_iterator(dir_))
            if (!entry.path().filename().string().starts_with(".std")) names.insert(entry.path().filename());
        return names;
    }
    std::shared_ptr<ZonCollectingReporter> reporter_ = std::make_shared<ZonCollectingReporter>();
};

TEST_F(ThreeMFTest, PackageHoldsItsPartsInOrderWithTheirExactLinesAndSharedVerticesOnce)
{
    const std::string path = Path("out.3mf");
    ASSERT_EQ(Export(TwoFaces(), path), ZON_S_OK);
    const Members members = ReadPackage(path);
    ASSERT_EQ(members.size(), 4u);
    const std::string relationships = "<Relationships xmlns=\"http://schemas.openxmlformats.org/package/2006/relationships\">\n";
    const Members expected = {
        {"[Content_Types].xml",
         Declaration + "<Types xmlns=\"http://schemas.openxmlformats.org/package/2006/content-types\">\n"
             "<Default Extension=\"rels\" ContentType=\"application/vnd.openxmlformats-package.relationships+xml\" />\n"
             "<Default Extension=\"model\" ContentType=\"application/vnd.ms-package.3dmanufacturing-3dmodel+xml\" />\n"
             "</Types> \n"},
        {"_rels/.rels", Declaration + relationships +
                            "<Relationship Target=\"/3D/3dmodel.model\" Id=\"rel0\" "
                            "Type=\"http://schemas.microsoft.com/3dmanufacturing/2013/01/3dmodel\" />\n"
                            "</Relationships> \n"},
        {"3D/_rels/3dmodel.model.rels", Declaration + relationships + "</Relationships>\n"},
        {"3D/3dmodel.model",
         Declaration + "<model unit=\"millimeter\" xml:lang=\"en-US\" xmlns=\"" + CoreNamespace + "\">\n" +
             "<metadata type=\"name\">part</metadata>\n"
             "<resources>\n"
             "<object id=\"0\" name=\"part\">\n<mesh>\n<vertices>\n"
             "<vertex x=\"0.000000\" y=\"0.000000\" z=\"0.000000\" />\n"
             "<vertex x=\"1.000000\" y=\"0.000000\" z=\"0.000000\" />\n"
             "<vertex x=\"0.000000\" y=\"1.000000\" z=\"0.000000\" />\n"
             "<vertex x=\"1.000000\" y=\"1.000000\" z=\"0.500000\" />\n"
             "</vertices>\n<triangles>\n"
             "<triangle v1=\"0\" v2=\"1\" v3=\"2\" />\n"
             "<triangle v1=\"1\" v2=\"3\" v3=\"2\" />\n"
             "</triangles>\n</mesh>\n</object>\n"
             "</resources>\n<build>\n"
             "<item objectid=\"0\"/> \n"
             "</build>\n</model>\n"},
    };
    EXPECT_EQ(members, expected);
    // Only the package is left: the tree it was packed from is gone.
    EXPECT_EQ(Listing(), std::set<std::string>{"out.3mf"});
    EXPECT_TRUE(reporter_->Entries().empty());
}

TEST_F(ThreeMFTest, StrictFormNumbersObjectsFromOneAndNamesTheDocumentTitle)
{
    const std::string path = Path("strict.3mf");
    ASSERT_EQ(Export(Document({Node(ZonExchNodeSolid, {Face({0, 0, 0, 1, 0, 0, 0, 1, 0}, {0, 1, 2})}),
                               Node(ZonExchNodeFace, {Face({0, 0, 1, 1, 0, 1, 0, 1, 1}, {0, 1, 2})})},
                              "a&b"),
                     path, {{"Strict", "1"}}),
              ZON_S_OK);
    const std::string model = Model(path);
    for (const char* line : {"<metadata name=\"Title\">a&amp;b</metadata>\n", "<object id=\"1\" name=\"a&amp;b\">\n",
                             "<object id=\"2\" name=\"a&amp;b\">\n", "<item objectid=\"1\"/> \n<item objectid=\"2\"/> \n"})
        EXPECT_NE(model.find(line), std::string::npos) << line << model;
    EXPECT_EQ(model.find("id=\"0\""), std::string::npos);
}

// Strips alternate their orientation, fans turn about their first vertex.
TEST_F(ThreeMFTest, StripsAndFansAreUnfoldedAsForStl)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    std::vector<float> coords;
    for (int k = 0; k < 6; ++k) coords.insert(coords.end(), {float(k), float(k * k), 0});
    face->SetCoords(coords);
    face->AddStrip({0, 3, 6, 9, 12});
    face->AddFan({15, 0, 3, 6});
    ASSERT_EQ(Export(Document({Node(ZonExchNodeSolid, {face})}), Path("s.3mf")), ZON_S_OK);
    const std::string model = Model(Path("s.3mf"));
    const std::string triangles = model.substr(model.find("<triangles>\n"), model.find("</triangles>") - model.find("<triangles>\n"));
    EXPECT_EQ(triangles, "<triangles>\n"
                         "<triangle v1=\"0\" v2=\"1\" v3=\"2\" />\n<triangle v1=\"2\" v2=\"1\" v3=\"3\" />\n"
                         "<triangle v1=\"2\" v2=\"3\" v3=\"4\" />\n"
                         "<triangle v1=\"5\" v2=\"0\" v3=\"1\" />\n<triangle v1=\"5\" v2=\"1\" v3=\"2\" />\n");
}

// The placement travels in the build item: the linear part column by
// column, then the translation (scaled with the coordinates).
TEST_F(ThreeMFTest, PlacementsGoIntoTheBuildItemsInTheirOrder)
{
    auto part = std::make_shared<ZonExchMemoryProduct>("wheel");
    part->SetTessellatedRep(Rep({Node(ZonExchNodeSolid, {Face({0, 0, 0, 1, 0, 0, 0, 1, 0}, {0, 1, 2})})}));
    auto root = std::make_shared<ZonExchMemoryProduct>("car");
    const ZonMathTransformation turned({0, -1, 0, 1, 0, 0, 0, 0, 2}, {10, 20.5, -3});
    root->AddInstance(std::make_shared<ZonExchMemoryInstance>(part, ZonMathTransformation()));
    root->AddInstance(std::make_shared<ZonExchMemoryInstance>(part, turned));
    auto structure = std::make_shared<ZonExchMemoryProductStructure>();
    structure->AddRoot(root);
    auto document = std::make_shared<ZonExchMemoryDocument>("car");
    document->SetRepresentation(ZonIExchProductStructure::RepresentationType, structure);

    ASSERT_EQ(Export(document, Path("p.3mf"), {{"Scaling", "2"}}), ZON_S_OK);
    const std::string model = Model(Path("p.3mf"));
    EXPECT_NE(model.find("<object id=\"1\" name=\"wheel\">\n"), std::string::npos) << model;
    EXPECT_NE(model.find("<vertex x=\"2.000000\" y=\"0.000000\" z=\"0.000000\" />\n"), std::string::npos) << model;
    EXPECT_NE(model.find("<item objectid=\"0\"/> \n"
                         "<item objectid=\"1\" transform=\"0 1 0 -1 0 0 0 0 2 20 41 -6 \"/> \n"),
              std::string::npos)
        << model;
}

TEST_F(ThreeMFTest, PackageDirectoryIsNamedAfterTheTarget)
{
    const std::pair<const char*, const char*> cases[] = {
        {"d/out.3mf", "d/out_Zip_my_contained"},   {"d/out", "d/out_Zip_my_contained"},
        {"d/a.b.3mf", "d/a.b_Zip_my_contained"},   {"d/.3mf", "d/.3mf_Zip_my_contained"},
        {"d/", "d/Export_3MF_Zip_my_contained"},   {"out.3mf", "out_Zip_my_contained"},
    };
    for (const auto& [target, directory] : cases)
        EXPECT_EQ(ZonCld3MFOutputDocument::PackageDirectoryOf(target), directory) << target;

    ASSERT_EQ(Export(TwoFaces(), Path("noext")), ZON_S_OK);
    EXPECT_EQ(ReadPackage(Path("noext")).size(), 4u);
    EXPECT_EQ(Listing(), std::set<std::string>{"noext"});
}

TEST_F(ThreeMFTest, OptionsNeedTheUnitAndListsOfOneLength)
{
    ZonCld3MFOutputDocument document;
    EXPECT_EQ(document.SetOptions({"ExportUnit", "Strict"}, {"inch"}), ZON_E_FAIL);
    EXPECT_EQ(document.SetOptions({"Scaling"}, {"2"}), ZON_E_FAIL);
    EXPECT_EQ(document.SetOptions({"ExportUnit"}, {""}), ZON_S_OK);
    EXPECT_EQ(document.GetUnit(), "millimeter");
}

// Clouds, scans and grids cannot go into the package; alone they make none.
TEST_F(ThreeMFTest, NoMeshMakesNoPackageAndSaysWhatWasSkipped)
{
    ASSERT_EQ(Export(Document({Node(ZonExchNodeCloud, {}), Node(ZonExchNodeGrid, {})}), Path("c.3mf")), ZON_S_OK);
    EXPECT_TRUE(Listing().empty());
    ASSERT_EQ(reporter_->Entries().size(), 2u);
    EXPECT_EQ(reporter_->Entries()[0].key, "ZonCldExportCmd.ERR_NotInMeshFile_Cloud_Grid");
    EXPECT_EQ(reporter_->Entries()[1].key, "ZonCldExportCmd.Empty");
}

// Another locale's decimal comma must not reach the file.
TEST_F(ThreeMFTest, DecimalPointStaysAPointUnderACommaLocale)
{
    const std::string previous = std::setlocale(LC_NUMERIC, nullptr);
    bool comma = false;
    for (const char* name : {"de_DE.UTF-8", "de_DE.utf8", "fr_FR.UTF-8", "fr_FR.utf8"})
        if (std::setlocale(LC_NUMERIC, name)) {
            comma = true;
            break;
        }
    if (!comma) {
        // Built for the test when the machine has the sources but not the locale.
        const std::string command = "localedef -i de_DE -c -f UTF-8 " + zontest::Quote(Path("de")) + " >/dev/null 2>&1";
        if (std::system(command.c_str()) == 0) {
            ::setenv("LOCPATH", dir_.c_str(), 1);
            comma = std::setlocale(LC_NUMERIC, "de") != nullptr;
            ::unsetenv("LOCPATH");
        }
    }
    if (!comma) GTEST_SKIP() << "no locale with a decimal comma is available";
    fs::remove_all(Path("de"));
    const ZonHResult result = Export(TwoFaces(), Path("comma.3mf"));
    const std::string decimalPoint = std::localeconv()->decimal_point;
    std::setlocale(LC_NUMERIC, previous.c_str());
    ASSERT_EQ(decimalPoint, ",");
    ASSERT_EQ(result, ZON_S_OK);
    EXPECT_NE(Model(Path("comma.3mf")).find("<vertex x=\"1.000000\" y=\"1.000000\" z=\"0.500000\" />"),
              std::string::npos);
}

// ---- Targets that cannot be written -------------------------------------------

// The exporter in a child process, under a file-size limit when one is given;
// answers the keys of the errors it reported.
std::string ExportInChild(const ZonIExchInputDocument_var& document, const std::string& path, rlim_t limit)
{
    int ends[2];
    if (::pipe(ends) != 0) return "no pipe";
    std::fflush(nullptr);
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(ends[0]);
        if (limit) {
            const rlimit fileSize{limit, limit};
            ::setrlimit(RLIMIT_FSIZE, &fileSize);
            std::signal(SIGXFSZ, SIG_IGN);  // a refused write then fails with EFBIG
        }
        ZonSession::OpenSession();
        auto reporter = std::make_shared<ZonCollectingReporter>();
        ZonSession::GetPtrSession()->SetReporter(reporter);
        std::string keys = ZonFailed(ZonCld3MFExporter().Export(document, path, {})) ? "failed" : "succeeded";
        for (const auto& entry : reporter->Entries()) keys += " " + entry.key;
        ::_exit(::write(ends[1], keys.data(), keys.size()) == static_cast<ssize_t>(keys.size()) ? 0 : 1);
    }
    ::close(ends[1]);
    std::string keys;
    char buffer[512];
    for (ssize_t n; (n = ::read(ends[0], buffer, sizeof buffer)) > 0;) keys.append(buffer, n);
    ::close(ends[0]);
    int status = 0;
    ::waitpid(child, &status, 0);
    return keys;
}

// n separate triangles.
ZonIExchInputDocument_var Triangles(unsigned n)
{
    std::vector<float> coords;
    std::vector<unsigned> triangles;
    for (unsigned i = 0; i < n; ++i) {
        coords.insert(coords.end(), {float(i), 0, 0, float(i) + 0.5f, 1, 0, float(i), 0, 1});
        triangles.insert(triangles.end(), {3 * i, 3 * i + 1, 3 * i + 2});
    }
    return Document({Node(ZonExchNodeSolid, {Face(coords, triangles)})});
}

TEST_F(ThreeMFTest, TargetsThatCannotBeWrittenGiveTheSystemsErrorAndLeaveNothing)
{
    fs::create_directory(Path("taken.3mf"));
    const struct {
        const char* name;
        std::string target;
        rlim_t limit;
        unsigned triangles;
        const char* error;
    } cases[] = {
        {"missing directory", Path("nowhere/out.3mf"), 0, 1, "ERR_ENOENT"},
        {"target is a directory", Path("taken.3mf"), 0, 1, "ERR_EISDIR"},
        {"system directory", "/proc/out.3mf", 0, 1, "ERR_"},
        // The tree's model part is refused.
        {"disk full while writing the tree", Path("big.3mf"), 8192, 1000, "ERR_EFBIG"},
        // Every part fits; the archive, with its headers, does not.
        {"disk full while packing", Path("packed.3mf"), 1024, 3, "ERR_EFBIG"},
    };
    {
        ASSERT_EQ(Export(Triangles(3), Path("small.3mf")), ZON_S_OK);
        EXPECT_LT(Model(Path("small.3mf")).size(), 1024u);
        EXPECT_GT(fs::file_size(Path("small.3mf")), 1024u);
        fs::remove(Path("small.3mf"));
    }
    for (const auto& c : cases) {
        SCOPED_TRACE(c.name);
        const std::string keys = ExportInChild(Triangles(c.triangles), c.target, c.limit);
        EXPECT_TRUE(keys.starts_with("failed ZonCloudOperErrorTool.")) << keys;
        EXPECT_NE(keys.find(c.error), std::string::npos) << keys;
        EXPECT_EQ(keys.find("SUCCESSFULL"), std::string::npos) << keys;
        EXPECT_EQ(Listing(), std::set<std::string>{"taken.3mf"});
    }
    EXPECT_TRUE(fs::is_empty(Path("taken.3mf")));
    // Unwritable for anyone but the superuser, who writes anywhere.
    if (::geteuid() != 0) {
        fs::create_directory(Path("locked"));
        fs::permissions(Path("locked"), fs::perms::owner_read | fs::perms::owner_exec);
        EXPECT_NE(ExportInChild(TwoFaces(), Path("locked/out.3mf"), 0).find("ERR_EACCES"), std::string::npos);
        EXPECT_TRUE(fs::is_empty(Path("locked")));
        fs::permissions(Path("locked"), fs::perms::owner_all);
    }
}

// ---- The tool, and other readers ----------------------------------------------

// A tetrahedron in binary STL: 4 triangles over 4 shared corners.
std::string WriteTetrahedron(const std::string& path)
{
    const float a[3] = {0, 0, 0}, b[3] = {2.5f, 0, 0}, c[3] = {0, 1.25f, 0}, d[3] = {0, 0, -0.75f};
    const float* faces[4][3] = {{a, c, b}, {a, b, d}, {a, d, c}, {b, c, d}};
    ZonCloudWriteStl writer(path);
    writer.BeginWriteTriangles(4);
    for (const auto& face : faces) {
        float v[9];
        for (int k = 0; k < 9; ++k) v[k] = face[k / 3][k % 3];
        writer.WriteTriangle(v);
    }
    writer.EndWriteTriangles();
    return path;
}

struct Mesh {
    std::vector<float> vertices;
    std::vector<unsigned> triangles;
    bool operator==(const Mesh&) const = default;
};

// The numbers in attribute values of the model's vertex and triangle lines.
Mesh ParseModel(const std::string& model)
{
    Mesh mesh;
    std::istringstream lines(model);
    for (std::string line; std::getline(lines, line);) {
        const bool vertex = line.starts_with("<vertex "), triangle = line.starts_with("<triangle ");
        for (std::size_t at = 0; (vertex || triangle) && (at = line.find("=\"", at)) != std::string::npos;) {
            at += 2;
            if (vertex) {
                float value = 0;
                std::from_chars(line.data() + at, line.data() + line.size(), value);
                mesh.vertices.push_back(value);
            } else {
                unsigned value = 0;
                std::from_chars(line.data() + at, line.data() + line.size(), value);
                mesh.triangles.push_back(value);
            }
        }
    }
    return mesh;
}

TEST_F(ThreeMFTest, ConvertWritesTheReadersMergedMeshAndCloudsWriteNothing)
{
    const std::string stl = WriteTetrahedron(Path("tetra.stl"));
    const zontest::ToolRun run = Run("convert " + zontest::Quote(stl) + " " + zontest::Quote(Path("tetra.3mf")));
    ASSERT_EQ(run.status, 0) << run.out << run.err;
    EXPECT_EQ(run.out, Path("tetra.3mf") + ": 4 triangles (3MF)\n");

    ZonCloudReadStl reader(stl);
    reader.BeginGetPolygon();
    ASSERT_TRUE(reader.NextPolygon());
    unsigned vertexCount = 0, triangleCount = 0;
    const float* vertices = reader.GetPolygonPoints(vertexCount);
    const unsigned* triangles = reader.GetTriangles(triangleCount);
    const Mesh expected{{vertices, vertices + 3 * vertexCount}, {triangles, triangles + 3 * triangleCount}};
    EXPECT_EQ(vertexCount, 4u);
    EXPECT_EQ(ParseModel(Model(Path("tetra.3mf"))), expected);
    EXPECT_NE(Model(Path("tetra.3mf")).find("<metadata type=\"name\">tetra</metadata>"), std::string::npos);

    const std::string cloud = Write("cloud.asc", "1 2 3\n4 5 6\n");
    const zontest::ToolRun none = Run("convert " + zontest::Quote(cloud) + " " + zontest::Quote(Path("cloud.3mf")));
    EXPECT_EQ(none.status, 1) << none.out << none.err;
    EXPECT_EQ(Listing(), (std::set<std::string>{"cloud.asc", "tetra.3mf", "tetra.stl"}));
}

// lib3mf's C interface, loaded when the library is installed.
class Lib3mf {
public:
    Lib3mf() : _handle(::dlopen("lib3MF.so.1", RTLD_NOW)) {}
    ~Lib3mf()
    {
        if (_handle) ::dlclose(_handle);
    }
    explicit operator bool() const { return _handle != nullptr; }

    // Reads the package in strict mode: "" and the totals of its mesh
    // objects, or what went wrong.
    std::string ReadStrict(const std::string& path, unsigned& vertices, unsigned& triangles, float low[3], float high[3])
    {
#if defined(__SANITIZE_ADDRESS__)
        // lib3mf leaves a zip file handle of its own unfreed on every read: not ours to report.
        __lsan::ScopedDisabler lib3mfLeaks;
#endif
        using Result = unsigned;
        void *model = nullptr, *reader = nullptr, *iterator = nullptr;
        if (Call<Result (*)(void**)>("lib3mf_createmodel")(&model) != 0) return "no model";
        std::string failure;
        if (Call<Result (*)(void*, const char*, void**)>("lib3mf_model_queryreader")(model, "3mf", &reader) != 0)
            failure = "no reader";
        else if (Call<Result (*)(void*, int)>("lib3mf_reader_setstrictmodeactive")(reader, 1) != 0)
            failure = "no strict mode";
        else if (Call<Result (*)(void*, const char*)>("lib3mf_reader_readfromfileutf8")(reader, path.c_str()) != 0) {
            unsigned code = 0;
            const char* message = nullptr;
            Call<Result (*)(void*, unsigned*, const char**)>("lib3mf_getlasterror")(reader, &code, &message);
            failure = "refused: " + std::to_string(code) + " " + (message ? message : "");
        } else if (Call<Result (*)(void*, void**)>("lib3mf_model_getmeshobjects")(model, &iterator) != 0) {
            failure = "no objects";
        }
        vertices = triangles = 0;
        for (int i = 0; i < 3; ++i) low[i] = 1e30f, high[i] = -1e30f;
        for (int more = 0; failure.empty() &&
                           Call<Result (*)(void*, int*)>("lib3mf_resourceiterator_movenext")(iterator, &more) == 0 && more;) {
            void* mesh = nullptr;
            Call<Result (*)(void*, void**)>("lib3mf_resourceiterator_getcurrent")(iterator, &mesh);
            unsigned n = 0, t = 0;
            Call<Result (*)(void*, unsigned*)>("lib3mf_meshobject_getvertexcount")(mesh, &n);
            Call<Result (*)(void*, unsigned*)>("lib3mf_meshobject_gettrianglecount")(mesh, &t);
            std::vector<float> xyz(3 * std::size_t{n});
            Call<Result (*)(void*, float*, unsigned, unsigned*)>("lib3mf_meshobject_getvertices")(mesh, xyz.data(), n, nullptr);
            for (std::size_t k = 0; k < xyz.size(); ++k) {
                low[k % 3] = std::min(low[k % 3], xyz[k]);
                high[k % 3] = std::max(high[k % 3], xyz[k]);
            }
            vertices += n;
            triangles += t;
            Release(mesh);
        }
        Release(iterator);
        Release(reader);
        Release(model);
        return failure;
    }

private:
    template <class F>
    F Call(const char* name)
    {
        return reinterpret_cast<F>(::dlsym(_handle, name));
    }
    void Release(void* object)
    {
        if (object) Call<unsigned (*)(void*)>("lib3mf_release")(object);
    }
    void* _handle;
};

bool HasTool(const std::string& name)
{
    return std::system(("command -v " + name + " >/dev/null 2>&1").c_str()) == 0;
}

TEST_F(ThreeMFTest, Lib3mfInStrictModeAndAssimpReadOurPackages)
{
    const std::string stl = WriteTetrahedron(Path("tetra.stl"));
    ASSERT_EQ(Run("convert " + zontest::Quote(stl) + " " + zontest::Quote(Path("strict.3mf")) + " --3mf-strict").status, 0);
    ASSERT_EQ(Run("convert " + zontest::Quote(stl) + " " + zontest::Quote(Path("plain.3mf"))).status, 0);
    bool ran = false;
    if (Lib3mf lib3mf; lib3mf) {
        ran = true;
        unsigned vertices = 0, triangles = 0;
        float low[3], high[3];
        EXPECT_EQ(lib3mf.ReadStrict(Path("strict.3mf"), vertices, triangles, low, high), "");
        EXPECT_EQ(vertices, 4u);
        EXPECT_EQ(triangles, 4u);
        EXPECT_EQ(std::vector<float>(low, low + 3), (std::vector<float>{0, 0, -0.75f}));
        EXPECT_EQ(std::vector<float>(high, high + 3), (std::vector<float>{2.5f, 1.25f, 0}));
    }
    if (HasTool("assimp")) {
        ran = true;
        for (const char* package : {"strict.3mf", "plain.3mf"}) {
            const std::string report = Path(".report");
            std::system(("assimp info " + zontest::Quote(Path(package)) + " >" + zontest::Quote(report) + " 2>&1").c_str());
            const std::string text = zontest::Slurp(report);
            for (const char* line : {"Vertices:           4\n", "Faces:              4\n",
                                     "Minimum point      (0.000000 0.000000 -0.750000)",
                                     "Maximum point      (2.500000 1.250000 0.000000)"})
                EXPECT_NE(text.find(line), std::string::npos) << package << ": " << line << "\n" << text;
        }
    }
    if (!ran) GTEST_SKIP() << "neither lib3mf (lib3mf-dev) nor assimp (assimp-utils) is installed";
}

}  // namespace
