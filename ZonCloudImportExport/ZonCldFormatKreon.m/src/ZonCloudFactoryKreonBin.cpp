#include "ZonCloudFactoryKreonBin.h"

#include <memory>

#include "ZonCloudReadKreonBin.h"

ZonCloudFactoryKreonBin::ZonCloudFactoryKreonBin()
    : ZonCloudReadFileFactory(Description{"CloudFactoryKreonBin", "KREON", "*.grk", /*withSampling=*/true,
                                          /*withLengthUnit=*/true, /*withOptions=*/false, {}})
{
}

ZonICloudReadFile_var ZonCloudFactoryKreonBin::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadKreonBin>(fileName);
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryKreonBin, "CloudFactoryKreonBin")
