#pragma once
#include <cstdint>

#include "ZonCloudReadGridMesh.h"

// Reads a text raster of heights (a header of keyword lines, then ncols x
// nrows values) as one mesh. Header values are whole numbers (decimals are
// cut). The rows run along x from xllcorner and the columns along y from
// yllcorner, in file order; cells holding the no-data value stay points at
// that height. Besides the classic six lines, a header may omit
// NODATA_value and may give "dx" and "dy" for cells that are not square: dy
// steps the rows (along x), dx the columns (along y).
class ZON_CLD_API ZonCldReadArcInfoGrid : public ZonCloudReadGridMesh {
public:
    explicit ZonCldReadArcInfoGrid(const ZonUnicodeString& fileName);

    struct Header {
        std::int32_t columns = 0, rows = 0;
        std::int32_t xCorner = 0, yCorner = 0;
        std::int32_t cellSize = 0, noData = 0;
        std::int32_t dx = 0, dy = 0;
        bool hasDx = false, hasDy = false;
        // Step between rows (along x) and between columns (along y).
        std::int32_t RowStep() const { return hasDy ? dy : cellSize; }
        std::int32_t ColumnStep() const { return hasDx ? dx : cellSize; }
    };
    const Header& GetHeader();

protected:
    void AnalyseFile() override;

private:
    std::uint64_t ReadHeader();
    void ReadCells(std::uint64_t offset);

    Header _header;
};
