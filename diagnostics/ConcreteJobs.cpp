#include "diagnostics/ConcreteJobs.h"

#include "agent/Build.h"
#include "agent/MethodCall.h"
#include "device/Bindings.h"
#include "diagnostics/TestRun.h"
#include "runtime/base/Time.h"
#include "schema/TVRHBA_AffectedJobElement.h"
#include "schema/TVRHBA_FCHBADiagnosticTest.h"
#include "schema/TVRHBA_OwningJobElement.h"
#include "schema/TVRHBA_PortController.h"

#include <algorithm>
#include <atomic>
#include <string_view>

namespace cimple
{

namespace
{

constexpr std::uint32_t noSuchJob = 32969;
constexpr std::uint32_t wrongArgument = 32968;

/// Of all jobs of the process.
std::atomic<std::uint32_t> lastSequenceNumber{0};

// --- the job and what it is joined to

struct StateRow
{
    std::uint32_t requested;
    std::uint16_t jobState;
    std::uint16_t percentComplete;
};

constexpr StateRow states[] = {
    {JOB_COMPLETED, 7, 100},
    {JOB_RUNNING, 4, 0},
    {JOB_TERMINATED, 8, 0},
};
constexpr StateRow anyOtherState = {JOB_FAILED, jobException, 0};

void setState(TVRHBA_ConcreteJob& job, std::uint32_t requested)
{
    const StateRow* found = std::ranges::find(states, requested, &StateRow::requested);
    const StateRow& row = found == std::end(states) ? anyOtherState : *found;
    job.JobState.set(row.jobState);
    job.PercentComplete.set(row.percentComplete);
}

Ref<TVRHBA_ConcreteJob> makeJob(const JobOrder& order)
{
    Ref<TVRHBA_ConcreteJob> job = fresh<TVRHBA_ConcreteJob>();
    const std::uint32_t number = ++lastSequenceNumber;
    job->InstanceID.set(formatText("%s:%d:%lu", order.testName, static_cast<int>(number),
                                   static_cast<unsigned long>(order.diagHandle)));
    job->ElementName.set(className<TVRHBA_ConcreteJob>());
    job->Name.set(order.testName);
    job->DeleteOnCompletion.set(order.deleteOnCompletion);
    job->TimeSubmitted.set(Datetime::now());
    job->ElapsedTime.set(job->TimeSubmitted.value); // the time of the end, not a span
    setState(*job, order.requestedState);
    if (order.wwpnText)
    {
        job->diagHandle.set(order.diagHandle);
        job->wwpn.set(order.wwpnText);
    }
    return job;
}

/// An association of the job, which is there without its other end as well. Logs one of the texts if it cannot be made;
/// false if there was no memory for it.
template <class Association, class Element, class Holder1, class Holder2>
bool joinJob(InstanceCache& cache, CIM_Job* Holder1::*jobRole, const TVRHBA_ConcreteJob* job,
             Element* Holder2::*elementRole, const Element* element, const LogText& notMade, const LogText& refused)
{
    return insertMade(
               mapOf<Association>(cache),
               [&]
               {
                   Ref<Association> association = fresh<Association>();
                   (*association).*jobRole = shared_end(job).release();
                   (*association).*elementRole = shared_end(element).release();
                   return association;
               },
               notMade, refused)
        .has_value();
}

/// Takes the job's association out of its map.
template <class Association> void partFrom(InstanceCache& cache, CIM_Job* Association::*role, const String& jobId)
{
    mapOf<Association>(cache).removeIf(
        [&](const Association& association)
        {
            const auto* job = cast<CIM_ConcreteJob>(association.*role);
            return job && job->InstanceID.value == jobId;
        });
}

// --- a change of its state

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of TVRHBA_ConcreteJob"},
    .noPlainName = {TVR_DBG, "TVRHBA_ConcreteJob_Provider: RequestStateChange:Id2HBAName failed"},
    .noWwn = {TVR_DBG, "TVRHBA_ConcreteJob_Provider: RequestStateChange:str2HBAName failed"},
    .ofName = {4097},
};

bool isLinkTest(std::string_view testName)
{
    const DiagnosticTest* test = findDiagnosticTest(testName);
    return test && test->id == DiagnosticTestId::DPort;
}

std::uint32_t requestStateChange(const Instance* reference, TVRHBA_ConcreteJob_RequestStateChange_method& parameters)
{
    constexpr std::uint16_t terminate = 4;
    MethodCall call({TVR_DBG, "TVRHBA_ConcreteJob_Provider: RequestStateChange Entry"});
    const auto* job = call.self<TVRHBA_ConcreteJob>(reference, texts);
    if (parameters.RequestedState.null || parameters.RequestedState.value != terminate)
        call.end({TVR_DBG, "TVRHBA_ConcreteJob_Provider: Invalid Arguments"}, {wrongArgument});
    if (!isLinkTest(job->Name.value.view()))
        call.end({TVR_DBG, "TVRHBA_ConcreteJob_Provider: Stop Supported for Only DPORT test"}, {wrongArgument});
    const HBA_WWN wwpn = call.wwpn(job->wwpn.value, texts);
    const std::uint32_t handle = job->diagHandle.value;
    if (const RM_STATUS status = CancelDportTest(wwpn, handle, job->Name.value.c_str()); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "TVRHBA_ConcreteJob_Provider: CancelTest failed: DiagHandle:%d", static_cast<int>(handle));
        return ofLibrary(status);
    }
    TVR_LOG(TVR_DBG, "TVRHBA_ConcreteJob_Provider: CancelTest Successful: DiagHandle :%d", static_cast<int>(handle));
    return 0;
}

/// Whether a test can be cancelled that somebody named so.
bool isCancellable(std::uint32_t diagHandle, const char* testName)
{
    if (testName && diagHandle != 0)
        return true;
    TVR_LOG(TVR_DBG, "Invalid Parameter");
    return false;
}

} // namespace

TVRHBA_ConcreteJob* CreateConcreteJobInstantiateNonBlocking(InstanceCache& cache, const JobOrder& order)
{
    using Owning = TVRHBA_OwningJobElement;
    using Affected = TVRHBA_AffectedJobElement;
    TVR_LOG(TVR_DBG, "CreateConcreteJobInstantiateNonBlocking");
    TVRHBA_ConcreteJob* job = insertMade(
                                  mapOf<TVRHBA_ConcreteJob>(cache), [&] { return makeJob(order); },
                                  {TVR_ERR, "Unable to create TVRHBA_ConcreteJob"}, "Insert Failed: TVRHBA_ConcreteJob")
                                  .value_or(nullptr);
    if (!job)
        return nullptr;
    const CIM_ManagedElement* test = mapOf<TVRHBA_FCHBADiagnosticTest>(cache).findFirst(
        [&](const auto& known) { return known.Name.value == order.testName; });
    if (joinJob<Owning>(cache, &Owning::OwnedElement, job, &Owning::OwningElement, test,
                        {TVR_ERR, "Unable to create TVRHBA_OwningJobElement"},
                        {TVR_ERR, "Insert Failed: TVRHBA_OwningJobElement"}))
        joinJob<Affected>(cache, &Affected::AffectingElement, job, &Affected::AffectedElement,
                          static_cast<const CIM_ManagedElement*>(order.portController),
                          {TVR_ERR, "Unable to create TVRHBA_AffectedJobElement"},
                          {TVR_ERR, "Insert Failed: TVRHBA_AffectedJobElement"});
    return job;
}

std::uint32_t DeleteConcreteJob(InstanceCache& cache, const TVRHBA_ConcreteJob* job)
{
    TVR_LOG(TVR_DBG, "TVRHBA_DiagTestFunc::DeleteConcreteJob()");
    if (!job)
    {
        TVR_LOG(TVR_DBG, "Invalid Job ID");
        return noSuchJob;
    }
    const String jobId = job->InstanceID.value; // the job is gone in the end
    partFrom<TVRHBA_OwningJobElement>(cache, &TVRHBA_OwningJobElement::OwnedElement, jobId);
    partFrom<TVRHBA_AffectedJobElement>(cache, &TVRHBA_AffectedJobElement::AffectingElement, jobId);
    mapOf<TVRHBA_ConcreteJob>(cache).removeIf([&](const auto& known) { return known.InstanceID.value == jobId; });
    return 0;
}

RM_STATUS CancelTest(const ProviderAgent& agent, const HBA_WWN& wwpn, std::uint32_t diagHandle, const char* testName)
{
    constexpr int attempts = 450;
    if (!isCancellable(diagHandle, testName))
        return RM_ERROR;
    RM_STATUS status = RM_ERROR;
    for (int attempt = 0; attempt < attempts && !agent.hasEnded(); attempt++)
    {
        status = LRM_DiagCancelDiagnostic(wwpn, diagHandle);
        TVR_LOG(TVR_DBG, "Polling for the Cancel status ..: %d", status);
        Time::sleep(Time::second);
        if (status != RM_OK)
        {
            TVR_LOG(TVR_DBG, "Unknown error, Unable to cancel the test, Exited with the error code : %d", status);
            continue;
        }
        RM_DiagResults results{};
        status = LRM_DiagGetResults(wwpn, diagHandle, &results);
        TVR_LOG(TVR_DBG, "Polling for the results.. : %d", status);
        if (status == RM_OK && results.state == RM_DIAG_STATE_CANCELLED)
        {
            TVR_LOG(TVR_DBG, "Canceled the %s", testName);
            return RM_OK;
        }
    }
    return status;
}

RM_STATUS CancelDportTest(const HBA_WWN& wwpn, std::uint32_t diagHandle, const char* testName)
{
    if (!isCancellable(diagHandle, testName))
        return RM_ERROR;
    const RM_STATUS status = LRM_DiagCancelDiagnostic(wwpn, diagHandle);
    Time::sleep(Time::second);
    TVR_LOG(TVR_DBG, "TVR_Diagnostics::CancelDportTest RM_DiagCancelDiagnostic Status, DiagHandle: %d %d", status,
            static_cast<int>(diagHandle));
    return status;
}

std::span<const MethodRow> concreteJobMethods()
{
    return methodTable<TVRHBA_ConcreteJob, &requestStateChange>;
}

} // namespace cimple
