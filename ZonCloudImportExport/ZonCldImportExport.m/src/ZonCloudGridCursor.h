#pragma once
#include <cstddef>

#include "ZonCldExport.h"

// Where a grid reader stands in the grid protocol: BeginGetGrid, one NextGrid
// per grid, BeginGetGridPoints, then one row per GetGridPoints until the
// grid's rows are done. The checks of the calling order live here, once for
// every grid format.
class ZON_CLD_API ZonCloudGridCursor {
public:
    // BeginGetGrid: the walk starts again before the first of `grids`.
    void Begin(std::size_t grids)
    {
        _begun = true;
        _grids = grids;
        _next = 0;
        _current = false;
        _row = 0;
    }
    void Reset() { *this = ZonCloudGridCursor(); }
    // Makes grid `index` (from 0) of `grids` the current one, as if NextGrid
    // had just moved to it.
    void Select(std::size_t index, std::size_t grids)
    {
        _begun = true;
        _grids = grids;
        _next = index + 1;
        _current = true;
        _row = 0;
    }
    // NextGrid: moves to the next grid, whose rows start again; false past the
    // last. Raises "ERR_BeginGetGridNotDone" before Begin.
    bool Next();
    // BeginGetGridPoints: the current grid's rows start again. Raises
    // "ERR_BeginGetGridNotDone" before Begin, "ERR_NextGridNotDone" without a
    // current grid.
    void BeginRows();
    // GetGridPoints: whether the current grid of `rows` rows has a row left
    // to give, and moves past it. Raises "ERR_BeginGetGridNotDone" before Begin.
    bool NextRow(std::size_t rows);

    bool HasCurrent() const { return _current; }
    // Index from 0 of the current grid, and of the row the last NextRow gave.
    std::size_t Current() const { return _next == 0 ? 0 : _next - 1; }
    std::size_t Row() const { return _row == 0 ? 0 : _row - 1; }

private:
    bool _begun = false;
    bool _current = false;
    std::size_t _grids = 0;
    std::size_t _next = 0;
    std::size_t _row = 0;
};
