// The figures that must hold on any machine: each is a ratio of two measured in the same run, best of several rounds.
#include "bench/HostAndFloor.h"
#include "bench/Workloads.h"
#include "schema/TVRHBA_Card.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <limits>

using namespace cimple;

namespace
{

template <class T> void keep(const T& value)
{
    asm volatile("" : : "r,m"(value) : "memory");
}

/// Nanoseconds of one call: the best of many short rounds, so that other load on the machine does not count.
template <class Work> double nanoseconds(int calls, Work work)
{
    double best = std::numeric_limits<double>::max();
    for (int round = 0; round < 60; round++)
    {
        const auto start = std::chrono::steady_clock::now();
        for (int i = 0; i < calls; i++)
            work();
        const std::chrono::duration<double, std::nano> took = std::chrono::steady_clock::now() - start;
        best = std::min(best, took.count() / calls);
    }
    return best;
}

TEST(Ratio, KeyCompareStaysNearItsStringCompares)
{
    const auto a = bench::makePort(1);
    const auto b = bench::makePort(2);
    const double bare = nanoseconds(2000,
                                    [&]
                                    {
                                        keep(a->SystemCreationClassName.value == b->SystemCreationClassName.value);
                                        keep(a->SystemName.value == b->SystemName.value);
                                        keep(a->CreationClassName.value == b->CreationClassName.value);
                                        keep(a->DeviceID.value == b->DeviceID.value);
                                    });
    const double keys = nanoseconds(2000, [&] { keep(key_eq(a.get(), b.get())); });
    RecordProperty("bare_ns", std::to_string(bare));
    RecordProperty("key_eq_ns", std::to_string(keys));
    EXPECT_LE(keys, 4 * bare) << keys << " ns against " << bare << " ns";
}

double insertInto(std::size_t size)
{
    Instance_Map map(&TVRHBA_FCPort::static_meta_class);
    for (std::size_t i = 0; i < size; i++)
        map.insert(bench::makePort(i).release());
    Instance* extra = bench::makePort(size).release();
    const double took = nanoseconds(500,
                                    [&]
                                    {
                                        map.insert(extra);
                                        extra = map.remove_at(size);
                                    });
    unref(extra);
    return took;
}

TEST(Ratio, InsertIntoALargeMapIsOneTightPass)
{
    const double small = insertInto(128);
    const double large = insertInto(16384);
    EXPECT_LE(large, 40 * small) << large << " ns against " << small << " ns";
}

TEST(Ratio, CloneCostsWhatItCannotAvoid)
{
    const auto card = bench::makeCard(1);
    const bench::CloneFloor floor(card.get());
    const double least = nanoseconds(1000, [&] { floor.run(); });
    const double cloned = nanoseconds(1000, [&] { unref(clone(card.get())); });
    // 1.3 to 2.2 on the machines that were measured; what this must catch is an allocation for each text, at 5 and more.
    EXPECT_LE(cloned, 3 * least) << cloned << " ns against " << least << " ns";
}

// --- a client's operations --------------------------------------------------------------------------------

TEST(Ratio, GetAmong64CostsAtMostTwiceItsFloor)
{
    bench::HostAndFloor both({.adapters = 64}, TVRHBA_Card::static_meta_class, bench::cardsOf);
    const broker::Path& card = both.known().back().path;
    const auto nanosecondsAt = [&](broker::Broker& broker)
    {
        EXPECT_TRUE(broker.getInstance(card).ok());
        return nanoseconds(100, [&] { keep(broker.getInstance(card).objects.size()); });
    };
    const double floor = nanosecondsAt(both.floor());
    const double got = nanosecondsAt(both.host());
    EXPECT_LE(got, 2 * floor) << got << " ns against " << floor << " ns";
}

TEST(Ratio, NamesCostLittleMoreThanTheirFloor)
{
    bench::HostAndFloor both({.adapters = 64}, TVRHBA_Card::static_meta_class, bench::cardsOf);
    const auto nanosecondsAt = [&](broker::Broker& broker)
    {
        EXPECT_EQ(broker.enumerateInstanceNames(bench::benchNamespace, bench::cardClass).paths.size(), 64u);
        return nanoseconds(
            10, [&] { keep(broker.enumerateInstanceNames(bench::benchNamespace, bench::cardClass).paths.size()); });
    };
    const double floor = nanosecondsAt(both.floor());
    const double names = nanosecondsAt(both.host());
    EXPECT_LE(names, 1.8 * floor) << names << " ns against " << floor << " ns";
}

struct SearchTimes
{
    double get, associatorNames;
};

SearchTimes searchAmong(std::uint32_t cards)
{
    bench::BenchHost host({.cards = cards});
    const broker::Path card = bench::lastCardOf(host).front().path;
    const broker::AssociationFilter filter{.assocClass = bench::associationClass};
    EXPECT_EQ(host.broker().associatorNames(card, filter).paths.size(), 1u);
    return {
        nanoseconds(100, [&] { keep(host.broker().getInstance(card).objects.size()); }),
        nanoseconds(100, [&] { keep(host.broker().associatorNames(card, filter).paths.size()); }),
    };
}

TEST(Ratio, SearchesInALargeMapAreOneTightPass)
{
    const SearchTimes small = searchAmong(128);
    const SearchTimes large = searchAmong(16384);
    EXPECT_LE(large.get, 3 * small.get) << large.get << " ns against " << small.get << " ns";
    EXPECT_LE(large.associatorNames, 3 * small.associatorNames)
        << large.associatorNames << " ns against " << small.associatorNames << " ns";
}

} // namespace
