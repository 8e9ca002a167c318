// Registered profiles of the module, and what conforms to them.
#pragma once

#include "agent/RefreshContext.h"
#include "schema/TVRHBA_RegisteredProfile.h"

#include <cstdint>
#include <string_view>

namespace cimple
{

/// CIM_RegisteredProfile.RegisteredOrganization.
inline constexpr std::uint16_t DMTF = 2;
inline constexpr std::uint16_t SNIA = 11;

struct ProfileRow
{
    const char* name;
    std::uint16_t organization;
    const char* version;
    bool ofHost; ///< registered with the host, and not with a service of its own
};

/// Every profile that the module implements, in the order in which they are enumerated.
inline constexpr ProfileRow profileRows[] = {
    {"Profile Registration", DMTF, "1.0.0", true},
    {"Software Inventory", DMTF, "1.0.0", true},
    {"Physical Package", SNIA, "1.3.0", true},
    {"Host Discovered Resources", SNIA, "1.2.0", true},
    {"FC HBA", SNIA, "1.2.0", true},
    {"Storage HBA", SNIA, "1.4.0", true},
    {"FC Initiator Ports", SNIA, "1.3.0", true},
    {"Software Update", DMTF, "1.0.0", false},
    {"Record Log", DMTF, "1.0.1", false},
    {"Software", SNIA, "1.2.0", true},
    {"Access Points", SNIA, "1.3.0", true},
    {"PCI Device", DMTF, "1.0.0", true},
    {"FCHBA Diagnostics", DMTF, "1.0.0", true},
    {"Physical Asset", DMTF, "1.0.2", true},
};

/// The row of a profile; a name that is not in the table does not compile.
consteval const ProfileRow& profileRow(std::string_view name)
{
    for (const ProfileRow& row : profileRows)
        if (name.compare(row.name) == 0)
            return row;
    throw "no such profile";
}

Ref<TVRHBA_RegisteredProfile> makeRegisteredProfile(const ProfileRow& row);

/// The profile in the map, new or existing; null when it was refused.
TVRHBA_RegisteredProfile* createRegisteredProfile(HostContext& host, const ProfileRow& row);

/// Relates the generated computer system to a profile; one that belongs to the platform is left alone.
void createComputerSystemConformsToProfile(HostContext& host, const TVRHBA_RegisteredProfile* profile);

/// Step: registers the profiles of the host, each with its conformance of the computer system. A BuildStatus.
std::uint32_t createProfiles(HostContext& host);

} // namespace cimple
