#include "ZonCloudFactorySteinbichler.h"

#include <memory>

#include "ZonCloudReadSteinbichler.h"

ZonCloudFactorySteinbichler::ZonCloudFactorySteinbichler()
    : ZonCloudReadFileFactory(Description{"CloudFactorySteinbichler", "STEINBICHLER", "*.ac", /*withSampling=*/true,
                                          /*withLengthUnit=*/true, /*withOptions=*/false, {}})
{
}

ZonICloudReadFile_var ZonCloudFactorySteinbichler::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadSteinbichler>(fileName);
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactorySteinbichler, "CloudFactorySteinbichler")
