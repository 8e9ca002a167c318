// The 159 class providers. A provider is an empty object: its catalog row says how it enumerates. The headers of
// classes that do more (agent/ProviderExtension.h) are included here.
#pragma once

#include "agent/EnumerationForms.h"
#include "agent/ProviderExtension.h"
#include "diagnostics/ConcreteJobs.h"
#include "diagnostics/DiagnosticRun.h"
#include "diagnostics/DiagnosticsLog.h"
#include "diagnostics/HelpService.h"
#include "logs/DriverLog.h"
#include "logs/LogEntries.h"
#include "logs/RecordLog.h"
#include "model/FCPortProvider.h"
#include "model/LiveRefresh.h"
#include "model/ProfileProviders.h"
#include "runtime/base/Immortal.h"
#include "schema/AllClasses.h"
#include "services/BootBiosService.h"
#include "services/DriverParameterService.h"
#include "services/DumpService.h"
#include "services/LaneInstances.h"
#include "services/ProviderSettings.h"
#include "services/SoftwareInstallation.h"
#include "services/TagService.h"
#include "services/WwnService.h"

#include <type_traits>

namespace cimple
{

/// Joining and leaving the agent, for the provider of one class.
template <class Class> struct ProviderBase
{
    using Record = Class;
    int load() { return loadProvider(); }
    int unload() { return unloadProvider(CatalogRow<Class>::providerName); }
};

template <class Class> struct PlainForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection& selection)
    {
        return enumeratePlain(MapPlace<Class>::map, secondMap<Class>(), CatalogRow<Class>::providerName, handler,
                              client, selection);
    }
};

template <class Class> struct SanForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection& selection)
    {
        return enumerateSan(MapPlace<Class>::map, CatalogRow<Class>::providerName, handler, client, selection);
    }
};

template <class Class> struct ActiveForm : ProviderBase<Class>
{
    int enum_instances(const Instance*, Instance_Handler handler, void* client, const Selection& selection)
    {
        static Immortal<Mutex> classMutex(true);
        return enumerateActive(MapPlace<Class>::map, CatalogRow<Class>::providerName, *classMutex, &liveRefresh<Class>,
                               handler, client, selection);
    }
};

/// A class of this form has its enumeration in its Extended.
template <class Class> struct OwnForm : ProviderBase<Class>
{};

/// The code of a provider does what its row says, no more and no less: a misspelt function, or the header of an
/// Extended that is not included, does not build.
template <class Provider, class Form> constexpr bool keepsItsRow()
{
    using Row = CatalogRow<typename Provider::Record>;
    if constexpr (Row::enumeration != EnumerationForm::Own)
        static_assert(std::is_same_v<decltype(&Provider::enum_instances), decltype(&Form::enum_instances)>,
                      "an enumeration of its own, which the row does not say");
    static_assert(duties<Provider> == Row::duties, "the provider does not do what its row says");
    return true;
}

#define TVR_CLASS(name, form, group, does)                                                                             \
    class TVRHBA_##name##_Provider : public Extended<TVRHBA_##name, form##Form<TVRHBA_##name>>                         \
    {};                                                                                                                \
    static_assert(keepsItsRow<TVRHBA_##name##_Provider, form##Form<TVRHBA_##name>>());
#include "agent/ClassCatalog.def"

} // namespace cimple
