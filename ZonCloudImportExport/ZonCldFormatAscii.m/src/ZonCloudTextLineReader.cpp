#include "ZonCloudTextLineReader.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <new>

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
    if (_buffer.size() != _blockSize) {
        try {
            _buffer.assign(_blockSize, '\0');
        } catch (const std::bad_alloc&) {
            ZonCloudOperErrorTool::ThrowInsufficientMemory();
        }
    }
    _begin = _end = 0;
    _bufferOffset = offset;
    _pieceOffset = offset;
    _endOfFile = false;
}

void ZonCloudTextLineReader::Release()
{
    _buffer.clear();
    _buffer.shrink_to_fit();
    _begin = _end = 0;
    _file = nullptr;
}

void ZonCloudTextLineReader::Refill()
{
    // Keep the unread tail (shorter than one piece) and fill the rest.
    const std::size_t tail = _end - _begin;
    if (tail > 0 && _begin > 0) std::memmove(_buffer.data(), _buffer.data() + _begin, tail);
    _bufferOffset += static_cast<std::int64_t>(_begin);
    _begin = 0;
    _end = tail;
    while (_end < _buffer.size() && !_endOfFile) {
        errno = 0;
        const std::size_t wanted = _buffer.size() - _end;
        const std::size_t got = std::fread(_buffer.data() + _end, 1, wanted, _file);
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
    const char* start = _buffer.data() + _begin;
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
