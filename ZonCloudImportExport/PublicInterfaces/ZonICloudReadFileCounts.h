#pragma once
#include <cstdint>
#include <string>
#include <utility>
#include <vector>

#include "ZonCldExport.h"

// Optional interface of a reader that knows counts of its file beyond the
// points (the slices of an image series): the import engine adds them to the
// statistics, each under its own label key.
class ZON_CLD_API ZonICloudReadFileCounts {
public:
    virtual ~ZonICloudReadFileCounts() = default;
    // Label keys with their counts, in the order they are shown.
    virtual std::vector<std::pair<std::string, std::uint64_t>> GetFileCounts() = 0;
};
