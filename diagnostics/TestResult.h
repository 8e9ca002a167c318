// The two ways in which an executor ends.
#pragma once

#include "diagnostics/ConcreteJobs.h"
#include "diagnostics/TestRun.h"
#include "runtime/values/String.h"

namespace cimple
{

/// What a test came to.
struct TestResult
{
    String message;
    bool passed = false;
    std::uint32_t requestedState = JOB_FAILED; ///< a JobRequest
    std::uint32_t diagHandle = noDiagHandle;
    const RM_DiagResults* results = nullptr; ///< of a test that is polled
};

/// Without a result: there is no job. Returns the status.
RM_STATUS endWithoutJob(RM_STATUS status);

/// Makes the job of the test and its records, and deletes the job if it is wanted for no longer. A copy of the job;
/// null if none could be made.
Ref<TVRHBA_ConcreteJob> publish(TestRun& run, const TestResult& result);
/// The same; the client gets the job if it is not deleted.
void endWithJob(TestRun& run, const TestResult& result);

} // namespace cimple
