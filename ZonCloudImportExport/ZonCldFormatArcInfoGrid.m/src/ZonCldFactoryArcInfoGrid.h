#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates readers of text height rasters ("*.asc_grid;*.asc") with the
// triangles setting applied (ImportArcInfoGridFacets).
class ZON_CLD_API ZonCldFactoryArcInfoGrid : public ZonCloudReadFileFactory {
public:
    ZonCldFactoryArcInfoGrid();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
