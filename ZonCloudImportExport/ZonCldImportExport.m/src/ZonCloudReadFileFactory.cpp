#include "ZonCloudReadFileFactory.h"

#include "ZonCloudReadNLSTool.h"

void ZonCloudReadFileFactory::GetFormatName(ZonUnicodeString& name)
{
    name = _description.formatName ? ZonUnicodeString(_description.formatName)
                                   : ZonCloudReadNLSTool::NameOfFormat(_description.registryName);
}
