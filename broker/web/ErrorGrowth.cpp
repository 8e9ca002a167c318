#include "broker/web/ErrorGrowth.h"

namespace web
{

bool ErrorGrowth::hasGrown(const std::string& port, const std::string& counter, std::uint64_t value)
{
    const std::scoped_lock lock(_mutex);
    if (_last.size() >= mostPorts && !_last.contains(port))
        return false;
    const Time now = _clock();
    Reading& last = _last[port].try_emplace(counter, Reading{value, now}).first->second;
    if (value != last.value)
        last = {value, value > last.value ? now + toldFor : now};
    return now < last.told;
}

} // namespace web
