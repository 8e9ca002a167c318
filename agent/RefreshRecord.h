// What is known of the refreshes of this process, for whoever watches it. It outlives the agent.
#pragma once

#include "runtime/base/Time.h"

#include <atomic>
#include <cstdint>
#include <limits>

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
        _length = now < _begin ? 0 : now - _begin;
        _end = now;
        ++_ended;
        _running = false;
    }

    bool running() const { return _running; }
    std::uint64_t ended() const { return _ended; }
    /// Microseconds that the last one took.
    std::uint64_t length() const { return _length; }
    /// Microseconds since the last one ended; since 1970 where none has. Behind the step of a clock that went backwards
    /// the largest number: the agent takes its cache for too old then.
    std::uint64_t age() const
    {
        const std::uint64_t end = _end; // before the clock is read: another one may end between
        const std::uint64_t now = Time::now();
        return now < end ? std::numeric_limits<std::uint64_t>::max() : now - end;
    }

private:
    std::atomic<std::uint64_t> _begin{0}, _end{0}, _length{0}, _ended{0};
    std::atomic<bool> _running{false};
};

inline constinit RefreshRecord refreshRecord;

} // namespace cimple
