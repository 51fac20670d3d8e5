#include "ZonCloudReadIges.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "ZonCloudLineSource.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudSampler.h"
#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr int kPointEntity = 116;
constexpr int kCopiousEntity = 106;
// Counts are 32-bit numbers of points and the reader's total is an int.
constexpr std::size_t kMaxPoints = std::numeric_limits<int>::max();
// No copious entity can carry more values than a file holds characters; the
// bound only keeps the value arithmetic in range.
constexpr std::int64_t kMaxCount = std::int64_t{1} << 40;

bool IsSpace(char c) { return c == ' ' || (c >= '\t' && c <= '\r'); }

bool IsBlank(const char* first, const char* last) { return std::all_of(first, last, IsSpace); }

const char* Find(const char* first, const char* last, char c)
{
    const void* hit = std::memchr(first, c, static_cast<std::size_t>(last - first));
    return hit ? static_cast<const char*>(hit) : nullptr;
}

// A whole number as atoi reads it (white space, sign, digits, anything after
// ignored; no digits read as 0), saturated instead of overflowing.
std::int64_t ReadInteger(const char* first, const char* last)
{
    while (first < last && IsSpace(*first)) ++first;
    bool negative = false;
    if (first < last && (*first == '+' || *first == '-')) negative = *first++ == '-';
    std::int64_t value = 0;
    for (; first < last && *first >= '0' && *first <= '9'; ++first)
        value = std::min<std::int64_t>(value * 10 + (*first - '0'), kMaxCount);
    return negative ? -value : value;
}

// A value as atof reads it: the longest number at the start of the text
// (after white space), 0 when there is none. IGES writes '.' whatever the
// locale.
double ReadValue(const char* first, const char* last)
{
    double value = 0.0;
    return ZonParseDouble(first, last, '.', value) ? value : 0.0;
}

// The field up to the next comma; `p` moves past that comma.
std::pair<const char*, const char*> NextField(const char*& p, const char* last)
{
    const char* first = p;
    const char* comma = Find(p, last, ',');
    p = comma ? comma + 1 : last;
    return {first, comma ? comma : last};
}

// The entity a line begins: 116 or 106, else 0 (a continuation line). A line
// ended by ";" whose first field is the bare number begins one too, while a
// coordinate such as "106.25;" is data.
int EntityOf(const char* first, const char* last)
{
    const std::size_t length = static_cast<std::size_t>(last - first);
    if (length >= 4 && first[3] == ',' && first[0] == '1' && first[1] == '1' && first[2] == '6') return kPointEntity;
    if (length >= 4 && first[3] == ',' && first[0] == '1' && first[1] == '0' && first[2] == '6') return kCopiousEntity;
    if (!Find(first, last, ';')) return 0;
    const char* comma = Find(first, last, ',');
    const char* fieldEnd = comma ? comma : last;
    if (Find(first, fieldEnd, '.')) return 0;
    const std::int64_t number = ReadInteger(first, fieldEnd);
    return number == kPointEntity || number == kCopiousEntity ? static_cast<int>(number) : 0;
}

}  // namespace

class ZonCloudReadIges::Parser {
public:
    explicit Parser(Content& content) : _content(content) {}

    void Line(const char* first, const char* last)
    {
        switch (EntityOf(first, last)) {
        case kPointEntity:
            BeginPoint(first, last);
            break;
        case kCopiousEntity:
            BeginCopious(first, last);
            break;
        default:
            if (_entity != Entity::None) Scan(first, last);
        }
    }

    void Finish()
    {
        if (_entity != Entity::None) End();
        CloseRun(false);
    }

    unsigned Scans() const { return _scans; }
    ZonMathBox Box() const
    {
        ZonMathBox box;
        if (_low[0] <= _high[0] && _low[1] <= _high[1] && _low[2] <= _high[2])
            box.SetLowHigh(ZonMathPoint(_low[0], _low[1], _low[2]), ZonMathPoint(_high[0], _high[1], _high[2]));
        return box;
    }

private:
    enum class Entity { None, Point, Copious };

    void BeginPoint(const char* first, const char* last)
    {
        if (_entity != Entity::None) End();
        _entity = Entity::Point;
        _index = 0;
        const char* p = first;
        const auto [fieldFirst, fieldLast] = NextField(p, last);
        if (Find(fieldFirst, fieldLast, ';'))
            End();
        else
            Scan(p, last);
    }

    void BeginCopious(const char* first, const char* last)
    {
        if (_entity != Entity::None) End();
        const char* p = first;
        NextField(p, last);
        const auto [formFirst, formLast] = NextField(p, last);
        const auto [countFirst, countLast] = NextField(p, last);
        const std::int64_t form = ReadInteger(formFirst, formLast);
        const std::int64_t n = std::max<std::int64_t>(ReadInteger(countFirst, countLast), 0);
        switch (form) {
        case 1:  // a common z, then (x, y) pairs
            _expected = 2 * n + 1;
            break;
        case 2:  // (x, y, z) triples
            _expected = 3 * n;
            break;
        case 3:  // a point and a vector each
            _expected = 6 * n;
            break;
        default:  // forms of other data: skipped
            return;
        }
        CloseRun(false);
        _entity = Entity::Copious;
        _form = static_cast<int>(form);
        _index = 0;
        _entityStart = _content.points.size();
        if (_expected == 0 || Find(formFirst, countLast, ';'))
            End();
        else
            Scan(p, last);
    }

    // Values at runs of commas. A token with a "P" and no ";" is the section
    // letter and sequence number of the line's last columns; ";" ends the
    // entity after its value.
    void Scan(const char* p, const char* last)
    {
        while (_entity != Entity::None && p < last) {
            while (p < last && *p == ',') ++p;
            if (p == last) break;
            const char* comma = Find(p, last, ',');
            if (!comma) comma = last;
            const char* semicolon = Find(p, comma, ';');
            const char* end = semicolon ? semicolon : comma;
            // White space alone (the end of a line that ends with a comma) is no value.
            if ((semicolon || !Find(p, comma, 'P')) && !IsBlank(p, end)) Value(ReadValue(p, end));
            if (semicolon && _entity != Entity::None) End();
            p = comma;
        }
    }

    void Value(double value)
    {
        const auto v = static_cast<float>(value);
        const std::int64_t i = _index++;
        if (_entity == Entity::Point) {
            // x, y, z; the rest of the entity's parameters do not matter.
            if (i < 3) _xyz[i] = v;
            if (i == 2) Add();
            return;
        }
        switch (_form) {
        case 1:
            if (i == 0) {
                _xyz[2] = v;
            } else if (i % 2 == 1) {
                _xyz[0] = v;
            } else {
                _xyz[1] = v;
                Add();
            }
            break;
        case 2:
            _xyz[i % 3] = v;
            if (i % 3 == 2) Add();
            break;
        default:
            if (i % 6 < 3) _xyz[i % 6] = v;
            if (i % 6 == 2) Add();
            break;
        }
        if (_index == _expected) End();
    }

    void Add()
    {
        std::vector<float>& points = _content.points;
        if (points.size() >= 3 * kMaxPoints) return;
        points.insert(points.end(), _xyz, _xyz + 3);
        for (int k = 0; k < 3; ++k) {
            _low[k] = _xyz[k] < _low[k] ? _xyz[k] : _low[k];
            _high[k] = _xyz[k] > _high[k] ? _xyz[k] : _high[k];
        }
    }

    void End()
    {
        // A copious entity that gave points ends a scan, with the isolated
        // points gathered before it.
        if (_entity == Entity::Copious && _content.points.size() > _entityStart) {
            CloseRun(true);
            _content.hasCopiousPoints = true;
            ++_scans;
        }
        _entity = Entity::None;
    }

    void CloseRun(bool endsScan)
    {
        const std::uint64_t end = _content.points.size() / 3;
        if (end > _runStart) {
            _content.runs.push_back({end, endsScan});
            _runStart = end;
        } else if (endsScan && !_content.runs.empty()) {
            _content.runs.back().endsScan = true;
        }
    }

    Content& _content;
    Entity _entity = Entity::None;
    int _form = 0;
    std::int64_t _expected = 0;
    std::int64_t _index = 0;
    std::size_t _entityStart = 0;
    std::uint64_t _runStart = 0;
    unsigned _scans = 0;
    float _xyz[3] = {0, 0, 0};
    float _low[3] = {std::numeric_limits<float>::infinity(), std::numeric_limits<float>::infinity(),
                     std::numeric_limits<float>::infinity()};
    float _high[3] = {-std::numeric_limits<float>::infinity(), -std::numeric_limits<float>::infinity(),
                      -std::numeric_limits<float>::infinity()};
};

ZonCloudReadIges::ZonCloudReadIges(const ZonUnicodeString& fileName) : ZonCloudReadFile(fileName) {}

ZonCloudReadIges::~ZonCloudReadIges() = default;

void ZonCloudReadIges::AnalyseFile()
{
    _content = Content();
    _cloud = {};
    _cloudPercent = -1.0f;
    _scanCount = 0;
    Parser parser(_content);
    {
        // Pieces as a 512-character line buffer receives them: the tail of a
        // longer line is read as a line of its own.
        ZonCloudLineSource lines(ZonCloudLineSource::FgetsPiece);
        lines.Start(Source(), 0);
        const char* first = nullptr;
        const char* last = nullptr;
        while (lines.Next(first, last)) parser.Line(first, last);
        parser.Finish();
    }
    // Everything is in memory now.
    CloseSource();
    const std::size_t count = _content.points.size() / 3;
    if (count == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _content.points.shrink_to_fit();
    _numberOfPoints = static_cast<int>(count);
    _boundingBox = parser.Box();
    _digitizationType = _content.hasCopiousPoints ? DigitizationScans : DigitizationCloud;
    // Isolated points after the last copious entity make a last scan.
    _scanCount = parser.Scans() + (_content.runs.back().endsScan ? 0u : 1u);
}

unsigned ZonCloudReadIges::GetNumberOfScans()
{
    Analyse();
    return _scanCount;
}

// The points of runs [firstRun, endRun), each run sampled on its own; at 100 %
// the stored points themselves.
const float* ZonCloudReadIges::Sampled(std::size_t firstRun, std::size_t endRun, std::vector<float>& out,
                                       unsigned& count)
{
    const std::uint64_t first = firstRun == 0 ? 0 : _content.runs[firstRun - 1].end;
    const std::uint64_t last = endRun == 0 ? 0 : _content.runs[endRun - 1].end;
    const float* all = _content.points.data();
    if (_samplingPercent >= 100.0f) {
        count = static_cast<unsigned>(last - first);
        return count ? all + 3 * first : nullptr;
    }
    out.clear();
    ZonCloudSampler sampler(_samplingPercent);
    std::uint64_t start = first;
    for (std::size_t r = firstRun; r < endRun; ++r) {
        sampler.Restart();
        for (std::uint64_t i = start; i < _content.runs[r].end; ++i)
            if (sampler.Keep()) Allocating([&] { out.insert(out.end(), all + 3 * i, all + 3 * i + 3); });
        start = _content.runs[r].end;
    }
    count = static_cast<unsigned>(out.size() / 3);
    return count ? out.data() : nullptr;
}

const float* ZonCloudReadIges::GetPoints(unsigned& count)
{
    Analyse();
    if (_cloudPercent != _samplingPercent) {
        _cloudPoints = Sampled(0, _content.runs.size(), _cloud, _cloudCount);
        _cloudPercent = _samplingPercent;
    }
    count = _cloudCount;
    return _cloudPoints;
}

void ZonCloudReadIges::BeginGetSetOfScans()
{
    Analyse();
    _setBegun = true;
    _setGiven = false;
    _scanBegun = false;
    _hasScan = false;
}

bool ZonCloudReadIges::NextSetOfScans()
{
    if (!_setBegun) Tool::Raise(Tool::Data, "ERR_BeginGetSetOfScansNotDone");
    if (_setGiven) return false;
    _setGiven = true;
    return true;
}

void ZonCloudReadIges::BeginGetScan()
{
    if (!_setGiven) Tool::Raise(Tool::Usage, "ERR_NextSetOfScansNotDone");
    _scanBegun = true;
    _scansEnded = false;
    _nextRun = 0;
    _hasScan = false;
}

bool ZonCloudReadIges::NextScan()
{
    RequireScan();
    _hasScan = false;
    _scan = {};
    if (_scansEnded) {
        // A file of isolated points has given them as its one scan.
        if (_digitizationType != DigitizationScans) Tool::Raise(Tool::Usage, "ERR_NotAScanDigit");
        return false;
    }
    const std::size_t first = _nextRun;
    std::size_t end = first;
    while (end < _content.runs.size() && !_content.runs[end].endsScan) ++end;
    if (end < _content.runs.size())
        ++end;
    else
        _scansEnded = true;
    _nextRun = end;
    if (first == end) return false;
    _scanFirstRun = first;
    _scanEndRun = end;
    _hasScan = true;
    return true;
}

const float* ZonCloudReadIges::GetScanPoints(unsigned& count)
{
    RequireScan();
    count = 0;
    if (!_hasScan) return nullptr;
    return Sampled(_scanFirstRun, _scanEndRun, _scan, count);
}

void ZonCloudReadIges::RequireScan()
{
    if (!_scanBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetScanNotDone");
}
