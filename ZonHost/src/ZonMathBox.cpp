#include <algorithm>

#include "ZonMath.h"

ZonMathBox::ZonMathBox(double xmin, double xmax, double ymin, double ymax, double zmin, double zmax)
    : low_(xmin, ymin, zmin), high_(xmax, ymax, zmax), empty_(false)
{
}

ZonMathBox::ZonMathBox(const ZonMathPoint& low, const ZonMathPoint& high) : low_(low), high_(high), empty_(false) {}

void ZonMathBox::AddPoint(double x, double y, double z)
{
    if (empty_) {
        low_ = high_ = ZonMathPoint(x, y, z);
        empty_ = false;
        return;
    }
    const double v[3] = {x, y, z};
    for (int i = 0; i < 3; ++i) {
        low_[i] = std::min(low_[i], v[i]);
        high_[i] = std::max(high_[i], v[i]);
    }
}

void ZonMathBox::AddBox(const ZonMathBox& other)
{
    if (other.empty_) return;
    AddPoint(other.low_[0], other.low_[1], other.low_[2]);
    AddPoint(other.high_[0], other.high_[1], other.high_[2]);
}

bool ZonMathBox::Intersects(const ZonMathBox& other, double tolerance) const
{
    if (empty_ || other.empty_) return false;
    for (int i = 0; i < 3; ++i)
        if (low_[i] > other.high_[i] + tolerance || other.low_[i] > high_[i] + tolerance) return false;
    return true;
}

bool ZonMathBox::Contains(double x, double y, double z) const
{
    return !empty_ && low_[0] <= x && x <= high_[0] && low_[1] <= y && y <= high_[1] && low_[2] <= z && z <= high_[2];
}

bool ZonMathBox::IsSameAs(const ZonMathBox& other) const
{
    if (empty_ || other.empty_) return empty_ == other.empty_;
    return low_.DistanceTo(other.low_) == 0.0 && high_.DistanceTo(other.high_) == 0.0;
}
