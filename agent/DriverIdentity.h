// The software identity of a driver, which is one for each name and version.
#pragma once

#include "agent/ProviderAgent.h"
#include "device/FCAdapter.h"

namespace cimple
{

class TVRHBA_SoftwareIdentity;

String driverIdentityId(const FCAdapterAttributes& attributes);

/// That of an adapter's driver; null where there is none, as when the adapter does not tell its driver.
TVRHBA_SoftwareIdentity* findDriverIdentity(ProviderAgent& agent, const FCAdapterAttributes& attributes);

} // namespace cimple
