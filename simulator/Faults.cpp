#include "simulator/Faults.h"

#include <algorithm>

namespace tvrsim
{

void Faults::add(const Fault& fault)
{
    std::lock_guard lock(_mutex);
    _rows.push_back({fault});
}

void Faults::clear()
{
    std::lock_guard lock(_mutex);
    _rows.clear();
}

bool Faults::concerns(std::string_view function) const
{
    std::lock_guard lock(_mutex);
    return std::ranges::any_of(_rows, [&](const Row& row) { return row.fault.function == function; });
}

Effects Faults::meet(std::string_view function, const std::function<std::string()>& subject)
{
    Effects effects;
    if (!concerns(function))
        return effects;
    const std::string concerned = subject ? subject() : std::string();

    std::lock_guard lock(_mutex);
    for (Row& row : _rows)
    {
        const Fault& fault = row.fault;
        if (fault.function != function || (!fault.subject.empty() && fault.subject != concerned))
            continue;
        ++row.calls;
        if (row.calls < fault.from || row.calls > fault.to)
            continue;
        if (fault.delay)
            effects.delay += *fault.delay;
        if (!fault.gate.empty())
            effects.gates.push_back(fault.gate);
        if (!effects.status)
            effects.status = fault.status;
        if (!effects.truncate)
            effects.truncate = fault.truncate;
        if (!effects.hostile)
            effects.hostile = fault.hostile;
    }
    return effects;
}

void CallCounts::add(std::string_view function)
{
    std::lock_guard lock(_mutex);
    const auto place = _counts.find(function);
    if (place != _counts.end())
        ++place->second;
    else
        _counts.emplace(function, 1);
}

std::uint64_t CallCounts::of(std::string_view function) const
{
    std::lock_guard lock(_mutex);
    const auto place = _counts.find(function);
    return place == _counts.end() ? 0 : place->second;
}

void CallCounts::reset()
{
    std::lock_guard lock(_mutex);
    _counts.clear();
}

} // namespace tvrsim
