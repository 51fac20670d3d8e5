#pragma once
#include <algorithm>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <memory>
#include <mutex>
#include <vector>

#include "ZonCldExport.h"
#include "ZonCloudByteSource.h"
#include "ZonCloudLineSource.h"
#include "ZonCloudWorkerPool.h"

// The pieces of the lines of one chunk of a mapped text, cut as
// ZonCloudLineSource cuts them (a chunk starts at a line start, so the cuts
// fall where they fall when the whole file is read line by line).
class ZonCloudChunkLines {
public:
    ZonCloudChunkLines(const char* first, const char* last, std::uint64_t offset, std::size_t maxPiece)
        : _begin(first), _position(first), _end(last), _offset(offset), _maxPiece(std::max<std::size_t>(maxPiece, 1))
    {
    }
    bool Next(const char*& first, const char*& last)
    {
        if (_position == _end) return false;
        _lineOffset = NextOffset();
        first = _position;
        _position += ZonCloudLineSource::PieceLength(_position, static_cast<std::size_t>(_end - _position), _maxPiece);
        last = _position;
        return true;
    }
    std::uint64_t LineOffset() const { return _lineOffset; }
    std::uint64_t NextOffset() const { return _offset + static_cast<std::uint64_t>(_position - _begin); }

private:
    const char* _begin;
    const char* _position;
    const char* _end;
    std::uint64_t _offset;
    std::size_t _maxPiece;
    std::uint64_t _lineOffset = 0;
};

// The reading path of large files on every core. The file is mapped and cut
// into chunks; each chunk is parsed on a worker into a compact result of the
// reader's own (points, and marks for the few lines that are no points), and
// the results are stitched on the calling thread in file order, where the
// reader applies every rule that depends on what came before (counts of
// unknown lines, sampling, count and end lines, vertex numbering) exactly as
// its line-by-line loop does. A few chunks are in flight at a time, and the
// pages of stitched chunks are given back, so memory stays bounded.
//
// Files below the threshold are read line by line on the calling thread:
// there the threads would cost more than they save. Tests lower the
// threshold and the chunk size to put chunk boundaries everywhere.
class ZON_CLD_API ZonCloudChunkedText {
public:
    static constexpr std::uint64_t DefaultThreshold = std::uint64_t{4} << 20;
    static constexpr std::size_t DefaultChunkSize = std::size_t{1} << 20;

    // Files (from the reader's start offset) of at least this many bytes take
    // the chunked path. 0 restores the default; 1 sends every file there.
    static std::uint64_t Threshold();
    static void SetThreshold(std::uint64_t bytes);
    // Bytes per chunk (a chunk is longer by the rest of its last line).
    static std::size_t ChunkSize();
    static void SetChunkSize(std::size_t bytes);

    // The mapped bytes of `source` when what lies from `offset` on is worth
    // the chunked path; null when it is not, or cannot be mapped.
    static const unsigned char* MapIfWorth(ZonCloudByteSource& source, std::uint64_t offset);

    // Cuts the mapped text [offset, size) of `source` into chunks at line
    // starts; parse(lines, chunk) runs on the workers, stitch(chunk) on the
    // calling thread in file order. A stitch that answers false stops the
    // reading: no later chunk is stitched. Failures of either reach the
    // caller once the chunks before have been stitched.
    template <class Chunk, class Parse, class Stitch>
    static void Run(ZonCloudByteSource& source, const unsigned char* mapped, std::uint64_t offset,
                    std::size_t maxPiece, Parse&& parse, Stitch&& stitch)
    {
        const auto size = static_cast<std::uint64_t>(source.Size());
        if (offset >= size) return;
        const char* text = reinterpret_cast<const char*>(mapped);
        const std::uint64_t step = ChunkSize();
        const std::uint64_t count = (size - offset + step - 1) / step;
        // The first line start at or after `at`.
        const auto lineStart = [&](std::uint64_t at) -> std::uint64_t {
            if (at <= offset) return offset;
            if (at >= size) return size;
            const void* newline = std::memchr(text + at - 1, '\n', static_cast<std::size_t>(size - at + 1));
            return newline ? static_cast<std::uint64_t>(static_cast<const char*>(newline) - text) + 1 : size;
        };
        InOrder<Chunk>(
            static_cast<std::size_t>(count),
            [&](std::size_t i, Chunk& chunk) {
                const std::uint64_t first = lineStart(offset + i * step);
                const std::uint64_t last = lineStart(offset + (i + 1) * step);
                ZonCloudChunkLines lines(text + first, text + last, first, maxPiece);
                parse(lines, chunk);
            },
            [&](std::size_t i, Chunk& chunk) {
                const bool more = stitch(chunk);
                source.Unneeded(offset + i * step, step);
                return more;
            });
    }

    // The same for `count` records of `recordSize` bytes from `offset` of
    // the mapped `source` (the caller checked that they lie in it):
    // parse(first record, records, chunk) on the workers, stitch(chunk) in
    // order on the calling thread.
    template <class Chunk, class Parse, class Stitch>
    static void RunRecords(ZonCloudByteSource& source, const unsigned char* mapped, std::uint64_t offset,
                           std::uint64_t count, std::size_t recordSize, Parse&& parse, Stitch&& stitch)
    {
        const std::uint64_t perChunk = std::max<std::uint64_t>(ChunkSize() / recordSize, 1);
        const std::uint64_t chunks = (count + perChunk - 1) / perChunk;
        InOrder<Chunk>(
            static_cast<std::size_t>(chunks),
            [&](std::size_t i, Chunk& chunk) {
                const std::uint64_t first = i * perChunk;
                const std::uint64_t records = std::min(perChunk, count - first);
                parse(mapped + offset + first * recordSize, static_cast<std::size_t>(records), chunk);
            },
            [&](std::size_t i, Chunk& chunk) {
                const bool more = stitch(chunk);
                source.Unneeded(offset + i * perChunk * recordSize, perChunk * recordSize);
                return more;
            });
    }

private:
    // Chunk i lives in slot i % window from its parse to its stitch: the pool
    // never works on more than `window` items past the one being consumed.
    // A chunk type with a Reuse() (which makes it as a new one, keeping its
    // memory) is handed from a stitched chunk to the next parse, so its arrays
    // are not allocated and faulted in afresh for every chunk.
    template <class Chunk, class Work, class Stitch>
    static void InOrder(std::size_t count, Work&& work, Stitch&& stitch)
    {
        constexpr bool reusable = requires(Chunk& c) { c.Reuse(); };
        const unsigned threads = ZonCloudWorkerPool::ThreadCount();
        const std::size_t window = 2 * static_cast<std::size_t>(threads) + 2;
        std::vector<std::unique_ptr<Chunk>> slots(std::min(window, std::max<std::size_t>(count, 1)));
        std::mutex spareLock;
        std::vector<std::unique_ptr<Chunk>> spare;
        std::atomic<bool> stopped{false};
        ZonCloudWorkerPool::Ordered(
            count,
            [&](std::size_t i) {
                std::unique_ptr<Chunk> chunk;
                if constexpr (reusable) {
                    std::lock_guard lock(spareLock);
                    if (!spare.empty()) {
                        chunk = std::move(spare.back());
                        spare.pop_back();
                    }
                }
                if constexpr (reusable) {
                    if (chunk) chunk->Reuse();
                }
                if (!chunk) chunk = std::make_unique<Chunk>();
                // After a stop the rest is not worth parsing.
                if (!stopped.load(std::memory_order_relaxed)) work(i, *chunk);
                slots[i % slots.size()] = std::move(chunk);
            },
            [&](std::size_t i) {
                std::unique_ptr<Chunk> chunk = std::move(slots[i % slots.size()]);
                if (!stopped.load(std::memory_order_relaxed) && !stitch(i, *chunk))
                    stopped.store(true, std::memory_order_relaxed);
                if constexpr (reusable) {
                    std::lock_guard lock(spareLock);
                    spare.push_back(std::move(chunk));
                }
            },
            slots.size(), threads);
    }
};
