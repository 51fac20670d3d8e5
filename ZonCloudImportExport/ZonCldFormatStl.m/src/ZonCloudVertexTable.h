#pragma once
#include <algorithm>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <new>
#include <type_traits>
#include <vector>

#include "ZonCloudWorkerPool.h"

// Merges the corners of a triangle soup into distinct vertices. Two corners
// are one vertex when their coordinates compare equal as floating-point
// values: -0.0 and 0.0 are one vertex, a NaN equals nothing (so a corner with
// a NaN is always a vertex of its own), and no tolerance is applied. Vertices
// are numbered in order of first appearance and appended to the caller's
// array; the table itself holds only indices and hashes (open addressing,
// linear probing, at most five eighths full).
template <class T>
class ZonCloudVertexTable {
    static_assert(std::is_same_v<T, float> || std::is_same_v<T, double>);

public:
    // `expectedDistinct` sizes the table; it grows past that when needed.
    // Allocation failures surface as std::bad_alloc.
    ZonCloudVertexTable(std::vector<T>& vertices, std::size_t expectedDistinct) : _vertices(vertices)
    {
        std::size_t size = 16;
        while (IsCrowded(expectedDistinct, size)) size *= 2;
        Allocate(_slots, size);
        _mask = size - 1;
    }

    // Starts again with no vertex, for at least `expectedDistinct` of them,
    // keeping the table's memory (the caller clears the vertices).
    void Reset(std::size_t expectedDistinct)
    {
        std::size_t size = 16;
        while (IsCrowded(expectedDistinct, size)) size *= 2;
        if (size > _slots.size()) {
            std::vector<Slot>().swap(_slots);
            Allocate(_slots, size);
        } else {
            std::fill(_slots.begin(), _slots.end(), Slot{});
        }
        _mask = _slots.size() - 1;
        _used = 0;
    }

    // The index of the vertex at xyz[0..2], appended when new.
    std::uint32_t Index(const T* xyz) { return Index(xyz, HashOf(xyz)); }

    // For callers that look up many vertices in a row: hash them all and
    // prefetch their slots first, so that the cache misses overlap, then call
    // Index with each hash in the order of the vertices.
    static std::uint32_t HashOf(const T* xyz) { return Hash(xyz[0], xyz[1], xyz[2]); }
    void Prefetch(std::uint32_t hash) const { __builtin_prefetch(_slots.data() + (hash & _mask)); }

    std::uint32_t Index(const T* xyz, std::uint32_t hash)
    {
        const T x = xyz[0], y = xyz[1], z = xyz[2];
        if (x != x || y != y || z != z) return Append(x, y, z);
        std::size_t i = hash & _mask;
        for (;; i = (i + 1) & _mask) {
            const Slot slot = _slots[i];
            if (slot.index1 == 0) break;
            if (slot.hash != hash) continue;
            const T* v = _vertices.data() + 3 * static_cast<std::size_t>(slot.index1 - 1);
            if (v[0] == x && v[1] == y && v[2] == z) return slot.index1 - 1;
        }
        const std::uint32_t index = Append(x, y, z);
        if (IsCrowded(_used + 1, _slots.size())) {
            Grow();
            for (i = hash & _mask; _slots[i].index1 != 0; i = (i + 1) & _mask) {
            }
        }
        _slots[i] = Slot{index + 1, hash};
        ++_used;
        return index;
    }

    std::size_t DistinctCount() const { return _vertices.size() / 3; }

private:
    struct Slot {
        std::uint32_t index1 = 0;  // vertex index + 1; 0 marks a free slot
        std::uint32_t hash = 0;
    };

    static bool IsCrowded(std::size_t used, std::size_t size) { return 8 * used > 5 * size; }

    std::uint32_t Append(T x, T y, T z)
    {
        const std::size_t index = _vertices.size() / 3;
        // Index + 1 must fit in a slot.
        if (index >= std::numeric_limits<std::uint32_t>::max() - 1) throw std::bad_alloc();
        _vertices.push_back(x);
        _vertices.push_back(y);
        _vertices.push_back(z);
        return static_cast<std::uint32_t>(index);
    }

    // Free slots; a large table is asked in huge pages, as its slots are hit at random.
    static void Allocate(std::vector<Slot>& slots, std::size_t size)
    {
        slots.reserve(size);
        ZonCloudWorkerPool::AdviseHugePages(slots.data(), size * sizeof(Slot));
        slots.resize(size);
    }

    void Grow()
    {
        std::vector<Slot> bigger;
        Allocate(bigger, 2 * _slots.size());
        const std::size_t mask = bigger.size() - 1;
        for (const Slot& slot : _slots) {
            if (slot.index1 == 0) continue;
            std::size_t i = slot.hash & mask;
            while (bigger[i].index1 != 0) i = (i + 1) & mask;
            bigger[i] = slot;
        }
        _slots.swap(bigger);
        _mask = mask;
    }

    // Equal values must hash alike, so -0.0 is hashed as 0.0 (NaNs never get here).
    static std::uint64_t Bits(T v)
    {
        if (v == T(0)) v = T(0);
        if constexpr (std::is_same_v<T, float>)
            return std::bit_cast<std::uint32_t>(v);
        else
            return std::bit_cast<std::uint64_t>(v);
    }

    static std::uint32_t Hash(T x, T y, T z)
    {
        std::uint64_t h;
        if constexpr (std::is_same_v<T, float>)
            h = (Bits(x) | Bits(y) << 32) * 0x9E3779B97F4A7C15ull ^ Bits(z) * 0xC2B2AE3D27D4EB4Full;
        else
            h = Bits(x) * 0x9E3779B97F4A7C15ull ^ std::rotl(Bits(y) * 0xC2B2AE3D27D4EB4Full, 21) ^
                std::rotl(Bits(z) * 0x165667B19E3779F9ull, 42);
        // Final avalanche so that the low bits, which pick the slot, depend on every input bit.
        h ^= h >> 33;
        h *= 0xFF51AFD7ED558CCDull;
        h ^= h >> 33;
        h *= 0xC4CEB9FE1A85EC53ull;
        h ^= h >> 33;
        return static_cast<std::uint32_t>(h);
    }

    std::vector<T>& _vertices;
    std::vector<Slot> _slots;
    std::size_t _mask = 0;
    std::size_t _used = 0;
};
