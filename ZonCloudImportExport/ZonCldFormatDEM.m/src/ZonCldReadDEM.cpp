#include "ZonCldReadDEM.h"

#include <algorithm>
#include <cerrno>
#include <string_view>

#include "ZonCloudScanFormat.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::size_t kRecord = 1024;
// Elevations of a profile: from offset 145 in its first record (one byte
// into the standard's field, which a right-aligned number never fills), 170
// from offset 0 in each record that continues it.
constexpr std::size_t kFirstElevation = 145;
constexpr std::size_t kFirstCount = 146;
constexpr std::size_t kNextCount = 170;
constexpr std::size_t kElevationWidth = 6;

using Block = unsigned char[kRecord];

[[noreturn]] void FieldDoesNotConvert()
{
    errno = EINVAL;
    Tool::Raise(Tool::Input, nullptr);
}

std::string_view Field(const Block& block, std::size_t offset, std::size_t width)
{
    return {reinterpret_cast<const char*>(block) + offset, width};
}

bool IsBlank(std::string_view field) { return field.find_first_not_of(' ') == std::string_view::npos; }

// A whole number in its columns; blank reads as 0 where the layout allows it.
std::int32_t Whole(const Block& block, std::size_t offset, std::size_t width, bool blankIsZero)
{
    static const ZonCloudScanFormat format("%d");
    const std::string_view field = Field(block, offset, width);
    if (blankIsZero && IsBlank(field)) return 0;
    std::int32_t value = 0;
    void* const destinations[] = {&value, nullptr};
    if (format.Scan(field.data(), field.data() + field.size(), '.', destinations) != 1) FieldDoesNotConvert();
    return value;
}

// A real number in its columns, where Fortran writers put "D" for the exponent.
double Real(const Block& block, std::size_t offset, std::size_t width, bool blankIsZero)
{
    const std::string_view field = Field(block, offset, width);
    if (blankIsZero && IsBlank(field)) return 0.0;
    char text[32];
    std::transform(field.begin(), field.end(), text, [](char c) { return c == 'D' || c == 'd' ? 'E' : c; });
    double value = 0.0;
    if (!ZonParseDouble(text, text + field.size(), '.', value)) FieldDoesNotConvert();
    return value;
}

// Records a profile of m elevations takes.
std::uint64_t RecordsOf(std::int64_t m)
{
    if (m <= static_cast<std::int64_t>(kFirstCount)) return 1;
    return 1 + (static_cast<std::uint64_t>(m) - kFirstCount + kNextCount - 1) / kNextCount;
}

}  // namespace

ZonCldReadDEM::ZonCldReadDEM(const ZonUnicodeString& fileName) : ZonCloudReadGridMesh(fileName) {}

const ZonCldReadDEM::Header& ZonCldReadDEM::GetHeader()
{
    Analyse();
    return _header;
}

void ZonCldReadDEM::ReadHeader()
{
    Block a;
    ZonCloudByteSource& source = Source();
    source.Seek(0);
    source.Read(a, kRecord);
    _header = Header();
    // Every field must convert, though only the resolutions and the number
    // of profiles shape the grid.
    const auto whole = [&a](std::size_t offset, std::size_t width) { return Whole(a, offset, width, true); };
    const auto real = [&a](std::size_t offset, std::size_t width) { return Real(a, offset, width, true); };
    // South-east corner: degrees, minutes, seconds of longitude, then latitude.
    for (std::size_t offset : {109u, 122u}) {
        whole(offset, 4);
        whole(offset + 4, 2);
        real(offset + 6, 7);
    }
    for (std::size_t offset : {144u, 150u, 156u, 162u}) whole(offset, 6);
    for (std::size_t i = 0; i < 15; ++i) real(168 + 24 * i, 24);  // projection parameters
    _header.planimetricUnit = whole(528, 6);
    _header.elevationUnit = whole(534, 6);
    whole(540, 6);
    for (std::size_t i = 0; i < 8; ++i) real(546 + 24 * i, 24);  // corners
    for (std::size_t offset : {738u, 762u, 786u}) real(offset, 24);
    whole(810, 6);
    for (std::size_t axis = 0; axis < 3; ++axis) _header.resolution[axis] = real(816 + 12 * axis, 12);
    _header.rows = whole(852, 6);
    _header.profiles = whole(858, 6);
    whole(864, 5);
    whole(869, 1);
    whole(870, 5);
    whole(875, 1);
    whole(876, 4);
    whole(880, 4);
    whole(885, 1);
    for (std::size_t offset : {886u, 888u, 890u}) whole(offset, 2);
    whole(892, 4);
    whole(896, 4);
    for (std::size_t offset : {900u, 902u, 904u, 906u}) whole(offset, 2);
    real(908, 7);
}

void ZonCldReadDEM::AnalyseFile()
{
    ReadHeader();
    ZonCloudByteSource& source = Source();
    const std::uint64_t profiles = static_cast<std::uint64_t>(std::max(_header.profiles, 0));

    // First pass: the profiles whose records are all in the file, at most as
    // many as the header announces (what may follow them is no profile).
    // A record cut short at the end, or a profile without all its records,
    // is left out.
    std::vector<std::int32_t> lengths;
    std::uint64_t points = 0;
    std::uint64_t record = 1;
    std::int32_t longest = 0;
    Block b;
    while (lengths.size() < profiles && source.Fits(record * kRecord, 1, kRecord)) {
        source.Seek(record * kRecord);
        source.Read(b, kRecord);
        const std::int32_t m = std::max(Whole(b, 12, 6, false), 0);
        const std::uint64_t records = RecordsOf(m);
        if (!source.Fits(record * kRecord, records, kRecord)) break;
        Whole(b, 18, 6, false);
        lengths.push_back(m);
        points += static_cast<std::uint64_t>(m);
        longest = std::max(longest, m);
        record += records;
    }
    ReservePoints(points);

    // Second pass: the points.
    record = 1;
    const double yStep = _header.resolution[1], zStep = _header.resolution[2];
    for (const std::int32_t m : lengths) {
        source.Seek(record * kRecord);
        source.Read(b, kRecord);
        ++record;
        for (std::size_t offset : {0u, 6u, 12u, 18u}) Whole(b, offset, 6, false);
        const double x = Real(b, 24, 24, false);
        const double y = Real(b, 48, 24, false);
        for (std::size_t offset : {72u, 96u, 122u}) Real(b, offset, 24, false);
        std::size_t offset = kFirstElevation;
        std::size_t left = kFirstCount;
        for (std::int32_t k = 0; k < m; ++k) {
            if (left == 0) {
                source.Read(b, kRecord);
                ++record;
                offset = 0;
                left = kNextCount;
            }
            const std::int32_t elevation = Whole(b, offset, kElevationWidth, false);
            offset += kElevationWidth;
            --left;
            _points.insert(_points.end(), {static_cast<float>(x), static_cast<float>(k * yStep + y),
                                           static_cast<float>(elevation * zStep)});
        }
    }
    BuildGridTriangles(lengths.size(), static_cast<std::uint64_t>(longest), points);
    FinishPoints();
}
