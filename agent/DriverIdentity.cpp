#include "agent/DriverIdentity.h"

#include "agent/Build.h"
#include "schema/TVRHBA_SoftwareIdentity.h"

namespace cimple
{

String driverIdentityId(const FCAdapterAttributes& attributes)
{
    return formatText("TVR FC HBA: Driver %s v%s", attributes.driverName.c_str(), attributes.driverVersion.c_str());
}

TVRHBA_SoftwareIdentity* findDriverIdentity(ProviderAgent& agent, const FCAdapterAttributes& attributes)
{
    const String id = driverIdentityId(attributes);
    return mapOf<TVRHBA_SoftwareIdentity>(agent).findFirst([&](const TVRHBA_SoftwareIdentity& known)
                                                           { return known.InstanceID.value == id; });
}

} // namespace cimple
