#include "ZonCloudReadKreonBin.h"

#include <algorithm>
#include <cerrno>
#include <cmath>
#include <limits>
#include <numbers>

#include "ZonCloudReadNLSTool.h"

namespace {

using Tool = ZonCloudReadNLSTool;

constexpr std::uint64_t HeaderSize = 128;
constexpr std::uint64_t CentreSize = 8;

template <class T>
T Little(const unsigned char* p)
{
    return ZonCloudByteSource::LoadLittle<T>(p);
}

[[noreturn]] void ShortRead()
{
    errno = ENODATA;
    Tool::Raise(Tool::Input, nullptr);
}

}  // namespace

ZonCloudReadKreonBin::ZonCloudReadKreonBin(const ZonUnicodeString& fileName) : ZonCloudReadRowTable(fileName) {}

ZonCloudReadKreonBin::GridKind ZonCloudReadKreonBin::GetGridKind()
{
    Analyse();
    return _kind;
}

// ---- Analysis ---------------------------------------------------------------

void ZonCloudReadKreonBin::AnalyseFile()
{
    _numberOfPoints = 0;
    _boundingBox = ZonMathBox();
    _boxKnown = false;
    ResetRows();

    ZonCloudByteSource& source = Source();
    unsigned char header[HeaderSize];
    source.Read(header, sizeof header);
    const auto kind = Little<std::uint16_t>(header + 32);
    if (header[30] != 1 || header[31] != 0 || Little<std::uint16_t>(header + 70) != 0 ||
        (kind != Planar && kind != Cylindrical && kind != CylindricalWithCentres))
        Tool::Raise(Tool::Data, "ERR_UnknownData");
    _kind = static_cast<GridKind>(kind);
    _columns = Little<std::uint16_t>(header + 34);
    _rows = Little<std::uint16_t>(header + 36);
    _x0 = Little<float>(header + 38);
    _columnStep = Little<float>(header + 46);
    _y0 = Little<float>(header + 54);
    _rowStep = Little<float>(header + 58);
    for (int r = 0; r < 3; ++r)
        for (int c = 0; c < 3; ++c) _rotation[r][c] = Little<float>(header + 72 + 4 * (3 * r + c));
    for (int a = 0; a < 3; ++a) _translation[a] = Little<float>(header + 108 + 4 * a);
    _values = Little<std::uint32_t>(header + 120);
    const std::uint64_t centres = Little<std::uint32_t>(header + 124);

    const std::uint64_t nodes = _rows * _columns;
    if (nodes == 0) Tool::Raise(Tool::Data, "ERR_NoPointFound");
    if (!source.Fits(_values, nodes, ValueSize)) ShortRead();
    if (_kind == CylindricalWithCentres) {
        if (!source.Fits(centres, _rows, CentreSize)) ShortRead();
        Resize(_centres, 2 * _rows);
        source.Seek(centres);
        Resize(_buffer, _rows * CentreSize);
        source.Read(_buffer.data(), _buffer.size());
        for (std::size_t i = 0; i < _centres.size(); ++i) _centres[i] = Little<float>(_buffer.data() + 4 * i);
    }
    // Planar: local (x_i, y_j, v); cylinders: (v cos t_i + cx_j, v sin t_i + cy_j, z_j).
    Resize(_columnBase, 3 * _columns);
    Resize(_columnScale, 3 * _columns);
    for (std::uint64_t i = 0; i < _columns; ++i) {
        double* base = &_columnBase[3 * i];
        double* scale = &_columnScale[3 * i];
        if (_kind == Planar) {
            const double x = static_cast<double>(i) * _columnStep + _x0;
            for (int a = 0; a < 3; ++a) {
                base[a] = _rotation[a][0] * x;
                scale[a] = _rotation[a][2];
            }
        } else {
            const double angle = static_cast<double>(i) * 2.0 * std::numbers::pi / static_cast<double>(_columns);
            const double c = std::cos(angle), s = std::sin(angle);
            for (int a = 0; a < 3; ++a) {
                base[a] = 0.0;
                scale[a] = _rotation[a][0] * c + _rotation[a][1] * s;
            }
        }
    }
    _boxKnown = false;
    SetTable({_values, _columns * ValueSize, _rows}, _columns);
    // Counts are 16-bit each: the product always fits.
    _numberOfPoints = static_cast<int>(nodes);
    _digitizationType = DigitizationGrids;
}

void ZonCloudReadKreonBin::GetBoundingBox(ZonMathBox& box)
{
    Analyse();
    if (!_boxKnown) {
        float low[3], high[3];
        for (int a = 0; a < 3; ++a) {
            low[a] = std::numeric_limits<float>::infinity();
            high[a] = -std::numeric_limits<float>::infinity();
        }
        Guarded([&] {
            ZonCloudByteSource& source = Source();
            Resize(_buffer, _columns * ValueSize);
            source.Seek(_values);
            for (std::uint64_t row = 0; row < _rows; ++row) {
                source.Read(_buffer.data(), _buffer.size());
                ForEachMeasured(row, _buffer.data(), [&](std::uint64_t, const float* p) {
                    for (int a = 0; a < 3; ++a) {
                        low[a] = p[a] < low[a] ? p[a] : low[a];
                        high[a] = p[a] > high[a] ? p[a] : high[a];
                    }
                });
            }
        });
        _boundingBox = ZonMathBox();
        if (low[0] <= high[0] && low[1] <= high[1] && low[2] <= high[2])
            _boundingBox = ZonMathBox(low[0], high[0], low[1], high[1], low[2], high[2]);
        _boxKnown = true;
    }
    box = _boundingBox;
}

template <class Visit>
void ZonCloudReadKreonBin::ForEachMeasured(std::uint64_t row, const unsigned char* bytes, Visit visit) const
{
    // What the row adds: its height along the axis (planar y, cylinder z) and its centre.
    const double down = static_cast<double>(row) * _rowStep;
    double local[3] = {0.0, 0.0, _y0 - down};
    if (_kind == Planar) {
        local[1] = _y0 - down;
        local[2] = 0.0;
    } else if (_kind == CylindricalWithCentres) {
        local[0] = _centres[2 * row];
        local[1] = _centres[2 * row + 1];
    }
    double rowBase[3];
    for (int a = 0; a < 3; ++a)
        rowBase[a] = _rotation[a][0] * local[0] + _rotation[a][1] * local[1] + _rotation[a][2] * local[2] + _translation[a];

    const double* base = _columnBase.data();
    const double* scale = _columnScale.data();
    for (std::uint64_t column = 0; column < _columns; ++column, bytes += ValueSize, base += 3, scale += 3) {
        const float value = Little<float>(bytes);
        if (value == Hole) continue;
        const double v = value;
        const float p[3] = {static_cast<float>(rowBase[0] + base[0] + scale[0] * v),
                            static_cast<float>(rowBase[1] + base[1] + scale[1] * v),
                            static_cast<float>(rowBase[2] + base[2] + scale[2] * v)};
        visit(column, p);
    }
}

// ---- Reading ----------------------------------------------------------------

std::uint64_t ZonCloudReadKreonBin::FillRow(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) const
{
    Allocating([&] { target.Start(_columns, _samplingPercent); });
    ForEachMeasured(row, bytes, [&](std::uint64_t column, const float* p) {
        const std::int64_t slot = target.SlotOf(column);
        if (slot >= 0) target.Set(static_cast<std::size_t>(slot), p[0], p[1], p[2]);
    });
    return 0;
}
