#include "model/Profiles.h"

#include "agent/ProviderProc.h"
#include "model/Build.h"
#include "model/ComputerSystem.h"
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

TVRHBA_RegisteredProfile* findProfile(const ProviderAgent& agent, const char* name)
{
    const String id = formatText("TVR:%s", name);
    return findFirst<TVRHBA_RegisteredProfile>(agent.m_TVRHBA_RegisteredProfile_map,
                                               [&](const auto& profile) { return profile.InstanceID.value == id; });
}

TVRHBA_RegisteredProfile* createRegisteredProfile(ProviderAgent& agent, const char* name, std::uint16_t organization,
                                                  const char* version)
{
    TVR_LOG(TVR_DBG, "Generating TVRHBA_RegisteredProfile (%s)", name);
    if (TVRHBA_RegisteredProfile* existing = findProfile(agent, name))
    {
        TVR_LOG(TVR_DBG, "Got TVRHBA_RegisteredProfile in the map (%s)", name);
        return existing;
    }
    Ref<TVRHBA_RegisteredProfile> profile(create<TVRHBA_RegisteredProfile>(true));
    profile->__name_space = interopNamespace;
    profile->Description.set(formatText("Tavrin %s", name));
    profile->ElementName.set(formatText("Tavrin Registered %s", name));
    profile->RegisteredOrganization.set(organization);
    profile->RegisteredName.set(name);
    profile->RegisteredVersion.set(version);
    profile->InstanceID.set(formatText("TVR:%s", name));
    profile->AdvertiseTypes.set({3});
    profile->AdvertiseTypeDescriptions.set({"SLP"});
    return insert(agent.m_TVRHBA_RegisteredProfile_map, profile, "Insert Failed : m_TVRHBA_RegisteredProfile_map");
}

void createComputerSystemConformsToProfile(ProviderAgent& agent, const TVRHBA_RegisteredProfile* profile)
{
    TVR_LOG(TVR_DBG, "inside createComputerSystemConformsToProfile");
    if (!agent.m_bOwnComputerSystem)
    {
        TVR_LOG(TVR_DBG, "This is IBM/VMWare comp Sys - do nothing");
        return;
    }
    if (!profile)
        return;
    TVR_LOG(TVR_DBG, "Generating TVRHBA_ComputerSystemConformsToProfile (Computer System,%s)",
            profile->InstanceID.value.c_str());
    using Conforms = TVRHBA_ComputerSystemConformsToProfile;
    if (auto conforms = associate<Conforms>(&Conforms::ConformantStandard, profile, &Conforms::ManagedElement,
                                            computerSystem(agent)))
        insert(agent.m_TVRHBA_ComputerSystemConformsToProfile_map, conforms,
               "Insert Failed : m_TVRHBA_ComputerSystemConformsToProfile_map");
}

void createProfiles(ProviderAgent& agent)
{
    for (const ProfileRow& row : hostProfiles)
        createComputerSystemConformsToProfile(agent,
                                              createRegisteredProfile(agent, row.name, row.organization, row.version));
}

} // namespace cimple
