// Virtual ports: what shares a physical port, the virtual machines that they are given to, and what they reach.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Step of the host, behind the ports: the virtual ports of each, with their endpoints, units and paths, and the pool
/// that they come from. What a call does not tell is left out; the status says whether anything was.
std::uint32_t createPortVirtualization(HostContext& host);

/// Ties the virtual ports to the driver parameters that the maps now hold of their physical ports. The caller holds the
/// data mutex.
void rebuildVirtualPortParameters(ProviderAgent& agent);

} // namespace cimple
