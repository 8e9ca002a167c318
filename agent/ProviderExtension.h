// How a class provider does more than its form says.
//
// A provider with methods, a modify_instance or an enumeration of its own specialises Extended for its class in a
// header that derivedObjects/Providers.h includes:
//
//   template <class Form> struct Extended<TVRHBA_FCTagService, Form> : Form
//   {
//       static std::span<const MethodRow> methods();
//   };
#pragma once

#include "runtime/Instance.h"

#include <concepts>
#include <span>

namespace cimple
{

template <class Record, class Form> struct Extended : Form
{};

/// An extrinsic method with a body. `call` gets the reference and the parameter record, writes the out parameters
/// and "return_value", and returns a Provider_Status.
struct MethodRow
{
    const char* name;
    int (*call)(const Instance* reference, Instance* record);
};

/// Adapts a function of the typed parameter record to a row.
template <class Record, int (*function)(const Instance* reference, Record& record)>
int callMethod(const Instance* reference, Instance* record)
{
    return function(reference, *static_cast<Record*>(record));
}

template <class Provider>
concept HasMethods = requires
{
    {
        Provider::methods()
        } -> std::same_as<std::span<const MethodRow>>;
};

template <class Provider>
concept HasModifyInstance = requires(Provider& provider, const Instance* instance)
{
    {
        provider.modify_instance(instance, instance)
        } -> std::same_as<int>;
};

} // namespace cimple
