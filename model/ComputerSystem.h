// The host and its chassis: found by up-call, or generated.
#pragma once

#include "agent/ProviderAgent.h"
#include "schema/CIM_Chassis.h"
#include "schema/CIM_ComputerSystem.h"

namespace cimple
{

/// Finds the host's computer system by up-call, or generates one, and puts it in its map. True when it is there.
bool createComputerSystem(ProviderAgent& agent);

/// The computer system of this refresh; null before createComputerSystem().
CIM_ComputerSystem* computerSystem(const ProviderAgent& agent);

/// The host's chassis by up-call, or null.
Ref<CIM_Chassis> findChassis();

/// A chassis for a host that has none.
Ref<CIM_Chassis> generateChassis();

} // namespace cimple
