// Writes the system refuses: every writer, output document and exporter run
// in a child process under a small file-size limit. Each must raise (or, for
// the exporter, report) the system's error, leave no file behind and never
// report success; so must `zoncloud convert`, which then exits 1.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <functional>
#include <sstream>
#include <stdexcept>

#include "ZonCloudWriteAsciiLibre.h"
#include "ZonCloudWriteAsciiUserFormat.h"
#include "ZonCloudWriteCgoAscii.h"
#include "ZonCloudWriteLeica.h"
#include "ZonCloudWriteStl.h"
#include "ZonExchMemoryDocument.h"
#include "ZonExchMemoryTessFace.h"
#include "ZonExchMemoryTessNode.h"
#include "ZonExchMemoryTessRep.h"
#include "ZonIExchExporter.h"
#include "ZonIExchOutputDocument.h"
#include "ZonIReporter.h"
#include "ZonMsgCatalog.h"
#include "ZonObjectRegistry.h"
#include "ZonTestFiles.h"

namespace fs = std::filesystem;

namespace {

constexpr rlim_t Limit = 4096;
const std::string TooLarge = "ZonCloudOperErrorTool.ERR_EFBIG";
const std::string Success = "ZonCldExportCmd.ERR_FILESUCCESSFULL";

// Puts the limit on this process; a write past it then fails with EFBIG
// instead of killing the process.
void LimitFileSize()
{
    const rlimit limit{Limit, Limit};
    if (::setrlimit(RLIMIT_FSIZE, &limit) != 0) ::_exit(90);
    std::signal(SIGXFSZ, SIG_IGN);
}

struct Outcome {
    bool finished = false;             // the child ran to its end
    std::string raised;                // key of the error that came out, "" for none
    std::vector<std::string> reported; // keys the session's reporter was given
};

// Runs write(path) in a child under the limit and collects what came out.
Outcome UnderLimit(const std::function<void()>& write)
{
    int pipeEnds[2];
    if (::pipe(pipeEnds) != 0) return {};
    std::fflush(nullptr);
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(pipeEnds[0]);
        LimitFileSize();
        ZonSession::OpenSession();
        auto reporter = std::make_shared<ZonCollectingReporter>();
        ZonSession::GetPtrSession()->SetReporter(reporter);
        std::string text = "raised ";
        try {
            write();
        } catch (const ZonError& error) {
            text += error.GetMessageKey();
        } catch (const std::exception& error) {
            text += std::string("unexpected: ") + error.what();
        }
        text += "\n";
        for (const auto& entry : reporter->Entries()) text += "reported " + entry.key + "\n";
        const bool sent = ::write(pipeEnds[1], text.data(), text.size()) == static_cast<ssize_t>(text.size());
        ::_exit(sent ? 0 : 91);
    }
    ::close(pipeEnds[1]);
    std::string text;
    char buffer[4096];
    for (ssize_t n; (n = ::read(pipeEnds[0], buffer, sizeof buffer)) > 0;) text.append(buffer, n);
    ::close(pipeEnds[0]);
    int status = 0;
    ::waitpid(child, &status, 0);

    Outcome outcome;
    outcome.finished = WIFEXITED(status) && WEXITSTATUS(status) == 0;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        if (line.starts_with("raised ")) outcome.raised = line.substr(7);
        if (line.starts_with("reported ")) outcome.reported.push_back(line.substr(9));
    }
    return outcome;
}

void Require(ZonHResult result, const char* step)
{
    if (ZonFailed(result)) throw std::runtime_error(step);
}

// n points, all different, with a colour each.
std::vector<float> Coords(unsigned n)
{
    std::vector<float> coords;
    for (unsigned i = 0; i < n; ++i) coords.insert(coords.end(), {1.5f * i, 2.25f * i, 3.125f * i});
    return coords;
}
const unsigned char Red[3] = {200, 10, 20};

template <class Writer>
void WritePoints(Writer& writer, unsigned n, bool colored)
{
    const std::vector<float> coords = Coords(n);
    writer.BeginWritePoints(n);
    for (unsigned i = 0; i < n; ++i) {
        if (colored) writer.WritePointColor(&coords[3 * i], Red);
        else writer.WritePoint(&coords[3 * i]);
    }
    writer.EndWritePoints();
}

// n points as scans of up to 50 points.
void WriteScans(ZonCloudWriteAsciiLibre& writer, unsigned n)
{
    const std::vector<float> coords = Coords(n);
    const unsigned scans = (n + 49) / 50;
    writer.BeginWriteScans(scans);
    for (unsigned s = 0; s < scans; ++s) writer.WriteScan(&coords[150 * s], std::min(50u, n - 50 * s));
    writer.EndWriteScans();
}

void WriteTriangles(ZonCloudWriteStl& writer, unsigned n)
{
    writer.BeginWriteTriangles(n);
    for (unsigned i = 0; i < n; ++i) {
        const float v[9] = {float(i), 0, 0, float(i) + 1, 0, 0, float(i), 1, 0.5f};
        writer.WriteTriangle(v);
    }
    writer.EndWriteTriangles();
}

// A document of one node: a cloud of n points, or a mesh of n separate triangles.
ZonIExchInputDocument_var Document(int nodeType, unsigned n)
{
    auto face = std::make_shared<ZonExchMemoryTessFace>();
    if (nodeType == ZonExchNodeCloud) {
        face->SetCoords(Coords(n));
    } else {
        face->SetCoords(Coords(3 * n));
        std::vector<unsigned> offsets;
        for (unsigned k = 0; k < 3 * n; ++k) offsets.push_back(3 * k);
        face->SetTriangles(offsets);
    }
    auto node = std::make_shared<ZonExchMemoryTessNode>(nodeType);
    node->AddFace(face);
    auto rep = std::make_shared<ZonExchMemoryTessRep>();
    rep->AddTopNode(node);
    auto document = std::make_shared<ZonExchMemoryDocument>("part");
    document->SetRepresentation(ZonIExchTessRep::RepresentationType, rep);
    return document;
}

// The steps a host takes with a point output document; it releases the
// document whatever happened, which is when the outcome is reported.
void RunPointDocument(const char* type, const std::string& path, unsigned n)
{
    auto output = ZonQueryInterface<ZonIExchOutputDocument>(ZonObjectRegistry::CreateByLateType(type));
    if (!output) throw std::runtime_error("no document");
    const auto document = Document(ZonExchNodeCloud, n);
    Require(output->SetFileName(path), "name");
    Require(output->Open(), "open");
    struct Release {
        ZonIExchOutputDocument& output;
        ~Release() { output.Release(); }
    } release{*output};
    Require(output->Write(document), "write");
    Require(output->Close(), "close");
}

// The exporters report their errors instead of raising them.
void Run3MFExporter(const std::string& path, unsigned n)
{
    auto exporter = ZonQueryInterface<ZonIExchExporter>(ZonObjectRegistry::CreateByLateType("3MFExporter"));
    if (!exporter) throw std::runtime_error("no exporter");
    exporter->Export(Document(ZonExchNodeSolid, n), path, {});
}

void RunStlExporter(const std::string& path, unsigned n, const char* binary)
{
    auto exporter = ZonQueryInterface<ZonIExchExporter>(ZonObjectRegistry::CreateByLateType("STLExporter"));
    if (!exporter) throw std::runtime_error("no exporter");
    exporter->Export(Document(ZonExchNodeSolid, n), path, {{"BinaryState", binary}});
}

const ZonListValZonString UserSettings = {"Header", "Name", "-", "|", "Y", "12", "3"};

struct Case {
    const char* name;
    const char* file;
    unsigned bytesPerItem;  // about what one item (point, triangle) takes
    std::function<void(const std::string& path, unsigned items)> write;
};

const std::vector<Case>& Cases()
{
    static const std::vector<Case> cases = {
        {"FreeAsciiPoints", "out.asc", 34,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteAsciiLibre writer(path);
             WritePoints(writer, n, false);
         }},
        {"FreeAsciiScans", "out.asc", 34,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteAsciiLibre writer(path);
             WriteScans(writer, n);
         }},
        {"FreeAsciiMultiPart", "out.asc", 34,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteAsciiLibre writer(path);
             Require(writer.BeginMultiWrite(), "begin");
             WritePoints(writer, n / 2, false);
             WriteScans(writer, n - n / 2);
             writer.EndMultiWrite();
         }},
        {"StlWriter", "out.stl", 50,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteStl writer(path);
             WriteTriangles(writer, n);
         }},
        {"StlExporterBinary", "out.stl", 50,
         [](const std::string& path, unsigned n) { RunStlExporter(path, n, "1"); }},
        {"StlExporterText", "out.stl", 200,
         [](const std::string& path, unsigned n) { RunStlExporter(path, n, "0"); }},
        // The package's tree is what meets the limit: the archive is smaller.
        {"ThreeMFExporter", "out.3mf", 200,
         [](const std::string& path, unsigned n) { Run3MFExporter(path, n); }},
        {"UserFormat", "out.asc_fmt", 150,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteAsciiUserFormat writer(path);
             writer.SetWriteSettings(UserSettings);
             WritePoints(writer, n, true);
         }},
        {"UserFormatMultiPart", "out.asc_fmt", 150,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteAsciiUserFormat writer(path);
             writer.SetWriteSettings(UserSettings);
             Require(writer.BeginMultiWrite(), "begin");
             WritePoints(writer, n, false);
             writer.EndMultiWrite();
         }},
        {"RgbWriter", "out.asc_rgb", 40,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteLeica writer(path);
             WritePoints(writer, n, true);
         }},
        {"RgbDocument", "out.asc_rgb", 30,
         [](const std::string& path, unsigned n) { RunPointDocument("CLD_AsciiRGB_OutputDocument", path, n); }},
        {"CgoWriter", "out.cgo", 30,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteCgoAscii writer(path);
             WritePoints(writer, n, false);
         }},
        {"CgoMultiPart", "out.cgo", 30,
         [](const std::string& path, unsigned n) {
             ZonCloudWriteCgoAscii writer(path);
             Require(writer.BeginMultiWrite(), "begin");
             WritePoints(writer, n / 2, false);
             WritePoints(writer, n - n / 2, false);
             writer.EndMultiWrite();
         }},
        {"CgoDocument", "out.cgo", 30,
         [](const std::string& path, unsigned n) { RunPointDocument("CLD_Cgo_OutputDocument", path, n); }},
    };
    return cases;
}

// Just past the limit, the last bytes are still buffered and only the close
// can find them refused; far past it, a write in the middle fails.
enum class Excess { JustPast, FarPast };

class WriteFailure : public zontest::FilesTest,
                     public ::testing::WithParamInterface<std::tuple<std::size_t, Excess>> {};

TEST_P(WriteFailure, RaisesTheSystemErrorLeavesNoFileAndReportsNoSuccess)
{
    const auto [index, excess] = GetParam();
    const Case& c = Cases()[index];
    const std::size_t bytes = excess == Excess::JustPast ? Limit + 600 : 30 * Limit;
    const unsigned items = static_cast<unsigned>(bytes / c.bytesPerItem + 1);
    const std::string path = Path(c.file);

    const Outcome outcome = UnderLimit([&] { c.write(path, items); });

    ASSERT_TRUE(outcome.finished);
    const bool errorCameOut = outcome.raised == TooLarge ||
                              std::find(outcome.reported.begin(), outcome.reported.end(), TooLarge) != outcome.reported.end();
    EXPECT_TRUE(errorCameOut) << "raised '" << outcome.raised << "'";
    EXPECT_EQ(std::find(outcome.reported.begin(), outcome.reported.end(), Success), outcome.reported.end());
    EXPECT_FALSE(fs::exists(path));
    EXPECT_TRUE(fs::is_empty(fs::path(path).parent_path())) << "something was left beside " << path;
}

INSTANTIATE_TEST_SUITE_P(
    EveryWriter, WriteFailure,
    ::testing::Combine(::testing::Range<std::size_t>(0, Cases().size()),
                       ::testing::Values(Excess::JustPast, Excess::FarPast)),
    [](const auto& info) {
        return std::string(Cases()[std::get<0>(info.param)].name) +
               (std::get<1>(info.param) == Excess::JustPast ? "JustPast" : "FarPast");
    });

// ---- The tool ----------------------------------------------------------------

class ConvertUnderLimit : public zontest::FilesTest {
protected:
    // The tool under the limit, its output in files of the test directory.
    zontest::ToolRun Convert(const std::vector<std::string>& arguments) const
    {
        const std::string out = Path(".stdout"), err = Path(".stderr");
        std::fflush(nullptr);
        const pid_t child = ::fork();
        if (child == 0) {
            LimitFileSize();
            const int outFd = ::open(out.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
            const int errFd = ::open(err.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
            if (outFd < 0 || errFd < 0 || ::dup2(outFd, 1) < 0 || ::dup2(errFd, 2) < 0) ::_exit(92);
            std::vector<char*> argv{const_cast<char*>(ZON_TOOL_PATH), const_cast<char*>("convert")};
            for (const std::string& argument : arguments) argv.push_back(const_cast<char*>(argument.c_str()));
            argv.push_back(nullptr);
            ::execv(ZON_TOOL_PATH, argv.data());
            ::_exit(93);
        }
        int status = 0;
        ::waitpid(child, &status, 0);
        return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, zontest::Slurp(out), zontest::Slurp(err)};
    }
};

TEST_F(ConvertUnderLimit, ExitsOneWithTheSystemErrorAndNeverSaysTheFileWasWritten)
{
    const unsigned n = 3000;  // well past the limit in every format below
    const std::string cloud = Path("cloud.asc");
    {
        ZonCloudWriteAsciiLibre writer(cloud);
        WritePoints(writer, n, false);
    }
    const std::string mesh = Path("mesh.stl");
    {
        ZonCloudWriteStl writer(mesh);
        WriteTriangles(writer, n);
    }
    const std::string tooLargeText = ZonMsgCatalog::Lookup("ZonCldResOperError", TooLarge);
    ASSERT_FALSE(tooLargeText.empty());

    const std::vector<std::vector<std::string>> conversions = {
        {cloud, Path("out.asc")},  {cloud, Path("out.cgo")},       {cloud, Path("out.asc_rgb")},
        {cloud, Path("out.asc_fmt")}, {mesh, Path("out.stl"), "--text"}, {mesh, Path("binary.stl")},
        {mesh, Path("out.3mf")},
    };
    for (const auto& arguments : conversions) {
        const std::string& target = arguments[1];
        const zontest::ToolRun run = Convert(arguments);
        const std::string output = run.out + run.err;
        EXPECT_EQ(run.status, 1) << target << "\n" << output;
        EXPECT_NE(output.find(tooLargeText), std::string::npos) << target << "\n" << output;
        EXPECT_EQ(output.find(target + " was written"), std::string::npos) << output;
        EXPECT_FALSE(fs::exists(target)) << target;
        EXPECT_FALSE(fs::exists(Path("out_Zip_my_contained")));
    }
}

}  // namespace
