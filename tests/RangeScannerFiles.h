// Byte builders of the laser line and range scanner files (profile files,
// range grids and fringe-sensor grids), shared by their tests, fuzz seeds and
// benchmarks.
#pragma once
#include <algorithm>
#include <array>
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

namespace zontest {

// Every row a grid reader gives, points and validity, grid after grid.
struct GridRows {
    std::vector<std::vector<float>> points;
    std::vector<std::vector<int>> valid;
};

template <class Reader>
GridRows ReadGridRows(Reader& reader)
{
    GridRows rows;
    reader.BeginGetGrid();
    while (reader.NextGrid()) {
        reader.BeginGetGridPoints();
        unsigned n = 0;
        const unsigned char* v = nullptr;
        while (const float* p = reader.GetGridPoints(n, v)) {
            rows.points.emplace_back(p, p + 3 * n);
            rows.valid.emplace_back(v, v + n);
        }
    }
    return rows;
}

// Appends a value's bytes, little-endian, or reversed when `reversed`.
template <class T>
void PutOrdered(std::string& bytes, T value, bool reversed = false)
{
    char raw[sizeof(T)];
    std::memcpy(raw, &value, sizeof(T));
    if (reversed) std::reverse(raw, raw + sizeof(T));
    bytes.append(raw, sizeof(T));
}

// A profile: its point count as stored, and its values (points x values per point).
struct HyscanProfile {
    std::uint32_t points;
    std::vector<float> values;
};
using HyscanGroup = std::vector<HyscanProfile>;

struct HyscanHeader {
    std::uint32_t wordA = 1;  // written little-endian as it is: the byte-order probe
    std::uint32_t wordC = 0;
    bool reversed = false;    // every other 32-bit value written the other way round
    std::string axes = "-----------XYZ";  // from byte 8, NUL-padded to 15 bytes
    std::string unit = "mm";              // from byte 23
};

inline std::string HyscanFile(const std::vector<HyscanGroup>& groups, const HyscanHeader& h = {})
{
    std::string bytes;
    PutOrdered(bytes, h.wordA);
    PutOrdered<std::uint32_t>(bytes, 7, h.reversed);  // word B
    std::string text = h.axes;
    text.resize(15, '\0');
    bytes += text;
    text = h.unit;
    text.resize(5, '\0');
    bytes += text;
    bytes.resize(68, ' ');
    PutOrdered(bytes, h.wordC);
    bytes.resize(96, '\0');
    for (const HyscanGroup& group : groups) {
        std::string header = "group";
        header.resize(18, '\0');
        PutOrdered<std::uint16_t>(header, 3, h.reversed);
        header.resize(22, '\0');
        for (int i = 0; i < 18; ++i) PutOrdered<float>(header, static_cast<float>(i), h.reversed);
        PutOrdered(header, static_cast<std::uint32_t>(group.size()), h.reversed);
        header.resize(122, '\0');
        bytes += header;
        for (const HyscanProfile& profile : group) {
            std::string profileHeader(36, 'p');
            PutOrdered(profileHeader, profile.points, h.reversed);
            bytes += profileHeader;
            for (float v : profile.values) PutOrdered(bytes, v, h.reversed);
        }
    }
    return bytes;
}

struct KreonGrid {
    std::uint16_t kind = 1;  // 1 planar, 2 cylindrical, 6 cylindrical with row centres
    std::uint16_t columns = 0, rows = 0;
    float x0 = 0, columnStep = 1, origin = 0, rowStep = 1;  // origin: y0 of a plane, z0 of a cylinder
    std::array<float, 9> rotation = {1, 0, 0, 0, 1, 0, 0, 0, 1};
    std::array<float, 3> translation = {0, 0, 0};
    std::vector<float> values;   // rows x columns
    std::vector<float> centres;  // cx, cy per row
    unsigned char byte30 = 1, byte31 = 0;
    std::uint16_t field70 = 0;
};

// Header, value table at 128, then the row centres.
inline std::string KreonFile(const KreonGrid& g)
{
    std::string bytes(30, 'k');
    bytes += static_cast<char>(g.byte30);
    bytes += static_cast<char>(g.byte31);
    PutOrdered(bytes, g.kind);
    PutOrdered(bytes, g.columns);
    PutOrdered(bytes, g.rows);
    for (float v : {g.x0, 0.0f, g.columnStep, 0.0f, g.origin, g.rowStep, 0.0f, 0.0f}) PutOrdered(bytes, v);
    PutOrdered(bytes, g.field70);
    for (float v : g.rotation) PutOrdered(bytes, v);
    for (float v : g.translation) PutOrdered(bytes, v);
    const auto values = static_cast<std::uint32_t>(128);
    PutOrdered(bytes, values);
    PutOrdered(bytes, static_cast<std::uint32_t>(values + 4 * g.values.size()));
    for (float v : g.values) PutOrdered(bytes, v);
    for (float v : g.centres) PutOrdered(bytes, v);
    return bytes;
}

using OptonRecord = std::array<float, 4>;

struct OptonGrid {
    float extra = 4;  // header record 1: the data start after trunc(extra) + 3 records
    std::array<float, 3> low = {0, 0, 0}, high = {1, 1, 1};  // the box's corners
    float points = -1;  // header point count; -1: rows x columns
    float rows = 0, columns = 0;
    std::vector<OptonRecord> records;  // written from the data offset, over the header if it starts inside
};

inline std::string OptonFile(const OptonGrid& g)
{
    std::string bytes(16, '\0');
    const auto record = [&](OptonRecord r) {
        for (float v : r) PutOrdered(bytes, v);
    };
    record({g.extra, 0, 0, 0});
    record({0, 0, 0, 0});
    record({g.low[0], g.low[1], g.low[2], 0});
    record({g.high[0], g.high[1], g.high[2], 0});
    record({0, 0, 0, 0});
    record({g.points < 0 ? g.rows * g.columns : g.points, g.rows, g.columns, 0});
    std::string data;
    for (const OptonRecord& r : g.records)
        for (float v : r) PutOrdered(data, v);
    const long start = (static_cast<long>(g.extra) + 3) * 16;
    if (start < 0) return bytes;  // data before the file: none written
    const auto offset = static_cast<std::size_t>(start);
    bytes.resize(std::max(bytes.size(), offset + data.size()), '\0');
    bytes.replace(offset, data.size(), data);
    return bytes;
}

}  // namespace zontest
