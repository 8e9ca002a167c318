#include "broker/web/ErrorGrowth.h"

namespace web
{

bool ErrorGrowth::hasGrown(const std::string& port, const std::string& counter, std::uint64_t value)
{
    const std::scoped_lock lock(_mutex);
    if (_first.size() >= mostPorts && !_first.contains(port))
        return false;
    std::uint64_t& first = _first[port].try_emplace(counter, value).first->second;
    if (value < first)
        first = value;
    return value > first;
}

} // namespace web
