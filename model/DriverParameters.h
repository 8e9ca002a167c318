// The parameters of the Fibre Channel driver as settings: those of each port, and those for all adapters.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Step of the host; what the library does not list, no port has.
std::uint32_t createDriverParameters(HostContext& host);

/// Put what the library lists now in the place of what the maps hold, with the associations. What it does not list,
/// for a port or for all adapters, stays as it is. The caller holds the data mutex.
void rebuildDriverParameters(ProviderAgent& agent);
void rebuildGlobalDriverParameters(ProviderAgent& agent);

} // namespace cimple
