#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the laser line scanner's profile files ("CloudFactoryHyscanBin").
// The files carry their own length unit; the reader samples and has no options.
class ZonCloudFactoryHyscanBin : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryHyscanBin();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
