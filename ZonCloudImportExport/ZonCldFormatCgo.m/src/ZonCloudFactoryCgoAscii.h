#pragma once
#include "ZonCldExport.h"
#include "ZonCloudReadFileFactory.h"

// Factory of Cgo ASCII point files; the format has no options.
class ZON_CLD_API ZonCloudFactoryCgoAscii : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryCgoAscii();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
