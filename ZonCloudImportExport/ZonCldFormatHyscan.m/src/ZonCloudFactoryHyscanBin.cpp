#include "ZonCloudFactoryHyscanBin.h"

#include <memory>

#include "ZonCloudReadHyscanBin.h"

ZonCloudFactoryHyscanBin::ZonCloudFactoryHyscanBin()
    : ZonCloudReadFileFactory(Description{"CloudFactoryHyscanBin", "HYSCAN", "*.hym", /*withSampling=*/true,
                                          /*withLengthUnit=*/false, /*withOptions=*/false, {}})
{
}

ZonICloudReadFile_var ZonCloudFactoryHyscanBin::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadHyscanBin>(fileName);
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryHyscanBin, "CloudFactoryHyscanBin")
