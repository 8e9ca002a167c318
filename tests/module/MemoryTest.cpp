// One allocation of the module fails, at any place of its life.
#include "tests/module/Changes.h"
#include "tests/module/Host.h"
#include "tests/module/LibCurl.h"
#include "tests/module/ModuleMemory.h"
#include "tests/module/Process.h"
#include "tests/module/RefreshLines.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <unistd.h>

using namespace module_test;

namespace
{

constexpr const char* loaded = "[TVR_INFO] Tavrin Provider v10.2.261-13 Loaded";

/// The card of the host, known beforehand: the module is asked for nothing before memory fails.
broker::Path card()
{
    return {
        "root/tavrin",
        "TVRHBA_Card",
        {{"CreationClassName", broker::Value::string("TVRHBA_Card")}, {"Tag", broker::Value::string("TV32D00001")}}};
}

/// With memory there again the next request brings back in full what a refresh left out, without waiting for the cache
/// to time out. A module that could not be loaded is loaded anew.
void expectRecovery(Host& host)
{
    if (host.logged(loaded) == 0)
        host.unload();
    EXPECT_EQ(host.instancesOf("TVRHBA_Card").size(), 1u);
    EXPECT_TRUE(host.broker().getInstance(card()).ok());
    EXPECT_EQ(host.instancesOf("TVRHBA_PCIDevice").size(), 2u);
}

/// First enumeration with its refresh, second enumeration, get and associators with the number-th allocation refused.
/// What was asked may fail or come short, but a get never says that the card is not there.
std::size_t askWithout(std::size_t number)
{
    Host host("multiport");
    host.broker();
    refuseAllocation(number);
    host.enumerate("TVRHBA_Card");
    host.enumerate("TVRHBA_Card");
    EXPECT_NE(host.broker().getInstance(card()).status, CMPI_RC_ERR_NOT_FOUND);
    host.broker().associators(card());
    EXPECT_TRUE(host.awaitLog(ended, host.logged(created)));
    const std::size_t counted = allocationsOfModule();
    expectRecovery(host);
    host.unload();
    return counted;
}

/// The same while the module ends.
std::size_t endWithout(std::size_t number)
{
    Host host("multiport");
    expectRecovery(host);
    refuseAllocation(number);
    host.broker().unload();
    const std::size_t counted = allocationsOfModule();
    host.closeBroker();
    expectRecovery(host);
    host.unload();
    return counted;
}

/// The same with all that a client can change. What was refused then is done afterwards, with nothing in its way.
std::size_t changeWithout(std::size_t number)
{
    test_support::FileServer server;
    Host host(changeableHost);
    const std::filesystem::path folder = host.root() / "work";
    std::filesystem::create_directories(folder);
    std::filesystem::create_directories(host.root() / "tmp");
    std::filesystem::current_path(folder);
    setRealLibCurl("libcurl.so");
    host.instancesOf("TVRHBA_LogicalDisk"); // the fabric is known
    const std::vector<Change> changes = changesOf(host, server);
    EXPECT_TRUE(host.awaitLog(ended, host.logged(created)));
    refuseAllocation(number);
    for (const Change& change : changes)
        change.ask(host.broker());
    const std::size_t counted = allocationsOfModule();
    EXPECT_TRUE(host.awaitLog(ended, host.logged(created)));
    EXPECT_TRUE(std::filesystem::is_empty(folder));
    EXPECT_FALSE(std::filesystem::exists(host.root() / "tmp" / "out.xml"));
    removeLane(host.broker());
    for (const Change& change : changes)
        EXPECT_EQ(change.ask(host.broker()), "CIM_ERR_OK 0") << change.name;
    std::filesystem::current_path("/");
    host.unload();
    return counted;
}

/// Each in a process of its own; one that hangs is ended.
std::size_t inProcess(std::size_t (*life)(std::size_t number), std::size_t number, const std::string& countFile)
{
    EXPECT_EQ(inChild(
                  [&]
                  {
                      alarm(120);
                      std::ofstream(countFile) << life(number);
                  }),
              0)
        << "allocation " << number;
    std::size_t counted = 0;
    std::ifstream(countFile) >> counted;
    return counted;
}

/// TVR_REFUSED_ALLOCATION=all refuses each in turn, which takes minutes, and a number that one alone; otherwise the
/// first few, among which a thread takes what it needs once, and some of each part of the life.
void refuseInTurn(std::size_t (*life)(std::size_t number))
{
    const std::string countFile = (std::filesystem::temp_directory_path() / ("tvr-count-" + std::to_string(getpid())));
    const std::size_t all = inProcess(life, 0, countFile);
    const std::string wanted = std::getenv("TVR_REFUSED_ALLOCATION") ? std::getenv("TVR_REFUSED_ALLOCATION") : "";
    const std::size_t only = std::strtoul(wanted.c_str(), nullptr, 10);
    const std::size_t step = wanted == "all" ? 1 : all / 40 + 1;
    for (std::size_t number = only ? only : 1; number <= (only ? only : all); number += number < 4 ? 1 : step)
        inProcess(life, number, countFile);
    std::filesystem::remove(countFile);
}

TEST(Memory, OneRefusedAllocationNeitherHangsNorCorruptsNorLies)
{
    refuseInTurn(askWithout);
    refuseInTurn(endWithout);
}

TEST(Memory, OneRefusedAllocationOfAChangeIsInNobodysWay)
{
    refuseInTurn(changeWithout);
}

} // namespace
