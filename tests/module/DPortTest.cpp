// The test of a link as a client sees it: the run, the job that a thread finishes, the records, and all that can come
// between.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/Host.h"
#include "tests/module/HostNames.h"
#include "tests/module/ModuleMemory.h"
#include "tests/module/Process.h"
#include "tests/module/Threads.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <future>
#include <thread>
#include <unistd.h>

using namespace module_test;
using namespace std::chrono_literals;
using broker::Value;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

constexpr char test[] = "TVR:FCHBA D-Port Test";
constexpr char firstPort[] = "1000027A51160210";
constexpr char otherPort[] = "1000027A51320240";
constexpr char forEver[] = R"({"dport": {"polls": 4294967295}})";
constexpr char ended[] = "[TVR_DBG] TVR_Diagnostics::DportStatusThread Ends";
constexpr char noRecords[] = "[TVR_DBG] DPORTStatusThreadCall: RM_DiagGetResultsDPort Failed and Not creating Service "
                             "and Completion Records";

struct Started
{
    std::uint64_t value = 0;
    std::string job = {}; ///< its InstanceID; empty for a null
};

class LinkHost : public Host
{
public:
    explicit LinkHost(const std::string& scenario = "default") : Host(scenario)
    {
        setHostNames({});
        instancesOf("TVRHBA_PortController");
        EXPECT_TRUE(awaitRefresh());
        service = theOne(*this, "TVRHBA_FCHBADiagnosticTest", "Name", test).path;
    }

    Started run(const std::string& wwpn, std::vector<broker::Property> settings = {})
    {
        const broker::Path port = theOne(*this, "TVRHBA_PortController", "DeviceID", wwpn).path;
        settings.push_back({"ManagedElement", Value::reference(port)});
        const broker::MethodReply reply = broker().invokeMethod(service, "RunDiagnosticService", settings);
        EXPECT_TRUE(reply.ok()) << reply.message;
        const broker::Property* job = broker::findNamed(reply.out, "Job");
        const bool hasJob = job && !job->value.isNull();
        return {reply.returnValue.asUnsigned(),
                hasJob ? job->value.asPath().key("InstanceID")->asString() : std::string()};
    }

    broker::Object job(const Started& run) { return theOne(*this, "TVRHBA_ConcreteJob", "InstanceID", run.job); }
    /// State, percentage and error of the job.
    std::string stateOf(const Started& run)
    {
        const broker::Object found = job(run);
        std::string state = std::to_string(found.get("JobState").asUnsigned()) + " " +
                            std::to_string(found.get("PercentComplete").asUnsigned());
        const Value error = found.get("ErrorCode");
        return error.isNull() ? state : state + " " + std::to_string(error.asUnsigned());
    }
    std::size_t count(const char* className) { return instancesOf(className).size(); }
    std::size_t records()
    {
        return count("TVRHBA_DiagnosticServiceRecord") + count("TVRHBA_DiagnosticCompletionRecord");
    }
    std::uint64_t cancel(const Started& run)
    {
        return broker()
            .invokeMethod(job(run).path, "RequestStateChange", {{"RequestedState", Value::uint16(4)}})
            .returnValue.asUnsigned();
    }
    /// From the third poll on, which is the thread's first, the library is held at a gate.
    void holdThread(unsigned from = 3)
    {
        addFault(R"({"function": "LRM_DiagGetResultsDPort", "gate": "link", "from": )" + std::to_string(from) + "}");
    }

    broker::Path service;
};

Value instanceOf(const char* className, const char* id, const char* property, Value value)
{
    broker::Object object;
    object.path.className = className;
    object.properties = {{"InstanceID", Value::string(id)}, {property, std::move(value)}};
    return Value::instance(object);
}

// --- how tests end

struct Ending
{
    const char* link;    ///< of the simulated port
    const char* begins;  ///< the job when the run returns
    const char* ends;    ///< the job at the end
    std::string message; ///< of the completion record; empty without records
    std::vector<std::string> lines;
    unsigned looks = 2; ///< polls of the run itself
};

const std::string passed = "TVR:FCHBA D-Port Test resulted with Success";
const std::string running = "[TVR_DBG] D-Port Test in progress";
const std::string figures = "[TVR_DBG] BuffersRequired: 2 FrameSize: 2112 RoundTripLatency: 1976";

std::string readAs(const std::string& status, const std::string& state, const std::string& result)
{
    return "[TVR_DBG] D-Port Test completed. DiagStatus: " + status + " DiagState: " + state +
           " OverallTestResult: " + result;
}

std::string notRead(const std::string& status)
{
    return "[TVR_DBG] DPORTStatusThreadCall: RM_DiagGetResultsDPort failed :" + status;
}

// clang-format off
const Ending endings[] = {
    {R"({})", "4 0", "7 100", passed, {running, running, readAs("0", "6", "0"), figures}},
    {R"({"polls": 3, "runningStatus": 0})", "10 0", "7 100", passed,
     {readAs("0", "4", "0"), readAs("0", "6", "0"), figures}},
    {R"({"polls": 0})", "7 100", "7 100", passed, {readAs("0", "6", "0"), figures}},
    {R"({"polls": 2, "result": 3})", "4 0", "32768 0",
     "TVR:FCHBA D-Port Test resulted with Failure  : Suggested Actions a) Verify end devices b) Verify switch "
     "configuration c) Verify and replace cable(s) if faultyd) Verify and replace transceiver(s) if faulty e) Replace "
     "Card f) Replace Switch",
     {readAs("0", "6", "3"), figures}},
    {R"({"polls": 0, "result": 3, "diagnosticStatus": 9})", "10 0", "32768 0", "",
     {readAs("9", "6", "3"), "[TVR_DBG] TVR:FCHBA D-Port Test Unknown error", noRecords}},
    {R"({"polls": 1, "endState": "cancelled"})", "8 0", "8 0", "",
     {readAs("0", "5", "0"), "[TVR_DBG] DPort Test cancelled.", noRecords}},
    {R"({"polls": 2, "endStatus": 65537})", "4 0", "10 0 1", "", {notRead("65537"), noRecords}},
    {R"({"polls": 0, "endStatus": 2})", "10 0", "10 0 2", "", {notRead("2"), noRecords}, 1},
};
// clang-format on

TEST(DPortTest, TheThreadEndsTheJobAsTheLibraryEndsTheTest)
{
    unsigned number = 0; // of all jobs of the process
    for (const Ending& row : endings)
    {
        SCOPED_TRACE(row.link);
        LinkHost host;
        host.setDiagnostics(firstPort, (std::string(R"({"dport": )") + row.link + "}").c_str());
        host.holdThread(row.looks + 1);
        const auto before = slept();
        const Started run = host.run(firstPort);
        EXPECT_EQ(run.value, 0u);
        EXPECT_EQ(run.job, std::string(test) + ":" + std::to_string(++number) + ":1");
        EXPECT_EQ(slept() - before, 5s + 2s * (row.looks == 2 ? 2 : 0)) << "the thread does not sleep yet";
        EXPECT_EQ(host.stateOf(run), row.begins);
        EXPECT_EQ(host.job(run).get("wwpn").asString(), firstPort);
        EXPECT_EQ(host.job(run).get("diagHandle").asUnsigned(), 1u);
        host.openGate("link");
        ASSERT_TRUE(host.awaitLog(ended));
        EXPECT_EQ(host.stateOf(run), row.ends);
        EXPECT_EQ(logAbout(host, {"D-Port Test in progress", "D-Port Test completed", "DPort Test cancelled",
                                  "BuffersRequired", "Unknown error", "DPORTStatusThreadCall: RM_Diag"}),
                  row.lines);
        EXPECT_EQ(host.logged("[TVR_DBG] Created completion Records"), row.message.empty() ? 0u : 1u);
        EXPECT_EQ(host.records(), row.message.empty() ? 0u : 2u);
        if (!row.message.empty())
        {
            const broker::Object record = theOne(host, "TVRHBA_DiagnosticCompletionRecord", "InstanceID", run.job);
            EXPECT_EQ(text(record, "RecordData"), row.message);
            EXPECT_EQ(record.get("CompletionState").asUnsigned(), std::string(row.ends) == "7 100" ? 2u : 5u);
        }
        host.unload();
    }
}

// --- what a record shows

constexpr char phases[] = R"({"dport": {"roundTripLatency": 300, "cableLength": 20, "frameSize": 2112,
    "buffersRequired": 3, "phaseCount": 7, "phases": [
      {"id": "electricalLoopback", "latency": 38},
      {"id": "opticalLoopback", "result": "failed", "localErrors": "0x00008001", "remoteErrors": "0x80"},
      {"id": "reverseOpticalLoopback", "result": "stopped"},
      {"id": "linkTraffic", "result": "skipped"},
      {"id": 9, "result": 9}]}})";

std::string withoutTime(broker::Object record)
{
    EXPECT_EQ(
        std::erase_if(record.properties, [](const auto& property) { return property.name == "CreationTimeStamp"; }),
        1u);
    return describe(record);
}

TEST(DPortTest, RecordsShowThePhases)
{
    LinkHost host;
    host.setDiagnostics(firstPort, phases);
    const Started run =
        host.run(firstPort, {{"DiagnosticSettings", instanceOf("TVRHBA_FCHBADiagnosticSettingData", test, "HaltOnError",
                                                               Value::boolean(true))}});
    ASSERT_TRUE(host.awaitLog(ended));
    const std::string common = R"(FrameSize = 2112
InstanceID = "<id>"
LinkDistance = 20
LocalErrorDesc = {"", "GENERIC,SYNC_LOSS,", "", "", "", "", ""}
LocalErrors = {0, 32769, 0, 0, 0, 0, 0}
LoopsFailed = 0
LoopsPassed = 0
ManagedElementName = "<port>"
NoOfPhases = 7
OverallTestResult = 2
PhaseLatency = {38, 0, 0, 0, 0, 0, 0}
RecordData = "TVR:FCHBA D-Port Test resulted with Failure <advice>"
RecordFormat = ""
RecordType = 2
RemoteErrorDesc = {"", "", "", "", "", "", ""}
RemoteErrors = {0, 128, 0, 0, 0, 0, 0}
ServiceName = "TVR:FCHBA D-Port Test"
TestPhaseResults = {"Passed", "Failed", "Stopped", "Skipped", "", "Passed", "Passed"}
TestPhases = {"Electrical Loopback", "Optical Loopback", "Reverse Optical Loopback", "Link Traffic", "", "", ""}
TimeToExecute = 300
)";
    const auto filled = [&](const std::string& id, const std::string& advice)
    {
        std::string filled = common;
        for (const auto& [mark, value] : std::initializer_list<std::pair<std::string, std::string>>{
                 {"<id>", id},
                 {"<advice>", advice},
                 {"<port>", text(theOne(host, "TVRHBA_PortController", "DeviceID", firstPort), "ElementName")}})
            filled.replace(filled.find(mark), mark.size(), value);
        return filled;
    };
    EXPECT_EQ(withoutTime(host.instancesOf("TVRHBA_DiagnosticServiceRecord").at(0)), R"(
BuffersRequired = 3
Description = "This class holds the results(service) of the test"
ElementName = "TVR:FCHBA D-Port Test Service Record"
)" + filled(run.job + ":Service Record", ""));
    EXPECT_EQ(withoutTime(host.instancesOf("TVRHBA_DiagnosticCompletionRecord").at(0)), R"(
BuffersRequired = 3
CompletionState = 5
Description = "This class holds the result of the test"
ElementName = "TVR:FCHBA D-Port Test Completion Record"
)" + filled(run.job, " : Suggested Actions a) Verify end devices b) Verify switch configuration c) Verify and replace "
                     "cable(s) if faultyd) Verify and replace transceiver(s) if faulty e) Replace Card f) Replace "
                     "Switch"));
    std::string settings = withoutTime(host.instancesOf("TVRHBA_DiagnosticSettingDataRecord").at(0));
    EXPECT_EQ(settings.find("\nSettings = "), settings.npos);
    settings.resize(settings.find("ManagedElementName"));
    EXPECT_EQ(settings, "\nCaption = \"" + run.job + R"("
Description = "This class holds the overrided setting data of the test"
ElementName = "TVR:FCHBA D-Port Test SettingData Record"
InstanceID = ")" + run.job + ":SettingData Record\"\n");
    EXPECT_EQ(host.count("TVRHBA_CorrespondingSettingDataRecord"), 2u);
    for (const char* association : {"TVRHBA_LogManagesRecord", "TVRHBA_RecordAppliesToElement"})
        EXPECT_EQ(host.count(association), 3u) << association;
    for (const char* line :
         {"[TVR_DBG] Creating diagnostic service record.", "[TVR_DBG] Creating diagnostic completion record."})
        EXPECT_EQ(host.logged(line), 1u) << line;
    for (const char* line :
         {"[TVR_DBG] CableLength: 20 NoOfPhase: 7", "[TVR_DBG] Test phase: Optical Loopback, Result: Failed",
          "[TVR_DBG] LocalErrors: GENERIC,SYNC_LOSS,, RemoteErrors: "})
        EXPECT_EQ(host.logged(line), 2u) << line;
    host.unload();
}

TEST(DPortTest, NoMorePhasesThanTheBlockHas)
{
    LinkHost host;
    host.setDiagnostics(firstPort, R"({"dport": {"phaseCount": 255, "phases": [{"id": 214, "latency": 1}]}})");
    host.run(firstPort);
    ASSERT_TRUE(host.awaitLog(ended));
    const broker::Object record = host.instancesOf("TVRHBA_DiagnosticServiceRecord").at(0);
    EXPECT_EQ(record.get("NoOfPhases").asUnsigned(), 37u);
    for (const char* array : {"TestPhases", "TestPhaseResults", "PhaseLatency", "LocalErrors", "RemoteErrors",
                              "LocalErrorDesc", "RemoteErrorDesc"})
        EXPECT_EQ(record.get(array).asList().size(), 37u) << array;
    host.unload();
}

// --- tests that do not begin

TEST(DPortTest, RunsThatCannotBeginLeaveNothing)
{
    const std::string pending = "[TVR_WARN] WWN Management detected a new name change that requires a sytem reboot.";
    const std::string reboot = "[TVR_ERR] Please reboot the system. D Port test is not allowed at this time.";
    const std::string notStarted = "[TVR_DBG] Unable to start the diagnostic test.";
    const struct
    {
        const char* port; ///< members of the simulated port
        std::uint64_t feature;
        std::uint64_t value;
        std::vector<std::string> lines;
    } rows[] = {
        {R"("state": "online")", 0, 40248, {"[TVR_ERR] D_Port Test is not supported on this adapter."}},
        {R"("names": {"activation": 5, "volatile": {"wwpn": "1000027A51160299"}}, "attributes": {"linkState": 22})",
         1,
         40089,
         {pending, reboot}},
        {R"("names": {"activation": 6, "nonVolatile": {"wwpn": "1000027A51160299"}})", 1, 40089, {pending, reboot}},
        {R"("attributes": {"linkState": 22})",
         1,
         40253,
         {"[TVR_ERR] Source HBA port is disabled. Unable to start loopback test"}},
        {R"("diagnostics": {"dport": {"startStatus": 204}})",
         1,
         40204,
         {notStarted, "[TVR_DBG] D_Port Test is not supported on this switch. , Exited with error code : 204"}},
        {R"("state": "offline")",
         1,
         40212,
         {notStarted, "[TVR_DBG] No FC cable connecting the port to the switch. , Exited with error code : 212"}},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.port);
        LinkHost host(R"({"adapters": [{"name": "Tavrin-TV3202-1", "model": "TV3202", "serialNumber": "TV32B71155",
            "features": {"200": )" +
                      std::to_string(row.feature) + R"(}, "attributes": {"diagVersion": 4},
            "ports": [{"wwpn": "1000027A51160210", )" +
                      row.port + "}]}]}");
        const Started run = host.run(firstPort);
        EXPECT_EQ(run.value, row.value);
        EXPECT_EQ(run.job, "");
        EXPECT_EQ(logAbout(host, {"D_Port", "D Port", "WWN Management", "disabled", "Unable to start", "error code"}),
                  row.lines);
        EXPECT_EQ(host.calls("LRM_DiagDPortTest"), row.value >= 40200 && row.value < 40240 ? 1u : 0u);
        EXPECT_EQ(host.count("TVRHBA_ConcreteJob") + host.records(), 0u);
        host.unload();
    }
}

// --- between the start and the end

TEST(DPortTest, ACancelledTestLeavesNoRecords)
{
    LinkHost host;
    host.setDiagnostics(firstPort, forEver);
    const Started run = host.run(firstPort);
    EXPECT_EQ(host.stateOf(run), "4 0");
    EXPECT_EQ(host.cancel(run), 0u);
    EXPECT_EQ(host.logged("[TVR_DBG] TVRHBA_ConcreteJob_Provider: CancelTest Successful: DiagHandle :1"), 1u);
    ASSERT_TRUE(host.awaitLog(ended));
    EXPECT_EQ(host.stateOf(run), "8 0");
    EXPECT_EQ(host.records(), 0u);
    host.unload();
}

TEST(DPortTest, AJobThatIsDeletedAtItsEndLeavesItsRecords)
{
    LinkHost host;
    const std::vector<broker::Property> deleted = {
        {"JobSettings",
         instanceOf("TVRHBA_JobSettingData", "TVR:FCHBA JobSettingData", "DeleteOnCompletion", Value::boolean(true))}};
    const auto jobs = [&]
    {
        return std::vector{host.count("TVRHBA_ConcreteJob"), host.count("TVRHBA_OwningJobElement"),
                           host.count("TVRHBA_AffectedJobElement")};
    };
    EXPECT_NE(host.run(firstPort, deleted).job, "") << "of a job that is gone at the end";
    ASSERT_TRUE(host.awaitLog(ended));
    EXPECT_THAT(jobs(), ElementsAre(0u, 0u, 0u));
    EXPECT_EQ(host.records(), 2u);
    host.setDiagnostics(firstPort, R"({"dport": {"endState": "cancelled"}})");
    host.run(firstPort, deleted);
    ASSERT_TRUE(host.awaitLog(ended, 2));
    EXPECT_THAT(jobs(), ElementsAre(1u, 1u, 1u)) << "without a result";
    EXPECT_EQ(host.records(), 2u);
    host.unload();
}

/// While a run waits for the test before, clients are answered, and the adapters may be read again.
TEST(DPortTest, ASecondTestWaitsForTheFirst)
{
    LinkHost host;
    host.setDiagnostics(firstPort, forEver);
    const Started first = host.run(firstPort);
    advanceClock(10min);
    auto second = std::async(std::launch::async, [&] { return host.run(otherPort); });
    ASSERT_TRUE(host.awaitLog("[TVR_DBG] DPortTest:Joining the thread created for DPORTStatus"));
    EXPECT_EQ(host.count("TVRHBA_ConcreteJob"), 2u);
    EXPECT_EQ(second.wait_for(0s), std::future_status::timeout);
    EXPECT_EQ(host.cancel(first), 0u);
    const Started run = second.get();
    EXPECT_EQ(run.value, 0u);
    EXPECT_EQ(host.stateOf(first), "8 0");
    ASSERT_TRUE(host.awaitLog(ended, 2));
    EXPECT_EQ(host.stateOf(run), "7 100");
    EXPECT_EQ(host.records(), 2u) << "of the second";
    host.unload();
}

TEST(DPortTest, RefreshesRunBesideIt)
{
    LinkHost host;
    host.setDiagnostics(firstPort, forEver);
    const Started run = host.run(firstPort);
    for (std::size_t refreshes = 2; refreshes < 5; ++refreshes)
    {
        advanceClock(10min);
        EXPECT_EQ(host.count("TVRHBA_PortController"), 4u);
        ASSERT_TRUE(host.awaitRefresh(refreshes));
    }
    host.setDiagnostics(firstPort, R"({})"); // which lets it end
    ASSERT_TRUE(host.awaitLog(ended));
    EXPECT_EQ(host.stateOf(run), "7 100");
    const broker::Object applies = host.instancesOf("TVRHBA_RecordAppliesToElement").at(0);
    EXPECT_EQ(applies.get("Dependent").asPath().key("DeviceID")->asString(), firstPort);
    host.unload();
}

TEST(DPortTest, WithoutAThreadTheJobIsNotRunning)
{
    LinkHost host;
    host.setDiagnostics(firstPort, forEver);
    refuseThreads(true);
    const Started run = host.run(firstPort);
    refuseThreads(false);
    EXPECT_EQ(run.value, 0u);
    EXPECT_EQ(host.logged("[TVR_DBG] DPortTest: Creation of DPORT Status Thread Failed"), 1u);
    EXPECT_EQ(host.stateOf(run), "10 0 1");
    host.run(otherPort);
    ASSERT_TRUE(host.awaitLog(ended)) << "the next one has its thread";
    host.broker().unload();
    const std::vector<broker::Violation> violations = host.broker().violations();
    ASSERT_EQ(violations.size(), 1u);
    EXPECT_EQ(violations[0].text, "outside of a call: 1 prepared thread contexts were never detached");
}

/// A refusal at each place of a host's first run, in which the maps of jobs and associations have no room yet: what
/// says that it runs has a thread that will end it.
TEST(DPortTest, NoJobRunsForEverWhateverMemoryLacks)
{
    for (std::size_t number = 1, places = number; number <= places; number++)
    {
        SCOPED_TRACE(number);
        LinkHost host;
        host.setDiagnostics(firstPort, forEver);
        const broker::Path port = theOne(host, "TVRHBA_PortController", "DeviceID", firstPort).path;
        refuseAllocation(number);
        host.broker().invokeMethod(host.service, "RunDiagnosticService", {{"ManagedElement", Value::reference(port)}});
        places = allocationsOfModule();
        for (const broker::Object& job : host.instancesOf("TVRHBA_ConcreteJob"))
        {
            const bool isRunning = job.get("JobState").asUnsigned() == 4;
            ASSERT_TRUE(!isRunning || host.awaitLog("[TVR_DBG] TVR_Diagnostics::DPORTStatusThreadCall Start"));
        }
        host.broker().unload(); // a context that the run left unused is the broker's to complain of
    }
}

// --- ends that come first

TEST(DPortTest, TheModuleEndsWhileATestRuns)
{
    LinkHost host;
    host.setDiagnostics(firstPort, forEver);
    host.run(firstPort);
    host.unload();
    EXPECT_EQ(host.logged("[TVR_DBG] DPORTStatusThreadCall: m_bDportThreadEnd is set"), 1u);
    EXPECT_EQ(host.logged(ended), 1u);
}

/// A library of the hardware that gives up the process does so on the thread that asked it.
TEST(DPortTest, TheThreadMayExit)
{
    EXPECT_EQ(inChild(
                  []
                  {
                      alarm(60); // a child that hangs is ended by it
                      LinkHost host;
                      host.setDiagnostics(firstPort, forEver);
                      host.run(firstPort);
                      atSleep([] { std::exit(0); });
                      std::this_thread::sleep_for(1min);
                  }),
              0);
}

/// On the thread of a refresh, which has the data that the other thread waits for.
TEST(DPortTest, TheRefreshBesideItMayExit)
{
    EXPECT_EQ(inChild(
                  []
                  {
                      alarm(60); // a child that hangs is ended by it
                      LinkHost host;
                      host.setDiagnostics(firstPort, forEver);
                      host.run(firstPort);
                      host.addFault(R"({"function": "HBA_GetNumberOfAdapters", "gate": "refresh"})");
                      advanceClock(10min);
                      std::thread([&] { host.count("TVRHBA_Card"); }).detach();
                      EXPECT_TRUE(host.awaitGate("refresh"));
                      setHostNames({.resolving = [] { std::exit(0); }});
                      host.openGate("refresh");
                      std::this_thread::sleep_for(1min);
                  }),
              0);
}

TEST(DPortTest, TheProcessExitsWhileATestRunsAndASecondWaits)
{
    for (const bool waits : {false, true})
    {
        EXPECT_EQ(inChild(
                      [&]
                      {
                          alarm(60); // a child that hangs is ended by it
                          LinkHost host;
                          host.setDiagnostics(firstPort, forEver);
                          host.run(firstPort);
                          if (waits)
                              std::thread([&] { host.run(otherPort); }).detach();
                          EXPECT_TRUE(!waits ||
                                      host.awaitLog("[TVR_DBG] DPortTest:Joining the thread created for DPORTStatus"));
                          std::exit(testing::Test::HasFailure());
                      }),
                  0);
    }
}

} // namespace
