// The module itself as instances: its software identity and its settings.
#pragma once

#include "agent/ProviderAgent.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

namespace cimple
{

/// The identity of this version of the module, with its relations to the host.
std::uint32_t createProviderSoftwareIdentity(ProviderAgent& agent);

/// The identity in the map; null before it is made.
TVRHBA_SoftwareIdentity* findProviderSoftwareIdentity(const ProviderAgent& agent);

/// The three settings of the cache, in the order that a client's change relies on.
std::uint32_t createProviderConfigSettings(ProviderAgent& agent);

} // namespace cimple
