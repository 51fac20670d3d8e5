#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates GoCad surface readers with the triangles flag (ImportGoCadFacets) applied.
class ZON_CLD_API ZonCloudFactoryGoCad : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryGoCad();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
