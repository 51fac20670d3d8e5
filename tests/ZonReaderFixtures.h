// One small, valid file of every reader, shared by the tests that run every
// reader alike (threads, memory caps). Most are the seed files of the fuzz
// corpora (real-looking files of each format); a new reader adds one row.
#pragma once
#include <functional>
#include <string>
#include <vector>

#include "ZonCldSettings.h"
#include "ZonTestFiles.h"

namespace zontest {

inline std::string CorpusFile(const std::string& target, const std::string& file)
{
    // tests/data may not exist, so the path is cut rather than walked up.
    const std::string data = ZON_TEST_DATA_DIR;
    const std::string corpus = data.substr(0, data.rfind("/tests/data")) + "/fuzz/corpus/";
    const std::string bytes = Slurp(corpus + target + "/" + file);
    EXPECT_FALSE(bytes.empty()) << corpus + target + "/" + file;
    return bytes;
}

struct ReaderFixture {
    const char* reader;
    std::string fileName;                  // its extension chooses the reader
    std::function<std::string()> bytes;    // the file's content
    std::function<void(const FilesTest&)> prepare = nullptr;  // settings the reader needs
};

// The user-format rows read their columns from this description.
inline void WriteUserFormatDescription(const std::string& path)
{
    std::ofstream(path) << "X Y Z R G B\n";
    ZonCldSettings::Instance().SetValue("ImportAUFFDF", path);
}

inline std::vector<ReaderFixture> EveryReaderFixture()
{
    const auto seed = [](const char* target, const char* file) {
        return [=] { return CorpusFile(target, file); };
    };
    return {
        {"free ASCII", "plain.asc", seed("fuzz_ascii_libre", "plain.asc")},
        {"user format", "columns.asc_fmt", [] { return std::string("1 2 3 255 0 0\n4 5 6 0 255 0\n7 8 9 1 2 3\n"); }},
        {"RGB", "colors.asc_rgb", seed("fuzz_leica", "colors.asc_rgb")},
        {"RGB xyz", "plain.xyz_rgb", seed("fuzz_leica", "plain.xyz_rgb")},
        {"Cgo", "counted.cgo", seed("fuzz_cgo", "counted.cgo")},
        {"STL text", "square.stl", seed("fuzz_stl", "square.stl")},
        {"STL binary", "cube.stl", seed("fuzz_stl", "cube.stl")},
        {"GoCad", "two_surfaces.ts", seed("fuzz_gocad", "two_surfaces.ts")},
        {"ATOS binary", "two_patches.surf", seed("fuzz_atos", "two_patches.surf")},
        {"ATOS text", "patch.atos_ascii", seed("fuzz_atos", "patch.atos_ascii")},
        {"Steinbichler", "scans.ac", seed("fuzz_steinbichler", "scans.ac")},
        {"IGES", "points_and_copious.igs", seed("fuzz_iges", "points_and_copious.igs")},
        {"DICOM slice", "explicit.dcm", seed("fuzz_dicom", "explicit.dcm")},
        {"DICOM archive", "series.dcz", seed("fuzz_dicom", "series.dcz")},
        {"ArcInfo grid", "six.asc_grid", seed("fuzz_arcinfo_grid", "six_lines.asc")},
        {"DEM", "gdal_4x3.dem", seed("fuzz_dem", "gdal_4x3.dem")},
        {"SRTM", "ten.hgt", seed("fuzz_srtm", "ten.hgt")},
        {"Hyscan", "groups.hym", seed("fuzz_hyscan", "xyz_two_groups")},
        {"Kreon planar", "planar.grk", seed("fuzz_kreon", "planar")},
        {"Kreon cylinder", "cylinder.grk", seed("fuzz_kreon", "cylinder_centres")},
        {"Opton", "grid.xyz", seed("fuzz_opton", "two_by_three")},
    };
}

}  // namespace zontest
