#include "broker/values/SchemaText.h"

#include <unordered_map>

namespace broker
{

namespace
{

using Texts = std::span<const cimple::Schema_Text>;

/// Those of each class, by its name as the schema writes it.
std::unordered_map<std::string_view, Texts> byClass()
{
    std::unordered_map<std::string_view, Texts> classes;
    const Texts all(cimple::schema_texts, cimple::num_schema_texts);
    for (std::size_t begin = 0, end = 0; begin < all.size(); begin = end)
    {
        const std::string_view name = all[begin].class_name;
        while (end < all.size() && all[end].class_name == name)
            end++;
        classes.emplace(name, all.subspan(begin, end - begin));
    }
    return classes;
}

Texts textsOf(const ClassInfo& info)
{
    static const std::unordered_map<std::string_view, Texts> classes = byClass();
    const auto it = classes.find(info.name);
    return it == classes.end() ? Texts() : it->second;
}

/// What `get` takes from the nearest declaration of which it is not empty.
template <class Get> auto nearest(const ClassInfo& info, std::string_view feature, std::string_view parameter, Get get)
{
    for (const ClassInfo* owner = &info; owner; owner = owner->superclass)
        for (const cimple::Schema_Text& text : textsOf(*owner))
            if (sameName(text.feature, feature) && sameName(text.parameter, parameter) && !get(text).empty())
                return get(text);
    return decltype(get(cimple::Schema_Text()))();
}

} // namespace

std::string_view descriptionOf(const ClassInfo& info)
{
    for (const cimple::Schema_Text& text : textsOf(info))
        if (!*text.feature)
            return text.description;
    return info.description;
}

std::string_view descriptionOf(const ClassInfo& info, std::string_view feature, std::string_view parameter)
{
    if (const FeatureInfo* known = info.property(feature); known && !known->description.empty())
        return known->description;
    return nearest(info, feature, parameter,
                   [](const cimple::Schema_Text& text) { return std::string_view(text.description); });
}

std::string_view unitOf(const ClassInfo& info, std::string_view feature, std::string_view parameter)
{
    return nearest(info, feature, parameter,
                   [](const cimple::Schema_Text& text) { return std::string_view(text.unit); });
}

ValueNames valueNames(const ClassInfo& info, std::string_view feature, std::string_view parameter)
{
    return nearest(info, feature, parameter,
                   [](const cimple::Schema_Text& text) { return ValueNames(text.names, text.num_names); });
}

ValueNames bitNames(const ClassInfo& info, std::string_view feature, std::string_view parameter)
{
    return nearest(info, feature, parameter,
                   [](const cimple::Schema_Text& text) { return ValueNames(text.bits, text.num_bits); });
}

} // namespace broker
