#include "ZonCloudTextLineReader.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <new>

#include <sys/stat.h>

#include "ZonCloudOperErrorTool.h"
#include "ZonCloudReadNLSTool.h"

ZonCloudTextLineReader::ZonCloudTextLineReader(std::size_t blockSize)
    : _blockSize(std::max(blockSize, 4 * (MaxPiece + 1)))
{
}

void ZonCloudTextLineReader::Start(FILE* file, std::int64_t offset)
{
    _file = file;
    errno = 0;
    if (!_file || offset < 0 || fseeko(_file, static_cast<off_t>(offset), SEEK_SET) != 0) {
        if (errno == 0) errno = EBADF;
        ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
    }
    std::clearerr(_file);
    // A small file needs no large buffer; a big one is read a block at a time.
    std::size_t wanted = _blockSize;
    struct stat info {};
    if (fstat(fileno(_file), &info) == 0 && S_ISREG(info.st_mode)) {
        const std::int64_t remaining = std::max<std::int64_t>(static_cast<std::int64_t>(info.st_size) - offset, 0);
        const auto minimum = static_cast<std::int64_t>(4 * (MaxPiece + 1));
        wanted = static_cast<std::size_t>(
            std::clamp<std::int64_t>(remaining + 1, minimum, static_cast<std::int64_t>(_blockSize)));
    }
    if (_capacity < wanted) {
        _buffer.reset();
        _capacity = 0;
        _buffer.reset(new (std::nothrow) char[wanted]);
        if (!_buffer) ZonCloudOperErrorTool::ThrowInsufficientMemory();
        _capacity = wanted;
    }
    _size = wanted;
    _begin = _end = 0;
    _bufferOffset = offset;
    _pieceOffset = offset;
    _endOfFile = false;
}

void ZonCloudTextLineReader::Release()
{
    _buffer.reset();
    _capacity = 0;
    _size = 0;
    _begin = _end = 0;
    _file = nullptr;
}

void ZonCloudTextLineReader::Refill()
{
    // Keep the unread tail (shorter than one piece) and fill the rest.
    const std::size_t tail = _end - _begin;
    if (tail > 0 && _begin > 0) std::memmove(_buffer.get(), _buffer.get() + _begin, tail);
    _bufferOffset += static_cast<std::int64_t>(_begin);
    _begin = 0;
    _end = tail;
    while (_end < _size && !_endOfFile) {
        errno = 0;
        const std::size_t wanted = _size - _end;
        const std::size_t got = std::fread(_buffer.get() + _end, 1, wanted, _file);
        _end += got;
        // fread comes back short only at the end of the stream or on an error.
        if (got < wanted) {
            if (std::ferror(_file)) {
                if (errno == 0) errno = EIO;
                ZonCloudReadNLSTool::Raise(ZonCloudReadNLSTool::Input, nullptr);
            }
            _endOfFile = true;
        }
    }
}

bool ZonCloudTextLineReader::Next(const char*& first, const char*& last)
{
    if (!_file) return false;
    if (_end - _begin <= MaxPiece && !_endOfFile) Refill();
    const std::size_t available = _end - _begin;
    if (available == 0) return false;
    const char* start = _buffer.get() + _begin;
    const std::size_t window = std::min(available, MaxPiece);
    const void* newline = std::memchr(start, '\n', window);
    const std::size_t length =
        newline ? static_cast<std::size_t>(static_cast<const char*>(newline) - start) + 1 : window;
    _pieceOffset = NextOffset();
    _begin += length;
    first = start;
    last = start + length;
    return true;
}
