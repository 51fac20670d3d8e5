#pragma once
#include <vector>

#include "ZonBaseUnknown.h"
#include "ZonCldGrid.h"
#include "ZonHostExport.h"

// The grids of one file, in file order.
class ZON_HOST_API ZonCldSetOfGrids : public ZonBaseUnknown {
public:
    void AddGrid(ZonCldGrid_var grid) { _grids.push_back(std::move(grid)); }
    const std::vector<ZonCldGrid_var>& GetGrids() const { return _grids; }
    std::size_t GetNumberOfGrids() const { return _grids.size(); }
    std::size_t GetNumberOfValidPoints() const;

private:
    std::vector<ZonCldGrid_var> _grids;
};
using ZonCldSetOfGrids_var = std::shared_ptr<ZonCldSetOfGrids>;
