// Control of the simulated host from tests and tools: the functions that libtvrsim.so exports.
//
// All names are texts that end in a zero byte; WWPNs are 16 hexadecimal digits, with or without colons. Functions that
// return int give 1 for success and 0 for failure. Where a function takes `error`, a failure leaves its message
// there, cut to `errorSize` bytes; `error` may be null. All of them may be called from any thread at any time.
//
// A process that links nothing of the simulator takes the functions from dlsym with the types of this header:
//     auto* load = reinterpret_cast<decltype(tvrsim_load_scenario)*>(dlsym(library, "tvrsim_load_scenario"));
#pragma once

#include <cstddef>
#include <cstdint>

namespace tvrsim
{
class Simulation;
}

#define TVRSIM_EXPORT __attribute__((visibility("default")))

extern "C"
{

    /// Puts the host of a scenario file in the place of the present one. Counts begin at zero, faults are those of the
    /// scenario. On failure the present host stays.
    ///
    /// A process that never loads a scenario has the host of the file that the environment variable
    /// TVR_SIM_SCENARIO names, or the default host. If that file is wrong, the message goes to standard error and the
    /// host has no adapters.
    TVRSIM_EXPORT int tvrsim_load_scenario(const char* path, char* error, std::size_t errorSize);
    TVRSIM_EXPORT int tvrsim_load_scenario_text(const char* text, char* error, std::size_t errorSize);

    /// Calls of an exported function, by its exact name, since the scenario was loaded or the counts were reset.
    TVRSIM_EXPORT std::uint64_t tvrsim_call_count(const char* function);
    TVRSIM_EXPORT void tvrsim_reset_counts();
    /// Nanoseconds spent inside calls since the process began, their waits at gates and delays left out.
    TVRSIM_EXPORT std::uint64_t tvrsim_nanoseconds();

    /// Adds a fault row, as in the "faults" of a scenario. Its calls are counted from now on.
    TVRSIM_EXPORT int tvrsim_add_fault(const char* row, char* error, std::size_t errorSize);
    /// Removes every row, and opens every gate.
    TVRSIM_EXPORT void tvrsim_clear_faults();

    /// Lets the calls go on that a fault row holds at a gate, and those that come.
    TVRSIM_EXPORT void tvrsim_open_gate(const char* gate);
    /// Waits until so many calls are held at a gate. 0 if that does not happen within the time.
    TVRSIM_EXPORT int tvrsim_await_gate(const char* gate, unsigned calls, unsigned milliseconds);

    /// Adapters that are open through the HBA API or for frame tagging.
    TVRSIM_EXPORT std::size_t tvrsim_open_handles();

    /// Remembers the state of the host as it is.
    TVRSIM_EXPORT void tvrsim_remember_host();
    /// What differs from the state that was remembered, such as "port 10:00:02:7A:51:16:02:10"; empty if nothing does.
    /// Cut to `size` bytes.
    TVRSIM_EXPORT void tvrsim_host_difference(char* text, std::size_t size);

    // Changes of the host. 0 if there is no such adapter or port.

    /// The adapter and its ports vanish; handles of it become invalid.
    TVRSIM_EXPORT int tvrsim_remove_adapter(const char* adapter);
    /// The HBA API answers "stale data" for the adapter until HBA_RefreshInformation.
    TVRSIM_EXPORT int tvrsim_make_stale(const char* adapter);
    /// `state` is one of the HBA API's port states. Only an online port reaches its targets.
    TVRSIM_EXPORT int tvrsim_set_port_state(const char* wwpn, std::uint32_t state);
    /// Sets one attribute of a port, of its statistics or of its adapter: {"name": value}, as in a scenario.
    TVRSIM_EXPORT int tvrsim_set_attribute(const char* wwpn, const char* attribute, char* error, std::size_t errorSize);

    /// Puts what a scenario has under "diagnostics" in the place of that of a port; what is not named has its default.
    /// With "loopbackPlug" the plug takes the place of the cable, and without it the cable comes back.
    TVRSIM_EXPORT int tvrsim_set_diagnostics(const char* wwpn, const char* diagnostics, char* error,
                                             std::size_t errorSize);

    /// Sets the current value of a driver parameter of the adapter behind a port, or of that for all adapters where
    /// `wwpn` is null.
    TVRSIM_EXPORT int tvrsim_set_driver_parameter(const char* wwpn, const char* name, std::uint32_t current);

    /// What waits for a restart of the host comes into force: names of ports, stored driver parameters and priority
    /// lanes. With `powerDown` volatile names are lost before.
    TVRSIM_EXPORT void tvrsim_reboot(int powerDown);

    /// For the front ends: what they share. Loads a scenario first if none was loaded.
    TVRSIM_EXPORT tvrsim::Simulation* tvrsim_simulation();

} // extern "C"
