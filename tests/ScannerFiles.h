// Byte builders of the scanner files of the fringe-projection formats, shared
// by their tests, fuzz seeds and benchmarks.
#pragma once
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

namespace zontest {

// Appends the little-endian bytes of a value.
template <class T>
void Put(std::string& bytes, T value)
{
    char raw[sizeof(T)];
    std::memcpy(raw, &value, sizeof(T));
    bytes.append(raw, sizeof(T));
}

struct AtosPoint {
    double x, y, z;
    std::uint32_t column, row;  // pixel position
    double quality;
};

struct AtosPatch {
    std::vector<AtosPoint> points;
    std::uint32_t stepX = 1, stepY = 1;
    std::uint32_t height = 1000;
};

// A binary measurement file: header, descriptors at 512, then each patch's
// records of `recordSize` bytes (the first 40 used).
inline std::string AtosBinary(const std::vector<AtosPatch>& patches, std::uint32_t recordSize = 40,
                              std::uint16_t kind = 1, const char* version = "v4.4.3")
{
    constexpr std::uint32_t DescriptorSize = 76;
    std::string bytes = "%ATOSBIN";
    bytes.append(version, 6);
    Put<std::uint16_t>(bytes, kind);
    Put<std::uint32_t>(bytes, static_cast<std::uint32_t>(patches.size()));
    Put<std::uint32_t>(bytes, DescriptorSize);
    Put<std::uint32_t>(bytes, recordSize);
    bytes.resize(512 + patches.size() * DescriptorSize, '\0');
    std::uint64_t offset = bytes.size();
    std::string records;
    for (std::size_t i = 0; i < patches.size(); ++i) {
        const AtosPatch& patch = patches[i];
        std::string descriptor;
        Put<std::uint32_t>(descriptor, static_cast<std::uint32_t>(offset));
        Put<std::uint32_t>(descriptor, 0);
        Put<std::uint32_t>(descriptor, patch.height);
        Put<std::uint32_t>(descriptor, 0);
        Put<std::uint32_t>(descriptor, static_cast<std::uint32_t>(patch.points.size()));
        Put<std::uint32_t>(descriptor, patch.stepY);
        Put<std::uint32_t>(descriptor, patch.stepX);
        descriptor.resize(DescriptorSize, '\0');
        bytes.replace(512 + i * DescriptorSize, DescriptorSize, descriptor);
        for (const AtosPoint& p : patch.points) {
            std::string record;
            Put(record, p.x);
            Put(record, p.y);
            Put(record, p.z);
            Put(record, p.column);
            Put(record, p.row);
            Put(record, p.quality);
            record.resize(recordSize, '\0');
            records += record;
        }
        offset += patch.points.size() * recordSize;
    }
    return bytes + records;
}

// One subset of a subset file: its keyword lines (without the offsets, which
// the builder adds), its point records and an optional scan or pixel table.
struct SteinSubset {
    enum Table { None, Scans, Pixels };
    SteinSubset(std::string lines_, std::string records_, Table table_ = None, std::string tableBytes_ = {})
        : lines(std::move(lines_)), records(std::move(records_)), table(table_), tableBytes(std::move(tableBytes_))
    {
    }
    std::string lines;       // "KEYWORD value\n" lines
    std::string records;     // 12 bytes per point
    Table table;
    std::string tableBytes;  // scan table without its 4 leading bytes, or pixel entries
};

inline std::string SteinRecords(const std::vector<float>& xyz)
{
    std::string bytes;
    for (float v : xyz) Put(bytes, v);
    return bytes;
}

inline std::string SteinIntegerRecords(const std::vector<std::int32_t>& xyz)
{
    std::string bytes;
    for (std::int32_t v : xyz) Put(bytes, v);
    return bytes;
}

// A subset file: "II", the subsets one after the other, each header followed
// by its records and its table, linked by NEXT_SUBSET.
inline std::string SteinFile(const std::vector<SteinSubset>& subsets, const std::string& mark = "II")
{
    std::string bytes = mark + "\r\n";
    for (std::size_t i = 0; i < subsets.size(); ++i) {
        const SteinSubset& s = subsets[i];
        // Offsets are written in ten columns so that the header's length is known first.
        const auto line = [](const char* keyword, std::uint64_t value) {
            char text[64];
            std::snprintf(text, sizeof text, "%s %10llu\n", keyword, static_cast<unsigned long long>(value));
            return std::string(text);
        };
        const bool last = i + 1 == subsets.size();
        const std::size_t fixedLines = 1 + (s.table != SteinSubset::None) + (last ? 0 : 1);
        const std::size_t headerSize = s.lines.size() + fixedLines * line("FIRST_PIXEL_TABLE_BYTE", 0).size();
        const std::uint64_t data = bytes.size() + headerSize;
        const std::uint64_t table = data + s.records.size();
        const std::uint64_t next = table + (s.table == SteinSubset::Scans ? 4 : 0) + s.tableBytes.size();
        std::string header = s.lines;
        // Padded to one width so that every fixed line has the same length.
        const auto padded = [&](const char* keyword, std::uint64_t value) {
            std::string text = line(keyword, value);
            const std::size_t width = line("FIRST_PIXEL_TABLE_BYTE", 0).size();
            text.insert(text.size() - 11, width - text.size(), ' ');
            return text;
        };
        header += padded("FIRST_DATA_BYTE", data);
        if (s.table == SteinSubset::Scans) header += padded("FIRST_SCAN_BYTE", table);
        if (s.table == SteinSubset::Pixels) header += padded("FIRST_PIXEL_TABLE_BYTE", table);
        if (!last) header += padded("NEXT_SUBSET", next);
        bytes += header + s.records;
        if (s.table == SteinSubset::Scans) bytes += std::string(4, '\0');
        bytes += s.tableBytes;
    }
    return bytes;
}

}  // namespace zontest
