#pragma once
#include <atomic>
#include <cstdint>

#include "ZonCldExport.h"

// Bytes of files read so far by the readers of one thread, for a front end
// that shows progress while one long import call runs. Created on the thread
// that imports, it counts what every byte source opened on that thread reads
// from its file (not from memory), by reads or by mapped parts given back
// once used, whichever thread does it; another thread may read BytesRead at
// any time. Scopes nest: the innermost one counts. A source keeps the counter it
// found when it opened, so the counter outlives the readers made in its scope.
class ZON_CLD_API ZonCloudReadProgress {
public:
    ZonCloudReadProgress();
    ~ZonCloudReadProgress();
    ZonCloudReadProgress(const ZonCloudReadProgress&) = delete;
    ZonCloudReadProgress& operator=(const ZonCloudReadProgress&) = delete;

    std::uint64_t BytesRead() const { return _bytes.load(std::memory_order_relaxed); }
    void Add(std::uint64_t bytes) { _bytes.fetch_add(bytes, std::memory_order_relaxed); }

    // The calling thread's innermost counter; null when there is none.
    static ZonCloudReadProgress* Current();

private:
    std::atomic<std::uint64_t> _bytes{0};
    ZonCloudReadProgress* _outer;
};
