// How the tests of a port behave.
#include "simulator/ScenarioParts.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

constexpr NamedNumber testStates[] = {
    {"started", RM_DIAG_STATE_STARTED},
    {"running", RM_DIAG_STATE_RUNNING},
    {"cancelled", RM_DIAG_STATE_CANCELLED},
    {"finished", RM_DIAG_STATE_FINISHED},
};

constexpr NamedNumber linkTestStates[] = {
    {"running", RM_DPORT_STATE_RUNNING},
    {"cancelled", RM_DPORT_STATE_CANCELLED},
    {"finished", RM_DPORT_STATE_FINISHED},
};

constexpr NamedNumber phaseIds[] = {
    {"electricalLoopback", RM_DPORT_ELECTRICAL_LOOPBACK},          {"opticalLoopback", RM_DPORT_OPTICAL_LOOPBACK},
    {"reverseOpticalLoopback", RM_DPORT_REVERSE_OPTICAL_LOOPBACK}, {"linkTraffic", RM_DPORT_LINK_TRAFFIC},
    {"reverseLinkTraffic", RM_DPORT_REVERSE_LINK_TRAFFIC},
};

constexpr NamedNumber linkResults[] = {
    {"passed", RM_DPORT_PASSED},
    {"skipped", RM_DPORT_SKIPPED},
    {"failed", RM_DPORT_FAILED},
    {"stopped", RM_DPORT_STOPPED},
};

struct TestRow
{
    const char* key;
    TestOf test;
};

constexpr TestRow tests[] = {
    {"self", &Diagnostics::self},
    {"hostLoopback", &Diagnostics::hostLoopback},
    {"internalLoopback", &Diagnostics::internalLoopback},
    {"externalLoopback", &Diagnostics::externalLoopback},
    {"echo", &Diagnostics::echo},
};

void readStatus(JsonNode& node, const char* key, RM_STATUS& out)
{
    if (node.has(key))
        out = static_cast<RM_STATUS>(node.at(key).asNumber(INT32_MAX));
}

void readOptional(JsonNode& node, const char* key, std::optional<std::uint32_t>& out)
{
    if (node.has(key))
        out = static_cast<std::uint32_t>(node.at(key).asNumber(UINT32_MAX));
}

void readBehaviour(JsonNode& node, TestBehaviour& test, std::span<const NamedNumber> states)
{
    readStatus(node, "startStatus", test.startStatus);
    node.read("busy", test.busy);
    node.read("polls", test.polls);
    readStatus(node, "runningStatus", test.runningStatus);
    node.readNamed("runningState", test.runningState, states);
    readStatus(node, "endStatus", test.endStatus);
    node.readNamed("endState", test.endState, states);
    readStatus(node, "cancelStatus", test.cancelStatus);
    node.read("ignoresCancel", test.ignoresCancel);
}

void readTest(JsonNode node, TestBehaviour& test)
{
    readBehaviour(node, test, testStates);
    readOptional(node, "result", test.result);
    readOptional(node, "cyclesCompleted", test.cyclesCompleted);
    readOptional(node, "cyclesFailed", test.cyclesFailed);
    readOptional(node, "executionTime", test.executionTime);
    node.finish();
}

/// A number of eight bits, or its name.
void readByte(JsonNode& node, const char* key, std::uint8_t& out, std::span<const NamedNumber> names)
{
    std::uint32_t number = out;
    node.readNamed(key, number, names);
    if (number > UINT8_MAX)
        node.at(key).fail("a number from 0 to 255");
    out = static_cast<std::uint8_t>(number);
}

RM_DPortPhase readPhase(JsonNode& node)
{
    RM_DPortPhase phase{};
    node.at("id"); // required
    readByte(node, "id", phase.id, phaseIds);
    readByte(node, "result", phase.result, linkResults);
    const bool hasErrors = node.has("localErrors") || node.has("remoteErrors");
    if (hasErrors && node.has("latency"))
        node.failWith("expected either a latency or errors");
    phase.flags = hasErrors ? RM_DPORT_HAS_ERRORS : 0;
    node.read("latency", phase.latencyOrLocalErrors);
    node.read("localErrors", phase.latencyOrLocalErrors);
    node.read("remoteErrors", phase.remoteErrors);
    node.finish();
    return phase;
}

void readPhases(JsonNode& node, RM_DPortResults& link)
{
    if (!node.has("phases"))
        return;
    link.phaseCount = 0;
    std::ranges::fill(link.phases, RM_DPortPhase{});
    node.forEach("phases",
                 [&](JsonNode& item)
                 {
                     if (link.phaseCount == RM_MAX_DPORT_PHASES)
                         item.failWith("expected at most 37 phases");
                     const RM_DPortPhase phase = readPhase(item);
                     link.phases[link.phaseCount++] = phase;
                     if (phase.result == RM_DPORT_FAILED)
                         link.testResult = RM_DPORT_FAILED;
                 });
}

void readLinkTest(JsonNode node, Diagnostics& diagnostics)
{
    RM_DPortResults& link = diagnostics.link;
    readBehaviour(node, diagnostics.dport, linkTestStates);
    node.read("diagnosticStatus", link.diagnosticStatus);
    readPhases(node, link);
    readByte(node, "result", link.testResult, linkResults);
    node.read("phaseCount", link.phaseCount);
    node.read("roundTripLatency", link.roundTripLatency);
    node.read("cableLength", link.cableLength);
    node.read("frameSize", link.frameSize);
    node.read("buffersRequired", link.buffersRequired);
    node.finish();
}

} // namespace

Diagnostics readDiagnostics(JsonNode node)
{
    Diagnostics diagnostics;
    readStatus(node, "whenRunning", diagnostics.whenRunning);
    node.read("loopbackPlug", diagnostics.hasLoopbackPlug);
    for (const TestRow& row : tests)
        if (node.has(row.key))
            readTest(node.at(row.key), diagnostics.*row.test);
    if (node.has("dport"))
        readLinkTest(node.at("dport"), diagnostics);
    node.finish();
    return diagnostics;
}

} // namespace tvrsim
