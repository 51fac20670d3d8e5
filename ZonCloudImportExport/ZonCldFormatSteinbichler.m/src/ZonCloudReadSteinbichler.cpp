#include "ZonCloudReadSteinbichler.h"

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <string_view>

#include "DecimalPointGuard.h"
#include "ZonCloudReadNLSTool.h"
#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint64_t FirstHeader = 4;
constexpr std::uint64_t RecordSize = 12;
constexpr std::uint64_t ScanEntrySize = 8;
constexpr std::uint64_t PixelEntrySize = 4;
constexpr std::uint64_t Chunk = std::uint64_t{1} << 20;

enum class Key {
    Ignored, Points, FirstDataByte, DataType, MinX, MaxX, MinY, MaxY, MinZ, MaxZ, Scans, FirstScanByte,
    PixelMaxX, PixelMaxY, FirstPixelTableByte, RasterX, RasterY, NextSubset, Row1, Row2, Row3, Row4, Orientation,
};

struct Keyword {
    std::string_view word;
    Key key;
};

constexpr Keyword Keywords[] = {
    {"POINT_CLOUD_TYPE", Key::Ignored},
    {"OBJECT_TYPE", Key::Ignored},
    {"POINTSET_3D_CONTOUR", Key::Ignored},
    {"MODIFIED", Key::Ignored},
    {"COMMENT", Key::Ignored},
    {"NUMBER_OF_POINTS", Key::Points},
    {"FIRST_DATA_BYTE", Key::FirstDataByte},
    {"DATA_TYPE", Key::DataType},
    {"MINIMUM_X", Key::MinX},
    {"MAXIMUM_X", Key::MaxX},
    {"MINIMUM_Y", Key::MinY},
    {"MAXIMUM_Y", Key::MaxY},
    {"MINIMUM_Z", Key::MinZ},
    {"MAXIMUM_Z", Key::MaxZ},
    {"NUMBER_OF_SCANS", Key::Scans},
    {"FIRST_SCAN_BYTE", Key::FirstScanByte},
    {"PIXEL_TABLE_MAX_X", Key::PixelMaxX},
    {"PIXEL_TABLE_MAX_Y", Key::PixelMaxY},
    {"FIRST_PIXEL_TABLE_BYTE", Key::FirstPixelTableByte},
    {"RASTER_X", Key::RasterX},
    {"RASTER_Y", Key::RasterY},
    {"NEXT_SUBSET", Key::NextSubset},
    {"TRANSFORMATION_ROW1", Key::Row1},
    {"TRANSFORMATION_ROW2", Key::Row2},
    {"TRANSFORMATION_ROW3", Key::Row3},
    {"TRANSFORMATION_ROW4", Key::Row4},
    {"ORIENTATION", Key::Orientation},
};

// The keyword that starts the line (followed by a blank or the line's end),
// and where its value begins: one blank after the keyword.
const Keyword* Match(const char* first, const char* last, const char*& value)
{
    const std::string_view line(first, static_cast<std::size_t>(last - first));
    for (const Keyword& k : Keywords) {
        if (line.size() < k.word.size() || line.compare(0, k.word.size(), k.word) != 0) continue;
        if (line.size() > k.word.size()) {
            const char next = line[k.word.size()];
            if (next != ' ' && next != '\t' && next != '\r' && next != '\n') continue;
        }
        value = std::min(first + k.word.size() + 1, last);
        return &k;
    }
    return nullptr;
}

bool HasFraction(const double* values, int count)
{
    for (int i = 0; i < count; ++i)
        if (std::isfinite(values[i]) && values[i] != std::trunc(values[i])) return true;
    return false;
}

int ScanReals(const char* first, const char* last, char point, double* values, int count)
{
    static const ZonCloudScanFormat one("%lf");
    static const ZonCloudScanFormat four("%lf%lf%lf%lf");
    void* const args[] = {values, values + 1, values + 2, values + 3, nullptr};
    if (count == 1) {
        void* const single[] = {values, nullptr};
        return one.Scan(first, last, point, single);
    }
    return four.Scan(first, last, point, args);
}

// A subset's box, widened by 1e-5 of its extent on each side so that points
// on its faces are inside.
ZonMathBox Widened(const double low[3], const double high[3])
{
    double l[3], h[3];
    for (int axis = 0; axis < 3; ++axis) {
        const double margin = (high[axis] - low[axis]) * 1e-5;
        l[axis] = low[axis] - margin;
        h[axis] = high[axis] + margin;
    }
    return ZonMathBox(l[0], h[0], l[1], h[1], l[2], h[2]);
}

}  // namespace

ZonCloudReadSteinbichler::ZonCloudReadSteinbichler(const ZonUnicodeString& fileName)
    : ZonCloudReadFile(fileName), _nativePoint(DecimalPointGuard().DecimalPoint())
{
}

void ZonCloudReadSteinbichler::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) _cloudRead = false;
}

const std::vector<ZonCloudReadSteinbichler::Subset>& ZonCloudReadSteinbichler::GetSubsets()
{
    Analyse();
    return _subsets;
}

// ---- Analysis ---------------------------------------------------------------

void ZonCloudReadSteinbichler::AnalyseFile()
{
    _subsets.clear();
    _separator = Separator::Undecided;
    _numberOfPoints = 0;
    _boundingBox = ZonMathBox();
    _cloud.clear();
    _cloudRead = false;

    ZonCloudByteSource& source = Source();
    char mark[2];
    source.Read(mark, sizeof mark);
    if (mark[0] == 'M' && mark[1] == 'M') Tool::Raise(Tool::Data, "ERR_FormatNotImplemented");
    if (mark[0] != 'I' || mark[1] != 'I') Tool::Raise(Tool::Data, "ERR_UnknownData");

    const auto size = static_cast<std::uint64_t>(std::max<std::int64_t>(source.Size(), 0));
    std::uint64_t total = 0, scans = 0, slots = 0;
    std::uint64_t offset = FirstHeader;
    for (;;) {
        Subset subset;
        subset.header = offset;
        ReadHeader(subset);
        const std::uint64_t headerEnd = _lines.NextOffset();
        CheckTables(subset);
        total += subset.points;
        scans += subset.scans;
        // Scan tables are distinct too.
        if (scans > size / ScanEntrySize) Tool::Raise(Tool::Data, "ERR_UnknownData");
        if (subset.IsGridded()) slots += subset.maxX * subset.maxY;
        // Subsets hold distinct records: more points than the file has room
        // for means subsets that claim the same bytes again and again.
        if (total > size / RecordSize || total > static_cast<std::uint64_t>(std::numeric_limits<int>::max()))
            Tool::Raise(Tool::Data, "ERR_UnknownData");
        if (!_subsets.empty() && (subset.IsScanned() != _subsets.front().IsScanned() ||
                                  (!subset.IsScanned() && subset.IsGridded() != _subsets.front().IsGridded())))
            Tool::Raise(Tool::Data, "ERR_FormatNotImplemented");
        if (subset.hasBox) {
            const double* b = subset.bounds;
            const double low[3] = {b[0], b[2], b[4]}, high[3] = {b[1], b[3], b[5]};
            subset.box = Widened(low, high);
        } else {
            BoxOfPoints(subset);
        }
        _boundingBox.AddBox(subset.box);
        const std::uint64_t next = subset.next;
        Allocating([&] { _subsets.push_back(std::move(subset)); });
        if (next == 0) break;
        // The list runs forward through the file, each subset after the
        // header before it; anything else could loop or read bytes again.
        if (next < headerEnd || next <= offset || next >= size) Tool::Raise(Tool::Data, "ERR_UnknownData");
        offset = next;
    }
    _lines.Release();
    if (total == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    // All grids together, not only each one, must be justified by the records.
    ZonCloudGridRow::CheckSize(1, slots, total);
    _numberOfPoints = static_cast<int>(total);
    const Subset& first = _subsets.front();
    _digitizationType = first.IsScanned() ? DigitizationScans : first.IsGridded() ? DigitizationGrids : DigitizationCloud;
}

void ZonCloudReadSteinbichler::ReadHeader(Subset& subset)
{
    _lines.Start(Source(), subset.header);
    const char* first = nullptr;
    const char* last = nullptr;
    // The header also ends where the next subset begins, so that no byte is
    // read as a header line twice.
    const auto ended = [&] {
        const std::uint64_t at = _lines.NextOffset();
        return (subset.hasFirstDataByte && at >= subset.firstDataByte) || (subset.next != 0 && at >= subset.next);
    };
    while (!ended() && _lines.Next(first, last)) {
        const char* value = nullptr;
        const Keyword* keyword = Match(first, last, value);
        if (!keyword) continue;
        switch (keyword->key) {
            case Key::Ignored: break;
            case Key::Points: subset.points = ReadCount(value, last); break;
            case Key::FirstDataByte:
                subset.firstDataByte = ReadCount(value, last);
                subset.hasFirstDataByte = true;
                break;
            case Key::DataType: {
                std::string_view word(value, static_cast<std::size_t>(last - value));
                word = word.substr(0, word.find_first_of(" \t\r\n"));
                if (word == "FLOAT") subset.integer = false;
                else if (word == "INTEGER") subset.integer = true;
                else Tool::Raise(Tool::Data, "ERR_UnknownData");
                break;
            }
            case Key::MinX: case Key::MaxX: case Key::MinY: case Key::MaxY: case Key::MinZ: case Key::MaxZ: {
                const int index = static_cast<int>(keyword->key) - static_cast<int>(Key::MinX);
                ReadReals(value, last, &subset.bounds[index], 1);
                subset.boundsGiven |= 1u << index;
                subset.hasBox = subset.boundsGiven == 0x3f;
                break;
            }
            case Key::Scans:
                subset.scans = ReadCount(value, last);
                subset.hasScans = true;
                break;
            case Key::FirstScanByte:
                subset.scanTable = ReadCount(value, last);
                subset.hasScanTable = true;
                break;
            case Key::PixelMaxX:
                subset.maxX = ReadCount(value, last);
                subset.hasMaxX = true;
                break;
            case Key::PixelMaxY:
                subset.maxY = ReadCount(value, last);
                subset.hasMaxY = true;
                break;
            case Key::FirstPixelTableByte:
                subset.pixelTable = ReadCount(value, last);
                subset.hasPixelTable = true;
                break;
            case Key::RasterX:
                ReadReals(value, last, &subset.rasterX, 1);
                subset.hasRasterX = true;
                break;
            case Key::RasterY:
                ReadReals(value, last, &subset.rasterY, 1);
                subset.hasRasterY = true;
                break;
            case Key::NextSubset: subset.next = ReadCount(value, last); break;
            case Key::Row1: case Key::Row2: case Key::Row3: {
                const int row = static_cast<int>(keyword->key) - static_cast<int>(Key::Row1);
                ReadReals(value, last, subset.placement[row], 4);
                subset.placementRows |= 1u << row;
                subset.hasPlacement = subset.placementRows == 7;
                break;
            }
            case Key::Row4: {
                double dropped[4];
                ReadReals(value, last, dropped, 4);
                break;
            }
            case Key::Orientation:
                ReadReals(value, last, subset.orientation, 4);
                subset.hasOrientation = true;
                break;
        }
    }
}

std::uint64_t ZonCloudReadSteinbichler::ReadCount(const char* first, const char* last) const
{
    static const ZonCloudScanFormat format("%d");
    int value = 0;
    void* const args[] = {&value, nullptr};
    if (format.Scan(first, last, '.', args) != 1 || value < 0) Tool::Raise(Tool::Data, "ERR_UnknownData");
    return static_cast<std::uint64_t>(value);
}

void ZonCloudReadSteinbichler::ReadReals(const char* first, const char* last, double* values, int count)
{
    if (count != 1 && count != 4) Tool::Raise(Tool::Data, "ERR_Failure");
    if (_separator == Separator::C) {
        if (ScanReals(first, last, '.', values, count) != count) Tool::Raise(Tool::Data, "ERR_UnknownData");
        return;
    }
    double native[4] = {};
    if (ScanReals(first, last, _nativePoint, native, count) == count) {
        std::copy(native, native + count, values);
        if (_separator != Separator::Undecided) return;
        if (HasFraction(native, count)) {
            _separator = Separator::Native;
            return;
        }
        // Whole numbers say nothing, unless the "C" reading finds a fraction
        // that the locale's decimal point cut off.
        double c[4] = {};
        if (ScanReals(first, last, '.', c, count) == count && HasFraction(c, count)) {
            std::copy(c, c + count, values);
            _separator = Separator::C;
        }
        return;
    }
    if (_separator != Separator::Undecided) Tool::Raise(Tool::Data, "ERR_UnknownData");
    if (ScanReals(first, last, '.', values, count) != count) Tool::Raise(Tool::Data, "ERR_UnknownData");
}

void ZonCloudReadSteinbichler::CheckTables(Subset& subset)
{
    ZonCloudByteSource& source = Source();
    if (subset.points > 0) {
        if (!subset.hasFirstDataByte) Tool::Raise(Tool::Data, "ERR_UnknownData");
        source.CheckFits(subset.firstDataByte, subset.points, RecordSize);
    }
    if (subset.IsScanned()) {
        source.CheckFits(subset.scanTable + 4, subset.scans, ScanEntrySize);
        Resize(subset.scanEntries, subset.scans);
        std::uint64_t scanned = 0;
        Resize(_buffer, subset.scans * ScanEntrySize);
        if (subset.scans > 0) {
            source.Seek(subset.scanTable + 4);
            source.Read(_buffer.data(), _buffer.size());
        }
        for (std::uint64_t i = 0; i < subset.scans; ++i) {
            ScanEntry& entry = subset.scanEntries[i];
            entry.first = ZonCloudByteSource::LoadLittle<std::uint32_t>(_buffer.data() + i * ScanEntrySize);
            entry.count = ZonCloudByteSource::LoadLittle<std::uint32_t>(_buffer.data() + i * ScanEntrySize + 4);
            if (std::uint64_t{entry.first} + entry.count > subset.points) Tool::Raise(Tool::Data, "ERR_UnknownData");
            // A scan table shares the subset's points out: together its scans
            // hold no more points than the subset.
            scanned += entry.count;
            if (scanned > subset.points) Tool::Raise(Tool::Data, "ERR_UnknownData");
        }
    } else if (subset.IsGridded()) {
        ZonCloudGridRow::CheckSize(subset.maxY, subset.maxX, subset.points);
        source.CheckFits(subset.pixelTable, subset.points, PixelEntrySize);
        // Rows are the runs of entries with the same row number, in table order.
        Resize(_present, subset.maxX);
        std::fill(_present.begin(), _present.end(), 0);
        PixelRow row;
        std::uint32_t rowNumber = 0;
        const auto close = [&] {
            if (row.entries == 0) return;
            if (subset.pixelRows.size() >= subset.maxY) Tool::Raise(Tool::Data, "ERR_UnknownData");
            Allocating([&] { subset.pixelRows.push_back(row); });
            row = PixelRow{row.entry + row.entries, 0, row.record + row.records, 0};
            std::fill(_present.begin(), _present.end(), 0);
        };
        source.Seek(subset.pixelTable);
        const std::uint64_t perChunk = Chunk / PixelEntrySize;
        for (std::uint64_t done = 0; done < subset.points;) {
            const std::uint64_t n = std::min(subset.points - done, perChunk);
            Resize(_buffer, n * PixelEntrySize);
            source.Read(_buffer.data(), _buffer.size());
            for (std::uint64_t i = 0; i < n; ++i) {
                const unsigned char* entry = _buffer.data() + i * PixelEntrySize;
                const auto column = ZonCloudByteSource::LoadLittle<std::uint16_t>(entry);
                const auto number = ZonCloudByteSource::LoadLittle<std::uint16_t>(entry + 2);
                if (row.entries > 0 && number != rowNumber) close();
                rowNumber = number;
                // Columns are slots from 0: one past the row cannot be stored.
                if (column >= subset.maxX) Tool::Raise(Tool::Data, "ERR_Failure");
                ++row.entries;
                if (!_present[column]) {
                    _present[column] = 1;
                    ++row.records;
                }
            }
            done += n;
        }
        close();
    }
}

template <class Visit>
void ZonCloudReadSteinbichler::ForEachPoint(const Subset& subset, std::uint64_t index, std::uint64_t count,
                                            Visit visit)
{
    if (count == 0) return;
    if (index + count > subset.points) Tool::Raise(Tool::Data, "ERR_UnknownData");
    ZonCloudByteSource& source = Source();
    source.Seek(subset.firstDataByte + index * RecordSize);
    const std::uint64_t perChunk = Chunk / RecordSize;
    while (count > 0) {
        const std::uint64_t n = std::min(count, perChunk);
        Resize(_buffer, n * RecordSize);
        source.Read(_buffer.data(), _buffer.size());
        for (std::uint64_t i = 0; i < n; ++i) {
            const unsigned char* r = _buffer.data() + i * RecordSize;
            if (subset.integer) {
                visit(static_cast<float>(ZonCloudByteSource::LoadLittle<std::int32_t>(r)) / 1000.0f,
                      static_cast<float>(ZonCloudByteSource::LoadLittle<std::int32_t>(r + 4)) / 1000.0f,
                      static_cast<float>(ZonCloudByteSource::LoadLittle<std::int32_t>(r + 8)) / 1000.0f);
            } else {
                visit(ZonCloudByteSource::LoadLittle<float>(r), ZonCloudByteSource::LoadLittle<float>(r + 4),
                      ZonCloudByteSource::LoadLittle<float>(r + 8));
            }
        }
        count -= n;
    }
}

void ZonCloudReadSteinbichler::BoxOfPoints(Subset& subset)
{
    // Without a complete header box, the box is the one of the points,
    // widened as a header box is.
    ZonMathBox box;
    ForEachPoint(subset, 0, subset.points, [&](float x, float y, float z) { box.AddPoint(x, y, z); });
    if (box.IsEmpty()) return;
    const double low[3] = {box.GetLow()[0], box.GetLow()[1], box.GetLow()[2]};
    const double high[3] = {box.GetHigh()[0], box.GetHigh()[1], box.GetHigh()[2]};
    subset.box = Widened(low, high);
}

// ---- Reading ----------------------------------------------------------------

void ZonCloudReadSteinbichler::RequireType(int type, const char* code)
{
    Analyse();
    if (_digitizationType != type) Tool::Raise(Tool::Usage, code);
}

void ZonCloudReadSteinbichler::MarkColumns(const Subset& subset, const PixelRow& row)
{
    Resize(_present, subset.maxX);
    std::fill(_present.begin(), _present.end(), 0);
    if (row.entries == 0) return;
    ZonCloudByteSource& source = Source();
    Resize(_buffer, row.entries * PixelEntrySize);
    source.Seek(subset.pixelTable + row.entry * PixelEntrySize);
    source.Read(_buffer.data(), _buffer.size());
    for (std::uint64_t i = 0; i < row.entries; ++i)
        _present[ZonCloudByteSource::LoadLittle<std::uint16_t>(_buffer.data() + i * PixelEntrySize)] = 1;
}

const float* ZonCloudReadSteinbichler::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_cloudRead) {
        _cloud.clear();
        ZonCloudSampler sampler(_samplingPercent);
        const auto keep = [&](float x, float y, float z) {
            if (!sampler.Keep()) return;
            _cloud.push_back(x);
            _cloud.push_back(y);
            _cloud.push_back(z);
        };
        Guarded([&] {
            Reserve(_cloud, 3 * static_cast<std::uint64_t>(_numberOfPoints));
            for (const Subset& subset : _subsets) {
                if (subset.IsScanned()) {
                    for (const ScanEntry& scan : subset.scanEntries) {
                        sampler.Restart();
                        ForEachPoint(subset, scan.first, scan.count, keep);
                    }
                } else if (subset.IsGridded()) {
                    for (const PixelRow& row : subset.pixelRows) {
                        sampler.Restart();
                        ForEachPoint(subset, row.record, row.records, keep);
                    }
                } else {
                    sampler.Restart();
                    ForEachPoint(subset, 0, subset.points, keep);
                }
            }
        });
        _cloudRead = true;
    }
    count = static_cast<unsigned>(_cloud.size() / 3);
    return _cloud.empty() ? nullptr : _cloud.data();
}

void ZonCloudReadSteinbichler::BeginGetSetOfScans()
{
    RequireType(DigitizationScans, "ERR_NotAScanDigit");
    _setsBegun = true;
    _nextSet = 0;
    _hasSet = _scansBegun = _hasScan = false;
}

bool ZonCloudReadSteinbichler::NextSetOfScans()
{
    RequireType(DigitizationScans, "ERR_NotAScanDigit");
    if (!_setsBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetSetOfScansNotDone");
    _scansBegun = _hasScan = false;
    _hasSet = _nextSet < _subsets.size();
    if (_hasSet) _set = _nextSet++;
    return _hasSet;
}

void ZonCloudReadSteinbichler::BeginGetScan()
{
    RequireType(DigitizationScans, "ERR_NotAScanDigit");
    if (!_hasSet) Tool::Raise(Tool::Usage, "ERR_NextSetOfScansNotDone");
    _scansBegun = true;
    _hasScan = false;
    _nextScan = 0;
}

bool ZonCloudReadSteinbichler::NextScan()
{
    RequireType(DigitizationScans, "ERR_NotAScanDigit");
    if (!_scansBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetScanNotDone");
    _hasScan = _nextScan < _subsets[_set].scanEntries.size();
    if (_hasScan) _scan = _nextScan++;
    return _hasScan;
}

const float* ZonCloudReadSteinbichler::GetScanPoints(unsigned& count)
{
    count = 0;
    RequireType(DigitizationScans, "ERR_NotAScanDigit");
    if (!_scansBegun) Tool::Raise(Tool::Usage, "ERR_BeginGetScanNotDone");
    if (!_hasScan) return nullptr;
    const Subset& subset = _subsets[_set];
    const ScanEntry& scan = subset.scanEntries[_scan];
    _scanPoints.clear();
    ZonCloudSampler sampler(_samplingPercent);
    Guarded([&] {
        ForEachPoint(subset, scan.first, scan.count, [&](float x, float y, float z) {
            if (!sampler.Keep()) return;
            _scanPoints.push_back(x);
            _scanPoints.push_back(y);
            _scanPoints.push_back(z);
        });
    });
    count = static_cast<unsigned>(_scanPoints.size() / 3);
    return _scanPoints.empty() ? nullptr : _scanPoints.data();
}

void ZonCloudReadSteinbichler::BeginGetGrid()
{
    RequireType(DigitizationGrids, "ERR_NotAGridDigit");
    _cursor.Begin(_subsets.size());
}

bool ZonCloudReadSteinbichler::NextGrid()
{
    RequireType(DigitizationGrids, "ERR_NotAGridDigit");
    return _cursor.Next();
}

void ZonCloudReadSteinbichler::BeginGetGridPoints()
{
    RequireType(DigitizationGrids, "ERR_NotAGridDigit");
    _cursor.BeginRows();
}

void ZonCloudReadSteinbichler::FillRow(const Subset& subset, std::uint64_t rowIndex)
{
    _row.Start(subset.maxX, 100.0f);
    // Rows the table does not list are all holes.
    if (rowIndex >= subset.pixelRows.size()) return;
    const PixelRow& row = subset.pixelRows[static_cast<std::size_t>(rowIndex)];
    MarkColumns(subset, row);
    ZonCloudSampler sampler(_samplingPercent);
    std::size_t column = 0;
    ForEachPoint(subset, row.record, row.records, [&](float x, float y, float z) {
        while (!_present[column]) ++column;
        if (sampler.Keep()) _row.Set(column, x, y, z);
        ++column;
    });
}

const float* ZonCloudReadSteinbichler::GetGridPoints(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    RequireType(DigitizationGrids, "ERR_NotAGridDigit");
    const Subset* subset = _cursor.HasCurrent() ? &_subsets[_cursor.Current()] : nullptr;
    if (!_cursor.NextRow(subset ? subset->maxY : 0)) return nullptr;
    Guarded([&] { FillRow(*subset, _cursor.Row()); });
    return _row.Deliver(count, valid);
}
