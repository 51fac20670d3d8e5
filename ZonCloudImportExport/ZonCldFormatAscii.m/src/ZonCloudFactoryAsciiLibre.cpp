#include "ZonCloudFactoryAsciiLibre.h"

#include <memory>

#include "ZonCloudReadAsciiLibre.h"

namespace {
using Kind = ZonCloudSetting::Kind;
const ZonCloudSetting Begin{.key = "StartDelimitor", .option = "delimiters", .help = "Begin and end scan delimiters"};
const ZonCloudSetting End{.key = "EndDelimitor", .option = "delimiters", .help = "Begin and end scan delimiters"};
const ZonCloudSetting Direction{.key = "ScanDirection", .option = "direction", .kind = Kind::Integer, .fallback = "0",
                                .help = "Scan direction: 0 unknown, 1 one way, 2 zigzag"};
const ZonCloudSetting Settings[] = {Begin, End, Direction};
}  // namespace

ZonCloudFactoryAsciiLibre::ZonCloudFactoryAsciiLibre()
    : ZonCloudReadFileFactory(Description{"CloudFactoryAsciiLibre", "ASCII FREE", "*.asc;*.libre;*.ascii",
                                          /*withSampling=*/true, /*withLengthUnit=*/true, /*withOptions=*/true,
                                          Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryAsciiLibre::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadAsciiLibre>(fileName);
    const std::string begin = Begin.Read();
    const std::string end = End.Read();
    // Setting delimiters analyses the file, so a reader without them stays untouched until asked.
    if (!begin.empty() || !end.empty()) reader->SetDelimiters(ZonUnicodeString(begin), ZonUnicodeString(end));
    reader->SetScanDirection(Direction.ReadInt());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryAsciiLibre, "CloudFactoryAsciiLibre")
