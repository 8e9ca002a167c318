// The test of a link, which the switch at its other end helps with. It takes too long for a method call: the run starts
// the test and makes its job, and a thread of the agent waits for the end.
#pragma once

#include "diagnostics/TestRun.h"

namespace cimple
{

/// An executor. A second test waits for the thread of the first, and lets go of the data lock meanwhile.
RM_STATUS DPortTest(TestRun& run);

} // namespace cimple
