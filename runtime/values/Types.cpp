#include "runtime/values/Types.h"

#include "runtime/values/LowerCase.h"

#include <string_view>

namespace cimple
{
namespace
{

// Length, first and last character of a type name select at most two names to compare: uint32 and sint64 have
// one hash, as have sint32 and uint64.
constexpr std::size_t hash_base = 9;
constexpr std::size_t hash_size = 75;
constexpr std::size_t names_per_hash = 2;

constexpr std::size_t type_name_hash(std::string_view name)
{
    return (name.size() ^ to_lower(name.front()) ^ to_lower(name.back())) - hash_base;
}

/// Type codes by hash; -1 where there is no name.
constexpr auto codes_of_hash = []
{
    std::array<std::array<std::int8_t, names_per_hash>, hash_size> table{};
    for (auto& codes : table)
        codes.fill(-1);
    for (std::size_t type = 0; type < num_types; ++type)
    {
        std::size_t i = 0;
        auto& codes = table[type_name_hash(type_names[type])];
        while (codes.at(i) >= 0)
            ++i;
        codes.at(i) = static_cast<std::int8_t>(type);
    }
    return table;
}();

} // namespace

int type_code(const char* name)
{
    if (!name || !*name)
        return -1;
    const std::size_t hash = type_name_hash(name);
    if (hash >= hash_size)
        return -1;
    for (const int code : codes_of_hash[hash])
        if (code >= 0 && eqi(type_names[code], name))
            return code;
    return -1;
}

} // namespace cimple
