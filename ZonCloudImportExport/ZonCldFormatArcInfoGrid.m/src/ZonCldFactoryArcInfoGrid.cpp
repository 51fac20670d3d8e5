#include "ZonCldFactoryArcInfoGrid.h"

#include <memory>

#include "ZonCldReadArcInfoGrid.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Shares the mesh formats' option.
const ZonCloudSetting Triangles{.key = "ImportArcInfoGridFacets", .option = "no-triangles", .kind = Kind::Flag,
                                .fallback = "1", .help = "Import the vertices of meshes only", .given = "0"};
const ZonCloudSetting Settings[] = {Triangles};
}  // namespace

ZonCldFactoryArcInfoGrid::ZonCldFactoryArcInfoGrid()
    : ZonCloudReadFileFactory(Description{"CloudFactoryArcInfoGrid", "ArcInfoGrid", "*.asc_grid;*.asc",
                                          /*withSampling=*/false, /*withLengthUnit=*/false, /*withOptions=*/true,
                                          Settings})
{
}

ZonICloudReadFile_var ZonCldFactoryArcInfoGrid::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCldReadArcInfoGrid>(fileName);
    reader->SetTriangles(Triangles.ReadBool());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCldFactoryArcInfoGrid, "CloudFactoryArcInfoGrid")
