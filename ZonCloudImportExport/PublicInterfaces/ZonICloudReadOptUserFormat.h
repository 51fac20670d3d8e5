#pragma once
#include "ZonCldExport.h"
#include "ZonUnicodeString.h"

// The format description file (".fdf") that names the columns of an ASCII
// user format file.
class ZON_CLD_API ZonICloudReadOptUserFormat {
public:
    virtual ~ZonICloudReadOptUserFormat() = default;
    virtual void SetFDFile(const ZonUnicodeString& path) = 0;
    virtual void GetFDFile(ZonUnicodeString& path) = 0;
};
