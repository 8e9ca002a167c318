// The time of day as the module sees it: that of the machine and what a test adds.
#pragma once

#include <chrono>

namespace module_test
{

/// Moves the time of day of this process forward.
void advanceClock(std::chrono::microseconds time);
/// From now on every look at the clock moves it forward by this much; zero ends it.
void setClockStep(std::chrono::microseconds step);

/// From now on the time of day moves only as a test moves it.
void stopClock();

} // namespace module_test
