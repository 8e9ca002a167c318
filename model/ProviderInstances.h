// The module itself as instances: its software identity, its settings and its record log. All are steps of the refresh
// and return a BuildStatus.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// The identity of this version of the module, with its relations to the host.
std::uint32_t createProviderSoftwareIdentity(HostContext& host);

/// The three settings of the cache, in the order that a client's change relies on.
std::uint32_t createProviderConfigSettings(HostContext& host);

/// The log that publishes the module's own log, with its profile, capabilities and user.
std::uint32_t createProviderRecordLog(HostContext& host);

} // namespace cimple
