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

ZonCloudReadOptonBin::ZonCloudReadOptonBin(const ZonUnicodeString& fileName) : ZonCloudReadRowTable(fileName) {}

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
    ResetRows();

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
    const std::uint64_t rows = Count(Word(record(6), 1));
    const std::uint64_t columns = Count(Word(record(6), 2));
    if (points != rows * columns) NotThisFormat();
    if (points == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    if (!source.Fits(_data, points, RecordSize)) {
        errno = ENODATA;
        Tool::Raise(Tool::Input, nullptr);
    }
    if (points > static_cast<std::uint64_t>(std::numeric_limits<int>::max())) Tool::Raise(Tool::Data, "ERR_UnknownData");
    SetTable({_data, columns * RecordSize, rows}, columns);
    _numberOfPoints = static_cast<int>(points);
    _digitizationType = DigitizationGrids;
}

// ---- Reading ----------------------------------------------------------------

std::uint64_t ZonCloudReadOptonBin::FillRow(std::uint64_t, const unsigned char* bytes, ZonCloudGridRow& target) const
{
    Allocating([&] { target.Start(Columns(), _samplingPercent); });
    std::uint64_t measured = 0;
    for (std::uint64_t column = 0; column < Columns(); ++column, bytes += RecordSize) {
        if (Word(bytes, 3) == NotMeasured) continue;
        ++measured;
        const std::int64_t slot = target.SlotOf(column);
        if (slot >= 0) target.Set(static_cast<std::size_t>(slot), Word(bytes, 0), Word(bytes, 1), Word(bytes, 2));
    }
    return measured;
}

void ZonCloudReadOptonBin::WholeFileRead(std::uint64_t measured, bool asCloud)
{
    _numberOfPoints = static_cast<int>(measured);
    if (asCloud && measured == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
}
