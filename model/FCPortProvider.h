// What a client changes of an FC port: its beacon.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_FCPort.h"

namespace cimple
{

/// Lights or darkens the port's beacon by LocationIndicator, the one property that can be changed. `model` is not null
/// where the client names a property. A Provider_Status.
int modifyFCPort(const TVRHBA_FCPort* instance, const TVRHBA_FCPort* model);

template <class Form> struct Extended<TVRHBA_FCPort, Form> : Form
{
    int modify_instance(const Instance* instance, const Instance* model)
    {
        return modifyFCPort(static_cast<const TVRHBA_FCPort*>(instance), static_cast<const TVRHBA_FCPort*>(model));
    }
};

} // namespace cimple
