#include "schemac/Model.h"

#include <algorithm>
#include <cctype>
#include <iterator>

namespace schemac
{

std::string refusal(const Place& place, const std::string& reason)
{
    return place.file + ":" + std::to_string(place.line) + ": " + reason;
}

bool same_name(std::string_view a, std::string_view b)
{
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](unsigned char x, unsigned char y) { return std::tolower(x) == std::tolower(y); });
}

template <class Items>
static auto find_named(const Items& items, std::string_view name) -> const typename Items::value_type*
{
    const auto it = std::find_if(items.begin(), items.end(), [&](const auto& x) { return same_name(x.name, name); });
    return it == items.end() ? nullptr : &*it;
}

const Class* Schema::find_class(std::string_view name) const
{
    return find_named(classes, name);
}

const QualifierDeclaration* Schema::find_qualifier(std::string_view name) const
{
    return find_named(qualifiers, name);
}

const Qualifier* find(const Qualifiers& qualifiers, std::string_view name)
{
    return find_named(qualifiers, name);
}

bool is_set(const Qualifiers& qualifiers, std::string_view name)
{
    const Qualifier* qualifier = find(qualifiers, name);
    if (!qualifier || !qualifier->value)
        return qualifier;
    const std::vector<Literal>& items = qualifier->value->items;
    return !items.empty() && items.front().kind != Literal::Kind::Null && items.front().text != "false";
}

const std::string* text_of(const Qualifiers& qualifiers, std::string_view name)
{
    const Qualifier* qualifier = find(qualifiers, name);
    if (!qualifier || !qualifier->value || qualifier->value->items.size() != 1)
        return nullptr;
    const Literal& literal = qualifier->value->items.front();
    return literal.kind == Literal::Kind::String ? &literal.text : nullptr;
}

std::vector<Feature> recorded_features(const Class& c)
{
    std::vector<Feature> features;
    std::copy_if(c.features.begin(), c.features.end(), std::back_inserter(features),
                 [](const Feature& feature) { return !feature.only_explains; });
    return features;
}

bool is_or_derives_from(const Class* descendant, const Class* ancestor)
{
    for (; descendant; descendant = descendant->superclass)
        if (descendant == ancestor)
            return true;
    return false;
}

} // namespace schemac
