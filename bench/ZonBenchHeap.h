// Heap in use and its peak, counted by the global allocation functions, for
// the benchmarks that report peak memory against the arrays they produce.
// Included by exactly one source file of a benchmark program.
#pragma once
#include <malloc.h>

#include <atomic>
#include <cstdlib>
#include <new>

namespace zonbench {
inline std::atomic<std::size_t> gHeapInUse{0};
inline std::atomic<std::size_t> gHeapPeak{0};

inline void* CountedAlloc(std::size_t size)
{
    void* p = std::malloc(size ? size : 1);
    if (!p) throw std::bad_alloc();
    const std::size_t now = gHeapInUse += malloc_usable_size(p);
    std::size_t peak = gHeapPeak.load();
    while (now > peak && !gHeapPeak.compare_exchange_weak(peak, now)) {
    }
    return p;
}

inline void CountedFree(void* p)
{
    if (!p) return;
    gHeapInUse -= malloc_usable_size(p);
    std::free(p);
}
}  // namespace zonbench

void* operator new(std::size_t size) { return zonbench::CountedAlloc(size); }
void* operator new[](std::size_t size) { return zonbench::CountedAlloc(size); }
void operator delete(void* p) noexcept { zonbench::CountedFree(p); }
void operator delete[](void* p) noexcept { zonbench::CountedFree(p); }
void operator delete(void* p, std::size_t) noexcept { zonbench::CountedFree(p); }
void operator delete[](void* p, std::size_t) noexcept { zonbench::CountedFree(p); }
