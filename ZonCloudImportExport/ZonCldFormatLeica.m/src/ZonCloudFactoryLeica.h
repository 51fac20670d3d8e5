#pragma once
#include "ZonCldExport.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonHResult.h"

// Factory of RGB point files; the reader keeps colours unless the settings
// say "KeepColors" is off.
class ZON_CLD_API ZonCloudFactoryLeica : public ZonCloudReadFileFactory {
public:
    // The exchange option of the format, a flag written with "%d".
    static constexpr const char* OptionKeepColors = "KeepColors";

    ZonCloudFactoryLeica();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;

    // Exchange options to the keep-colours choice: "KeepColors" among the
    // keys (keys and values side by side), its value an integer.
    static ZonHResult OptionsToSettings(const ZonListValZonString& keys, const ZonListValZonString& values, bool& keepColors);
    static ZonHResult SettingsToOptions(bool keepColors, ZonListValZonString& keys, ZonListValZonString& values);
};
