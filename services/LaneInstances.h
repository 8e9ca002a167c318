// Priority lanes that a client makes and takes away, as instances among the driver parameters.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_DriverParams.h"

namespace cimple
{

/// Each answers a Provider_Status. Where the library refuses, the cache stays as it is.
int createLane(const TVRHBA_DriverParams* instance);
int deleteLane(const TVRHBA_DriverParams* instance);

template <class Form> struct Extended<TVRHBA_DriverParams, Form> : Form
{
    int create_instance(Instance* instance) { return createLane(static_cast<const TVRHBA_DriverParams*>(instance)); }
    int delete_instance(const Instance* instance)
    {
        return deleteLane(static_cast<const TVRHBA_DriverParams*>(instance));
    }
};

} // namespace cimple
