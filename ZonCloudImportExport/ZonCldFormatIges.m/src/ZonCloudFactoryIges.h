#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates IGES point readers with the scan direction setting applied.
class ZON_CLD_API ZonCloudFactoryIges : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryIges();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
