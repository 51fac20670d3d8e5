#include "ZonCloudFactoryCgoAscii.h"

#include "ZonCloudReadCgoAscii.h"

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryCgoAscii, "CloudFactoryCgoAscii")

// The format's name is the catalog's display name.
ZonCloudFactoryCgoAscii::ZonCloudFactoryCgoAscii()
    : ZonCloudReadFileFactory({"CloudFactoryCgoAscii", nullptr, "*.cgo;*.cgo_ascii", true, false, false})
{
}

ZonICloudReadFile_var ZonCloudFactoryCgoAscii::CreateReader(const ZonUnicodeString& fileName)
{
    return std::make_shared<ZonCloudReadCgoAscii>(fileName);
}
