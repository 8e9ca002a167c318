// Runs of the tests that end before their method does: what the client gets, what is left of them, and what the log
// says. The test of a link is in DPortTest.cpp.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/Process.h"
#include "tests/module/ServiceHost.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <future>
#include <map>
#include <thread>
#include <unistd.h>

using namespace module_test;
using namespace std::chrono_literals;
using broker::Value;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::IsSupersetOf;

namespace
{

using Lines = std::vector<std::string>;
using Settings = std::vector<broker::Property>;

constexpr char firstPort[] = "1000027A51160210";
constexpr char target[] = "50063D200110000A"; ///< of the first port
constexpr char advice[] = " : Suggested Actions ";

std::string nameOf(const std::string& test)
{
    return "TVR:FCHBA " + test + " Test";
}

Value instanceOf(const char* className, const std::string& id, Settings properties)
{
    broker::Object object;
    object.path.className = className;
    object.properties = std::move(properties);
    object.properties.push_back({"InstanceID", Value::string(id)});
    return Value::instance(object);
}

broker::Property overrides(const std::string& test, const Settings& properties)
{
    return {"DiagnosticSettings", instanceOf("TVRHBA_FCHBADiagnosticSettingData", nameOf(test), properties)};
}

broker::Property deletion(bool deleted)
{
    return {"JobSettings", instanceOf("TVRHBA_JobSettingData", "TVR:FCHBA JobSettingData",
                                      {{"DeleteOnCompletion", Value::boolean(deleted)}})};
}

/// What a test needs of the client to be run at all.
Settings needsOf(const std::string& test)
{
    if (test != "Echo" && test != "Ping")
        return {};
    return {overrides(test, {{"TargetDevice", Value::string(target)}})};
}

class TestHost : public ServiceHost
{
public:
    explicit TestHost(const std::string& scenario = "default") : ServiceHost("TVRHBA_FCHBADiagnosticTest", scenario)
    {
        controller = theOne(*this, "TVRHBA_PortController", "DeviceID", firstPort).path;
    }

    Answer run(const std::string& test, Settings settings)
    {
        service.setKey("Name", Value::string(nameOf(test)));
        settings.push_back({"ManagedElement", Value::reference(controller)});
        return call("RunDiagnosticService", "[TVR_DBG] TVRHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService",
                    settings);
    }
    Answer run(const std::string& test) { return run(test, needsOf(test)); }
    std::size_t count(const char* className) { return instancesOf(className).size(); }
    /// Jobs and their associations, service and completion records.
    Lines leftBehind()
    {
        Lines counts;
        for (const char* className : {"TVRHBA_ConcreteJob", "TVRHBA_OwningJobElement", "TVRHBA_AffectedJobElement",
                                      "TVRHBA_DiagnosticServiceRecord", "TVRHBA_DiagnosticCompletionRecord"})
            counts.push_back(std::to_string(count(className)));
        return counts;
    }

    broker::Path controller;
};

/// InstanceID of the client's job; empty without one.
std::string jobOf(const Answer& answer)
{
    const Value job = answer.at("Job");
    return job.isNull() ? std::string() : job.asPath().key("InstanceID")->asString();
}

std::string numberOf(const broker::Object& object, const char* property)
{
    const Value value = object.get(property);
    return value.isNull() ? "-" : std::to_string(value.asUnsigned());
}

// --- a run from its beginning to its end

TEST(DiagnosticRun, ARunLeavesAJobAndItsRecords)
{
    TestHost host;
    const Answer answer = host.run(
        "Echo",
        {overrides("Echo", {{"TargetDevice", Value::string(target)},
                            {"LUN", Value::uint64(0)},
                            {"HaltOnError", Value::boolean(true)},
                            {"LoopControlParameter", Value::array(CMPI_string, {Value::string("12")})},
                            {"BufferPattern", Value::array(CMPI_uint8, {Value::uint8('f'), Value::uint8('0')})}})});
    EXPECT_EQ(answer.value, 0u);
    const std::string id = "TVR:FCHBA Echo Test:1:1";
    EXPECT_EQ(jobOf(answer), id);
    const std::string port = "[TVR_DBG] PortController : Tavrin TV1602 FV11.4.210.8 DV12.0.0.1";
    EXPECT_THAT(
        answer.lines,
        ElementsAre(
            "[TVR_DBG] Device ID 1000027A51160210", "[TVR_DBG] Using the default TVRHBA_JobSettingData Instance",
            "[TVR_DBG] Entered embedded instance",
            "[TVR_DBG] Using the overrided values if valid, else default settings values are used",
            "[TVR_DBG] Input LoopControlParam : 12", "[TVR_DBG] Valid Pattern entered",
            "[TVR_DBG] Input LoopControlParam : 12", "[TVR_DBG] Valid Pattern entered",
            "[TVR_DBG] Checking the Echo test targetdevice", "[TVR_DBG] Input TargetDevice : 50063D200110000A",
            "[TVR_DBG] Started Diagnostic : TVR:FCHBA Echo Test", "[TVR_DBG] TVR_Diagnostics::EchoTest/Ping",
            "[TVR_DBG] Diagnostics Name : TVR:FCHBA Echo Test", "[TVR_DBG] Number of test cycles set to run : 12 ",
            "[TVR_DBG] HaltOnError value : 1 ", "[TVR_DBG] Pattern used for testing f0000000",
            "[TVR_DBG] TargetDevice WWPN to check : 50063D200110000A", "[TVR_DBG] Polling for the results.. : 60",
            "[TVR_DBG] Polling for the results.. : 60", "[TVR_DBG] Polling for the results.. : 0",
            "[TVR_DBG] MapDiagResultStatus", "[TVR_DBG] CreateConcreteJobInstantiateNonBlocking",
            "[TVR_DBG] TVR_Diagnostics::CreateDiagnosticServiceRecord", port, port,
            "[TVR_DBG] TVR_Diagnostics::CreateDiagnosticCompletionRecord", port,
            "[TVR_DBG] TVR:FCHBA Echo Test Launched/Completed Succesful",
            "[TVR_DBG] Adding the embedded instance for Settingdatarecord : "
            "TVR:FCHBA Echo Test:1:1:SettingData Record"));

    broker::Object job = theOne(host, "TVRHBA_ConcreteJob", "InstanceID", id);
    EXPECT_EQ(describe(broker::Object{job.path, {{"TimeSubmitted", job.get("TimeSubmitted")}}}),
              describe(broker::Object{job.path, {{"TimeSubmitted", job.get("ElapsedTime")}}}));
    std::erase_if(job.properties, [](const broker::Property& property)
                  { return property.name == "TimeSubmitted" || property.name == "ElapsedTime"; });
    EXPECT_EQ(describe(job), R"(
DeleteOnCompletion = false
ElementName = "TVRHBA_ConcreteJob"
InstanceID = "TVR:FCHBA Echo Test:1:1"
JobRunTimes = 1
JobState = 7
Name = "TVR:FCHBA Echo Test"
PercentComplete = 100
TimeBeforeRemoval = "00000000000500.000000:000"
)");
    const broker::Object owning = host.instancesOf("TVRHBA_OwningJobElement").at(0);
    EXPECT_EQ(owning.get("OwnedElement").asPath().key("InstanceID")->asString(), id);
    EXPECT_EQ(owning.get("OwningElement").asPath().key("Name")->asString(), nameOf("Echo"));
    const broker::Object affected = host.instancesOf("TVRHBA_AffectedJobElement").at(0);
    EXPECT_EQ(affected.get("AffectingElement").asPath().key("InstanceID")->asString(), id);
    EXPECT_EQ(affected.get("AffectedElement").asPath().key("DeviceID")->asString(), firstPort);
    EXPECT_TRUE(affected.get("ElementEffects").isNull());

    const broker::Object record = host.instancesOf("TVRHBA_DiagnosticServiceRecord").at(0);
    EXPECT_EQ(text(record, "InstanceID"), id + ":Service Record");
    EXPECT_EQ(text(record, "RecordData"), "TVR:FCHBA Echo Test Resulted with Success");
    EXPECT_EQ(numberOf(record, "LoopsPassed") + " " + numberOf(record, "LoopsFailed"), "12 0");
    const Value settings = host.instancesOf("TVRHBA_DiagnosticSettingDataRecord").at(0).get("Settings");
    ASSERT_FALSE(settings.isNull());
    EXPECT_EQ(text(settings.asObject(), "TargetDevice"), target);
    host.unload();
}

// --- how tests end

struct Ending
{
    const char* test;
    const char* diagnostics; ///< of the simulated port
    std::vector<std::string> faults;
    std::uint64_t value;
    const char* state;   ///< of the job; null without one
    std::string message; ///< of the completion record
    std::chrono::seconds time;
    Lines lines = {}; ///< among others
};

std::string fault(const std::string& function, const std::string& effect)
{
    return R"({"function": ")" + function + R"(", "subject": ")" + firstPort + R"(", )" + effect + "}";
}

constexpr char forEver[] = R"({"self": {"polls": 4294967295}})";
constexpr char plug[] = R"({"loopbackPlug": true})";
constexpr char noPlug[] = "[TVR_DBG] Loopback plug is not detected. Unabled to run test. Install loopback plug and "
                          "make sure HBA Port is Up/Ready.. ";
const std::string busy = "[TVR_DBG] Adapter Busy: Another critical application may be running , Exited with error "
                         "code : 64";
const std::string unavailable = "[TVR_DBG] Diagnostics not available/Port not supported , Exited with error code : ";

// clang-format off
const Ending endings[] = {
    // Each test, when all is well.
    {"Ping", "{}", {}, 0, "7 100", "TVR:FCHBA Ping Test Resulted with Success", 3s},
    {"External Loopback", plug, {}, 0, "7 100", "TVR:FCHBA External Loopback Test Resulted with Success", 4s,
     {"[TVR_DBG] TVR_Diagnostics::LoopBackTest", "[TVR_DBG] TVR:FCHBA External Loopback Test",
     "[TVR_DBG] Number of test cycles set to run : 100 ", "[TVR_DBG] HaltOnError value : 0 ",
     "[TVR_DBG] The Input pattern used for testing 1a2b3c4d"}},
    {"Host Loopback", "{}", {}, 0, "7 100", "TVR:FCHBA Host Loopback Test Resulted with Success", 3s},
    {"Internal Loopback", "{}", {}, 0, "7 100", "TVR:FCHBA Internal Loopback Test Resulted with Success", 4s},
    {"Self", "{}", {}, 0, "7 100", "TVR:FCHBA Self Test Resulted with Success", 4s,
     {"[TVR_DBG] TVR_DiagTestFunc::SelfTest", "[TVR_DBG] Polling for the results.. 60",
     "[TVR_DBG] Polling for the results.. 0"}},
    {"Status", "{}", {}, 0, "7 100", "TVR:FCHBA Status Test Resulted with Success", 0s,
     {"[TVR_DBG] TVR_DiagTestFunc::StatusTest", "[TVR_DBG] RM_GetPortAttributes call result : 0",
     "[TVR_DBG] TVR:FCHBA Status Test Succesful"}},
    {"Reset", "{}", {}, 0, "7 100", "TVR:FCHBA Reset Test Success", 0s,
     {"[TVR_DBG] TVR_DiagTestFunc::FCHBAResetTest", "[TVR_WARN] WWN 10:00:02:7A:51:16:02:10 is reset",
     "[TVR_DBG] TVR:FCHBA Reset Test Succesful"}},
    {"Beacon", "{}", {}, 0, "7 100", "TVR:FCHBA Beacon Test Resulted with Success", 40s,
     {"[TVR_DBG] TVR:FCHBA Beacon Test Succesful", "[TVR_DBG] TVR:FCHBA Beacon Test Launched/Completed Succesful"}},

    // A bad result is a job, and no failure of the method.
    {"Echo", R"({"echo": {"result": 9}})", {}, 0, "10 0",
     "TVR:FCHBA Echo Test Resulted with Failure, Result - Error: Echo Failed ", 3s},
    {"Host Loopback", R"({"hostLoopback": {"result": 20}})", {}, 0, "10 0",
     "TVR:FCHBA Host Loopback Test Resulted with Failure, Result - Unknown", 3s},
    {"Self", R"({"self": {"result": 11}})", {}, 0, "10 0",
     "TVR:FCHBA Self Test Resulted with Failure, Result - Error: HBA temperature exceeded operational range. Adapter "
     "stopped.\n\nPlease see the product documentation", 4s},
    {"Echo", R"({"echo": {"endState": "cancelled"}})", {}, 0, "10 0",
     "TVR:FCHBA Echo Test Unknown error, Exited with error code : 0", 3s},
    {"Internal Loopback", R"({"internalLoopback": {"endState": 0}})", {}, 0, "10 0",
     "TVR:FCHBA Internal Loopback Test Unknown Error, Exited with error code: 0", 4s},
    {"Self", R"({"self": {"endState": 7}})", {}, 0, "10 0",
     "TVR:FCHBA Self Test Unknown Error, Exited with error code: 0", 4s},

    // Without a result there is none.
    {"Host Loopback", R"({"hostLoopback": {"busy": 1}})", {}, 40064, nullptr, "", 0s,
     {busy, "[TVR_DBG] TVR:FCHBA Host Loopback Test Failed to Run"}},
    {"Internal Loopback", R"({"internalLoopback": {"startStatus": 251}})", {}, 40251, nullptr, "", 1s,
     {"[TVR_DBG] Test not supported on this firmware. , Exited with error code : 251"}},
    {"Self", R"({"self": {"endStatus": 77}})", {}, 40077, nullptr, "", 4s,
     {"[TVR_DBG] Unknown , Exited with error code : 77"}},
    {"Echo", "{}", {fault("LRM_GetPortAttributes", R"("status": 2)")}, 40002, nullptr, "", 0s,
     {"[TVR_DBG] RM_GetPortAttributes command failed. Exited with error code : 2"}},
    {"External Loopback", "{}", {}, 40001, nullptr, "", 1s, {noPlug}},
    // Where the port does not tell, it is tried.
    {"External Loopback", plug, {fault("LRM_GetPortAttributes", R"("from": 2, "status": 2)")}, 0, "7 100",
     "TVR:FCHBA External Loopback Test Resulted with Success", 4s},
    {"External Loopback", plug, {fault("LRM_GetFcpTargetMapping", R"("status": 1)")}, 40001, nullptr, "", 1s, {noPlug}},

    // Tests that do not end are cancelled in the 449th second.
    {"Self", forEver, {}, 40060, nullptr, "", 450s,
     {"[TVR_DBG] Polling for the Cancel status ..: 0", "[TVR_DBG] Polling for the results.. : 0",
     "[TVR_DBG] Canceled the TVR:FCHBA Self Test", "[TVR_DBG] TVR:FCHBA Self Test is running "}},
    {"Self", R"({"self": {"polls": 4294967295, "runningStatus": 0, "runningState": "started"}})", {}, 0, nullptr, "",
     450s},
    {"Self", R"({"self": {"polls": 4294967295, "cancelStatus": 3}})", {}, 40060, nullptr, "", 900s,
     {"[TVR_DBG] Unknown error, Unable to cancel the test, Exited with the error code : 3"}},
    {"Host Loopback", R"({"hostLoopback": {"polls": 4294967295, "ignoresCancel": true}})", {}, 40060, nullptr, "",
     900s},
    {"Internal Loopback", R"({"internalLoopback": {"polls": 4294967295, "runningState": 0}})", {}, 40060, nullptr, "",
     451s},
    {"Self", R"({"self": {"polls": 448}})", {}, 0, "7 100", "TVR:FCHBA Self Test Resulted with Success", 449s},
    {"Self", "{}",
     {fault("LRM_DiagRunPOST", R"("hostile": "zeroHandle")"), fault("LRM_DiagGetResults", R"("status": 60)")}, 40060,
     nullptr, "", 450s},

    // What has its result at once may be busy first.
    {"Status", "{}", {fault("LRM_GetPortAttributes", R"("status": 7)")}, 40007, "10 0",
     "TVR:FCHBA Status Test Resulted with Failure, Exited with error code 7", 0s,
     {"[TVR_DBG] TVR:FCHBA Status Test Resulted with Failure, Exited with error code 7"}},
    {"Status", "{}", {fault("LRM_GetPortAttributes", R"("to": 2, "status": 64)")}, 0, "7 100",
     "TVR:FCHBA Status Test Resulted with Success", 0s},
    {"Status", "{}",
     {fault("LRM_GetPortAttributes", R"("to": 2, "status": 64)"), fault("LRM_GetPortAttributes", R"("status": 7)")},
     40007, nullptr, "", 0s, {"[TVR_DBG] TVR:FCHBA Status Test Resulted with Failure, Exited with error code 7"}},
    {"Status", "{}", {fault("LRM_GetPortAttributes", R"("status": 64)")}, 40064, nullptr, "", 0s, {busy}},
    {"Status", "{}", {fault("LRM_GetPortAttributes", R"("status": 63)")}, 40063, nullptr, "", 0s, {unavailable + "63"}},
    {"Reset", "{}", {fault("LRM_ResetHBA", R"("status": 190)")}, 40190, nullptr, "", 0s, {unavailable + "190"}},
    {"Reset", "{}", {fault("LRM_ResetHBA", R"("status": 97)")}, 40097, "10 0",
     "TVR:FCHBA Reset Test Resulted with Failure, Exited with error code 97", 0s},

    // The beacon.
    {"Beacon", "{}", {fault("LRM_DiagBeaconState", R"("status": 63)")}, 40063, "10 0", "", 0s,
     {"[TVR_DBG] TVR:FCHBA Beacon Test Succesful"}},
    {"Beacon", "{}", {fault("LRM_DiagBeacon", R"("to": 1, "status": 5)")}, 0, "10 0",
     "TVR:FCHBA Beacon Test Resulted with Failure, Exited with error code 5", 0s},
    {"Beacon", "{}", {fault("LRM_DiagBeacon", R"("from": 3, "to": 3, "status": 5)")}, 0, "7 100",
     "TVR:FCHBA Beacon Test Resulted with Failure, Exited with error code 5", 2s},
    {"Beacon", "{}", {fault("LRM_DiagBeacon", R"("from": 40, "status": 5)")}, 40005, "7 100",
     "TVR:FCHBA Beacon Test Resulted with Failure, Exited with error code 5", 40s,
     {"[TVR_DBG] Unable to set the previous beacon state"}},
};
// clang-format on

TEST(DiagnosticRun, EachTestEndsInItsWay)
{
    TestHost host;
    for (const Ending& row : endings)
    {
        SCOPED_TRACE(std::string(row.test) + " " + row.diagnostics + " " + testing::PrintToString(row.faults));
        host.setDiagnostics(firstPort, row.diagnostics);
        for (const std::string& rule : row.faults)
            host.addFault(rule);
        const Lines before = host.leftBehind();
        const auto begin = slept();
        const Answer answer = host.run(row.test);
        EXPECT_EQ(slept() - begin, row.time);
        advanceClock(begin - slept()); // no refresh is due
        host.clearFaults();
        EXPECT_EQ(answer.value, row.value);
        EXPECT_THAT(answer.lines, IsSupersetOf(row.lines));
        const std::string id = jobOf(answer);
        ASSERT_EQ(id.empty(), !row.state);
        if (!row.state)
        {
            EXPECT_EQ(host.leftBehind(), before);
            continue;
        }
        const broker::Object job = theOne(host, "TVRHBA_ConcreteJob", "InstanceID", id);
        EXPECT_EQ(numberOf(job, "JobState") + " " + numberOf(job, "PercentComplete"), row.state);
        const broker::Object record = theOne(host, "TVRHBA_DiagnosticCompletionRecord", "InstanceID", id);
        const bool passed = std::string(row.state) == "7 100";
        EXPECT_EQ(numberOf(record, "CompletionState"), passed ? "2" : "5");
        std::string message = text(record, "RecordData");
        if (!passed)
            message.erase(std::min(message.find(advice), message.size()));
        EXPECT_EQ(message, row.message);
    }
    host.unload();
}

TEST(DiagnosticRun, ABusyAdapterIsAskedFourHundredAndFiftyTimes)
{
    TestHost host;
    for (const auto& [test, function] : std::initializer_list<std::pair<const char*, const char*>>{
             {"Status", "LRM_GetPortAttributes"}, {"Reset", "LRM_ResetHBA"}})
    {
        host.addFault(fault(function, R"("status": 64)"));
        const std::size_t before = host.calls(function);
        EXPECT_EQ(host.run(test).value, 40064u) << test;
        EXPECT_EQ(host.calls(function) - before, 450u) << test;
        host.clearFaults();
    }
    host.unload();
}

TEST(DiagnosticRun, ADisabledPortIsNoFailureAndNoJob)
{
    TestHost host;
    host.setAttribute(firstPort, R"({"linkState": 22})");
    for (const std::string test : {"Echo", "Ping", "External Loopback", "Host Loopback", "Internal Loopback", "Self"})
    {
        const Answer answer = host.run(test);
        EXPECT_EQ(answer.value, 0u) << test;
        EXPECT_EQ(jobOf(answer), "") << test;
        EXPECT_THAT(answer.lines, Contains("[TVR_DBG] Source HBA port is disabled. Unable to start " + nameOf(test) +
                                           (test == "Self" ? "" : " ")));
    }
    EXPECT_THAT(host.leftBehind(), Each("0"));
    EXPECT_NE(jobOf(host.run("Status")), "");
    host.unload();
}

TEST(DiagnosticRun, TheBeaconGetsItsFormerState)
{
    for (const char* state : {"on", "off"})
    {
        TestHost host(R"({"adapters": [{"name": "A", "serialNumber": "S1", "model": "M1", "attributes":
            {"diagVersion": 1}, "ports": [{"wwpn": "1000027A51160210", "beacon": ")" +
                      std::string(state) + R"("}]}]})");
        host.rememberState();
        EXPECT_EQ(host.run("Beacon").value, 0u);
        EXPECT_EQ(host.stateDifference(), "");
        EXPECT_EQ(host.calls("LRM_DiagBeacon"), 41u);
        host.unload();
    }
    TestHost without(R"({"adapters": [{"name": "A", "serialNumber": "S1", "model": "M1", "attributes":
        {"diagVersion": 1}, "ports": [{"wwpn": "1000027A51160210", "beacon": "notAvailable"}]}]})");
    const Answer answer = without.run("Beacon");
    EXPECT_EQ(answer.value, 0u);
    EXPECT_EQ(jobOf(answer), "");
    EXPECT_THAT(answer.lines, Contains("[TVR_DBG] Successful , Exited with error code : 0"));
    EXPECT_EQ(without.calls("LRM_DiagBeacon"), 0u);
    without.unload();
}

// --- what clients give

TEST(DiagnosticRun, ADeletedJobLeavesItsRecords)
{
    TestHost host;
    host.setDiagnostics(firstPort, plug);
    unsigned runs = 0;
    for (const std::string test :
         {"Internal Loopback", "External Loopback", "Host Loopback", "Self", "Status", "Reset", "Beacon"})
    {
        Settings settings = needsOf(test);
        settings.push_back(deletion(true));
        const Answer answer = host.run(test, settings);
        EXPECT_EQ(answer.value, 0u) << test;
        EXPECT_EQ(jobOf(answer).empty(), test != "Beacon") << test;
        EXPECT_THAT(answer.lines, Contains("[TVR_DBG] TVRHBA_DiagTestFunc::DeleteConcreteJob()"));
        const std::string records = std::to_string(++runs);
        EXPECT_THAT(host.leftBehind(), ElementsAre("0", "0", "0", records, records)) << test;
    }
    // It holds for later runs, until a client says otherwise or the adapters are read again.
    EXPECT_EQ(jobOf(host.run("Status")), "");
    EXPECT_NE(jobOf(host.run("Status", {deletion(false)})), "");
    host.run("Status", {deletion(true)});
    advanceClock(10min);
    host.portsAfterRefresh();
    EXPECT_NE(jobOf(host.run("Status")), "");
    EXPECT_THAT(host.leftBehind(), ElementsAre("2", "2", "2", "11", "11")) << "which a refresh leaves alone";
    host.unload();
}

TEST(DiagnosticRun, OverridesHoldUntilTheAdaptersAreReadAgain)
{
    TestHost host;
    const auto cyclesOf = [&](const Settings& settings)
    {
        const std::string id = jobOf(host.run("Host Loopback", settings));
        return numberOf(theOne(host, "TVRHBA_DiagnosticServiceRecord", "InstanceID", id + ":Service Record"),
                        "CompletedCycles");
    };
    EXPECT_EQ(cyclesOf({overrides("Host Loopback",
                                  {{"LoopControlParameter", Value::array(CMPI_string, {Value::string("7")})}})}),
              "7");
    EXPECT_EQ(cyclesOf({}), "7");
    advanceClock(10min);
    host.portsAfterRefresh();
    EXPECT_EQ(cyclesOf({}), "100");
    host.unload();
}

TEST(DiagnosticRun, WhatIsWrongIsRefusedBeforeTheLibraryIsAsked)
{
    TestHost host;
    const std::string notReady = "[TVR_DBG] Unable to get the Job/Diagnostic SettingData, Not able to continue";
    const std::string noPort = "[TVR_ERR] Either ManagedElement is NULL or Invalid instance: TVRHBA_PortController";
    const std::string noTest = "[TVR_ERR] Invalid instance: TVRHBA_FCHBADiagnosticTest";
    const std::string noTarget = "[TVR_DBG] Invalid TargetDevice, Enter Target WWPN";
    const Value otherJob = instanceOf("TVRHBA_JobSettingData", "another", {});
    const broker::Path known = host.controller;
    broker::Path unknown = known;
    unknown.setKey("DeviceID", Value::string("1000027A51160299"));
    const struct
    {
        const char* test;
        Value element;
        Settings settings;
        Lines lines; ///< the last ones
    } rows[] = {
        {"another", Value::reference(known), {}, {noTest}},
        {"Self", {}, {}, {noPort}},
        {"Self", Value::reference(unknown), {}, {noPort}},
        {"Self", Value::reference(host.port), {}, {noPort}},
        {"Self",
         Value::reference(known),
         {{"JobSettings", otherJob}},
         {"[TVR_DBG] Invalid input instance: TVRHBA_JobSettingData",
          "[TVR_DBG] Using default TVRHBA_FCHBADiagnosticSettingData Instance", notReady}},
        {"Self",
         Value::reference(known),
         {overrides("Status", {})},
         {"[TVR_DBG] Using the default TVRHBA_JobSettingData Instance", "[TVR_DBG] Entered embedded instance",
          "[TVR_DBG] Invalid input instance: TVRHBA_FCHBADiagnosticSettingData", notReady}},
        {"Ping", Value::reference(known), {}, {"[TVR_DBG] Started Diagnostic : TVR:FCHBA Ping Test", noTarget}},
        {"Echo",
         Value::reference(known),
         {overrides("Echo", {{"TargetDevice", Value::string("5063D200110000A")}})},
         {noTarget}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.lines.back());
        host.service.setKey("Name", Value::string(nameOf(row.test)));
        Settings settings = row.settings;
        settings.push_back({"ManagedElement", row.element});
        const Answer answer = host.call(
            "RunDiagnosticService", "[TVR_DBG] TVRHBA_FCHBADiagnosticTest_Provider::RunDiagnosticService", settings);
        EXPECT_EQ(answer.value, 5u);
        EXPECT_EQ(jobOf(answer), "");
        ASSERT_GE(answer.lines.size(), row.lines.size());
        EXPECT_EQ(Lines(answer.lines.end() - static_cast<std::ptrdiff_t>(row.lines.size()), answer.lines.end()),
                  row.lines);
    }
    const Answer answer = host.run("Echo", {overrides("Echo", {{"TargetDevice", Value::string("5063D200110000XY")}})});
    EXPECT_EQ(answer.value, 40001u) << "a name by its length alone";
    EXPECT_THAT(answer.lines, Contains("[TVR_DBG] TVR_Diagnostics::EchoTest::str2HBAName failed"));
    for (const char* function : {"LRM_DiagEchoTestV2", "LRM_DiagRunPOST"})
        EXPECT_EQ(host.calls(function), 0u) << function;
    EXPECT_THAT(host.leftBehind(), Each("0"));
    host.unload();
}

TEST(DiagnosticRun, JobsThatCannotBeCancelled)
{
    TestHost host;
    const std::string beacon = jobOf(host.run("Beacon"));
    const std::string link = jobOf(host.run("D-Port"));
    const std::string invalid = "[TVR_DBG] TVRHBA_ConcreteJob_Provider: Invalid Arguments";
    const struct
    {
        std::string job;
        Value state;
        std::uint64_t value;
        Lines lines;
    } rows[] = {
        {"another", Value::uint16(4), 33068, {"[TVR_ERR] Invalid instance of TVRHBA_ConcreteJob"}},
        {link, Value::uint16(3), 32968, {invalid}},
        {link, {}, 32968, {invalid}},
        {beacon,
         Value::uint16(4),
         32968,
         {"[TVR_DBG] TVRHBA_ConcreteJob_Provider: Stop Supported for Only DPORT test"}},
        {link,
         Value::uint16(4),
         40001,
         {"[TVR_DBG] TVR_Diagnostics::CancelDportTest RM_DiagCancelDiagnostic Status, DiagHandle: 1 1",
          "[TVR_ERR] TVRHBA_ConcreteJob_Provider: CancelTest failed: DiagHandle:1"}},
    };
    ASSERT_TRUE(host.awaitLog("[TVR_DBG] TVR_Diagnostics::DportStatusThread Ends"));
    host.service = theOne(host, "TVRHBA_ConcreteJob", "InstanceID", link).path;
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.lines.back());
        host.service.setKey("InstanceID", Value::string(row.job));
        const Answer answer =
            host.call("RequestStateChange", "[TVR_DBG] TVRHBA_ConcreteJob_Provider: RequestStateChange Entry",
                      {{"RequestedState", row.state}});
        EXPECT_EQ(answer.value, row.value);
        EXPECT_EQ(answer.lines, row.lines);
    }
    EXPECT_EQ(host.calls("LRM_DiagCancelDiagnostic"), 1u);
    host.unload();
}

/// Associations have ends of their own, which clients get once the port has gone, and once a log was cleared, which
/// leaves the records of settings.
TEST(DiagnosticRun, WhatItLeftOutlivesThePort)
{
    TestHost host;
    const std::string id = jobOf(host.run("Host Loopback", {overrides("Host Loopback", {})}));
    const broker::Path job = theOne(host, "TVRHBA_ConcreteJob", "InstanceID", id).path;
    const broker::Path record = host.instancesOf("TVRHBA_DiagnosticServiceRecord").at(0).path;
    const broker::Path completion = host.instancesOf("TVRHBA_DiagnosticCompletionRecord").at(0).path;
    host.addFault(R"({"function": "HBA_GetAdapterName", "subject": "Tavrin-TV1602-1", "status": 1})");
    advanceClock(10min);
    host.count("TVRHBA_Card");
    ASSERT_TRUE(host.awaitRefresh(2));
    EXPECT_EQ(host.broker().getInstance(host.controller).status, CMPI_RC_ERR_NOT_FOUND);
    for (const auto& [path, association] :
         {std::pair(job, "TVRHBA_AffectedJobElement"), std::pair(record, "TVRHBA_RecordAppliesToElement"),
          std::pair(completion, "TVRHBA_RecordAppliesToElement")})
    {
        const broker::Reply ports = host.broker().associators(path, {.assocClass = association});
        ASSERT_EQ(ports.objects.size(), 1u) << association << broker::statusName(ports.status);
        EXPECT_EQ(text(ports.objects[0], "DeviceID"), firstPort);
    }
    broker::Path log = job;
    log.className = "TVRHBA_DiagnosticsLog";
    log.keys = {{"InstanceID", Value::string(nameOf("Host Loopback"))}};
    EXPECT_EQ(host.broker().invokeMethod(log, "ClearLog", {}).returnValue.asUnsigned(), 0u);
    EXPECT_EQ(host.count("TVRHBA_DiagnosticServiceRecord"), 0u);
    const broker::Path settings = host.instancesOf("TVRHBA_DiagnosticSettingDataRecord").at(0).path;
    EXPECT_EQ(
        host.broker().associators(settings, {.assocClass = "TVRHBA_CorrespondingSettingDataRecord"}).objects.size(),
        2u);
    host.unload();
}

// --- beside a run

TEST(DiagnosticRun, ReadersWaitForItAndNoRefreshStarts)
{
    TestHost host;
    host.addFault(fault("LRM_DiagGetResults", R"("gate": "poll", "to": 1)"));
    auto run = std::async(std::launch::async, [&] { return host.run("Self"); });
    ASSERT_TRUE(host.awaitGate("poll"));
    advanceClock(10min);
    const std::string skipped = "[TVR_DBG] Diagnostics is running.. Skip the internal refresh till it ends";
    auto jobs = std::async(std::launch::async, [&] { return host.count("TVRHBA_ConcreteJob"); });
    ASSERT_TRUE(host.awaitLog(skipped));
    EXPECT_EQ(jobs.wait_for(0s), std::future_status::timeout);
    host.openGate("poll");
    EXPECT_EQ(run.get().value, 0u);
    EXPECT_EQ(jobs.get(), 1u);
    const std::size_t skips = host.logged(skipped);
    host.count("TVRHBA_Card");
    EXPECT_TRUE(host.awaitRefresh(2));
    EXPECT_EQ(host.logged(skipped), skips);
    host.unload();
}

/// Nobody else comes who would begin the refresh that the reader waits for.
TEST(DiagnosticRun, AReaderOfTheFabricIsWokenBehindIt)
{
    TestHost host;
    const broker::Object setting =
        theOne(host, "TVRHBA_ProviderConfigSetting", "InstanceID", "Tavrin HBA Provider:sanrefresh");
    EXPECT_TRUE(host.broker().modifyInstance(changed(setting, "current", Value::uint32(0))).ok());
    advanceClock(10min);
    host.count("TVRHBA_Card");
    ASSERT_TRUE(host.awaitRefresh(2));
    host.addFault(fault("LRM_DiagGetResults", R"("gate": "poll", "to": 1)"));
    auto run = std::async(std::launch::async, [&] { return host.run("Self"); });
    ASSERT_TRUE(host.awaitGate("poll"));
    auto disks = std::async(std::launch::async, [&] { return host.count("TVRHBA_LogicalDisk"); });
    ASSERT_TRUE(host.awaitLog("[TVR_DBG] Diagnostics is running.. Skip the internal refresh till it ends"));
    host.openGate("poll");
    EXPECT_EQ(run.get().value, 0u);
    ASSERT_EQ(disks.wait_for(20s), std::future_status::ready);
    EXPECT_GT(disks.get(), 0u);
    host.unload();
}

/// Ten thousand seconds of the module's clock. The beacon's log is cleared all the time, so that its records come and
/// go; those of the other tests are all there at the end. Link tests go on while the next tests begin.
TEST(DiagnosticRun, TestsOnAllPortsAndReadersOfTheirRecordsGoTogether)
{
    TestHost host;
    const std::vector<broker::Object> ports = host.instancesOf("TVRHBA_PortController");
    broker::Path beaconLog = theOne(host, "TVRHBA_DiagnosticsLog", "InstanceID", nameOf("Beacon")).path;
    std::map<std::string, std::size_t> jobs; ///< by the test
    std::atomic<bool> over = false;
    const auto runsTests = [&]
    {
        for (const auto start = slept(); slept() - start < 10'000s;)
            for (const broker::Object& port : ports)
                for (const char* test : {"Beacon", "Status", "D-Port", "Internal Loopback", "Self"})
                {
                    broker::Path of = host.service;
                    of.setKey("Name", Value::string(nameOf(test)));
                    const auto reply = host.broker().invokeMethod(of, "RunDiagnosticService",
                                                                  {{"ManagedElement", Value::reference(port.path)}});
                    const broker::Property* job = broker::findNamed(reply.out, "Job");
                    if (job && !job->value.isNull())
                        jobs[nameOf(test)]++;
                }
        over = true;
    };
    auto running = std::async(std::launch::async, runsTests);
    while (!over)
    {
        for (const char* className : {"TVRHBA_ConcreteJob", "TVRHBA_DiagnosticServiceRecord",
                                      "TVRHBA_DiagnosticCompletionRecord", "TVRHBA_RecordAppliesToElement"})
            EXPECT_EQ(host.enumerate(className).status, CMPI_RC_OK) << className;
        EXPECT_EQ(host.broker().invokeMethod(beaconLog, "ClearLog", {}).returnValue.asUnsigned(), 0u);
    }
    running.get();
    EXPECT_TRUE(host.awaitLog("[TVR_DBG] TVR_Diagnostics::DportStatusThread Ends", jobs[nameOf("D-Port")]));
    host.broker().invokeMethod(beaconLog, "ClearLog", {});
    const auto countsOf = [&](const char* className, const char* nameProperty)
    {
        std::map<std::string, std::size_t> counts;
        for (const broker::Object& one : host.instancesOf(className))
            counts[text(one, nameProperty)]++;
        return counts;
    };
    EXPECT_GT(jobs[nameOf("Beacon")], 100u);
    EXPECT_EQ(countsOf("TVRHBA_ConcreteJob", "Name"), jobs);
    jobs.erase(nameOf("Beacon"));
    EXPECT_EQ(countsOf("TVRHBA_DiagnosticServiceRecord", "ServiceName"), jobs);
    EXPECT_EQ(countsOf("TVRHBA_DiagnosticCompletionRecord", "ServiceName"), jobs);
    host.unload();
}

/// A library of the hardware that gives up the process does so on the thread that asked it, which has the data of the
/// agent.
TEST(DiagnosticRun, TheProcessMayExitOnTheThreadOfARun)
{
    for (const char* test : {"Self", "Beacon", "D-Port"})
        EXPECT_EQ(inChild(
                      [&]
                      {
                          alarm(60); // a child that hangs is ended by it
                          TestHost host;
                          host.setDiagnostics(firstPort, forEver);
                          atSleep([] { std::exit(0); });
                          host.run(test);
                          std::_Exit(1);
                      }),
                  0)
            << test;
}

/// Between the end of the data and that of the maps: it gets the data lock behind both.
TEST(DiagnosticRun, ARunThatComesWhileTheProcessExitsIsRefused)
{
    static std::promise<bool> refused;
    EXPECT_EQ(inChild(
                  []
                  {
                      alarm(60); // a child that hangs is ended by it
                      passOverLeaks();
                      std::atexit( // called behind the module's end, which is registered later
                          []
                          {
                              if (!refused.get_future().get())
                                  std::_Exit(1);
                          });
                      TestHost host;
                      host.addFault(R"({"function": "HBA_FreeLibrary", "gate": "end"})");
                      std::thread(
                          [&]
                          {
                              host.awaitGate("end");
                              std::thread([&] { host.openGate("end"); }).detach();
                              const broker::MethodReply reply = // the log has ended by then
                                  host.broker().invokeMethod(host.service, "RunDiagnosticService",
                                                             {{"ManagedElement", Value::reference(host.controller)}});
                              refused.set_value(reply.ok() && reply.returnValue.asUnsigned() == 4);
                          })
                          .detach();
                      std::exit(testing::Test::HasFailure());
                  }),
              0);
}

/// It would go on for a quarter of an hour.
TEST(DiagnosticRun, ATestEndsWhenTheProcessExits)
{
    Host files;
    EXPECT_EQ(inChild(
                  [&]
                  {
                      alarm(60); // a child that hangs is ended by it
                      passOverLeaks();
                      TestHost host;
                      files.write("/child", host.root());
                      host.setDiagnostics(firstPort, forEver);
                      host.addFault(fault("LRM_DiagGetResults", R"("gate": "poll", "from": 3, "to": 3)"));
                      std::thread([&] { host.run("Self"); }).detach();
                      EXPECT_TRUE(host.awaitGate("poll"));
                      std::thread(
                          [&]
                          {
                              host.awaitLog("[TVR_DBG] Entering dtor ~ProviderAgent()");
                              host.openGate("poll");
                          })
                          .detach();
                      std::exit(testing::Test::HasFailure());
                  }),
              0);
    const std::filesystem::path root = files.read("/child");
    const std::string log = files.read("/../" + root.filename().string() + "/provider.log");
    std::size_t polls = 0;
    for (std::size_t at = 0; (at = log.find("Polling for the results.. 60", at)) != log.npos; at++)
        polls++;
    EXPECT_EQ(polls, 3u);
    EXPECT_NE(log.find("Exiting ClearMaps()"), log.npos) << "the module has ended";
    std::filesystem::remove_all(root);
}

} // namespace
