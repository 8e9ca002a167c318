#include "simulator/Gates.h"

namespace tvrsim
{

void Gates::close(const std::string& name)
{
    std::lock_guard lock(_mutex);
    _gates[name].closed = true;
}

void Gates::open(const std::string& name)
{
    std::lock_guard lock(_mutex);
    _gates[name].closed = false;
    _changed.notify_all();
}

void Gates::openAll()
{
    std::lock_guard lock(_mutex);
    for (auto& [name, gate] : _gates)
        gate.closed = false;
    _changed.notify_all();
}

void Gates::pass(const std::string& name)
{
    std::unique_lock lock(_mutex);
    Gate& gate = _gates[name]; // map nodes stay where they are
    ++gate.waiting;
    _changed.notify_all();
    _changed.wait(lock, [&] { return !gate.closed; });
    --gate.waiting;
}

bool Gates::await(const std::string& name, unsigned calls, std::chrono::milliseconds time)
{
    std::unique_lock lock(_mutex);
    Gate& gate = _gates[name];
    return _changed.wait_for(lock, time, [&] { return gate.waiting >= calls; });
}

} // namespace tvrsim
