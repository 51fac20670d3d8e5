#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the fringe-projection sensor's grid files ("CloudFactoryOptonBin").
// The files carry no length unit; the reader samples and has no options.
class ZonCloudFactoryOptonBin : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryOptonBin();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
