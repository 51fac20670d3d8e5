#include "ZonCloudWorkerPool.h"

#include <algorithm>
#include <atomic>
#include <charconv>
#include <cstdint>
#include <condition_variable>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <mutex>
#include <sys/mman.h>
#include <unistd.h>
#include <thread>
#include <vector>

namespace {

std::atomic<unsigned> fixedCount{0};

unsigned DefaultCount()
{
    if (const char* text = std::getenv("ZON_THREADS")) {
        unsigned value = 0;
        const char* end = text + std::strlen(text);
        const auto [ptr, ec] = std::from_chars(text, end, value);
        if (ec == std::errc() && ptr == end && value >= 1 && value <= 64) return value;
    }
    // Asking the system for its cores costs a file read: once per process.
    static const unsigned cores = std::clamp(std::thread::hardware_concurrency(), 1u, 8u);
    return cores;
}

// Joins every started thread on every way out of a call.
class ThreadGroup {
public:
    ~ThreadGroup()
    {
        for (auto& thread : threads_) thread.join();
    }
    template <class F>
    void Start(F&& body)
    {
        threads_.emplace_back(std::forward<F>(body));
    }

private:
    std::vector<std::thread> threads_;
};

} // namespace

unsigned ZonCloudWorkerPool::ThreadCount()
{
    const unsigned fixed = fixedCount.load(std::memory_order_relaxed);
    return fixed != 0 ? fixed : DefaultCount();
}

void ZonCloudWorkerPool::SetThreadCount(unsigned count)
{
    fixedCount.store(std::min(count, 64u), std::memory_order_relaxed);
}

namespace {
// Below a few MB the faults cost less than the advice and the workers.
constexpr std::size_t Worth = std::size_t(4) << 20;

// The whole pages inside [data, data + bytes).
bool InnerPages(void* data, std::size_t bytes, std::uintptr_t& begin, std::uintptr_t& end)
{
    if (!data || bytes < Worth) return false;
    const auto page = static_cast<std::uintptr_t>(sysconf(_SC_PAGESIZE));
    begin = (reinterpret_cast<std::uintptr_t>(data) + page - 1) / page * page;
    end = (reinterpret_cast<std::uintptr_t>(data) + bytes) / page * page;
    return begin < end;
}
}  // namespace

void ZonCloudWorkerPool::AdviseHugePages(void* data, std::size_t bytes)
{
    std::uintptr_t begin = 0, end = 0;
    if (!InnerPages(data, bytes, begin, end)) return;
#ifdef MADV_HUGEPAGE
    madvise(reinterpret_cast<void*>(begin), end - begin, MADV_HUGEPAGE);
#endif
}

void ZonCloudWorkerPool::Populate(void* data, std::size_t bytes)
{
    AdviseHugePages(data, bytes);
    std::uintptr_t begin = 0, end = 0;
    if (!InnerPages(data, bytes, begin, end)) return;
#ifdef MADV_POPULATE_WRITE
    if (ThreadCount() < 2) return;
    // Slices of a few MB, taken in turn, keep both cores busy to the end.
    const std::uintptr_t slice = std::uintptr_t(4) << 20;
    const std::size_t count = (end - begin + slice - 1) / slice;
    Run(count, [&](std::size_t i) {
        const std::uintptr_t from = begin + i * slice, to = std::min(end, from + slice);
        // A kernel without this advice answers EINVAL: the pages then come on first touch.
        madvise(reinterpret_cast<void*>(from), to - from, MADV_POPULATE_WRITE);
    });
#endif
}

void ZonCloudWorkerPool::Run(std::size_t count, const std::function<void(std::size_t)>& work,
                             unsigned threads)
{
    if (count == 0) return;
    if (threads == 0) threads = ThreadCount();
    threads = static_cast<unsigned>(std::min<std::size_t>(threads, count));
    if (threads <= 1) {
        for (std::size_t i = 0; i < count; ++i) work(i);
        return;
    }

    std::atomic<std::size_t> next{0};
    std::atomic<bool> failed{false};
    std::mutex mutex;
    std::size_t failedIndex = count;
    std::exception_ptr failure;
    auto body = [&] {
        for (;;) {
            if (failed.load(std::memory_order_relaxed)) return;
            const std::size_t i = next.fetch_add(1);
            if (i >= count) return;
            try {
                work(i);
            } catch (...) {
                std::lock_guard lock(mutex);
                if (i < failedIndex) {
                    failedIndex = i;
                    failure = std::current_exception();
                }
                failed.store(true);
            }
        }
    };
    {
        ThreadGroup group;
        for (unsigned t = 1; t < threads; ++t) group.Start(body);
        body();
    }
    if (failure) std::rethrow_exception(failure);
}

void ZonCloudWorkerPool::Ordered(std::size_t count, const std::function<void(std::size_t)>& work,
                                 const std::function<void(std::size_t)>& consume, std::size_t window,
                                 unsigned threads)
{
    if (count == 0) return;
    if (threads == 0) threads = ThreadCount();
    window = std::max<std::size_t>(window, 1);
    if (threads <= 1 || count == 1) {
        for (std::size_t i = 0; i < count; ++i) {
            work(i);
            consume(i);
        }
        return;
    }
    // The calling thread only consumes; the workers work.
    const unsigned workers = static_cast<unsigned>(std::min<std::size_t>(threads, count));

    std::mutex mutex;
    std::condition_variable changed;
    std::size_t next = 0;     // next item to hand to a worker
    std::size_t consumed = 0; // items consumed so far
    bool stop = false;
    std::vector<unsigned char> done(count, 0);
    std::vector<std::exception_ptr> failures(count);

    auto body = [&] {
        std::unique_lock lock(mutex);
        for (;;) {
            changed.wait(lock, [&] { return stop || next >= count || next < consumed + window; });
            if (stop || next >= count) return;
            const std::size_t i = next++;
            lock.unlock();
            std::exception_ptr failure;
            try {
                work(i);
            } catch (...) {
                failure = std::current_exception();
            }
            lock.lock();
            failures[i] = failure;
            done[i] = 1;
            changed.notify_all();
        }
    };

    std::exception_ptr failure;
    {
        ThreadGroup group;
        for (unsigned t = 0; t < workers; ++t) group.Start(body);
        try {
            for (std::size_t i = 0; i < count; ++i) {
                {
                    std::unique_lock lock(mutex);
                    changed.wait(lock, [&] { return done[i] != 0; });
                    if (failures[i]) std::rethrow_exception(failures[i]);
                }
                consume(i);
                {
                    std::lock_guard lock(mutex);
                    consumed = i + 1;
                }
                changed.notify_all();
            }
        } catch (...) {
            failure = std::current_exception();
        }
        {
            std::lock_guard lock(mutex);
            stop = true;
        }
        changed.notify_all();
    }
    if (failure) std::rethrow_exception(failure);
}
