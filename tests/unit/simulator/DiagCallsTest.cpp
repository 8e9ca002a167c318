// Tests of the simulated ports, through the local RM library.
#include "Opened.h"
#include "Scenarios.h"

#include "simulator/Control.h"

#include <gmock/gmock.h>

namespace tvrsim
{
namespace
{

constexpr Wwn portDown = 0x1000'027A'0000'00C0, portOther = 0x1000'027A'0000'00D0;

/// Two ports in a fabric, and one that is down; a port without the link test.
constexpr const char* fourPorts = R"({
  "targets": [{"name": "disks", "wwpn": "5063D20000000001", "units": [{"lun": 0, "blocks": 10}]}],
  "adapters": [
    {"name": "A", "features": {"200": 1}, "ports": [
      {"wwpn": "1000027A000000A0", "fabricName": "100000000000FAB1", "targets": ["disks"], "fcId": 7,
       "virtualPorts": [{"wwpn": "2001027A000000A0"}]},
      {"wwpn": "1000027A000000B0", "fabricName": "100000000000FAB1"},
      {"wwpn": "1000027A000000C0", "state": "linkDown"}]},
    {"name": "B", "ports": [{"wwpn": "1000027A000000D0"}]}]})";

struct DiagCalls : testing::Test
{
    using Start = RM_STATUS (DiagCalls::*)(Wwn);

    void SetUp() override { ASSERT_TRUE(FUNCTION(control, tvrsim_load_scenario_text)(fourPorts, nullptr, 0)); }

    void set(Wwn wwpn, const std::string& diagnostics)
    {
        char error[256] = "";
        EXPECT_TRUE(
            FUNCTION(control, tvrsim_set_diagnostics)(wwnText(wwpn).c_str(), diagnostics.c_str(), error, sizeof error))
            << error;
    }
    void addFault(const char* row) { ASSERT_TRUE(FUNCTION(control, tvrsim_add_fault)(row, nullptr, 0)); }

    template <class Function> Function* call(const std::string& name) { return rm.function<Function>(name.c_str()); }

    RM_STATUS self(Wwn wwpn) { return call<RM_DiagRunPOST_t>("LRM_DiagRunPOST")(toHba(wwpn), &handle); }
    RM_STATUS host(Wwn wwpn)
    {
        return call<RM_DiagPciLoopBackTestV2_t>("LRM_DiagPciLoopBackTestV2")(toHba(wwpn), 5, halts, &handle, 0,
                                                                             pattern);
    }
    RM_STATUS loopback(Wwn wwpn, std::uint32_t type)
    {
        return call<RM_DiagLoopBackTestV3_t>("LRM_DiagLoopBackTestV3")(toHba(wwpn), type, 5, halts, &handle, 0,
                                                                       pattern);
    }
    RM_STATUS internal(Wwn wwpn) { return loopback(wwpn, RM_LOOPBACK_INTERNAL); }
    RM_STATUS external(Wwn wwpn) { return loopback(wwpn, RM_LOOPBACK_EXTERNAL); }
    RM_STATUS echo(Wwn wwpn)
    {
        return call<RM_DiagEchoTestV2_t>("LRM_DiagEchoTestV2")(toHba(wwpn), toHba(echoed), 5, halts, &handle, 0,
                                                               pattern);
    }
    RM_STATUS dport(Wwn wwpn) { return call<RM_DiagDPortTest_t>("LRM_DiagDPortTest")(toHba(wwpn), 0, &handle); }

    /// Status and state: "60/2".
    template <class Poll, class Record> std::string poll(Wwn wwpn, const char* function, Record& record)
    {
        record = {};
        const RM_STATUS status = call<Poll>(function)(toHba(wwpn), handle, &record);
        return std::to_string(status) + '/' + std::to_string(record.state);
    }
    std::string poll(Wwn wwpn) { return poll<RM_DiagGetResults_t>(wwpn, "LRM_DiagGetResults", results); }
    std::string pollLink(Wwn wwpn) { return poll<RM_DiagGetResultsDPort_t>(wwpn, "LRM_DiagGetResultsDPort", link); }
    RM_STATUS cancel(Wwn wwpn)
    {
        return call<RM_DiagCancelDiagnostic_t>("LRM_DiagCancelDiagnostic")(toHba(wwpn), handle);
    }

    /// A test from its start to the poll that finds it ended, five at most: "60/2 60/2 0/6 result 0 cycles 5-0 time 2".
    std::string run(Start start, Wwn wwpn)
    {
        if (const RM_STATUS status = (this->*start)(wwpn); status != RM_OK)
            return "refused with " + std::to_string(status);
        const bool isLinkTest = start == &DiagCalls::dport;
        std::string all;
        for (int i = 0; i < 5; ++i)
        {
            all += (isLinkTest ? pollLink(wwpn) : poll(wwpn)) + ' ';
            if ((isLinkTest ? link.state : results.state) >= 5)
                return all + (isLinkTest ? linkResults() : testResults());
        }
        return all + "and so on";
    }
    std::string testResults() const
    {
        return "result " + std::to_string(results.result) + " cycles " + std::to_string(results.cyclesCompleted) + '-' +
               std::to_string(results.cyclesFailed) + " time " + std::to_string(results.executionTime);
    }
    std::string linkResults() const
    {
        return "status " + std::to_string(link.diagnosticStatus) + " result " + std::to_string(link.testResult) +
               " phases " + std::to_string(link.phaseCount);
    }

    const Opened control{fileOf("libtvrsim.so")}, rm{fileOf("liblrmapi.so")};
    std::uint32_t handle = 0, halts = 0;
    const char* pattern = "1a2b3c4d";
    Wwn echoed = disks;
    RM_DiagResults results;
    RM_DPortResults link;
};

constexpr const char* good = "60/2 60/2 0/6 result 0 cycles 5-0 time 2";
constexpr const char* goodSelfTest = "60/2 60/2 60/2 0/6 result 0 cycles 1-0 time 3";
constexpr const char* goodLinkTest = "60/4 60/4 60/4 60/4 0/6 status 0 result 0 phases 5";

TEST_F(DiagCalls, TestsRunAsTheScenarioSays)
{
    const struct
    {
        Start start;
        const char* diagnostics;
        std::string seen;
        Wwn wwpn = portA;
    } rows[] = {
        {&DiagCalls::self, "{}", goodSelfTest},
        {&DiagCalls::host, "{}", good},
        {&DiagCalls::internal, "{}", good},
        {&DiagCalls::internal, "{}", good, portDown},
        {&DiagCalls::external, "{}", "60/2 60/2 0/6 result 2 cycles 5-5 time 2"},
        {&DiagCalls::external, R"({"loopbackPlug": true})", good},
        {&DiagCalls::echo, "{}", good},
        {&DiagCalls::echo, "{}", "60/2 60/2 0/6 result 10 cycles 5-5 time 2", portB},
        {&DiagCalls::echo, R"({"loopbackPlug": true})", "60/2 60/2 0/6 result 10 cycles 5-5 time 2"},
        {&DiagCalls::dport, "{}", goodLinkTest},
        {&DiagCalls::dport, "{}", "refused with 212", portDown},
        {&DiagCalls::dport, R"({"loopbackPlug": true})", "refused with 212"},
        {&DiagCalls::dport, "{}", "refused with 248", portOther},
        {&DiagCalls::dport, R"({"dport": {"startStatus": 204}})", "refused with 204"},
        {&DiagCalls::self, "{}", "refused with 5", disks},

        {&DiagCalls::echo, R"({"echo": {"polls": 0, "result": 26, "cyclesFailed": 2, "executionTime": 9}})",
         "0/6 result 26 cycles 5-2 time 9"},
        {&DiagCalls::host, R"({"hostLoopback": {"runningStatus": 0, "runningState": "started", "cyclesCompleted": 1}})",
         "0/1 0/1 0/6 result 0 cycles 1-0 time 2"},
        {&DiagCalls::self, R"({"self": {"polls": 1, "endState": 9, "endStatus": 0}})",
         "60/2 0/9 result 0 cycles 1-0 time 1"},
        {&DiagCalls::self, R"({"self": {"polls": 4294967295}})", "60/2 60/2 60/2 60/2 60/2 and so on"},
        {&DiagCalls::dport, R"({"dport": {"polls": 1, "runningStatus": 0, "phases": [
            {"id": "linkTraffic", "result": "skipped"}]}})",
         "0/4 0/6 status 0 result 0 phases 1"},
        {&DiagCalls::dport, R"({"dport": {"polls": 0, "diagnosticStatus": 3, "phaseCount": 255}})",
         "0/6 status 3 result 0 phases 255"},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.diagnostics);
        SetUp();
        if (row.wwpn != disks)
            set(row.wwpn, row.diagnostics);
        EXPECT_EQ(run(row.start, row.wwpn), row.seen);
    }
    for (const Wwn reachable : {portB, portA})
    {
        echoed = reachable;
        EXPECT_EQ(run(&DiagCalls::echo, portA), good) << "another port of the fabric, or itself";
    }
}

TEST_F(DiagCalls, AFailureEndsATestThatHaltsOnErrors)
{
    halts = 1;
    EXPECT_EQ(run(&DiagCalls::external, portA), "60/2 60/2 0/6 result 2 cycles 1-1 time 2");
    EXPECT_EQ(run(&DiagCalls::internal, portA), good);
}

TEST_F(DiagCalls, OnlyPatternsOfHexadecimalDigitsAreTaken)
{
    for (const char* text : {static_cast<const char*>(nullptr), "", "1a2b3c4d5", "0x12", "1a2b3c4g"})
    {
        pattern = text;
        for (const Start start : {&DiagCalls::host, &DiagCalls::internal, &DiagCalls::echo})
            EXPECT_EQ((this->*start)(portA), RM_ERROR) << (text ? text : "null");
    }
    pattern = "f";
    EXPECT_EQ(loopback(portA, 2), RM_ERROR);
    EXPECT_EQ(run(&DiagCalls::internal, portA), good);
}

TEST_F(DiagCalls, AResultsRecordBelongsToItsTest)
{
    ASSERT_EQ(self(portA), RM_OK);
    EXPECT_NE(handle, 0u);
    const std::uint32_t first = handle;
    EXPECT_EQ(poll(portB), "1/0");
    EXPECT_EQ(pollLink(portA), "1/0") << "it is no link test";
    ASSERT_EQ(self(portB), RM_OK);
    EXPECT_NE(handle, first);
    EXPECT_EQ(poll(portA), "1/0");
    EXPECT_EQ(cancel(portA), RM_ERROR);
    handle = first;
    EXPECT_EQ(poll(portA), "60/2");
    handle = 0;
    EXPECT_EQ(poll(portA), "1/0");
}

TEST_F(DiagCalls, APortRunsOneTestAtATime)
{
    set(portA, R"({"whenRunning": 62, "echo": {"busy": 2}, "self": {"polls": 5}})");
    EXPECT_EQ(echo(portA), RM_ERROR_ADAPTER_BUSY);
    EXPECT_EQ(echo(portA), RM_ERROR_ADAPTER_BUSY);
    EXPECT_EQ(echo(portA), RM_OK);
    EXPECT_EQ(self(portA), RM_ERROR_TOO_MANY_TESTS);
    EXPECT_EQ(self(portB), RM_OK);
    EXPECT_EQ(self(portB), RM_ERROR_ADAPTER_BUSY);
    EXPECT_EQ(self(portA), RM_ERROR_TOO_MANY_TESTS) << "time goes by, also for a test that nobody asks about";
    EXPECT_EQ(self(portA), RM_OK);
}

TEST_F(DiagCalls, EndedTestsAreRememberedUntilThereAreManyOthers)
{
    EXPECT_EQ(run(&DiagCalls::dport, portA), goodLinkTest);
    const std::uint32_t first = handle;
    EXPECT_EQ(run(&DiagCalls::self, portA), goodSelfTest);
    handle = first;
    EXPECT_EQ(pollLink(portA), "0/6");
    for (int i = 0; i < 100; ++i)
        ASSERT_EQ(run(&DiagCalls::self, portA), goodSelfTest);
    handle = first;
    EXPECT_EQ(pollLink(portA), "1/0");
}

TEST_F(DiagCalls, ACancelledTestSaysSo)
{
    ASSERT_EQ(self(portA), RM_OK);
    EXPECT_EQ(cancel(portA), RM_OK);
    EXPECT_EQ(cancel(portA), RM_OK);
    EXPECT_EQ(poll(portA), "0/5");

    EXPECT_EQ(run(&DiagCalls::dport, portA), goodLinkTest);
    EXPECT_EQ(cancel(portA), RM_ERROR) << "it has finished";
    ASSERT_EQ(dport(portA), RM_OK);
    EXPECT_EQ(cancel(portA), RM_OK);
    EXPECT_EQ(pollLink(portA), "0/5");

    set(portA, R"({"self": {"cancelStatus": 97}, "echo": {"ignoresCancel": true}})");
    ASSERT_EQ(self(portA), RM_OK);
    EXPECT_EQ(cancel(portA), 97);
    EXPECT_EQ(poll(portA), "60/2");
    ASSERT_EQ(call<RM_ResetHBA_t>("LRM_ResetHBA")(toHba(portB), 1), RM_OK);
    EXPECT_EQ(poll(portA), "0/5") << "a reset of the adapter ends every test";
    ASSERT_EQ(echo(portA), RM_OK);
    EXPECT_EQ(cancel(portA), RM_OK);
    EXPECT_EQ(poll(portA), "60/2");
}

TEST_F(DiagCalls, APortThatIsDisabledRunsNoTest)
{
    std::uint32_t dynamic = 0;
    ASSERT_EQ(call<RM_SetPortEnabled_t>("LRM_SetPortEnabled")(toHba(portA), 0, &dynamic), RM_OK);
    for (const Start start : {&DiagCalls::self, &DiagCalls::host, &DiagCalls::internal, &DiagCalls::external,
                              &DiagCalls::echo, &DiagCalls::dport})
        EXPECT_EQ(run(start, portA), "refused with 253");
    RM_WwnNames names{};
    ASSERT_EQ(call<RM_ReadWWN_t>("LRM_ReadWWN")(toHba(portA), RM_WWN_TYPE_CONFIGURED, &names), RM_OK);
    EXPECT_EQ(fromHba(names.wwpn), portA) << "the name by which its attributes show that it is disabled";
    EXPECT_EQ(names.kind, RM_WWN_KIND_NONE);
}

TEST_F(DiagCalls, ALoopbackPlugTakesThePlaceOfTheCable)
{
    const auto shown = [&]
    {
        std::byte buffer[RM_DIAG_PORT_ATTRIBUTES_SIZE];
        std::uint32_t size = sizeof buffer, length = 0;
        RM_STATUS status = RM_OK;
        EXPECT_EQ(call<RM_GetPortAttributes_t>("LRM_GetPortAttributes")(toHba(portA), buffer, &size), RM_OK);
        const auto value = call<RM_GetAttributeValue_t>("RM_GetAttributeValue");
        const auto* type = static_cast<const unsigned char*>(value(buffer, RM_PA_PORT_TYPE, &length, &status));
        const auto* fabric = static_cast<const unsigned char*>(value(buffer, RM_PA_FABRIC_NAME, &length, &status));
        RM_FcpTargetMapping targets{};
        targets.count = 1;
        EXPECT_EQ(call<RM_GetFcpTargetMapping_t>("LRM_GetFcpTargetMapping")(toHba(portA), &targets), RM_OK);
        RM_VPortList vports{};
        call<RM_VPList_t>("LRM_VPList")(toHba(portA), &vports);
        return std::vector<unsigned>{*type, fabric[7], targets.count, vports.count};
    };
    const std::vector<unsigned> cabled = {HBA_PORTTYPE_NPORT, 0xB1, 1, 1}, plugged = {HBA_PORTTYPE_LPORT, 0, 0, 0};
    EXPECT_EQ(shown(), cabled);
    set(portA, R"({"loopbackPlug": true})");
    set(portA, R"({"loopbackPlug": true})");
    EXPECT_EQ(shown(), plugged);
    set(portA, "{}");
    EXPECT_EQ(shown(), cabled);
    char error[64];
    EXPECT_FALSE(FUNCTION(control, tvrsim_set_diagnostics)("0000000000000001", "{}", error, sizeof error));
    EXPECT_STREQ(error, "no port 00:00:00:00:00:00:00:01");
}

TEST_F(DiagCalls, PhasesHaveALatencyOrErrors)
{
    EXPECT_EQ(run(&DiagCalls::dport, portA), goodLinkTest);
    for (unsigned i = 0; i < 5; ++i)
    {
        EXPECT_EQ(link.phases[i].id, 210 + i);
        EXPECT_EQ(link.phases[i].flags, 0);
        EXPECT_NE(link.phases[i].latencyOrLocalErrors, 0u);
    }
    set(portA, R"({"dport": {"roundTripLatency": 1, "cableLength": 2, "frameSize": 3, "buffersRequired": 4, "phases": [
        {"id": 210, "latency": 5},
        {"id": "opticalLoopback", "result": "failed", "localErrors": "0x8001", "remoteErrors": 4},
        {"id": 250, "result": 9, "remoteErrors": 1}]}})");
    EXPECT_EQ(run(&DiagCalls::dport, portA), "60/4 60/4 60/4 60/4 0/6 status 0 result 2 phases 3");
    EXPECT_EQ(link.roundTripLatency, 1u);
    EXPECT_EQ(link.cableLength, 2u);
    EXPECT_EQ(link.frameSize, 3);
    EXPECT_EQ(link.buffersRequired, 4);
    const RM_DPortPhase phases[] = {{0, 210, 0, 0, 5, 0}, {2, 211, 1, 0, 0x8001, 4}, {9, 250, 1, 0, 0, 1}, {}};
    for (unsigned i = 0; i < std::size(phases); ++i)
        EXPECT_TRUE(link.phases[i] == phases[i]) << i;
}

TEST_F(DiagCalls, FaultsReachTests)
{
    addFault(R"({"function": "LRM_DiagRunPOST", "hostile": "zeroHandle", "to": 1})");
    handle = 7;
    EXPECT_EQ(self(portA), RM_OK);
    EXPECT_EQ(handle, 0u);
    addFault(R"({"function": "LRM_DiagGetResultsDPort", "hostile": "hugeCount"})");
    addFault(R"({"function": "LRM_DiagGetResults", "subject": "1000027A000000B0", "truncate": 8})");
    EXPECT_EQ(run(&DiagCalls::self, portB), "60/2 60/2 60/2 0/6 result 0 cycles 0-0 time 0");
    EXPECT_EQ(run(&DiagCalls::dport, portB), "60/4 60/4 60/4 60/4 0/6 status 0 result 0 phases 255");
}

} // namespace
} // namespace tvrsim
