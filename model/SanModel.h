// The SAN: what stands behind the ports. Both are steps of the refresh of the SAN maps and return a BuildStatus.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// For each logical unit behind a port: a target endpoint, the device that the unit is, and the path from the port's
/// initiator endpoint to it. Notes the pairs of ports in the context.
std::uint32_t createLogicalUnits(HostContext& host);

/// Asks for the priority lanes between the noted pairs of ports, and marks the chips whose ports have them.
std::uint32_t scanPriorityLanes(HostContext& host);

} // namespace cimple
