#include "ZonCldSetOfScans.h"

std::size_t ZonCldSetOfScans::GetNumberOfPoints() const
{
    std::size_t n = 0;
    for (const auto& scan : _scans) n += scan->GetNumberOfPoints();
    return n;
}
