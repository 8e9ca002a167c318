// The parameters of the Fibre Channel driver as settings: those of each port, and those for all adapters. Their classes
// read them live.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Step of the host. A parameter that is refused is left out, and what the library does not list is not there.
std::uint32_t createDriverParameters(HostContext& host);

} // namespace cimple
