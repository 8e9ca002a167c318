#include "diagnostics/DPortTest.h"

#include "agent/Build.h"
#include "device/AttributeBlock.h"
#include "device/Bindings.h"
#include "device/ForeignText.h"
#include "diagnostics/ConcreteJobs.h"
#include "diagnostics/DiagnosticRecords.h"
#include "diagnostics/DiagnosticTexts.h"
#include "runtime/base/Time.h"
#include "runtime/log/Shielded.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_JobSettingData.h"
#include "schema/TVRHBA_PortController.h"

#include <memory>
#include <optional>
#include <string>

namespace cimple
{

namespace
{

/// What the thread knows of its test. Each thread has its own: it goes on with it while the next test is begun. The job
/// and the port are those of the cache, and may have gone from it.
struct LinkTest
{
    ProviderAgent& agent;
    const DiagnosticTest& test;
    HBA_WWN wwpn;
    std::string wwpnText;
    Ref<const TVRHBA_PortController> portController;
    bool overridden;
    bool deleteOnCompletion;
    std::uint32_t handle = 0;
    Ref<TVRHBA_ConcreteJob> job = {}; ///< null if none could be made
};

/// Another owner of what is the cache's.
template <class Record> Ref<Record> hold(Record* instance)
{
    ref(instance);
    return Ref<Record>(instance);
}

/// How a test has ended, as its job tells it.
struct Ending
{
    std::uint32_t jobState;
    std::optional<RM_STATUS> error = {}; ///< of the library, where it does not know the test any more, or of the thread
    std::optional<bool> passed = {};     ///< where there is a result, which its records tell
};

// --- the thread

RM_STATUS readLink(const LinkTest& link, RM_DPortResults& results)
{
    results = {};
    return LRM_DiagGetResultsDPort(link.wwpn, link.handle, &results);
}

Ending endOfResults(const LinkTest& link, const RM_DPortResults& results)
{
    if (results.diagnosticStatus != 0)
    {
        TVR_LOG(TVR_DBG, "%s Unknown error", link.test.name);
        return {JOB_FAILED};
    }
    TVR_LOG(TVR_DBG, "BuffersRequired: %d FrameSize: %d RoundTripLatency: %d", results.buffersRequired,
            results.frameSize, static_cast<int>(results.roundTripLatency));
    const bool passed = results.testResult == RM_DPORT_PASSED;
    return {.jobState = passed ? JOB_COMPLETED : JOB_FAILED, .passed = passed};
}

/// Nothing while the test runs.
std::optional<Ending> endOf(const LinkTest& link, RM_STATUS status, const RM_DPortResults& results)
{
    if (status == RM_ERROR_TEST_RUNNING)
    {
        TVR_LOG(TVR_DBG, "D-Port Test in progress");
        return std::nullopt;
    }
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "DPORTStatusThreadCall: RM_DiagGetResultsDPort failed :%d", status);
        return Ending{.jobState = jobException, .error = status};
    }
    TVR_LOG(TVR_DBG, "D-Port Test completed. DiagStatus: %d DiagState: %d OverallTestResult: %d",
            static_cast<int>(results.diagnosticStatus), static_cast<int>(results.state), results.testResult);
    if (results.state == RM_DPORT_STATE_CANCELLED)
    {
        TVR_LOG(TVR_DBG, "DPort Test cancelled.");
        return Ending{JOB_TERMINATED};
    }
    if (results.state == RM_DPORT_STATE_RUNNING)
        return std::nullopt;
    return endOfResults(link, results);
}

/// As long as the library says that the test runs, or until the agent ends.
Ending awaitEnd(const LinkTest& link, RM_DPortResults& results)
{
    for (;;)
    {
        const RM_STATUS status = readLink(link, results);
        if (const std::optional<Ending> ending = endOf(link, status, results))
            return *ending;
        Time::sleep(Time::second);
        if (link.agent.m_bDportThreadEnd)
        {
            TVR_LOG(TVR_DBG, "DPORTStatusThreadCall: m_bDportThreadEnd is set");
            return {JOB_FAILED};
        }
    }
}

/// Into the job in the cache, if it still is there.
void endJob(const LinkTest& link, const Ending& ending)
{
    TVRHBA_ConcreteJob* job = mapOf<TVRHBA_ConcreteJob>(link.agent).withKeysOf(link.job.get());
    if (!job)
        return;
    TVR_LOG(TVR_DBG, "DPORTStatusThreadCall:Found matching Concrete Job Instance");
    job->JobState.set(static_cast<std::uint16_t>(ending.jobState));
    job->PercentComplete.set(ending.jobState == JOB_COMPLETED ? 100 : 0);
    if (ending.error)
        job->ErrorCode.set(static_cast<std::uint16_t>(*ending.error));
}

void leaveRecords(const LinkTest& link, const RM_DPortResults& results, bool passed)
{
    const char* name = link.test.name;
    const TestOutcome outcome = {
        .test = link.test,
        .message =
            passed ? formatText("%s resulted with Success", name) : formatText("%s resulted with Failure ", name),
        .jobId = link.job->InstanceID.value,
        .passed = passed,
        .portController = link.portController.get(),
        .overridden = link.overridden,
        .link = &results,
    };
    CreateDiagnosticServiceRecord(link.agent, outcome);
    CreateDiagnosticCompletionRecord(link.agent, outcome);
    TVR_LOG(TVR_DBG, "Created completion Records");
}

void logException(const char* what)
{
    TVR_LOG(TVR_ERR, "Exception in a link test: %s", what);
}

/// Whatever is thrown on the way, the job ends.
void DPORTStatusThreadCall(const LinkTest& link)
{
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::DPORTStatusThreadCall Start");
    if (!link.job)
    {
        TVR_LOG(TVR_DBG, "DPORTStatusThreadCall: iConcreateJob , sDiagSettingData NULL");
        return;
    }
    RM_DPortResults results{};
    const Ending ending = shielded(
        Ending{.jobState = jobException, .error = RM_ERROR}, [&] { return awaitEnd(link, results); }, logException);
    Auto_Mutex dataLock(link.agent.m_DataMutex); // whoever waits for this thread does not hold it
    endJob(link, ending);
    if (!ending.passed)
    {
        TVR_LOG(TVR_DBG, "DPORTStatusThreadCall: RM_DiagGetResultsDPort Failed and Not creating Service and Completion "
                         "Records");
        return;
    }
    shielded(
        false, [&] { return leaveRecords(link, results, *ending.passed), true; }, logException);
    if (link.deleteOnCompletion)
        DeleteConcreteJob(link.agent, link.job.get());
}

void* DportStatusThread(void* arg)
{
    const std::unique_ptr<const LinkTest> link(static_cast<const LinkTest*>(arg));
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::DportStatusThread Start");
    shielded(
        false, [&] { return DPORTStatusThreadCall(*link), true; }, logException);
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::DportStatusThread Ends");
    return nullptr;
}

// --- the run

bool hasFeature(const HBA_WWN& wwpn)
{
    std::uint32_t value = 0;
    if (LRM_GetHBAFeature(wwpn, RM_FEATURE_DPORT, &value) == RM_OK && value != 0)
        return true;
    TVR_LOG(TVR_ERR, "D_Port Test is not supported on this adapter.");
    return false;
}

/// Whether names wait for a restart of the host. `configured` gets those that are in force after it, or now.
bool awaitsReboot(const HBA_WWN& wwpn, RM_WwnNames& configured)
{
    if (LRM_ReadWWN(wwpn, RM_WWN_TYPE_CONFIGURED, &configured) != RM_OK ||
        (configured.activation != RM_WWN_AT_REBOOT_VOLATILE_UNTIL && configured.activation != RM_WWN_AT_REBOOT))
        return false;
    TVR_LOG(TVR_WARN, "WWN Management detected a new name change that requires a sytem reboot.");
    TVR_LOG(TVR_ERR, "Please reboot the system. D Port test is not allowed at this time.");
    return true;
}

bool isDisabled(const HBA_WWN& wwpn)
{
    AttributeBlock attributes(RM_DIAG_PORT_ATTRIBUTES_SIZE);
    std::uint32_t state = 0;
    if (attributes.fetch(LRM_GetPortAttributes, wwpn) != RM_OK || attributes.number(RM_PA_LINK_STATE, state) != RM_OK ||
        state != RM_LINK_DISABLED)
        return false;
    TVR_LOG(TVR_ERR, "Source HBA port is disabled. Unable to start loopback test");
    return true;
}

/// Why the test cannot begin; RM_OK if it can.
RM_STATUS obstacleTo(const HBA_WWN& wwpn)
{
    if (!hasFeature(wwpn))
        return RM_ERROR_HARDWARE_LACKS;
    RM_WwnNames configured{};
    if (awaitsReboot(wwpn, configured))
        return RM_ERROR_WWN_NOT_SUPPORTED;
    return isDisabled(configured.wwpn) ? RM_ERROR_PORT_DISABLED : RM_OK;
}

RM_STATUS startTest(LinkTest& link)
{
    const RM_STATUS status = LRM_DiagDPortTest(link.wwpn, 0, &link.handle);
    if (status != RM_OK)
    {
        TVR_LOG(TVR_DBG, "Unable to start the diagnostic test.");
        TVR_MethodWrapper::logStatus(status);
        TVR_LOG(TVR_DBG, "%s , Exited with error code : %d", MapDiagStatus(status), status);
    }
    return status;
}

/// The state that a job begins with. A test of which the library says so in its record, and not by its status, begins
/// as failed, which the thread corrects.
std::uint32_t stateAfter(RM_STATUS status, const RM_DPortResults& results)
{
    if (status == RM_ERROR_TEST_RUNNING)
        return JOB_RUNNING;
    if (results.state == RM_DPORT_STATE_CANCELLED)
        return JOB_TERMINATED;
    const bool hasPassed = results.diagnosticStatus == 0 && results.testResult == RM_DPORT_PASSED;
    return results.state != RM_DPORT_STATE_RUNNING && hasPassed ? JOB_COMPLETED : JOB_FAILED;
}

/// What the job begins with after a short look at the test.
std::uint32_t lookAtTest(const LinkTest& link)
{
    RM_DPortResults results{};
    RM_STATUS status = RM_OK;
    Time::sleep(5 * Time::second);
    for (int polls = 0; polls < 2; polls++)
    {
        status = readLink(link, results);
        if (status != RM_OK && status != RM_ERROR_TEST_RUNNING)
        {
            TVR_LOG(TVR_DBG, "DPortTest: RM_DiagGetResultsDPort failed :%d", status);
            TVR_MethodWrapper::logStatus(status);
            return JOB_FAILED;
        }
        TVR_LOG(TVR_DBG, "DPortTest: RM_DiagGetResultsDPort Diag Status :%d", status);
        Time::sleep(2 * Time::second);
    }
    return stateAfter(status, results);
}

TVRHBA_ConcreteJob* makeJob(const LinkTest& link, std::uint32_t state)
{
    return CreateConcreteJobInstantiateNonBlocking(link.agent, {.testName = link.test.name,
                                                                .wwpnText = link.wwpnText.c_str(),
                                                                .deleteOnCompletion = link.deleteOnCompletion,
                                                                .requestedState = state,
                                                                .diagHandle = link.handle,
                                                                .portController = link.portController.get()});
}

/// Waits for the thread of the test before. A refresh may go on meanwhile and take from the cache what the run has.
void startThread(TestRun& run, std::unique_ptr<LinkTest> link)
{
    const Ref<TVRHBA_ConcreteJob> job = link->job;
    run.kept = {hold<const Instance>(&run.settings), hold<const Instance>(&run.jobSettings),
                hold<const Instance>(&run.portController)};
    const int error = [&]
    {
        const Auto_Unlock released(run.agent.m_DataMutex);
        return run.agent.startDportThread(&DportStatusThread, link.get());
    }();
    if (error == 0)
        return static_cast<void>(link.release()); // the thread's from now on
    TVR_LOG(TVR_DBG, "DPortTest: Creation of DPORT Status Thread Failed");
    if (!job)
        return;
    job->ErrorCode.set(RM_ERROR); // its records will never come
    if (job->JobState.value == JOB_RUNNING)
        job->JobState.set(jobException);
}

} // namespace

RM_STATUS DPortTest(TestRun& run)
{
    TVR_LOG(TVR_DBG, "TVR_DiagTestFunc::Entered DPortTest");
    if (const RM_STATUS why = obstacleTo(run.wwpn); why != RM_OK)
        return why;
    auto link = std::make_unique<LinkTest>(LinkTest{
        .agent = run.agent,
        .test = run.test,
        .wwpn = run.wwpn,
        .wwpnText = wwnText(run.wwpn), // before the test begins, which a thread must follow then
        .portController = hold(&run.portController),
        .overridden = run.settings.OverridedSettingData.value == 1,
        .deleteOnCompletion = run.jobSettings.DeleteOnCompletion.value,
    });
    if (const RM_STATUS status = startTest(*link); status != RM_OK)
        return status;
    // Whatever is thrown from here on, a thread follows the test that has begun.
    const std::uint32_t state = shielded(
        std::uint32_t{JOB_FAILED}, [&] { return lookAtTest(*link); }, logException);
    link->job = hold(makeJob(*link, state));
    const Ref<TVRHBA_ConcreteJob> job = link->job;
    startThread(run, std::move(link));
    run.job = unlessOutOfMemory([&] { return Ref<TVRHBA_ConcreteJob>(clone_of(job.get())); });
    return RM_OK;
}

} // namespace cimple
