// The CIM types: their codes, and the C++ types that hold them.
#pragma once

#include "runtime/values/Datetime.h"
#include "runtime/values/String.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <iterator>
#include <tuple>
#include <type_traits>
#include <utility>

namespace cimple
{

/// The code of a type is its place in Slot_Types and in every table by type.
enum Type : std::uint16_t
{
    BOOLEAN = 0,
    UINT8 = 1,
    SINT8 = 2,
    UINT16 = 3,
    SINT16 = 4,
    UINT32 = 5,
    SINT32 = 6,
    UINT64 = 7,
    SINT64 = 8,
    REAL32 = 9,
    REAL64 = 10,
    CHAR16 = 11,
    STRING = 12,
    DATETIME = 13,
};

/// What a scalar slot or an element of an array holds.
using Slot_Types = std::tuple<bool, std::uint8_t, std::int8_t, std::uint16_t, std::int16_t, std::uint32_t, std::int32_t,
                              std::uint64_t, std::int64_t, float, double, std::uint16_t, String, Datetime>;
template <std::size_t type> using Slot_Type = std::tuple_element_t<type, Slot_Types>;
inline constexpr std::size_t num_types = std::tuple_size_v<Slot_Types>;
static_assert(std::is_same_v<Slot_Type<CHAR16>, std::uint16_t> && std::is_same_v<Slot_Type<DATETIME>, Datetime>);

/// Calls `use` with the codes as constants, `use(std::integral_constant<std::size_t, code>...)`.
template <class Use> constexpr auto with_all_types(Use use)
{
    return [&]<std::size_t... code>(std::index_sequence<code...>)
    {
        return use(std::integral_constant<std::size_t, code>()...);
    }
    (std::make_index_sequence<num_types>());
}

/// What `use(std::type_identity<T>())` says for the C++ type T of a CIM type; `otherwise` for an unknown code.
template <class Result, class Use> Result with_type(std::uint32_t type, Result otherwise, Use use)
{
    Result result = std::move(otherwise);
    const auto try_one = [&](auto code)
    { return type == code && (result = use(std::type_identity<Slot_Type<code>>()), true); };
    with_all_types([&](auto... code) { return (try_one(code) || ...); });
    return result;
}

/// Bytes of a scalar slot by type code, without its null byte; a string or datetime is one handle.
inline constexpr auto type_widths =
    with_all_types([](auto... code) { return std::array{std::uint8_t{sizeof(Slot_Type<code>)}...}; });

/// The same; 0 for an unknown code.
constexpr std::size_t type_width(std::uint32_t type)
{
    return type < num_types ? type_widths[type] : 0;
}

/// Code of the CIM type that T holds (char16 is held as UINT16); -1 for other types.
template <class T>
inline constexpr int cim_type_of = with_all_types(
    [](auto... code)
    {
        const bool same[] = {std::is_same_v<T, Slot_Type<code>>...};
        const bool* found = std::find(std::begin(same), std::end(same), true);
        return found == std::end(same) ? -1 : static_cast<int>(found - same);
    });

/// "boolean", "uint8", ... as in MOF, by type code.
inline constexpr std::array<const char*, num_types> type_names{
    "boolean", "uint8",  "sint8",  "uint16", "sint16", "uint32", "sint32",
    "uint64",  "sint64", "real32", "real64", "char16", "string", "datetime",
};

/// The same; null for an unknown code.
constexpr const char* type_name(std::uint32_t type)
{
    return type < num_types ? type_names[type] : nullptr;
}

/// Code of a CIM type name, case-insensitive; -1 if it is none.
int type_code(const char* name);

} // namespace cimple
