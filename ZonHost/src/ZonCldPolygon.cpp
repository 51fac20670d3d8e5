#include "ZonCldPolygon.h"

// Out of line: anchors the class's type information in the host library.
ZonCldPolygon::~ZonCldPolygon() = default;
