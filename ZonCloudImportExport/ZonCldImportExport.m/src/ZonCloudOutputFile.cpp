#include "ZonCloudOutputFile.h"

#include <cerrno>
#include <utility>

#include "ZonCloudPrintFormat.h"
#include "ZonCloudReadNLSTool.h"

namespace {
[[noreturn]] void RaiseSystemError(int reason)
{
    errno = reason != 0 ? reason : EIO;
    ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Data, nullptr);
}
}  // namespace

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

// Called only while the file is being written (its stream open, or being
// closed): what is on disk is unfinished. A call with no stream open raises
// EBADF instead and leaves alone a file that was closed complete.
void ZonCloudOutputFile::Fail()
{
    // The system's reason first: closing and removing may change errno.
    const int reason = errno;
    if (_stream) std::fclose(std::exchange(_stream, nullptr));
    std::remove(_name.c_str());
    _failed = true;
    RaiseSystemError(reason);
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
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    if (ZonPrintFileV(_stream, format, args) < 0) Fail();
}

void ZonCloudOutputFile::Write(const void* data, std::size_t size)
{
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    if (std::fwrite(data, 1, size, _stream) != size) Fail();
}

void ZonCloudOutputFile::Read(void* data, std::size_t size)
{
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    if (std::fread(data, 1, size, _stream) != size) Fail();
}

void ZonCloudOutputFile::Seek(long offset, int whence)
{
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    if (std::fseek(_stream, offset, whence) != 0) Fail();
}

long ZonCloudOutputFile::Tell()
{
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    const long offset = std::ftell(_stream);
    if (offset < 0) Fail();
    return offset;
}

void ZonCloudOutputFile::Flush()
{
    if (!_stream) RaiseSystemError(EBADF);
    errno = 0;
    if (std::fflush(_stream) != 0 || std::ferror(_stream)) Fail();
}

void ZonCloudOutputFile::Close()
{
    if (!_stream) return;
    // A write refused earlier leaves the error flag even when this flush succeeds.
    Flush();
    // The stream is gone whatever fclose answers; a failure still removes the file.
    errno = 0;
    if (std::fclose(std::exchange(_stream, nullptr)) != 0) Fail();
}
