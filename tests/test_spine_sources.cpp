// The byte and line sources every reader reads through, and the mesh helpers
// the mesh readers share: the file and memory forms give the same bytes and
// lines, size checks never overflow, short reads are errors.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <memory>
#include <limits>

#include "ZonCloudByteSource.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudPolygonCursor.h"
#include "ZonCloudReadAsciiLibre.h"
#include "ZonCloudReadCgoAscii.h"
#include "ZonCloudReadLeica.h"
#include "ZonCloudReadProgress.h"
#include "ZonCloudReadStl.h"
#include "ZonCloudSubMesh.h"
#include "ZonTestFiles.h"

namespace {

using namespace zontest;

class SourcesTest : public FilesTest {
protected:
    // Opens the same bytes as a file and from memory.
    void OpenBoth(const std::string& bytes)
    {
        bytes_ = bytes;
        file_.Open(Write("bytes.bin", bytes));
        memory_.OpenMemory(bytes_.data(), bytes_.size());
    }
    std::string bytes_;
    ZonCloudByteSource file_, memory_;
};

TEST_F(SourcesTest, FileAndMemoryGiveTheSameBytesSizeAndPositions)
{
    OpenBoth("\x01\x02\x03\x04\x05\x06\x07\x08\x09");
    for (ZonCloudByteSource* source : {&file_, &memory_}) {
        EXPECT_EQ(source->Size(), 9);
        source->Seek(1);
        EXPECT_EQ(source->ReadLittle<std::uint16_t>(), 0x0302u);
        EXPECT_EQ(source->ReadBig<std::uint32_t>(), 0x04050607u);
        EXPECT_EQ(source->Tell(), 7u);
        char rest[8];
        EXPECT_EQ(source->ReadSome(rest, sizeof rest), 2u);  // short only at the end
        EXPECT_EQ(ErrorKeyAndSeverity([&] { source->Read(rest, 1); }), "ZonCloudOperErrorTool.ERR_ENODATA/2");
        source->Seek(100);  // past the end: nothing to read, no error until an exact read
        EXPECT_EQ(source->ReadSome(rest, 1), 0u);
    }
}

// Progress counts what the file sources of its thread read, while it lives;
// memory sources and sources opened outside it count nowhere.
TEST_F(SourcesTest, ProgressCountsFileBytesReadInItsScope)
{
    const std::string path = Write("cloud.asc", Repeat("1 2 3\n", 1000));
    ZonCloudByteSource before;
    before.Open(path);
    ZonCloudReadProgress outer;
    {
        ZonCloudReadProgress inner;
        ZonCloudReadAsciiLibre reader{ZonUnicodeString(path)};
        EXPECT_EQ(reader.GetNumberOfPoints(), 1000);
        EXPECT_GE(inner.BytesRead(), 6000u);
        EXPECT_LE(inner.BytesRead(), 2 * 6000u);  // at most a second pass
        char byte = 0;
        before.Read(&byte, 1);
        memory_.OpenMemory("abc", 3);
        memory_.Read(&byte, 1);
    }
    EXPECT_EQ(outer.BytesRead(), 0u);
    EXPECT_EQ(ZonCloudReadProgress::Current(), &outer);

    // The chunked path reads the mapped file: its stitched parts count.
    ZonCloudChunkedText::SetThreshold(1);
    ZonCloudReadAsciiLibre mapped{ZonUnicodeString(path)};
    EXPECT_EQ(mapped.GetNumberOfPoints(), 1000);
    ZonCloudChunkedText::SetThreshold(0);
    EXPECT_GE(outer.BytesRead(), 6000u);
    EXPECT_LE(outer.BytesRead(), 2 * 6000u);
}

TEST(ByteSource, LoadsOfEachWidthAndOrder)
{
    const unsigned char bytes[8] = {0x3f, 0xf0, 0, 0, 0, 0, 0, 0};
    EXPECT_EQ(ZonCloudByteSource::LoadBig<double>(bytes), 1.0);
    EXPECT_EQ(ZonCloudByteSource::LoadBig<std::int16_t>(bytes), 0x3ff0);
    const unsigned char one[4] = {0, 0, 0x80, 0x3f};
    EXPECT_EQ(ZonCloudByteSource::LoadLittle<float>(one), 1.0f);
    const unsigned char minus[8] = {0xff, 0xff, 0xff, 0xff, 0xff, 0xff, 0xff, 0xff};
    EXPECT_EQ(ZonCloudByteSource::LoadLittle<std::int64_t>(minus), -1);
    EXPECT_EQ(ZonCloudByteSource::LoadLittle<std::uint32_t>(minus), 0xffffffffu);
}

TEST(ByteSource, FitsChecksInSixtyFourBitsWithoutOverflow)
{
    static const char bytes[100] = {};
    ZonCloudByteSource source;
    source.OpenMemory(bytes, sizeof bytes);
    constexpr std::uint64_t max = std::numeric_limits<std::uint64_t>::max();
    struct Case {
        std::uint64_t offset, count, size;
        bool fits;
    } cases[] = {
        {0, 100, 1, true},    {84, 0, 50, true},          {84, 1, 16, true},  {84, 1, 17, false},
        {101, 0, 1, false},   {0, max, 2, false},         {1, max / 2, 2, false},
        {max, 1, 1, false},   {0, 0x100000000ull, 50, false},
    };
    for (const Case& c : cases) EXPECT_EQ(source.Fits(c.offset, c.count, c.size), c.fits) << c.offset << " " << c.count;
    EXPECT_EQ(ErrorKeyAndSeverity([&] { source.CheckFits(0, max, 8); }), "ZonCloudReadNLSTool.ERR_UnknownData/2");
}

TEST_F(SourcesTest, MissingFileAndDirectoryRaiseTheSystemMessage)
{
    ZonCloudByteSource source;
    EXPECT_EQ(ErrorKeyAndSeverity([&] { source.Open(Path("missing")); }), "ZonCloudOperErrorTool.ERR_ENOENT/4");
    EXPECT_EQ(ErrorKeyAndSeverity([&] { source.Open(Path("")); }), "ZonCloudOperErrorTool.ERR_EISDIR/4");
    EXPECT_FALSE(source.IsOpen());
}

// Pieces as fgets with a buffer one longer than the piece limit cuts them.
TEST_F(SourcesTest, LinesArePiecesWithTheirNewlineFromFileAndMemory)
{
    const std::string long_line(10, 'x');
    OpenBoth("a\r\n\nbb\n" + long_line + "\nlast");
    for (ZonCloudByteSource* source : {&file_, &memory_}) {
        ZonCloudLineSource lines(4);
        lines.Start(*source);
        std::vector<std::string> got;
        std::vector<std::uint64_t> offsets;
        std::string_view line;
        while (lines.Next(line)) {
            got.emplace_back(line);
            offsets.push_back(lines.LineOffset());
        }
        EXPECT_EQ(got, (std::vector<std::string>{"a\r\n", "\n", "bb\n", "xxxx", "xxxx", "xx\n", "last"}));
        EXPECT_EQ(offsets, (std::vector<std::uint64_t>{0, 3, 4, 7, 11, 15, 18}));
        EXPECT_EQ(lines.NextOffset(), bytes_.size());
    }
}

TEST_F(SourcesTest, StartComesBackToAnyOffsetAcrossBlocks)
{
    std::string text;
    for (int i = 0; i < 20000; ++i) text += std::to_string(i) + "\n";
    OpenBoth(text);
    ZonCloudLineSource lines(511, 4096);  // many blocks
    lines.Start(file_);
    std::string_view line;
    std::uint64_t at = 0;
    for (int i = 0; i < 15000; ++i) {
        ASSERT_TRUE(lines.Next(line));
        if (i == 12345) at = lines.LineOffset();
    }
    for (std::uint64_t offset : {at, std::uint64_t{0}, at}) {
        lines.Start(file_, offset);
        ASSERT_TRUE(lines.Next(line));
        EXPECT_EQ(line, offset ? "12345\n" : "0\n");
    }
    // Someone else moved the file: coming back must not trust the buffer.
    lines.Start(file_, 0);
    ASSERT_TRUE(lines.Next(line));
    file_.Seek(6);
    lines.Start(file_, 2);
    ASSERT_TRUE(lines.Next(line));
    EXPECT_EQ(line, "1\n");
}

// Every reader answers the same from memory (archive members, fuzz inputs) as from the file.
TEST_F(SourcesTest, ReadersAnswerTheSameFromMemoryAsFromTheFile)
{
    std::string binaryStl(80, '\0');
    const std::uint32_t one = 1;
    binaryStl.append(reinterpret_cast<const char*>(&one), 4);
    for (float v : {0.f, 0.f, 1.f, 0.f, 0.f, 0.f, 1.f, 0.f, 0.f, 0.f, 1.f, 0.f}) binaryStl.append(reinterpret_cast<const char*>(&v), 4);
    binaryStl.append(2, '\0');
    struct Case {
        const char* name;
        std::string bytes;
        std::function<std::shared_ptr<ZonCloudReadFile>(const std::string&)> create;
    };
    const std::vector<Case> cases = {
        {"binary stl", binaryStl, [](const std::string& f) { return std::make_shared<ZonCloudReadStl>(f); }},
        {"text stl", "solid s\nfacet normal 0 0 1\nouter loop\nvertex 0 0 0\nvertex 1 0 0\nvertex 0 1.5 0\nendloop\nendfacet\n",
         [](const std::string& f) { return std::make_shared<ZonCloudReadStl>(f); }},
        {"free ascii", "1 2 3\r\n4,5 6 7\n8 9 10\n", [](const std::string& f) { return std::make_shared<ZonCloudReadAsciiLibre>(f); }},
        {"rgb", "2\n1 2 3 10 20 30\n4 5 6 40 50 60\n", [](const std::string& f) { return std::make_shared<ZonCloudReadLeica>(f); }},
        {"cgo", "2\n1 2 3\n4 5 6\n", [](const std::string& f) { return std::make_shared<ZonCloudReadCgoAscii>(f); }},
    };
    for (const Case& c : cases) {
        const std::string path = Write("input", c.bytes);
        const auto fromFile = c.create(path);
        const auto fromMemory = c.create("not/a/file");
        fromMemory->SetSourceMemory(c.bytes.data(), c.bytes.size());
        for (const auto& reader : {fromFile, fromMemory}) reader->SetSamplingPercent(50.0f);
        unsigned n1 = 0, n2 = 0;
        const double* p1 = fromFile->GetPointsDouble(n1);
        const double* p2 = fromMemory->GetPointsDouble(n2);
        ASSERT_EQ(n1, n2) << c.name;
        ASSERT_GT(n1, 0u) << c.name;
        EXPECT_TRUE(std::equal(p1, p1 + 3 * n1, p2)) << c.name;
        ZonMathBox b1, b2;
        fromFile->GetBoundingBox(b1);
        fromMemory->GetBoundingBox(b2);
        EXPECT_TRUE(b1.IsSameAs(b2)) << c.name;
        EXPECT_EQ(fromFile->GetTypeOfDigitization(), fromMemory->GetTypeOfDigitization()) << c.name;
    }
}

TEST(LineSource, ChompRemovesOneLineEnd)
{
    for (const auto& [in, out] : std::vector<std::pair<std::string, std::string>>{
             {"a b\r\n", "a b"}, {"a\n", "a"}, {"a\r", "a"}, {"a", "a"}, {"\r\n", ""}, {"a\r\r\n", "a\r"}, {"", ""}})
        EXPECT_EQ(ZonCloudLineSource::Chomp(in), out) << in;
}

TEST(SubMesh, KeepsTrianglesWholeInsideAndRenumbers)
{
    // Four vertices on the x axis, two triangles; the box holds the first three.
    const float vertices[] = {0, 0, 0, 1, 0, 0, 2, 0, 0, 3, 0, 0};
    const double verticesDouble[] = {0, 0, 0, 1, 0, 0, 2, 0, 0, 3, 0, 0};
    const std::uint32_t triangles[] = {2, 1, 0, 1, 2, 3};
    const ZonMathBox file(0, 3, 0, 0, 0, 0);
    const ZonMathBox box(0, 2.5, -1, 1, -1, 1);
    ZonCloudSubMesh sub, subDouble;
    sub.Compute(box, file, vertices, 4, triangles, 2);
    subDouble.Compute(box, file, verticesDouble, 4, triangles, 2);
    for (const ZonCloudSubMesh* s : {&sub, &subDouble}) {
        EXPECT_EQ(s->Vertices(), (std::vector<float>{0, 0, 0, 1, 0, 0, 2, 0, 0}));
        EXPECT_EQ(s->Triangles(), (std::vector<std::uint32_t>{2, 1, 0}));
        EXPECT_TRUE(s->IsFor(box));
        EXPECT_FALSE(s->IsFor(file));
    }
    // The file's own upper face is closed: x = 3 is inside a box ending at 3.
    sub.Compute(ZonMathBox(1, 3, -1, 1, -1, 1), file, vertices, 4, triangles, 2);
    EXPECT_EQ(sub.Triangles(), (std::vector<std::uint32_t>{0, 1, 2}));
    sub.Compute(ZonMathBox(5, 6, 5, 6, 5, 6), file, vertices, 4, triangles, 2);
    EXPECT_EQ(sub.TriangleCount(), 0u);
    EXPECT_EQ(sub.VertexCount(), 0u);
}

TEST(PolygonCursor, WalksPolygonsTrianglesAndBoxTriangles)
{
    ZonCloudPolygonCursor cursor;
    EXPECT_EQ(ErrorKeyAndSeverity([&] { cursor.HasNext(); }), "ZonCloudReadNLSTool.ERR_BeginGetPolygonNotDone/1");
    const std::uint32_t triangles[] = {0, 1, 2, 2, 1, 3};
    cursor.Begin(2);
    for (std::size_t polygon = 0; polygon < 2; ++polygon) {
        ASSERT_TRUE(cursor.HasNext());
        cursor.Advance();
        EXPECT_EQ(cursor.Current(), polygon);
        EXPECT_EQ(cursor.NextTriangle(triangles, 2), triangles);
        EXPECT_EQ(cursor.NextTriangle(triangles, 2), triangles + 3);
        EXPECT_EQ(cursor.NextTriangle(triangles, 2), nullptr);
    }
    EXPECT_FALSE(cursor.HasNext());
    EXPECT_EQ(cursor.NextTriangleInBox(), nullptr);
    cursor.SetBoxTriangles(triangles + 3, 1);
    EXPECT_EQ(cursor.NextTriangleInBox(), triangles + 3);
    EXPECT_EQ(cursor.NextTriangleInBox(), nullptr);
}

}  // namespace
