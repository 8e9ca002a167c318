// Priority lanes among the driver parameters, as the library lists them: units that an adapter serves before others.
//
// Which adapters have lanes is seen with the fabric (scanPriorityLanes in model/SanModel.h). From then on the paths of
// their ports are read with the driver parameters; so are those of the lanes that a client made before. The caller
// holds the data mutex.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>
#include <set>

namespace cimple
{

/// Step of the host, behind the virtual ports.
std::uint32_t createPriorityLanes(HostContext& host);

/// Those in the map.
std::set<Lane> priorityLanes(ProviderAgent& agent);
/// Puts lanes into the map that has none: those that the library lists now, and those in `former` of paths of which it
/// gives no list.
void restorePriorityLanes(ProviderAgent& agent, const std::set<Lane>& former);
/// Reads the one path. A lane that is none any more goes.
void refreshPriorityLane(ProviderAgent& agent, const Lane& lane);

} // namespace cimple
