#include "ZonCloudPolygonCursor.h"

#include "ZonCloudReadNLSTool.h"

bool ZonCloudPolygonCursor::HasNext() const
{
    if (!_begun) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Usage, "ERR_BeginGetPolygonNotDone");
    return _next < _polygons;
}
