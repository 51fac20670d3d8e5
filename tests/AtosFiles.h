// Byte builders of the scanner files of the fringe-projection formats, shared
// by their tests, fuzz seeds and benchmarks.
#pragma once
#include <cstdint>
#include <cstring>
#include <string>
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

}  // namespace zontest
