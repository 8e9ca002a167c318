// Many clients at once, while the cache is rebuilt under them.
#include "tests/module/Changes.h"
#include "tests/module/Clock.h"
#include "tests/module/LibCurl.h"
#include "tests/module/RefreshLines.h"
#include "tests/module/Walk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <functional>
#include <map>
#include <mutex>
#include <thread>

using namespace module_test;
using namespace std::chrono_literals;

namespace
{

constexpr unsigned clients = 64;
constexpr unsigned requestsEach = 6;
constexpr const char* settings = "TVR_PROVIDER_CACHE_TIMEOUT = 1\nTVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE\n";

/// What a client asks, with the status and the paths of the answer as text.
struct Request
{
    std::string name;
    std::function<std::vector<std::string>(broker::Broker&)> ask;
};

std::vector<std::string> answerOf(const broker::Outcome& outcome, const std::vector<broker::Path>& paths = {})
{
    std::vector<std::string> answer = identities(paths);
    answer.insert(answer.begin(), broker::statusName(outcome.status));
    return answer;
}

Request enumeration(const std::string& className)
{
    return {"enumerate " + className, [className](broker::Broker& broker)
            {
                const broker::Reply reply = broker.enumerateInstances("root/tavrin", className);
                return answerOf(reply, pathsOf(reply.objects));
            }};
}

/// One of each operation, and each form of enumeration.
std::vector<Request> requestsFor(const broker::Path& card)
{
    std::vector<Request> requests = {
        {"get", [card](auto& broker) { return answerOf(broker.getInstance(card)); }},
        {"associators",
         [card](auto& broker)
         {
             const broker::Reply reply = broker.associators(card, {"", "CIM_PhysicalElement", "", ""});
             return answerOf(reply, pathsOf(reply.objects));
         }},
        {"references",
         [card](auto& broker)
         {
             const broker::Reply reply = broker.references(card, {"CIM_Container"});
             return answerOf(reply, pathsOf(reply.objects));
         }},
        {"names",
         [](auto& broker)
         {
             const broker::NamesReply reply = broker.enumerateInstanceNames("root/tavrin", "TVRHBA_CardContainsChip");
             return answerOf(reply, reply.paths);
         }},
        {"delete", [card](auto& broker) { return answerOf(broker.deleteInstance(card)); }},
        {"invoke", [card](auto& broker) { return answerOf(broker.invokeMethod(card, "IsCompatible")); }},
    };
    for (const char* className : {"TVRHBA_Card", "TVRHBA_PhysicalConnector", "TVRHBA_RegisteredProfile",
                                  "TVRHBA_FCPort", "TVRHBA_DriverParamGlobal", "TVRHBA_LogicalDisk",
                                  "TVRHBA_SCSIInitiatorTargetLogicalDiskPath", "TVRHBA_VirtualFCPort", "CIM_Component"})
        requests.push_back(enumeration(className));
    return requests;
}

void runClients(unsigned count, const std::function<void(unsigned client)>& work)
{
    std::vector<std::thread> threads;
    for (unsigned client = 0; client < count; client++)
        threads.emplace_back(work, client);
    for (std::thread& thread : threads)
        thread.join();
}

TEST(Concurrency, AnswersStayCompleteWhileTheCacheIsRebuilt)
{
    Host host;
    host.write("/etc/tavrin_fc_provider.conf", settings);
    addPlatform(host.broker());
    const std::vector<Request> requests = requestsFor(host.instancesOf("TVRHBA_Card").at(0).path);
    std::vector<std::vector<std::string>> expected;
    for (const Request& request : requests)
        expected.push_back(request.ask(host.broker()));

    setClockStep(1min); // whoever looks at the age of the cache finds it too old
    const std::size_t runs = host.logged(begun);
    std::atomic<bool> rebuilt = false; // several times
    runClients(clients,
               [&](unsigned client)
               {
                   for (unsigned i = 0; i < requestsEach || (!rebuilt && i < 100 * requestsEach); i++)
                   {
                       if (client == 0)
                           rebuilt = host.logged(begun) > runs + 3;
                       const std::size_t choice = (client * 7 + i) % requests.size();
                       EXPECT_EQ(requests[choice].ask(host.broker()), expected[choice]) << requests[choice].name;
                   }
               });
    setClockStep(0us);
    EXPECT_TRUE(rebuilt);
    host.unload();
}

TEST(Concurrency, FirstCallsOfAllClassesMakeOneAgent)
{
    Host host;
    host.options.personality.loadKinds = broker::LoadKinds::all;
    addPlatform(host.broker());
    const std::vector<std::string>& served = host.broker().servedClasses();
    std::mutex mutex;
    std::map<std::string, std::vector<std::string>> cold;
    runClients(clients,
               [&](unsigned client)
               {
                   for (std::size_t i = client; i < served.size(); i += clients)
                   {
                       std::vector<std::string> answer = enumeration(served[i]).ask(host.broker());
                       const std::lock_guard lock(mutex);
                       cold[served[i]] = std::move(answer);
                   }
               });
    EXPECT_EQ(host.logged("[TVR_INFO] Tavrin Provider v10.2.261-13 Loaded["), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] ProviderAgent::addRef["), served.size());
    EXPECT_EQ(host.calls("HBA_LoadLibrary"), 1u);
    for (const std::string& className : served)
    {
        if (className != "TVRHBA_LogEntry" && className != "TVRHBA_RecordLogManagesRecord") // each call adds to them
        {
            EXPECT_EQ(cold[className], enumeration(className).ask(host.broker())) << className;
        }
    }
    host.unload();
}

/// All changes at once on a cache that is rebuilt all the time, among clients that read what is changed.
TEST(Concurrency, ChangesSucceedWhileTheCacheIsRebuilt)
{
    test_support::FileServer server;
    Host host(changeableHost);
    host.write("/etc/tavrin_fc_provider.conf", settings);
    const std::filesystem::path before = std::filesystem::current_path();
    std::filesystem::create_directory(host.root() / "work");
    std::filesystem::create_directories(host.root() / "tmp");
    std::filesystem::current_path(host.root() / "work");
    addPlatform(host.broker());
    setRealLibCurl("libcurl.so");
    host.instancesOf("TVRHBA_LogicalDisk");
    const std::vector<Change> changes = changesOf(host, server);
    const std::vector<Request> readers = {enumeration("TVRHBA_FCPort"), enumeration("TVRHBA_Card"),
                                          enumeration("TVRHBA_ProviderConfigSetting"),
                                          enumeration("TVRHBA_SoftwareInstallationService")};
    const std::vector<std::string> lanes = {"TVRHBA_DriverParams", "TVRHBA_DriverServiceElementSettingData",
                                            "TVRHBA_DriverParameterAffectsFCPort"};
    std::vector<std::vector<std::string>> expected;
    for (const Request& reader : readers)
        expected.push_back(reader.ask(host.broker()));

    setClockStep(1min);
    runClients(24,
               [&](unsigned client)
               {
                   for (unsigned i = 0; i < 2 * changes.size(); i++)
                   {
                       const Change& change = changes[(client * 5 + i) % changes.size()];
                       const std::string answer = change.ask(host.broker());
                       const bool ofLane = change.name.find("lane") != std::string::npos;
                       const bool ofTest = change.name.find("RunDiagnosticService") != std::string::npos;
                       // Another client may have made or deleted the lane, or its link test may be under way.
                       if (!ofLane && !(ofTest && answer == "CIM_ERR_OK 40064"))
                       {
                           EXPECT_EQ(answer, "CIM_ERR_OK 0") << change.name;
                       }
                       const std::size_t reader = (client + i) % readers.size();
                       EXPECT_EQ(readers[reader].ask(host.broker()), expected[reader]) << readers[reader].name;
                       EXPECT_EQ(enumeration(lanes[i % lanes.size()]).ask(host.broker()).at(0), "CIM_ERR_OK");
                   }
               });
    setClockStep(0us);
    EXPECT_TRUE(std::filesystem::is_empty("."));
    std::filesystem::current_path(before);
    setLibCurl("");
    host.unload();
}

/// A run that is held in the hardware's library holds all who read what it builds, and they get what it built.
TEST(Concurrency, ReadersWaitForTheRunThatIsHeld)
{
    Host host;
    host.write("/etc/tavrin_fc_provider.conf", settings);
    addPlatform(host.broker());
    const std::vector<Request> readers = {
        enumeration("TVRHBA_PhysicalConnector"), enumeration("TVRHBA_CardContainsConnector"),
        enumeration("TVRHBA_PCIDevice"),         enumeration("TVRHBA_FCPort"),
        enumeration("TVRHBA_PortController"),
    };
    std::vector<std::vector<std::string>> before;
    for (const Request& reader : readers)
        before.push_back(reader.ask(host.broker()));
    ASSERT_TRUE(host.awaitRefresh());

    host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": "run"})");
    host.addFault(R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV3202-1", "status": 1})");
    advanceClock(2min);
    std::thread starter([&] { host.enumerate("TVRHBA_Card"); });
    ASSERT_TRUE(host.awaitGate("run"));
    const std::size_t asked = host.logged(running);
    std::atomic<bool> opened{false};
    std::vector<std::vector<std::string>> after(readers.size());
    std::thread opener(
        [&]
        {
            EXPECT_TRUE(host.awaitLog(running, asked + readers.size()));
            opened = true;
            host.openGate("run");
        });
    runClients(static_cast<unsigned>(readers.size()),
               [&](unsigned client)
               {
                   after[client] = readers[client].ask(host.broker());
                   EXPECT_TRUE(opened) << readers[client].name << " did not wait";
               });
    opener.join();
    starter.join();
    EXPECT_EQ(before[0].size(), 1u + 4u);
    EXPECT_EQ(after[0].size(), 1u + 3u);
    EXPECT_EQ(after[1].size(), 1u + 3u);
    EXPECT_EQ(after[2].size(), 1u + 3u);
    for (std::size_t i = 0; i < readers.size(); i++)
        EXPECT_EQ(after[i], readers[i].ask(host.broker())) << readers[i].name;
    host.unload();
}

} // namespace
