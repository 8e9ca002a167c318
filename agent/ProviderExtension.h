// How a class provider does more than its form says.
//
// A provider with methods, a change of instances or an enumeration of its own specialises Extended for its class in a
// header that derivedObjects/Providers.h includes, and says so in its row of the catalog:
//
//   template <class Form> struct Extended<TVRHBA_FCTagService, Form> : Form
//   {
//       static std::span<const MethodRow> methods()
//       {
//           return methodTable<TVRHBA_FCTagService, &setGlobalFlag, &getGlobalFlag>;
//       }
//   };
#pragma once

#include "agent/CatalogRow.h"
#include "agent/MethodOutcome.h"
#include "runtime/meta/Instance.h"

#include <array>
#include <concepts>
#include <cstdint>
#include <span>
#include <type_traits>

namespace cimple
{

template <class Record, class Form> struct Extended : Form
{};

/// An extrinsic method with a body. `call` gets the reference and the parameter record, writes the out parameters
/// and "return_value", and returns a Provider_Status.
struct MethodRow
{
    const Meta_Method* method;
    int (*call)(const Instance* reference, Instance* record);
};

namespace detail
{

/// The parameter record that a body takes.
template <class Parameters> Parameters parametersOf(std::uint32_t (*)(const Instance* reference, Parameters& record));

template <auto body> using ParametersOf = decltype(parametersOf(body));

template <auto body> int callBody(const Instance* reference, Instance* record)
{
    auto& parameters = static_cast<ParametersOf<body>&>(*record);
    return methodOutcome([&] { return body(reference, parameters); },
                         [&](std::uint32_t result)
                         {
                             using Result = decltype(parameters.return_value.value);
                             parameters.return_value.set(static_cast<Result>(result));
                         });
}

template <class Record, auto body> constexpr MethodRow methodRow()
{
    using Parameters = ParametersOf<body>;
    static_assert(std::is_base_of_v<typename Parameters::Class, Record>, "a method of another class");
    return {&Parameters::static_meta_method, &callBody<body>};
}

} // namespace detail

/// The methods of a class. A body is `std::uint32_t body(const Instance* reference, Parameters& record)`, whose answer
/// is the method's return value; what the method is called stands in the type of its parameters.
template <class Record, auto... bodies>
inline constexpr std::array<MethodRow, sizeof...(bodies)> methodTable = {detail::methodRow<Record, bodies>()...};

template <class Provider>
concept HasMethods = requires
{
    {
        Provider::methods()
        } -> std::convertible_to<std::span<const MethodRow>>;
};

template <class Provider>
concept HasModifyInstance = requires(Provider& provider, const Instance* instance)
{
    {
        provider.modify_instance(instance, instance)
        } -> std::same_as<int>;
};

template <class Provider>
concept HasCreateInstance = requires(Provider& provider, Instance* instance)
{
    {
        provider.create_instance(instance)
        } -> std::same_as<int>;
};

template <class Provider>
concept HasDeleteInstance = requires(Provider& provider, const Instance* instance)
{
    {
        provider.delete_instance(instance)
        } -> std::same_as<int>;
};

/// What the provider's code does, to be held against its row of the catalog.
template <class Provider>
inline constexpr unsigned duties = (HasMethods<Provider> ? Methods : Reads) |
                                   (HasModifyInstance<Provider> ? Modifies : Reads) |
                                   (HasCreateInstance<Provider> ? Creates : Reads) |
                                   (HasDeleteInstance<Provider> ? Deletes : Reads);

} // namespace cimple
