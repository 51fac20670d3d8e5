#include "ZonBaseUnknown.h"

ZonBaseUnknown::~ZonBaseUnknown() = default;
