// What the shared object exports: two factory symbols a class for instances and methods, two more for associations,
// and the head of the registration list. All of it derives from the class catalog.
#include "agent/ProviderProc.h"
#include "derivedObjects/Providers.h"
#include "runtime/adapter/CMPI_Adapter.h"
#include "runtime/cmpi/Cmpi.h"

#include <iterator>

#define TVR_EXPORT extern "C" __attribute__((visibility("default")))

namespace cimple
{

namespace
{

constexpr const char* moduleName = "tavrin_fc_provider_Module";

/// Place of each class in the registration list.
enum Place : std::size_t
{
#define TVR_CLASS(name, form, group, does) PLACE_##name,
#include "agent/ClassCatalog.def"
    NUM_CLASSES
};

extern const Registration registrations[NUM_CLASSES];

constexpr const Registration* linkedBefore(Place place)
{
    return place == 0 ? nullptr : &registrations[place - 1];
}

const Registration registrations[NUM_CLASSES] = {
#define TVR_CLASS(name, form, group, does)                                                                             \
    {moduleName, CatalogRow<TVRHBA_##name>::providerName, &providerProc<TVRHBA_##name##_Provider>,                     \
     &TVRHBA_##name::static_meta_class, linkedBefore(PLACE_##name)},
#include "agent/ClassCatalog.def"
};

/// Records, and the ports that jobs and records name, stay in their associations when they are cleared or gone.
constexpr Lasting_End lastingEnds[] = {
    {nullptr, "CIM_RecordForLog"},
    {"CIM_AffectedJobElement", "CIM_PortController"},
    {"CIM_RecordAppliesToElement", "CIM_PortController"},
};

constinit const Module_Info moduleInfo = {&registrations[NUM_CLASSES - 1], lastingEnds};

/// The object that the broker sees for each class.
Static_Adapter_Data adapters[NUM_CLASSES];

/// Makes or joins the class's adapter; null if there is no such kind.
template <class MI> MI* makeMI(Place place, char type, const CMPIBroker* broker, const CMPIContext* context)
{
    void* mi = nullptr;
    cimple_cmpi_adapter(&adapters[place], &registrations[place], broker, context, registrations[place].provider_name,
                        type, &mi, &moduleInfo);
    return static_cast<MI*>(mi);
}

} // namespace

} // namespace cimple

using namespace cimple;

TVR_EXPORT const Registration* cimple_module()
{
    return &registrations[NUM_CLASSES - 1];
}

/// The named form of a factory, and the form that brokers look up, whose status argument stays untouched.
#define TVR_FACTORY(name, kind, type)                                                                                  \
    TVR_EXPORT CMPI##kind##MI* TVRHBA_##name##_Provider_Create_##kind##MI(const CMPIBroker* broker,                    \
                                                                          const CMPIContext* context)                  \
    {                                                                                                                  \
        return makeMI<CMPI##kind##MI>(PLACE_##name, type, broker, context);                                            \
    }                                                                                                                  \
    TVR_EXPORT CMPI##kind##MI* TVRHBA_##name##_Create_##kind##MI(const CMPIBroker* broker, const CMPIContext* context, \
                                                                 CMPIStatus*)                                          \
    {                                                                                                                  \
        return TVRHBA_##name##_Provider_Create_##kind##MI(broker, context);                                            \
    }

#define TVR_CLASS(name, form, group, does)                                                                             \
    TVR_FACTORY(name, Instance, 'I')                                                                                   \
    TVR_FACTORY(name, Method, 'M')
#define TVR_ASSOCIATION(name, form, group, does)                                                                       \
    TVR_CLASS(name, form, group, does)                                                                                 \
    TVR_FACTORY(name, Association, 'A')
#include "agent/ClassCatalog.def"
