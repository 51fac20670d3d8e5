#include "ZonCloudFactoryLeica.h"

#include <charconv>
#include <string>

#include "ZonCloudReadLeica.h"

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryLeica, "CloudFactoryLeica")

namespace {
const ZonCloudSetting KeepColors{.key = ZonCloudFactoryLeica::OptionKeepColors, .option = "no-colors",
                                 .kind = ZonCloudSetting::Kind::Flag, .fallback = "1",
                                 .help = "Do not keep the points' colours", .given = "0"};
const ZonCloudSetting Settings[] = {KeepColors};
}  // namespace

ZonCloudFactoryLeica::ZonCloudFactoryLeica()
    : ZonCloudReadFileFactory({"CloudFactoryLeica", "Ascii RGB", "*.asc_rgb;*.xyz_rgb", true, false, true, Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryLeica::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadLeica>(fileName);
    reader->SetKeepColors(KeepColors.ReadBool());
    return reader;
}

ZonHResult ZonCloudFactoryLeica::OptionsToSettings(const ZonListValZonString& keys, const ZonListValZonString& values,
                                            bool& keepColors)
{
    if (keys.size() != values.size()) return ZON_E_FAIL;
    for (std::size_t i = 0; i < keys.size(); ++i) {
        if (keys[i] != OptionKeepColors) continue;
        const std::string& text = values[i];
        int flag = 0;
        const auto [end, ec] = std::from_chars(text.data(), text.data() + text.size(), flag);
        if (ec != std::errc() || end == text.data()) return ZON_E_FAIL;
        keepColors = flag != 0;
        return ZON_S_OK;
    }
    return ZON_E_FAIL;
}

ZonHResult ZonCloudFactoryLeica::SettingsToOptions(bool keepColors, ZonListValZonString& keys, ZonListValZonString& values)
{
    keys.assign(1, OptionKeepColors);
    values.assign(1, std::to_string(keepColors ? 1 : 0));
    return ZON_S_OK;
}
