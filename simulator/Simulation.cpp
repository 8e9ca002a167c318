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
    counts.add(function);
    const Effects effects = _faults.meet(function, subject);
    for (const std::string& gate : effects.gates)
        gates.pass(gate);
    if (effects.delay.count() > 0)
        std::this_thread::sleep_for(effects.delay);
    return effects;
}

} // namespace tvrsim
