// The agent's life: when it refreshes, how it ends, and what it leaves behind.
#include "tests/module/Clock.h"
#include "tests/module/Host.h"
#include "tests/module/HostNames.h"
#include "tests/module/Process.h"
#include "tests/module/RefreshLines.h"
#include "tests/support/Sanitized.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <dlfcn.h>
#include <fstream>
#include <functional>
#include <future>
#include <optional>
#include <sys/inotify.h>
#include <thread>

using namespace module_test;
using namespace std::chrono_literals;

namespace
{

constexpr const char* settingsFile = "/etc/tavrin_fc_provider.conf";
constexpr const char* notDue = "[TVR_DBG] PERF: ---No timeout BuildCimpleInfo END---";
constexpr const char* joining = "[TVR_DBG] PERF: Clearing the previous thread...with join";

constexpr const char* defaultSettings = "##################################################\n"
                                        "# Tavrin HBA CIM Provider Configuration Settings #\n"
                                        "##################################################\n"
                                        "TVR_PROVIDER_CACHE_TIMEOUT = 10\n"
                                        "TVR_PROVIDER_REFRESH_ADAPTERDATA = FALSE\n"
                                        "TVR_PROVIDER_REFRESH_SANDATA = TRUE\n";

bool isMapped()
{
    void* module = dlopen(TVR_MODULE_FILE, RTLD_NOW | RTLD_NOLOAD);
    if (module)
        dlclose(module);
    return module != nullptr;
}

std::size_t positionOf(const std::vector<std::string>& log, const std::string& line)
{
    return static_cast<std::size_t>(std::ranges::find(log, line) - log.begin());
}

std::future<std::size_t> countInBackground(Host& host, const char* className)
{
    return std::async(std::launch::async, [&host, className] { return host.instancesOf(className).size(); });
}

TEST(Refresh, FirstEnumerationWaitsForTheAdaptersAndTheNextFindsThemThere)
{
    Host host;
    host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": "adapters"})");
    host.broker();
    auto first = countInBackground(host, "TVRHBA_Card");
    ASSERT_TRUE(host.awaitGate("adapters"));
    auto second = countInBackground(host, "TVRHBA_Chip");
    ASSERT_TRUE(host.awaitLog(running));
    EXPECT_EQ(first.wait_for(0s), std::future_status::timeout);
    EXPECT_EQ(second.wait_for(0s), std::future_status::timeout);
    EXPECT_EQ(host.logged("[TVR_DBG] TVRHBA_"), 0u) << "an answer before the adapters were known";

    host.openGate("adapters");
    EXPECT_EQ(first.get(), 2u);
    EXPECT_EQ(second.get(), 2u);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    EXPECT_EQ(host.logged(created), 1u);
    EXPECT_EQ(host.logged(begun), 1u);
    EXPECT_EQ(host.logged(running), 1u);
    EXPECT_EQ(host.logged(notDue), 1u);
    host.unload();
}

TEST(Refresh, CacheIsValidForTheMinutesOfItsSettingFromTheEndOfARun)
{
    struct Row
    {
        const char* name;
        const char* setting;
        std::chrono::microseconds after;
        bool refreshes;
    };
    constexpr Row rows[] = {
        {"a moment before", "", 10min - 1us, false},
        {"a second before", "", 9min + 59s, false},
        {"at the minute", "", 10min, true},
        {"shortest, before", "TVR_PROVIDER_CACHE_TIMEOUT = 1", 59s, false},
        {"shortest, at", "TVR_PROVIDER_CACHE_TIMEOUT = 1", 1min, true},
        {"longest, before", "TVR_PROVIDER_CACHE_TIMEOUT = 30", 30min - 1us, false},
        {"longest, at", "TVR_PROVIDER_CACHE_TIMEOUT = 30", 30min, true},
        {"age of more than 32 bits", "", std::chrono::microseconds((std::int64_t{1} << 32) + 1), true},
        {"clock set back", "", -1us, true},
    };
    stopClock();
    for (const Row& row : rows)
    {
        SCOPED_TRACE(row.name);
        Host host;
        host.write(settingsFile, row.setting);
        host.instancesOf("TVRHBA_Card");
        ASSERT_TRUE(host.awaitRefresh());

        advanceClock(row.after);
        EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
        EXPECT_EQ(host.logged(created), row.refreshes ? 2u : 1u);
        EXPECT_EQ(host.logged(notDue), row.refreshes ? 0u : 1u);
        EXPECT_TRUE(host.awaitRefresh(row.refreshes ? 2 : 1));
        host.unload();
    }
}

TEST(Refresh, ReadersOfTheNextRunWaitForItsAdapters)
{
    stopClock();
    Host host;
    host.instancesOf("TVRHBA_Card");
    ASSERT_TRUE(host.awaitRefresh());
    host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": "adapters"})");
    host.addFault(R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV3202-1", "status": 1})");
    advanceClock(10min);

    auto starter = countInBackground(host, "TVRHBA_PCIDevice");
    ASSERT_TRUE(host.awaitGate("adapters"));
    auto reader = countInBackground(host, "TVRHBA_PhysicalConnector");
    ASSERT_TRUE(host.awaitLog(running));
    EXPECT_EQ(reader.wait_for(0s), std::future_status::timeout);
    host.openGate("adapters");
    EXPECT_EQ(reader.get(), 3u);
    starter.get();
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 3u);
    host.unload();
}

TEST(Refresh, FabricIsScannedWhenTheSettingOrAReaderAsksForIt)
{
    Host host;
    host.write(settingsFile, "TVR_PROVIDER_REFRESH_SANDATA = FALSE");
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.calls("HBA_GetFcpTargetMapping"), 0u) << "a fabric that nobody asked for";

    // A reader of the fabric asks for it, and only for it.
    host.instancesOf("TVRHBA_LogicalDisk");
    ASSERT_TRUE(host.awaitRefresh(2));
    EXPECT_EQ(host.calls("HBA_GetFcpTargetMapping"), 4u);
    EXPECT_EQ(host.calls("HBA_GetNumberOfAdapters"), 1u);
    host.unload();
}

/// A reader that asks for the fabric when the running refresh has passed its stage may be the last to come.
TEST(Refresh, FabricIsScannedForAReaderThatComesLate)
{
    stopClock();
    Host host;
    host.write(settingsFile, "TVR_PROVIDER_REFRESH_SANDATA = FALSE");
    host.broker();
    for (unsigned round = 0; round < 60; ++round)
    {
        advanceClock(10min);
        auto card = countInBackground(host, "TVRHBA_Card");
        auto disk = countInBackground(host, "TVRHBA_LogicalDisk");
        card.get();
        ASSERT_EQ(disk.wait_for(20s), std::future_status::ready) << "round " << round;
    }
    host.unload();
}

TEST(Life, SettingsAreWrittenOnceAtTheEndAndReadAgainAtTheNextLoad)
{
    Host host;
    FolderWatch written(host.root() / "etc", IN_MOVED_TO | IN_CLOSE_WRITE);
    host.instancesOf("TVRHBA_Card");
    EXPECT_FALSE(std::filesystem::exists(host.root().string() + settingsFile));
    host.unload();
    EXPECT_EQ(host.read(settingsFile), defaultSettings);
    EXPECT_TRUE(written.wait(0));
    EXPECT_EQ(written.changes("tavrin_fc_provider.conf"), 1u);
    EXPECT_TRUE(isMapped()) << "threads that are inside it could not be waited for in dlclose";

    // Cleaned up by a server that keeps the library open: the next use starts anew all the same.
    for (const char* minutes : {"3", "20"})
    {
        host.write(settingsFile, std::string("TVR_PROVIDER_CACHE_TIMEOUT=") + minutes);
        EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
        EXPECT_TRUE(std::ranges::any_of(host.log(), [&](const std::string& line)
                                        { return line.ends_with(std::string("cache timeout = ") + minutes); }));
        host.broker().cleanup("", true);
        EXPECT_THAT(host.read(settingsFile), testing::HasSubstr(std::string("TIMEOUT = ") + minutes + "\n"));
    }
    EXPECT_EQ(host.logged("[TVR_INFO] Tavrin Provider v10.2.261-13 Loaded[" + std::to_string(getpid()) + "]"), 3u);
    EXPECT_EQ(host.calls("LRM_InitLib"), 3u);
    EXPECT_EQ(host.calls("LRM_ExitLib"), 0u);
    host.unload();
}

TEST(Life, CountOfReferencesIsThatOfTheLoadedClasses)
{
    Host host;
    for (const char* name : {"TVRHBA_Card", "TVRHBA_Chip", "TVRHBA_Product"})
        host.instancesOf(name);
    ASSERT_TRUE(host.awaitRefresh());
    for (const char* name : {"TVRHBA_Card", "TVRHBA_Product"})
        host.broker().cleanup(name, true);
    for (const char* line : {"addRef[0]", "addRef[1]", "addRef[2]", "releaseRef[3]", "releaseRef[2]"})
        EXPECT_EQ(host.logged(std::string("[TVR_DBG] ProviderAgent::") + line), 1u) << line;
    EXPECT_EQ(semaphoresOf(getpid()), 2u) << "the agent lives on";
    host.broker().cleanup("TVRHBA_Chip", true);
    EXPECT_EQ(semaphoresOf(getpid()), 0u);
    EXPECT_EQ(host.read(settingsFile), defaultSettings);
    host.unload();
}

/// A refresh that stands in a library while no reader waits for it, and what the end of the module must make of it.
class HeldRefresh
{
public:
    explicit HeldRefresh(Host& host) : _host(host) {}

    /// Loads the module and holds its second refresh at a gate.
    void begin()
    {
        EXPECT_EQ(_host.instancesOf("TVRHBA_Chip").size(), 2u);
        EXPECT_EQ(_host.instancesOf("TVRHBA_Card").size(), 2u);
        ASSERT_TRUE(_host.awaitRefresh());
        _host.openGate("adapters"); // the control function is at hand from now on
        bool held = false;
        for (std::size_t attempt = 1; attempt <= 100 && !held; ++attempt)
            held = startRefresh(attempt + 1);
        ASSERT_TRUE(held) << "every reader came after the refresh that it had started";
    }

    /// Opens the gate in the background, once the end of the module waits for the refresh.
    std::thread openWhenJoined()
    {
        return std::thread(
            [&host = _host, joins = _host.logged(joining) + 1]
            {
                EXPECT_TRUE(host.awaitLog(joining, joins));
                host.openGate("adapters");
            });
    }

    void expectCleanEnd(int process) const
    {
        std::vector<std::string> log = _host.log();
        std::ranges::reverse(log);
        EXPECT_LT(positionOf(log, ended), positionOf(log, joining));
        EXPECT_EQ(_host.logged(begun), _host.logged(ended));
        EXPECT_EQ(_host.logged("[TVR_DBG] PERF: Updating Adapter Maps..."), _host.logged(ended) - 1)
            << "work for nobody";
        EXPECT_EQ(semaphoresOf(process), 0u);
        EXPECT_EQ(_host.read(settingsFile), defaultSettings);
    }

private:
    /// True if the reader that starts the refresh has its copy before the refresh locks the data.
    bool startRefresh(std::size_t refresh)
    {
        _host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": "adapters"})");
        advanceClock(10min);
        auto reader = countInBackground(_host, "TVRHBA_Chip");
        EXPECT_TRUE(_host.awaitGate("adapters"));
        if (reader.wait_for(100ms) == std::future_status::ready)
            return true;
        _host.openGate("adapters");
        reader.get();
        EXPECT_TRUE(_host.awaitRefresh(refresh));
        return false;
    }

    Host& _host;
};

TEST(Life, LastCleanupWaitsForTheRefresh)
{
    Host host;
    FolderWatch written(host.root() / "etc", IN_MOVED_TO | IN_CLOSE_WRITE);
    HeldRefresh held(host);
    ASSERT_NO_FATAL_FAILURE(held.begin());
    std::thread opener = held.openWhenJoined();
    host.unload();
    opener.join();
    held.expectCleanEnd(getpid());
    EXPECT_TRUE(written.wait(0));
    EXPECT_EQ(written.changes("tavrin_fc_provider.conf"), 1u);
}

/// A server that calls fewer cleanups than it made providers closes the library while a refresh stands in it, and the
/// refresh needs the loader to end. The module lives on, serves on when it is opened again, and ends with the process.
TEST(Life, LibraryClosedWithFewerCleanupsServesOnAndEndsWithTheProcess)
{
    Host host;
    EXPECT_EQ(inChild(
                  [&]
                  {
                      std::ofstream(host.root() / "pid") << getpid();
                      host.options.personality.cleanupCalls = broker::CleanupCalls::last_of_kind;
                      setHostNames(
                          {.resolving = [] { EXPECT_NE(dlopen("libresolv.so.2", RTLD_NOW), nullptr) << dlerror(); }});
                      HeldRefresh held(host);
                      ASSERT_NO_FATAL_FAILURE(held.begin());
                      std::thread opener(
                          [&]
                          {
                              EXPECT_TRUE(host.awaitLog("[TVR_DBG] ProviderAgent::releaseRef"));
                              host.openGate("adapters");
                          });
                      host.broker().unload();
                      opener.join();
                      ASSERT_TRUE(host.awaitRefresh(2));
                      EXPECT_FALSE(std::filesystem::exists(host.root().string() + settingsFile));
                      host.setBrokerAside();

                      EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
                      EXPECT_EQ(host.calls("LRM_InitLib"), 1u);
                      EXPECT_EQ(semaphoresOf(getpid()), 2u);
                  }),
              0);
    int process = 0;
    std::ifstream(host.root() / "pid") >> process;
    EXPECT_EQ(semaphoresOf(process), 0u);
    EXPECT_EQ(host.read(settingsFile), defaultSettings);
}

TEST(Life, ProcessThatExitsWithTheAgentAliveEndsIt)
{
    Host host;
    HeldRefresh held(host);
    FolderWatch written(host.root() / "etc", IN_MOVED_TO | IN_CLOSE_WRITE);
    EXPECT_EQ(inChild(
                  [&]
                  {
                      std::ofstream(host.root() / "pid") << getpid();
                      ASSERT_NO_FATAL_FAILURE(held.begin());
                      EXPECT_EQ(semaphoresOf(getpid()), 2u);
                      held.openWhenJoined().detach();
                  }),
              0);
    int process = 0;
    std::ifstream(host.root() / "pid") >> process;
    held.expectCleanEnd(process);
    EXPECT_TRUE(written.wait(0));
    EXPECT_EQ(written.changes("tavrin_fc_provider.conf"), 1u);
}

/// A library of the hardware, or a module of the resolver, that gives up the process ends it on the refresh's own
/// thread.
TEST(Life, RefreshThreadMayExit)
{
    Host host;
    EXPECT_EQ(inChild(
                  [&]
                  {
                      alarm(60); // a child that hangs is ended by it
                      std::ofstream(host.root() / "pid") << getpid();
                      setHostNames({.resolving = [] { std::exit(0); }});
                      host.enumerate("TVRHBA_Card");
                  }),
              0);
    int process = 0;
    std::ifstream(host.root() / "pid") >> process;
    EXPECT_EQ(semaphoresOf(process), 0u);
    EXPECT_EQ(host.read(settingsFile), defaultSettings);
}

TEST(Life, ProcessMayExitWithClientsInside)
{
    for (unsigned round = 0; round < 3; ++round)
    {
        Host host;
        EXPECT_EQ(inChild(
                      [&]
                      {
                          alarm(60);
                          host.broker();
                          std::atomic<unsigned> answers{0};
                          for (unsigned client = 0; client < 8; ++client)
                              std::thread(
                                  [&]
                                  {
                                      for (;; ++answers)
                                          host.enumerate(answers % 2 ? "TVRHBA_FCPort" : "TVRHBA_Card");
                                  })
                                  .detach();
                          while (answers < 200)
                              std::this_thread::yield();
                          std::exit(0);
                      }),
                  0);
        EXPECT_EQ(host.read(settingsFile), defaultSettings);
    }
}

/// Servers fork helpers, which end by exit() as often as not.
TEST(Life, ChildOfAForkEndsNothingOfItsParent)
{
    stopClock();
    Host host;
    HeldRefresh held(host);
    ASSERT_NO_FATAL_FAILURE(held.begin());
    const std::function<void()> children[] = {[] {}, [&] { host.broker().unload(); }};
    for (const auto& child : children)
    {
        EXPECT_EQ(inChild(
                      [&]
                      {
                          alarm(60); // a child that hangs is ended by it
                          passOverLeaks();
                          child();
                      }),
                  0);
        EXPECT_EQ(semaphoresOf(getpid()), 2u);
        EXPECT_FALSE(std::filesystem::exists(host.root().string() + settingsFile));
    }
    host.openGate("adapters");
    ASSERT_TRUE(host.awaitLog(ended, host.logged(begun)));
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    host.unload();
    EXPECT_EQ(host.read(settingsFile), defaultSettings);
}

constexpr bool sanitized = TVR_SANITIZED;
#if TVR_SANITIZED
constexpr unsigned rounds = 40;
#elif defined(__OPTIMIZE__)
constexpr unsigned rounds = 1000;
#else
constexpr unsigned rounds = 250;
#endif

/// Loads and unloads the library itself every time: a thousand times when optimised, 250 times when not, 40 times under
/// a sanitizer. All logs are on, the runtime's too.
TEST(Life, AThousandRoundsLeaveTheProcessAsItWas)
{
    Host host;
    host.write("/.cimplerc", "LOG_LEVEL = DBG\n");
    setenv("CIMPLE_HOME", host.root().c_str(), 1);
    const std::string log = (host.root() / "provider.log").string();
    const auto round = [&]
    {
        host.write("/etc/tavrin_fc_provider.dmp", "4,5,1\n" + log);
        std::ofstream(log).close(); // empty, or it would grow over all rounds
        ASSERT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
        host.unload();
    };
    // Until the log's ring of 1,024 entries is full, to which each round adds; a few rounds fit the bound without that.
    for (unsigned i = 0; i < (sanitized ? 20 : 350); ++i)
        ASSERT_NO_FATAL_FAILURE(round());
    const Footprint before = Footprint::take();
    for (unsigned i = 0; i < rounds; ++i)
        ASSERT_NO_FATAL_FAILURE(round());
    const Footprint after = Footprint::take(before.threads);
    EXPECT_EQ(after.threads, before.threads);
    EXPECT_EQ(after.descriptors, before.descriptors);
    EXPECT_EQ(after.semaphores, 0u);
    // Less than the smallest block a round, and what the C library keeps once, however many the rounds: 16 to 25 KB.
    EXPECT_LT(after.heap, before.heap + rounds * 24 + 26000);
    EXPECT_TRUE(sanitized || after.resident < before.resident + (2u << 20))
        << before.resident << " to " << after.resident;
    EXPECT_GT(std::filesystem::file_size(host.root() / ".cimple" / "messages"), 0u);
}

TEST(Life, LibraryThatDoesNotInitialiseGivesAnEmptyModule)
{
    Host host;
    host.addFault(R"({"function": "LRM_InitLib", "status": 1, "to": 1})");
    EXPECT_TRUE(host.instancesOf("TVRHBA_Card").empty());
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_TRUE(host.instancesOf("TVRHBA_LogicalDisk").empty());
    EXPECT_TRUE(host.instancesOf("TVRHBA_PortController").empty());
    const std::size_t asked = host.logged("[TVR_INFO]  Entering BuildCimpleInfo()");
    EXPECT_TRUE(host.instancesOf("TVRHBA_FCPort").empty());
    EXPECT_EQ(host.logged("[TVR_INFO]  Entering BuildCimpleInfo()"), asked) << "the active form answers at once";

    EXPECT_EQ(host.logged("[TVR_CRIT] Error : Initialization of RMLib:: RM_InitLib failed with[1]"), 1u);
    EXPECT_EQ(host.logged("[TVR_ERR] Tavrin CIM Provider load failure"), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] RM Init failed for TVRHBA_FCPort"), 1u);
    EXPECT_GE(host.logged("[TVR_DBG] Tavrin Provider dependent library load has failed..do nothing is the only option"),
              3u);
    EXPECT_EQ(host.logged("[TVR_DBG] ProviderAgent::addRef"), 0u) << "a load that failed takes no reference";
    EXPECT_EQ(host.calls("HBA_GetNumberOfAdapters"), 0u);
    EXPECT_EQ(semaphoresOf(getpid()), 0u);
    host.unload();
    EXPECT_EQ(host.read(settingsFile), defaultSettings);

    // The library recovers, the server loads again.
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    host.unload();
}

} // namespace
