#include "ZonCloudWriteFile.h"

#include <cstdarg>

#include "ZonCloudReadNLSTool.h"
#include "ZonICloudWritePointFile.h"
#include "ZonICloudWritePolygonFile.h"
#include "ZonICloudWriteScanFile.h"

// Out-of-line destructors anchor the writer interfaces' type information in the module.
ZonICloudWriteFile::~ZonICloudWriteFile() = default;
ZonICloudWritePointFile::~ZonICloudWritePointFile() = default;
ZonICloudWriteScanFile::~ZonICloudWriteScanFile() = default;
ZonICloudWritePolygonFile::~ZonICloudWritePolygonFile() = default;

ZonCloudWriteFile::ZonCloudWriteFile(const ZonUnicodeString& fileName) : _fileName(fileName) {}

void ZonCloudWriteFile::GetFileName(ZonUnicodeString& name) { name = _fileName; }

ZonHResult ZonCloudWriteFile::BeginMultiWrite()
{
    if (!TryOpenStream("w")) return ZON_E_FAIL;
    _multiWrite = true;
    return ZON_S_OK;
}

ZonHResult ZonCloudWriteFile::EndMultiWrite()
{
    _multiWrite = false;
    CloseStream();
    return ZON_S_OK;
}

bool ZonCloudWriteFile::TryOpenStream(const char* mode) { return _file.Open(_fileName, mode); }

void ZonCloudWriteFile::OpenStream(const char* mode)
{
    if (!TryOpenStream(mode)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}

void ZonCloudWriteFile::Print(const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    _file.PrintV(format, args);
    va_end(args);
}
