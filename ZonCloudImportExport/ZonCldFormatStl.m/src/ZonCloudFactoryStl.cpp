#include "ZonCloudFactoryStl.h"

#include <memory>

#include "ZonCldSettings.h"
#include "ZonCloudReadStl.h"

ZonCloudFactoryStl::ZonCloudFactoryStl()
    : ZonCloudReadFileFactory(Description{"CloudFactoryStl", "STL", "*.stl", false, false, true})
{
}

ZonICloudReadFile_var ZonCloudFactoryStl::CreateReader(const ZonUnicodeString& fileName)
{
    const ZonCldSettings& settings = ZonCldSettings::Instance();
    auto reader = std::make_shared<ZonCloudReadStl>(fileName);
    reader->SetBinaryFrom(settings.GetInt("BinaryFrom", ZonICloudReadOptBinMachine::Unknown));
    reader->SetTriangles(settings.GetImportSTLFacets());
    reader->SetFreeEdges(settings.GetBool("CreateFreeEdges", false));
    return reader;
}

ZON_REGISTER_CLOUD_FACTORY(ZonCloudFactoryStl, "CloudFactoryStl")
