// The record log that publishes the module's own log, as an instance.
#include "agent/RecordLogs.h"
#include "foundation/ClientText.h"
#include "model/Profiles.h"
#include "model/ProviderInstances.h"
#include "schema/TVRHBA_EnabledRecordLogCapabilities.h"
#include "schema/TVRHBA_ProviderUseOfLog.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_RecordLogCapabilities.h"
#include "schema/TVRHBA_RecordLogConformsToProfile.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

namespace cimple
{

namespace
{

Ref<TVRHBA_RecordLog> makeProviderLog(const HostContext& host)
{
    const TVR_Logger& logger = TVR_Logger::instance();
    const String id = providerLogId(host.system->Name.value);
    const bool enabled = logger.isEnabled();
    Ref<TVRHBA_RecordLog> log = fresh<TVRHBA_RecordLog>();
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
    log->TracePath.set(clientText(host.agent.m_fileLogger.getPath().view()));
    return log;
}

Ref<TVRHBA_EnabledRecordLogCapabilities> makeCapabilities()
{
    Ref<TVRHBA_EnabledRecordLogCapabilities> capabilities = fresh<TVRHBA_EnabledRecordLogCapabilities>();
    capabilities->InstanceID.set("TVRHBA provider log capabilities");
    capabilities->ElementName.set("TVRHBA provider log capabilities");
    capabilities->RequestedStatesSupported.set({2, 3});
    capabilities->LogParamsSupported.set({2, 3});
    capabilities->ElementNameEditSupported.set(false);
    return capabilities;
}

std::uint32_t associateProfile(HostContext& host, const TVRHBA_RecordLog* log)
{
    const TVRHBA_RegisteredProfile* profile = createRegisteredProfile(host, profileRow("Record Log"));
    createComputerSystemConformsToProfile(host, profile);
    if (!host.profiles.find("Profile Registration"))
        return failed("Missing Profile Registration Profile instance");
    using Conforms = TVRHBA_RecordLogConformsToProfile;
    join<Conforms>(host.agent, &Conforms::ConformantStandard, profile, &Conforms::ManagedElement, log,
                   "Insert Failed : m_TVRHBA_RecordLogConformsToProfile_map",
                   [&](Conforms&)
                   {
                       TVR_LOG(TVR_DBG, "%s conformant to %s profile", log->InstanceID.value.c_str(),
                               profile->RegisteredName.value.c_str());
                   });
    return BUILD_DONE;
}

std::uint32_t associateCapabilities(HostContext& host, const TVRHBA_RecordLog* log)
{
    const auto* capabilities =
        mapOf<TVRHBA_EnabledRecordLogCapabilities>(host.agent)
            .insert(makeCapabilities(), "Insert Failed : m_TVRHBA_TVRHBA_EnabledRecordLogCapabilities_map");
    if (!capabilities)
        return BUILD_FAILED;
    using Capabilities = TVRHBA_RecordLogCapabilities;
    join<Capabilities>(host.agent, &Capabilities::ManagedElement, log, &Capabilities::Capabilities, capabilities,
                       "Insert Failed : m_TVRHBA_RecordLogCapabilities_map",
                       [&](Capabilities&)
                       { TVR_LOG(TVR_DBG, "%s : Logging capabilities", log->InstanceID.value.c_str()); });
    return BUILD_DONE;
}

std::uint32_t associateProvider(HostContext& host, const TVRHBA_RecordLog* log)
{
    const TVRHBA_SoftwareIdentity* identity = host.providerIdentity;
    if (!identity)
        return failed({TVR_DBG, "Missing Provider Software Identity"});
    associateUseOfLog(mapOf<TVRHBA_ProviderUseOfLog>(host.agent), log, identity);
    return BUILD_DONE;
}

} // namespace

std::uint32_t createProviderRecordLog(HostContext& host)
{
    const Ref<TVRHBA_RecordLog> made = unlessOutOfMemory([&] { return makeProviderLog(host); });
    if (!made)
        return BUILD_DONE;
    const TVRHBA_RecordLog* log =
        mapOf<TVRHBA_RecordLog>(host.agent).insert(made, "Insert Failed : m_TVRHBA_TVRHBA_RecordLog_map");
    if (!log)
        return BUILD_FAILED;
    for (auto* associate : {associateProfile, associateCapabilities, associateProvider})
        if (const std::uint32_t status = associate(host, log); status != BUILD_DONE)
            return status;
    return BUILD_DONE;
}

} // namespace cimple
