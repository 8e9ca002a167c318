#include "broker/core/UpcallChannel.h"

namespace broker
{

bool UpcallChannel::enter(std::chrono::milliseconds limit)
{
    const std::thread::id self = std::this_thread::get_id();
    std::unique_lock lock(_mutex);
    if (!_freed.wait_for(lock, limit, [&] { return _depth == 0 || _owner == self; }))
        return false;
    _owner = self;
    ++_depth;
    return true;
}

void UpcallChannel::leave()
{
    const std::lock_guard lock(_mutex);
    if (--_depth == 0)
        _freed.notify_one();
}

} // namespace broker
