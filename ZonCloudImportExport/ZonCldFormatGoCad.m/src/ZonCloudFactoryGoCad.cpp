#include "ZonCloudFactoryGoCad.h"

#include <memory>

#include "ZonCloudReadGoCad.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Shares the tool's option with the other mesh formats.
const ZonCloudSetting Triangles{.key = "ImportGoCadFacets", .option = "no-triangles", .kind = Kind::Flag,
                                .fallback = "1", .help = "Import the vertices of meshes only", .given = "0"};
const ZonCloudSetting Settings[] = {Triangles};
}  // namespace

ZonCloudFactoryGoCad::ZonCloudFactoryGoCad()
    : ZonCloudReadFileFactory(Description{"CloudFactoryGoCad", "GOCAD", "*.ts", /*withSampling=*/false,
                                          /*withLengthUnit=*/true, /*withOptions=*/true, Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryGoCad::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadGoCad>(fileName);
    reader->SetTriangles(Triangles.ReadBool());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryGoCad, "CloudFactoryGoCad")
