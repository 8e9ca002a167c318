// What a client may change about the settings of a test, and the maps of the feature where no host leads them: keys
// that are there already, a port without a name, records of tests that nobody ran.
#include "diagnostics/DiagnosticSettings.h"
#include "agent/Build.h"
#include "diagnostics/ConcreteJobs.h"
#include "diagnostics/DiagnosticFeature.h"
#include "diagnostics/DiagnosticRun.h"
#include "diagnostics/DiagnosticsLog.h"
#include "diagnostics/Executors.h"
#include "schema/TVRHBA_ConcreteJob.h"
#include "schema/TVRHBA_DiagElementSettingData.h"
#include "schema/TVRHBA_DiagnosticCompletionRecord.h"
#include "schema/TVRHBA_DiagnosticServiceRecord.h"
#include "schema/TVRHBA_DiagnosticSettingDataRecord.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_FCHBADiagnosticTest.h"
#include "schema/TVRHBA_JobSettingData.h"
#include "schema/TVRHBA_LogManagesRecord.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RecordAppliesToElement.h"
#include "tests/support/Eventually.h"
#include "tests/unit/device/FakeHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <map>
#include <optional>
#include <string_view>

using namespace cimple;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

using Settings = TVRHBA_FCHBADiagnosticSettingData;
using Lines = std::vector<std::string>;

Array<std::uint8_t> bytes(std::string_view text)
{
    Array<std::uint8_t> array;
    array.append(reinterpret_cast<const std::uint8_t*>(text.data()), text.size());
    return array;
}

std::string text(const Array<std::uint8_t>& array)
{
    return {array.begin(), array.end()};
}

TEST(DiagnosticSettings, LoopsAreANumberAtTheFrontOfFourCharacters)
{
    for (const auto& [parameter, count] : std::initializer_list<std::pair<const char*, unsigned>>{
             {"1", 1}, {"4000", 4000}, {"0012", 12}, {"12x", 12}, {"9 9", 9}})
        EXPECT_EQ(loopCount(parameter), count) << parameter;
    for (const char* parameter : {"", "0", "4001", "9999", "12345", "00001", "-1", "x1"})
        EXPECT_EQ(loopCount(parameter), std::nullopt) << parameter;
}

TEST(DiagnosticSettings, PatternsAreFittedToTheSize)
{
    struct Row
    {
        const char* pattern;
        std::uint32_t size;
        const char* fitted; ///< null where it is invalid
    };
    for (const auto& [pattern, size, fitted] : std::initializer_list<Row>{{"ab", 4, "ab00"},
                                                                          {"0123456789abcdefABCDEF", 8, "01234567"},
                                                                          {"aF", 2, "aF"},
                                                                          {"", 3, "000"},
                                                                          {"ab", 0, nullptr},
                                                                          {"ag", 4, nullptr},
                                                                          {"abcdefgh", 2, nullptr},
                                                                          {"a\xE1", 4, nullptr}})
    {
        const auto result = fitPattern(bytes(pattern), size);
        ASSERT_EQ(result.has_value(), fitted != nullptr) << pattern;
        if (fitted)
        {
            EXPECT_EQ(text(*result), fitted);
        }
    }
}

/// Waits for the last line of the refresh thread, which it writes after it let go of the model.
class RefreshEnd : public TVR_LoggerInterface
{
public:
    RefreshEnd() { TVR_Logger::instance().addSink(this); }
    ~RefreshEnd() override { TVR_Logger::instance().removeSink(this); }
    void logMessage(int, const char*, unsigned, const char* message) override
    {
        if (std::string_view(message).ends_with("Thread END"))
            _ended = true;
    }
    void start() override {}
    void stop() override {}
    void clearLog() override {}

    bool await() const
    {
        return test_support::eventually([&] { return _ended.load(); });
    }

private:
    std::atomic<bool> _ended = false;
};

/// An agent with a system, and a port that no library knows.
class DiagnosticMaps : public testing::Test
{
protected:
    DiagnosticMaps() : agent(*ProviderAgent::instance())
    {
        const RefreshEnd refresh;
        ProviderAgent::addRef();
        agent.BuildCimpleInfo();
        EXPECT_TRUE(refresh.await());
        Ref<CIM_ComputerSystem> system = fresh<CIM_ComputerSystem>();
        system->CreationClassName.set("CIM_ComputerSystem");
        system->Name.set("host");
        mapOf<CIM_ComputerSystem>(agent).insert(system, "refused");
        controller = fresh<TVRHBA_PortController>();
        controller->DeviceID.set("1000027A51160210");
        mapOf<TVRHBA_PortController>(agent).insert(controller, "refused");
        log.emplace();
    }
    ~DiagnosticMaps() override
    {
        log.reset();
        ProviderAgent::releaseRef();
    }

    /// The lines that the work left behind, but for those of converted names.
    template <class Work> Lines linesOf(Work work)
    {
        log->lines.clear();
        work();
        Lines lines = log->lines;
        std::erase_if(lines,
                      [](const std::string& line)
                      {
                          return line.find("TVR_MethodWrapper::") != line.npos || line.find(" is:: ") != line.npos ||
                                 line.find("wwpn:(") != line.npos;
                      });
        return lines;
    }

    ProviderAgent& agent;
    Ref<TVRHBA_PortController> controller;
    std::optional<LogCapture> log;
};

// --- settings that clients give

const std::string usual = "5 Using the overrided values if valid, else default settings values are used";

struct Override
{
    const char* test;
    std::function<void(Settings& input)> give;
    Lines twice; ///< logged in both passes
    std::function<void(Settings& settings)> expect;
    Lines once = {}; ///< behind these
};

const char* const external = "TVR:FCHBA External Loopback Test";
const char* const ping = "TVR:FCHBA Ping Test";
const std::string checking = "5 Checking the Echo test targetdevice";
const std::string noLun = "5 Invalid LUN, Using the default value '0' ";

const Override overrides[] = {
    {external,
     [](Settings& input)
     {
         input.LoopControl.set({3, 9});
         input.LoopControlParameter.set({"4000", "9999"});
         input.HaltOnError.set(true);
         input.BufferSizes.set({4});
         input.BufferPattern.set(bytes("ab"));
     },
     {"5 Input LoopControl : 3", "5 Input LoopControlParam : 4000", "5 Input Buffer Size : 4",
      "5 Valid Pattern entered"},
     [](Settings& settings)
     {
         settings.LoopControlParameter.set({"4000"});
         settings.HaltOnError.set(true);
         settings.BufferSizes.set({4});
         settings.BufferPattern.set(bytes("ab00"));
     }},
    {external,
     [](Settings& input)
     {
         input.LoopControl.set({4});
         input.LoopControlParameter.set({"4001"});
         input.BufferSizes.set({9});
         input.BufferPattern.set(bytes("xyz"));
     },
     {"5 Input LoopControl : 4", "5 Invalid LoopControl, Valid value is '3'. Using the default value",
      "5 Input LoopControlParam : 4001",
      "5 Invalid LoopControlParam, Valid value range[1-4000]. Using the default value", "5 Input Buffer Size : 9",
      "5 Invalid BufferSizes, Valid value is '<8'. Using the default value",
      "5 Invalid BufferPattern, Use hex values. Using the default value"},
     [](Settings&) {}},
    {external,
     [](Settings& input)
     {
         input.LoopControl.set({});
         input.LoopControlParameter.set({});
         input.BufferSizes.set({});
     },
     {"5 Invalid LoopControl, Valid value is '3'. Using the default value",
      "5 Invalid LoopControlParam, Valid value range[1-4000]. Using the default value",
      "5 Invalid BufferSizes, Valid value is '<8'. Using the default value"},
     [](Settings&) {}},
    {external,
     [](Settings& input)
     {
         input.BufferSizes.set({0});
         input.BufferPattern.set(bytes("ab"));
         input.LUN.set(7);
         input.TargetDevice.set("5063D20000000001");
     },
     {"5 Input Buffer Size : 0", "5 Invalid BufferPattern, Use hex values. Using the default value"},
     [](Settings& settings) { settings.BufferSizes.set({0}); }},
    {ping,
     [](Settings& input)
     {
         input.BufferSizes.set({8});
         input.LUN.set(7);
         input.TargetDevice.set("5063D20000000001");
         input.PingMechanism.set(4);
     },
     {"5 Input Buffer Size : 8"},
     [](Settings& settings)
     {
         settings.LUN.set(7);
         settings.TargetDevice.set("5063D20000000001");
     },
     {checking, "5 Input TargetDevice : 5063D20000000001"}},
    {ping, [](Settings& input) { input.TargetDevice.set("5063D2000000000"); }, {}, [](Settings&) {}, {checking, noLun}},
    {"TVR:FCHBA Beacon Test", [](Settings& input) { input.LoopControlParameter.set({"9"}); }, {}, [](Settings&) {}},
    {"TVR:FCHBA D-Port Test", [](Settings& input) { input.HaltOnError.set(true); }, {}, [](Settings&) {}},
};

TEST_F(DiagnosticMaps, ValidOverridesChangeTheSettingsInTheCacheAndNoAssociation)
{
    for (const Override& row : overrides)
    {
        SCOPED_TRACE(row.test);
        ClearDiagnosticClassMaps(agent, 0);
        ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
        Settings* cached = getDefaultTVRHBA_FCHBADiagnosticSettingDataInstance(agent, row.test);
        ASSERT_NE(cached, nullptr);
        const Ref<Settings> before(clone_of(cached));
        const Ref<Settings> expected(clone_of(cached));
        expected->OverridedSettingData.set(1);
        row.expect(*expected);

        Ref<Settings> input = empty<Settings>();
        input->InstanceID.set(row.test);
        row.give(*input);
        Lines lines = {usual};
        for (const Lines* part : {&row.twice, &row.twice, &row.once})
            lines.insert(lines.end(), part->begin(), part->end());
        const Settings* used = nullptr;
        EXPECT_EQ(linesOf([&] { used = getTVRHBA_FCHBADiagnosticSettingDataInstance(agent, input.get(), row.test); }),
                  lines);
        EXPECT_EQ(used, cached);
        EXPECT_TRUE(identical(cached, expected.get()));
        EXPECT_NE(mapOf<TVRHBA_DiagElementSettingData>(agent).findFirst(
                      [&](const auto& known) { return identical(known.SettingData, before.get()); }),
                  nullptr);
    }
}

TEST_F(DiagnosticMaps, OtherSettingsAreRefusedOrLeftAlone)
{
    ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
    const auto merged = [&](const Instance* input, const char* test)
    { return getTVRHBA_FCHBADiagnosticSettingDataInstance(agent, input, test); };
    Ref<Settings> input = empty<Settings>();
    const std::string invalid = "5 Invalid overrided Diagsetting param, default settings values are used";
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(nullptr, ping), nullptr); }), ElementsAre(invalid));
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(controller.get(), ping), nullptr); }), ElementsAre(invalid));
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(input.get(), ping), nullptr); }), IsEmpty()) << "without a key";
    input->InstanceID.set(external);
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(input.get(), ping), nullptr); }), IsEmpty());
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(input.get(), "another"), nullptr); }),
                ElementsAre("5 Could not find the default setting data"));

    for (const char* test : {"TVR:FCHBA Status Test", "TVR:FCHBA Reset Test", "TVR:FCHBA Self Test"})
    {
        input->InstanceID.set(test);
        input->HaltOnError.set(true);
        EXPECT_THAT(linesOf(
                        [&]
                        {
                            const Settings* used = merged(input.get(), test);
                            ASSERT_NE(used, nullptr);
                            EXPECT_FALSE(used->HaltOnError.value);
                            EXPECT_EQ(used->OverridedSettingData.value, 0u);
                        }),
                    ElementsAre(usual, std::string("5 No Override Setting Supported for test : ") + test));
    }
}

TEST_F(DiagnosticMaps, JobSettingsAreOneForAllTests)
{
    ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
    TVRHBA_JobSettingData* cached = getDefaultTVRHBA_JobSettingDataInstance(agent);
    ASSERT_NE(cached, nullptr);
    Ref<TVRHBA_JobSettingData> input = empty<TVRHBA_JobSettingData>();
    const auto merged = [&](const Instance* from) { return getTVRHBA_JobSettingDataInstance(agent, from); };
    EXPECT_THAT(linesOf(
                    [&]
                    {
                        EXPECT_EQ(merged(nullptr), nullptr);
                        EXPECT_EQ(merged(controller.get()), nullptr);
                        EXPECT_EQ(merged(input.get()), nullptr) << "without a key";
                    }),
                IsEmpty());
    input->InstanceID.set("TVR:FCHBA JobSettingData");
    input->DeleteOnCompletion.set(true);
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(input.get()), cached); }), ElementsAre(usual));
    EXPECT_TRUE(cached->DeleteOnCompletion.value);
    input->DeleteOnCompletion.set_null();
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(merged(input.get()), cached); }),
                ElementsAre(usual, "5 Missing DeleteOnCompletion parameter, Valid values are 1 or 0. Using the default "
                                   "value"));
    EXPECT_TRUE(cached->DeleteOnCompletion.value);
}

// --- maps that do not take everything

TEST_F(DiagnosticMaps, ATestOfWhichAPartIsRefusedLeavesNothingAndTheOthersStand)
{
    Ref<TVRHBA_DiagnosticsLog> other = fresh<TVRHBA_DiagnosticsLog>();
    other->InstanceID.set(ping);
    mapOf<TVRHBA_DiagnosticsLog>(agent).insert(other, "refused");
    std::uint32_t status = 1;
    linesOf([&] { status = CreateFCHBADiagnosticClassFeature(agent); });
    EXPECT_EQ(status, 0u);
    EXPECT_THAT(log->notable(),
                ElementsAre("3 GetDiagnosticVersion:RM_GetHBAAttributes call failed (1)",
                            "1 Insert Failed : DiagnosticsLog_map",
                            std::string("3 Failed to insert the Diag Instances into map for DiagTest ") + ping,
                            "3 Tag:200 not supported for Port 1000027A51160210",
                            "2 DPort not supported on this port: 1000027A51160210"));
    EXPECT_EQ(log->count("5 FCHBA Registration Profile instance missing"), 1);

    EXPECT_EQ(mapOf<TVRHBA_DiagnosticsLog>(agent).first(), other.get());
    // Nine tests, of which one does not run on the port.
    const std::map<std::string, std::size_t> unlike = {{"TVRHBA_DiagnosticsLog", 10},
                                                       {"TVRHBA_JobSettingData", 1},
                                                       {"TVRHBA_AvailableDiagnosticService", 8},
                                                       {"TVRHBA_ServiceAffectsElement", 8},
                                                       {"TVRHBA_DiagServiceConformsToProfile", 0}};
    for (const MapRow& row : allMaps())
        if (const char* name = row.meta_class->name; row.group == MapGroup::Diagnostics)
        {
            EXPECT_EQ((agent.*row.map).size(), unlike.contains(name) ? unlike.at(name) : 9u) << name;
        }
}

TEST_F(DiagnosticMaps, WithoutAPortThatCanBeAskedThereAreNoDiagnostics)
{
    mapOf<TVRHBA_PortController>(agent).clear();
    Ref<TVRHBA_PortController> nameless = fresh<TVRHBA_PortController>();
    nameless->DeviceID.set("no name");
    mapOf<TVRHBA_PortController>(agent).insert(nameless, "refused");
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(CreateFCHBADiagnosticClassFeature(agent), 40002u); }),
                ElementsAre("5 Number of FCHBA ManagedElement : 1", "3 INVALID HBA Name",
                            "5 TVRHBA_DiagTestFunc::str2HBAName failed",
                            "5 FCHBA Diagnostics are not supported in any of the managed element"));
    EXPECT_EQ(mapOf<TVRHBA_FCHBADiagnosticTest>(agent).size(), 0u);
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(GetDiagnosticVersion("1000027A51160210", nullptr), 32768u); }),
                ElementsAre("5 Invalid Argument"));
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(IsFeatureTagSupported("no name", 200), 32768u); }),
                ElementsAre("3 INVALID HBA Name", "5 str2HBAName failed"));
}

// --- methods on what no host has

TEST_F(DiagnosticMaps, ATestOutsideOfTheCatalogIsNotRun)
{
    constexpr char unknown[] = "TVR:FCHBA Unknown Test";
    ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
    Ref<TVRHBA_FCHBADiagnosticTest> test = fresh<TVRHBA_FCHBADiagnosticTest>();
    test->Name.set(unknown);
    mapOf<TVRHBA_FCHBADiagnosticTest>(agent).insert(test, "refused");
    Ref<Settings> settings = fresh<Settings>();
    settings->InstanceID.set(unknown);
    mapOf<Settings>(agent).insert(settings, "refused");
    Ref<TVRHBA_PortController> nameless = fresh<TVRHBA_PortController>();
    nameless->DeviceID.set("no name"); // it goes on with none
    mapOf<TVRHBA_PortController>(agent).insert(nameless, "refused");
    Ref<CIM_DiagnosticService_RunDiagnosticService_method> parameters(
        create<CIM_DiagnosticService_RunDiagnosticService_method>());
    parameters->ManagedElement = clone_of(nameless.get());
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(diagnosticTestMethods()[0].call(test.get(), parameters.get()), 0); }),
                testing::IsSupersetOf({"5 TVRHBA_FCHBADiagnosticTest_Provider::str2HBAName failed",
                                       "5 Started Diagnostic : TVR:FCHBA Unknown Test", "5 Invalid Test Name"}));
    EXPECT_EQ(parameters->return_value.value, 1u);
    EXPECT_EQ(parameters->Job, nullptr);
}

TEST_F(DiagnosticMaps, AJobOfAPortWithoutANameIsNotCancelled)
{
    Ref<TVRHBA_ConcreteJob> job = fresh<TVRHBA_ConcreteJob>();
    job->InstanceID.set("job");
    job->Name.set("TVR:FCHBA D-Port Test");
    job->diagHandle.set(1);
    job->wwpn.set("no name");
    mapOf<TVRHBA_ConcreteJob>(agent).insert(job, "refused");
    Ref<TVRHBA_ConcreteJob_RequestStateChange_method> parameters(
        create<TVRHBA_ConcreteJob_RequestStateChange_method>());
    parameters->RequestedState.set(4);
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(concreteJobMethods()[0].call(job.get(), parameters.get()), 0); }),
                testing::Contains("5 TVRHBA_ConcreteJob_Provider: RequestStateChange:str2HBAName failed"));
    EXPECT_EQ(parameters->return_value.value, 4097u);
    ClearDiagnosticClassMaps(agent, 2);
}

TEST_F(DiagnosticMaps, ALoopbackOfAnotherModeIsRefused)
{
    const Ref<Settings> settings = empty<Settings>();
    const Ref<TVRHBA_JobSettingData> jobSettings = empty<TVRHBA_JobSettingData>();
    TestRun run{agent, *findDiagnosticTest(external), {}, *settings, *jobSettings, *controller};
    EXPECT_THAT(linesOf([&] { EXPECT_EQ(LoopBackTest(run, 7), 4); }),
                ElementsAre("5 TVR_Diagnostics::LoopBackTest", "5 Error: Wrong Test type passed: 7"));
    EXPECT_FALSE(run.job);
}

// --- records of runs

class DiagnosticRecords : public DiagnosticMaps
{
protected:
    template <class Record> void addRecord(const std::string& job, const char* test)
    {
        Ref<Record> record = fresh<Record>();
        record->InstanceID.set(job);
        record->ServiceName.set(test);
        mapOf<Record>(agent).insert(record, "refused");
        using Manages = TVRHBA_LogManagesRecord;
        const auto* testLog = mapOf<TVRHBA_DiagnosticsLog>(agent).findFirst([&](const auto& known)
                                                                            { return known.InstanceID.value == test; });
        join<Manages>(agent, &Manages::Log, testLog, &Manages::Record, record.get(), "refused");
        using Applies = TVRHBA_RecordAppliesToElement;
        join<Applies>(agent, &Applies::Antecedent, record.get(), &Applies::Dependent, controller.get(), "refused");
    }

    template <class Record, class Id> std::vector<std::string> idsOf(Id id)
    {
        std::vector<std::string> ids;
        const auto map = mapOf<Record>(agent);
        for (std::size_t i = 0; const Record* record = map.at(i); i++)
            ids.emplace_back(id(*record)->InstanceID.value.c_str());
        return ids;
    }
};

TEST_F(DiagnosticRecords, OneLogIsClearedAndTheOthersKeepTheirOrder)
{
    ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
    for (const auto& [job, test] : std::initializer_list<std::pair<const char*, const char*>>{
             {"1", ping}, {"2", external}, {"3", ping}, {"4", external}})
    {
        addRecord<TVRHBA_DiagnosticServiceRecord>(std::string(job) + "s", test);
        addRecord<TVRHBA_DiagnosticCompletionRecord>(std::string(job) + "c", test);
        addRecord<TVRHBA_DiagnosticSettingDataRecord>(std::string(job) + "d", test);
    }
    Ref<TVRHBA_DiagnosticsLog> reference = empty<TVRHBA_DiagnosticsLog>();
    reference->InstanceID.set(ping);
    Ref<CIM_Log_ClearLog_method> parameters(create<CIM_Log_ClearLog_method>());
    EXPECT_EQ(diagnosticsLogMethods()[0].call(reference.get(), parameters.get()), 0);
    EXPECT_EQ(parameters->return_value.value, 0u);

    const auto itself = [](const auto& record) { return &record; };
    EXPECT_THAT(idsOf<TVRHBA_DiagnosticServiceRecord>(itself), ElementsAre("2s", "4s"));
    EXPECT_THAT(idsOf<TVRHBA_DiagnosticCompletionRecord>(itself), ElementsAre("2c", "4c"));
    EXPECT_THAT(idsOf<TVRHBA_DiagnosticSettingDataRecord>(itself), ElementsAre("1d", "2d", "3d", "4d"));
    EXPECT_THAT(idsOf<TVRHBA_LogManagesRecord>([](const auto& manages) { return manages.Record; }),
                ElementsAre("2s", "2c", "2d", "4s", "4c", "4d"));
    EXPECT_THAT(idsOf<TVRHBA_RecordAppliesToElement>([](const auto& applies) { return applies.Antecedent; }),
                ElementsAre("2s", "2c", "2d", "4s", "4c", "4d"));
}

TEST_F(DiagnosticRecords, OutliveTheTestsAndTheAdapters)
{
    ASSERT_EQ(CreateFCHBADiagnosticClassFeature(agent), 0u);
    addRecord<TVRHBA_DiagnosticServiceRecord>("1", ping);
    Ref<TVRHBA_ConcreteJob> job = fresh<TVRHBA_ConcreteJob>();
    job->InstanceID.set("1");
    mapOf<TVRHBA_ConcreteJob>(agent).insert(job, "refused");
    agent.clearAdapterMaps();
    EXPECT_EQ(mapOf<TVRHBA_FCHBADiagnosticTest>(agent).size(), 0u);
    ClearDiagnosticClassMaps(agent, 0);
    ClearDiagnosticClassMaps(agent, 3);
    EXPECT_EQ(mapOf<TVRHBA_LogManagesRecord>(agent).size(), 1u);
    ClearDiagnosticClassMaps(agent, 1);
    EXPECT_EQ(mapOf<TVRHBA_LogManagesRecord>(agent).size(), 0u);
    EXPECT_EQ(mapOf<TVRHBA_ConcreteJob>(agent).size(), 1u);
    ClearDiagnosticClassMaps(agent, 2);
    EXPECT_EQ(mapOf<TVRHBA_ConcreteJob>(agent).size(), 0u);
}

} // namespace
