// Which error counters have grown while somebody was reading them.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <string>

namespace web
{

class ErrorGrowth
{
public:
    using Time = std::chrono::steady_clock::time_point;

    /// An error of long ago is no news: a counter that has stood still for so long does not grow any more.
    static constexpr std::chrono::minutes toldFor{15};

    ErrorGrowth() = default;
    explicit ErrorGrowth(std::function<Time()> clock) : _clock(std::move(clock)) {}

    /// Takes the value of a port's counter as it is now; true when it has grown between two readings, of which the
    /// later was not long ago. One that has become smaller was reset, and begins anew.
    bool hasGrown(const std::string& port, const std::string& counter, std::uint64_t value);

private:
    struct Reading
    {
        std::uint64_t value;
        Time told = {}; ///< until when it counts as growing
    };

    /// Ports come and go: beyond that many, others are not watched.
    static constexpr std::size_t mostPorts = 4096;

    std::function<Time()> _clock = std::chrono::steady_clock::now;
    std::mutex _mutex;
    std::map<std::string, std::map<std::string, Reading>> _last; ///< by port and counter
};

} // namespace web
