// The time of day as the module sees it: that of the machine, what a test adds, and what the module sleeps, since no
// sleep of the module takes its time.
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

/// How long the module has slept so far.
std::chrono::microseconds slept();

/// From now on called by each thread of the module that sleeps; null ends it.
void atSleep(void (*hook)());

} // namespace module_test
