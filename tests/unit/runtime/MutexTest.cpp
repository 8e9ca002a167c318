// Who holds a mutex, as its own threads see it.
#include "runtime/threads/Thread.h"

#include <gtest/gtest.h>

#include <thread>

using namespace cimple;

namespace
{

bool isMineElsewhere(const Mutex& mutex)
{
    bool mine = true;
    std::thread([&] { mine = mutex.isMine(); }).join();
    return mine;
}

TEST(Mutex, IsOfTheThreadThatHoldsIt)
{
    for (const bool recursive : {false, true})
    {
        Mutex mutex(recursive);
        EXPECT_FALSE(mutex.isMine());
        mutex.lock();
        if (recursive)
        {
            EXPECT_EQ(mutex.try_lock(), 0);
            mutex.unlock();
        }
        EXPECT_TRUE(mutex.isMine());
        EXPECT_FALSE(isMineElsewhere(mutex));
        {
            const Auto_Unlock released(mutex);
            EXPECT_FALSE(mutex.isMine());
            std::thread(
                [&]
                {
                    const Auto_Mutex lock(mutex);
                    EXPECT_TRUE(mutex.isMine());
                })
                .join();
            EXPECT_FALSE(mutex.isMine());
        }
        EXPECT_TRUE(mutex.isMine());
        mutex.unlock();
        EXPECT_FALSE(mutex.isMine());
    }
}

/// A thread that waits has none, and has it again behind the wait.
TEST(Mutex, IsNobodysWhileItsHolderWaits)
{
    Mutex mutex;
    Condition condition;
    bool waits = false, mineBehind = false, over = false;
    std::thread waiting(
        [&]
        {
            const Auto_Mutex lock(mutex);
            waits = true;
            while (!over)
                condition.wait(mutex);
            mineBehind = mutex.isMine();
        });
    for (bool seen = false; !seen;)
    {
        const Auto_Mutex lock(mutex);
        seen = waits;
        EXPECT_TRUE(mutex.isMine());
        over = seen;
        condition.signal();
    }
    waiting.join();
    EXPECT_TRUE(mineBehind);
    EXPECT_FALSE(mutex.isMine());
}

} // namespace
