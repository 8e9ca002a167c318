// The one seam through which the program reads the clock and sleeps.
#pragma once

#include <cstdint>

namespace cimple
{

/// What a process takes its time from. Tests replace it to run minutes in milliseconds; the default is
/// gettimeofday and select.
struct Time_Source
{
    /// Microseconds since the epoch and the local offset east of UTC in minutes; false if the clock failed.
    bool (*now)(std::uint64_t& usec, std::int32_t& utc_offset);
    void (*sleep)(std::uint64_t usec);
};

/// Installs a source for the whole process; null restores the system's. Returns the former one.
const Time_Source* set_time_source(const Time_Source* source);
const Time_Source& time_source();

struct Time
{
    static constexpr std::uint64_t second = 1'000'000;

    static void sleep(std::uint64_t usec);
    /// Microseconds since the epoch; 0 if the clock cannot be read.
    static std::uint64_t now();
};

} // namespace cimple
