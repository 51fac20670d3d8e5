#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudGridCursor.h"
#include "ZonCloudGridRow.h"
#include "ZonCloudGridRows.h"
#include "ZonCloudReadFile.h"
#include "ZonTieCloudReadFile.h"

// Grid files of a fringe-projection sensor: a sequence of 16-byte records of
// four floats. Seven header records (the first all zero, then where the data
// start, two corners of the box, and the point, row and column counts) are
// followed by rows x columns point records, x, y, z and a fourth value that
// is -1 where the node was not measured.
//
// The file is one grid, delivered row by row with a hole for each node not
// measured, or its measured nodes as a cloud. The analysis reads the header
// only; the box is the one of its two corners. The count of measured nodes
// replaces the header's point count once the whole file has been read.
class ZonCloudReadOptonBin : public ZonCloudReadFile, public ZonTieCloudReadGridFile<ZonCloudReadOptonBin> {
public:
    explicit ZonCloudReadOptonBin(const ZonUnicodeString& fileName);

    // ZonICloudReadFile: the measured nodes, sampled along each row as the rows are.
    void SetSamplingPercent(float percent) override;
    const float* GetPoints(unsigned& count) override;

    // ZonICloudReadGridFile: one grid of R rows.
    void BeginGetGrid() override;
    bool NextGrid() override;
    void BeginGetGridPoints() override;
    const float* GetGridPoints(unsigned& count, const unsigned char*& valid) override;
    using ZonCloudReadFile::GetGridPointsInBox;
    using ZonCloudReadFile::GetGridPointsInBoxDouble;

    unsigned GetNumberOfRows();
    unsigned GetNumberOfColumns();
    // Where the point records start.
    std::uint64_t GetDataOffset();

protected:
    void AnalyseFile() override;
    void ListOwnedArrays(ZonCloudOwnedArrays& arrays) override;

private:
    // Fills `target` with row `row` (from 0) from its records `bytes`; returns
    // the measured records of the whole row, sampled or not. Changes nothing
    // else, so rows may be filled side by side.
    std::uint64_t FillRow(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) const;
    ZonCloudGridRows::Table RecordTable() const;
    void RequireGrid();

    std::uint64_t _rows = 0, _columns = 0;
    std::uint64_t _data = 0;

    ZonCloudGridCursor _cursor;
    ZonCloudGridRows _gridRows;
    const ZonCloudGridRows::Fill _fill;  // FillRow
    std::uint64_t _measuredInWalk = 0;  // measured records of the rows given in this grid walk
    std::vector<float> _cloud;
    bool _cloudRead = false;
};
