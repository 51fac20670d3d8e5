#include "ZonCldFactoryDEM.h"

#include <memory>

#include "ZonCldReadDEM.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Shares the mesh formats' option. The interactive import has no entry of
// its own for this format: the preference's name serves as the key.
const ZonCloudSetting Triangles{.key = "OptionTrianglesDEM", .option = "no-triangles", .kind = Kind::Flag,
                                .fallback = "1", .help = "Import the vertices of meshes only", .given = "0"};
const ZonCloudSetting Settings[] = {Triangles};
}  // namespace

ZonCldFactoryDEM::ZonCldFactoryDEM()
    : ZonCloudReadFileFactory(Description{"CloudFactoryDEM", "DEM", "*.dem", /*withSampling=*/false,
                                          /*withLengthUnit=*/false, /*withOptions=*/true, Settings})
{
}

ZonICloudReadFile_var ZonCldFactoryDEM::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCldReadDEM>(fileName);
    reader->SetTriangles(Triangles.ReadBool());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCldFactoryDEM, "CloudFactoryDEM")
