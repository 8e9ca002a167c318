// Registered profiles of the module, and what conforms to them.
#pragma once

#include "agent/RefreshContext.h"
#include "schema/TVRHBA_RegisteredProfile.h"

#include <cstdint>

namespace cimple
{

/// CIM_RegisteredProfile.RegisteredOrganization.
inline constexpr std::uint16_t DMTF = 2;
inline constexpr std::uint16_t SNIA = 11;

/// The profile in the map, new or existing; null when it was refused. `name` stays the caller's, for as long as the
/// refresh.
TVRHBA_RegisteredProfile* createRegisteredProfile(HostContext& host, const char* name, std::uint16_t organization,
                                                  const char* version);

/// Relates the generated computer system to a profile; one that belongs to the platform is left alone.
void createComputerSystemConformsToProfile(HostContext& host, const TVRHBA_RegisteredProfile* profile);

/// Step: registers the profiles of the host, each with its conformance of the computer system. A BuildStatus.
std::uint32_t createProfiles(HostContext& host);

} // namespace cimple
