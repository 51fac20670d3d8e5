#include "ZonCloudWriteFile.h"

#include <bit>
#include <cerrno>
#include <cstdarg>
#include <cstring>

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

static_assert(std::endian::native == std::endian::little, "binary output assumes a little-endian machine");

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

void ZonCloudWriteFile::WriteBytes(const void* data, std::size_t size)
{
    if (!_file) {
        errno = EBADF;
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
    }
    if (std::fwrite(data, 1, size, _file) != size) ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}

void ZonCloudWriteFile::WriteUInt32(std::uint32_t value)
{
    if (_reverseBytes) value = __builtin_bswap32(value);
    WriteBytes(&value, sizeof value);
}

void ZonCloudWriteFile::WriteFloat32(float value) { WriteUInt32(std::bit_cast<std::uint32_t>(value)); }

std::uint32_t ZonCloudWriteFile::ReadUInt32()
{
    std::uint32_t value = 0;
    errno = 0;
    if (!_file || std::fread(&value, sizeof value, 1, _file) != 1) {
        if (errno == 0) errno = EIO;
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
    }
    return _reverseBytes ? __builtin_bswap32(value) : value;
}

void ZonCloudWriteFile::Seek(long offset, int whence)
{
    errno = 0;
    if (!_file || std::fseek(_file, offset, whence) != 0) {
        if (errno == 0) errno = EBADF;
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
    }
}
