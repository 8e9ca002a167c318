#include "tests/module/Clock.h"

#include <atomic>
#include <ctime>
#include <sys/time.h>

namespace
{

std::atomic<std::int64_t> added{0};
std::atomic<std::int64_t> step{0};
std::atomic<std::int64_t> stopped{0};

std::int64_t machineTime()
{
    timespec machine{};
    clock_gettime(CLOCK_REALTIME, &machine);
    return std::int64_t{machine.tv_sec} * 1'000'000 + machine.tv_nsec / 1000;
}

} // namespace

namespace module_test
{

void advanceClock(std::chrono::microseconds time)
{
    added += time.count();
}

void setClockStep(std::chrono::microseconds time)
{
    step = time.count();
}

void stopClock()
{
    stopped = machineTime();
}

} // namespace module_test

/// Stands before the C library's function for all libraries of the process, the module among them.
extern "C" __attribute__((visibility("default"))) int gettimeofday(timeval* now, void*) noexcept
{
    const std::int64_t base = stopped ? stopped.load() : machineTime();
    const std::int64_t time = base + (added += step);
    now->tv_sec = time / 1'000'000;
    now->tv_usec = time % 1'000'000;
    return 0;
}
