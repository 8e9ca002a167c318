// Tests that the library runs by itself: started, asked for their results once a second, cancelled in the end.
#include "agent/Build.h"
#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "diagnostics/DiagnosticSettings.h"
#include "diagnostics/DiagnosticTexts.h"
#include "diagnostics/Executors.h"
#include "diagnostics/PortName.h"
#include "diagnostics/TestResult.h"
#include "runtime/base/Time.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"

#include <algorithm>
#include <array>
#include <optional>

namespace cimple
{

namespace
{

/// What these tests say, each in its own words.
struct Wording
{
    const char* disabled; ///< of the test
    const char* polling;  ///< of the status
    const char* unknown;  ///< of the test and 0
    const char* failure;  ///< of the test and its result
};

constexpr char cannotStart[] = "Source HBA port is disabled. Unable to start %s ";
constexpr char polling[] = "Polling for the results.. : %d";
constexpr char unknownError[] = "%s Unknown Error, Exited with error code: %d";
constexpr char hasFailed[] = "%s Resulted with Failure, Result - %s";

constexpr Wording echoWording = {cannotStart, polling, "%s Unknown error, Exited with error code : %d",
                                 "%s Resulted with Failure, Result - %s "};
constexpr Wording loopBackWording = {cannotStart, polling, unknownError, hasFailed};
constexpr Wording selfWording = {"Source HBA port is disabled. Unable to start %s", "Polling for the results.. %d",
                                 unknownError, hasFailed};

// --- before the start

std::uint32_t numberOf(const AttributeBlock& attributes, RM_Attribute id)
{
    std::uint32_t number = 0;
    attributes.number(id, number);
    return number;
}

/// Why the test of a port is not started; nothing if it can be. A disabled port is no failure.
std::optional<RM_STATUS> obstacle(const TestRun& run, const Wording& wording)
{
    AttributeBlock attributes(RM_DIAG_PORT_ATTRIBUTES_SIZE);
    if (const RM_STATUS status = attributes.fetch(LRM_GetPortAttributes, run.wwpn); status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "RM_GetPortAttributes command failed. Exited with error code : %d", status);
        return status;
    }
    if (numberOf(attributes, RM_PA_LINK_STATE) != RM_LINK_DISABLED)
        return std::nullopt;
    TVR_LOG(TVR_DBG, wording.disabled, run.test.name);
    return RM_OK;
}

/// What the library is told to send.
struct Load
{
    std::uint32_t cycles = 0;
    std::uint32_t haltOnError = 0;
    std::array<char, 9> pattern = {}; ///< ends in a zero byte
};

Load loadOf(const TestRun& run)
{
    const auto& settings = run.settings;
    Load load;
    load.haltOnError = settings.HaltOnError.value;
    if (settings.LoopControlParameter.value.size() != 0)
        load.cycles = loopCount(settings.LoopControlParameter.value[0].view()).value_or(0);
    const Array<std::uint8_t>& pattern = settings.BufferPattern.value;
    std::copy_n(pattern.begin(), std::min<std::size_t>(pattern.size(), load.pattern.size() - 1), load.pattern.begin());
    return load;
}

/// `pattern` is the line of the pattern.
void logLoad(const TestRun& run, const Load& load, const char* name, const char* pattern)
{
    TVR_LOG(TVR_DBG, name, run.test.name);
    TVR_LOG(TVR_DBG, "Number of test cycles set to run : %d ", static_cast<int>(load.cycles));
    TVR_LOG(TVR_DBG, "HaltOnError value : %d ", static_cast<int>(load.haltOnError));
    TVR_LOG(TVR_DBG, pattern, load.pattern.data());
}

// --- from the start to the end

bool isUnderWay(const RM_DiagResults& results)
{
    return results.state == RM_DIAG_STATE_STARTED || results.state == RM_DIAG_STATE_RUNNING;
}

bool isRunning(RM_STATUS status, const RM_DiagResults& results)
{
    return status == RM_ERROR_TEST_RUNNING || (status == RM_OK && isUnderWay(results));
}

/// The status of the last poll, whose results are in `results`: the test has ended, or was cancelled, or could not be.
RM_STATUS pollToEnd(const TestRun& run, const Wording& wording, std::uint32_t handle, RM_DiagResults& results)
{
    constexpr int polls = 449; // and one when the test could not be cancelled
    for (int left = polls;; left--)
    {
        Time::sleep(Time::second);
        results = {};
        const RM_STATUS status = LRM_DiagGetResults(run.wwpn, handle, &results);
        TVR_LOG(TVR_DBG, wording.polling, status);
        if (!isRunning(status, results) || left == 0 || run.agent.hasEnded())
            return status;
        if (left == 1 && isUnderWay(results) && CancelTest(run.agent, run.wwpn, handle, run.test.name) == RM_OK)
            return status;
    }
}

TestResult resultOf(const TestRun& run, const Wording& wording, const RM_DiagResults& results)
{
    const char* name = run.test.name;
    if (results.state != RM_DIAG_STATE_FINISHED)
        return {.message = formatText(wording.unknown, name, 0)};
    const char* result = MapDiagResultStatus(results.result);
    if (results.result == RM_DIAG_RESULT_SUCCESS)
        return {
            .message = formatText("%s Resulted with Success", name), .passed = true, .requestedState = JOB_COMPLETED};
    return {.message = formatText(wording.failure, name, result)};
}

/// `start(handle)` gives the status of the call that starts the test.
template <class Start> RM_STATUS runPolled(TestRun& run, const Wording& wording, Start start)
{
    std::uint32_t handle = 0;
    if (const RM_STATUS status = start(&handle); status != RM_OK)
        return endWithoutJob(status);
    RM_DiagResults results{};
    const RM_STATUS status = pollToEnd(run, wording, handle, results);
    if (status != RM_OK || isUnderWay(results))
        return endWithoutJob(status);
    TestResult result = resultOf(run, wording, results);
    result.diagHandle = handle;
    result.results = &results;
    endWithJob(run, result);
    return status;
}

// --- loopbacks

/// A port with a plug in the place of the cable is a loop or a point of its own, sees no fabric and no targets. One
/// that does not tell its attributes is taken for one.
bool hasPlug(const TestRun& run)
{
    AttributeBlock attributes(RM_DIAG_PORT_ATTRIBUTES_SIZE);
    if (attributes.fetch(LRM_GetPortAttributes, run.wwpn) != RM_OK)
        return true;
    const std::uint32_t type = numberOf(attributes, RM_PA_PORT_TYPE);
    std::uint64_t fabricName = 1;
    if ((type != HBA_PORTTYPE_LPORT && type != HBA_PORTTYPE_PTP) ||
        attributes.counter(RM_PA_FABRIC_NAME, fabricName) != RM_OK || fabricName != 0)
        return false;
    RM_FcpTargetMapping mapping{};
    mapping.count = 1;
    LRM_GetFcpTargetMapping(run.wwpn, &mapping);
    return mapping.count == 0;
}

RM_STATUS startLoopBack(const TestRun& run, std::uint32_t mode, const Load& load, std::uint32_t* handle)
{
    const char* pattern = load.pattern.data();
    if (mode == hostLoopback)
        return LRM_DiagPciLoopBackTestV2(run.wwpn, load.cycles, load.haltOnError, handle, 0, pattern);
    const RM_LoopbackType type = mode == externalLoopback ? RM_LOOPBACK_EXTERNAL : RM_LOOPBACK_INTERNAL;
    return LRM_DiagLoopBackTestV3(run.wwpn, type, load.cycles, load.haltOnError, handle, 0, pattern);
}

} // namespace

RM_STATUS EchoTest(TestRun& run)
{
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::EchoTest/Ping");
    if (const auto why = obstacle(run, echoWording))
        return *why;
    const char* targetName = run.settings.TargetDevice.value.c_str();
    HBA_WWN target;
    if (!toWwn(target, targetName, {TVR_DBG, "TVR_Diagnostics::EchoTest::Id2HBAName failed"},
               {TVR_DBG, "TVR_Diagnostics::EchoTest::str2HBAName failed"}))
        return RM_ERROR;
    const Load load = loadOf(run);
    logLoad(run, load, "Diagnostics Name : %s", "Pattern used for testing %s");
    TVR_LOG(TVR_DBG, "TargetDevice WWPN to check : %s", targetName);
    return runPolled(run, echoWording,
                     [&](std::uint32_t* handle) {
                         return LRM_DiagEchoTestV2(run.wwpn, target, load.cycles, load.haltOnError, handle, 0,
                                                   load.pattern.data());
                     });
}

RM_STATUS LoopBackTest(TestRun& run, std::uint32_t mode)
{
    constexpr RM_STATUS wrongMode = 4;
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::LoopBackTest");
    if (mode != externalLoopback && mode != hostLoopback && mode != internalLoopback)
    {
        TVR_LOG(TVR_DBG, "Error: Wrong Test type passed: %d", static_cast<int>(mode));
        return wrongMode;
    }
    if (const auto why = obstacle(run, loopBackWording))
        return *why;
    const Load load = loadOf(run);
    logLoad(run, load, "%s", "The Input pattern used for testing %s");
    if (mode == externalLoopback && !hasPlug(run))
    {
        TVR_LOG(TVR_DBG, "Loopback plug is not detected. Unabled to run test. Install loopback plug and make sure HBA "
                         "Port is Up/Ready.. ");
        return RM_ERROR;
    }
    return runPolled(run, loopBackWording,
                     [&](std::uint32_t* handle) { return startLoopBack(run, mode, load, handle); });
}

RM_STATUS SelfTest(TestRun& run)
{
    TVR_LOG(TVR_DBG, "TVR_DiagTestFunc::SelfTest");
    if (const auto why = obstacle(run, selfWording))
        return *why;
    return runPolled(run, selfWording, [&](std::uint32_t* handle) { return LRM_DiagRunPOST(run.wwpn, handle); });
}

} // namespace cimple
