// The host and its chassis: found by up-call, or generated.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Up-calls for the host's computer system and chassis; the answers stay in the agent.
void askPlatform(ProviderAgent& agent);

// --- steps; each returns a BuildStatus

/// Puts the platform's computer system, or a generated one, in its map.
std::uint32_t createComputerSystem(HostContext& host);

/// Holds the platform's chassis, if it has one.
std::uint32_t takePlatformChassis(HostContext& host);

/// Puts a generated chassis in its map where the platform has none.
std::uint32_t createChassis(HostContext& host);

} // namespace cimple
