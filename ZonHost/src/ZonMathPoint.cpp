#include "ZonMath.h"

double ZonMathPoint::DistanceTo(const ZonMathPoint& other) const
{
    const double dx = x_[0] - other.x_[0], dy = x_[1] - other.x_[1], dz = x_[2] - other.x_[2];
    return std::sqrt(dx * dx + dy * dy + dz * dz);
}
