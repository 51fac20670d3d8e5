#pragma once
#include <array>
#include <cmath>

#include "ZonHostExport.h"

class ZON_HOST_API ZonMathPoint {
public:
    ZonMathPoint() = default;
    ZonMathPoint(double x, double y, double z) : x_{x, y, z} {}
    double GetX() const { return x_[0]; }
    double GetY() const { return x_[1]; }
    double GetZ() const { return x_[2]; }
    double operator[](int i) const { return x_[i]; }
    double& operator[](int i) { return x_[i]; }
    double DistanceTo(const ZonMathPoint& other) const;
    friend bool operator==(const ZonMathPoint&, const ZonMathPoint&) = default;

private:
    std::array<double, 3> x_{0.0, 0.0, 0.0};
};

// Axis-aligned box of six doubles (x, y, z low and high) with an empty state.
class ZON_HOST_API ZonMathBox {
public:
    ZonMathBox() = default;  // empty
    ZonMathBox(double xmin, double xmax, double ymin, double ymax, double zmin, double zmax);
    ZonMathBox(const ZonMathPoint& low, const ZonMathPoint& high);

    bool IsEmpty() const { return empty_; }
    void SetToEmpty() { empty_ = true; low_ = high_ = ZonMathPoint(); }
    const ZonMathPoint& GetLow() const { return low_; }
    const ZonMathPoint& GetHigh() const { return high_; }
    void SetLowHigh(const ZonMathPoint& low, const ZonMathPoint& high) { low_ = low; high_ = high; empty_ = false; }
    void AddPoint(double x, double y, double z);
    void AddBox(const ZonMathBox& other);
    // True when the boxes overlap, faces enlarged by tolerance; empty boxes meet nothing.
    bool Intersects(const ZonMathBox& other, double tolerance = 0.0) const;
    bool Contains(double x, double y, double z) const;
    // Both corners at distance exactly 0.
    bool IsSameAs(const ZonMathBox& other) const;

private:
    ZonMathPoint low_, high_;
    bool empty_ = true;
};

// Affine map: 3 x 3 matrix then translation.
class ZON_HOST_API ZonMathTransformation {
public:
    ZonMathTransformation();  // identity
    ZonMathTransformation(const std::array<double, 9>& rowMajor, const std::array<double, 3>& translation);

    bool IsIdentity() const;
    // Throws ZonError "ZonMathTransformation.ERR_NotInvertible" (catalog "ZonCldResOperError") for a singular matrix.
    ZonMathTransformation ComputeInverse() const;
    ZonMathPoint Apply(const ZonMathPoint& p) const;
    ZonMathTransformation operator*(const ZonMathTransformation& right) const;  // this after right
    const std::array<double, 9>& GetMatrix() const { return m_; }
    const std::array<double, 3>& GetTranslation() const { return t_; }
    friend bool operator==(const ZonMathTransformation&, const ZonMathTransformation&) = default;

private:
    std::array<double, 9> m_;
    std::array<double, 3> t_;
};
