#include "model/Profiles.h"

#include "agent/Build.h"
#include "schema/TVRHBA_ComputerSystemConformsToProfile.h"

namespace cimple
{

Ref<TVRHBA_RegisteredProfile> makeRegisteredProfile(const ProfileRow& row)
{
    Ref<TVRHBA_RegisteredProfile> made = fresh<TVRHBA_RegisteredProfile>();
    made->__name_space = interopNamespace;
    made->Description.set(formatText("Tavrin %s", row.name));
    made->ElementName.set(formatText("Tavrin Registered %s", row.name));
    made->RegisteredOrganization.set(row.organization);
    made->RegisteredName.set(row.name);
    made->RegisteredVersion.set(row.version);
    made->InstanceID.set(formatText("TVR:%s", row.name));
    made->AdvertiseTypes.set({3});
    made->AdvertiseTypeDescriptions.set({"SLP"});
    return made;
}

TVRHBA_RegisteredProfile* createRegisteredProfile(HostContext& host, const ProfileRow& row)
{
    TVR_LOG(TVR_DBG, "Generating TVRHBA_RegisteredProfile (%s)", row.name);
    if (TVRHBA_RegisteredProfile* existing = host.profiles.find(row.name))
    {
        TVR_LOG(TVR_DBG, "Got TVRHBA_RegisteredProfile in the map (%s)", row.name);
        return existing;
    }
    TVRHBA_RegisteredProfile* profile =
        mapOf<TVRHBA_RegisteredProfile>(host.agent)
            .insert(makeRegisteredProfile(row), "Insert Failed : m_TVRHBA_RegisteredProfile_map");
    if (profile)
        host.profiles.add(row.name, profile);
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
    for (const ProfileRow& row : profileRows)
        if (row.ofHost)
            createComputerSystemConformsToProfile(host, createRegisteredProfile(host, row));
    return BUILD_DONE;
}

} // namespace cimple
