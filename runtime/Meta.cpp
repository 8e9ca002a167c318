#include "runtime/Meta.h"

#include "runtime/Instance.h"
#include "runtime/LowerCase.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>
#include <strings.h>

namespace cimple
{
namespace
{

constexpr const char* type_names[num_types] = {
    "boolean", "uint8",  "sint8",  "uint16", "sint16", "uint32", "sint32",
    "uint64",  "sint64", "real32", "real64", "char16", "string", "datetime",
};

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

bool is_root(const Meta_Class* mc)
{
    return mc == &Instance::static_meta_class || eqi(mc->name, Instance::static_meta_class.name);
}

/// The first of `mc` and its superclasses that is named `name`; null if none is.
const Meta_Class* find_in_chain(const Meta_Class* mc, const char* name)
{
    while (mc && !eqi(mc->name, name))
        mc = mc->super_meta_class;
    return mc;
}

} // namespace

const char* type_name(std::uint32_t type)
{
    return type < num_types ? type_names[type] : nullptr;
}

int type_code(const char* name)
{
    if (!name || !*name)
        return -1;
    const std::size_t hash = type_name_hash(name);
    if (hash >= hash_size)
        return -1;
    for (const int code : codes_of_hash[hash])
    {
        if (code >= 0 && eqi(type_names[code], name))
            return code;
    }
    return -1;
}

const char* flag_name(unsigned bit)
{
    return bit < std::size(flag_names) ? flag_names[bit] : nullptr;
}

int flag_bit(const char* name)
{
    const auto found = std::find_if(std::begin(flag_names), std::end(flag_names),
                                    [name](const char* flag) { return eqi(flag, name); });
    return found == std::end(flag_names) ? -1 : static_cast<int>(found - std::begin(flag_names));
}

bool eqi(const char* a, const char* b)
{
    if (!a || !b)
        return a == b;
    return to_lower(*a) == to_lower(*b) && strcasecmp(a, b) == 0;
}

const Meta_Feature* find_feature(const Meta_Record* mc, const char* name, std::uint32_t mask)
{
    for (std::size_t i = 0; i < mc->num_meta_features; ++i)
    {
        const Meta_Feature* mf = mc->meta_features[i];
        if ((mf->flags & mask) && eqi(mf->name, name))
            return mf;
    }
    return nullptr;
}

const Meta_Class* find_class(const Meta_Repository* repository, const char* name)
{
    if (!repository)
        return nullptr;
    for (std::size_t i = 0; i < repository->num_meta_classes; ++i)
    {
        if (eqi(repository->meta_classes[i]->name, name))
            return repository->meta_classes[i];
    }
    return nullptr;
}

const Meta_Class* find_class_in_chain(const Meta_Class* mc, const char* name)
{
    if (!mc)
        return nullptr;
    const Meta_Class* found = find_in_chain(mc, name);
    return found ? found : find_class(mc->meta_repository, name);
}

bool is_subclass(const Meta_Class* ancestor, const Meta_Class* descendant)
{
    if (!ancestor || !descendant)
        return false;
    if (is_root(ancestor))
        return true;
    for (const Meta_Class* mc = descendant; mc; mc = mc->super_meta_class)
    {
        if (mc == ancestor || eqi(mc->name, ancestor->name))
            return true;
    }
    return false;
}

int is_subclass_by_name(const Meta_Repository* repository, const char* ancestor, const char* descendant)
{
    if (!repository || !ancestor || !descendant)
        return -1;
    const Meta_Class* above = find_class(repository, ancestor);
    const Meta_Class* below = find_class(repository, descendant);
    if (!above || !below)
        return -1;
    return is_subclass(above, below) ? 0 : 1;
}

bool is_or_derives_from(const Meta_Class* mc, const char* name)
{
    return find_in_chain(mc, name) != nullptr;
}

bool has_flag(const Meta_Record* mc, std::uint32_t mask)
{
    return std::any_of(mc->meta_features, mc->meta_features + mc->num_meta_features,
                       [mask](const Meta_Feature* mf) { return (mf->flags & mask) != 0; });
}

} // namespace cimple
