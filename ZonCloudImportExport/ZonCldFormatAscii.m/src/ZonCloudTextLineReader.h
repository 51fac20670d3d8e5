#pragma once
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <memory>

// Cuts an open stream into the pieces a 512-character fgets buffer would
// receive: up to and including the next newline, at most 511 characters, so
// a longer line arrives as several pieces. Reads the stream in large blocks
// and hands out pointers into its own buffer, so a line costs no allocation
// and no copy. A piece stays valid until the next call of Next or Seek.
class ZonCloudTextLineReader {
public:
    static constexpr std::size_t MaxPiece = 511;

    explicit ZonCloudTextLineReader(std::size_t blockSize = std::size_t{1} << 20);

    // Reads from `file` (not owned) starting at `offset`. A failed seek raises
    // type 1 with the errno message.
    void Start(FILE* file, std::int64_t offset);
    // The next piece as [first, last); false at the end of the stream. A read
    // error raises type 1 with the errno message.
    bool Next(const char*& first, const char*& last);
    // File offset of the piece last returned, and of what follows it.
    std::int64_t PieceOffset() const { return _pieceOffset; }
    std::int64_t NextOffset() const { return _bufferOffset + static_cast<std::int64_t>(_begin); }
    // True when the next piece would be the one at `offset` of `file`.
    bool IsAt(const FILE* file, std::int64_t offset) const
    {
        return file && _file == file && NextOffset() == offset;
    }
    // Gives the buffer back (a reader keeps it only while it reads).
    void Release();

private:
    void Refill();

    FILE* _file = nullptr;
    std::size_t _blockSize;
    std::unique_ptr<char[]> _buffer;
    std::size_t _capacity = 0;         // allocated bytes
    std::size_t _size = 0;             // bytes used for this pass (small files need less)
    std::size_t _begin = 0;            // first unread byte in _buffer
    std::size_t _end = 0;              // end of the valid bytes in _buffer
    std::int64_t _bufferOffset = 0;    // file offset of _buffer[0]
    std::int64_t _pieceOffset = 0;
    bool _endOfFile = false;
};
