// The record log that publishes the module's own log, as an instance.
#include "agent/ModelStages.h"
#include "model/Build.h"
#include "model/ComputerSystem.h"
#include "model/Profiles.h"
#include "model/ProviderInstances.h"
#include "model/Slices.h"
#include "schema/TVRHBA_EnabledRecordLogCapabilities.h"
#include "schema/TVRHBA_ProviderUseOfLog.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_RecordLogCapabilities.h"
#include "schema/TVRHBA_RecordLogConformsToProfile.h"

namespace cimple
{

namespace
{

Ref<TVRHBA_RecordLog> makeProviderLog(ProviderAgent& agent)
{
    const TVR_Logger& logger = TVR_Logger::instance();
    const String id = formatText("TVRHBA:ProviderLog:%s", computerSystem(agent)->Name.value.c_str());
    const bool enabled = logger.isEnabled();
    Ref<TVRHBA_RecordLog> log(create<TVRHBA_RecordLog>(true));
    log->InstanceID.set(id);
    log->ElementName.set(id);
    log->Name.set("Record logs for Tavrin CIM Provider");
    log->MaxNumberOfRecords.set(1024);
    log->CurrentNumberOfRecords.set(0);
    log->LogState.set(4);
    log->OverwritePolicy.set(2);
    log->OperationalStatus.set({2});
    log->HealthState.set(5);
    log->RequestedState.set(enabled ? 2 : 5);
    log->EnabledState.set(enabled ? 2 : 3);
    log->LogLevel.set(static_cast<std::uint16_t>(logger.getLevel()));
    log->LogMode.set(static_cast<std::uint16_t>(logger.getMode()));
    log->TracePath.set(agent.m_fileLogger.getPath());
    return log;
}

Ref<TVRHBA_EnabledRecordLogCapabilities> makeCapabilities()
{
    Ref<TVRHBA_EnabledRecordLogCapabilities> capabilities(create<TVRHBA_EnabledRecordLogCapabilities>(true));
    capabilities->InstanceID.set("TVRHBA provider log capabilities");
    capabilities->ElementName.set("TVRHBA provider log capabilities");
    capabilities->RequestedStatesSupported.set({2, 3});
    capabilities->LogParamsSupported.set({2, 3});
    capabilities->ElementNameEditSupported.set(false);
    return capabilities;
}

std::uint32_t associateProfile(ProviderAgent& agent, const TVRHBA_RecordLog* log)
{
    const TVRHBA_RegisteredProfile* profile = createRegisteredProfile(agent, "Record Log", DMTF, "1.0.1");
    createComputerSystemConformsToProfile(agent, profile);
    if (!findProfile(agent, "Profile Registration"))
        return TVR_LOG(TVR_CRIT, "Missing Profile Registration Profile instance"), BUILD_FAILED;
    using Conforms = TVRHBA_RecordLogConformsToProfile;
    if (auto conforms = associate<Conforms>(&Conforms::ConformantStandard, profile, &Conforms::ManagedElement, log))
    {
        TVR_LOG(TVR_DBG, "%s conformant to %s profile", log->InstanceID.value.c_str(),
                profile->RegisteredName.value.c_str());
        insert(agent.m_TVRHBA_RecordLogConformsToProfile_map, conforms,
               "Insert Failed : m_TVRHBA_RecordLogConformsToProfile_map");
    }
    return BUILD_DONE;
}

std::uint32_t associateCapabilities(ProviderAgent& agent, const TVRHBA_RecordLog* log)
{
    const auto* capabilities = insert(agent.m_TVRHBA_EnabledRecordLogCapabilities_map, makeCapabilities(),
                                      "Insert Failed : m_TVRHBA_TVRHBA_EnabledRecordLogCapabilities_map");
    if (!capabilities)
        return BUILD_FAILED;
    using Capabilities = TVRHBA_RecordLogCapabilities;
    if (auto association =
            associate<Capabilities>(&Capabilities::ManagedElement, log, &Capabilities::Capabilities, capabilities))
    {
        TVR_LOG(TVR_DBG, "%s : Logging capabilities", log->InstanceID.value.c_str());
        insert(agent.m_TVRHBA_RecordLogCapabilities_map, association,
               "Insert Failed : m_TVRHBA_RecordLogCapabilities_map");
    }
    return BUILD_DONE;
}

std::uint32_t associateProvider(ProviderAgent& agent, const TVRHBA_RecordLog* log)
{
    const TVRHBA_SoftwareIdentity* identity = findProviderSoftwareIdentity(agent);
    if (!identity)
        return TVR_LOG(TVR_DBG, "Missing Provider Software Identity"), BUILD_FAILED;
    using Use = TVRHBA_ProviderUseOfLog;
    if (auto use = associate<Use>(&Use::Antecedent, log, &Use::Dependent, identity))
    {
        TVR_LOG(TVR_DBG, "%s uses log : %s", identity->InstanceID.value.c_str(), log->InstanceID.value.c_str());
        insert(agent.m_TVRHBA_ProviderUseOfLog_map, use, "Insert Failed : m_TVRHBA_ProviderUseOfLog_map");
    }
    return BUILD_DONE;
}

} // namespace

std::uint32_t createProviderRecordLog(ProviderAgent& agent)
{
    Ref<TVRHBA_RecordLog> made = makeProviderLog(agent);
    if (!made)
        return BUILD_DONE;
    const TVRHBA_RecordLog* log =
        insert(agent.m_TVRHBA_RecordLog_map, made, "Insert Failed : m_TVRHBA_TVRHBA_RecordLog_map");
    if (!log)
        return BUILD_FAILED;
    if (const std::uint32_t status = associateProfile(agent, log); status != BUILD_DONE)
        return status;
    if (const std::uint32_t status = associateCapabilities(agent, log); status != BUILD_DONE)
        return status;
    return associateProvider(agent, log);
}

} // namespace cimple
