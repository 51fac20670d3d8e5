#include "ZonCloudReadAsciiUserFormat.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <limits>

#include "ZonCloudByteSource.h"
#include "ZonCloudChunkedText.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"
#include "ZonCloudScanFormat.h"

namespace {

constexpr std::array<std::string_view, 15> Vocabulary = {
    "X", "Y", "Z", "DX", "DY", "DZ", "R", "G", "B", "A", "COLOR", "SYMBOL", "LABEL", "TEXT", "USELESS_INFO"};

// R, G, B of the COLOR column's eight entries (their alpha is always 255).
constexpr unsigned char Palette[8][3] = {{0, 0, 0},     {255, 255, 255}, {255, 0, 0},   {0, 255, 0},
                                         {0, 0, 255},   {255, 255, 0},   {255, 0, 255}, {0, 255, 255}};

constexpr std::size_t DataLinePiece = ZonCloudLineSource::FgetsPiece;  // lines cut after 511 characters
constexpr std::size_t FdfLinePiece = 254;  // the FDF line: its first 254 characters
constexpr std::size_t FdfBlock = 4096;     // only the first line of an FDF is read
constexpr int SampleLines = 20;            // lines read to estimate the number of points
constexpr std::uint64_t GrowthStep = 8192;
constexpr int MaxTokens = static_cast<int>(DataLinePiece + 1) / 2 + 1;

bool IsSeparator(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n' || c == '\v' || c == '\f'; }

// The end of a line's text: the character before its newline goes with the
// newline. That removes the CR of a CR LF line, and on a line ended by LF
// alone it eats the last character of the last word. Files have always been
// read this way. (A newline can only end a piece; a lone "\n" keeps it as a
// separator.)
const char* CutBeforeNewline(const char* first, const char* last)
{
    return last - first > 1 && last[-1] == '\n' ? last - 2 : last;
}

// A token of a line: its text is [text, text + length). Whether it holds a
// double quote is noted on the way, so quoted texts cost nothing to lines
// without them.
struct Token {
    const char* text;
    int length;
    bool quoted;
    const char* End() const { return text + length; }
};

// Splits [first, last) at white space; a NUL ends the line, as it ended the
// C string the format has always been read as.
int Tokenize(const char* first, const char* last, Token tokens[], int maxTokens)
{
    int n = 0;
    const char* p = first;
    while (p < last && *p && n < maxTokens) {
        while (p < last && *p && IsSeparator(*p)) ++p;
        if (p == last || !*p) break;
        const char* start = p;
        bool quoted = false;
        while (p < last && *p && !IsSeparator(*p)) {
            quoted |= *p == '"';
            ++p;
        }
        tokens[n++] = {start, static_cast<int>(p - start), quoted};
        if (p < last && *p) ++p;
    }
    return n;
}

// A real column: a decimal comma reads as a point (such a token is read from
// a copy with the commas replaced). Parsing with '.' gives what the locale's
// own decimal point would after the same swap. Tokens made only of digits,
// signs, points and exponent letters read the same under strtod's rules as
// under scanf's "%le", and skip the general scan.
double ReadReal(const Token& token)
{
    static const ZonCloudScanFormat realFormat("%le");
    bool simple = true;
    bool comma = false;
    for (int i = 0; i < token.length; ++i) {
        const char c = token.text[i];
        comma |= c == ',';
        const bool plain =
            (c >= '0' && c <= '9') || c == '.' || c == ',' || c == '-' || c == '+' || c == 'e' || c == 'E';
        simple &= plain;
    }
    const char* text = token.text;
    char copy[DataLinePiece];
    if (comma) {
        std::replace_copy(token.text, token.End(), copy, ',', '.');
        text = copy;
    }
    double value = 0.0;
    if (simple) {
        ZonParseDouble(text, text + token.length, '.', value);
    } else {
        void* const destination[] = {&value, nullptr};
        realFormat.Scan(text, text + token.length, '.', destination);
    }
    return value;
}

// An integer column, converted as "%d" would; the target keeps its value when
// nothing converts (the answer is false then). Short runs of digits skip the
// general scan.
bool ReadInteger(const Token& token, std::int32_t& target)
{
    static const ZonCloudScanFormat integerFormat("%d");
    const char* p = token.text;
    const char* end = token.End();
    const bool negative = *p == '-';
    if (*p == '-' || *p == '+') ++p;
    const char* digits = p;
    std::int32_t value = 0;
    while (p < end && p - digits < 9 && *p >= '0' && *p <= '9') value = value * 10 + (*p++ - '0');
    if (p > digits && (p == end || !(*p >= '0' && *p <= '9'))) {
        target = negative ? -value : value;
        return true;
    }
    void* const destination[] = {&target, nullptr};
    return integerFormat.Scan(token.text, end, '.', destination) == 1;
}

}  // namespace

// The values one data line gives. The colour and symbol indices live in the
// reader because a line without those columns inherits them: a line only
// tells whether it set them, and to what.
struct ZonCloudReadAsciiUserFormat::LineValues {
    double x = 0.0, y = 0.0, z = 0.0;
    std::int32_t r = 0, g = 255, b = 0, a = 255;
    int colorCounter = 0;
    std::int32_t colorIndex = 0, symbolIndex = 0;
    bool setsColorIndex = false, setsSymbolIndex = false;
    bool hasAlpha = false, hasSymbol = false, hasText = false;
    std::string text;
};

int ZonCloudReadAsciiUserFormat::FieldCodeOf(std::string_view word)
{
    for (std::size_t i = 0; i < Vocabulary.size(); ++i)
        if (Vocabulary[i] == word) return static_cast<int>(i) + 1;
    return 0;
}

ZonCloudReadAsciiUserFormat::ZonCloudReadAsciiUserFormat(const ZonUnicodeString& fileName)
    : ZonCloudReadFile(fileName)
{
    _digitizationType = DigitizationCloud;
    ReadFDF();
}

void ZonCloudReadAsciiUserFormat::SetFDFile(const ZonUnicodeString& path)
{
    if (path == _fdfPath) return;
    _fdfPath = path;
    ReadFDF();
    Discard();
}

void ZonCloudReadAsciiUserFormat::GetFDFile(ZonUnicodeString& path) { path = _fdfPath; }

void ZonCloudReadAsciiUserFormat::SetKeepColors(bool keep)
{
    if (keep == _keepColors) return;
    _keepColors = keep;
    Discard();
}

bool ZonCloudReadAsciiUserFormat::GetKeepColors() { return _hasColor; }

void ZonCloudReadAsciiUserFormat::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) Discard();
}

void ZonCloudReadAsciiUserFormat::ReadFDF()
{
    // The first FDF fixes the columns for the life of the reader.
    if (_fdfRead || _fdfPath.IsNull()) return;
    ZonCloudByteSource fdf;
    fdf.Open(_fdfPath.ToUtf8());
    ZonCloudLineSource lines(FdfLinePiece, FdfBlock);
    lines.Start(fdf, 0);
    const char* first = nullptr;
    const char* last = nullptr;
    if (!lines.Next(first, last)) first = last = nullptr;

    // Words that are not keywords take no column.
    _fields.clear();
    Token tokens[FdfLinePiece];
    const int n = Tokenize(first, CutBeforeNewline(first, last), tokens, static_cast<int>(FdfLinePiece));
    for (int i = 0; i < n; ++i) {
        const int code = FieldCodeOf(std::string_view(tokens[i].text, static_cast<std::size_t>(tokens[i].length)));
        if (code != 0) _fields.push_back(code);
    }
    _fieldsHaveColor = _fieldsHaveAlpha = _fieldsHaveSymbol = _fieldsHaveText = false;
    for (const int code : _fields) {
        _fieldsHaveColor |= code == FieldR || code == FieldG || code == FieldB || code == FieldColor;
        _fieldsHaveAlpha |= code == FieldA;
        _fieldsHaveSymbol |= code == FieldSymbol;
        _fieldsHaveText |= code == FieldText;
    }
    _fdfRead = true;
}

void ZonCloudReadAsciiUserFormat::Discard()
{
    std::vector<float>().swap(_points);
    std::vector<double>().swap(_pointsDouble);
    std::vector<unsigned char>().swap(_colors);
    std::vector<std::int32_t>().swap(_alphas);
    std::vector<std::int32_t>().swap(_symbols);
    std::vector<std::string>().swap(_texts);
    _count = 0;
    _capacity = 0;
    _hasColor = _hasAlpha = _hasSymbol = _hasText = false;
    _completeLines = 0;
    _numberOfPoints = 0;
    _boundingBox.SetToEmpty();
    _analysed = false;
    ClearBoxCaches();
}

void ZonCloudReadAsciiUserFormat::AnalyseFile()
{
    if (!_fdfRead) return;
    Load(_doublePrecision);
}

bool ZonCloudReadAsciiUserFormat::Prepare(bool wantDouble)
{
    if (!_fdfRead) return false;
    // Doubles cannot be recovered from floats: a double request reloads.
    if (!_analysed || (wantDouble && !_loadedAsDouble)) Load(wantDouble || _doublePrecision);
    if (_completeLines <= 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    return true;
}

std::uint64_t ZonCloudReadAsciiUserFormat::EstimateCapacity(ZonCloudLineSource& lines, std::uint64_t fileSize)
{
    // The average length of the first lines; the caller starts the lines again.
    const char* first = nullptr;
    const char* last = nullptr;
    std::uint64_t sampled = 0;
    while (sampled < SampleLines && lines.Next(first, last)) ++sampled;
    const std::uint64_t average = sampled > 0 ? lines.NextOffset() / sampled : 0;
    if (average == 0) return 0;
    // A complete line holds one token per column and a separator between
    // them, so no file has more points than this; the estimate never asks
    // for more room than the file can fill.
    const std::uint64_t columns = _fields.empty() ? 1 : _fields.size();
    const std::uint64_t mostPoints = fileSize / (2 * columns - 1) + 1;
    return std::min(fileSize / average + 1, mostPoints);
}

void ZonCloudReadAsciiUserFormat::Load(bool asDouble)
{
    Discard();
    _loadedAsDouble = asDouble;
    Guarded([this] {
        ZonCloudByteSource& source = Source();
        _completeLines = 0;
        _dataStart = 0;
        if (source.Size() < 0) {
            // A stream without a size (a pipe) cannot be estimated.
            errno = ESPIPE;
            ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
        }
        ZonCloudLineSource lines(DataLinePiece);
        lines.Start(source, 0);
        _estimate = EstimateCapacity(lines, static_cast<std::uint64_t>(source.Size()));
        if (const unsigned char* text = ZonCloudChunkedText::MapIfWorth(source, 0)) {
            ReadLinesInChunks(text);
        } else {
            lines.Start(source, 0);
            ReadLines(lines);
        }
        // Everything is in memory now.
        CloseSource();
    });
}

void ZonCloudReadAsciiUserFormat::ReadLines(ZonCloudLineSource& lines)
{
    _colorIndex = 3;
    _symbolIndex = 0;
    ZonCloudSampler sampler = ZonCloudSampler::InDouble(_samplingPercent);
    ZonMathBox box;
    LineValues values;
    const char* first = nullptr;
    const char* last = nullptr;
    while (lines.Next(first, last)) {
        bool complete = false;
        ParseLine(first, last, values, complete);
        TakeLine(values, complete, lines.NextOffset(), sampler, box);
    }
    FinishLines(box);
}

void ZonCloudReadAsciiUserFormat::ReadLinesInChunks(const unsigned char* text)
{
    struct Line {
        LineValues values;
        bool complete;
        std::uint64_t nextOffset;
    };
    struct Chunk {
        std::vector<Line> lines;
    };
    _colorIndex = 3;
    _symbolIndex = 0;
    ZonCloudSampler sampler = ZonCloudSampler::InDouble(_samplingPercent);
    ZonMathBox box;
    const auto parse = [&](ZonCloudChunkLines& lines, Chunk& chunk) {
        const char* first = nullptr;
        const char* last = nullptr;
        while (lines.Next(first, last)) {
            Line& line = chunk.lines.emplace_back();
            ParseLine(first, last, line.values, line.complete);
            line.nextOffset = lines.NextOffset();
        }
    };
    const auto stitch = [&](Chunk& chunk) {
        for (Line& line : chunk.lines) TakeLine(line.values, line.complete, line.nextOffset, sampler, box);
        return true;
    };
    ZonCloudChunkedText::Run<Chunk>(_source, text, 0, DataLinePiece, parse, stitch);
    FinishLines(box);
}

void ZonCloudReadAsciiUserFormat::TakeLine(LineValues& values, bool complete, std::uint64_t nextOffset,
                                           ZonCloudSampler& sampler, ZonMathBox& box)
{
    if (values.setsColorIndex) _colorIndex = values.colorIndex;
    if (values.setsSymbolIndex) _symbolIndex = values.symbolIndex;
    _hasAlpha |= values.hasAlpha;
    _hasSymbol |= values.hasSymbol;
    _hasText |= values.hasText;
    if (!complete) {
        if (_completeLines == 0) _dataStart = static_cast<long>(nextOffset);
        return;
    }
    const auto above255 = [](std::int32_t v) { return static_cast<std::uint32_t>(v) > 255u; };
    if (above255(values.r) || above255(values.g) || above255(values.b) || above255(values.a))
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_RGBColorOutOfRange");
    if (static_cast<std::uint32_t>(_colorIndex) > 7u)
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_ColorIndexOutOfRange");
    if (values.colorCounter == 4) {
        // COLOR was the line's last colour column: the palette wins.
        values.r = Palette[_colorIndex][0];
        values.g = Palette[_colorIndex][1];
        values.b = Palette[_colorIndex][2];
        values.a = 255;
    }
    if (static_cast<std::uint32_t>(_symbolIndex) > 8u)
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_SymbolIndexOutOfRange");
    if (_keepColors && (values.colorCounter == 3 || values.colorCounter == 4)) _hasColor = true;

    ++_completeLines;
    box.AddPoint(values.x, values.y, values.z);
    if (sampler.Keep()) StorePoint(values);
}

void ZonCloudReadAsciiUserFormat::FinishLines(const ZonMathBox& box)
{
    if (_completeLines > 0) _boundingBox = box;
    _numberOfPoints = static_cast<int>(std::min<std::int64_t>(_completeLines, std::numeric_limits<int>::max()));
    if (_completeLines == 0) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, "ERR_NoPointFound");
    _analysed = true;
}

void ZonCloudReadAsciiUserFormat::ParseLine(const char* first, const char* last, LineValues& values,
                                            bool& complete) const
{
    values.x = values.y = values.z = 0.0;
    values.r = 0;
    values.g = 255;
    values.b = 0;
    values.a = 255;
    values.colorCounter = 0;
    values.setsColorIndex = values.setsSymbolIndex = false;
    values.hasAlpha = values.hasSymbol = values.hasText = false;
    values.text.clear();
    complete = false;

    Token tokens[MaxTokens];
    const int tokenCount = Tokenize(first, CutBeforeNewline(first, last), tokens, MaxTokens);
    if (tokenCount == 0 || tokens[0].text[0] == '!') return;

    const std::size_t fieldCount = _fields.size();
    std::size_t field = 0;
    int t = 0;
    std::string quoted;
    for (; field < fieldCount && t < tokenCount; ++field, ++t) {
        const Token& token = tokens[t];
        quoted.clear();
        if (token.quoted) {
            // A quoted text may run over several tokens; those take no column.
            const char* rest = std::find(token.text, token.End(), '"') + 1;
            if (const char* close = std::find(rest, token.End(), '"'); close != token.End()) {
                quoted.assign(rest, close);
            } else {
                quoted.assign(rest, token.End());
                while (t + 1 < tokenCount) {
                    const Token& next = tokens[++t];
                    quoted += ' ';
                    if (next.quoted) {
                        quoted.append(next.text, std::find(next.text, next.End(), '"'));
                        break;
                    }
                    quoted.append(next.text, next.End());
                }
            }
        }
        switch (_fields[field]) {
            case FieldX:
                values.x = ReadReal(token);
                break;
            case FieldY:
                values.y = ReadReal(token);
                break;
            case FieldZ:
                values.z = ReadReal(token);
                break;
            case FieldDX:
            case FieldDY:
            case FieldDZ:
                ReadReal(token);  // directions are read, not kept
                break;
            case FieldR:
                ReadInteger(token, values.r);
                ++values.colorCounter;
                break;
            case FieldG:
                ReadInteger(token, values.g);
                ++values.colorCounter;
                break;
            case FieldB:
                ReadInteger(token, values.b);
                ++values.colorCounter;
                break;
            case FieldA:
                ReadInteger(token, values.a);
                values.hasAlpha = true;
                break;
            case FieldColor:
                values.setsColorIndex |= ReadInteger(token, values.colorIndex);
                values.colorCounter = 4;
                break;
            case FieldSymbol:
                values.setsSymbolIndex |= ReadInteger(token, values.symbolIndex);
                values.hasSymbol = true;
                break;
            case FieldText:
                values.text += '/';
                values.text += quoted;
                values.text += '%';
                values.hasText = true;
                break;
            default:  // LABEL, USELESS_INFO: the column is only consumed
                break;
        }
    }
    complete = fieldCount > 0 && field == fieldCount;
}

void ZonCloudReadAsciiUserFormat::Grow()
{
    const std::uint64_t capacity = (_capacity == 0 && _estimate != 0) ? _estimate : _capacity + GrowthStep;
    if (_loadedAsDouble)
        Reserve(_pointsDouble, 3 * capacity);
    else
        Reserve(_points, 3 * capacity);
    if (_fieldsHaveColor && _keepColors) Reserve(_colors, 3 * capacity);
    if (_fieldsHaveAlpha) Reserve(_alphas, capacity);
    if (_fieldsHaveSymbol) Reserve(_symbols, capacity);
    if (_fieldsHaveText) Reserve(_texts, capacity);
    _capacity = capacity;
}

void ZonCloudReadAsciiUserFormat::StorePoint(const LineValues& values)
{
    if (_count >= std::numeric_limits<unsigned>::max()) RaiseMemoryError();
    if (_count == _capacity) Grow();
    if (_loadedAsDouble) {
        _pointsDouble.push_back(values.x);
        _pointsDouble.push_back(values.y);
        _pointsDouble.push_back(values.z);
    } else {
        _points.push_back(static_cast<float>(values.x));
        _points.push_back(static_cast<float>(values.y));
        _points.push_back(static_cast<float>(values.z));
    }
    if (_fieldsHaveColor && _keepColors) {
        _colors.push_back(static_cast<unsigned char>(values.r));
        _colors.push_back(static_cast<unsigned char>(values.g));
        _colors.push_back(static_cast<unsigned char>(values.b));
    }
    if (_fieldsHaveAlpha) _alphas.push_back(values.a);
    if (_fieldsHaveSymbol) _symbols.push_back(_symbolIndex);
    if (_fieldsHaveText) _texts.push_back(values.text);
    ++_count;
}

const float* ZonCloudReadAsciiUserFormat::GetPoints(unsigned& count)
{
    count = 0;
    if (!Prepare(false)) return nullptr;
    if (_loadedAsDouble && _points.size() != 3 * _count) {
        // Loaded for doubles: floats are the same values narrowed.
        Guarded([this] { _points.assign(_pointsDouble.begin(), _pointsDouble.end()); });
    }
    count = static_cast<unsigned>(_count);
    return _points.data();
}

const double* ZonCloudReadAsciiUserFormat::GetPointsDouble(unsigned& count)
{
    count = 0;
    if (!Prepare(true)) return nullptr;
    count = static_cast<unsigned>(_count);
    return _pointsDouble.data();
}

const unsigned char* ZonCloudReadAsciiUserFormat::GetPointColors(unsigned& count)
{
    count = 0;
    if (!Prepare(false) || !_hasColor) return nullptr;
    count = static_cast<unsigned>(_count);
    return _colors.data();
}

const void* ZonCloudReadAsciiUserFormat::GetPointAttributes1(unsigned& count)
{
    count = 0;
    if (!Prepare(false) || !_hasAlpha) return nullptr;
    count = static_cast<unsigned>(_count);
    return _alphas.data();
}

const void* ZonCloudReadAsciiUserFormat::GetPointAttributes2(unsigned& count)
{
    count = 0;
    if (!Prepare(false) || !_hasSymbol) return nullptr;
    count = static_cast<unsigned>(_count);
    return _symbols.data();
}

const void* ZonCloudReadAsciiUserFormat::GetPointAttributes3(unsigned& count)
{
    count = 0;
    if (!Prepare(false) || !_hasText) return nullptr;
    count = static_cast<unsigned>(_count);
    return _texts.data();
}
