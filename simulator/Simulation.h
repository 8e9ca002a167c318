// The simulated host with all that stands around it: what the front ends of a process share.
#pragma once

#include "simulator/Faults.h"
#include "simulator/Gates.h"
#include "simulator/SimulatedHost.h"

#include <atomic>

namespace tvrsim
{

class Simulation
{
public:
    /// Takes the place of host and faults, opens the gates and resets the counts.
    void load(Scenario scenario);

    void addFault(const Fault& fault);
    /// Also opens every gate, so that no call stays behind.
    void clearFaults();

    /// Begins a call: counts it, and waits as long as faults say. No lock is held meanwhile.
    Effects enter(const char* function, const std::function<std::string()>& subject);
    /// Ends it: adds the time that it took, without its waits.
    void leave(const Effects& effects);

    /// Spent inside calls since the process began, threads added up.
    std::atomic<std::uint64_t> nanoseconds{0};
    SimulatedHost host;
    CallCounts counts;
    Gates gates;

private:
    Faults _faults;
};

} // namespace tvrsim
