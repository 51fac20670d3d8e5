#include "ZonCloudLineSource.h"

#include <algorithm>
#include <cstring>
#include <new>

#include "ZonCloudByteSource.h"
#include "ZonCloudOperErrorTool.h"

ZonCloudLineSource::ZonCloudLineSource(std::size_t maxPiece, std::size_t blockSize)
    : _maxPiece(std::max<std::size_t>(maxPiece, 1)), _blockSize(std::max(blockSize, 4 * (_maxPiece + 1)))
{
}

ZonCloudLineSource::~ZonCloudLineSource() = default;

void ZonCloudLineSource::Start(ZonCloudByteSource& source, std::uint64_t offset)
{
    // Back to a line still in the buffer (a reader's second look at the
    // start of a file): no seek, no read.
    if (_source == &source && _buffer && offset >= _bufferOffset && offset <= _bufferOffset + _end &&
        source.Tell() == _bufferOffset + _end) {
        _begin = static_cast<std::size_t>(offset - _bufferOffset);
        _lineOffset = offset;
        return;
    }
    _source = &source;
    source.Seek(offset);
    // A small file needs no large buffer; a big one is read a block at a time.
    std::size_t wanted = _blockSize;
    if (source.Size() >= 0) {
        const std::uint64_t size = static_cast<std::uint64_t>(source.Size());
        const std::uint64_t remaining = size > offset ? size - offset : 0;
        const std::uint64_t minimum = 4 * (_maxPiece + 1);
        wanted = static_cast<std::size_t>(std::clamp<std::uint64_t>(remaining + 1, minimum, _blockSize));
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
    _lineOffset = offset;
    _endOfSource = false;
}

void ZonCloudLineSource::Release()
{
    _buffer.reset();
    _capacity = 0;
    _size = 0;
    _begin = _end = 0;
    _source = nullptr;
}

void ZonCloudLineSource::Refill()
{
    // Keep the unread tail (shorter than one piece) and fill the rest.
    const std::size_t tail = _end - _begin;
    if (tail > 0 && _begin > 0) std::memmove(_buffer.get(), _buffer.get() + _begin, tail);
    _bufferOffset += _begin;
    _begin = 0;
    _end = tail;
    while (_end < _size && !_endOfSource) {
        const std::size_t wanted = _size - _end;
        const std::size_t got = _source->ReadSome(_buffer.get() + _end, wanted);
        _end += got;
        if (got < wanted) _endOfSource = true;
    }
}

bool ZonCloudLineSource::Next(std::string_view& line)
{
    const char* first = nullptr;
    const char* last = nullptr;
    if (!Next(first, last)) return false;
    line = std::string_view(first, static_cast<std::size_t>(last - first));
    return true;
}
