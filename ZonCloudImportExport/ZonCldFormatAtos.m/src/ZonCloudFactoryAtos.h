#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the fringe-projection scanner's measurement files
// ("CloudFactoryAtos"). The files carry no length unit; the reader samples
// its grid rows and takes the minimum point quality from the settings store.
class ZonCloudFactoryAtos : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryAtos();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
