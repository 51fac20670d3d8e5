#pragma once
#include <cstdint>
#include <vector>

#include "ZonCloudReadRowTable.h"

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
class ZonCloudReadOptonBin : public ZonCloudReadRowTable {
public:
    explicit ZonCloudReadOptonBin(const ZonUnicodeString& fileName);

    // Where the point records start.
    std::uint64_t GetDataOffset();

protected:
    void AnalyseFile() override;
    // Fills `target` with row `row` from its records; answers the measured
    // records of the whole row, sampled or not.
    std::uint64_t FillRow(std::uint64_t row, const unsigned char* bytes, ZonCloudGridRow& target) const override;
    // The count of measured records replaces the header's point count.
    void WholeFileRead(std::uint64_t measured, bool asCloud) override;

private:
    std::uint64_t _data = 0;
};
