#pragma once
#include "ZonCloudReadFileFactory.h"

// Creates SRTM tile readers ("*.hgt") with the triangles setting applied
// (ImportSRTMFacets). The files carry their unit, metres.
class ZON_CLD_API ZonCldFactorySRTM : public ZonCloudReadFileFactory {
public:
    ZonCldFactorySRTM();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;
};
