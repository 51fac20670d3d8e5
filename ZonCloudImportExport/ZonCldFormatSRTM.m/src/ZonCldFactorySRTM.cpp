#include "ZonCldFactorySRTM.h"

#include <memory>

#include "ZonCldReadSRTM.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Shares the mesh formats' option.
const ZonCloudSetting Triangles{.key = "ImportSRTMFacets", .option = "no-triangles", .kind = Kind::Flag,
                                .fallback = "1", .help = "Import the vertices of meshes only", .given = "0"};
const ZonCloudSetting Settings[] = {Triangles};
}  // namespace

ZonCldFactorySRTM::ZonCldFactorySRTM()
    : ZonCloudReadFileFactory(Description{"CloudFactorySRTM", "Srtm", "*.hgt", /*withSampling=*/false,
                                          /*withLengthUnit=*/true, /*withOptions=*/true, Settings})
{
}

ZonICloudReadFile_var ZonCldFactorySRTM::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCldReadSRTM>(fileName);
    reader->SetTriangles(Triangles.ReadBool());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCldFactorySRTM, "CloudFactorySRTM")
