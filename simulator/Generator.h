// Hosts of any size.
#pragma once

#include "simulator/Scenario.h"

namespace tvrsim
{

struct GeneratorSettings
{
    std::uint64_t seed = 1;
    std::uint32_t adapters = 1;
    std::uint32_t portsPerAdapter = 1;
    std::uint32_t targetsPerPort = 1;
    std::uint32_t unitsPerTarget = 1;
    std::vector<std::uint8_t> deviceTypes{}; ///< of the units, in turn; disks if empty
};

/// Adds adapters and the targets behind their ports. Equal settings give equal hosts on every machine; each port has
/// targets of its own.
void generate(const GeneratorSettings& settings, Scenario& scenario);

} // namespace tvrsim
