#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates STL readers with the format's settings applied: the byte order of
// binary files ("BinaryFrom"), the triangles flag (ImportSTLFacets) and the
// free-edges flag ("CreateFreeEdges").
class ZON_CLD_API ZonCloudFactoryStl : public ZonCloudReadFileFactory {
public:
    ZonCloudFactoryStl();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
