// Which error counters have grown while the port was watching them.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace web
{

class ErrorGrowth
{
public:
    /// Takes the value of a port's counter as it is now; true when it has grown since it was first seen. One that has
    /// become smaller was reset, and begins anew.
    bool hasGrown(const std::string& port, const std::string& counter, std::uint64_t value);

private:
    /// Ports come and go: beyond that many, others are not watched.
    static constexpr std::size_t mostPorts = 4096;

    std::mutex _mutex;
    std::map<std::string, std::map<std::string, std::uint64_t>> _first; ///< by port and counter
};

} // namespace web
