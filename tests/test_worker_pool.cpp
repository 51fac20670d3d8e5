#include <gtest/gtest.h>

#include <atomic>
#include <mutex>
#include <stdexcept>
#include <vector>

#include "ZonCloudWorkerPool.h"

TEST(WorkerPool, RunDoesEveryItemOnceAndRethrowsTheLowestFailure)
{
    for (unsigned threads : {1u, 2u, 5u}) {
        std::vector<std::atomic<int>> seen(1000);
        ZonCloudWorkerPool::Run(seen.size(), [&](std::size_t i) { ++seen[i]; }, threads);
        for (auto& count : seen) EXPECT_EQ(count.load(), 1);

        try {
            ZonCloudWorkerPool::Run(
                100,
                [](std::size_t i) {
                    if (i == 7 || i == 60) throw std::runtime_error(std::to_string(i));
                },
                threads);
            FAIL() << "no failure";
        } catch (const std::runtime_error& e) {
            // Items run in index order on one thread and are taken in order by several.
            EXPECT_EQ(std::string(e.what()), "7");
        }
    }
}

TEST(WorkerPool, OrderedConsumesInOrderWithinTheWindow)
{
    for (unsigned threads : {1u, 2u, 4u}) {
        std::mutex mutex;
        std::size_t consumed = 0, worst = 0;
        std::vector<std::size_t> order;
        ZonCloudWorkerPool::Ordered(
            200,
            [&](std::size_t i) {
                std::lock_guard lock(mutex);
                worst = std::max(worst, i + 1 - consumed);
            },
            [&](std::size_t i) {
                std::lock_guard lock(mutex);
                order.push_back(i);
                consumed = i + 1;
            },
            3, threads);
        ASSERT_EQ(order.size(), 200u);
        for (std::size_t i = 0; i < order.size(); ++i) EXPECT_EQ(order[i], i);
        EXPECT_LE(worst, 3u) << threads << " threads";
    }
}

TEST(WorkerPool, OrderedConsumesEverythingBeforeAFailedItem)
{
    std::vector<std::size_t> order;
    EXPECT_THROW(ZonCloudWorkerPool::Ordered(
                     50,
                     [](std::size_t i) {
                         if (i == 20) throw std::runtime_error("work");
                     },
                     [&](std::size_t i) { order.push_back(i); }, 4, 3),
                 std::runtime_error);
    EXPECT_EQ(order.size(), 20u);
    order.clear();
    EXPECT_THROW(ZonCloudWorkerPool::Ordered(
                     50, [](std::size_t) {},
                     [&](std::size_t i) {
                         if (i == 5) throw std::runtime_error("consume");
                         order.push_back(i);
                     },
                     4, 3),
                 std::runtime_error);
    EXPECT_EQ(order.size(), 5u);
}
