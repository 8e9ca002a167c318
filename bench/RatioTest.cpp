// The figures that must hold on any machine: each is a ratio of two measured in the same run, best of several rounds.
#include "bench/HostAndFloor.h"
#include "bench/Workloads.h"
#include "broker/cimxml/Port.h"
#include "broker/http/Server.h"
#include "device/Target.h"
#include "logs/NewestLines.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_LocalHostedAccessPoint.h"
#include "schema/TVRHBA_SCSIInitiatorTargetStorageVolumePath.h"
#include "schema/TVRHBA_SCSIProtocolEndpoint.h"
#include "schema/TVRHBA_StorageVolume.h"
#include "schema/TVRHBA_StorageVolumeSystemDevice.h"
#include "tests/support/RawClient.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fstream>
#include <limits>
#include <malloc.h>
#include <optional>
#include <set>
#include <string>
#include <unistd.h>
#include <utility>

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
    // 1.3 to 2.2 on the machines that were measured; what this must catch is an allocation for each text, at 5 and
    // more.
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

// --- the SAN ---------------------------------------------------------------------------------------------

constexpr const char* volumeClass = "TVRHBA_StorageVolume";
constexpr const char* emptyClass = "TVRHBA_TapeDrive"; ///< of a host of disks: its reader waits, and gets nothing

bench::HostSize hostOfUnits(std::uint32_t units)
{
    constexpr std::uint32_t perTarget = 64;
    return {.adapters = 2, .targetsPerPort = units / perTarget / 2, .unitsPerTarget = perTarget};
}

/// Nanoseconds for which this process had a processor: other load on the machine does not count.
double processorTime()
{
    timespec now;
    clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

struct RefreshTimes
{
    double total = std::numeric_limits<double>::max(); ///< for each unit
    double libraries = 0;                              ///< of them, inside the simulated libraries
};

RefreshTimes refreshOf(std::uint32_t units, int rounds)
{
    bench::BenchHost host(hostOfUnits(units));
    RefreshTimes best;
    for (int round = 0; round < rounds; round++)
    {
        host.reload();
        host.load(emptyClass);
        host.enumerate(bench::smallClass);
        bench::BenchHost::awaitEndOfRefresh();
        const auto libraries = static_cast<double>(bench::BenchHost::nanosecondsInLibraries());
        const double before = processorTime();
        EXPECT_TRUE(host.enumerate(emptyClass).empty());
        bench::BenchHost::awaitEndOfRefresh();
        const double total = (processorTime() - before) / units;
        if (total < best.total)
            best = {total, (static_cast<double>(bench::BenchHost::nanosecondsInLibraries()) - libraries) / units};
    }
    return best;
}

struct RefreshRatios
{
    RefreshTimes small = refreshOf(1024, 100);
    RefreshTimes large = refreshOf(16384, 10);

    double growth() const { return large.total / small.total; }
    /// The module's own time against that inside the libraries.
    double own() const { return std::max(ownOf(small), ownOf(large)); }

private:
    static double ownOf(const RefreshTimes& times) { return times.total / times.libraries - 1; }
};

/// An idle machine gives 0.9 to 1.2 for the growth and 1.3 to 1.47 for the module's own time. Where instances came to
/// lie in memory, and what else runs, moves single measurements by half: hence the attempts.
TEST(Ratio, RefreshOfTheSanIsLinear)
{
    constexpr double mostGrowth = 1.5, mostOwn = 1.5;
    std::optional<RefreshRatios> ratios;
    for (int attempt = 0; attempt < 3; attempt++)
    {
        ratios.emplace();
        if (ratios->growth() <= mostGrowth && ratios->own() <= mostOwn)
            break;
    }
    for (const auto& [name, times] : {std::pair("small", ratios->small), std::pair("large", ratios->large)})
    {
        RecordProperty(std::string(name) + "_ns_a_unit", std::to_string(times.total));
        RecordProperty(std::string(name) + "_ns_in_libraries", std::to_string(times.libraries));
    }
    EXPECT_LE(ratios->growth(), mostGrowth) << ratios->large.total << " ns a unit against " << ratios->small.total;
    EXPECT_LE(ratios->own(), mostOwn) << "of " << ratios->small.total << " and " << ratios->large.total << " ns a unit";
}

struct UnitTimes
{
    double get, associatorNames, associators;
};

/// Of one volume, and of the system for each of its volumes. The processor's time, best of a few.
UnitTimes operationsAmong(std::uint32_t units)
{
    bench::BenchHost host(hostOfUnits(units));
    const broker::Path volume = host.enumerate(volumeClass).back().path;
    const broker::AssociationFilter ofUnit{.assocClass = "TVRHBA_StorageVolumeSystemDevice"};
    const broker::NamesReply system = host.broker().associatorNames(volume, ofUnit);
    EXPECT_EQ(system.paths.size(), 1u);
    const auto bestOf = [](int rounds, int calls, auto work)
    {
        double best = std::numeric_limits<double>::max();
        for (int round = 0; round < rounds; round++)
        {
            const double before = processorTime();
            for (int i = 0; i < calls; i++)
                work();
            best = std::min(best, (processorTime() - before) / calls);
        }
        return best;
    };
    return {
        .get = bestOf(20, 50, [&] { keep(host.broker().getInstance(volume).objects.size()); }),
        .associatorNames = bestOf(20, 50, [&] { keep(host.broker().associatorNames(volume, ofUnit).paths.size()); }),
        .associators =
            bestOf(units > 1024 ? 1 : 3, 1,
                   [&] { EXPECT_EQ(host.broker().associators(system.paths[0], ofUnit).objects.size(), units); }) /
            units,
    };
}

TEST(Ratio, OperationsOnAVolumeDoNotGrowWithTheSan)
{
    const UnitTimes few = operationsAmong(128);
    const UnitTimes some = operationsAmong(1024);
    const UnitTimes many = operationsAmong(16384);
    for (const auto& [size, times] : {std::pair("128", few), std::pair("1024", some), std::pair("16384", many)})
    {
        RecordProperty(std::string("get_ns_among_") + size, std::to_string(times.get));
        RecordProperty(std::string("names_ns_among_") + size, std::to_string(times.associatorNames));
        RecordProperty(std::string("associators_ns_among_") + size, std::to_string(times.associators));
    }
    EXPECT_LE(many.get, 3 * few.get) << many.get << " ns against " << few.get << " ns";
    EXPECT_LE(many.associatorNames, 3 * few.associatorNames)
        << many.associatorNames << " ns against " << few.associatorNames << " ns";
    EXPECT_LE(many.associators, 2 * some.associators)
        << many.associators << " ns a volume against " << some.associators << " ns";
}

// --- the port ---------------------------------------------------------------------------------------------

/// Bytes of this process that are in memory, now and at the most since the last call.
std::pair<std::size_t, std::size_t> memoryAndPeak()
{
    const auto kilobytes = [](const std::string& name)
    {
        std::ifstream status("/proc/self/status");
        for (std::string line; std::getline(status, line);)
            if (line.starts_with(name))
                return std::stoul(line.substr(name.size())) << 10;
        return 0ul;
    };
    const std::pair both(kilobytes("VmRSS:"), kilobytes("VmHWM:"));
    std::ofstream("/proc/self/clear_refs") << "5"; // the peak begins anew
    return both;
}

TEST(Ratio, PortCostsAtMostThreeTimesTheBrokerAndKeepsNoResult)
{
    constexpr std::uint32_t units = 16384;
    bench::BenchHost host(hostOfUnits(units));
    EXPECT_EQ(host.enumerate(volumeClass).size(), units);
    bench::BenchHost::awaitEndOfRefresh();
    const auto cost = [](auto work)
    {
        double best = std::numeric_limits<double>::max();
        for (int round = 0; round < 3; round++)
        {
            const double before = processorTime();
            work();
            best = std::min(best, processorTime() - before);
        }
        return best / 1e6;
    };
    const double inProcess = cost([&] { keep(host.enumerate(volumeClass).size()); });

    http::Server server(cimxml::site(host.broker()), {.port = 0});
    std::size_t bytes = 0;
    const auto overThePort = [&]
    {
        const RawClient client(server.port());
        client.send(httpRequest(cimMessage("EnumerateInstances", volumeClass)));
        bytes = 0;
        client.read([&](std::string_view part) { bytes += part.size(); });
    };
    malloc_trim(0);
    memoryAndPeak();
    const std::size_t before = memoryAndPeak().first;
    const double port = cost(overThePort);
    const std::size_t grown = memoryAndPeak().second - before;
    const std::size_t copy = units * TVRHBA_StorageVolume::static_meta_class.size;
    EXPECT_GT(bytes, units * 1000);
    RecordProperty("ms", std::to_string(port) + " beside " + std::to_string(inProcess));
    RecordProperty("grown_kb",
                   std::to_string(grown >> 10) + " with the module's copy of " + std::to_string(copy >> 10));
    EXPECT_LE(port, 3 * inProcess) << port << " ms against " << inProcess << " ms";
    EXPECT_LE(grown, copy + (32u << 20)) << (grown >> 20) << " MiB beside a copy of " << (copy >> 20);
}

// --- the driver's log -------------------------------------------------------------------------------------

/// Milliseconds, best of a few.
template <class Work> double milliseconds(Work work)
{
    double best = std::numeric_limits<double>::max();
    for (int round = 0; round < 5; round++)
    {
        const auto start = std::chrono::steady_clock::now();
        work();
        best =
            std::min(best, std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count());
    }
    return best;
}

/// A system log of 256 MiB in which one line in 500 is the driver's.
std::size_t writeSystemLog(const std::string& file)
{
    std::string part;
    for (int i = 0; i < 10000; i++)
        part += i % 500 == 0 ? "Nov 22 18:00:00 host kernel: tvfc 0000:08:00.0: link up, 8 Gbit/s\n"
                             : "Nov 22 18:00:00 host kernel: usb 1-1: new high-speed device number " +
                                   std::to_string(i) + " using xhci_hcd, verified after transfer of fc service\n";
    std::ofstream out(file);
    std::size_t lines = 0;
    for (std::size_t size = 0; size < 256u << 20; size += part.size(), lines += 20)
        out << part;
    return lines;
}

TEST(Ratio, TheWholeSystemLogTakesAtMostTwiceGrepsTime)
{
    const std::string file = testing::TempDir() + "messages-" + std::to_string(getpid());
    const std::size_t written = writeSystemLog(file);
    const std::string grep =
        "LC_ALL=C grep -c tvfc " + file + " | cat > /dev/null"; // into /dev/null it ends at the first
    const double greps = milliseconds([&] { EXPECT_EQ(std::system(grep.c_str()), 0); });
    const double ours = milliseconds(
        [&]
        {
            std::size_t lines = 0;
            newestLinesWith(file.c_str(), "tvfc",
                            [&](std::string_view)
                            {
                                lines++;
                                return true;
                            });
            EXPECT_EQ(lines, written);
        });
    std::remove(file.c_str());
    RecordProperty("ms", std::to_string(ours) + " beside " + std::to_string(greps) + " of grep");
    EXPECT_LE(ours, 2 * greps) << ours << " ms against " << greps << " ms";
}

/// Bytes of the texts of an object, each counted once.
std::size_t textBytes(const broker::Object& object, std::set<std::string>& counted)
{
    std::size_t bytes = 0;
    for (const auto& [name, value] : object.properties)
        if (value.type() == CMPI_string && !value.isNull() && counted.insert(value.asString()).second)
            bytes += value.asString().size();
    return bytes;
}

TEST(Ratio, UnitKeepsAtMostTwiceItsRecordsAndItsText)
{
    constexpr std::uint32_t units = 4096;
    bench::BenchHost host(hostOfUnits(units));
    host.load(emptyClass);
    host.enumerate(bench::smallClass);
    bench::BenchHost::awaitEndOfRefresh();
    const std::size_t before = bench::heapBytes();
    host.enumerate(emptyClass);
    bench::BenchHost::awaitEndOfRefresh();
    const std::size_t kept = (bench::heapBytes() - before) / units - sizeof(Target);

    const std::size_t records = TVRHBA_SCSIProtocolEndpoint::static_meta_class.size +
                                TVRHBA_StorageVolume::static_meta_class.size +
                                TVRHBA_LocalHostedAccessPoint::static_meta_class.size +
                                TVRHBA_StorageVolumeSystemDevice::static_meta_class.size +
                                TVRHBA_SCSIInitiatorTargetStorageVolumePath::static_meta_class.size;
    std::set<std::string> counted;
    std::size_t texts = 0;
    for (const char* className : {volumeClass, "TVRHBA_SCSIProtocolEndpoint"})
        texts += textBytes(host.enumerate(className).back(), counted);
    RecordProperty("kept", std::to_string(kept) + " of " + std::to_string(records) + " and " + std::to_string(texts));
    EXPECT_GE(kept, records) << "all were counted";
    EXPECT_LE(kept, 2 * records + texts) << kept << " bytes of " << records << " of records and " << texts
                                         << " of text";
}

} // namespace
