#include "ZonCloudDicomSlice.h"

#include <bit>
#include <charconv>
#include <cmath>
#include <cstring>
#include <string_view>

#include "ZonCloudReadNLSTool.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint64_t PreambleSize = 128;
constexpr const char* ImplicitLittle = "1.2.840.10008.1.2";
constexpr const char* ExplicitLittle = "1.2.840.10008.1.2.1";

std::string_view Trim(std::string_view text)
{
    // Texts are padded to an even length with a blank (or a NUL for UIDs).
    const auto blank = [](char c) { return c == ' ' || c == '\0' || c == '\t' || c == '\r' || c == '\n'; };
    while (!text.empty() && blank(text.front())) text.remove_prefix(1);
    while (!text.empty() && blank(text.back())) text.remove_suffix(1);
    return text;
}

// The values of a multi-valued text, split at backslashes.
std::vector<std::string_view> Values(std::string_view text)
{
    std::vector<std::string_view> values;
    for (;;) {
        const std::size_t cut = text.find('\\');
        values.push_back(Trim(text.substr(0, cut)));
        if (cut == std::string_view::npos) return values;
        text.remove_prefix(cut + 1);
    }
}

// A decimal text; 0 when it is not a finite number, as an unreadable value gives nothing.
double Real(std::string_view text)
{
    if (!text.empty() && text.front() == '+') text.remove_prefix(1);
    double value = 0.0;
    const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (ec != std::errc() || !std::isfinite(value)) return 0.0;
    return value;
}

std::int64_t Integer(std::string_view text)
{
    if (!text.empty() && text.front() == '+') text.remove_prefix(1);
    std::int64_t value = 0;
    const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), value);
    return ec == std::errc() ? value : 0;
}

// Reals of a multi-valued text into `out`, as many as both hold.
template <std::size_t N>
void Reals(const std::string& text, double (&out)[N])
{
    const std::vector<std::string_view> values = Values(text);
    for (std::size_t i = 0; i < N && i < values.size(); ++i) out[i] = Real(values[i]);
}

double FirstReal(const std::string& text) { return Real(Values(text).front()); }

// Explicit VRs whose length takes 32 bits after two reserved bytes.
bool HasLongLength(const char vr[2])
{
    static constexpr const char* Long[] = {"OB", "OD", "OF", "OL", "OV", "OW", "SQ", "SV", "UC", "UN", "UR", "UT", "UV"};
    for (const char* name : Long)
        if (vr[0] == name[0] && vr[1] == name[1]) return true;
    return false;
}

std::string SyntaxName(const std::string& uid)
{
    if (uid == "1.2.840.10008.1.2.2") return uid + " (explicit VR big endian)";
    if (uid == "1.2.840.10008.1.2.1.99") return uid + " (deflated explicit VR little endian)";
    if (uid == "1.2.840.10008.1.2.5") return uid + " (RLE compressed)";
    if (uid.starts_with("1.2.840.10008.1.2.4.")) return uid + " (JPEG family compressed)";
    return uid;
}

}  // namespace

double ZonCloudDicomSlice::PositionAlongNormal() const
{
    const double* a = orientation;
    const double* b = orientation + 3;
    const double normal[3] = {a[1] * b[2] - a[2] * b[1], a[2] * b[0] - a[0] * b[2], a[0] * b[1] - a[1] * b[0]};
    const double along = position[0] * normal[0] + position[1] * normal[1] + position[2] * normal[2];
    // Overflowing tags could give NaN, which no sort may see.
    return std::isnan(along) ? 0.0 : along;
}

bool ZonCloudDicomSlice::Read(ZonCloudByteSource& source)
{
    _source = &source;
    if (!source.Fits(0, PreambleSize + 4, 1)) return false;
    char marker[4];
    source.Seek(PreambleSize);
    source.Read(marker, sizeof marker);
    if (std::memcmp(marker, "DICM", 4) != 0) return false;
    ReadMeta();
    const std::string syntax(Trim(_transferSyntax));
    if (syntax == ImplicitLittle)
        _explicitVr = false;
    else if (syntax == ExplicitLittle)
        _explicitVr = true;
    else if (syntax.empty())
        _explicitVr = DataSetLooksExplicit();  // no syntax named: the bytes tell
    else
        Tool::Raise(Tool::Data, "ERR_DicomTransferSyntax", {SyntaxName(syntax)});
    ReadDataSet();
    return true;
}

ZonCloudDicomSlice::Element ZonCloudDicomSlice::ReadHeader(bool explicitVr)
{
    unsigned char bytes[8];
    _source->Read(bytes, sizeof bytes);
    Element e;
    e.group = ZonCloudByteSource::LoadLittle<std::uint16_t>(bytes);
    e.element = ZonCloudByteSource::LoadLittle<std::uint16_t>(bytes + 2);
    // Items and delimiters carry no VR in either form.
    if (!explicitVr || e.group == 0xFFFE) {
        e.length = ZonCloudByteSource::LoadLittle<std::uint32_t>(bytes + 4);
        return e;
    }
    const char vr[2] = {static_cast<char>(bytes[4]), static_cast<char>(bytes[5])};
    if (HasLongLength(vr))
        e.length = _source->ReadLittle<std::uint32_t>();
    else
        e.length = ZonCloudByteSource::LoadLittle<std::uint16_t>(bytes + 6);
    return e;
}

void ZonCloudDicomSlice::Skip(std::uint32_t length)
{
    const std::uint64_t at = _source->Tell();
    _source->CheckFits(at, length, 1);
    _source->Seek(at + length);
}

std::string ZonCloudDicomSlice::ReadText(std::uint32_t length)
{
    _source->CheckFits(_source->Tell(), length, 1);
    std::string text(length, '\0');
    _source->Read(text.data(), length);
    return text;
}

std::uint32_t ZonCloudDicomSlice::ReadUnsigned16(std::uint32_t length)
{
    if (length < 2) {
        Skip(length);
        return 0;
    }
    const std::uint32_t value = _source->ReadLittle<std::uint16_t>();
    Skip(length - 2);
    return value;
}

// Inside a sequence of undefined length, items and nested sequences open and
// their delimiters close; a counter instead of recursion keeps any nesting
// depth to constant stack, and every step reads at least one header, so the
// walk ends at the end of the source at the latest.
void ZonCloudDicomSlice::SkipUndefinedLength()
{
    std::uint64_t depth = 1;
    while (depth > 0) {
        const Element e = ReadHeader(_explicitVr);
        if (e.group == 0xFFFE && (e.element == 0xE00D || e.element == 0xE0DD)) {
            --depth;
        } else if (e.length == Undefined) {
            ++depth;
        } else {
            Skip(e.length);
        }
    }
}

void ZonCloudDicomSlice::ReadMeta()
{
    // The meta group is always explicit VR little endian, whatever follows it.
    for (;;) {
        const std::uint64_t at = _source->Tell();
        if (!_source->Fits(at, 8, 1)) return;
        const std::uint16_t group = _source->ReadLittle<std::uint16_t>();
        _source->Seek(at);
        if (group != 0x0002) return;
        const Element e = ReadHeader(true);
        if (e.length == Undefined) Tool::Raise(Tool::Input, "ERR_UnknownData");
        if (e.element == 0x0010)
            _transferSyntax = ReadText(e.length);
        else
            Skip(e.length);
    }
}

bool ZonCloudDicomSlice::DataSetLooksExplicit()
{
    const std::uint64_t at = _source->Tell();
    if (!_source->Fits(at, 6, 1)) return true;
    unsigned char bytes[6];
    _source->Read(bytes, sizeof bytes);
    _source->Seek(at);
    const auto letter = [](unsigned char c) { return c >= 'A' && c <= 'Z'; };
    return letter(bytes[4]) && letter(bytes[5]);
}

void ZonCloudDicomSlice::ReadDataSet()
{
    std::string spacingText, positionText, orientationText;
    for (;;) {
        const std::uint64_t at = _source->Tell();
        // A few bytes of padding after the last element are no element.
        if (!_source->Fits(at, 8, 1)) break;
        const Element e = ReadHeader(_explicitVr);
        if (e.Is(0x7FE0, 0x0010)) {
            if (e.length == Undefined) Tool::Raise(Tool::Data, "ERR_DicomTransferSyntax", {"encapsulated pixel data"});
            ReadPixels(e.length);
            break;  // nothing after the pixels is used
        }
        if (e.length == Undefined) {
            SkipUndefinedLength();
            continue;
        }
        if (e.group == 0x0028) {
            switch (e.element) {
                case 0x0002: _samplesPerPixel = ReadUnsigned16(e.length); continue;
                case 0x0004: _photometric = ReadText(e.length); _hasPhotometric = true; continue;
                case 0x0006: _planarConfiguration = ReadUnsigned16(e.length); continue;
                case 0x0010: rows = ReadUnsigned16(e.length); continue;
                case 0x0011: columns = ReadUnsigned16(e.length); continue;
                case 0x0030: spacingText = ReadText(e.length); continue;
                case 0x0100: _bitsAllocated = ReadUnsigned16(e.length); continue;
                case 0x0103: pixelSigned = ReadUnsigned16(e.length) == 1; continue;
                case 0x1050: windowCentre = FirstReal(ReadText(e.length)); continue;
                case 0x1051: windowWidth = FirstReal(ReadText(e.length)); continue;
                case 0x1052: intercept = FirstReal(ReadText(e.length)); continue;
                case 0x1053: slope = FirstReal(ReadText(e.length)); continue;
                default: break;
            }
        } else if (e.group == 0x0020) {
            switch (e.element) {
                case 0x0013: instanceNumber = Integer(Values(ReadText(e.length)).front()); continue;
                case 0x0032: positionText = ReadText(e.length); continue;
                case 0x0037: orientationText = ReadText(e.length); continue;
                default: break;
            }
        }
        Skip(e.length);
    }
    if (!spacingText.empty()) Reals(spacingText, spacing);
    if (!positionText.empty()) Reals(positionText, position);
    if (!orientationText.empty()) Reals(orientationText, orientation);
}

void ZonCloudDicomSlice::ReadPixels(std::uint32_t length)
{
    if (PixelCount() == 0) return;
    if (_bitsAllocated != 16)
        Tool::Raise(Tool::Data, "ERR_DicomBitsAllocated", {std::to_string(_bitsAllocated)});
    // Monochrome texts give one sample, any other three, unless the file says how many.
    const std::string_view photometric = Trim(_photometric);
    std::uint32_t samples = photometric == "MONOCHROME1" || photometric == "MONOCHROME2" || !_hasPhotometric ? 1 : 3;
    if (_samplesPerPixel == 1 || _samplesPerPixel == 3) samples = _samplesPerPixel;

    const std::uint64_t values = PixelCount() * samples;
    // Too short by its own length or cut off by the end of the file: the same fault.
    if (values * 2 > length || !_source->Fits(_source->Tell(), values, 2))
        Tool::Raise(Tool::Input, "ERR_DicomShortPixelData");
    pixels.resize(static_cast<std::size_t>(values));
    _source->Read(pixels.data(), static_cast<std::size_t>(values) * 2);
    if constexpr (std::endian::native != std::endian::little)
        for (std::uint16_t& v : pixels) v = ZonCloudByteSource::LoadLittle<std::uint16_t>(&v);
    if (samples == 1) return;

    // A colour pixel's value is the mean of its samples, interleaved or in planes.
    const std::size_t n = static_cast<std::size_t>(PixelCount());
    const bool planes = _planarConfiguration == 1;
    for (std::size_t i = 0; i < n; ++i) {
        std::int64_t sum = 0;
        for (std::size_t s = 0; s < 3; ++s) sum += Raw(planes ? s * n + i : 3 * i + s);
        const auto mean = static_cast<std::int32_t>(sum / 3);
        pixels[i] = static_cast<std::uint16_t>(mean);
    }
    pixels.resize(n);
}
