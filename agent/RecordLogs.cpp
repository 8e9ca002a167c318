#include "agent/RecordLogs.h"

#include "schema/CIM_ComputerSystem.h"
#include "schema/TVRHBA_ProviderUseOfLog.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

namespace cimple
{

namespace
{

String systemName(InstanceCache& cache)
{
    const CIM_ComputerSystem* system = mapOf<CIM_ComputerSystem>(cache).first();
    return system ? system->Name.value : String();
}

} // namespace

String providerLogId(const String& systemName)
{
    return formatText("TVRHBA:ProviderLog:%s", systemName.c_str());
}

String driverLogId(const String& systemName)
{
    return formatText("TVR: FC Driver Record Log:%s", systemName.c_str());
}

String providerLogId(InstanceCache& cache)
{
    return providerLogId(systemName(cache));
}

String driverLogId(InstanceCache& cache)
{
    return driverLogId(systemName(cache));
}

TVRHBA_RecordLog* findRecordLog(InstanceCache& cache, const String& id)
{
    return mapOf<TVRHBA_RecordLog>(cache).findFirst([&](const TVRHBA_RecordLog& log)
                                                    { return log.InstanceID.value == id; });
}

Joined associateUseOfLog(const TypedMap<TVRHBA_ProviderUseOfLog>& map, const TVRHBA_RecordLog* log,
                         const TVRHBA_SoftwareIdentity* software)
{
    using Use = TVRHBA_ProviderUseOfLog;
    return join<Use>(
        map, &Use::Antecedent, log, &Use::Dependent, software, "Insert Failed : m_TVRHBA_ProviderUseOfLog_map",
        [&](Use&)
        { TVR_LOG(TVR_DBG, "%s uses log : %s", software->InstanceID.value.c_str(), log->InstanceID.value.c_str()); });
}

} // namespace cimple
