#include "ZonCldPointArray.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <type_traits>

namespace {
template <class To, class From>
void CopyScaled(std::vector<To>& to, const From* from, std::size_t count, double factor)
{
    if constexpr (std::is_same_v<To, From>) {
        if (factor == 1.0) {
            // Copied straight into fresh memory, not zeroed first.
            to.assign(from, from + 3 * count);
            return;
        }
    }
    to.resize(3 * count);
    for (std::size_t i = 0; i < 3 * count; ++i) to[i] = static_cast<To>(static_cast<double>(from[i]) * factor);
}

template <class T>
void SelectTriples(std::vector<T>& values, const std::vector<std::size_t>& indices)
{
    std::vector<T> kept(3 * indices.size());
    for (std::size_t i = 0; i < indices.size(); ++i)
        for (std::size_t k = 0; k < 3; ++k) kept[3 * i + k] = values[3 * indices[i] + k];
    values = std::move(kept);
}
// Accumulates in the array's own type with plain comparisons (the minimum
// and maximum of floats are the same taken in float or in double): AddPoint
// per point is the slow path for millions of points.
// The box of the points whose flag is set (every point without flags) when
// all their coordinates are finite, in one pass that the compiler can
// vectorise: twelve lanes hold four points, so lane j always sees axis j % 3
// of point j / 3. False when a coordinate is not finite (x - x is then NaN).
template <bool Flagged, class T>
bool FastTriplesBox(const T* p, const unsigned char* flags, std::size_t n, T low[3], T high[3])
{
    constexpr std::size_t Lanes = 12;
    constexpr T Infinity = std::numeric_limits<T>::infinity();
    T lo[Lanes], hi[Lanes], odd[Lanes];
    for (std::size_t j = 0; j < Lanes; ++j) {
        lo[j] = Infinity;
        hi[j] = -Infinity;
        odd[j] = 0;
    }
    const auto take = [&](std::size_t i, std::size_t j) {
        const T v = p[i];
        bool keep = true;
        if constexpr (Flagged) keep = flags[i / 3] != 0;
        lo[j] = keep && v < lo[j] ? v : lo[j];
        hi[j] = keep && v > hi[j] ? v : hi[j];
        odd[j] += keep ? v - v : T(0);
    };
    const std::size_t values = 3 * n, whole = values / Lanes * Lanes;
    for (std::size_t i = 0; i < whole; i += Lanes)
        for (std::size_t j = 0; j < Lanes; ++j) take(i + j, j);
    for (std::size_t i = whole; i < values; ++i) take(i, i - whole);
    for (std::size_t j = 0; j < Lanes; ++j)
        if (odd[j] != 0) return false;
    for (std::size_t j = 0; j < Lanes; ++j) {
        low[j % 3] = lo[j] < low[j % 3] ? lo[j] : low[j % 3];
        high[j % 3] = hi[j] > high[j % 3] ? hi[j] : high[j % 3];
    }
    return true;
}

template <class T>
void AddTriplesToBox(const std::vector<T>& xyz, const unsigned char* flags, ZonMathBox& box)
{
    constexpr T Infinity = std::numeric_limits<T>::infinity();
    T low[3] = {Infinity, Infinity, Infinity}, high[3] = {-Infinity, -Infinity, -Infinity};
    std::size_t n = xyz.size() / 3;
    const T* p = xyz.data();
    // The exact walk below is for points that are not finite.
    if (flags ? FastTriplesBox<true>(p, flags, n, low, high) : FastTriplesBox<false>(p, flags, n, low, high)) n = 0;
    for (std::size_t i = 0; i < n; ++i, p += 3) {
        if (flags && !flags[i]) continue;
        // A point with a missing coordinate has no place in a box.
        if (!std::isfinite(p[0]) || !std::isfinite(p[1]) || !std::isfinite(p[2])) continue;
        for (int a = 0; a < 3; ++a) {
            low[a] = p[a] < low[a] ? p[a] : low[a];
            high[a] = p[a] > high[a] ? p[a] : high[a];
        }
    }
    if (low[0] > high[0]) return;  // no point
    box.AddPoint(low[0], low[1], low[2]);
    box.AddPoint(high[0], high[1], high[2]);
}
}  // namespace

void ZonCldPointArray::AssignScaled(const float* xyz, std::size_t count, double factor)
{
    _double = false;
    _doubles.clear();
    CopyScaled(_floats, xyz, count, factor);
}

void ZonCldPointArray::AssignScaled(const double* xyz, std::size_t count, double factor)
{
    _double = true;
    _floats.clear();
    CopyScaled(_doubles, xyz, count, factor);
}

namespace {
template <class T>
void ScaleInPlace(std::vector<T>& xyz, double factor)
{
    if (factor == 1.0) return;
    for (T& value : xyz) value = static_cast<T>(static_cast<double>(value) * factor);
}
}  // namespace

void ZonCldPointArray::AdoptScaled(std::vector<float>&& xyz, double factor)
{
    _double = false;
    _doubles.clear();
    _floats = std::move(xyz);
    _floats.resize(_floats.size() / 3 * 3);
    ScaleInPlace(_floats, factor);
}

void ZonCldPointArray::AdoptScaled(std::vector<double>&& xyz, double factor)
{
    _double = true;
    _floats.clear();
    _doubles = std::move(xyz);
    _doubles.resize(_doubles.size() / 3 * 3);
    ScaleInPlace(_doubles, factor);
}

void ZonCldPointArray::Select(const std::vector<std::size_t>& indices)
{
    if (_double)
        SelectTriples(_doubles, indices);
    else
        SelectTriples(_floats, indices);
}

ZonMathPoint ZonCldPointArray::GetPoint(std::size_t index) const
{
    if (_double) return ZonMathPoint(_doubles[3 * index], _doubles[3 * index + 1], _doubles[3 * index + 2]);
    return ZonMathPoint(_floats[3 * index], _floats[3 * index + 1], _floats[3 * index + 2]);
}

void ZonCldPointArray::AddToBox(ZonMathBox& box, const unsigned char* flags) const
{
    if (_double)
        AddTriplesToBox(_doubles, flags, box);
    else
        AddTriplesToBox(_floats, flags, box);
}
