// What the record logs have in common: that of the module itself and that of the driver.
#pragma once

#include "agent/Build.h"

namespace cimple
{

class TVRHBA_ProviderUseOfLog;
class TVRHBA_RecordLog;
class TVRHBA_SoftwareIdentity;

/// InstanceIDs of the logs of a computer system.
String providerLogId(const String& systemName);
String driverLogId(const String& systemName);
/// The same of the system in the cache; without one, of a system without a name.
String providerLogId(InstanceCache& cache);
String driverLogId(InstanceCache& cache);

/// Null if it is not in the cache.
TVRHBA_RecordLog* findRecordLog(InstanceCache& cache, const String& id);

/// Says that a software writes to a log, in one of the two maps for this.
Joined associateUseOfLog(const TypedMap<TVRHBA_ProviderUseOfLog>& map, const TVRHBA_RecordLog* log,
                         const TVRHBA_SoftwareIdentity* software);

} // namespace cimple
