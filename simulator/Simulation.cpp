#include "simulator/Simulation.h"

#include <thread>

namespace tvrsim
{

void Simulation::load(Scenario scenario)
{
    clearFaults();
    for (const Fault& fault : scenario.faults)
        addFault(fault);
    counts.reset();
    host.load(std::move(scenario));
}

void Simulation::addFault(const Fault& fault)
{
    if (!fault.gate.empty())
        gates.close(fault.gate);
    _faults.add(fault);
}

void Simulation::clearFaults()
{
    _faults.clear();
    gates.openAll();
}

Effects Simulation::enter(const char* function, const std::function<std::string()>& subject)
{
    using Clock = std::chrono::steady_clock;
    const Clock::time_point arrival = Clock::now();
    counts.add(function);
    Effects effects = _faults.meet(function, subject);
    for (const std::string& gate : effects.gates)
        gates.pass(gate);
    if (effects.delay.count() > 0)
        std::this_thread::sleep_for(effects.delay);
    const bool waited = effects.delay.count() > 0 || !effects.gates.empty();
    effects.begun = waited ? Clock::now() : arrival;
    return effects;
}

void Simulation::leave(const Effects& effects)
{
    const std::chrono::nanoseconds took = std::chrono::steady_clock::now() - effects.begun;
    nanoseconds.fetch_add(static_cast<std::uint64_t>(took.count()), std::memory_order_relaxed);
}

} // namespace tvrsim
