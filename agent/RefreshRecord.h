// What is known of the refreshes of this process, for whoever watches it. It outlives the agent.
#pragma once

#include "runtime/base/Time.h"

#include <atomic>
#include <cstdint>

namespace cimple
{

/// Written by whoever starts and ends a refresh, read at any time without a lock.
class RefreshRecord
{
public:
    void begin()
    {
        _begin = Time::now();
        _running = true;
    }
    /// The thread could not be made.
    void giveUp() { _running = false; }
    void end()
    {
        const std::uint64_t now = Time::now();
        _length = elapsed(_begin, now);
        _end = now;
        ++_ended;
        _running = false;
    }

    bool running() const { return _running; }
    std::uint64_t ended() const { return _ended; }
    /// Microseconds that the last one took.
    std::uint64_t length() const { return _length; }
    /// Microseconds since the last one ended; since 1970 where none has.
    std::uint64_t age() const { return elapsed(_end, Time::now()); }

private:
    /// A clock that stepped backwards has no time gone by.
    static std::uint64_t elapsed(std::uint64_t from, std::uint64_t to) { return to < from ? 0 : to - from; }

    std::atomic<std::uint64_t> _begin{0}, _end{0}, _length{0}, _ended{0};
    std::atomic<bool> _running{false};
};

inline constinit RefreshRecord refreshRecord;

} // namespace cimple
