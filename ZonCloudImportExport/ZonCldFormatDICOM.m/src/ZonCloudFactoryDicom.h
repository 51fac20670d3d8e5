#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of medical image slices and ".dcz" archives of them
// ("CloudFactoryDicom"). Positions are in millimetres, so no unit is asked;
// the reader honours sampling and has no options.
class ZonCloudFactoryDicom : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryDicom();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
