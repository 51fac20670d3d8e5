#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the laser scanner's range grids ("CloudFactoryKreonBin"). The
// files carry no length unit; the reader samples and has no options.
class ZonCloudFactoryKreonBin : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryKreonBin();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
