#include "ZonCldReadArcInfoGrid.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>
#include <memory>
#include <string>
#include <string_view>

#include "ZonCloudLineSource.h"
#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

// Header lines are cut as a 1024-byte fgets buffer cuts them.
constexpr std::size_t kHeaderPiece = 1023;
constexpr std::size_t kBlock = std::size_t(1) << 20;

bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }
bool IsLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }

bool IsWord(std::string_view word, const char* lower)
{
    const std::size_t n = std::strlen(lower);
    if (word.size() != n) return false;
    for (std::size_t i = 0; i < n; ++i)
        if ((word[i] | 0x20) != lower[i]) return false;
    return true;
}

// The header is the leading lines that begin with a word; the values begin
// with a number (a word such as "nan" or "inf" is a value too).
bool IsHeaderLine(std::string_view line)
{
    std::size_t i = 0;
    while (i < line.size() && IsSpace(line[i])) ++i;
    if (i == line.size() || !IsLetter(line[i])) return false;
    std::size_t end = i;
    while (end < line.size() && IsLetter(line[end])) ++end;
    const std::string_view word = line.substr(i, end - i);
    return !IsWord(word, "nan") && !IsWord(word, "inf") && !IsWord(word, "infinity");
}

// "%d" at `skip` characters after the keyword found at `at`; nothing when the
// line ends before or no number is there.
void ReadWhole(std::string_view line, std::size_t at, std::size_t skip, std::int32_t& value, bool* given = nullptr)
{
    static const ZonCloudScanFormat format("%d");
    if (at + skip > line.size()) return;
    std::int32_t read = 0;
    void* const destinations[] = {&read, nullptr};
    if (format.Scan(line.data() + at + skip, line.data() + line.size(), '.', destinations) != 1) return;
    value = read;
    if (given) *given = true;
}

// The values, one after another whatever the lines, from a large buffer. A
// value is parsed only when the buffer holds its end (white space follows it
// in the buffer, or the file ends), so none is cut by a refill.
class ValueReader {
public:
    ValueReader(ZonCloudByteSource& source, std::uint64_t offset) : _source(source)
    {
        const std::int64_t size = source.Size();
        const std::uint64_t left = size > 0 && static_cast<std::uint64_t>(size) > offset
                                       ? static_cast<std::uint64_t>(size) - offset
                                       : 0;
        _capacity = static_cast<std::size_t>(std::clamp<std::uint64_t>(left + 1, 4096, kBlock));
        _buffer = std::make_unique<char[]>(_capacity);
        source.Seek(offset);
        Refill();
    }

    // The next value; false when the file has no more.
    bool Next(float& value)
    {
        for (;;) {
            while (_begin < _end && IsSpace(_buffer[_begin])) ++_begin;
            if (_begin < _safeEnd || (_atEnd && _begin < _end)) break;
            if (_atEnd) return false;
            Refill();
        }
        const char* first = _buffer.get() + _begin;
        const char* last = ZonParseFloat(first, _buffer.get() + _end, '.', value);
        if (!last) {
            errno = EINVAL;
            Tool::Raise(Tool::Input, nullptr);
        }
        _begin = static_cast<std::size_t>(last - _buffer.get());
        return true;
    }

private:
    void Refill()
    {
        std::memmove(_buffer.get(), _buffer.get() + _begin, _end - _begin);
        _end -= _begin;
        _begin = 0;
        while (_end < _capacity && !_atEnd) {
            const std::size_t got = _source.ReadSome(_buffer.get() + _end, _capacity - _end);
            _end += got;
            _atEnd = got == 0;
        }
        // A value starting before the last white space ends in the buffer. A
        // buffer without any is one giant word: it is parsed as it stands.
        _safeEnd = _end;
        while (_safeEnd > 0 && !IsSpace(_buffer[_safeEnd - 1])) --_safeEnd;
        if (_safeEnd > 0) --_safeEnd;
        else _safeEnd = _end;
    }

    ZonCloudByteSource& _source;
    std::unique_ptr<char[]> _buffer;
    std::size_t _capacity = 0;
    std::size_t _begin = 0, _end = 0, _safeEnd = 0;
    bool _atEnd = false;
};

}  // namespace

ZonCldReadArcInfoGrid::ZonCldReadArcInfoGrid(const ZonUnicodeString& fileName) : ZonCloudReadGridMesh(fileName) {}

const ZonCldReadArcInfoGrid::Header& ZonCldReadArcInfoGrid::GetHeader()
{
    Analyse();
    return _header;
}

void ZonCldReadArcInfoGrid::AnalyseFile()
{
    _header = Header();
    ReadCells(ReadHeader());
    const auto rows = static_cast<std::uint64_t>(std::max(_header.rows, 0));
    const auto columns = static_cast<std::uint64_t>(std::max(_header.columns, 0));
    BuildGridTriangles(rows, columns, _points.size() / 3);
    FinishPoints();
}

// Returns the offset of the first value line.
std::uint64_t ZonCldReadArcInfoGrid::ReadHeader()
{
    // Searched in this order anywhere in a line; the first found decides.
    // Some writers spell them in capitals, so the search ignores case.
    static const struct {
        const char* word;  // lower case
        std::size_t skip;  // characters from the keyword's start to the number
        std::int32_t Header::*field;
    } keywords[] = {
        {"ncols", 5, &Header::columns},       {"nrows", 5, &Header::rows},
        {"xllcorner", 9, &Header::xCorner},   {"yllcorner", 9, &Header::yCorner},
        {"cellsize", 9, &Header::cellSize},   {"nodata_value", 12, &Header::noData},
    };
    ZonCloudByteSource& source = Source();
    ZonCloudLineSource lines(kHeaderPiece, 64 * 1024);
    lines.Start(source, 0);
    std::string_view line;
    std::string lower;
    while (lines.Next(line)) {
        if (!IsHeaderLine(line)) return lines.LineOffset();
        lower.assign(line);
        for (char& ch : lower) ch = static_cast<char>(ch >= 'A' && ch <= 'Z' ? ch | 0x20 : ch);
        const auto keyword = std::find_if(std::begin(keywords), std::end(keywords),
                                          [&](const auto& k) { return lower.find(k.word) != std::string::npos; });
        if (keyword != std::end(keywords)) {
            ReadWhole(line, lower.find(keyword->word), keyword->skip, _header.*keyword->field);
            continue;
        }
        // Spacings of cells that are not square, as their own first word.
        const std::size_t start = lower.find_first_not_of(" \t");
        const std::string_view word = std::string_view(lower).substr(start, 3);
        if (word.size() < 2 || word[0] != 'd' || (word.size() == 3 && !IsSpace(word[2]))) continue;
        if (word[1] == 'x') ReadWhole(line, start, 2, _header.dx, &_header.hasDx);
        if (word[1] == 'y') ReadWhole(line, start, 2, _header.dy, &_header.hasDy);
    }
    return lines.NextOffset();
}

void ZonCldReadArcInfoGrid::ReadCells(std::uint64_t offset)
{
    const auto rows = static_cast<std::uint64_t>(std::max(_header.rows, 0));
    const auto columns = static_cast<std::uint64_t>(std::max(_header.columns, 0));
    const std::uint64_t cells = rows * columns;
    if (cells == 0) return;
    // Each value takes a character and all but the last a separator: a file
    // too short for the cells it announces fails before anything is allocated.
    ZonCloudByteSource& source = Source();
    if (!source.Fits(offset, 2 * cells - 1, 1)) {
        errno = ENODATA;
        Tool::Raise(Tool::Input, nullptr);
    }
    ReservePoints(cells);
    std::vector<float> ys;
    Resize(ys, columns);
    for (std::uint64_t c = 0; c < columns; ++c)
        ys[c] = static_cast<float>(static_cast<double>(c) * _header.ColumnStep() + _header.yCorner);
    Resize(_points, 3 * cells);
    ValueReader values(source, offset);
    float* p = _points.data();
    for (std::uint64_t r = 0; r < rows; ++r) {
        const auto x = static_cast<float>(_header.xCorner + static_cast<double>(r) * _header.RowStep());
        for (std::uint64_t c = 0; c < columns; ++c, p += 3) {
            p[0] = x;
            p[1] = ys[c];
            if (!values.Next(p[2])) {
                errno = ENODATA;
                Tool::Raise(Tool::Input, nullptr);
            }
        }
    }
}
