#include "ZonCloudOutputFile.h"

#include <cerrno>
#include <utility>

#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"

ZonCloudOutputFile::~ZonCloudOutputFile()
{
    if (!_stream) return;
    const bool flushed = std::fflush(_stream) == 0 && !std::ferror(_stream);
    if (std::fclose(_stream) != 0 || !flushed) std::remove(_name.c_str());
    _stream = nullptr;
}

bool ZonCloudOutputFile::Open(const ZonUnicodeString& name, const char* mode)
{
    Close();
    _failed = false;
    _name = name;
    if (name.IsNull()) {
        errno = ENOENT;
        return false;
    }
    _stream = std::fopen(name.c_str(), mode);
    return _stream != nullptr;
}

void ZonCloudOutputFile::Fail()
{
    // The system's reason first: closing and removing may change errno.
    const int reason = errno != 0 ? errno : EIO;
    if (_stream) std::fclose(_stream);
    _stream = nullptr;
    std::remove(_name.c_str());
    _failed = true;
    errno = reason;
    ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}

void ZonCloudOutputFile::Print(const char* format, ...)
{
    std::va_list args;
    va_start(args, format);
    PrintV(format, args);
    va_end(args);
}

void ZonCloudOutputFile::PrintV(const char* format, std::va_list args)
{
    if (!_stream) {
        errno = EBADF;
        Fail();
    }
    errno = 0;
    if (ZonPrintFileV(_stream, format, args) < 0) Fail();
}

void ZonCloudOutputFile::Write(const void* data, std::size_t size)
{
    errno = _stream ? 0 : EBADF;
    if (!_stream || std::fwrite(data, 1, size, _stream) != size) Fail();
}

void ZonCloudOutputFile::Read(void* data, std::size_t size)
{
    errno = _stream ? 0 : EBADF;
    if (!_stream || std::fread(data, 1, size, _stream) != size) Fail();
}

void ZonCloudOutputFile::Seek(long offset, int whence)
{
    errno = _stream ? 0 : EBADF;
    if (!_stream || std::fseek(_stream, offset, whence) != 0) Fail();
}

long ZonCloudOutputFile::Tell()
{
    errno = _stream ? 0 : EBADF;
    const long offset = _stream ? std::ftell(_stream) : -1;
    if (offset < 0) Fail();
    return offset;
}

void ZonCloudOutputFile::Flush()
{
    errno = _stream ? 0 : EBADF;
    if (!_stream || std::fflush(_stream) != 0 || std::ferror(_stream)) Fail();
}

void ZonCloudOutputFile::Close()
{
    if (!_stream) return;
    // A write refused earlier leaves the error flag even when this flush succeeds.
    Flush();
    // The stream is gone whatever fclose answers; a failure still removes the file.
    if (std::fclose(std::exchange(_stream, nullptr)) != 0) Fail();
}
