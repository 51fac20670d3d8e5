#include "ZonCloudReadOptonBin.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <cstring>
#include <limits>

#include "ZonCloudReadNLSTool.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint64_t RecordSize = 16;
constexpr std::uint64_t HeaderRecords = 7;
// The fourth value of a node that was not measured.
constexpr float NotMeasured = -1.0f;

float Word(const unsigned char* record, int index)
{
    return ZonCloudByteSource::LoadLittle<float>(record + 4 * index);
}

// A header that is not one of these files: refused as a failed read is.
[[noreturn]] void NotThisFormat() { Tool::Raise(Tool::Input, "ERR_UnknownData"); }

// A count held in a float: whole, not negative, and of a size a file can hold.
std::uint64_t Count(float value)
{
    if (!(value >= 0.0f && value < 4294967296.0f) || std::trunc(value) != value) NotThisFormat();
    return static_cast<std::uint64_t>(value);
}

}  // namespace

ZonCloudReadOptonBin::ZonCloudReadOptonBin(const ZonUnicodeString& fileName)
    : ZonCloudReadFile(fileName),
      _fill([this](std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) {
          return FillRow(row, bytes, target);
      })
{
}

void ZonCloudReadOptonBin::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) {
        _cloudRead = false;
        _gridRows.Clear();
    }
}

unsigned ZonCloudReadOptonBin::GetNumberOfRows()
{
    Analyse();
    return static_cast<unsigned>(_rows);
}

unsigned ZonCloudReadOptonBin::GetNumberOfColumns()
{
    Analyse();
    return static_cast<unsigned>(_columns);
}

std::uint64_t ZonCloudReadOptonBin::GetDataOffset()
{
    Analyse();
    return _data;
}

// ---- Analysis ---------------------------------------------------------------

void ZonCloudReadOptonBin::AnalyseFile()
{
    _numberOfPoints = 0;
    _boundingBox = ZonMathBox();
    _cloud.clear();
    _cloudRead = false;
    _cursor.Reset();
    _gridRows.Clear();

    ZonCloudByteSource& source = Source();
    unsigned char header[HeaderRecords * RecordSize];
    source.Read(header, sizeof header);
    const auto record = [&](std::uint64_t i) { return header + i * RecordSize; };
    // Record 0: four zero words.
    for (int w = 0; w < 4; ++w)
        if (ZonCloudByteSource::LoadLittle<std::uint32_t>(record(0) + 4 * w) != 0) NotThisFormat();

    // The data start after trunc(E) + 3 records, E counting extra header records.
    const float extra = Word(record(1), 0);
    if (!(extra > -4.0f && extra < 4294967296.0f)) {
        errno = ENODATA;
        Tool::Raise(Tool::Input, nullptr);
    }
    _data = static_cast<std::uint64_t>(std::trunc(static_cast<double>(extra)) + 3.0) * RecordSize;

    _boundingBox = ZonMathBox();
    _boundingBox.AddPoint(Word(record(3), 0), Word(record(3), 1), Word(record(3), 2));
    _boundingBox.AddPoint(Word(record(4), 0), Word(record(4), 1), Word(record(4), 2));

    const std::uint64_t points = Count(Word(record(6), 0));
    _rows = Count(Word(record(6), 1));
    _columns = Count(Word(record(6), 2));
    if (points != _rows * _columns) NotThisFormat();
    if (points == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    if (!source.Fits(_data, points, RecordSize)) {
        errno = ENODATA;
        Tool::Raise(Tool::Input, nullptr);
    }
    if (points > static_cast<std::uint64_t>(std::numeric_limits<int>::max())) Tool::Raise(Tool::Data, "ERR_UnknownData");
    _numberOfPoints = static_cast<int>(points);
    _digitizationType = DigitizationGrids;
}

// ---- Reading ----------------------------------------------------------------

std::uint64_t ZonCloudReadOptonBin::FillRow(std::uint64_t, const unsigned char* bytes, ZonCloudGridRow& target) const
{
    Allocating([&] { target.Start(_columns, _samplingPercent); });
    std::uint64_t measured = 0;
    for (std::uint64_t column = 0; column < _columns; ++column, bytes += RecordSize) {
        if (Word(bytes, 3) == NotMeasured) continue;
        ++measured;
        const std::int64_t slot = target.SlotOf(column);
        if (slot >= 0) target.Set(static_cast<std::size_t>(slot), Word(bytes, 0), Word(bytes, 1), Word(bytes, 2));
    }
    return measured;
}

ZonCloudGridRows::Table ZonCloudReadOptonBin::RecordTable() const { return {_data, _columns * RecordSize, _rows}; }

void ZonCloudReadOptonBin::ListOwnedArrays(ZonCloudOwnedArrays& arrays) { _gridRows.ListOwnedArrays(arrays); }

const float* ZonCloudReadOptonBin::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_cloudRead) {
        _cloud.clear();
        std::uint64_t measured = 0;
        Guarded([&] {
            const std::uint64_t nodes = _rows * _columns;
            Reserve(_cloud, 3 * std::min(nodes, _rows * ZonCloudGridRow::SlotsFor(_columns, _samplingPercent)));
            measured = ZonCloudGridRows::AppendAll(Source(), RecordTable(), _fill, _cloud);
        });
        _cloudRead = true;
        _numberOfPoints = static_cast<int>(measured);
        if (measured == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    }
    count = static_cast<unsigned>(_cloud.size() / 3);
    return _cloud.empty() ? nullptr : _cloud.data();
}

void ZonCloudReadOptonBin::RequireGrid()
{
    Analyse();
    if (_digitizationType != DigitizationGrids) Tool::Raise(Tool::Usage, "ERR_NotAGridDigit");
}

void ZonCloudReadOptonBin::BeginGetGrid()
{
    RequireGrid();
    _cursor.Begin(1);
}

bool ZonCloudReadOptonBin::NextGrid()
{
    RequireGrid();
    return _cursor.Next();
}

void ZonCloudReadOptonBin::BeginGetGridPoints()
{
    RequireGrid();
    _cursor.BeginRows();
    _gridRows.Clear();
    _measuredInWalk = 0;
}

const float* ZonCloudReadOptonBin::GetGridPoints(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    RequireGrid();
    if (!_cursor.NextRow(static_cast<std::size_t>(_rows))) return nullptr;
    const float* points = nullptr;
    Guarded([&] {
        std::uint64_t measured = 0;
        const ZonCloudGridRow& row = _gridRows.Get(Source(), RecordTable(), _cursor.Row(), _fill, measured);
        _measuredInWalk += measured;
        points = row.Deliver(count, valid);
    });
    // The last row of a walk from the first: the file has been read whole.
    if (_cursor.Row() + 1 == _rows) _numberOfPoints = static_cast<int>(_measuredInWalk);
    return points;
}
