#pragma once
#include <cstddef>
#include <functional>

#include "ZonCldExport.h"

// The one place where the module decides how many threads a large file may
// use and runs work on them. Threads are started per call: a call covers a
// whole file (many chunks), so their start-up cost is noise, and no thread
// outlives the import that needed it.
class ZON_CLD_API ZonCloudWorkerPool {
public:
    // ZON_THREADS when it holds a number from 1 to 64; otherwise the number of
    // cores, at least 1 and at most 8.
    static unsigned ThreadCount();
    // Fixes the count for this process (a setting); 0 goes back to the default.
    static void SetThreadCount(unsigned count);

    // Makes the pages of freshly allocated memory present, in slices on the
    // workers: the kernel then zeroes and maps them on both cores instead of
    // one page fault at a time on first touch, in huge pages where the system
    // offers them on request. Only worth it for large blocks; does nothing
    // for small ones or where the system cannot.
    static void Populate(void* data, std::size_t bytes);
    // Asks for huge pages over a large block that is filled later: where the
    // system offers them on request, a 2 MB page then costs one fault and one
    // clearing instead of 512. Untouched parts still take no memory.
    static void AdviseHugePages(void* data, std::size_t bytes);

    // Runs work(i) for every i in [0, count) on at most `threads` threads
    // (0: ThreadCount()), the calling thread included. After a failure no new
    // item starts; the failure of the lowest index is rethrown once all
    // started items have ended.
    static void Run(std::size_t count, const std::function<void(std::size_t)>& work,
                    unsigned threads = 0);

    // Runs work(i) on the workers and consume(i) on the calling thread in
    // order 0, 1, 2, ..., each consume(i) once work(i) has ended. At most
    // `window` items are worked on ahead of the one being consumed, so a
    // caller keeps at most `window` results in memory. A failure of work(i)
    // is rethrown when i is next to be consumed (so earlier items are still
    // consumed first); a failure of consume stops everything and is rethrown.
    static void Ordered(std::size_t count, const std::function<void(std::size_t)>& work,
                        const std::function<void(std::size_t)>& consume, std::size_t window,
                        unsigned threads = 0);
};
