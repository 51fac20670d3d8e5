#include "ZonCloudFactoryDicom.h"

#include <memory>

#include "ZonCloudReadDicom.h"

ZonCloudFactoryDicom::ZonCloudFactoryDicom()
    : ZonCloudReadFileFactory(Description{"CloudFactoryDicom", "Dicom", "*.dcm;*.dic;*.dc3;*.dcz",
                                          /*withSampling=*/true, /*withLengthUnit=*/false, /*withOptions=*/false})
{
}

ZonICloudReadFile_var ZonCloudFactoryDicom::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadDicom>(fileName);
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryDicom, "CloudFactoryDicom")
