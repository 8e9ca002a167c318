#include "runtime/base/Time.h"

#include <atomic>
#include <cerrno>
#include <ctime>
#include <sys/select.h>
#include <sys/time.h>

namespace cimple
{
namespace
{

/// gettimeofday no longer knows the time zone, so the local offset comes from the broken-down time.
std::int32_t local_offset(std::time_t seconds)
{
    std::tm local{};
    localtime_r(&seconds, &local);
    return static_cast<std::int32_t>(local.tm_gmtoff / 60);
}

bool system_now(std::uint64_t& usec, std::int32_t& utc_offset)
{
    timeval now{};
    if (gettimeofday(&now, nullptr) != 0)
        return false;
    usec = static_cast<std::uint64_t>(now.tv_sec) * Time::second + static_cast<std::uint64_t>(now.tv_usec);
    utc_offset = local_offset(now.tv_sec);
    return true;
}

void system_sleep(std::uint64_t usec)
{
    timeval rest{};
    rest.tv_sec = static_cast<std::time_t>(usec / Time::second);
    rest.tv_usec = static_cast<suseconds_t>(usec % Time::second);
    // After a signal select leaves the time not slept in `rest`.
    while (select(0, nullptr, nullptr, nullptr, &rest) != 0 && errno == EINTR)
    {}
}

constexpr Time_Source system_source = {system_now, system_sleep};

constinit std::atomic<const Time_Source*> current_source = &system_source;

} // namespace

const Time_Source* set_time_source(const Time_Source* source)
{
    return current_source.exchange(source ? source : &system_source, std::memory_order_acq_rel);
}

const Time_Source& time_source()
{
    return *current_source.load(std::memory_order_acquire);
}

void Time::sleep(std::uint64_t usec)
{
    time_source().sleep(usec);
}

std::uint64_t Time::now()
{
    std::uint64_t usec = 0;
    std::int32_t utc_offset = 0;
    return time_source().now(usec, utc_offset) ? usec : 0;
}

} // namespace cimple
