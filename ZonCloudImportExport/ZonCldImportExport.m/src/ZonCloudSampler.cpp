#include "ZonCloudSampler.h"

std::uint64_t ZonCloudSampler::CountKept(std::uint64_t n) const
{
    ZonCloudSampler walker(*this);
    walker.Restart();
    std::uint64_t kept = 0;
    for (std::uint64_t i = 0; i < n; ++i) kept += walker.Keep() ? 1 : 0;
    return kept;
}
