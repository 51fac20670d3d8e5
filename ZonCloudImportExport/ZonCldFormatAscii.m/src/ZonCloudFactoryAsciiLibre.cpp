#include "ZonCloudFactoryAsciiLibre.h"

#include <memory>

#include "ZonCldSettings.h"
#include "ZonCloudReadAsciiLibre.h"

ZonCloudFactoryAsciiLibre::ZonCloudFactoryAsciiLibre()
    : ZonCloudReadFileFactory(Description{"CloudFactoryAsciiLibre", "ASCII FREE", "*.asc;*.libre;*.ascii",
                                          /*withSampling=*/true, /*withLengthUnit=*/true, /*withOptions=*/true})
{
}

ZonICloudReadFile_var ZonCloudFactoryAsciiLibre::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadAsciiLibre>(fileName);
    const ZonCldSettings& settings = ZonCldSettings::Instance();
    const std::string begin = settings.GetString("StartDelimitor", "");
    const std::string end = settings.GetString("EndDelimitor", "");
    // Setting delimiters analyses the file, so a reader without them stays untouched until asked.
    if (!begin.empty() || !end.empty()) reader->SetDelimiters(ZonUnicodeString(begin), ZonUnicodeString(end));
    reader->SetScanDirection(settings.GetInt("ScanDirection", 0));
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryAsciiLibre, "CloudFactoryAsciiLibre")
