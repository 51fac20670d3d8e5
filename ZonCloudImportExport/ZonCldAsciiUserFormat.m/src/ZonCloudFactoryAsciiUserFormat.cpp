#include "ZonCloudFactoryAsciiUserFormat.h"

#include "ZonCldSettings.h"
#include "ZonCloudReadAsciiUserFormat.h"

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryAsciiUserFormat, "CloudFactoryAsciiUserFormat")

ZonCloudFactoryAsciiUserFormat::ZonCloudFactoryAsciiUserFormat()
    : ZonCloudReadFileFactory({"CloudFactoryAsciiUserFormat", "ASCII User Format", "*.asc_fmt", true, false, true})
{
}

ZonICloudReadFile_var ZonCloudFactoryAsciiUserFormat::CreateReader(const ZonUnicodeString& fileName)
{
    const ZonCldSettings& settings = ZonCldSettings::Instance();
    auto reader = std::make_shared<ZonCloudReadAsciiUserFormat>(fileName);
    reader->SetKeepColors(settings.GetBool("KeepColors", true));
    reader->SetFDFile(ZonUnicodeString(settings.GetImportAUFFDF()));
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
