#include "ZonCloudByteSource.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>

#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include "ZonCloudReadProgress.h"

using Tool = ZonCloudReadNLSTool;

void ZonCloudByteSource::Open(const std::string& path)
{
    Close();
    errno = 0;
    _file = std::fopen(path.c_str(), "rb");
    if (!_file) Tool::Raise(Tool::Data, nullptr);
    _progress = ZonCloudReadProgress::Current();
    struct stat info {};
    if (fstat(fileno(_file), &info) != 0) return;
    // A directory opens as a stream on this system; refuse it as the open would elsewhere.
    if (S_ISDIR(info.st_mode)) {
        Close();
        errno = EISDIR;
        Tool::Raise(Tool::Data, nullptr);
    }
    if (S_ISREG(info.st_mode)) _size = static_cast<std::int64_t>(info.st_size);
}

void ZonCloudByteSource::OpenMemory(const void* data, std::size_t size)
{
    Close();
    static const unsigned char empty = 0;
    _memory = data ? static_cast<const unsigned char*>(data) : &empty;
    _size = static_cast<std::int64_t>(size);
    _position = 0;
}

void ZonCloudByteSource::Close()
{
    if (_mapping) munmap(_mapping, static_cast<std::size_t>(_size));
    _mapping = nullptr;
    if (_file) std::fclose(_file);
    _file = nullptr;
    _progress = nullptr;
    _memory = nullptr;
    _size = -1;
    _position = 0;
}

std::uint64_t ZonCloudByteSource::Tell() const
{
    if (_memory) return _position;
    const off_t offset = _file ? ftello(_file) : -1;
    return offset < 0 ? 0 : static_cast<std::uint64_t>(offset);
}

void ZonCloudByteSource::Seek(std::uint64_t offset)
{
    errno = 0;
    if (_memory) {
        _position = offset;
        return;
    }
    if (!_file || offset > static_cast<std::uint64_t>(INT64_MAX) ||
        fseeko(_file, static_cast<off_t>(offset), SEEK_SET) != 0) {
        if (errno == 0) errno = EBADF;
        Tool::Raise(Tool::Input, nullptr);
    }
    std::clearerr(_file);
}

std::size_t ZonCloudByteSource::ReadSome(void* buffer, std::size_t count)
{
    if (_memory) {
        const std::uint64_t size = static_cast<std::uint64_t>(_size);
        const std::size_t got = _position >= size ? 0 : static_cast<std::size_t>(std::min<std::uint64_t>(count, size - _position));
        if (got) std::memcpy(buffer, _memory + _position, got);
        _position += got;
        return got;
    }
    errno = 0;
    if (!_file) {
        errno = EBADF;
        Tool::Raise(Tool::Input, nullptr);
    }
    const std::size_t got = std::fread(buffer, 1, count, _file);
    if (_progress) _progress->Add(got);
    if (got < count && std::ferror(_file)) {
        if (errno == 0) errno = EIO;
        Tool::Raise(Tool::Input, nullptr);
    }
    return got;
}

void ZonCloudByteSource::Read(void* buffer, std::size_t count, Tool::ErrorType type)
{
    if (ReadSome(buffer, count) == count) return;
    errno = ENODATA;
    Tool::Raise(type, nullptr);
}

bool ZonCloudByteSource::Fits(std::uint64_t offset, std::uint64_t count, std::uint64_t recordSize) const
{
    if (_size < 0) return false;
    std::uint64_t bytes = 0;
    std::uint64_t end = 0;
    if (__builtin_mul_overflow(count, recordSize, &bytes) || __builtin_add_overflow(offset, bytes, &end)) return false;
    return end <= static_cast<std::uint64_t>(_size);
}

void ZonCloudByteSource::CheckFits(std::uint64_t offset, std::uint64_t count, std::uint64_t recordSize,
                                   const char* code) const
{
    if (!Fits(offset, count, recordSize)) Tool::Raise(Tool::Input, code);
}

const unsigned char* ZonCloudByteSource::Map()
{
    if (_memory) return _memory;
    if (_mapping) return static_cast<const unsigned char*>(_mapping);
    if (!_file || _size <= 0 || static_cast<std::uint64_t>(_size) > SIZE_MAX) return nullptr;
    void* mapping = mmap(nullptr, static_cast<std::size_t>(_size), PROT_READ, MAP_PRIVATE, fileno(_file), 0);
    if (mapping == MAP_FAILED) return nullptr;
    // Read mostly front to back, a few chunks at a time.
    madvise(mapping, static_cast<std::size_t>(_size), MADV_SEQUENTIAL);
    _mapping = mapping;
    return static_cast<const unsigned char*>(_mapping);
}

void ZonCloudByteSource::Unneeded(std::uint64_t offset, std::uint64_t count)
{
    if (!_mapping || _size <= 0) return;
    const auto size = static_cast<std::uint64_t>(_size);
    // A mapped file is read by the parts it gives back: they count as read.
    if (_progress && offset < size) _progress->Add(std::min(count, size - offset));
    const std::uint64_t page = static_cast<std::uint64_t>(sysconf(_SC_PAGESIZE));
    // Whole pages inside the range only: the neighbours may still be read.
    const std::uint64_t first = (offset + page - 1) / page * page;
    const std::uint64_t end = std::min(offset + count, size) / page * page;
    if (first >= end) return;
    madvise(static_cast<char*>(_mapping) + first, static_cast<std::size_t>(end - first), MADV_DONTNEED);
}
