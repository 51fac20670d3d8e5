#include "ZonCldScan.h"

// Out of line: anchors the class's type information in the host library.
ZonCldScan::~ZonCldScan() = default;
