// The records of each kind of test, and maps that do not take all of them.
#include "diagnostics/DiagnosticRecords.h"
#include "agent/Build.h"
#include "schema/TVRHBA_CorrespondingSettingDataRecord.h"
#include "schema/TVRHBA_DiagnosticCompletionRecord.h"
#include "schema/TVRHBA_DiagnosticServiceRecord.h"
#include "schema/TVRHBA_DiagnosticSettingDataRecord.h"
#include "schema/TVRHBA_DiagnosticsLog.h"
#include "schema/TVRHBA_LogManagesRecord.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RecordAppliesToElement.h"
#include "tests/support/LogCollector.h"

#include <gtest/gtest.h>

#include <algorithm>

using namespace cimple;

namespace
{

constexpr char job[] = "the test:7:42";

class RecordsOfATest : public testing::Test
{
protected:
    RecordsOfATest()
    {
        controller->ElementName.set("the port");
        controller->DeviceID.set("1000027A51160210");
        for (const DiagnosticTest& test : diagnosticTests())
        {
            Ref<TVRHBA_DiagnosticsLog> log = empty<TVRHBA_DiagnosticsLog>();
            log->InstanceID.set(test.name);
            mapOf<TVRHBA_DiagnosticsLog>(cache).insert(log, "refused");
        }
    }
    ~RecordsOfATest() override { lines.stopCollecting(); }

    TestOutcome outcomeOf(const DiagnosticTest& test) const
    {
        return {.test = test,
                .message = "the message",
                .jobId = job,
                .passed = true,
                .portController = controller.get(),
                .overridden = false};
    }
    void create(const TestOutcome& outcome)
    {
        CreateDiagnosticServiceRecord(cache, outcome);
        CreateDiagnosticCompletionRecord(cache, outcome);
    }
    template <class Record> std::size_t count() { return mapOf<Record>(cache).size(); }
    bool isLogged(const std::string& line) const
    {
        const std::vector<std::string> messages = lines.messages();
        return std::find(messages.begin(), messages.end(), line) != messages.end();
    }

    InstanceCache cache;
    Ref<TVRHBA_PortController> controller = empty<TVRHBA_PortController>();
    test_support::LogCollector lines{TVR_DBG};
};

std::string number(const Property<std::uint32_t>& property)
{
    return property.null ? "-" : std::to_string(property.value);
}

/// Loops that failed and passed, cycles, time.
template <class Record> std::string figures(const Record& record)
{
    return number(record.LoopsFailed) + " " + number(record.LoopsPassed) + " " + number(record.CompletedCycles) + " " +
           number(record.TimeToExecute);
}

TEST_F(RecordsOfATest, FiguresAndAdviceDifferByTest)
{
    const std::string card = "a) Try latest released software and firmware b) Try putting this card in a different "
                             "host c) Replace Card";
    const std::string cable = "a) Verify and replace cable(s) if faulty b) Verify and replace transceiver(s) if faulty "
                              "c) Replace external PHY if card has an external PHY component d) Replace Card";
    const std::string fabric =
        "a) Verify end devices b) Verify switch configuration c) Verify and replace cable(s) if faultyd) Verify and "
        "replace transceiver(s) if faulty e) Replace Card f) Replace Switch";
    const struct
    {
        std::string test;
        const char *figures, *withoutResults;
        const std::string& advice;
    } rows[] = {
        {"Beacon", "0 0 - -", "0 0 - -", card},    {"Status", "0 0 - -", "0 0 - -", card},
        {"Reset", "0 0 - -", "0 0 - -", card},     {"Host Loopback", "3 97 100 9", "- - - -", card},
        {"Self", "3 97 100 9", "- - - -", card},   {"Internal Loopback", "3 97 100 9", "- - - -", card},
        {"Echo", "3 97 100 9", "- - - -", fabric}, {"External Loopback", "3 97 100 9", "- - - -", cable},
        {"Ping", "3 97 100 9", "- - - -", fabric}, {"D-Port", "0 0 - -", "0 0 - -", fabric},
    };
    RM_DiagResults results{};
    results.cyclesCompleted = 100;
    results.executionTime = 9;
    results.cyclesFailed = 3;
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.test);
        const DiagnosticTest* test = findDiagnosticTest("TVR:FCHBA " + row.test + " Test");
        ASSERT_NE(test, nullptr);
        TestOutcome outcome = outcomeOf(*test);
        outcome.passed = false;
        for (const bool hasResults : {true, false})
        {
            outcome.results = hasResults ? &results : nullptr;
            outcome.jobId = row.test + (hasResults ? " with" : " without");
            create(outcome);
            const auto isOfRun = [&](const auto& known) { return known.InstanceID.value.view().starts_with(row.test); };
            const auto* service = mapOf<TVRHBA_DiagnosticServiceRecord>(cache).findLast(isOfRun);
            const auto* completion = mapOf<TVRHBA_DiagnosticCompletionRecord>(cache).findLast(isOfRun);
            ASSERT_TRUE(service && completion);
            EXPECT_EQ(figures(*service), hasResults ? row.figures : row.withoutResults);
            EXPECT_EQ(figures(*completion), figures(*service));
            EXPECT_STREQ(service->RecordData.value.c_str(), "the message");
            EXPECT_EQ(completion->RecordData.value.c_str(), "the message : Suggested Actions " + row.advice);
            EXPECT_TRUE(isLogged("Message buffer: the message : Suggested Actions " + row.advice));
        }
    }
}

TEST_F(RecordsOfATest, WithoutPortAndLogTheyStandAlone)
{
    mapOf<TVRHBA_DiagnosticsLog>(cache).clear();
    TestOutcome outcome = outcomeOf(*findDiagnosticTest("TVR:FCHBA Beacon Test"));
    outcome.portController = nullptr;
    create(outcome);
    EXPECT_STREQ(mapOf<TVRHBA_DiagnosticServiceRecord>(cache).first()->ManagedElementName.value.c_str(),
                 "TVRHBA_Adapter");
    EXPECT_TRUE(isLogged("Invalid managed element"));
    EXPECT_EQ(count<TVRHBA_RecordAppliesToElement>(), 0u);
    ASSERT_EQ(count<TVRHBA_LogManagesRecord>(), 2u);
    EXPECT_EQ(mapOf<TVRHBA_LogManagesRecord>(cache).first()->Log, nullptr);
    EXPECT_NE(mapOf<TVRHBA_LogManagesRecord>(cache).first()->Record, nullptr);
}

/// A service record that is refused leaves nothing; a completion record that is refused leaves what leads nowhere.
TEST_F(RecordsOfATest, WhatAMapRefusesIsLeftOut)
{
    TestOutcome outcome = outcomeOf(*findDiagnosticTest("TVR:FCHBA Beacon Test"));
    outcome.overridden = true;
    create(outcome);
    const std::size_t managed = count<TVRHBA_LogManagesRecord>();
    CreateDiagnosticServiceRecord(cache, outcome);
    EXPECT_TRUE(isLogged("Insert Failed, DiagnosticServiceRecord"));
    EXPECT_EQ(count<TVRHBA_LogManagesRecord>(), managed);

    CreateDiagnosticCompletionRecord(cache, outcome);
    EXPECT_TRUE(isLogged("Insert in DiagnosticCompletionRecord Failed"));
    EXPECT_EQ(count<TVRHBA_DiagnosticCompletionRecord>(), 1u);
    const auto leadsNowhere = [](const auto* association, auto role)
    { return association && association->*role == nullptr; };
    EXPECT_TRUE(leadsNowhere(mapOf<TVRHBA_LogManagesRecord>(cache).findLast([](const auto&) { return true; }),
                             &TVRHBA_LogManagesRecord::Record));
    EXPECT_TRUE(
        leadsNowhere(mapOf<TVRHBA_CorrespondingSettingDataRecord>(cache).findLast([](const auto&) { return true; }),
                     &TVRHBA_CorrespondingSettingDataRecord::DataRecord));
    EXPECT_TRUE(leadsNowhere(mapOf<TVRHBA_RecordAppliesToElement>(cache).findLast([](const auto&) { return true; }),
                             &TVRHBA_RecordAppliesToElement::Antecedent));

    CreateDiagnosticCompletionRecord(cache, outcome); // and those are there already
    for (const char* line :
         {"Insert Failed : TVRHBA_LogManagesRecord", "Insert Failed : TVRHBA_CorrespondingSettingDataRecord",
          "Insert Failed : RecordAppliesToElement"})
        EXPECT_TRUE(isLogged(line)) << line;
}

} // namespace
