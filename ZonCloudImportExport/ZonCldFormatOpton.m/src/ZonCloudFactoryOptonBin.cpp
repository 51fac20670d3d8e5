#include "ZonCloudFactoryOptonBin.h"

#include <memory>

#include "ZonCloudReadOptonBin.h"

ZonCloudFactoryOptonBin::ZonCloudFactoryOptonBin()
    : ZonCloudReadFileFactory(Description{"CloudFactoryOptonBin", "OPTON", "*.xyz", /*withSampling=*/true,
                                          /*withLengthUnit=*/true, /*withOptions=*/false, {}})
{
}

ZonICloudReadFile_var ZonCloudFactoryOptonBin::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadOptonBin>(fileName);
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryOptonBin, "CloudFactoryOptonBin")
