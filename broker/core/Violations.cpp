#include "broker/core/Violations.h"

namespace broker
{

void Violations::add(std::string text)
{
    const std::lock_guard lock(_mutex);
    if (_list.size() < limit)
        _list.push_back({std::move(text)});
}

std::vector<Violation> Violations::all() const
{
    const std::lock_guard lock(_mutex);
    return _list;
}

void Violations::clear()
{
    const std::lock_guard lock(_mutex);
    _list.clear();
}

} // namespace broker
