#include "tests/module/Clock.h"

#include <atomic>
#include <ctime>
#include <dlfcn.h>
#include <sys/select.h>
#include <sys/time.h>

namespace
{

std::atomic<std::int64_t> added{0};
std::atomic<std::int64_t> step{0};
std::atomic<std::int64_t> stopped{0};
std::atomic<std::int64_t> sleeps{0};
std::atomic<void (*)()> sleepHook{nullptr};

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

void atSleep(void (*hook)())
{
    sleepHook = hook;
}

std::chrono::microseconds slept()
{
    return std::chrono::microseconds(sleeps);
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

/// Stands before the C library's in the same way. Without descriptors it is a sleep, as the module's are: it moves the
/// clock, and takes a little of the machine's time, so that a thread that polls leaves some to the others.
extern "C" __attribute__((visibility("default"))) int select(int count, fd_set* reads, fd_set* writes, fd_set* errors,
                                                             timeval* timeout)
{
    using Select = int(int, fd_set*, fd_set*, fd_set*, timeval*);
    static auto* const real = reinterpret_cast<Select*>(dlsym(RTLD_NEXT, "select"));
    if (reads || writes || errors || !timeout)
        return real(count, reads, writes, errors, timeout);
    if (void (*hook)() = sleepHook)
        hook();
    constexpr std::int64_t faster = 20'000;
    const std::int64_t time = std::int64_t{timeout->tv_sec} * 1'000'000 + timeout->tv_usec;
    sleeps += time;
    added += time;
    timeval rest{0, time / faster};
    return real(0, nullptr, nullptr, nullptr, &rest);
}
