#include "ZonError.h"

ZonCloudOperError::~ZonCloudOperError() = default;
