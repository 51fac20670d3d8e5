// Medical image slices and ".dcz" archives of them: placement, densities,
// greys, the encodings real tools write, refusals, stacking, and the zip
// service's limits.
#include <gtest/gtest.h>
#include <zip.h>

#include <cmath>
#include <cstdint>
#include <cstring>
#include <nlohmann/json.hpp>

#include "ZonCldImportEngine.h"
#include "ZonCloudReadDicom.h"
#include "ZonTestFiles.h"
#include "ZonZipReader.h"

namespace {

using zontest::ErrorKey;

void Put16(std::string& s, std::uint32_t v)
{
    s += static_cast<char>(v & 0xFF);
    s += static_cast<char>((v >> 8) & 0xFF);
}
void Put32(std::string& s, std::uint32_t v)
{
    Put16(s, v & 0xFFFF);
    Put16(s, v >> 16);
}

// A slice written element by element, in the form real tools write.
struct Slice {
    std::string syntax = "1.2.840.10008.1.2.1";
    bool explicitVr = true;
    std::string body;

    Slice& Element(std::uint16_t group, std::uint16_t element, const char* vr, const std::string& value,
                   std::uint32_t length = 0)
    {
        Put16(body, group);
        Put16(body, element);
        const std::uint32_t n = length ? length : static_cast<std::uint32_t>(value.size());
        const bool isLong = std::string("OB OD OF OL OV OW SQ SV UC UN UR UT UV").find(vr) != std::string::npos;
        if (!explicitVr || group == 0xFFFE) {
            Put32(body, n);
        } else if (isLong) {
            body += std::string(vr) + std::string(2, '\0');
            Put32(body, n);
        } else {
            body += vr;
            Put16(body, n);
        }
        body += value;
        return *this;
    }
    Slice& Text(std::uint16_t group, std::uint16_t element, const char* vr, std::string text)
    {
        if (text.size() % 2) text += ' ';
        return Element(group, element, vr, text);
    }
    Slice& Us(std::uint16_t group, std::uint16_t element, std::uint32_t value)
    {
        std::string v;
        Put16(v, value);
        return Element(group, element, "US", v);
    }
    Slice& Image(std::uint32_t rows, std::uint32_t columns, const std::string& photometric = "MONOCHROME2 ")
    {
        Us(0x0028, 0x0002, 1);
        Element(0x0028, 0x0004, "CS", photometric);
        Us(0x0028, 0x0010, rows);
        Us(0x0028, 0x0011, columns);
        return Us(0x0028, 0x0100, 16);
    }
    Slice& Pixels(const std::vector<std::uint16_t>& values, std::uint32_t length = 0)
    {
        std::string v;
        for (std::uint16_t x : values) Put16(v, x);
        return Element(0x7FE0, 0x0010, "OW", v, length);
    }
    std::string Bytes() const
    {
        std::string meta;
        std::string uid = syntax;
        if (uid.size() % 2) uid += '\0';
        Put16(meta, 0x0002);
        Put16(meta, 0x0010);
        meta += "UI";
        Put16(meta, static_cast<std::uint32_t>(uid.size()));
        meta += uid;
        return std::string(128, '\0') + "DICM" + (syntax.empty() ? "" : meta) + body;
    }
};

// A 2 × 3 slice with the given window and rescale (empty: none).
Slice Windowed(const std::vector<std::uint16_t>& pixels, const std::string& centre, const std::string& width,
               const std::string& slope = "", const std::string& intercept = "")
{
    Slice s;
    s.Image(1, static_cast<std::uint32_t>(pixels.size()));
    if (!centre.empty()) s.Text(0x0028, 0x1050, "DS", centre).Text(0x0028, 0x1051, "DS", width);
    if (!intercept.empty()) s.Text(0x0028, 0x1052, "DS", intercept).Text(0x0028, 0x1053, "DS", slope);
    return s.Pixels(pixels);
}

struct Read {
    std::vector<float> points;
    std::vector<int> greys;
    std::vector<std::string> texts;
    std::uint64_t slices = 0;
};

Read ReadBytes(const std::string& bytes, const std::string& name = "m.dcm")
{
    ZonCloudReadDicom reader(name);
    reader.SetSourceMemory(bytes.data(), bytes.size());
    Read r;
    unsigned n = 0;
    const float* p = reader.GetPoints(n);
    r.points.assign(p, p + 3 * n);
    const unsigned char* c = reader.GetPointColors(n);
    for (unsigned i = 0; i < n; ++i) {
        EXPECT_TRUE(c[3 * i] == c[3 * i + 1] && c[3 * i] == c[3 * i + 2]);
        r.greys.push_back(c[3 * i]);
    }
    const auto* t = static_cast<const std::string*>(reader.GetPointAttributes3(n));
    r.texts.assign(t, t + n);
    r.slices = reader.GetFileCounts().front().second;
    return r;
}

std::string Zip(const std::vector<std::pair<std::string, std::string>>& members)
{
    zip_error_t error;
    zip_error_init(&error);
    zip_source_t* buffer = zip_source_buffer_create(nullptr, 0, 0, &error);
    zip_source_keep(buffer);
    zip_t* archive = zip_open_from_source(buffer, ZIP_TRUNCATE, &error);
    for (const auto& [name, bytes] : members) {
        if (name.back() == '/') {
            zip_dir_add(archive, name.c_str(), 0);
            continue;
        }
        zip_source_t* member = zip_source_buffer(archive, bytes.data(), bytes.size(), 0);
        zip_file_add(archive, name.c_str(), member, 0);
    }
    zip_close(archive);
    zip_source_open(buffer);
    zip_source_seek(buffer, 0, SEEK_END);
    const auto size = static_cast<std::size_t>(zip_source_tell(buffer));
    zip_source_seek(buffer, 0, SEEK_SET);
    std::string out(size, '\0');
    zip_source_read(buffer, out.data(), size);
    zip_source_close(buffer);
    zip_source_free(buffer);
    return out;
}

TEST(DicomGrey, WindowsRescaleAndTheLow8BitsOfGreysAbove255)
{
    struct Case {
        const char* what;
        Slice slice;
        std::vector<int> greys;
    };
    const Case cases[] = {
        // d = raw - 1024: -160, 240, 40, -1024 (clamped to -160), 976 (clamped to 240).
        {"centre 40 width 400", Windowed({864, 1264, 1064, 0, 2000}, "40", "400", "1", "-1024"), {0, 255, 127, 0, 255}},
        // lo = 200 is not negative: no offset, 300 gives 382, stored as 126; 400 gives 510 -> 254.
        {"centre 300 width 200", Windowed({300, 200, 400, 100}, "300", "200"), {126, 255, 254, 255}},
        {"no window: the slice's min and max", Windowed({10, 20, 30}, "", ""), {0, 127, 255}},
        {"no window ignores the rescale", Windowed({10, 20, 30}, "", "", "2", "100"), {0, 127, 255}},
        {"a zero width is no window", Windowed({10, 20, 30}, "40", "0"), {0, 127, 255}},
        {"the rescale moves the grey with a window", Windowed({20, 20}, "40", "400", "2", "0"), {127, 127}},
        {"without it", Windowed({20, 20}, "40\\50", "400\\10"), {114, 114}},
        {"one value: grey 0", Windowed({7, 7}, "", ""), {0, 0}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        EXPECT_EQ(ReadBytes(c.slice.Bytes()).greys, c.greys);
    }
    // The texts always show the stored value, whatever the window and rescale.
    EXPECT_EQ(ReadBytes(Windowed({864, 65535}, "40", "400", "1", "-1024").Bytes()).texts,
              (std::vector<std::string>{"Density = 864", "Density = 65535"}));
}

TEST(DicomPlacement, NonSquareSpacingAndObliqueOrientation)
{
    // Columns grow along (0.6, 0.8, 0), rows along (0, 0, -1); 0.5 between rows, 2 between columns.
    Slice s;
    s.Image(2, 3)
        .Text(0x0020, 0x0032, "DS", "10\\-20\\+30.5")
        .Text(0x0020, 0x0037, "DS", "0.6\\0.8\\0\\0\\0\\-1")
        .Text(0x0028, 0x0030, "DS", "0.5\\2")
        .Pixels({1, 2, 3, 4, 5, 6});
    const Read r = ReadBytes(s.Bytes());
    const std::vector<float> expected = {
        10, -20, 30.5f,   11.2f, -18.4f, 30.5f,   12.4f, -16.8f, 30.5f,
        10, -20, 30.0f,   11.2f, -18.4f, 30.0f,   12.4f, -16.8f, 30.0f,
    };
    ASSERT_EQ(r.points.size(), expected.size());
    for (std::size_t i = 0; i < expected.size(); ++i) EXPECT_NEAR(r.points[i], expected[i], 1e-5) << i;
}

TEST(DicomEncodings, RealToolFormsReadAlike)
{
    const auto image = [](Slice s, const std::string& photometric = "MONOCHROME2 ") {
        return s.Image(1, 3, photometric).Text(0x0020, 0x0032, "DS", "1\\2\\3").Pixels({5, 6, 7});
    };
    Slice implicitVr;
    implicitVr.syntax = "1.2.840.10008.1.2";
    implicitVr.explicitVr = false;
    Slice unnamedImplicit = implicitVr;
    unnamedImplicit.syntax = "";
    // A sequence of undefined length holding an item of undefined length
    // with a nested sequence, and a defined-length item: all skipped.
    const auto withSequence = [](bool explicitVr) {
        Slice s;
        s.explicitVr = explicitVr;
        if (!explicitVr) s.syntax = "1.2.840.10008.1.2";
        s.Element(0x0008, 0x1140, "SQ", "", 0xFFFFFFFF).Element(0xFFFE, 0xE000, "", "", 0xFFFFFFFF);
        s.Element(0x0008, 0x1150, "SQ", "", 0xFFFFFFFF).Element(0xFFFE, 0xE000, "", "AB");
        s.Element(0xFFFE, 0xE0DD, "", "").Text(0x0008, 0x1155, "UI", "1.2.3");
        s.Element(0xFFFE, 0xE00D, "", "").Element(0xFFFE, 0xE0DD, "", "");
        return s;
    };
    struct Case {
        const char* what;
        std::string bytes;
    } cases[] = {
        {"implicit VR", image(implicitVr).Bytes()},
        {"implicit VR without a named syntax", image(unnamedImplicit).Bytes()},
        {"undefined-length sequences, explicit", image(withSequence(true)).Bytes()},
        {"undefined-length sequences, implicit", image(withSequence(false)).Bytes()},
        {"MONOCHROME2 without its padding blank", image(Slice{}, "MONOCHROME2").Bytes()},
    };
    const Read reference = ReadBytes(image(Slice{}).Bytes());
    ASSERT_EQ(reference.points, (std::vector<float>{1, 2, 3, 2, 2, 3, 3, 2, 3}));
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        const Read r = ReadBytes(c.bytes);
        EXPECT_EQ(r.points, reference.points);
        EXPECT_EQ(r.texts, reference.texts);
    }
}

TEST(DicomRefusals, EachFaultHasItsError)
{
    const auto slice = [](const std::string& syntax) {
        Slice s;
        s.syntax = syntax;
        return s.Image(1, 2).Pixels({1, 2});
    };
    Slice eightBits;
    eightBits.Image(1, 2).Us(0x0028, 0x0100, 8).Pixels({1});
    Slice shortPixels;
    shortPixels.Image(2, 2).Pixels({1, 2, 3});
    Slice noPixel;
    noPixel.Image(0, 0).Pixels({});
    const std::string whole = slice("1.2.840.10008.1.2.1").Bytes();
    std::string notDicom = whole;
    notDicom[128] = 'X';
    Slice longElement;
    longElement.Element(0x0010, 0x0010, "LO", "ab", 0x7FFF).Image(1, 1).Pixels({1});
    struct Case {
        const char* what;
        std::string bytes;
        const char* key;
    } cases[] = {
        {"big endian", slice("1.2.840.10008.1.2.2").Bytes(), "ZonCloudReadNLSTool.ERR_DicomTransferSyntax"},
        {"JPEG", slice("1.2.840.10008.1.2.4.50").Bytes(), "ZonCloudReadNLSTool.ERR_DicomTransferSyntax"},
        {"8 bits allocated", eightBits.Bytes(), "ZonCloudReadNLSTool.ERR_DicomBitsAllocated"},
        {"short pixel data", shortPixels.Bytes(), "ZonCloudReadNLSTool.ERR_DicomShortPixelData"},
        {"truncated in the pixels", whole.substr(0, whole.size() - 1), "ZonCloudReadNLSTool.ERR_DicomShortPixelData"},
        {"an element longer than the file", longElement.Bytes(), "ZonCloudReadNLSTool.ERR_UnknownData"},
        {"no marker", notDicom, "ZonCloudReadNLSTool.ERR_DicomNoMarker"},
        {"no pixel", noPixel.Bytes(), "ZonCloudReadNLSTool.ERR_NoPointFound"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.what);
        EXPECT_EQ(ErrorKey([&] { ReadBytes(c.bytes); }), c.key);
    }
    // The refusal names the syntax.
    try {
        ReadBytes(slice("1.2.840.10008.1.2.2").Bytes());
        FAIL();
    } catch (const ZonError& error) {
        EXPECT_NE(error.GetNLSMessage().find("1.2.840.10008.1.2.2 (explicit VR big endian)"), std::string::npos);
    }
}

TEST(DicomBadInput, DeepNestingAndEveryCutEndInAResultOrAnError)
{
    Slice deep;
    for (int i = 0; i < 1000; ++i) deep.Element(0x0008, 0x1140, "SQ", "", 0xFFFFFFFF).Element(0xFFFE, 0xE000, "", "", 0xFFFFFFFF);
    for (int i = 0; i < 1000; ++i) deep.Element(0xFFFE, 0xE00D, "", "").Element(0xFFFE, 0xE0DD, "", "");
    EXPECT_EQ(ReadBytes(deep.Image(1, 1).Pixels({9}).Bytes()).texts, std::vector<std::string>{"Density = 9"});

    Slice s;
    s.Image(2, 2).Text(0x0028, 0x1050, "DS", "40").Text(0x0028, 0x1051, "DS", "400").Pixels({1, 2, 3, 4});
    const std::string bytes = s.Bytes();
    for (std::size_t cut = 0; cut < bytes.size(); ++cut) {
        const std::string part = bytes.substr(0, cut);
        EXPECT_FALSE(ErrorKey([&] { ReadBytes(part); }).empty()) << cut;
    }
}

std::string ZSlice(int instance, double z, std::uint16_t value)
{
    Slice s;
    s.Text(0x0020, 0x0013, "IS", std::to_string(instance))
        .Text(0x0020, 0x0032, "DS", "0\\0\\" + std::to_string(z))
        .Image(1, 1)
        .Pixels({value});
    return s.Bytes();
}

TEST(DicomArchive, SlicesStackedByInstanceThenAlongTheNormal)
{
    const std::string archive = Zip({
        {"series/", ""},
        {"series/c.dcm", ZSlice(3, 0, 30)},
        {"README", "slices of a phantom"},
        {"series/a.dcm", ZSlice(1, 5, 10)},
        {"../b.dcm", ZSlice(2, 9, 22)},
        {"series/b2.dcm", ZSlice(2, -1, 21)},
    });
    const Read r = ReadBytes(archive, "series.DCZ");
    EXPECT_EQ(r.texts, (std::vector<std::string>{"Density = 10", "Density = 21", "Density = 22", "Density = 30"}));
    EXPECT_EQ(r.points, (std::vector<float>{0, 0, 5, 0, 0, -1, 0, 0, 9, 0, 0, 0}));
    EXPECT_EQ(r.slices, 4u);

    EXPECT_EQ(ErrorKey([&] { ReadBytes(Zip({{"README", "no slice"}}), "x.dcz"); }),
              "ZonCloudReadNLSTool.ERR_NoPointFound");
    EXPECT_EQ(ErrorKey([&] { ReadBytes(ZSlice(1, 0, 1), "x.dcz"); }), "ZonZipReader.ERR_Open");
}

TEST(DicomSampling, KeptPointsKeepTheirGreysAndTexts)
{
    const std::string bytes = Windowed({0, 10, 20, 30, 40, 50, 60, 70, 80, 90}, "", "").Bytes();
    ZonCloudReadDicom reader("s.dcm");
    reader.SetSourceMemory(bytes.data(), bytes.size());
    reader.SetSamplingPercent(30.0f);
    unsigned n = 0, colors = 0, texts = 0;
    const float* p = reader.GetPoints(n);
    const unsigned char* c = reader.GetPointColors(colors);
    const auto* t = static_cast<const std::string*>(reader.GetPointAttributes3(texts));
    ASSERT_EQ(n, 3u);  // indices 0, 4 and 7, where the whole part of 0.3 k changes
    ASSERT_TRUE(colors == n && texts == n);
    for (unsigned i = 0; i < n; ++i) {
        const int raw = static_cast<int>(p[3 * i]) * 10;  // one column per pixel, spacing 1
        EXPECT_EQ(t[i], "Density = " + std::to_string(raw));
        EXPECT_EQ(c[3 * i], raw * 255 / 90);
    }
}

// The rule runs over the whole series, not slice by slice.
TEST(DicomSampling, TheRuleRunsAcrossTheSlicesOfAnArchive)
{
    std::vector<std::pair<std::string, std::string>> members;
    for (int i = 0; i < 10; ++i)
        members.push_back({"s" + std::to_string(i) + ".dcm", ZSlice(i + 1, i, static_cast<std::uint16_t>(10 * i))});
    const std::string archive = Zip(members);
    ZonCloudReadDicom reader("s.dcz");
    reader.SetSourceMemory(archive.data(), archive.size());
    reader.SetSamplingPercent(30.0f);
    unsigned n = 0;
    reader.GetPoints(n);
    const auto* t = static_cast<const std::string*>(reader.GetPointAttributes3(n));
    ASSERT_EQ(n, 3u);
    EXPECT_EQ(std::vector<std::string>(t, t + n),
              (std::vector<std::string>{"Density = 0", "Density = 40", "Density = 70"}));
}

TEST(ZipReader, MembersLargerThanTheArchiveJustifiesAreRefused)
{
    std::string big;
    for (int i = 0; i < 200000; ++i) big += static_cast<char>('a' + i % 26);
    const std::string archive = Zip({{"zeros", big}, {"small", "abc"}});
    ZonZipReader reader(archive.data(), archive.size());
    ASSERT_EQ(reader.Members().size(), 2u);
    EXPECT_EQ(reader.Extract(reader.Members()[1], 3), std::vector<unsigned char>({'a', 'b', 'c'}));
    EXPECT_EQ(ErrorKey([&] { reader.Extract(reader.Members()[0], 1000); }), "ZonZipReader.ERR_TooLarge");
    EXPECT_EQ(reader.Extract(reader.Members()[0], big.size()).size(), big.size());

    // A central directory that declares far more than the compressed bytes can hold.
    std::string forged = archive;
    const std::size_t header = forged.find("PK\x01\x02");
    ASSERT_NE(header, std::string::npos);
    std::string huge;
    Put32(huge, 0x7FFFFFFF);
    forged.replace(header + 24, 4, huge);
    ZonZipReader forgedReader(forged.data(), forged.size());
    EXPECT_EQ(ErrorKey([&] { forgedReader.Extract(forgedReader.Members()[0], UINT64_MAX); }), "ZonZipReader.ERR_TooLarge");
}

class DicomFiles : public zontest::FilesTest {};

TEST_F(DicomFiles, ImportKeepsTextsAsValuesAndTheToolShowsSlicesGreysAndTexts)
{
    std::string archive = Zip({{"2.dcm", ZSlice(2, 1, 200)}, {"1.dcm", Windowed({0, 300}, "", "").Bytes()}});
    const std::string path = Write("s.dcz", archive);

    ZonGeoFactoryProtected factory;
    ZonCldBody_var body = factory.CreateCldBody();
    std::vector<std::string> messages;
    std::string statistics;
    ZonCldImportEngine::InsertFile(*body, factory, std::make_shared<ZonCloudReadDicom>(path), false, nullptr,
                                   ZonMathBox(), 1.0, messages, statistics, false);
    ASSERT_EQ(body->GetClouds().size(), 1u);
    const ZonCldCloud& cloud = *body->GetClouds().front();
    EXPECT_TRUE(cloud.Texts().empty());  // held as values
    ASSERT_EQ(cloud.GetNumberOfTexts(), 3u);
    EXPECT_EQ(cloud.GetText(2).ToUtf8(), "Density = 200");
    EXPECT_NE(statistics.find("Slices: 2"), std::string::npos) << statistics;

    const zontest::ToolRun info = Run("info " + zontest::Quote(path));
    EXPECT_EQ(info.status, 0) << info.err;
    EXPECT_NE(info.out.find("Slices: 2"), std::string::npos) << info.out;

    const zontest::ToolRun dump = Run("dump " + zontest::Quote(path));
    ASSERT_EQ(dump.status, 0) << dump.err;
    const nlohmann::json cloudJson = nlohmann::json::parse(dump.out)["cloud"];
    EXPECT_EQ(cloudJson["texts"], nlohmann::json({"Density = 0", "Density = 300", "Density = 200"}));
    EXPECT_EQ(cloudJson["colors"], nlohmann::json({{0, 0, 0}, {255, 255, 255}, {0, 0, 0}}));

    const zontest::ToolRun convert = Run("convert " + zontest::Quote(path) + " " + zontest::Quote(Path("o.asc_rgb")));
    EXPECT_EQ(convert.status, 0) << convert.err;
    EXPECT_NE(zontest::Slurp(Path("o.asc_rgb")).find(" 255 255 255\n"), std::string::npos);
}

}  // namespace

namespace {

bool HasOracles() { return std::getenv("ZON_WITH_ORACLES") && std::string(std::getenv("ZON_WITH_ORACLES")) == "1"; }

bool Runs(const std::string& command) { return std::system((command + " >/dev/null 2>&1").c_str()) == 0; }

// pydicom writes a signed CT slice with an oblique orientation, non-square
// spacing and a window, in either VR form, and writes where each pixel lies
// by the tags it reads back, with the stored values.
const char* PydicomSlice = R"(
import sys, json, numpy as np, pydicom
from pydicom.dataset import Dataset, FileMetaDataset
from pydicom.uid import ExplicitVRLittleEndian, ImplicitVRLittleEndian, generate_uid
path, implicit = sys.argv[1], sys.argv[2] == "implicit"
meta = FileMetaDataset()
meta.MediaStorageSOPClassUID = "1.2.840.10008.5.1.4.1.1.2"
meta.MediaStorageSOPInstanceUID = generate_uid()
meta.TransferSyntaxUID = ImplicitVRLittleEndian if implicit else ExplicitVRLittleEndian
ds = Dataset()
ds.file_meta = meta
ds.is_little_endian, ds.is_implicit_VR = True, implicit
ds.SOPClassUID, ds.SOPInstanceUID = meta.MediaStorageSOPClassUID, meta.MediaStorageSOPInstanceUID
ds.ReferencedImageSequence = [Dataset()]
ds.ReferencedImageSequence[0].ReferencedSOPInstanceUID = "1.2.3.4"
ds.InstanceNumber = 7
ds.ImagePositionPatient = [-12.5, 40.25, 3.0]
ds.ImageOrientationPatient = [0.8, 0.6, 0.0, 0.0, 0.0, -1.0]
ds.PixelSpacing = [0.75, 1.5]
ds.SamplesPerPixel, ds.PhotometricInterpretation = 1, "MONOCHROME2"
ds.Rows, ds.Columns = 3, 4
ds.BitsAllocated, ds.BitsStored, ds.HighBit, ds.PixelRepresentation = 16, 16, 15, 1
ds.WindowCenter, ds.WindowWidth, ds.RescaleIntercept, ds.RescaleSlope = 40, 400, -1024, 1
pixels = (np.arange(12, dtype=np.int16).reshape(3, 4) * 150 - 200)
ds.PixelData = pixels.tobytes()
ds.save_as(path, write_like_original=False)
back = pydicom.dcmread(path)
P = np.array(back.ImagePositionPatient, dtype=float)
o = np.array(back.ImageOrientationPatient, dtype=float)
dr, dc = float(back.PixelSpacing[0]), float(back.PixelSpacing[1])
points = []
for r in range(back.Rows):
    for c in range(back.Columns):
        points += list(P + c * dc * o[:3] + r * dr * o[3:])
open(sys.argv[3], "w").write(json.dumps({"points": points, "values": back.pixel_array.flatten().tolist()}))
)";

class DicomOracles : public zontest::FilesTest {};

TEST_F(DicomOracles, SlicesOfPydicomAndDcmtkReadAsTheyPlaceThem)
{
    if (!HasOracles()) GTEST_SKIP() << "ZON_WITH_ORACLES is not 1";
    if (!Runs("/usr/bin/python3 -c 'import pydicom, numpy'")) GTEST_SKIP() << "pydicom is not installed";
    if (!Runs("dcmconv --version")) GTEST_SKIP() << "DCMTK is not installed";
    Write("slice.py", PydicomSlice);
    for (const char* form : {"explicit", "implicit"}) {
        SCOPED_TRACE(form);
        const std::string dcm = Path(std::string(form) + ".dcm"), json = Path("expected.json");
        ASSERT_TRUE(Runs("/usr/bin/python3 " + zontest::Quote(Path("slice.py")) + " " + zontest::Quote(dcm) + " " +
                         form + " " + zontest::Quote(json)));
        const nlohmann::json expected = nlohmann::json::parse(zontest::Slurp(json));
        // DCMTK rewrites the same slice in the other VR form; both must read alike.
        const std::string converted = Path(std::string(form) + "-dcmtk.dcm");
        ASSERT_TRUE(Runs(std::string("dcmconv ") + (form[0] == 'e' ? "+ti " : "+te ") + zontest::Quote(dcm) + " " +
                         zontest::Quote(converted)));
        for (const std::string& file : {dcm, converted}) {
            const std::string bytes = zontest::Slurp(file);
            const Read r = ReadBytes(bytes);
            ASSERT_EQ(r.points.size(), expected["points"].size());
            for (std::size_t i = 0; i < r.points.size(); ++i)
                EXPECT_NEAR(r.points[i], expected["points"][i].get<double>(), 1e-4) << i;
            for (std::size_t i = 0; i < r.texts.size(); ++i)
                EXPECT_EQ(r.texts[i], "Density = " + std::to_string(expected["values"][i].get<int>()));
            // Densities -1224 ... 426 through the window 40/400: the clamped ends give 0 and 255.
            EXPECT_EQ(r.greys.front(), 0);
            EXPECT_EQ(r.greys.back(), 255);
        }
    }
    // Big endian, as DCMTK writes it, is refused by name.
    const std::string big = Path("big.dcm");
    ASSERT_TRUE(Runs("dcmconv +tb " + zontest::Quote(Path("explicit.dcm")) + " " + zontest::Quote(big)));
    const std::string bytes = zontest::Slurp(big);
    EXPECT_EQ(ErrorKey([&] { ReadBytes(bytes); }), "ZonCloudReadNLSTool.ERR_DicomTransferSyntax");
}

}  // namespace
