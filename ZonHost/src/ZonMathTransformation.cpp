#include "ZonError.h"
#include "ZonMath.h"

ZonMathTransformation::ZonMathTransformation() : m_{1, 0, 0, 0, 1, 0, 0, 0, 1}, t_{0, 0, 0} {}

ZonMathTransformation::ZonMathTransformation(const std::array<double, 9>& rowMajor,
                                             const std::array<double, 3>& translation)
    : m_(rowMajor), t_(translation)
{
}

bool ZonMathTransformation::IsIdentity() const
{
    return *this == ZonMathTransformation{};
}

ZonMathPoint ZonMathTransformation::Apply(const ZonMathPoint& p) const
{
    return ZonMathPoint(m_[0] * p[0] + m_[1] * p[1] + m_[2] * p[2] + t_[0],
                        m_[3] * p[0] + m_[4] * p[1] + m_[5] * p[2] + t_[1],
                        m_[6] * p[0] + m_[7] * p[1] + m_[8] * p[2] + t_[2]);
}

ZonMathTransformation ZonMathTransformation::operator*(const ZonMathTransformation& r) const
{
    std::array<double, 9> m{};
    for (int i = 0; i < 3; ++i)
        for (int j = 0; j < 3; ++j)
            for (int k = 0; k < 3; ++k) m[3 * i + j] += m_[3 * i + k] * r.m_[3 * k + j];
    const ZonMathPoint t = Apply(ZonMathPoint(r.t_[0], r.t_[1], r.t_[2]));
    return ZonMathTransformation(m, {t[0], t[1], t[2]});
}

ZonMathTransformation ZonMathTransformation::ComputeInverse() const
{
    const auto& a = m_;
    const double c00 = a[4] * a[8] - a[5] * a[7], c01 = a[5] * a[6] - a[3] * a[8], c02 = a[3] * a[7] - a[4] * a[6];
    const double det = a[0] * c00 + a[1] * c01 + a[2] * c02;
    if (det == 0.0 || !std::isfinite(det)) {
        ZonError error("ZonMathTransformation.ERR_NotInvertible", "ZonCldResOperError");
        error.SetSeverity(2);
        throw error;
    }
    const double inv = 1.0 / det;
    std::array<double, 9> m{c00 * inv,
                            (a[2] * a[7] - a[1] * a[8]) * inv,
                            (a[1] * a[5] - a[2] * a[4]) * inv,
                            c01 * inv,
                            (a[0] * a[8] - a[2] * a[6]) * inv,
                            (a[2] * a[3] - a[0] * a[5]) * inv,
                            c02 * inv,
                            (a[1] * a[6] - a[0] * a[7]) * inv,
                            (a[0] * a[4] - a[1] * a[3]) * inv};
    ZonMathTransformation result(m, {0, 0, 0});
    const ZonMathPoint t = result.Apply(ZonMathPoint(t_[0], t_[1], t_[2]));
    result.t_ = {-t[0], -t[1], -t[2]};
    return result;
}
