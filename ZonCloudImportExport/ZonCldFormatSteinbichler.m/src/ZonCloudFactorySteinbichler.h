#pragma once
#include "ZonCloudReadFileFactory.h"

// Factory of the fringe-projection scanner's subset files
// ("CloudFactorySteinbichler"). The files carry no length unit; the reader
// samples and has no options.
class ZonCloudFactorySteinbichler : public ZonCloudReadFileFactory {
public:
    ZonCloudFactorySteinbichler();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
