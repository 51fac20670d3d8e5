#pragma once
#include "ZonCldExport.h"
#include "ZonUnicodeString.h"

// Scan delimiter lines of text point files.
class ZON_CLD_API ZonICloudReadOptDelimitor {
public:
    virtual ~ZonICloudReadOptDelimitor() = default;
    virtual void SetDelimiters(const ZonUnicodeString& begin, const ZonUnicodeString& end) = 0;
    virtual void GetDelimiters(ZonUnicodeString& begin, ZonUnicodeString& end) = 0;
};
