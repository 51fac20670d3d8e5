#include "ZonCldPointArray.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#ifdef __SSE2__
#include <emmintrin.h>
#endif

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
    // Point k of a group of four fills lanes 3k to 3k + 2, so a lane's flag
    // is a fixed one of the group's four.
    const auto take = [&](const T* q, const unsigned char* f, std::size_t j) {
        const T v = q[j];
        bool keep = true;
        if constexpr (Flagged) keep = f[j / 3] != 0;
        lo[j] = keep && v < lo[j] ? v : lo[j];
        hi[j] = keep && v > hi[j] ? v : hi[j];
        odd[j] += keep ? v - v : T(0);
    };
    const std::size_t whole = n / 4 * 4;
    for (std::size_t k = 0; k < whole; k += 4)
        for (std::size_t j = 0; j < Lanes; ++j) take(p + 3 * k, Flagged ? flags + k : nullptr, j);
    for (std::size_t j = 0; j < 3 * (n - whole); ++j) take(p + 3 * whole, Flagged ? flags + whole : nullptr, j);
    for (std::size_t j = 0; j < Lanes; ++j)
        if (odd[j] != 0) return false;
    for (std::size_t j = 0; j < Lanes; ++j) {
        low[j % 3] = lo[j] < low[j % 3] ? lo[j] : low[j % 3];
        high[j % 3] = hi[j] > high[j % 3] ? hi[j] : high[j % 3];
    }
    return true;
}

#ifdef __SSE2__
// The same for floats in explicit vector steps (the compiler does not turn
// the lanes above into vector code at our optimisation level): four points
// are three vectors, x0 y0 z0 x1 | y1 z1 x2 y2 | z2 x3 y3 z3.
// Lane masks of a group of four points for each pattern of their flags (bit
// k set: point k kept); point k fills lanes 3k to 3k + 2 of the group.
struct LaneMasks {
    __m128 lanes[16][3];
    LaneMasks()
    {
        for (unsigned pattern = 0; pattern < 16; ++pattern) {
            alignas(16) std::int32_t bits[12];
            for (int lane = 0; lane < 12; ++lane) bits[lane] = (pattern >> (lane / 3)) & 1 ? -1 : 0;
            for (int i = 0; i < 3; ++i)
                lanes[pattern][i] = _mm_castsi128_ps(_mm_load_si128(reinterpret_cast<const __m128i*>(bits + 4 * i)));
        }
    }
};
const LaneMasks& Masks()
{
    static const LaneMasks masks;
    return masks;
}

template <bool Flagged>
bool FastTriplesBox(const float* p, const unsigned char* flags, std::size_t n, float low[3], float high[3])
{
    const __m128 inf = _mm_set1_ps(std::numeric_limits<float>::infinity());
    const __m128 negInf = _mm_set1_ps(-std::numeric_limits<float>::infinity());
    __m128 lo[3] = {inf, inf, inf}, hi[3] = {negInf, negInf, negInf};
    __m128 odd = _mm_setzero_ps();
    const LaneMasks* masks = Flagged ? &Masks() : nullptr;
    const std::size_t whole = n / 4 * 4;
    for (std::size_t k = 0; k < whole; k += 4) {
        const float* q = p + 3 * k;
        __m128 v[3] = {_mm_loadu_ps(q), _mm_loadu_ps(q + 4), _mm_loadu_ps(q + 8)};
        if constexpr (Flagged) {
            // The group's four flags pick one of sixteen lane masks; most
            // groups are all set (or all holes) and need no mask.
            const unsigned char* f = flags + k;
            const unsigned pattern = (f[0] != 0) | (f[1] != 0) << 1 | (f[2] != 0) << 2 | (f[3] != 0) << 3;
            if (pattern == 0) continue;
            if (pattern != 15) {
                const __m128* keep = masks->lanes[pattern];
                for (int i = 0; i < 3; ++i) {
                    const __m128 kept = _mm_and_ps(keep[i], v[i]);
                    lo[i] = _mm_min_ps(lo[i], _mm_or_ps(kept, _mm_andnot_ps(keep[i], inf)));
                    hi[i] = _mm_max_ps(hi[i], _mm_or_ps(kept, _mm_andnot_ps(keep[i], negInf)));
                    odd = _mm_add_ps(odd, _mm_and_ps(keep[i], _mm_sub_ps(v[i], v[i])));
                }
                continue;
            }
        }
        for (int i = 0; i < 3; ++i) {
            lo[i] = _mm_min_ps(lo[i], v[i]);
            hi[i] = _mm_max_ps(hi[i], v[i]);
            odd = _mm_add_ps(odd, _mm_sub_ps(v[i], v[i]));
        }
    }
    float lanes[3][4], highLanes[3][4], odds[4];
    _mm_storeu_ps(odds, odd);
    for (float o : odds)
        if (o != 0) return false;
    for (int i = 0; i < 3; ++i) {
        _mm_storeu_ps(lanes[i], lo[i]);
        _mm_storeu_ps(highLanes[i], hi[i]);
    }
    // Lane j of vector i holds axis (4 i + j) % 3.
    for (int i = 0; i < 3; ++i)
        for (int j = 0; j < 4; ++j) {
            const int axis = (4 * i + j) % 3;
            low[axis] = lanes[i][j] < low[axis] ? lanes[i][j] : low[axis];
            high[axis] = highLanes[i][j] > high[axis] ? highLanes[i][j] : high[axis];
        }
    // The last points, one by one.
    for (std::size_t k = whole; k < n; ++k) {
        if (Flagged && !flags[k]) continue;
        for (int a = 0; a < 3; ++a) {
            const float value = p[3 * k + a];
            if (value - value != 0) return false;
            low[a] = value < low[a] ? value : low[a];
            high[a] = value > high[a] ? value : high[a];
        }
    }
    return true;
}
#endif

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
