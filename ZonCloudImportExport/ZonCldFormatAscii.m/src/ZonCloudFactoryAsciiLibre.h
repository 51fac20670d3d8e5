#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the free ASCII point format ("CloudFactoryAsciiLibre"). The
// files carry no length unit, so the user is asked for one; the reader
// honours sampling and has options (scan delimiters, scan direction), which
// it gets from the settings store when it is created.
class ZonCloudFactoryAsciiLibre : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryAsciiLibre();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
