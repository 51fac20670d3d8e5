// Out-of-line destructors anchor the interfaces' type information in the module.
#include "ZonICloudReadFile.h"
#include "ZonICloudReadFileFactory.h"
#include "ZonICloudReadGridFile.h"
#include "ZonICloudReadOptDelimitor.h"
#include "ZonICloudReadOptDirection.h"
#include "ZonICloudReadOptTriangles.h"
#include "ZonICloudReadPolygonFile.h"
#include "ZonICloudReadScanFile.h"

ZonICloudReadFile::~ZonICloudReadFile() = default;
ZonICloudReadScanFile::~ZonICloudReadScanFile() = default;
ZonICloudReadGridFile::~ZonICloudReadGridFile() = default;
ZonICloudReadPolygonFile::~ZonICloudReadPolygonFile() = default;
ZonICloudReadFileFactory::~ZonICloudReadFileFactory() = default;
ZonICloudReadOptDelimitor::~ZonICloudReadOptDelimitor() = default;
ZonICloudReadOptDirection::~ZonICloudReadOptDirection() = default;
ZonICloudReadOptTriangles::~ZonICloudReadOptTriangles() = default;

ZonOptionFrame* ZonICloudReadFileFactory::GetOptions(ZonDialog*, ZonNotification*& notification)
{
    notification = nullptr;
    return nullptr;
}
