#include "ZonCloudWriteFile.h"

#include <cstdarg>

#include "ZonCloudPrintFormat.h"
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

ZonCloudWriteFile::~ZonCloudWriteFile() { CloseStream(); }

void ZonCloudWriteFile::GetFileName(ZonUnicodeString& name) { name = _fileName; }

ZonHResult ZonCloudWriteFile::BeginMultiWrite()
{
    if (!TryOpenStream("w")) return ZON_E_FAIL;
    _multiWrite = true;
    return ZON_S_OK;
}

ZonHResult ZonCloudWriteFile::EndMultiWrite()
{
    CloseStream();
    _multiWrite = false;
    return ZON_S_OK;
}

bool ZonCloudWriteFile::TryOpenStream(const char* mode)
{
    CloseStream();
    _file = std::fopen(_fileName.c_str(), mode);
    return _file != nullptr;
}

void ZonCloudWriteFile::OpenStream(const char* mode)
{
    if (!TryOpenStream(mode)) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}

void ZonCloudWriteFile::CloseStream()
{
    if (!_file) return;
    std::fclose(_file);
    _file = nullptr;
}

void ZonCloudWriteFile::Print(const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    ZonPrintFileV(_file, format, args);
    va_end(args);
}
