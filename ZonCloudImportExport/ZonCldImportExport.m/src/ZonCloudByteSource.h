#pragma once
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string>
#include <type_traits>

#include "ZonCldExport.h"
#include "ZonCloudReadNLSTool.h"

class ZonCloudReadProgress;

// What every reader reads through: a file, or bytes already in memory (the
// members of an archive, the fuzz targets), with its size, seek and tell,
// exact reads, and byte-order loads. Sizes and offsets are 64-bit; a reader
// checks any offset or count it takes from the file with Fits before using it.
class ZON_CLD_API ZonCloudByteSource {
public:
    ZonCloudByteSource() = default;
    ~ZonCloudByteSource() { Close(); }
    ZonCloudByteSource(const ZonCloudByteSource&) = delete;
    ZonCloudByteSource& operator=(const ZonCloudByteSource&) = delete;

    // Opens a file read-only; a failure (a directory too) raises type 3 with
    // the system's message. What is read from it counts in the opening
    // thread's ZonCloudReadProgress, if any.
    void Open(const std::string& path);
    // Reads from `size` bytes at `data`, which the caller keeps alive.
    void OpenMemory(const void* data, std::size_t size);
    void Close();
    bool IsOpen() const { return _file || _memory; }
    bool IsMemory() const { return _memory != nullptr; }

    // Size in bytes; -1 when the system cannot tell (a pipe).
    std::int64_t Size() const { return _size; }
    std::uint64_t Tell() const;
    // A failed seek raises type 1 with the system's message.
    void Seek(std::uint64_t offset);

    // Up to `count` bytes; fewer only at the end. A read error raises type 1.
    std::size_t ReadSome(void* buffer, std::size_t count);
    // Exactly `count` bytes: a short read raises `type` with the system's
    // error, or ENODATA when the data simply ended.
    void Read(void* buffer, std::size_t count, ZonCloudReadNLSTool::ErrorType type = ZonCloudReadNLSTool::Input);

    // The whole source as one block of memory: a read-only mapping of a file
    // (kept until Close), or the bytes of a memory source. Null when the
    // source cannot be mapped (no size, empty, a special file); the caller
    // then reads it. Parts already used may be given back with Unneeded, so
    // that a big file does not stay resident while it is read; they count as
    // read for the source's ZonCloudReadProgress.
    const unsigned char* Map();
    void Unneeded(std::uint64_t offset, std::uint64_t count);

    // True when `count` records of `recordSize` bytes from `offset` lie within
    // the source; computed without overflow. False when the size is unknown.
    bool Fits(std::uint64_t offset, std::uint64_t count, std::uint64_t recordSize) const;
    // The same, raising `code` (type 1) when they do not.
    void CheckFits(std::uint64_t offset, std::uint64_t count, std::uint64_t recordSize,
                   const char* code = "ERR_UnknownData") const;

    // Loads of a value stored in little- or big-endian order.
    template <class T>
    static T LoadLittle(const void* bytes)
    {
        return Load<T, std::endian::little>(bytes);
    }
    template <class T>
    static T LoadBig(const void* bytes)
    {
        return Load<T, std::endian::big>(bytes);
    }
    template <class T>
    T ReadLittle()
    {
        unsigned char bytes[sizeof(T)];
        Read(bytes, sizeof bytes);
        return LoadLittle<T>(bytes);
    }
    template <class T>
    T ReadBig()
    {
        unsigned char bytes[sizeof(T)];
        Read(bytes, sizeof bytes);
        return LoadBig<T>(bytes);
    }

private:
    template <class T, std::endian Order>
    static T Load(const void* bytes)
    {
        static_assert(sizeof(T) == 2 || sizeof(T) == 4 || sizeof(T) == 8, "16-, 32- or 64-bit values");
        using Bits = std::conditional_t<sizeof(T) == 2, std::uint16_t,
                                        std::conditional_t<sizeof(T) == 4, std::uint32_t, std::uint64_t>>;
        Bits bits;
        std::memcpy(&bits, bytes, sizeof bits);
        if constexpr (Order != std::endian::native) {
            if constexpr (sizeof(T) == 2)
                bits = __builtin_bswap16(bits);
            else if constexpr (sizeof(T) == 4)
                bits = __builtin_bswap32(bits);
            else
                bits = __builtin_bswap64(bits);
        }
        return std::bit_cast<T>(bits);
    }

    std::FILE* _file = nullptr;
    ZonCloudReadProgress* _progress = nullptr;  // of the file form
    const unsigned char* _memory = nullptr;
    std::int64_t _size = -1;
    std::uint64_t _position = 0;  // of the memory form
    void* _mapping = nullptr;     // of a mapped file
};
