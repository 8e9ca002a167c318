// What monitoring is told of the module and of the simulated host, and the alerts that it raises.
#include "broker/health/PortCounters.h"
#include "broker/metrics/Collector.h"
#include "broker/metrics/Exposition.h"
#include "broker/metrics/HostFamilies.h"
#include "tests/module/Clock.h"
#include "tests/module/Host.h"
#include "tests/module/ModuleMemory.h"
#include "tests/module/Process.h"
#include "tests/support/Command.h"
#include "tests/support/Sanitized.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <fstream>
#include <future>
#include <map>
#include <regex>
#include <set>
#include <sstream>

using namespace module_test;
using namespace std::chrono_literals;
using metrics::Collector;
using testing::AllOf;
using testing::Contains;
using testing::HasSubstr;
using testing::Key;
using testing::Not;
using testing::Pair;

namespace
{

constexpr const char* nameSpace = "root/tavrin";
constexpr const char* port = "1000027A51160210";
constexpr const char* otherPort = "1000027A51320240";
constexpr std::uint32_t linkUp = 2;
constexpr std::uint32_t linkDown = 6;
constexpr std::uint32_t loopback = 8;

broker::Observation observed(Host& host)
{
    const auto found = broker::observe(host.broker());
    EXPECT_TRUE(found);
    return found.value_or(broker::Observation());
}

std::uint64_t failures(const broker::Observation& observation, const std::string& function)
{
    for (const auto& [entryPoint, count] : observation.callFailures)
        if (entryPoint == function)
            return count;
    ADD_FAILURE() << function << " is not told";
    return 0;
}

/// Samples by name and labels, as Prometheus reads them.
using Samples = std::map<std::string, std::string>;

Samples scrape(Collector& collector)
{
    std::istringstream text(metrics::exposition(*collector.collect(), metrics::Format::prometheus));
    Samples samples;
    for (std::string line; std::getline(text, line);)
        if (!line.starts_with('#'))
            samples[line.substr(0, line.rfind(' '))] = line.substr(line.rfind(' ') + 1);
    return samples;
}

std::string ofPort(const std::string& family, const std::string& wwpn)
{
    return "tavrin_fc_port_" + family + "{port=\"" + wwpn + "\"}";
}

TEST(Metrics, TheModuleTellsOfItsCacheAndOfFailedCalls)
{
    stopClock();
    Host host;
    const broker::Observation before = observed(host);
    EXPECT_EQ(before.loaded, 0u);
    EXPECT_EQ(before.refreshes, 0u);
    EXPECT_EQ(before.cache_age, 0u);

    host.addFault(R"({"function": "HBA_GetAdapterAttributes", "status": 1})");
    host.addFault(R"({"function": "LRM_GetVPD", "status": 2})");
    host.addFault(R"({"function": "HBA_OpenAdapter", "status": 0, "to": 1})");
    host.instancesOf("TVRHBA_Card");
    ASSERT_TRUE(host.awaitRefresh());
    const broker::Observation after = observed(host);
    EXPECT_EQ(after.loaded, 1u);
    EXPECT_EQ(after.refreshes, 1u);
    EXPECT_EQ(after.refresh_running, 0u);
    EXPECT_EQ(after.refresh_pending, 0u);
    EXPECT_EQ(after.cache_timeout, 600'000'000u);
    EXPECT_GT(host.calls("HBA_GetAdapterAttributes"), 0u);
    EXPECT_EQ(failures(after, "HBA_GetAdapterAttributes"), host.calls("HBA_GetAdapterAttributes"));
    EXPECT_EQ(failures(after, "LRM_GetVPD"), 0u) << "an adapter without such data is no failure";
    EXPECT_EQ(failures(after, "HBA_OpenAdapter"), 1u) << "the handle 0";
    EXPECT_EQ(failures(after, "CPQFC_OpenAdapter"), 0u) << "absent";
    EXPECT_THAT(after.callFailures, Not(Contains(Key("HBA_GetNumberOfAdapters")))) << "a count tells no failure";

    advanceClock(3min);
    EXPECT_EQ(observed(host).cache_age, 180'000'000u + after.cache_age);
    host.unload();
    host.closeBroker();
    EXPECT_EQ(observed(host).loaded, 0u);
    EXPECT_EQ(failures(observed(host), "HBA_OpenAdapter"), 1u) << "counters outlive the agent";
}

TEST(Metrics, AScrapeHasWhatTheHostHas)
{
    Host host;
    Collector collector(host.broker(), nameSpace, 0s);
    const Samples samples = scrape(collector);
    const Samples expected = {
        {"tavrin_fc_up", "1"},
        {"tavrin_fc_cards", "2"},
        {"tavrin_fc_refreshes_total", "1"},
        {ofPort("up", port), "1"},
        {ofPort("up", "1000027A51160211"), "0"},
        {ofPort("speed_bytes_per_second", port), "1000000000"},
        {ofPort("transmitted_bytes_total", port), "1608754176"},
        {ofPort("invalid_transmission_words_total", port), "12"},
        {ofPort("targets", port), "2"},
        {ofPort("units", port), "4"},
        {ofPort("units", "1000027A51160211"), "0"},
        {ofPort("units", "2001027A51320240"), "1"}, // a virtual port
        {"tavrin_fc_board_temperature_celsius{chip=\"TV16A02417\"}", "47"},
        {"tavrin_fc_transceiver_voltage_volts{port=\"1000027A51160210\"}", "3.295"},
        {"tavrin_fc_driver_info{name=\"tvrfc\",version=\"12.0.0.1\"}", "1"},
    };
    for (const auto& [name, value] : expected)
        EXPECT_THAT(samples, Contains(Pair(name, value)));

    Collector shared(host.broker(), nameSpace, 1h);
    for (const std::uint32_t state : {linkUp, linkDown})
    {
        host.setPortState(port, state);
        EXPECT_THAT(scrape(shared), Contains(Pair(ofPort("up", port), "1"))) << "not read again within the hour";
    }
}

TEST(Metrics, TheTableHasTheCountersThatTheModuleServes)
{
    Host host;
    host.setAttribute(port, R"({"lipCount": 1})"); // which by themselves the simulated adapters do not report
    host.setAttribute(port, R"({"addressErrors": 1})");
    std::set<std::string> served;
    for (const broker::Object& statistics : host.instancesOf("TVRHBA_FCPortStatistics"))
        for (const broker::Property& property : statistics.properties)
            if (!property.value.isNull() && property.value.type() == CMPI_uint64)
                served.insert(property.name);
    std::set<std::string> told;
    for (const broker::CounterRow& row : broker::counterRows)
        told.insert(row.property);
    EXPECT_EQ(told, served);
}

TEST(Metrics, WhatCannotBeReadIsNotTold)
{
    // Before the first reading, a 0 would be taken for a loss of what monitoring knows from before.
    Host host;
    const std::string endpoints = "[TVRHBA_VirtualSCSIProtocolTargetEndpoint]";
    std::string registration = textOf(host.options.registration);
    ASSERT_NE(registration.find(endpoints), std::string::npos);
    host.write("/reg", registration.replace(registration.find(endpoints), endpoints.size(), "[TVRHBA_None]"));
    host.options.registration = host.root() / "reg";
    Collector halfOfFabric(host.broker(), nameSpace, 0s);
    const Samples half = scrape(halfOfFabric);
    EXPECT_THAT(half, AllOf(Contains(Pair("tavrin_fc_up", "0")), Contains(Pair("tavrin_fc_cards", "2")),
                            Not(Contains(Key(ofPort("targets", port)))), Not(Contains(Key(ofPort("units", port))))));
    Collector nothing(host.broker(), "root/none", 0s);
    EXPECT_THAT(scrape(nothing), AllOf(Contains(Pair("tavrin_fc_up", "0")), Not(Contains(Key("tavrin_fc_cards"))),
                                       Not(Contains(Key("tavrin_fc_values_age_seconds")))));
}

TEST(Metrics, AFabricThatIsReadOnDemandAloneIsNotRead)
{
    Host host;
    host.write("/etc/tavrin_fc_provider.conf", "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n");
    Collector collector(host.broker(), nameSpace, 0s);
    scrape(collector);
    EXPECT_THAT(scrape(collector),
                AllOf(Contains(Pair(ofPort("up", port), "1")), Contains(Pair("tavrin_fc_refreshes_total", "1")),
                      Not(Contains(Key(ofPort("targets", port))))));
    EXPECT_EQ(host.calls("HBA_GetFcpTargetMappingV2"), 0u);
}

TEST(Metrics, BehindAReadingThatHangsThereIsWhatWasReadBefore)
{
    stopClock();
    Host host;
    Collector collector(host.broker(), nameSpace, 0s, 1ms);
    const auto hang = [&](const std::string& gate)
    {
        host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": ")" + gate + "\"}");
        auto reading = std::async(std::launch::async, [&] { return collector.collect(); });
        EXPECT_TRUE(host.awaitGate(gate));
        return reading;
    };
    auto first = hang("first");
    EXPECT_FALSE(collector.collect()) << "nothing was read yet";
    host.openGate("first");
    EXPECT_TRUE(first.get());
    host.clearFaults();

    advanceClock(11min);
    auto second = hang("second");
    const Samples meanwhile = scrape(collector);
    EXPECT_THAT(meanwhile,
                AllOf(Contains(Pair(ofPort("up", port), "1")), Contains(Pair("tavrin_fc_cache_age_seconds", "660")),
                      Contains(Key("tavrin_fc_values_age_seconds"))));
    host.openGate("second");
    EXPECT_TRUE(second.get());
}

TEST(Metrics, UnitsAreCountedAndNotLabelled)
{
    const auto scrapeOf = [](int units)
    {
        Host host(R"({"generate": {"adapters": 2, "targetsPerPort": 3, "unitsPerTarget": )" + std::to_string(units) +
                  "}}");
        Collector collector(host.broker(), nameSpace, 0s);
        return scrape(collector);
    };
    const Samples few = scrapeOf(1);
    const Samples many = scrapeOf(100);
    EXPECT_EQ(few.size(), many.size());
    std::size_t ports = 0;
    for (const auto& [name, value] : many)
        if (name.starts_with("tavrin_fc_port_units"))
        {
            ++ports;
            EXPECT_EQ(value, "300");
            EXPECT_EQ(few.at(name), "3");
        }
    EXPECT_EQ(ports, 2u);
}

TEST(Metrics, AScrapeRefreshesNoSoonerThanTheTimeout)
{
    stopClock();
    Host host("multiport");
    Collector collector(host.broker(), nameSpace, 0s);
    const auto refreshesAfterScrapes = [&]
    {
        for (int i = 0; i < 3; ++i)
            EXPECT_THAT(scrape(collector), Contains(Pair("tavrin_fc_cards", "1")));
        return observed(host).refreshes;
    };
    EXPECT_EQ(refreshesAfterScrapes(), 1u);
    advanceClock(11min);
    EXPECT_EQ(refreshesAfterScrapes(), 2u);

    // A refresh that leaves something out, for want of memory, is due again at once.
    const auto isIncomplete = [&](std::size_t number)
    {
        advanceClock(11min);
        refuseAllocation(number);
        scrape(collector);
        allocationsOfModule();
        return observed(host).refresh_pending == 1;
    };
    for (const std::chrono::minutes step : {11min, -60min}) // what a clock that is set back did to the age is not known
    {
        std::size_t number = 100;
        while (number < 3000 && !isIncomplete(number))
            number += 100;
        ASSERT_LT(number, 3000u);
        const std::uint64_t incomplete = observed(host).refreshes;
        EXPECT_EQ(refreshesAfterScrapes(), incomplete) << "the former values stand";
        advanceClock(step);
        EXPECT_EQ(refreshesAfterScrapes(), incomplete + 1);
        EXPECT_EQ(observed(host).refresh_pending, 0u);
    }
}

TEST(Metrics, NothingOfAHostileHostBreaksTheText)
{
    Host host("hostile");
    Collector collector(host.broker(), nameSpace, 0s);
    const std::string file = host.root() / "scrape";
    std::ofstream(file) << metrics::exposition(*collector.collect(), metrics::Format::prometheus);
    const Answer checked = runCommand("promtool check metrics <" + file);
    EXPECT_EQ(checked.exitCode, 0) << checked.out << checked.err;
}

TEST(Metrics, TenThousandScrapesNeedNoMoreMemory)
{
#if TVR_SANITIZED
    GTEST_SKIP() << "the sanitizers keep what was freed";
#endif
    Host host(R"({"generate": {"adapters": 1, "targetsPerPort": 1, "unitsPerTarget": 1}})");
    host.write("/etc/tavrin_fc_provider.dmp", "2,5,0\n"); // without a log, which takes most of the time
    Collector collector(host.broker(), nameSpace, 0s);
    constexpr int scrapes = 10'000;
    constexpr int first = 300; // the broker keeps dead objects for a while
    constexpr std::size_t anyThreads = 100;
    std::size_t before = 0;
    for (int i = 0; i < scrapes; ++i)
    {
        ASSERT_FALSE(metrics::exposition(*collector.collect(), metrics::Format::openMetrics).empty());
        if (i == first)
            before = Footprint::take(anyThreads).resident;
    }
    EXPECT_LT(Footprint::take(anyThreads).resident, before + (1 << 20));
}

// --- alerts -------------------------------------------------------------------------------------------------------

/// The series that Prometheus has of one scrape a minute, as the input of a test of rules.
std::string inputOf(const std::vector<Samples>& scrapes)
{
    std::map<std::string, std::string> series;
    for (std::size_t minute = 0; minute < scrapes.size(); ++minute)
        for (const auto& [name, value] : scrapes[minute])
        {
            std::string& values = series[name];
            if (values.empty() && minute > 0)
                values = "_x" + std::to_string(minute - 1);
            values += (values.empty() ? "" : " ") + value;
        }
    std::string text;
    for (const auto& [name, values] : series)
    {
        const std::size_t brace = std::min(name.find('{'), name.size());
        const std::string further = brace == name.size() ? "}" : "," + name.substr(brace + 1);
        text += "      - series: '" + name.substr(0, brace) + "{job=\"tavrin-fc\",instance=\"host\"" + further +
                "'\n        values: '" + values + "'\n";
    }
    return text;
}

/// What fires at that minute, and nothing else.
std::string expectationAt(int minute, const std::vector<std::string>& alerts)
{
    std::string text = "      - expr: ALERTS{alertstate=\"firing\"}\n        eval_time: " + std::to_string(minute) +
                       "m\n        exp_samples:" + (alerts.empty() ? " []\n" : "\n");
    for (const std::string& alert : alerts)
        text += "          - labels: 'ALERTS{job=\"tavrin-fc\",instance=\"host\",alertstate=\"firing\"," + alert +
                "}'\n            value: 1\n";
    return text;
}

std::string firing(const std::string& alert, const std::string& severity, const std::string& labels)
{
    return "alertname=\"" + alert + "\",severity=\"" + severity + "\"," + labels;
}

TEST(Metrics, WhatHappensToAHostRaisesItsAlertsAndNoOthers)
{
    stopClock();
    Host host;
    Collector collector(host.broker(), nameSpace, 0s);
    constexpr int minutes = 80;
    constexpr int pulled = 5;
    std::vector<Samples> scrapes;
    for (int minute = 0; minute < minutes; ++minute)
    {
        advanceClock(1min);
        if (minute == pulled)
        {
            host.setPortState(port, linkDown);
            host.setPortState(otherPort, loopback); // which is no loss
            host.setAttribute(otherPort,
                              R"({"boardTemperature": 6904426})"); // 106, 90 and 105 degrees, from the next refresh on
            host.setAttribute(otherPort, R"({"firmwareOnFlash": "12.8.1.0"})");
            host.addFault(R"({"function": "LRM_GetVPD", "status": 97})"); // counted by each refresh
        }
        host.setAttribute(otherPort, (R"({"invalidCrcs": )" + std::to_string(minute) + "}").c_str());
        scrapes.push_back(scrape(collector));
    }
    const std::string down = firing("TavrinFcPortDown", "critical", std::string("port=\"") + port + "\"");
    const std::string errors = firing("TavrinFcPortErrors", "warning", std::string("port=\"") + otherPort + "\"");
    const std::string hot =
        firing("TavrinFcBoardCritical", "critical", R"(chip="TV32B71155",measure="temperature",level="alarm")");
    const std::string waiting =
        firing("TavrinFcFirmwareWaiting", "info",
               std::string("port=\"") + otherPort + R"(",name="Firmware On Flash",version="12.8.1.0")");
    const std::string failing = firing("TavrinFcLibraryCallsFail", "warning", R"(function="LRM_GetVPD")");
    const std::string file = host.root() / "alerts-test.yml";
    std::ofstream(file) << "rule_files: ['" TVR_FLEET
                           "/alerts.yml']\nevaluation_interval: 1m\ntests:\n  - interval: 1m\n"
                        << "    input_series:\n"
                        << inputOf(scrapes) << "    promql_expr_test:\n"
                        << expectationAt(pulled - 1, {}) << expectationAt(pulled + 2, {down})
                        << expectationAt(minutes - 1, {down, errors, hot, waiting, failing});
    const Answer tested = runCommand("promtool test rules " + file);
    EXPECT_EQ(tested.exitCode, 0) << tested.out << tested.err;
    EXPECT_THAT(tested.out, HasSubstr("SUCCESS"));
}

/// The names of families that a text has.
std::set<std::string> namesIn(const std::string& text)
{
    static const std::regex name("tavrin_fc_\\w+");
    return {std::sregex_token_iterator(text.begin(), text.end(), name), {}};
}

TEST(Metrics, AlertsAndDashboardNameFamiliesThatThereAre)
{
    Host host;
    Collector collector(host.broker(), nameSpace);
    std::set<std::string> told = namesIn(metrics::exposition(*collector.collect(), metrics::Format::prometheus));
    for (const metrics::SourceRow& source : metrics::hostSources())
        for (const metrics::FamilyRow& row : source.families)
            told.insert(row.name);
    for (const char* file : {TVR_FLEET "/alerts.yml", TVR_FLEET "/dashboard.json"})
    {
        const std::set<std::string> used = namesIn(textOf(file));
        EXPECT_GT(used.size(), 10u) << file;
        for (const std::string& name : used)
            EXPECT_TRUE(told.count(name)) << file << " has " << name;
    }
    const std::set<std::string> alerting = namesIn(textOf(TVR_FLEET "/alerts.yml"));
    for (const broker::CounterRow& row : broker::counterRows)
        EXPECT_EQ(row.isError, alerting.count(row.family) == 1) << row.family;
}

} // namespace
