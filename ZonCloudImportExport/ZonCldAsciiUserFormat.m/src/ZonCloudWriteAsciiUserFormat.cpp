#include "ZonCloudWriteAsciiUserFormat.h"

#include <algorithm>
#include <charconv>

#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"

namespace {

constexpr int MaxWidth = 1000;    // keeps a row separator line (4 W long) reasonable
constexpr int MaxDecimals = 100;  // beyond this printf has nothing left to show

// Reads an integer setting; the old value stays when the text is not one.
void ParseInteger(const std::string& text, int& value, int low, int high)
{
    int parsed = 0;
    const char* first = text.data();
    while (first != text.data() + text.size() && *first == ' ') ++first;
    const auto [end, ec] = std::from_chars(first, text.data() + text.size(), parsed);
    if (ec == std::errc() && end != first) value = std::clamp(parsed, low, high);
}

// The separator goes into a printf format: a '%' in it must print as itself.
std::string EscapePercent(const std::string& text)
{
    std::string escaped;
    for (const char c : text) {
        escaped += c;
        if (c == '%') escaped += '%';
    }
    return escaped;
}

std::string WithCrLf(const std::string& text)
{
    std::string out;
    out.reserve(text.size() + 8);
    for (const char c : text) {
        if (c == '\n') out += '\r';
        out += c;
    }
    return out;
}

}  // namespace

ZonCloudWriteAsciiUserFormat::ZonCloudWriteAsciiUserFormat(const ZonUnicodeString& fileName)
    : ZonCloudWritePointLines(fileName)
{
}

void ZonCloudWriteAsciiUserFormat::SetWriteSettings(const ZonListValZonString& settings)
{
    if (settings.size() != 7) return;
    const auto text = [](const std::string& value, std::string& target, bool& given) {
        given = value != "N";
        target = given ? value : std::string();
    };
    text(settings[0], _header, _headerGiven);
    text(settings[1], _name, _nameGiven);
    text(settings[2], _rowSeparator, _rowSeparatorGiven);
    text(settings[3], _columnSeparator, _columnSeparatorGiven);
    _pointNumber = settings[4] == "Y";
    // A negative width is a printf width too: it left-aligns the columns.
    ParseInteger(settings[5], _width, -MaxWidth, MaxWidth);
    ParseInteger(settings[6], _decimals, 0, MaxDecimals);
}

void ZonCloudWriteAsciiUserFormat::GetWriteSettings(ZonListValZonString& settings)
{
    settings = {_headerGiven ? _header : "N",
                _nameGiven ? _name : "N",
                _rowSeparatorGiven ? _rowSeparator : "N",
                _columnSeparatorGiven ? _columnSeparator : "N",
                _pointNumber ? "Y" : "N",
                ZonFormat("%d", _width),
                ZonFormat("%d", _decimals)};
}

std::string ZonCloudWriteAsciiUserFormat::RowSeparatorLine() const
{
    std::string line = "!";
    for (int i = 0; i < 4 * _width; ++i) line += _rowSeparator;
    return line;
}

std::string ZonCloudWriteAsciiUserFormat::LineTemplate(bool withColor) const
{
    const int w = _width;
    const int d = _decimals;
    const char* b = " ";
    if (_columnSeparatorGiven) {
        const std::string separator = EscapePercent(_columnSeparator);
        const char* s = separator.c_str();
        if (_pointNumber) {
            if (withColor)
                return ZonFormat("%s%%%dd%s%s%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%dd%s%s%s%%%dd%s%s%s%%%dd\n",
                                 b, w - 2, b, s, b, w - 2, d, b, s, b, w - 2, d, b, s, b, w - 2, d, b, s, b, w - 2,
                                 b, s, b, w - 2, b, s, b, w - 2);
            return ZonFormat("%s%%%dd%s%s%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%d.%df\n", b, w - 2, b, s, b, w - 2, d, b, s,
                             b, w - 2, d, b, s, b, w - 2, d);
        }
        if (withColor)
            return ZonFormat("%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%dd%s%s%s%%%dd%s%s%s%%%dd\n", b, w - 2, d,
                             b, s, b, w - 2, d, b, s, b, w - 2, d, b, s, b, w - 2, b, s, b, w - 2, b, s, b, w - 2);
        return ZonFormat("%s%%%d.%df%s%s%s%%%d.%df%s%s%s%%%d.%df\n", b, w - 2, d, b, s, b, w - 2, d, b, s, b, w - 2,
                         d);
    }
    if (_pointNumber) {
        if (withColor)
            return ZonFormat("%%%dd%s%%%d.%df%s%%%d.%df%s%%%d.%df%s%%%dd%s%%%dd%s%%%dd\n", w - 1, b, w - 1, d, b, w - 1,
                             d, b, w - 1, d, b, w - 1, b, w - 1, b, w - 1);
        return ZonFormat("%%%dd%s%%%d.%df%s%%%d.%df%s%%%d.%df\n", w - 1, b, w - 1, d, b, w - 1, d, b, w - 1, d);
    }
    if (withColor)
        return ZonFormat("%s%%%d.%df%s%%%d.%df%s%%%d.%df%s%%%dd%s%%%dd%s%%%dd\n", b, w - 1, d, b, w - 1, d, b, w - 1,
                         d, b, w - 1, b, w - 1, b, w - 1);
    return ZonFormat("%s%%%d.%df%s%%%d.%df%s%%%d.%df\n", b, w - 1, d, b, w - 1, d, b, w - 1, d);
}

void ZonCloudWriteAsciiUserFormat::Emit(const std::string& text)
{
    const std::string out = WithCrLf(text);
    _file.Write(out.data(), out.size());
}

void ZonCloudWriteAsciiUserFormat::WriteHeader()
{
    if (_headerGiven) Emit(ZonFormat("! %s\n\n", _header.c_str()));
    if (_nameGiven) Emit(ZonFormat("! %s\n\n", _name.c_str()));
}

ZonHResult ZonCloudWriteAsciiUserFormat::BeginMultiWrite()
{
    const ZonHResult result = ZonCloudWriteFile::BeginMultiWrite();
    if (ZonSucceeded(result)) WriteHeader();
    return result;
}

ZonHResult ZonCloudWriteAsciiUserFormat::EndMultiWrite()
{
    if (_file.IsOpen() && _rowSeparatorGiven) Emit(RowSeparatorLine() + "\n");
    return ZonCloudWriteFile::EndMultiWrite();
}

void ZonCloudWriteAsciiUserFormat::PrepareLines()
{
    _templatePlain = LineTemplate(false);
    _templateColor = LineTemplate(true);
    _linePlain = ZonCloudLineFormat(_templatePlain);
    _linePlain.UseCrLf();
    _lineColor = ZonCloudLineFormat(_templateColor);
    _lineColor.UseCrLf();
    // Doubled, as one line: the copy's "!" becomes a separator character.
    const std::string line = RowSeparatorLine();
    std::string copy = line;
    if (copy.size() > 2) copy[0] = copy[2];
    _pointSeparator = WithCrLf(line + copy + "\n");
}

void ZonCloudWriteAsciiUserFormat::BeginWritePoints(const unsigned& count)
{
    PrepareLines();
    if (!_multiWrite) {
        OpenStream("w");
        WriteHeader();
    }
    _total += count;
    _expected = count;
}

std::uint64_t ZonCloudWriteAsciiUserFormat::TakeLines(std::uint64_t lines)
{
    if (!_file.IsOpen() || _expected < lines) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
    const std::uint64_t first = _total - _expected + 1;
    _expected -= lines;
    return first;
}

void ZonCloudWriteAsciiUserFormat::FormatLine(ZonCloudTextBuffer& out, const double xyz[3], const unsigned char* rgb,
                                              std::uint64_t number) const
{
    if (_rowSeparatorGiven) out.Append(_pointSeparator.data(), _pointSeparator.size());
    // The number column is an int, as it always was.
    const double label = static_cast<int>(number);
    double values[7];
    double* v = values;
    if (_pointNumber) *v++ = label;
    for (int k = 0; k < 3; ++k) *v++ = xyz[k];
    if (rgb)
        for (int k = 0; k < 3; ++k) *v++ = rgb[k];
    const ZonCloudLineFormat& line = rgb ? _lineColor : _linePlain;
    if (line.IsValid()) {
        out.Commit(line.Print(out.Reserve(line.Bound()), values));
        return;
    }
    // Widths or precisions beyond the printer's: the C library prints them.
    const std::string& format = rgb ? _templateColor : _templatePlain;
    std::string text;
    const int n = static_cast<int>(number);
    if (_pointNumber && rgb)
        ZonPrint(text, format.c_str(), n, xyz[0], xyz[1], xyz[2], int{rgb[0]}, int{rgb[1]}, int{rgb[2]});
    else if (_pointNumber)
        ZonPrint(text, format.c_str(), n, xyz[0], xyz[1], xyz[2]);
    else if (rgb)
        ZonPrint(text, format.c_str(), xyz[0], xyz[1], xyz[2], int{rgb[0]}, int{rgb[1]}, int{rgb[2]});
    else
        ZonPrint(text, format.c_str(), xyz[0], xyz[1], xyz[2]);
    text = WithCrLf(text);
    out.Append(text.data(), text.size());
}

void ZonCloudWriteAsciiUserFormat::EndWritePoints()
{
    const bool complete = _expected == 0;
    _expected = 0;
    if (!_multiWrite) {
        if (_file.IsOpen() && _rowSeparatorGiven) Emit(RowSeparatorLine() + "\n");
        CloseStream();
    }
    if (!complete) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_Failure");
}
