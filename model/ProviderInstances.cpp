#include "model/ProviderInstances.h"

#include "agent/Build.h"
#include "schema/TVRHBA_InstalledSoftwareIdentity.h"
#include "schema/TVRHBA_ProviderConfigSetting.h"
#include "schema/TVRHBA_ProviderSoftwareIdentity.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SoftwareConformsToProfile.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

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
    Ref<TVRHBA_SoftwareIdentity> identity = fresh<TVRHBA_SoftwareIdentity>();
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
    identity->IdentityInfoType.set({"TAVRIN:SOFTWARE_NAME"});
    identity->IdentityInfoValue.set({"Tavrin CMPI HBA Provider"});
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
    Ref<TVRHBA_ProviderConfigSetting> setting = fresh<TVRHBA_ProviderConfigSetting>();
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

std::uint32_t createProviderSoftwareIdentity(HostContext& host)
{
    ProviderAgent& agent = host.agent;
    TVRHBA_SoftwareIdentity* identity = mapOf<TVRHBA_SoftwareIdentity>(agent).insert(
        makeProviderIdentity(), "Insert Failed : m_TVRHBA_SoftwareIdentity_map");
    if (!identity)
        return BUILD_FAILED;
    host.providerIdentity = identity;

    using OfHost = TVRHBA_ProviderSoftwareIdentity;
    join<OfHost>(agent, &OfHost::Antecedent, identity, &OfHost::Dependent, host.system,
                 "Insert Failed : m_TVRHBA_ProviderSoftwareIdentity_map");
    using Installed = TVRHBA_InstalledSoftwareIdentity;
    join<Installed>(agent, &Installed::System, host.system, &Installed::InstalledSoftware, identity,
                    "Insert Failed : m_TVRHBA_InstalledSoftwareIdentity_map");
    TVR_LOG(TVR_DBG, "Generating TVRHBA_SoftwareConformsToProfile (CMPI HBA Provider, Software)");
    using Conforms = TVRHBA_SoftwareConformsToProfile;
    join<Conforms>(agent, &Conforms::ConformantStandard, host.profiles.find("Software"), &Conforms::ManagedElement,
                   identity, "Insert Failed : m_TVRHBA_SoftwareConformsToProfile_map");
    return BUILD_DONE;
}

std::uint32_t createProviderConfigSettings(HostContext& host)
{
    ProviderAgent& agent = host.agent;
    const std::uint32_t current[] = {static_cast<std::uint32_t>(agent.m_config.getCacheTimeout()),
                                     agent.m_config.getRefreshAdapterData(), agent.m_config.getRefreshSANData()};
    for (std::size_t i = 0; i < std::size(settings); i++)
        if (!mapOf<TVRHBA_ProviderConfigSetting>(agent).insert(makeSetting(settings[i], current[i]),
                                                               "Insert Failed : m_TVRHBA_ProviderConfigSetting_map"))
            return BUILD_FAILED;
    return BUILD_DONE;
}

} // namespace cimple
