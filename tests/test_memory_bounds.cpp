// Files whose header announces far more than they hold (counts, rows ×
// columns, element lengths), one or more per reader, imported in a child
// process whose address space is capped a little above what it already uses:
// a reader that allocated what the header announces would end in the memory
// error (or die) instead of the file's own error. Skipped in the sanitizer
// build, whose shadow memory cannot live under such a cap.
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <fstream>

#include "RangeScannerFiles.h"
#include "ScannerFiles.h"
#include "ZonCldBody.h"
#include "ZonCldImportServices.h"
#include "ZonGeoFactoryProtected.h"
#include "ZonReaderFixtures.h"

#if defined(__SANITIZE_ADDRESS__)
#define ZON_UNDER_SANITIZER 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define ZON_UNDER_SANITIZER 1
#endif
#endif

namespace {

using zontest::CorpusFile;
using zontest::Put;

constexpr std::uint64_t Headroom = std::uint64_t{256} << 20;

// `text` with its first `from` replaced by `to`; the test fails when `from` is missing.
std::string Patched(std::string text, const std::string& from, const std::string& to)
{
    const auto at = text.find(from);
    EXPECT_NE(at, std::string::npos) << from;
    if (at != std::string::npos) text.replace(at, from.size(), to);
    return text;
}

// The little-endian 32-bit value at `offset` replaced.
std::string Set32(std::string bytes, std::size_t offset, std::uint32_t value)
{
    std::memcpy(bytes.data() + offset, &value, sizeof value);
    return bytes;
}

// A DICOM slice whose rows and columns say 65535 (explicit VR: tag, "US", length 2, value).
std::string HugeDicomSlice()
{
    std::string slice = CorpusFile("fuzz_dicom", "explicit.dcm");
    for (const char element : {'\x10', '\x11'}) {
        const std::string tag = std::string("\x28\x00", 2) + element + std::string("\x00US\x02\x00", 5);
        const auto at = slice.find(tag);
        EXPECT_NE(at, std::string::npos);
        if (at != std::string::npos) slice.replace(at + tag.size(), 2, "\xff\xff");
    }
    return slice;
}

// An archive whose every member declares `size` bytes once inflated and, when
// `compressed`, about as many compressed (local and central headers).
std::string HugeZipMembers(std::uint32_t size, bool compressed)
{
    std::string zip = CorpusFile("fuzz_dicom", "series.dcz");
    for (const auto& [signature, field] : {std::pair<std::string, std::size_t>{"PK\x03\x04", 18}, {"PK\x01\x02", 20}})
        for (auto at = zip.find(signature); at != std::string::npos; at = zip.find(signature, at + 4)) {
            if (compressed) zip = Set32(zip, at + field, size - 200);
            zip = Set32(zip, at + field + 4, size);
        }
    return zip;
}

std::string IgesWithHugeCopiousCount()
{
    // The parameter line keeps its 72 columns.
    return Patched(CorpusFile("fuzz_iges", "points_and_copious.igs"), "106,2,3,1.,2.,3.,4.,5.,6.,        ",
                   "106,2,2000000000,1.,2.,3.,4.,5.,6.,");
}

std::string BinaryStl(const std::string& header, std::uint32_t count)
{
    std::string bytes = header;
    bytes.resize(80, ' ');
    Put(bytes, count);
    for (int i = 0; i < 12; ++i) Put(bytes, static_cast<float>(i % 3));
    bytes += std::string(2, '\0');
    return bytes;
}

std::string AtosPatch(std::size_t descriptorField, std::uint32_t value)
{
    zontest::AtosPatch patch;
    patch.points = {{0, 0, 1, 0, 0, 0.5}, {1, 0, 1, 1, 0, 0.5}};
    const std::string bytes = zontest::AtosBinary({patch});
    return descriptorField == 0 ? Set32(bytes, 16, value) : Set32(bytes, 512 + descriptorField, value);
}

// One group of one profile; `field` (from the file's start) set to `value` when not 0.
std::string HyscanWith(std::uint32_t points, std::size_t field = 0, std::uint32_t value = 0)
{
    const std::string bytes = zontest::HyscanFile({{{points, {1, 2, 3, 4, 5, 6}}}});
    return field == 0 ? bytes : Set32(bytes, field, value);
}

std::string KreonHuge()
{
    zontest::KreonGrid grid;
    grid.columns = grid.rows = 0xFFFF;
    grid.values = {1, 2, 3, 4};
    return zontest::KreonFile(grid);
}

std::string OptonHuge(float points)
{
    zontest::OptonGrid grid;
    grid.rows = grid.columns = 1e6f;
    grid.points = points;
    grid.records = {{1, 2, 3, 0}, {4, 5, 6, 0}};
    return zontest::OptonFile(grid);
}

struct Hostile {
    const char* reader;
    std::string fileName;
    std::string bytes;
    std::string outcome;  // the error's key, or "ok" when the announced size is only a hint
};

std::vector<Hostile> HostileFiles()
{
    const std::string huge = "4000000000";
    const std::string Read = "ZonCloudReadNLSTool.";
    return {
        {"free ASCII count", "a.asc", huge + "\n1 2 3\n4 5 6\n", "ok"},
        {"user format count", "a.asc_fmt", huge + "\n1 2 3 1 2 3\n", "ok"},
        {"RGB count", "a.asc_rgb", huge + "\n1 2 3 4 5 6\n", "ok"},
        {"Cgo count", "a.cgo", huge + "\n1 2 3\n", "ok"},
        {"STL binary count", "a.stl", BinaryStl("mesh", 0xFFFFFFFFu), Read + "ERR_UnknownData"},
        {"STL solid header, binary count", "b.stl", BinaryStl("solid mesh", 0xFFFFFFFFu), Read + "ERR_UnknownData"},
        {"GoCad vertex number", "a.ts", "GOCAD TSurf 1\nTFACE\nVRTX " + huge + " 0 0 0\nVRTX 1 1 0 0\nVRTX 2 0 1 0\nTRGL " +
                                            huge + " 1 2\nEND\n", Read + "ERR_NoPointFound"},
        {"ATOS patch count", "a.surf", AtosPatch(0, 0xFFFFFFFFu), Read + "ERR_UnknownData"},
        {"ATOS points of a patch", "b.surf", AtosPatch(16, 0xFFFFFFF0u), Read + "ERR_UnknownData"},
        {"ATOS raster height", "c.surf", AtosPatch(8, 0xFFFFFFFFu), "ok"},
        {"ATOS text count", "a.atos_ascii",
         Patched(CorpusFile("fuzz_atos", "patch.atos_ascii"), "Points: 6", "Points: " + huge), "ok"},
        {"ATOS text raster", "b.atos_ascii",
         Patched(CorpusFile("fuzz_atos", "patch.atos_ascii"), "RasterX: 2", "RasterX: 2000000000"), "ok"},
        {"Steinbichler points", "a.ac",
         zontest::SteinFile({{"NUMBER_OF_POINTS " + huge + "\n", zontest::SteinRecords({1, 2, 3})}}), Read + "ERR_UnknownData"},
        {"Steinbichler scans", "b.ac",
         zontest::SteinFile({{"NUMBER_OF_POINTS 1\nNUMBER_OF_SCANS " + huge + "\n", zontest::SteinRecords({1, 2, 3}),
                              zontest::SteinSubset::Scans, std::string(8, '\0')}}), Read + "ERR_UnknownData"},
        {"IGES copious count", "a.igs", IgesWithHugeCopiousCount(), "ok"},
        {"DICOM rows and columns", "a.dcm", HugeDicomSlice(), Read + "ERR_DicomShortPixelData"},
        {"DICOM archive member sizes", "a.dcz", HugeZipMembers(0xFFFFFFF0u, false), "ZonZipReader.ERR_TooLarge"},
        {"DICOM archive compressed sizes", "b.dcz", HugeZipMembers(0x7FFFFFF0u, true), "ZonZipReader.ERR_TooLarge"},
        {"ArcInfo rows and columns", "a.asc_grid", "ncols 100000\nnrows 100000\nxllcorner 0\nyllcorner 0\ncellsize 1\n1 2 3\n", "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"DEM profile count", "a.dem",
         Patched(CorpusFile("fuzz_dem", "gdal_4x3.dem"), "1.000000D+00     1     4", "1.000000D+00     1999999"), "ok"},
        {"SRTM odd size", "a.hgt", std::string(3, '\0'), "ok"},
        {"Hyscan profile points", "a.hym", HyscanWith(0xFFFFFFFFu), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"Hyscan group profiles", "b.hym", HyscanWith(2, 96 + 94, 0xFFFFFFFFu), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"Kreon rows and columns", "a.grk", KreonHuge(), "ZonCloudOperErrorTool.ERR_ENODATA"},
        {"Opton rows and columns", "a.xyz", OptonHuge(-1), Read + "ERR_UnknownData"},
        {"Opton point count", "b.xyz", OptonHuge(4e9f), Read + "ERR_UnknownData"},
    };
}

// What the import of `path` ends in, in a child whose address space is capped.
std::string OutcomeUnderCap(const std::string& path)
{
    int channel[2];
    if (::pipe(channel) != 0) return "no pipe";
    const pid_t child = ::fork();
    if (child == 0) {
        ::close(channel[0]);
        std::string outcome;
        long pages = 0;
        std::ifstream("/proc/self/statm") >> pages;
        const rlim_t cap = static_cast<rlim_t>(pages) * static_cast<rlim_t>(::sysconf(_SC_PAGESIZE)) + Headroom;
        const rlimit limit{cap, cap};
        if (::setrlimit(RLIMIT_AS, &limit) != 0) outcome = "no cap";
        // The cap must be real: twice the headroom is refused.
        if (void* probe = std::malloc(2 * Headroom)) {
            std::free(probe);
            outcome = "cap not effective";
        }
        try {
            ZonGeoFactoryProtected geometry;
            const ZonMathTransformation placement;
            ZonMathTransformation inverse;
            ZonMathBox box;
            std::vector<ZonString> messages;
            ZonCldImportServices::BuildCldBodyFromFile(geometry, ZonUnicodeString(path), placement, inverse, box,
                                                       messages);
            if (outcome.empty()) outcome = "ok";
        } catch (const ZonError& error) {
            if (outcome.empty()) outcome = error.GetMessageKey();
        } catch (const std::exception& error) {
            outcome = std::string("std::exception ") + error.what();
        }
        (void)!::write(channel[1], outcome.data(), outcome.size());
        ::_exit(0);
    }
    ::close(channel[1]);
    std::string outcome;
    char buffer[256];
    for (ssize_t got; (got = ::read(channel[0], buffer, sizeof buffer)) > 0;) outcome.append(buffer, static_cast<std::size_t>(got));
    ::close(channel[0]);
    int status = 0;
    ::waitpid(child, &status, 0);
    if (!WIFEXITED(status)) return "died (" + outcome + ")";
    return outcome;
}

class MemoryBounds : public zontest::FilesTest {};

TEST_F(MemoryBounds, HeadersThatAnnounceHugeSizesEndInTheFilesError)
{
#ifdef ZON_UNDER_SANITIZER
    GTEST_SKIP() << "the address space cannot be capped under the address sanitizer";
#endif
    zontest::WriteUserFormatDescription(Path("columns.fdf"));
    for (const Hostile& file : HostileFiles())
        EXPECT_EQ(OutcomeUnderCap(Write(file.fileName, file.bytes)), file.outcome) << file.reader;
}

}  // namespace
