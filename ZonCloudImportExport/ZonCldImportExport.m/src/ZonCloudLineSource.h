#pragma once
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <string_view>

#include "ZonCldExport.h"

class ZonCloudByteSource;

// The lines of a text file for every text reader: reads the byte source in
// large blocks and hands out each line as a view into its own buffer, so a
// line costs no allocation and no copy. A line is handed with its newline, in
// pieces of at most `maxPiece` characters, as fgets with a buffer of
// maxPiece + 1 would cut it; formats whose rules know no such cut take a large
// maxPiece. A view stays valid until the next call of Next or Start.
class ZON_CLD_API ZonCloudLineSource {
public:
    static constexpr std::size_t FgetsPiece = 511;  // what a 512-character buffer receives
    static constexpr std::size_t DefaultBlock = std::size_t{1} << 20;

    explicit ZonCloudLineSource(std::size_t maxPiece = FgetsPiece, std::size_t blockSize = DefaultBlock);
    ~ZonCloudLineSource();
    ZonCloudLineSource(const ZonCloudLineSource&) = delete;
    ZonCloudLineSource& operator=(const ZonCloudLineSource&) = delete;

    // Reads `source` (not owned) from `offset`. Coming back to an offset that
    // is still in the buffer costs no read. A failed seek raises type 1.
    void Start(ZonCloudByteSource& source, std::uint64_t offset = 0);
    // The next piece as [first, last); false at the end. A read error raises
    // type 1. Inline: it runs once per line of every text file.
    bool Next(const char*& first, const char*& last)
    {
        if (!_source) return false;
        if (_end - _begin <= _maxPiece && !_endOfSource) Refill();
        const std::size_t available = _end - _begin;
        if (available == 0) return false;
        const char* start = _buffer.get() + _begin;
        const std::size_t length = PieceLength(start, available, _maxPiece);
        _lineOffset = NextOffset();
        _begin += length;
        first = start;
        last = start + length;
        return true;
    }
    bool Next(std::string_view& line);
    // Offset of the piece last handed, and of what follows it.
    std::uint64_t LineOffset() const { return _lineOffset; }
    std::uint64_t NextOffset() const { return _bufferOffset + _begin; }
    // True when the next piece would be the one at `offset` of `source`.
    bool IsAt(const ZonCloudByteSource* source, std::uint64_t offset) const
    {
        return source && _source == source && NextOffset() == offset;
    }
    // Gives the buffer back (a reader keeps it only while it reads).
    void Release();

    // The length of the piece at `start`, with `available` bytes there (more
    // than maxPiece unless the data ends): up to its newline, at most maxPiece.
    // Every reading of lines cuts them here, so that all cut them alike.
    static std::size_t PieceLength(const char* start, std::size_t available, std::size_t maxPiece)
    {
        const std::size_t window = available < maxPiece ? available : maxPiece;
        const void* newline = std::memchr(start, '\n', window);
        return newline ? static_cast<std::size_t>(static_cast<const char*>(newline) - start) + 1 : window;
    }

    // The line without its end: "\n" or "\r\n" (or a lone "\r" at the end).
    static std::string_view Chomp(std::string_view line)
    {
        if (!line.empty() && line.back() == '\n') line.remove_suffix(1);
        if (!line.empty() && line.back() == '\r') line.remove_suffix(1);
        return line;
    }

private:
    void Refill();

    ZonCloudByteSource* _source = nullptr;
    std::size_t _maxPiece;
    std::size_t _blockSize;
    std::unique_ptr<char[]> _buffer;
    std::size_t _capacity = 0;       // allocated bytes
    std::size_t _size = 0;           // bytes used for this pass (small files need less)
    std::size_t _begin = 0;          // first unread byte in _buffer
    std::size_t _end = 0;            // end of the valid bytes in _buffer
    std::uint64_t _bufferOffset = 0; // source offset of _buffer[0]
    std::uint64_t _lineOffset = 0;
    bool _endOfSource = false;
};
