// The tests of ports that end before their method does: what drives each through the library.
//
// A test without a result leaves no job. One with a result, good or bad, leaves a job in its final state and its
// records; the status is then that of the last call of the library, which for a test that is polled is 0.
#pragma once

#include "diagnostics/TestRun.h"

namespace cimple
{

/// Modes of LoopBackTest.
inline constexpr std::uint32_t internalLoopback = 5;
inline constexpr std::uint32_t hostLoopback = 6;
inline constexpr std::uint32_t externalLoopback = 11;

// They are polled once a second, and cancelled when they last too long. A disabled port is a status of 0 without a job.

/// Also the ping.
RM_STATUS EchoTest(TestRun& run);
/// 4 for another mode; 1 if the external one finds no plug in the place of the cable.
RM_STATUS LoopBackTest(TestRun& run, std::uint32_t mode);
RM_STATUS SelfTest(TestRun& run);

// They have their result at once; a busy adapter is asked again.

RM_STATUS StatusTest(TestRun& run);
RM_STATUS FCHBAResetTest(TestRun& run);

/// Lets the light of the port flash, and gives it its former state back. Once it has flashed, the test has passed, and
/// so it has when the light cannot be switched off. The client gets its job even if that is deleted.
RM_STATUS BeaconTest(TestRun& run);

} // namespace cimple
