#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates readers of fixed-column elevation models ("*.dem") with the
// triangles setting applied (OptionTrianglesDEM).
class ZON_CLD_API ZonCldFactoryDEM : public ZonCloudReadFileFactory {
public:
    ZonCldFactoryDEM();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
