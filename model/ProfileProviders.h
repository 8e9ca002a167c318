// The profiles and their references, enumerated from the table of profiles: they need no refresh.
#pragma once

#include "agent/ProviderExtension.h"
#include "runtime/adapter/Provider.h"
#include "schema/TVRHBA_BaseServerReferencedProfile.h"
#include "schema/TVRHBA_ReferencedProfile.h"
#include "schema/TVRHBA_RegisteredProfile.h"

namespace cimple
{

/// Each profile of the table.
int enumerateRegisteredProfiles(Instance_Handler handler, void* client);
/// Each profile that refers to "Profile Registration".
int enumerateReferencedProfiles(Instance_Handler handler, void* client);
/// Each profile that the platform's base server profile refers to; none where the broker knows no such profile. Makes
/// an up-call.
int enumerateBaseServerReferencedProfiles(Instance_Handler handler, void* client);

template <class Form> struct Extended<TVRHBA_RegisteredProfile, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection&)
    {
        return enumerateRegisteredProfiles(handler, client);
    }
};

template <class Form> struct Extended<TVRHBA_ReferencedProfile, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection&)
    {
        return enumerateReferencedProfiles(handler, client);
    }
};

template <class Form> struct Extended<TVRHBA_BaseServerReferencedProfile, Form> : Form
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection&)
    {
        return enumerateBaseServerReferencedProfiles(handler, client);
    }
};

} // namespace cimple
