#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudReadRowTable.h"

// Range grids of a laser scanner: one range value per node, the nodes laid
// out in a plane or around a cylinder (whose rows may each have their own
// centre), and a placement that carries the grid's local coordinates into the
// model. The file is one grid, delivered row by row with a hole where a node
// holds no measurement, or its measured nodes as a cloud.
//
// Rows run downward: row j lies j steps below the first. Around a cylinder,
// column i lies at the angle i * 2 pi / N. The analysis checks the header,
// reads the row centres and walks the value table once for the box; rows are
// then read back straight from the table, a batch at a time on all cores.
class ZonCloudReadKreonBin : public ZonCloudReadRowTable {
public:
    enum GridKind { Planar = 1, Cylindrical = 2, CylindricalWithCentres = 6 };
    // The value of a node without measurement.
    static constexpr float Hole = -32767.0f;

    explicit ZonCloudReadKreonBin(const ZonUnicodeString& fileName);

    // The box of the measured nodes, worked out on the first request (a walk
    // over the rows needs none).
    void GetBoundingBox(ZonMathBox& box) override;

    GridKind GetGridKind();

protected:
    void AnalyseFile() override;
    std::uint64_t FillRow(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) const override;

private:
    // Calls visit(column, point) for each measured node of row j (from 0)
    // whose values are `bytes`, its point in the model. Changes nothing, so
    // rows may be read side by side.
    template <class Visit>
    void ForEachMeasured(std::uint64_t row, const unsigned char* bytes, Visit visit) const;

    static constexpr std::uint64_t ValueSize = 4;

    GridKind _kind = Planar;
    std::uint64_t _columns = 0, _rows = 0;
    double _x0 = 0, _columnStep = 0, _y0 = 0, _rowStep = 0;
    double _rotation[3][3] = {};
    double _translation[3] = {};
    std::uint64_t _values = 0;       // offset of the value table
    std::vector<float> _centres;  // cx, cy per row (cylinders with centres)
    // The placed point of node (row, column) with value v is
    // rowBase(row) + _columnBase[column] + _columnScale[column] * v, three
    // coordinates each: the placement folded into the layout once per column.
    std::vector<double> _columnBase, _columnScale;
    bool _boxKnown = false;
    std::vector<unsigned char> _buffer;
};
