#include "ZonCloudReadAtos.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "DecimalPointGuard.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr char Magic[] = "%ATOSBIN";
constexpr char Version[] = "v4.4.3";
constexpr std::uint64_t HeaderSize = 28;
constexpr std::uint64_t DescriptorsAt = 512;
constexpr std::uint64_t DescriptorSize = 76;  // through the two blocks of three reals
constexpr std::uint64_t RecordUsed = 40;      // x, y, z, pixel column and row, quality
constexpr std::uint64_t Chunk = std::uint64_t{1} << 20;
constexpr int MaxUnknownLines = 200;

template <class T>
T Little(const unsigned char* p)
{
    return ZonCloudByteSource::LoadLittle<T>(p);
}

const ZonCloudScanFormat& PointLine()
{
    static const ZonCloudScanFormat format("%lf%lf%lf%d%d%lf");
    return format;
}

bool IsBlank(const char* first, const char* last)
{
    for (; first != last; ++first)
        if (*first != ' ' && *first != '\t' && *first != '\r' && *first != '\n') return false;
    return true;
}

// A header key followed by its "%d" value; a step of 0 reads as 1.
bool TakeKey(const char* first, const char* last, const char* key, std::uint32_t& value)
{
    static const ZonCloudScanFormat format("%d");
    const std::size_t length = std::strlen(key);
    if (static_cast<std::size_t>(last - first) < length || std::memcmp(first, key, length) != 0) return false;
    int read = 0;
    void* const args[] = {&read, nullptr};
    if (format.Scan(first + length, last, '.', args) == 1)
        value = read <= 0 ? 1u : static_cast<std::uint32_t>(read);
    return true;
}

}  // namespace

ZonCloudReadAtos::ZonCloudReadAtos(const ZonUnicodeString& fileName)
    : ZonCloudReadFile(fileName), _nativePoint(DecimalPointGuard().DecimalPoint())
{
}

void ZonCloudReadAtos::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) _cloudRead = false;
}

void ZonCloudReadAtos::SetMinPointQuality(float quality)
{
    if (quality == _minQuality) return;
    _minQuality = quality;
    // The valid points, their count and their box all follow the minimum.
    _cloudRead = false;
    _cursor.Reset();
    Reanalyse();
}

void ZonCloudReadAtos::GetQualityRange(double& least, double& greatest)
{
    Analyse();
    least = _leastQuality;
    greatest = _greatestQuality;
}

int ZonCloudReadAtos::GetNumberOfGrids()
{
    Analyse();
    return static_cast<int>(_grids.size());
}

void ZonCloudReadAtos::GetGridSize(int n, int& rows, int& columns)
{
    Analyse();
    if (n < 1 || static_cast<std::size_t>(n) > _grids.size()) Tool::Raise(Tool::Usage, "ERR_GridNumberIsInvalid");
    const Grid& grid = _grids[static_cast<std::size_t>(n - 1)];
    rows = static_cast<int>(grid.Rows());
    columns = static_cast<int>(grid.Columns());
}

bool ZonCloudReadAtos::IsBinary()
{
    Analyse();
    return _binary;
}

// ---- Analysis ---------------------------------------------------------------

void ZonCloudReadAtos::ResetAnalysis()
{
    _grids.clear();
    _numberOfPoints = 0;
    _boundingBox = ZonMathBox();
    _leastQuality = _greatestQuality = 0.0;
    _qualitySeen = false;
    for (int a = 0; a < 3; ++a) {
        _low[a] = std::numeric_limits<float>::infinity();
        _high[a] = -std::numeric_limits<float>::infinity();
    }
    _cloud.clear();
    _cloudRead = false;
    _cursor.Reset();
    _lines.Release();
}

void ZonCloudReadAtos::AnalyseFile()
{
    ResetAnalysis();
    _decimalPointSwitched = false;
    ZonCloudByteSource& source = Source();
    char magic[8];
    source.Read(magic, sizeof magic);
    _binary = std::memcmp(magic, Magic, sizeof magic) == 0;
    if (_binary) {
        AnalyseBinary();
    } else {
        _decimalPoint = _nativePoint;
        if (!AnalyseText(_decimalPoint)) {
            // Numbers written with '.' under a locale whose decimal point is
            // another: read the file again the way the "C" locale would.
            if (_decimalPoint == '.') Tool::Raise(Tool::Data, "ERR_TooManyUnknownData");
            _decimalPoint = '.';
            _decimalPointSwitched = true;
            if (!AnalyseText(_decimalPoint)) Tool::Raise(Tool::Data, "ERR_TooManyUnknownData");
        }
        _lines.Release();
    }
    if (_low[0] <= _high[0] && _low[1] <= _high[1] && _low[2] <= _high[2])
        _boundingBox = ZonMathBox(_low[0], _high[0], _low[1], _high[1], _low[2], _high[2]);
    _digitizationType = DigitizationGrids;
}

void ZonCloudReadAtos::Count(Grid& grid, const Record& record)
{
    grid.minColumn = std::min(grid.minColumn, record.column);
    grid.maxColumn = std::max(grid.maxColumn, record.column);
    grid.minRow = std::min(grid.minRow, record.row);
    grid.maxRow = std::max(grid.maxRow, record.row);
    if (!_qualitySeen) {
        _leastQuality = _greatestQuality = record.quality;
        _qualitySeen = true;
    } else {
        _leastQuality = std::min(_leastQuality, record.quality);
        _greatestQuality = std::max(_greatestQuality, record.quality);
    }
    ++grid.records;
    if (!IsValid(record.quality)) return;
    ++_numberOfPoints;
    // The box of the points as they are delivered, in single precision.
    const float p[3] = {static_cast<float>(record.x), static_cast<float>(record.y), static_cast<float>(record.z)};
    for (int a = 0; a < 3; ++a) {
        _low[a] = p[a] < _low[a] ? p[a] : _low[a];
        _high[a] = p[a] > _high[a] ? p[a] : _high[a];
    }
}

template <class Visit>
void ZonCloudReadAtos::ForEachRecord(std::uint64_t offset, std::uint64_t count, Visit visit)
{
    ZonCloudByteSource& source = Source();
    if (count == 0) return;
    if (_recordSize > Chunk) {
        // Huge records: only their first bytes are of use.
        Resize(_buffer, RecordUsed);
        for (std::uint64_t i = 0; i < count; ++i, offset += _recordSize) {
            source.Seek(offset);
            source.Read(_buffer.data(), RecordUsed);
            visit(offset, _buffer.data());
        }
        return;
    }
    const std::uint64_t perChunk = Chunk / _recordSize;
    Resize(_buffer, std::min(count, perChunk) * _recordSize);
    source.Seek(offset);
    while (count > 0) {
        const std::uint64_t n = std::min(count, perChunk);
        source.Read(_buffer.data(), static_cast<std::size_t>(n * _recordSize));
        const unsigned char* bytes = _buffer.data();
        for (std::uint64_t i = 0; i < n; ++i, bytes += _recordSize, offset += _recordSize) visit(offset, bytes);
        count -= n;
    }
}

ZonCloudReadAtos::Record ZonCloudReadAtos::Decode(const unsigned char* bytes, const Grid& grid) const
{
    Record r;
    r.x = Little<double>(bytes);
    r.y = Little<double>(bytes + 8);
    r.z = Little<double>(bytes + 16);
    r.column = Little<std::uint32_t>(bytes + 24) / grid.stepX;
    r.row = Little<std::uint32_t>(bytes + 28) / grid.stepY;
    r.quality = Little<double>(bytes + 32);
    return r;
}

void ZonCloudReadAtos::AnalyseBinary()
{
    ZonCloudByteSource& source = Source();
    unsigned char header[HeaderSize];
    source.Seek(0);
    source.Read(header, sizeof header);
    if (std::memcmp(header + 8, Version, 6) != 0) Tool::Raise(Tool::Data, "ERR_UnknownData");
    const auto kind = Little<std::uint16_t>(header + 14);
    if (kind == 256) Tool::Raise(Tool::Data, "ERR_FormatNotImplemented");
    if (kind != 1) Tool::Raise(Tool::Data, "ERR_UnknownData");
    const auto grids = Little<std::uint32_t>(header + 16);
    const auto descriptorSize = Little<std::uint32_t>(header + 20);
    _recordSize = Little<std::uint32_t>(header + 24);
    if (descriptorSize < DescriptorSize || _recordSize < RecordUsed) Tool::Raise(Tool::Data, "ERR_UnknownData");
    source.CheckFits(DescriptorsAt, grids, descriptorSize);
    Resize(_grids, grids);
    std::uint64_t allRecords = 0, allNodes = 0;

    for (std::uint32_t i = 0; i < grids; ++i) {
        Grid& grid = _grids[i];
        unsigned char descriptor[DescriptorSize];
        source.Seek(DescriptorsAt + std::uint64_t{i} * descriptorSize);
        source.Read(descriptor, sizeof descriptor);
        grid.start = Little<std::uint32_t>(descriptor);
        const std::uint64_t records = Little<std::uint32_t>(descriptor + 16);
        grid.stepY = std::max<std::uint32_t>(1, Little<std::uint32_t>(descriptor + 20));
        grid.stepX = std::max<std::uint32_t>(1, Little<std::uint32_t>(descriptor + 24));
        source.CheckFits(grid.start, records, _recordSize);
        // Patches hold distinct records: more than the file has room for
        // means descriptors that claim the same records again and again.
        allRecords += records;
        if (allRecords > static_cast<std::uint64_t>(source.Size()) / _recordSize ||
            allRecords > static_cast<std::uint64_t>(std::numeric_limits<int>::max()))
            Tool::Raise(Tool::Data, "ERR_UnknownData");

        // The row index covers the rows seen so far; it grows as records of
        // rows outside it come, within what the records can justify.
        std::int64_t base = 0;
        ForEachRecord(grid.start, records, [&](std::uint64_t offset, const unsigned char* bytes) {
            const Record record = Decode(bytes, grid);
            if (grid.rows.empty()) {
                base = record.row;
            } else if (record.row < base || record.row >= base + static_cast<std::int64_t>(grid.rows.size())) {
                const std::int64_t low = std::min(base, record.row);
                const std::int64_t high = std::max(base + static_cast<std::int64_t>(grid.rows.size()) - 1, record.row);
                ZonCloudGridRow::CheckSize(static_cast<std::uint64_t>(high - low) + 1, 1, records);
                if (record.row < base) {
                    Allocating([&] { grid.rows.insert(grid.rows.begin(), static_cast<std::size_t>(base - low), RowSpan{}); });
                    base = low;
                }
            }
            const auto index = static_cast<std::uint64_t>(record.row - base);
            if (index >= grid.rows.size()) Resize(grid.rows, index + 1);
            RowSpan& span = grid.rows[static_cast<std::size_t>(index)];
            span.first = std::min(span.first, offset);
            span.last = std::max(span.last, offset);
            ++span.records;
            Count(grid, record);
        });
        ZonCloudGridRow::CheckSize(grid.Rows(), grid.Columns(), records);
        allNodes += grid.Rows() * grid.Columns();
        ZonCloudGridRow::CheckSize(1, allNodes, allRecords);

        std::uint64_t spanned = 0;
        for (const RowSpan& span : grid.rows)
            if (span.records > 0) spanned += (span.last - span.first) / _recordSize + 1;
        if (spanned > 4 * records + 1024) IndexUnorderedRows(grid);
    }
}

void ZonCloudReadAtos::IndexUnorderedRows(Grid& grid)
{
    Resize(grid.rowStart, grid.rows.size() + 1);
    for (std::size_t r = 0; r < grid.rows.size(); ++r) grid.rowStart[r + 1] = grid.rowStart[r] + grid.rows[r].records;
    Resize(grid.order, grid.rowStart.back());
    std::vector<std::uint64_t> next(grid.rowStart.begin(), grid.rowStart.end() - 1);
    std::uint32_t index = 0;
    ForEachRecord(grid.start, grid.order.size(), [&](std::uint64_t, const unsigned char* bytes) {
        const auto r = static_cast<std::size_t>(Decode(bytes, grid).row - grid.minRow);
        grid.order[next[r]++] = index++;
    });
}

bool ZonCloudReadAtos::ParsePoint(const char* first, const char* last, const Grid& grid, Record& record) const
{
    int column = 0, row = 0;
    void* const args[] = {&record.x, &record.y, &record.z, &column, &row, &record.quality, nullptr};
    if (PointLine().Scan(first, last, _decimalPoint, args) != 6) return false;
    // Division truncates toward zero, as the device's own integer division does.
    record.column = column / static_cast<std::int64_t>(grid.stepX);
    record.row = row / static_cast<std::int64_t>(grid.stepY);
    return true;
}

bool ZonCloudReadAtos::AnalyseText(char decimalPoint)
{
    ResetAnalysis();
    _decimalPoint = decimalPoint;
    Resize(_grids, 1);
    Grid& grid = _grids.front();
    _lines.Start(Source(), 0);
    int unknown = 0;
    bool pointSeen = false;
    std::uint32_t ignored = 0;
    const char* first = nullptr;
    const char* last = nullptr;
    while (_lines.Next(first, last)) {
        Record record;
        if (ParsePoint(first, last, grid, record)) {
            if (!pointSeen) grid.start = _lines.LineOffset();
            pointSeen = true;
            Count(grid, record);
            continue;
        }
        if (!pointSeen && (TakeKey(first, last, "Points:", ignored) || TakeKey(first, last, "RasterX:", grid.stepX) ||
                           TakeKey(first, last, "RasterY:", grid.stepY)))
            continue;
        if (IsBlank(first, last)) continue;
        if (++unknown > MaxUnknownLines) return false;
    }
    ZonCloudGridRow::CheckSize(grid.Rows(), grid.Columns(), grid.records);
    return true;
}

// ---- Rows -------------------------------------------------------------------

void ZonCloudReadAtos::Place(const Grid& grid, const Record& record, ZonCloudGridRow& row) const
{
    const std::int64_t slot = row.SlotOf(static_cast<std::uint64_t>(record.column - grid.minColumn));
    if (slot < 0 || !IsValid(record.quality)) return;
    row.Set(static_cast<std::size_t>(slot), static_cast<float>(record.x), static_cast<float>(record.y),
            static_cast<float>(record.z));
}

void ZonCloudReadAtos::ReadRow(std::size_t index, std::uint64_t rowIndex, ZonCloudGridRow& row, std::uint64_t& resume)
{
    const Grid& grid = _grids[index];
    Guarded([&] {
        Allocating([&] { row.Start(grid.Columns(), _samplingPercent); });
        const std::int64_t gridRow = grid.minRow + static_cast<std::int64_t>(rowIndex);
        if (_binary)
            ReadBinaryRow(grid, gridRow, row);
        else
            ReadTextRow(grid, gridRow, row, resume);
    });
}

void ZonCloudReadAtos::ReadBinaryRow(const Grid& grid, std::int64_t gridRow, ZonCloudGridRow& row)
{
    const auto r = static_cast<std::size_t>(gridRow - grid.minRow);
    if (!grid.order.empty()) {
        ZonCloudByteSource& source = Source();
        unsigned char bytes[RecordUsed];
        for (std::uint64_t i = grid.rowStart[r]; i < grid.rowStart[r + 1]; ++i) {
            source.Seek(grid.start + std::uint64_t{grid.order[i]} * _recordSize);
            source.Read(bytes, sizeof bytes);
            Place(grid, Decode(bytes, grid), row);
        }
        return;
    }
    const RowSpan& span = grid.rows[r];
    if (span.first > span.last) return;  // a row without records: all holes
    const std::uint64_t count = (span.last - span.first) / _recordSize + 1;
    ForEachRecord(span.first, count, [&](std::uint64_t, const unsigned char* bytes) {
        const Record record = Decode(bytes, grid);
        if (record.row == gridRow) Place(grid, record, row);
    });
}

void ZonCloudReadAtos::ReadTextRow(const Grid& grid, std::int64_t gridRow, ZonCloudGridRow& row,
                                   std::uint64_t& resume)
{
    _lines.Start(Source(), resume);
    const char* first = nullptr;
    const char* last = nullptr;
    while (_lines.Next(first, last)) {
        Record record;
        if (!ParsePoint(first, last, grid, record)) continue;
        if (record.row > gridRow) {
            // The first line of a later row: the next row starts there.
            resume = _lines.LineOffset();
            return;
        }
        if (record.row == gridRow) Place(grid, record, row);
    }
    resume = _lines.NextOffset();
}

// ---- Protocol ---------------------------------------------------------------

void ZonCloudReadAtos::BeginGetGrid()
{
    Analyse();
    if (_digitizationType != DigitizationGrids) Tool::Raise(Tool::Usage, "ERR_NotAGridDigit");
    if (_numberOfPoints == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    _cursor.Begin(_grids.size());
}

void ZonCloudReadAtos::PrepareGrid(std::size_t index) { _textResume = _grids[index].start; }

bool ZonCloudReadAtos::NextGrid()
{
    if (!_cursor.Next()) return false;
    PrepareGrid(_cursor.Current());
    return true;
}

void ZonCloudReadAtos::SelectGrid(int n)
{
    Analyse();
    if (n < 1 || static_cast<std::size_t>(n) > _grids.size()) Tool::Raise(Tool::Usage, "ERR_GridNumberIsInvalid");
    _cursor.Select(static_cast<std::size_t>(n - 1), _grids.size());
    PrepareGrid(_cursor.Current());
}

void ZonCloudReadAtos::BeginGetGridPoints()
{
    _cursor.BeginRows();
    PrepareGrid(_cursor.Current());
}

const float* ZonCloudReadAtos::GetGridPoints(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    const bool hasRow = _cursor.NextRow(_cursor.HasCurrent() ? _grids[_cursor.Current()].Rows() : 0);
    if (!hasRow) return nullptr;
    ReadRow(_cursor.Current(), _cursor.Row(), _row, _textResume);
    return _row.Deliver(count, valid);
}

const float* ZonCloudReadAtos::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_cloudRead) {
        _cloud.clear();
        Reserve(_cloud, 3 * static_cast<std::uint64_t>(_numberOfPoints));
        ZonCloudGridRow row;
        for (std::size_t g = 0; g < _grids.size(); ++g) {
            std::uint64_t resume = _grids[g].start;
            for (std::uint64_t r = 0; r < _grids[g].Rows(); ++r) {
                ReadRow(g, r, row, resume);
                Allocating([&] { row.AppendValid(_cloud); });
            }
        }
        _cloudRead = true;
    }
    count = static_cast<unsigned>(_cloud.size() / 3);
    return _cloud.empty() ? nullptr : _cloud.data();
}
