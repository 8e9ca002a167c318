// Threads of a port: as many as are at work, and what becomes of the work where there are none or no memory.
#include "broker/http/Workers.h"
#include "tests/support/NoMemory.h"

#include <gtest/gtest.h>

#include <atomic>
#include <latch>
#include <new>
#include <set>
#include <stdexcept>
#include <thread>

using http::Workers;
using test_support::NoMemory;

namespace
{

TEST(Workers, ThoseAtWorkAreAsManyAsAreNeeded)
{
    std::mutex mutex;
    std::set<std::thread::id> threads;
    std::atomic<int> done = 0;
    {
        Workers workers(3);
        std::latch together(3), end(1);
        for (int i = 0; i < 3; i++)
            ASSERT_TRUE(workers.give(
                [&]
                {
                    together.arrive_and_wait();
                    end.wait();
                    const std::lock_guard lock(mutex);
                    threads.insert(std::this_thread::get_id());
                    throw std::runtime_error("ends this work alone");
                }));
        together.wait();
        EXPECT_FALSE(workers.full());
        for (int i = 0; i < 3; i++)
            ASSERT_TRUE(workers.give([&] { done++; }));
        EXPECT_TRUE(workers.full());
        EXPECT_EQ(done, 0);
        end.count_down();
    }
    EXPECT_EQ(threads.size(), 3U);
    EXPECT_EQ(done, 3);
}

TEST(Workers, RefusedThreadsAndMemoryLoseNoWorkThatWasTaken)
{
    std::atomic<int> done = 0;
    int taken = 0;
    {
        Workers workers(4);
        for (std::size_t n = 0; n < 12; n++)
        {
            const auto work = [&] { done++; };
            const NoMemory memory(n, 2);
            try
            {
                taken += workers.give(work) ? 1 : 0;
            }
            catch (const std::bad_alloc&)
            {}
        }
    }
    EXPECT_EQ(done, taken);
    EXPECT_GT(taken, 0);
    EXPECT_LT(taken, 12);
}

TEST(Workers, OneThreadDoesTheWorkOfThoseThatAreRefused)
{
    std::atomic<int> done = 0;
    {
        Workers workers(4);
        std::latch first(1), end(1);
        ASSERT_TRUE(workers.give(
            [&]
            {
                first.count_down();
                end.wait();
            }));
        first.wait();
        for (int i = 0; i < 3; i++)
        {
            Workers::Work work = [&] { done++; };
            const NoMemory memory(0, 1); // the thread's is the first that is asked for
            EXPECT_TRUE(workers.give(std::move(work)));
            EXPECT_EQ(memory.refused(), 1U);
        }
        end.count_down();
    }
    EXPECT_EQ(done, 3);
}

} // namespace
