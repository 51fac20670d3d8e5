#include "ZonCloudFactoryIges.h"

#include <memory>

#include "ZonCloudReadIges.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Shares the tool's option with the other formats that store a scan direction.
const ZonCloudSetting Direction{.key = "OptionScanDirectionIges", .option = "direction", .kind = Kind::Integer,
                                .fallback = "0", .help = "Scan direction: 0 unknown, 1 one way, 2 zigzag"};
const ZonCloudSetting Settings[] = {Direction};
}  // namespace

ZonCloudFactoryIges::ZonCloudFactoryIges()
    : ZonCloudReadFileFactory(Description{"CloudFactoryIges", "IGES", "*.iges;*.igs", /*withSampling=*/true,
                                          /*withLengthUnit=*/true, /*withOptions=*/true, Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryIges::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadIges>(fileName);
    reader->SetScanDirection(Direction.ReadInt());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryIges, "CloudFactoryIges")
