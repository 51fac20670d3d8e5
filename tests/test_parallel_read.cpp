// The chunked reading path against the line-by-line one, which is the
// reference: every answer of the text readers and of the STL reader must be
// the same, bit for bit, whatever the chunk size (so chunk boundaries fall
// inside every kind of line) and the number of threads.
#include <gtest/gtest.h>

#include <bit>
#include <cstring>
#include <random>
#include <string>
#include <vector>

#include "RangeScannerFiles.h"
#include "ZonCldImportEngine.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonCloudReadAsciiUserFormat.h"
#include "ZonCloudReadCgoAscii.h"
#include "ZonCloudReadKreonBin.h"
#include "ZonCloudReadLeica.h"
#include "ZonCloudReadOptonBin.h"
#include "ZonCloudReadStl.h"
#include "ZonCloudWorkerPool.h"
#include "ZonError.h"
#include "ZonTestFiles.h"

namespace {

// Everything a reader answered, as bytes: equal records mean equal answers.
class Record {
public:
    template <class T>
    void Values(const char* what, const T* values, std::size_t count)
    {
        _text += std::string(what) + "#" + std::to_string(count) + ":";
        if (values) _text.append(reinterpret_cast<const char*>(values), count * sizeof(T));
    }
    void Text(const std::string& what) { _text += what + ";"; }
    void Box(ZonICloudReadFile& reader)
    {
        ZonMathBox box;
        reader.GetBoundingBox(box);
        const double corners[6] = {box.GetLow()[0],  box.GetLow()[1],  box.GetLow()[2],
                                   box.GetHigh()[0], box.GetHigh()[1], box.GetHigh()[2]};
        Values("box", corners, box.IsEmpty() ? 0 : 6);
    }
    // The call's answers, or the key of the error it raised.
    void Guard(const std::function<void()>& call)
    {
        try {
            call();
        } catch (const ZonError& error) {
            Text("error " + error.GetMessageKey());
        }
    }
    const std::string& Bytes() const { return _text; }

private:
    std::string _text;
};

template <class Reader>
void Cloud(Record& out, Reader& reader)
{
    unsigned n = 0;
    out.Guard([&] {
        const float* points = reader.GetPoints(n);
        out.Values("points", points, 3 * std::size_t{n});
    });
    out.Guard([&] {
        const double* points = reader.GetPointsDouble(n);
        out.Values("doubles", points, 3 * std::size_t{n});
    });
    out.Guard([&] {
        const unsigned char* colors = reader.GetPointColors(n);
        out.Values("colors", colors, colors ? 3 * std::size_t{n} : 0);
        out.Text(std::to_string(reader.GetNumberOfPoints()));
        out.Box(reader);
    });
}

// How a file is read: precision, sampling, and what only some formats have.
struct Settings {
    bool doubles = false;
    float percent = 100.0f;
    bool delimiters = false;  // free ASCII: "G08" and "G09"
    bool keepColors = true;   // RGB and user format
    std::string fdf;          // user format
};

Settings With(bool doubles, float percent, bool delimiters = false, bool keepColors = true, std::string fdf = "")
{
    return Settings{doubles, percent, delimiters, keepColors, std::move(fdf)};
}

std::string ReadAscii(const std::string& path, const Settings& s)
{
    Record out;
    ZonCloudReadAsciiLibre reader{ZonUnicodeString(path)};
    reader.SetDoublePrecision(s.doubles);
    reader.SetSamplingPercent(s.percent);
    out.Guard([&] {
        if (s.delimiters) reader.SetDelimiters(ZonUnicodeString("G08"), ZonUnicodeString("G09"));
        out.Text(std::to_string(reader.GetTypeOfDigitization()) + reader.GetLineFormat() +
                 (reader.IsDecimalPointSwitched() ? "," : "."));
    });
    Cloud(out, reader);
    out.Guard([&] {
        if (reader.GetTypeOfDigitization() == DigitizationScans) {
            reader.BeginGetSetOfScans();
            while (reader.NextSetOfScans()) {
                reader.BeginGetScan();
                while (reader.NextScan()) {
                    unsigned n = 0;
                    const double* points = reader.GetScanPointsDouble(n);
                    out.Values("scan", points, 3 * std::size_t{n});
                }
            }
        }
    });
    return out.Bytes();
}

template <class Reader>
std::string ReadPointLines(const std::string& path, const Settings& s)
{
    Record out;
    Reader reader{ZonUnicodeString(path)};
    reader.SetDoublePrecision(s.doubles);
    reader.SetSamplingPercent(s.percent);
    if constexpr (std::is_same_v<Reader, ZonCloudReadLeica>) reader.SetKeepColors(s.keepColors);
    Cloud(out, reader);
    out.Text(std::to_string(reader.GetCapacity()) + "/" + std::to_string(reader.GetDataStartOffset()) + "/" +
             std::to_string(reader.IsDecimalPointSwapped()));
    return out.Bytes();
}

std::string ReadUserFormat(const std::string& path, const Settings& s)
{
    Record out;
    ZonCloudReadAsciiUserFormat reader{ZonUnicodeString(path)};
    reader.SetFDFile(ZonUnicodeString(s.fdf));
    reader.SetDoublePrecision(s.doubles);
    reader.SetSamplingPercent(s.percent);
    reader.SetKeepColors(s.keepColors);
    Cloud(out, reader);
    out.Guard([&] {
        unsigned n = 0;
        const void* alphas = reader.GetPointAttributes1(n);
        out.Values("alphas", static_cast<const std::int32_t*>(alphas), alphas ? n : 0);
        const void* symbols = reader.GetPointAttributes2(n);
        out.Values("symbols", static_cast<const std::int32_t*>(symbols), symbols ? n : 0);
        const auto* texts = static_cast<const std::string*>(reader.GetPointAttributes3(n));
        for (unsigned i = 0; texts && i < n; ++i) out.Text(texts[i]);
        out.Text(std::to_string(reader.GetCapacity()) + "/" + std::to_string(reader.GetDataStartOffset()) + "/" +
                 std::to_string(reader.GetKeepColors()));
    });
    return out.Bytes();
}

std::string ReadStl(const std::string& path, const Settings& s)
{
    Record out;
    ZonCloudReadStl reader{ZonUnicodeString(path)};
    reader.SetDoublePrecision(s.doubles);
    out.Guard([&] {
        out.Text(std::to_string(reader.IsTextFile()) + "/" + std::to_string(reader.GetNumberOfTriangles()));
        out.Box(reader);
        reader.BeginGetPolygon();
        reader.NextPolygon();
        unsigned n = 0;
        const float* vertices = reader.GetPolygonPoints(n);
        out.Values("vertices", vertices, 3 * std::size_t{n});
        const unsigned* triangles = reader.GetTriangles(n);
        out.Values("triangles", triangles, 3 * std::size_t{n});
        const double* doubles = reader.GetPointsDouble(n);
        out.Values("doubles", doubles, 3 * std::size_t{n});
        out.Text(std::to_string(reader.GetNumberOfPoints()));
    });
    return out.Bytes();
}

using ReadFunction = std::string (*)(const std::string&, const Settings&);

class ParallelRead : public zontest::FilesTest {
protected:
    void TearDown() override
    {
        ZonCloudChunkedText::SetThreshold(0);
        ZonCloudChunkedText::SetChunkSize(0);
        ZonCloudWorkerPool::SetThreadCount(0);
        FilesTest::TearDown();
    }

    // The file read line by line, then in chunks of many sizes on 1 to 3 threads.
    void ExpectSameAnswers(const std::string& name, const std::string& bytes, ReadFunction read,
                           const Settings& settings = {})
    {
        const std::string path = Write(name, bytes);
        ZonCloudChunkedText::SetThreshold(UINT64_MAX);
        const std::string reference = read(path, settings);
        ZonCloudChunkedText::SetThreshold(1);
        for (const std::size_t chunk : {5, 61, 509, 4096})
            for (const unsigned threads : {1u, 3u}) {
                ZonCloudChunkedText::SetChunkSize(chunk);
                ZonCloudWorkerPool::SetThreadCount(threads);
                const std::string chunked = read(path, settings);
                if (chunked != reference) {
                    ADD_FAILURE() << name << ": chunks of " << chunk << " bytes on " << threads
                                  << " threads answer otherwise (double " << settings.doubles << ", "
                                  << settings.percent << " %)";
                    return;
                }
            }
    }

public:
    std::mt19937 random_{17};

    int Pick(int n) { return std::uniform_int_distribution<int>(0, n - 1)(random_); }
    std::string Number(char point)
    {
        std::string text = std::to_string(Pick(2000) - 1000) + point + std::to_string(Pick(1000000));
        if (Pick(10) == 0) text += "e" + std::to_string(Pick(7) - 3);
        if (Pick(25) == 0) text = Pick(2) ? "-0" : "1e400";
        return text;
    }
    // A line that no reader takes for a point.
    std::string Unknown()
    {
        const int kind = Pick(16);
        if (kind == 0) return std::string(600 + Pick(500), 'w');  // cut in pieces of 511
        if (kind < 6) return "# comment";
        if (kind < 11) return "";
        return std::string("nul\0byte", 8);
    }
};

// Lines of the kinds `line` makes, with unknown lines in runs of every length,
// LF or CR LF ends and, now and then, a last line without its end.
template <class MakeLine>
std::string Lines(ParallelRead& test, int count, int unknownPercent, MakeLine line, int unknownRun = 3)
{
    std::string text;
    const std::string end = test.Pick(2) ? "\r\n" : "\n";
    for (int i = 0; i < count; ++i) {
        if (test.Pick(100) < unknownPercent)
            for (int k = 1 + test.Pick(unknownRun); k > 0; --k) text += test.Unknown() + end;
        text += line(i) + end;
    }
    if (test.Pick(2)) text.resize(text.size() - end.size());
    return text;
}

TEST_F(ParallelRead, FreeAsciiLayoutsDelimitersAndUnknownLines)
{
    for (int round = 0; round < 12; ++round) {
        const char point = round % 4 == 3 ? ',' : '.';
        const int layout = round % 3;
        const bool scans = round % 2 == 1;
        const auto line = [&](int i) {
            if (scans && i % 37 == 0) return std::string(i % 74 == 0 ? "G08(1)" : "G09");
            const std::string x = Number(point), y = Number(point), z = Number(point);
            if (layout == 0) return x + " " + y + " " + z;
            if (layout == 1) return "X " + x + " Y " + y + " Z " + z + (i % 5 == 0 ? " trailing" : "");
            return x + ";" + y + ";" + z;
        };
        const std::string text = Lines(*this, 300, round < 8 ? 4 : 3, line, round < 8 ? 3 : 120);
        for (const Settings& s : {With(false, 100.0f, scans), With(true, 37.0f, scans)})
            ExpectSameAnswers("f" + std::to_string(round) + ".asc", text, ReadAscii, s);
    }
}

TEST_F(ParallelRead, FreeAsciiLimitsOfUnknownLines)
{
    const std::string point = "1.5 2.5 3.5\n";
    // 100 unknown lines in a row pass, 101 do not; 300 in all pass, 301 do not.
    for (const int run : {100, 101})
        ExpectSameAnswers("run.asc", point + point + zontest::Repeat("?\n", run) + point, ReadAscii);
    for (const int all : {300, 301})
        ExpectSameAnswers("all.asc", point + point + zontest::Repeat("?\n" + point, all), ReadAscii);
    ExpectSameAnswers("comma.asc", zontest::Repeat("1,5 2,5 3,5\r\n", 400), ReadAscii);
}

TEST_F(ParallelRead, PointLineFilesCountEndAndColours)
{
    for (int round = 0; round < 10; ++round) {
        const char point = round % 3 == 2 ? ',' : '.';
        const auto line = [&](int i) {
            std::string text = Number(point) + " " + Number(point) + " " + Number(point);
            switch (i % 4) {
                case 1: return text + " " + std::to_string(Pick(300)) + " 20 30";
                case 2: return text + " 99 10 20 " + std::to_string(Pick(300));
                case 3: return text + " 4";
                default: return text;
            }
        };
        std::string text = (round % 2 ? std::to_string(1 + Pick(500)) + "\n" : std::string()) +
                           Lines(*this, 250, round < 8 ? 5 : 2, line, round < 8 ? 3 : 220);
        if (round == 4) text += "\n**end cloud**\n1 2 3\n";
        for (const Settings& s : {With(false, 100.0f), With(true, 50.0f, false, false)}) {
            ExpectSameAnswers("p" + std::to_string(round) + ".asc_rgb", text, ReadPointLines<ZonCloudReadLeica>, s);
            ExpectSameAnswers("p" + std::to_string(round) + ".cgo", text, ReadPointLines<ZonCloudReadCgoAscii>, s);
        }
    }
    // A decimal comma is only tried after 200 lines in a row not understood.
    const std::string comma = zontest::Repeat("1,5 2,5 3,5\n", 250);
    ExpectSameAnswers("comma.cgo", comma, ReadPointLines<ZonCloudReadCgoAscii>);
    ExpectSameAnswers("short.cgo", comma.substr(0, 12 * 150), ReadPointLines<ZonCloudReadCgoAscii>);
}

TEST_F(ParallelRead, UserFormatIndicesCarryOverLines)
{
    struct Case {
        const char* fdf;
        std::string (*line)(ParallelRead&, int);
    };
    const Case cases[] = {
        {"X Y Z\n", [](ParallelRead& t, int) { return t.Number('.') + " " + t.Number(',') + " " + t.Number('.') + " "; }},
        {"X Y Z R G B A\n",
         [](ParallelRead& t, int i) {
             return t.Number('.') + " 2 3 " + std::to_string(t.Pick(i > 200 ? 300 : 256)) + " 5 6 7 ";
         }},
        // COLOR and SYMBOL carry over to the lines that do not set them
        // (incomplete ones included); texts may hold quoted blanks.
        {"X Y Z COLOR SYMBOL TEXT\n",
         [](ParallelRead& t, int i) {
             const std::string head = t.Number('.') + " 1 2";
             if (i % 3 == 0) return head + " x y \"a b\" ";
             return head + " " + std::to_string(t.Pick(i > 220 ? 9 : 8)) + " " + std::to_string(t.Pick(9)) + " \"t" +
                    std::to_string(i) + "\" ";
         }},
    };
    int n = 0;
    for (const Case& c : cases) {
        const std::string fdf = Write("f" + std::to_string(n) + ".fdf", c.fdf);
        const std::string text = "! header\n" + Lines(*this, 240, 6, [&](int i) { return c.line(*this, i); });
        for (const Settings& s : {With(false, 100.0f, false, true, fdf), With(true, 30.0f, false, false, fdf)})
            ExpectSameAnswers("u" + std::to_string(n) + ".asc_fmt", text, ReadUserFormat, s);
        ++n;
    }
}

TEST_F(ParallelRead, TextStlFacetsFailuresAndSeparators)
{
    for (int round = 0; round < 8; ++round) {
        const char point = round == 5 ? ',' : '.';
        std::vector<std::string> corners;
        for (int i = 0; i < 40; ++i) corners.push_back(Number(point) + " " + Number(point) + " " + Number(point));
        std::string text = "solid s\n";
        const std::string end = round % 2 ? "\r\n" : "\n";
        for (int f = 0; f < 120; ++f) {
            text += "facet normal 0 0 1" + end + "outer loop" + end;
            for (int k = 0; k < 3; ++k) {
                // Shared corners merge; a few lines fail (in runs past the limit in some rounds).
                const bool fails = Pick(100) < (round >= 6 ? 20 : 3);
                text += (fails ? "vertex 1 x 2" : "  VERTEX " + corners[static_cast<std::size_t>(Pick(40))]) + end;
            }
            text += "endloop" + end + "endfacet" + end;
        }
        text += "vertex 9 9 9\nendsolid\n";  // a stray corner
        ExpectSameAnswers("t" + std::to_string(round) + ".stl", text, ReadStl, With(round % 2 == 0, 100.0f));
    }
}

TEST_F(ParallelRead, BinaryStlMergesInOneMappedPass)
{
    const auto binary = [](const std::vector<float>& corners, std::uint32_t count, bool reversed, std::size_t cut) {
        std::string out(80, '\0');
        const auto put = [&](std::uint32_t word) {
            if (reversed) word = __builtin_bswap32(word);
            out.append(reinterpret_cast<const char*>(&word), 4);
        };
        put(count);
        for (std::size_t i = 0; i < corners.size(); i += 9) {
            for (int k = 0; k < 3; ++k) put(0);
            for (std::size_t k = 0; k < 9; ++k) put(std::bit_cast<std::uint32_t>(corners[i + k]));
            out.append(2, '\0');
        }
        out.resize(out.size() - cut);
        return out;
    };
    std::vector<float> corners;
    const float values[] = {0.0f, -0.0f, 1.0f, 2.5f, std::numeric_limits<float>::quiet_NaN(), 1e30f, -3.0f};
    for (int i = 0; i < 9 * 300; ++i) corners.push_back(values[Pick(7)]);
    for (const bool reversed : {false, true})
        for (const std::size_t cut : {0, 2, 3})
            ExpectSameAnswers("b.stl", binary(corners, 300 + static_cast<std::uint32_t>(cut) * 50, reversed, cut),
                              ReadStl);
    const std::vector<float> flat(9 * 50, 1.0f);
    ExpectSameAnswers("flat.stl", binary(flat, 50, false, 0), ReadStl);
}

// Rows and validity of every grid row, as bytes.
std::string GridRows(ZonICloudReadGridFile& grids)
{
    Record out;
    grids.BeginGetGrid();
    while (grids.NextGrid()) {
        grids.BeginGetGridPoints();
        unsigned n = 0;
        const unsigned char* valid = nullptr;
        while (const float* points = grids.GetGridPoints(n, valid)) {
            out.Values("row", points, 3 * std::size_t{n});
            out.Values("valid", valid, n);
        }
    }
    return out.Bytes();
}

std::string GridRows(const ZonCldBody& body)
{
    Record out;
    for (const auto& set : body.GetSetsOfGrids())
        for (const auto& grid : set->GetGrids())
            for (const ZonCldGrid::Row& row : grid->GetRows()) {
                std::vector<float> points;
                for (std::size_t i = 0; i < row.points.GetNumberOfPoints(); ++i)
                    for (int a = 0; a < 3; ++a) points.push_back(static_cast<float>(row.points.GetPoint(i)[a]));
                out.Values("row", points.data(), points.size());
                out.Values("valid", row.valid.data(), row.valid.size());
            }
    return out.Bytes();
}

// Range grids large enough for several batches of rows: the rows built on
// the workers are those of one thread, an import takes each over and holds
// the same rows, and a walk after it builds them again.
TEST_F(ParallelRead, GridRowsBuiltInBatchesAndTakenOverByTheImport)
{
    zontest::KreonGrid kreon;
    kreon.columns = 700;
    kreon.rows = 1700;  // 4.8 MB of values
    zontest::OptonGrid opton;
    opton.rows = 800;
    opton.columns = 400;  // 5.1 MB of records
    for (int i = 0; i < 700 * 1700; ++i) kreon.values.push_back(Pick(10) == 0 ? -32767.0f : static_cast<float>(Pick(1000)) / 7);
    for (int i = 0; i < 800 * 400; ++i)
        opton.records.push_back({static_cast<float>(i % 400), static_cast<float>(i / 400), static_cast<float>(Pick(100)),
                                 Pick(10) == 0 ? -1.0f : 0.0f});
    const std::vector<std::string> paths = {Write("g.grk", zontest::KreonFile(kreon)), Write("g.xyz", zontest::OptonFile(opton))};
    const auto open = [&](std::size_t i) -> std::shared_ptr<ZonCloudReadFile> {
        if (i == 0) return std::make_shared<ZonCloudReadKreonBin>(paths[0]);
        return std::make_shared<ZonCloudReadOptonBin>(paths[1]);
    };
    for (std::size_t i = 0; i < paths.size(); ++i)
        for (const float percent : {100.0f, 30.0f}) {
            ZonCloudWorkerPool::SetThreadCount(1);
            auto reader = open(i);
            reader->SetSamplingPercent(percent);
            const std::string reference = GridRows(dynamic_cast<ZonICloudReadGridFile&>(*reader));
            ZonCloudWorkerPool::SetThreadCount(3);
            reader = open(i);
            reader->SetSamplingPercent(percent);
            auto& grids = dynamic_cast<ZonICloudReadGridFile&>(*reader);
            EXPECT_EQ(GridRows(grids), reference) << paths[i] << " at " << percent << " %";

            ZonGeoFactoryProtected factory;
            const ZonCldBody_var body = factory.CreateCldBody();
            std::vector<std::string> messages;
            std::string statistics;
            ZonCldImportEngine::InsertFile(*body, factory, reader, false, ZonICkeUnit::FromName("mm"), ZonMathBox(), 1.0,
                                           messages, statistics, true);
            EXPECT_EQ(GridRows(*body), reference) << paths[i] << " at " << percent << " %";
            EXPECT_EQ(GridRows(grids), reference) << paths[i] << " walked after the import";
        }
}

}  // namespace
