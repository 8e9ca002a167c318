// Answers that are kept: how long, how many, and who waits for whom.
#include "broker/web/Kept.h"

#include <gtest/gtest.h>

#include <atomic>
#include <latch>
#include <stdexcept>
#include <thread>
#include <vector>

using namespace std::chrono_literals;

namespace
{

struct Sized
{
    int value;
    std::size_t size = 1;

    std::size_t bytes() const { return size; }
};

class KeptAnswers : public testing::Test
{
protected:
    /// What is there for the key; makes another than before where nothing is.
    int get(const std::string& key, std::size_t size = 1)
    {
        return kept.get(key, 10s, [&] { return std::make_shared<Sized>(Sized{++made, size}); })->value;
    }

    std::chrono::steady_clock::time_point now = {};
    int made = 0;
    web::Kept<Sized> kept{{.number = 2, .bytes = 100}, [this] { return now; }};
};

TEST_F(KeptAnswers, LiveAsLongAsTheyAreSaidToAndNoLonger)
{
    EXPECT_EQ(get("a"), 1);
    now += 9999ms;
    EXPECT_EQ(get("a"), 1);
    EXPECT_EQ(get("b"), 2);
    now += 1ms;
    EXPECT_EQ(get("a"), 3);
    EXPECT_EQ(get("b"), 2);
    kept.drop();
    EXPECT_EQ(get("b"), 4);
}

TEST_F(KeptAnswers, HaveNoMoreRoomThanTheyAreGiven)
{
    get("a");
    now += 1s;
    get("b");
    now += 1s;
    get("c"); // the oldest goes
    EXPECT_EQ(get("b"), 2);
    EXPECT_EQ(get("c"), 3);
    EXPECT_EQ(get("a"), 4);

    kept.drop();
    EXPECT_EQ(get("half", 50), 5);
    now += 1s;
    EXPECT_EQ(get("rest", 50), 6);
    EXPECT_EQ(get("half", 50), 5);
    EXPECT_EQ(get("huge", 101), 7) << "is given, and not kept";
    EXPECT_EQ(get("huge", 101), 8);
}

TEST_F(KeptAnswers, AreMadeOnceForAllWhoAskTogether)
{
    constexpr int askers = 4;
    std::latch begun(1), end(1);
    std::atomic<int> values = 0;
    std::vector<std::thread> threads;
    threads.emplace_back(
        [&]
        {
            values += kept.get("a", 10s,
                               [&]
                               {
                                   begun.count_down();
                                   end.wait();
                                   return std::make_shared<Sized>(Sized{++made});
                               })
                          ->value;
        });
    begun.wait();
    for (int i = 1; i < askers; i++)
        threads.emplace_back(
            [&] { values += kept.get("a", 10s, [] { return std::make_shared<Sized>(Sized{100}); })->value; });
    end.count_down();
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(values, askers);
}

TEST_F(KeptAnswers, ThatAreMadeAcrossAChangeAreNotKept)
{
    const int old = kept.get("a", 10s,
                             [&]
                             {
                                 kept.drop();
                                 EXPECT_EQ(get("a"), 1) << "who comes later does not wait for the old";
                                 return std::make_shared<Sized>(Sized{77});
                             })
                        ->value;
    EXPECT_EQ(old, 77);
    EXPECT_EQ(get("a"), 1) << "nor is it put in the place of the new";
}

TEST_F(KeptAnswers, ThatFailAreNotKept)
{
    const auto fail = []() -> std::shared_ptr<Sized> { throw std::runtime_error("no answer"); };
    EXPECT_THROW(kept.get("a", 10s, fail), std::runtime_error);
    EXPECT_EQ(get("a"), 1);
}

} // namespace
