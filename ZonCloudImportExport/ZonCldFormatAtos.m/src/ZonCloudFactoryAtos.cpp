#include "ZonCloudFactoryAtos.h"

#include <memory>

#include "ZonCloudReadAtos.h"

namespace {
using Kind = ZonCloudSetting::Kind;
const ZonCloudSetting MinQuality{.key = "MinPointQuality", .option = "min-quality", .kind = Kind::Number,
                                 .fallback = "0", .help = "Minimum point quality: points of this quality or less are holes"};
const ZonCloudSetting Settings[] = {MinQuality};
}  // namespace

ZonCloudFactoryAtos::ZonCloudFactoryAtos()
    : ZonCloudReadFileFactory(Description{"CloudFactoryAtos", "ATOS", "*.surf;*.cloud;*.atos_ascii",
                                          /*withSampling=*/true, /*withLengthUnit=*/true, /*withOptions=*/true,
                                          Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryAtos::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadAtos>(fileName);
    reader->SetMinPointQuality(static_cast<float>(MinQuality.ReadDouble()));
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryAtos, "CloudFactoryAtos")
