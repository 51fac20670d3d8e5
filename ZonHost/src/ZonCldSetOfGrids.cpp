#include "ZonCldSetOfGrids.h"

std::size_t ZonCldSetOfGrids::GetNumberOfValidPoints() const
{
    std::size_t n = 0;
    for (const auto& grid : _grids) n += grid->GetNumberOfValidPoints();
    return n;
}
