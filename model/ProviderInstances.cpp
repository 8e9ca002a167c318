#include "model/ProviderInstances.h"

#include "agent/ModelStages.h"
#include "model/Build.h"
#include "model/ComputerSystem.h"
#include "model/Profiles.h"
#include "schema/TVRHBA_InstalledSoftwareIdentity.h"
#include "schema/TVRHBA_ProviderConfigSetting.h"
#include "schema/TVRHBA_ProviderSoftwareIdentity.h"
#include "schema/TVRHBA_SoftwareConformsToProfile.h"

namespace cimple
{

namespace
{

constexpr std::uint16_t instrumentation = 5; // CIM_SoftwareIdentity.Classifications

String providerIdentityId()
{
    return formatText("Tavrin CMPI HBA Provider v%d.%d.%d-%d", providerVersion[0], providerVersion[1],
                      providerVersion[2], providerVersion[3]);
}

Ref<TVRHBA_SoftwareIdentity> makeProviderIdentity()
{
    Ref<TVRHBA_SoftwareIdentity> identity(create<TVRHBA_SoftwareIdentity>(true));
    identity->InstanceID.set(providerIdentityId());
    identity->Name.set("Tavrin CMPI HBA Provider");
    identity->ElementName.set("Tavrin CMPI HBA Provider");
    identity->Description.set("CIM provider for Fibre Channel host bus adapters");
    identity->Manufacturer.set("Tavrin");
    identity->MajorVersion.set(static_cast<std::uint16_t>(providerVersion[0]));
    identity->MinorVersion.set(static_cast<std::uint16_t>(providerVersion[1]));
    identity->RevisionNumber.set(static_cast<std::uint16_t>(providerVersion[2]));
    identity->BuildNumber.set(static_cast<std::uint16_t>(providerVersion[3]));
    identity->VersionString.set(
        formatText("%d.%d.%d-%d", providerVersion[0], providerVersion[1], providerVersion[2], providerVersion[3]));
    identity->Classifications.set({instrumentation});
    identity->IsEntity.set(true);
    return identity;
}

struct SettingRow
{
    const char* id;
    const char* name;
    std::uint32_t lowRange;
    std::uint32_t highRange;
    std::uint32_t def;
    const char* description;
};

// Clients are told a timeout of at least 5 minutes; lower values down to 1 are accepted all the same.
constexpr SettingRow settings[] = {
    {"Tavrin HBA Provider:cachetimeout", "cachetimeout", 5, 30, 10,
     "This setting defines the timeout value of Tavrin CIM Provider's internal cache"},
    {"Tavrin HBA Provider:adapterrefresh", "adapterrefresh", 0, 1, 0,
     "This setting represents the Adapter data refresh setting value of Tavrin CIM Provider's internal cache"},
    {"Tavrin HBA Provider:sanrefresh", "sanrefresh", 0, 1, 1,
     "This setting represents the SAN data refresh setting value of Tavrin CIM Provider's internal cache"},
};

Ref<TVRHBA_ProviderConfigSetting> makeSetting(const SettingRow& row, std::uint32_t current)
{
    Ref<TVRHBA_ProviderConfigSetting> setting(create<TVRHBA_ProviderConfigSetting>(true));
    setting->InstanceID.set(row.id);
    setting->Description.set(row.description);
    setting->paramname.set(row.name);
    setting->lowRange.set(row.lowRange);
    setting->highRange.set(row.highRange);
    setting->def.set(row.def);
    setting->current.set(current);
    return setting;
}

} // namespace

TVRHBA_SoftwareIdentity* findProviderSoftwareIdentity(const ProviderAgent& agent)
{
    const String id = providerIdentityId();
    return findFirst<TVRHBA_SoftwareIdentity>(agent.m_TVRHBA_SoftwareIdentity_map,
                                              [&](const auto& identity) { return identity.InstanceID.value == id; });
}

std::uint32_t createProviderSoftwareIdentity(ProviderAgent& agent)
{
    const TVRHBA_SoftwareIdentity* identity = insert(agent.m_TVRHBA_SoftwareIdentity_map, makeProviderIdentity(),
                                                     "Insert Failed : m_TVRHBA_SoftwareIdentity_map");
    if (!identity)
        return BUILD_FAILED;
    const CIM_ComputerSystem* system = computerSystem(agent);

    using OfHost = TVRHBA_ProviderSoftwareIdentity;
    if (auto ofHost = associate<OfHost>(&OfHost::Antecedent, identity, &OfHost::Dependent, system))
        insert(agent.m_TVRHBA_ProviderSoftwareIdentity_map, ofHost,
               "Insert Failed : m_TVRHBA_ProviderSoftwareIdentity_map");
    using Installed = TVRHBA_InstalledSoftwareIdentity;
    if (auto installed = associate<Installed>(&Installed::System, system, &Installed::InstalledSoftware, identity))
        insert(agent.m_TVRHBA_InstalledSoftwareIdentity_map, installed,
               "Insert Failed : m_TVRHBA_InstalledSoftwareIdentity_map");
    TVR_LOG(TVR_DBG, "Generating TVRHBA_SoftwareConformsToProfile (CMPI HBA Provider, Software)");
    using Conforms = TVRHBA_SoftwareConformsToProfile;
    if (auto conforms = associate<Conforms>(&Conforms::ConformantStandard, findProfile(agent, "Software"),
                                            &Conforms::ManagedElement, identity))
        insert(agent.m_TVRHBA_SoftwareConformsToProfile_map, conforms,
               "Insert Failed : m_TVRHBA_SoftwareConformsToProfile_map");
    return BUILD_DONE;
}

std::uint32_t createProviderConfigSettings(ProviderAgent& agent)
{
    const std::uint32_t current[] = {static_cast<std::uint32_t>(agent.m_config.getCacheTimeout()),
                                     agent.m_config.getRefreshAdapterData(), agent.m_config.getRefreshSANData()};
    for (std::size_t i = 0; i < std::size(settings); i++)
        if (!insert(agent.m_TVRHBA_ProviderConfigSetting_map, makeSetting(settings[i], current[i]),
                    "Insert Failed : m_TVRHBA_ProviderConfigSetting_map"))
            return BUILD_FAILED;
    return BUILD_DONE;
}

} // namespace cimple
