// What a test that has ended leaves in the cache: the record of its figures and that of its verdict, each in the log of
// the test and applied to the port.
#pragma once

#include "agent/InstanceCache.h"
#include "device/RmApi.h"
#include "diagnostics/TestCatalog.h"
#include "runtime/values/String.h"

namespace cimple
{

class TVRHBA_PortController;

/// How a test ended. What it refers to stays the caller's.
struct TestOutcome
{
    const DiagnosticTest& test;
    String message;
    String jobId; ///< InstanceID of the test's job
    bool passed;
    const TVRHBA_PortController* portController; ///< null if it is not in the cache
    bool overridden;                             ///< a client gave settings for the run
    const RM_DiagResults* results = nullptr;     ///< of a test that is polled
    const RM_DPortResults* link = nullptr;       ///< of a test of a link
};

/// With overridden settings, also makes the record of these. What cannot be made has its line in the log. The caller
/// holds the data lock.
void CreateDiagnosticServiceRecord(InstanceCache& cache, const TestOutcome& outcome);
/// Refers to the record of the settings that the service record made: to be called after it.
void CreateDiagnosticCompletionRecord(InstanceCache& cache, const TestOutcome& outcome);

} // namespace cimple
