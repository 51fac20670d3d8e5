#include "ZonCloudReadRowTable.h"

#include "ZonCloudReadNLSTool.h"

using Tool = ZonCloudReadNLSTool;

ZonCloudReadRowTable::ZonCloudReadRowTable(const ZonUnicodeString& fileName)
    : ZonCloudReadFile(fileName),
      _fill([this](std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) {
          return FillRow(row, bytes, target);
      })
{
}

void ZonCloudReadRowTable::ResetRows()
{
    _table = {};
    _columns = 0;
    _cursor.Reset();
    _gridRows.Clear();
    _measuredInWalk = 0;
    _cloud.clear();
    _cloudRead = false;
}

void ZonCloudReadRowTable::SetTable(const ZonCloudGridRows::Table& table, std::uint64_t columns)
{
    _table = table;
    _columns = columns;
}

void ZonCloudReadRowTable::WholeFileRead(std::uint64_t, bool) {}

void ZonCloudReadRowTable::SetSamplingPercent(float percent)
{
    const float before = _samplingPercent;
    ZonCloudReadFile::SetSamplingPercent(percent);
    if (_samplingPercent != before) {
        _cloudRead = false;
        _gridRows.Clear();
    }
}

unsigned ZonCloudReadRowTable::GetNumberOfRows()
{
    Analyse();
    return static_cast<unsigned>(_table.rows);
}

unsigned ZonCloudReadRowTable::GetNumberOfColumns()
{
    Analyse();
    return static_cast<unsigned>(_columns);
}

void ZonCloudReadRowTable::ListOwnedArrays(ZonCloudOwnedArrays& arrays) { _gridRows.ListOwnedArrays(arrays); }

const float* ZonCloudReadRowTable::GetPoints(unsigned& count)
{
    count = 0;
    Analyse();
    if (!_cloudRead) {
        _cloud.clear();
        std::uint64_t measured = 0;
        Guarded([&] {
            Reserve(_cloud, 3 * _table.rows * ZonCloudGridRow::SlotsFor(_columns, _samplingPercent));
            measured = ZonCloudGridRows::AppendAll(Source(), _table, _fill, _cloud);
        });
        _cloudRead = true;
        WholeFileRead(measured, true);
    }
    count = static_cast<unsigned>(_cloud.size() / 3);
    return _cloud.empty() ? nullptr : _cloud.data();
}

void ZonCloudReadRowTable::RequireGrid()
{
    Analyse();
    if (_digitizationType != DigitizationGrids) Tool::Raise(Tool::Usage, "ERR_NotAGridDigit");
}

void ZonCloudReadRowTable::BeginGetGrid()
{
    RequireGrid();
    _cursor.Begin(1);
}

bool ZonCloudReadRowTable::NextGrid()
{
    RequireGrid();
    return _cursor.Next();
}

void ZonCloudReadRowTable::BeginGetGridPoints()
{
    RequireGrid();
    _cursor.BeginRows();
    _gridRows.Clear();
    _measuredInWalk = 0;
}

const float* ZonCloudReadRowTable::GetGridPoints(unsigned& count, const unsigned char*& valid)
{
    count = 0;
    valid = nullptr;
    RequireGrid();
    if (!_cursor.NextRow(static_cast<std::size_t>(_table.rows))) return nullptr;
    const float* points = nullptr;
    Guarded([&] {
        std::uint64_t measured = 0;
        const ZonCloudGridRow& row = _gridRows.Get(Source(), _table, _cursor.Row(), _fill, measured);
        _measuredInWalk += measured;
        points = row.Deliver(count, valid);
    });
    // The last row of a walk from the first: the file has been read whole.
    if (_cursor.Row() + 1 == _table.rows) WholeFileRead(_measuredInWalk, false);
    return points;
}
