#include "ZonCldCloud.h"

// Out of line: anchors the class's type information in the host library.
ZonCldCloud::~ZonCldCloud() = default;
