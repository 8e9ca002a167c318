// Dumps: a client has a port make one, lists and deletes a port's, and changes how many are kept.
#pragma once

#include "agent/ProviderExtension.h"
#include "schema/TVRHBA_DumpData.h"
#include "schema/TVRHBA_DumpService.h"

namespace cimple
{

std::span<const MethodRow> dumpServiceMethods();

/// Gives a port's dumps the `RetentionCount` of `model`, which has what the client names of `instance`, and reads the
/// dump classes again. The directory stays: another than the present one is not supported. A Provider_Status.
int modifyDumpData(const TVRHBA_DumpData* instance, const TVRHBA_DumpData* model);

template <class Form> struct Extended<TVRHBA_DumpService, Form> : Form
{
    static std::span<const MethodRow> methods() { return dumpServiceMethods(); }
};

template <class Form> struct Extended<TVRHBA_DumpData, Form> : Form
{
    int modify_instance(const Instance* instance, const Instance* model)
    {
        return modifyDumpData(static_cast<const TVRHBA_DumpData*>(instance),
                              static_cast<const TVRHBA_DumpData*>(model));
    }
};

} // namespace cimple
