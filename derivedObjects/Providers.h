// The 159 class providers. A provider is an empty object: its catalog row says how it enumerates. The headers of
// classes that do more (agent/ProviderExtension.h) are included here.
#pragma once

#include "agent/EnumerationForms.h"
#include "agent/ProviderExtension.h"
#include "model/LiveRefresh.h"
#include "schema/AllClasses.h"

namespace cimple
{

/// Joining and leaving the agent, for the provider of one class.
template <class Class> struct ProviderBase
{
    using Record = typename Class::Record;
    int load() { return loadProvider(); }
    int unload() { return unloadProvider(Class::providerName); }
};

template <class Class> struct PlainForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client)
    {
        return enumeratePlain(Class::map, Class::providerName, handler, client);
    }
};

template <class Class> struct SanForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client)
    {
        return enumerateSan(Class::map, Class::providerName, handler, client);
    }
};

template <class Class> struct ActiveForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client)
    {
        static Mutex classMutex(true);
        return enumerateActive(Class::map, Class::providerName, classMutex, &liveRefresh<typename Class::Record>,
                               handler, client);
    }
};

/// Classes that build their instances at each enumeration serve their map until their provider is written.
template <class Class> struct OwnForm : PlainForm<Class>
{};

/// What the forms know of a class, and its provider.
#define TVR_CLASS(name, form, group)                                                                                   \
    struct TVRHBA_##name##_Row                                                                                         \
    {                                                                                                                  \
        using Record = TVRHBA_##name;                                                                                  \
        static constexpr const char* providerName = "TVRHBA_" #name "_Provider";                                       \
        static constexpr Instance_Map InstanceCache::*map = &InstanceCache::m_TVRHBA_##name##_map;                     \
    };                                                                                                                 \
    class TVRHBA_##name##_Provider : public Extended<TVRHBA_##name, form##Form<TVRHBA_##name##_Row>>                   \
    {};
#define TVR_ASSOCIATION(name, form, group) TVR_CLASS(name, form, group)
#include "agent/ClassCatalog.def"

} // namespace cimple
