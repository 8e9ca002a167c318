#include "simulator/Control.h"

#include "simulator/ScenarioReader.h"
#include "simulator/Simulation.h"

#include <cstdio>
#include <cstdlib>
#include <exception>
#include <mutex>

namespace
{

using namespace tvrsim;

/// Lives as long as the process: threads of the program may still call while it ends.
Simulation& simulation()
{
    static Simulation* const only = new Simulation;
    return *only;
}

std::once_flag firstScenario;

void loadFirstScenario()
{
    const char* file = std::getenv("TVR_SIM_SCENARIO");
    try
    {
        simulation().load(file ? readScenarioFile(file) : readScenario(defaultScenarioText, "default scenario"));
    }
    catch (const std::exception& problem)
    {
        std::fprintf(stderr, "simulator: %s\n", problem.what());
    }
}

/// Runs `action`, and reports what it throws in the caller's buffer.
template <class Action> int attempt(char* error, std::size_t errorSize, Action action)
{
    try
    {
        action();
        return 1;
    }
    catch (const std::exception& problem)
    {
        if (error)
            std::snprintf(error, errorSize, "%s", problem.what());
        return 0;
    }
}

/// Puts a scenario in the place of the first one, or of the present one.
int load(char* error, std::size_t errorSize, Scenario (*read)(const char*), const char* source)
{
    return attempt(error, errorSize,
                   [&]
                   {
                       Scenario scenario = read(source);
                       std::call_once(firstScenario, [] {});
                       simulation().load(std::move(scenario));
                   });
}

Wwn requireWwn(const char* text)
{
    const std::optional<Wwn> name = parseWwn(text);
    if (!name)
        throw ScenarioError(std::string("expected a WWN of 16 hexadecimal digits, found \"") + text + '"');
    return *name;
}

} // namespace

tvrsim::Simulation* tvrsim_simulation()
{
    std::call_once(firstScenario, loadFirstScenario);
    return &simulation();
}

int tvrsim_load_scenario(const char* path, char* error, std::size_t errorSize)
{
    return load(
        error, errorSize, [](const char* file) { return readScenarioFile(file); }, path);
}

int tvrsim_load_scenario_text(const char* text, char* error, std::size_t errorSize)
{
    return load(
        error, errorSize, [](const char* source) { return readScenario(source, "scenario"); }, text);
}

std::uint64_t tvrsim_call_count(const char* function)
{
    return simulation().counts.of(function);
}

void tvrsim_reset_counts()
{
    simulation().counts.reset();
}

std::uint64_t tvrsim_nanoseconds()
{
    return simulation().nanoseconds;
}

int tvrsim_add_fault(const char* row, char* error, std::size_t errorSize)
{
    return attempt(error, errorSize, [&] { tvrsim_simulation()->addFault(readFault(row, "fault")); });
}

void tvrsim_clear_faults()
{
    simulation().clearFaults();
}

void tvrsim_open_gate(const char* gate)
{
    simulation().gates.open(gate);
}

int tvrsim_await_gate(const char* gate, unsigned calls, unsigned milliseconds)
{
    return simulation().gates.await(gate, calls, std::chrono::milliseconds(milliseconds));
}

std::size_t tvrsim_open_handles()
{
    return simulation().host.openHandles();
}

void tvrsim_remember_host()
{
    tvrsim_simulation()->host.remember();
}

void tvrsim_host_difference(char* text, std::size_t size)
{
    std::snprintf(text, size, "%s", tvrsim_simulation()->host.difference().c_str());
}

int tvrsim_remove_adapter(const char* adapter)
{
    return tvrsim_simulation()->host.removeAdapter(adapter);
}

int tvrsim_make_stale(const char* adapter)
{
    return tvrsim_simulation()->host.makeStale(adapter);
}

int tvrsim_set_port_state(const char* wwpn, std::uint32_t state)
{
    const std::optional<Wwn> name = parseWwn(wwpn);
    return name && tvrsim_simulation()->host.setPortState(*name, state);
}

int tvrsim_set_attribute(const char* wwpn, const char* attribute, char* error, std::size_t errorSize)
{
    return attempt(error, errorSize,
                   [&]
                   {
                       const Wwn name = requireWwn(wwpn);
                       if (!tvrsim_simulation()->host.setAttributeOf(name, readAttribute(attribute, "attribute")))
                           throw ScenarioError("no port " + wwnText(name) + ", or no attribute of a port or adapter");
                   });
}

int tvrsim_set_diagnostics(const char* wwpn, const char* diagnostics, char* error, std::size_t errorSize)
{
    return attempt(error, errorSize,
                   [&]
                   {
                       const Wwn name = requireWwn(wwpn);
                       if (!tvrsim_simulation()->host.setDiagnostics(name, readDiagnostics(diagnostics, "diagnostics")))
                           throw ScenarioError("no port " + wwnText(name));
                   });
}

int tvrsim_set_driver_parameter(const char* wwpn, const char* name, std::uint32_t current)
{
    const std::optional<Wwn> port = wwpn ? parseWwn(wwpn) : std::nullopt;
    return (port || !wwpn) && tvrsim_simulation()->host.setDriverParameter(port, name, current);
}

void tvrsim_reboot(int powerDown)
{
    tvrsim_simulation()->host.reboot(powerDown != 0);
}
