#include "ZonCloudGridCursor.h"

#include "ZonCloudReadNLSTool.h"

namespace {
void RequireBegun(bool begun)
{
    if (!begun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetGridNotDone");
}
}  // namespace

bool ZonCloudGridCursor::Next()
{
    RequireBegun(_begun);
    _row = 0;
    _current = _next < _grids;
    if (_current) ++_next;
    return _current;
}

void ZonCloudGridCursor::BeginRows()
{
    RequireBegun(_begun);
    if (!_current) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_NextGridNotDone");
    _row = 0;
}

bool ZonCloudGridCursor::NextRow(std::size_t rows)
{
    RequireBegun(_begun);
    if (!_current || _row >= rows) return false;
    ++_row;
    return true;
}
