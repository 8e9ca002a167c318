// Refreshes that cannot start, or do not reach their end, and lives at the limits of the process.
#include "tests/module/Clock.h"
#include "tests/module/Host.h"
#include "tests/module/HostNames.h"
#include "tests/module/RefreshLines.h"
#include "tests/module/Threads.h"
#include "tests/support/Sanitized.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <csignal>
#include <stdexcept>
#include <sys/resource.h>
#include <unistd.h>

using namespace module_test;
using namespace std::chrono_literals;

namespace
{

constexpr const char* noThread = "[TVR_ERR] Could not create the DataFetch_Handler thread, error 11";
constexpr const char* joining = "[TVR_DBG] PERF: Clearing the previous thread...with join";

/// One class of each form.
constexpr const char* classes[] = {"TVRHBA_Card", "TVRHBA_LogicalDisk", "TVRHBA_FCPort"};

TEST(RefreshFailure, ReadersGoOnWithTheMapsWhenNoThreadCanBeMade)
{
    stopClock();
    Host host;
    refuseThreads(true);
    for (const char* name : classes)
        EXPECT_TRUE(host.instancesOf(name).empty()) << name;
    EXPECT_EQ(host.logged(noThread), std::size(classes)) << "every request tries again";
    refuseThreads(false);
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u) << "readers wait for the refresh that made up for it";
    ASSERT_TRUE(host.awaitRefresh());

    // The thread that ended is joined once, however often the next one cannot be made.
    advanceClock(10min);
    refuseThreads(true);
    for (unsigned i = 0; i < 3; i++)
        EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u) << "the former maps";
    EXPECT_EQ(host.logged(joining), 1u);
    refuseThreads(false);
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    ASSERT_TRUE(host.awaitRefresh(2));
    EXPECT_EQ(host.logged(noThread), std::size(classes) + 3);
    EXPECT_EQ(host.logged(joining), 1u);

    // A broker frees a prepared context with the thread that attaches it, and in no other way.
    host.broker().unload();
    const std::vector<broker::Violation> violations = host.broker().violations();
    ASSERT_EQ(violations.size(), 1u);
    EXPECT_EQ(violations[0].text, "outside of a call: 6 prepared thread contexts were never detached");
}

TEST(RefreshFailure, ExceptionEndsItsPartOfTheRefreshAlone)
{
    stopClock();
    Host host;
    setHostNames({.resolving = [] { throw std::runtime_error("no resolver today"); }});
    for (const char* name : classes)
        EXPECT_TRUE(host.instancesOf(name).empty()) << name;
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_GE(host.logged("[TVR_ERR] Exception in the refresh of the adapter maps: no resolver today"), 1u);
    EXPECT_GE(host.calls("HBA_GetFcpTargetMapping"), 4u) << "the fabric is scanned all the same";
    const broker::Path card{
        "root/tavrin",
        "TVRHBA_Card",
        {{"CreationClassName", broker::Value::string("TVRHBA_Card")}, {"Tag", broker::Value::string("TV16A02417")}}};
    EXPECT_EQ(host.broker().getInstance(card).status, CMPI_RC_ERR_FAILED) << "it is there, and was left out";
    ASSERT_TRUE(host.awaitLog(ended, host.logged(created))); // of the refresh that the get asked for

    setHostNames({}); // the next request tries again, before the cache times out
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    EXPECT_TRUE(host.broker().getInstance(card).ok());
    host.unload();
}

/// A limit of this process, for a scope.
class Limit
{
public:
    Limit(__rlimit_resource resource, rlim_t value) : _resource(resource)
    {
        getrlimit(_resource, &_former);
        const rlimit limit{value, _former.rlim_max};
        setrlimit(_resource, &limit);
    }
    ~Limit() { setrlimit(_resource, &_former); }
    Limit(const Limit&) = delete;
    Limit& operator=(const Limit&) = delete;

private:
    __rlimit_resource _resource;
    rlimit _former{};
};

TEST(Limits, ModuleWithoutDescriptorsAnswersAndEnds)
{
    if (TVR_SANITIZED)
        GTEST_SKIP() << "the undefined-behaviour sanitizer needs descriptors of its own";
    Host host;
    host.broker();
    host.openGate("none"); // all that the test itself opens is open from here on
    {
        const int free = dup(0);
        close(free);
        const Limit none(RLIMIT_NOFILE, static_cast<rlim_t>(free));
        EXPECT_EQ(host.enumerate("TVRHBA_Card").objects.size(), 2u);
        EXPECT_EQ(host.enumerate("TVRHBA_LogicalDisk").status, CMPI_RC_OK);
        host.broker().unload();
        host.closeBroker();
    }
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    host.unload();
}

TEST(Limits, FullDiskKeepsTheOldSettingsFile)
{
    constexpr const char* settings = "/etc/tavrin_fc_provider.conf";
    constexpr const char* old = "TVR_PROVIDER_CACHE_TIMEOUT = 7\n";
    Host host;
    host.write(settings, old);
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    ASSERT_TRUE(host.awaitRefresh());
    signal(SIGXFSZ, SIG_IGN);
    {
        const Limit full(RLIMIT_FSIZE, 0);
        host.broker().unload();
    }
    EXPECT_EQ(host.read(settings), old);
    host.closeBroker();
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 2u);
    host.unload();
    EXPECT_THAT(host.read(settings), testing::HasSubstr("TVR_PROVIDER_CACHE_TIMEOUT = 7\n"));
}

} // namespace
