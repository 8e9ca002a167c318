#include "model/Profiles.h"

#include "agent/Build.h"
#include "schema/TVRHBA_ComputerSystemConformsToProfile.h"

namespace cimple
{

namespace
{

struct ProfileRow
{
    const char* name;
    std::uint16_t organization;
    const char* version;
};

/// In order of registration.
constexpr ProfileRow hostProfiles[] = {
    {"Profile Registration", DMTF, "1.0.0"},
    {"Software Inventory", DMTF, "1.0.0"},
    {"Physical Package", SNIA, "1.3.0"},
    {"Host Discovered Resources", SNIA, "1.2.0"},
    {"FC HBA", SNIA, "1.2.0"},
    {"Storage HBA", SNIA, "1.4.0"},
    {"FC Initiator Ports", SNIA, "1.3.0"},
    {"Software", SNIA, "1.2.0"},
    {"Access Points", SNIA, "1.3.0"},
    {"PCI Device", DMTF, "1.0.0"},
    {"FCHBA Diagnostics", DMTF, "1.0.0"},
    {"Physical Asset", DMTF, "1.0.2"},
};

} // namespace

TVRHBA_RegisteredProfile* createRegisteredProfile(HostContext& host, const char* name, std::uint16_t organization,
                                                  const char* version)
{
    TVR_LOG(TVR_DBG, "Generating TVRHBA_RegisteredProfile (%s)", name);
    if (TVRHBA_RegisteredProfile* existing = host.profiles.find(name))
    {
        TVR_LOG(TVR_DBG, "Got TVRHBA_RegisteredProfile in the map (%s)", name);
        return existing;
    }
    Ref<TVRHBA_RegisteredProfile> made = fresh<TVRHBA_RegisteredProfile>();
    made->__name_space = interopNamespace;
    made->Description.set(formatText("Tavrin %s", name));
    made->ElementName.set(formatText("Tavrin Registered %s", name));
    made->RegisteredOrganization.set(organization);
    made->RegisteredName.set(name);
    made->RegisteredVersion.set(version);
    made->InstanceID.set(formatText("TVR:%s", name));
    made->AdvertiseTypes.set({3});
    made->AdvertiseTypeDescriptions.set({"SLP"});
    TVRHBA_RegisteredProfile* profile =
        mapOf<TVRHBA_RegisteredProfile>(host.agent).insert(made, "Insert Failed : m_TVRHBA_RegisteredProfile_map");
    if (profile)
        host.profiles.add(name, profile);
    return profile;
}

void createComputerSystemConformsToProfile(HostContext& host, const TVRHBA_RegisteredProfile* profile)
{
    TVR_LOG(TVR_DBG, "inside createComputerSystemConformsToProfile");
    if (!host.agent.m_bOwnComputerSystem)
    {
        TVR_LOG(TVR_DBG, "This is IBM/VMWare comp Sys - do nothing");
        return;
    }
    if (!profile)
        return;
    TVR_LOG(TVR_DBG, "Generating TVRHBA_ComputerSystemConformsToProfile (Computer System,%s)",
            profile->InstanceID.value.c_str());
    using Conforms = TVRHBA_ComputerSystemConformsToProfile;
    join<Conforms>(host.agent, &Conforms::ConformantStandard, profile, &Conforms::ManagedElement, host.system,
                   "Insert Failed : m_TVRHBA_ComputerSystemConformsToProfile_map");
}

std::uint32_t createProfiles(HostContext& host)
{
    for (const ProfileRow& row : hostProfiles)
        createComputerSystemConformsToProfile(host,
                                              createRegisteredProfile(host, row.name, row.organization, row.version));
    return BUILD_DONE;
}

} // namespace cimple
