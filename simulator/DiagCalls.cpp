// Tests of the simulated ports. A test takes no time of its own: each poll of its results brings it nearer to its end,
// and so does a start that is refused because it runs.
#include "simulator/SimulatedHost.h"

#include <algorithm>
#include <cctype>
#include <cstring>

namespace tvrsim
{

namespace
{

/// Tests that the library remembers, those that run included.
constexpr std::size_t testRoom = 64;

/// Behind the pattern is a zero byte, within the room that the longest has.
bool isPattern(const char* text)
{
    constexpr std::size_t longest = 8;
    if (!text)
        return false;
    const std::size_t length = strnlen(text, longest + 1);
    const auto isHexadecimal = [](unsigned char digit) { return std::isxdigit(digit) != 0; };
    return length > 0 && length <= longest && std::all_of(text, text + length, isHexadecimal);
}

bool isDisabled(const Port& port)
{
    const Attribute disabled = numberAttribute(RM_PA_LINK_STATE, RM_LINK_DISABLED);
    return std::ranges::find(port.attributes, disabled) != port.attributes.end();
}

bool hasFeature(const Adapter& adapter, std::uint32_t tag)
{
    const auto place = std::ranges::find(adapter.features, tag, &RM_Feature::tag);
    return place != adapter.features.end() && place->value != 0;
}

/// Why a test of a port cannot begin, those aside that run; RM_OK if it can. What the scenario says stands first.
RM_STATUS obstacle(const Adapter& adapter, Port& port, TestOf test)
{
    TestBehaviour& behaviour = port.diagnostics.*test;
    if (behaviour.busy > 0)
    {
        --behaviour.busy;
        return RM_ERROR_ADAPTER_BUSY;
    }
    if (behaviour.startStatus != RM_OK)
        return behaviour.startStatus;
    if (isDisabled(port))
        return RM_ERROR_PORT_DISABLED;
    if (test == &Diagnostics::dport && !hasFeature(adapter, RM_FEATURE_DPORT))
        return RM_ERROR_HARDWARE_LACKS;
    if (test == &Diagnostics::dport && (port.state != HBA_PORTSTATE_ONLINE || port.unplugged))
        return RM_ERROR_NO_CABLE;
    return RM_OK;
}

} // namespace

RM_DPortResults goodLink()
{
    constexpr RM_DPortPhase phases[] = {
        {RM_DPORT_PASSED, RM_DPORT_ELECTRICAL_LOOPBACK, 0, 0, 38, 0},
        {RM_DPORT_PASSED, RM_DPORT_OPTICAL_LOOPBACK, 0, 0, 57, 0},
        {RM_DPORT_PASSED, RM_DPORT_REVERSE_OPTICAL_LOOPBACK, 0, 0, 59, 0},
        {RM_DPORT_PASSED, RM_DPORT_LINK_TRAFFIC, 0, 0, 1924, 0},
        {RM_DPORT_PASSED, RM_DPORT_REVERSE_LINK_TRAFFIC, 0, 0, 1931, 0},
    };
    RM_DPortResults link{};
    std::ranges::copy(phases, link.phases);
    link.phaseCount = std::size(phases);
    link.roundTripLatency = 1976;
    link.cableLength = 15;
    link.frameSize = 2112;
    link.buffersRequired = 2;
    return link;
}

void usePlug(Port& port)
{
    const bool hadPlug = port.unplugged.has_value();
    if (port.diagnostics.hasLoopbackPlug == hadPlug)
        return;
    Connection other = port.unplugged.value_or(Connection());
    std::swap(port.type, other.type);
    std::swap(port.beforeDisabling ? port.beforeDisabling->state : port.state, other.state);
    std::swap(port.fcId, other.fcId);
    std::swap(port.discoveredPorts, other.discoveredPorts);
    std::swap(port.fabricName, other.fabricName);
    std::swap(port.targets, other.targets);
    std::swap(port.virtualPorts, other.virtualPorts);
    port.unplugged = hadPlug ? std::nullopt : std::optional(std::move(other));
}

bool SimulatedHost::setDiagnostics(Wwn wwpn, const Diagnostics& diagnostics)
{
    return changePort(wwpn,
                      [&](Adapter&, Port& port)
                      {
                          port.diagnostics = diagnostics;
                          usePlug(port);
                          return RM_OK;
                      }) == RM_OK;
}

std::uint32_t SimulatedHost::resultOf(const Port& port, TestOf test, const TestOrder& order) const
{
    if (const std::optional<std::uint32_t> result = (port.diagnostics.*test).result)
        return *result;
    if (test == &Diagnostics::externalLoopback && !port.unplugged)
        return RM_DIAG_RESULT_LINK_DOWN;
    if (test != &Diagnostics::echo || reach(port.state, port.targets, order.target))
        return RM_DIAG_RESULT_SUCCESS;
    const Port* other = findPort(order.target);
    const bool areOnline = other && port.state == HBA_PORTSTATE_ONLINE && other->state == HBA_PORTSTATE_ONLINE;
    const bool answers = areOnline && port.fabricName != 0 && port.fabricName == other->fabricName;
    return answers ? RM_DIAG_RESULT_SUCCESS : RM_DIAG_RESULT_TARGET_UNREACHABLE;
}

bool SimulatedHost::isRunning(const StartedTest& started) const
{
    const Port* port = findPort(started.wwpn);
    return port && !started.isCancelled && !started.hasEnded && started.polls < (port->diagnostics.*started.test).polls;
}

SimulatedHost::StartedTest* SimulatedHost::findTest(Wwn wwpn, std::uint32_t handle)
{
    const auto place = _tests.find(handle);
    return place != _tests.end() && place->second.wwpn == wwpn ? &place->second : nullptr;
}

bool SimulatedHost::makeRoomForTest()
{
    if (_tests.size() < testRoom)
        return true;
    const auto ended = std::ranges::find_if(_tests, [&](const auto& known) { return !isRunning(known.second); });
    if (ended == _tests.end())
        return false;
    _tests.erase(ended);
    return true;
}

RM_STATUS SimulatedHost::startTest(Wwn wwpn, TestOf test, const TestOrder& order, std::uint32_t& handle)
{
    return changePort(wwpn,
                      [&](const Adapter& adapter, Port& port) -> RM_STATUS
                      {
                          if (!test || !isPattern(order.pattern))
                              return RM_ERROR;
                          if (const RM_STATUS refused = obstacle(adapter, port, test); refused != RM_OK)
                              return refused;
                          for (auto& [other, started] : _tests)
                              if (started.wwpn == wwpn && isRunning(started))
                              {
                                  ++started.polls;
                                  return port.diagnostics.whenRunning;
                              }
                          if (!makeRoomForTest())
                              return RM_ERROR_TOO_MANY_TESTS;
                          handle = ++_lastTest;
                          const std::uint32_t result = resultOf(port, test, order);
                          const bool halts = result != RM_DIAG_RESULT_SUCCESS && order.haltOnError;
                          _tests[handle] = {wwpn, test, result, halts ? 1 : order.cycles};
                          return RM_OK;
                      });
}

template <class Record, class Fill>
RM_STATUS SimulatedHost::poll(Wwn wwpn, std::uint32_t handle, Record& out, Fill fill)
{
    static_assert(static_cast<unsigned>(RM_DIAG_STATE_CANCELLED) == RM_DPORT_STATE_CANCELLED);
    return changePort(wwpn,
                      [&](const Adapter&, const Port& port) -> RM_STATUS
                      {
                          StartedTest* started = findTest(wwpn, handle);
                          const bool isLinkTest = started && started->test == &Diagnostics::dport;
                          if (!started || isLinkTest != std::is_same_v<Record, RM_DPortResults>)
                              return RM_ERROR;
                          const TestBehaviour& behaviour = port.diagnostics.*started->test;
                          if (isRunning(*started))
                          {
                              ++started->polls;
                              out.state = behaviour.runningState;
                              return behaviour.runningStatus;
                          }
                          if (started->isCancelled)
                          {
                              out.state = RM_DIAG_STATE_CANCELLED;
                              return RM_OK;
                          }
                          started->hasEnded = true;
                          fill(port, *started);
                          out.state = behaviour.endState;
                          return behaviour.endStatus;
                      });
}

RM_STATUS SimulatedHost::testResults(Wwn wwpn, std::uint32_t handle, RM_DiagResults& out)
{
    return poll(wwpn, handle, out,
                [&](const Port& port, const StartedTest& started)
                {
                    const TestBehaviour& behaviour = port.diagnostics.*started.test;
                    out.result = started.result;
                    const std::uint32_t failed = out.result == RM_DIAG_RESULT_SUCCESS ? 0 : started.cycles;
                    out.cyclesCompleted = behaviour.cyclesCompleted.value_or(started.cycles);
                    out.cyclesFailed = behaviour.cyclesFailed.value_or(failed);
                    out.executionTime = behaviour.executionTime.value_or(started.polls);
                });
}

RM_STATUS SimulatedHost::linkTestResults(Wwn wwpn, std::uint32_t handle, RM_DPortResults& out)
{
    return poll(wwpn, handle, out, [&](const Port& port, const StartedTest&) { out = port.diagnostics.link; });
}

RM_STATUS SimulatedHost::cancelTest(Wwn wwpn, std::uint32_t handle)
{
    return changePort(wwpn,
                      [&](const Adapter&, const Port& port) -> RM_STATUS
                      {
                          StartedTest* started = findTest(wwpn, handle);
                          if (!started)
                              return RM_ERROR;
                          const TestBehaviour& behaviour = port.diagnostics.*started->test;
                          if (behaviour.cancelStatus != RM_OK)
                              return behaviour.cancelStatus;
                          if (!isRunning(*started))
                              return started->isCancelled ? RM_OK : RM_ERROR;
                          started->isCancelled = !behaviour.ignoresCancel;
                          return RM_OK;
                      });
}

void SimulatedHost::cancelTests(const Adapter& adapter)
{
    for (auto& [handle, started] : _tests)
        if (std::ranges::find(adapter.ports, started.wwpn, &Port::wwpn) != adapter.ports.end() && isRunning(started))
            started.isCancelled = true;
}

RM_STATUS SimulatedHost::fcpTargets(Wwn wwpn, std::vector<RM_FcpMapping>& out) const
{
    std::lock_guard lock(_mutex);
    const Port* port = findPort(wwpn);
    if (!port)
        return RM_ERROR_INVALID_WWN;
    if (port->state == HBA_PORTSTATE_ONLINE)
        for (const std::size_t target : port->targets)
            out.push_back({toHba(_scenario.targets[target].wwpn), {}});
    return RM_OK;
}

} // namespace tvrsim
