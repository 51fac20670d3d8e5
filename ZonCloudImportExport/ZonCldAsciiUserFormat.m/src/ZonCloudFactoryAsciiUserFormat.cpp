#include "ZonCloudFactoryAsciiUserFormat.h"

#include "ZonCloudReadAsciiUserFormat.h"

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryAsciiUserFormat, "CloudFactoryAsciiUserFormat")

namespace {
using Kind = ZonCloudSetting::Kind;
const ZonCloudSetting FDFile{.key = "ImportAUFFDF", .option = "fdf", .help = "Format description file"};
const ZonCloudSetting KeepColors{.key = "KeepColors", .option = "no-colors", .kind = Kind::Flag, .fallback = "1",
                                 .help = "Do not keep the points' colours", .given = "0"};
const ZonCloudSetting Settings[] = {FDFile, KeepColors};
}  // namespace

ZonCloudFactoryAsciiUserFormat::ZonCloudFactoryAsciiUserFormat()
    : ZonCloudReadFileFactory(
          {"CloudFactoryAsciiUserFormat", "ASCII User Format", "*.asc_fmt", true, false, true, Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryAsciiUserFormat::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadAsciiUserFormat>(fileName);
    reader->SetKeepColors(KeepColors.ReadBool());
    reader->SetFDFile(ZonUnicodeString(FDFile.Read()));
    return reader;
}

ZonHResult ZonCloudFactoryAsciiUserFormat::OptionsToSettings(const ZonListValZonString& keys,
                                                      const ZonListValZonString& values, ZonUnicodeString& fdfPath)
{
    if (keys.size() != values.size()) return ZON_E_FAIL;
    for (std::size_t i = 0; i < keys.size(); ++i) {
        if (keys[i] == OptionFDFFileName) {
            fdfPath = ZonUnicodeString(values[i]);
            return ZON_S_OK;
        }
    }
    return ZON_E_FAIL;
}

ZonHResult ZonCloudFactoryAsciiUserFormat::SettingsToOptions(const ZonUnicodeString& fdfPath, ZonListValZonString& keys,
                                                      ZonListValZonString& values)
{
    keys.assign(1, OptionFDFFileName);
    values.assign(1, fdfPath.ToUtf8());
    return ZON_S_OK;
}
