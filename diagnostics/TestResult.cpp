#include "diagnostics/TestResult.h"

#include "agent/Build.h"
#include "diagnostics/DiagnosticRecords.h"
#include "diagnostics/DiagnosticTexts.h"
#include "schema/TVRHBA_FCHBADiagnosticSettingData.h"
#include "schema/TVRHBA_JobSettingData.h"

#include <utility>

namespace cimple
{

RM_STATUS endWithoutJob(RM_STATUS status)
{
    TVR_LOG(TVR_DBG, "%s , Exited with error code : %d", MapDiagStatus(status), status);
    return status;
}

Ref<TVRHBA_ConcreteJob> publish(TestRun& run, const TestResult& result)
{
    const bool isDeleted = run.jobSettings.DeleteOnCompletion.value;
    TVRHBA_ConcreteJob* made =
        CreateConcreteJobInstantiateNonBlocking(run.agent, {.testName = run.test.name,
                                                            .deleteOnCompletion = isDeleted,
                                                            .requestedState = result.requestedState,
                                                            .diagHandle = result.diagHandle,
                                                            .portController = &run.portController});
    if (!made)
        return {};
    ref(made);
    const Ref<TVRHBA_ConcreteJob> job(made); // beyond its place in the cache
    const TestOutcome outcome = {
        .test = run.test,
        .message = result.message,
        .jobId = job->InstanceID.value,
        .passed = result.passed,
        .portController = &run.portController,
        .overridden = run.settings.OverridedSettingData.value == 1,
        .results = result.results,
    };
    CreateDiagnosticServiceRecord(run.agent, outcome);
    CreateDiagnosticCompletionRecord(run.agent, outcome);
    if (isDeleted)
        DeleteConcreteJob(run.agent, job.get());
    return unlessOutOfMemory([&] { return Ref<TVRHBA_ConcreteJob>(clone_of(job.get())); });
}

void endWithJob(TestRun& run, const TestResult& result)
{
    Ref<TVRHBA_ConcreteJob> job = publish(run, result);
    if (!run.jobSettings.DeleteOnCompletion.value)
        run.job = std::move(job);
}

} // namespace cimple
