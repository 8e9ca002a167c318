// Tests that need no polling: those that have their result at once, and the beacon.
#include "diagnostics/Executors.h"

#include "agent/Build.h"
#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "device/TVR_MethodWrapper.h"
#include "diagnostics/TestResult.h"
#include "runtime/base/Time.h"

namespace cimple
{

namespace
{

constexpr char hasSucceeded[] = "%s Resulted with Success";
constexpr char hasFailed[] = "%s Resulted with Failure, Exited with error code %d";

// --- tests that have their result at once

constexpr int retries = 449;

bool isUnsupported(RM_STATUS status)
{
    return status == RM_ERROR_NOT_SUPPORTED || status == RM_ERROR_DIAGNOSTICS_NOT_AVAILABLE ||
           status == RM_ERROR_PORT_NOT_SUPPORTED;
}

/// `attempt()` gives the status of the test. A failure after it was busy is taken for no result of the test.
template <class Attempt> RM_STATUS runAtOnce(TestRun& run, const char* success, Attempt attempt)
{
    const char* name = run.test.name;
    int left = retries;
    RM_STATUS status = attempt();
    for (; status == RM_ERROR_ADAPTER_BUSY && left > 0; left--)
        status = attempt();
    if (isUnsupported(status) || status == RM_ERROR_ADAPTER_BUSY)
        return endWithoutJob(status);
    TestResult result;
    if (status == RM_OK)
        result = {.message = formatText(success, name), .passed = true, .requestedState = JOB_COMPLETED};
    else
    {
        result.message = formatText(hasFailed, name, status);
        TVR_LOG(TVR_DBG, "%s", result.message.c_str());
        if (left < retries)
            return endWithoutJob(status);
    }
    endWithJob(run, result);
    TVR_LOG(TVR_DBG, "%s Succesful", name);
    return status;
}

// --- the beacon

/// The status of the last step. Has a result from the first whole round on, which also a light has that stays on.
RM_STATUS flash(const TestRun& run, TestResult& result)
{
    constexpr int rounds = 20;
    RM_STATUS status = RM_OK;
    for (int round = 0; round < rounds && !run.agent.hasEnded(); round++)
    {
        status = LRM_DiagBeacon(run.wwpn, RM_BEACON_ON);
        if (status != RM_OK)
            return status;
        Time::sleep(Time::second);
        status = LRM_DiagBeacon(run.wwpn, RM_BEACON_OFF);
        Time::sleep(Time::second);
        result.requestedState = JOB_COMPLETED;
        result.passed = true;
    }
    return status;
}

} // namespace

RM_STATUS StatusTest(TestRun& run)
{
    TVR_LOG(TVR_DBG, "TVR_DiagTestFunc::StatusTest");
    AttributeBlock attributes(RM_PORT_ATTRIBUTES_SIZE);
    if (!attributes.allocated())
    {
        TVR_LOG(TVR_ERR, "GetPHYPortAttributeValues: Unable to allocate buffer");
        return RM_ERROR_NO_MEMORY;
    }
    return runAtOnce(run, hasSucceeded,
                     [&]
                     {
                         const RM_STATUS status = attributes.fetch(LRM_GetPortAttributes, run.wwpn);
                         TVR_LOG(TVR_DBG, "RM_GetPortAttributes call result : %d", status);
                         return status;
                     });
}

RM_STATUS FCHBAResetTest(TestRun& run)
{
    TVR_LOG(TVR_DBG, "TVR_DiagTestFunc::FCHBAResetTest");
    return runAtOnce(run, "%s Success", [&] { return TVR_MethodWrapper::tvrcimReset(run.wwpn); });
}

RM_STATUS BeaconTest(TestRun& run)
{
    std::uint32_t before = RM_BEACON_NOT_AVAILABLE;
    TestResult result;
    RM_STATUS status = LRM_DiagBeaconState(run.wwpn, &before);
    if (status == RM_OK && before == RM_BEACON_NOT_AVAILABLE)
        return endWithoutJob(status);
    if (status == RM_OK)
    {
        const RM_STATUS flashed = flash(run, result);
        status = LRM_DiagBeacon(run.wwpn, before);
        if (status != RM_OK)
            TVR_LOG(TVR_DBG, "Unable to set the previous beacon state");
        result.message =
            flashed == RM_OK ? formatText(hasSucceeded, run.test.name) : formatText(hasFailed, run.test.name, flashed);
    }
    run.job = publish(run, result);
    TVR_LOG(TVR_DBG, "%s Succesful", run.test.name);
    return status;
}

} // namespace cimple
