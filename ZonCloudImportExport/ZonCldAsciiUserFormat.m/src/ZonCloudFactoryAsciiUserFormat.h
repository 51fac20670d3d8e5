#pragma once
#include "ZonCldExport.h"
#include "ZonCloudReadFileFactory.h"
#include "ZonHResult.h"

// Factory of the ASCII user format: the reader gets the FDF path and the
// colour choice from the settings store.
class ZON_CLD_API ZonCloudFactoryAsciiUserFormat : public ZonCloudReadFileFactory {
public:
    // The one key of the format's exchange options; its value is the FDF path.
    static constexpr const char* OptionFDFFileName = "FDFFileName";

    ZonCloudFactoryAsciiUserFormat();
    ZonICloudReadFile_var CreateReader(const ZonUnicodeString& fileName) override;

    // Exchange options to reader settings: finds "FDFFileName" among the keys
    // (keys and values side by side, so the lists must be of one length).
    static ZonHResult OptionsToSettings(const ZonListValZonString& keys, const ZonListValZonString& values,
                                 ZonUnicodeString& fdfPath);
    // Reader settings to exchange options: exactly the one key with the path.
    static ZonHResult SettingsToOptions(const ZonUnicodeString& fdfPath, ZonListValZonString& keys,
                                        ZonListValZonString& values);
};
