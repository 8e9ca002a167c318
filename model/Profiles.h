// Registered profiles of the module, and what conforms to them.
#pragma once

#include "agent/ProviderAgent.h"
#include "schema/TVRHBA_RegisteredProfile.h"

namespace cimple
{

/// CIM_RegisteredProfile.RegisteredOrganization.
inline constexpr std::uint16_t DMTF = 2;
inline constexpr std::uint16_t SNIA = 11;

/// The profile in the map, new or existing; null when it was refused.
TVRHBA_RegisteredProfile* createRegisteredProfile(ProviderAgent& agent, const char* name, std::uint16_t organization,
                                                  const char* version);

/// Registers the profiles of the host, each with its conformance of the computer system.
void createProfiles(ProviderAgent& agent);

/// Relates the generated computer system to a profile; one that belongs to the platform is left alone.
void createComputerSystemConformsToProfile(ProviderAgent& agent, const TVRHBA_RegisteredProfile* profile);

/// A registered profile by its name; null if it is not in the map.
TVRHBA_RegisteredProfile* findProfile(const ProviderAgent& agent, const char* name);

} // namespace cimple
