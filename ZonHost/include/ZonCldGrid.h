#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldPointArray.h"
#include "ZonHostExport.h"

// A regular grid of points, row by row; each point has a validity byte
// (1 a measured point, 0 a hole), so rows keep their length.
class ZON_HOST_API ZonCldGrid : public ZonBaseUnknown {
public:
    struct Row {
        ZonCldPointArray points;
        std::vector<unsigned char> valid;
    };
    // Adds a row; a null validity means every point is valid.
    Row& AddRow(const unsigned char* valid, std::size_t count);
    // Adds a row whose validity bytes are taken as they are (any non-zero
    // byte a valid point).
    Row& AddRow(std::vector<unsigned char>&& valid);
    const std::vector<Row>& GetRows() const { return _rows; }
    std::size_t GetNumberOfRows() const { return _rows.size(); }
    // Points with their validity set (counted as rows are added: the
    // validity of a row does not change afterwards).
    std::size_t GetNumberOfValidPoints() const { return _validPoints; }

private:
    std::vector<Row> _rows;
    std::size_t _validPoints = 0;
};
using ZonCldGrid_var = std::shared_ptr<ZonCldGrid>;
