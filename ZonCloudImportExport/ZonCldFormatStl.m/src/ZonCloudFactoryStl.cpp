#include "ZonCloudFactoryStl.h"

#include <memory>

#include "ZonCloudReadStl.h"

namespace {
using Kind = ZonCloudSetting::Kind;
// Stored as the reader's ZonICloudReadOptBinMachine values, in that order.
const ZonCloudSetting ByteOrder{.key = "BinaryFrom", .option = "byte-order", .kind = Kind::Position, .fallback = "0",
                                .help = "Byte order of binary files", .choices = "unknown|current|differ"};
const ZonCloudSetting Triangles{.key = "ImportSTLFacets", .option = "no-triangles", .kind = Kind::Flag, .fallback = "1",
                                .help = "Import the vertices of meshes only", .given = "0"};
// Not offered by the tool.
const ZonCloudSetting FreeEdges{.key = "CreateFreeEdges", .option = nullptr, .kind = Kind::Flag, .fallback = "0"};
const ZonCloudSetting Settings[] = {ByteOrder, Triangles, FreeEdges};
}  // namespace

ZonCloudFactoryStl::ZonCloudFactoryStl()
    : ZonCloudReadFileFactory(Description{"CloudFactoryStl", "STL", "*.stl", false, false, true, Settings})
{
}

ZonICloudReadFile_var ZonCloudFactoryStl::CreateReader(const ZonUnicodeString& fileName)
{
    auto reader = std::make_shared<ZonCloudReadStl>(fileName);
    reader->SetBinaryFrom(ByteOrder.ReadInt());
    reader->SetTriangles(Triangles.ReadBool());
    reader->SetFreeEdges(FreeEdges.ReadBool());
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryStl, "CloudFactoryStl")
