#include "schemac/Check.h"
#include "schemac/Types.h"

#include <set>

namespace schemac
{

namespace
{

constexpr std::string_view range_mark = "..";

bool is_integer(const TypeRow* type)
{
    return type && (type->type_class == TypeClass::Unsigned || type->type_class == TypeClass::Signed);
}

bool is_number(const TypeRow* type)
{
    return is_integer(type) || (type && type->type_class == TypeClass::Real);
}

bool is_value(const TypeRow& type, std::string_view text)
{
    return !cpp_value(type, {Literal::Kind::Integer, std::string(text)}).empty();
}

/// A value, or a range of which an end or both may be open: "5", "0x1000..0x7FFF", "32768..", "..".
bool is_value_or_range(const TypeRow& type, std::string_view text)
{
    const std::size_t mark = text.find(range_mark);
    if (mark == std::string_view::npos)
        return is_value(type, text);
    const std::string_view low = text.substr(0, mark);
    const std::string_view high = text.substr(mark + range_mark.size());
    return (low.empty() || is_value(type, low)) && (high.empty() || is_value(type, high));
}

class ValueMapCheck
{
public:
    std::vector<std::string> run(const Schema& schema)
    {
        for (const Class& c : schema.classes)
        {
            for (const Feature& feature : c.features)
            {
                check(feature);
                for (const Feature& parameter : feature.parameters)
                    check(parameter);
            }
        }
        return std::move(_refusals);
    }

private:
    void refuse(const Qualifier& qualifier, const Feature& feature, const std::string& reason)
    {
        _refusals.push_back(
            refusal(qualifier.place, "qualifier \"" + qualifier.name + "\" of \"" + feature.name + "\" " + reason));
    }

    void check(const Feature& feature)
    {
        const TypeRow* type = find_type(feature.type);
        check_names(feature, "ValueMap", "Values");
        check_names(feature, "BitMap", "BitValues");
        check_values(feature, type);
        const Qualifier* unit = find(feature.qualifiers, "PUnit");
        if (unit && !is_number(type))
            refuse(*unit, feature, "is of no number");
    }

    /// A value map without names is a list of the values that there are.
    void check_names(const Feature& feature, const char* map_name, const char* names_name)
    {
        const Qualifier* map = find(feature.qualifiers, map_name);
        const Qualifier* names = find(feature.qualifiers, names_name);
        if (map && names && map->value && names->value && map->value->items.size() != names->value->items.size())
            refuse(*names, feature, "has not as many texts as \"" + std::string(map_name) + "\"");
    }

    void check_values(const Feature& feature, const TypeRow* type)
    {
        const Qualifier* map = find(feature.qualifiers, "ValueMap");
        if (!map || !map->value)
            return;
        std::set<std::string> seen;
        for (const Literal& item : map->value->items)
        {
            if (is_integer(type) && !is_value_or_range(*type, item.text))
                refuse(*map, feature, "has \"" + item.text + "\", which is no value of its type");
            if (!seen.insert(item.text).second)
                refuse(*map, feature, "has \"" + item.text + "\" twice");
        }
    }

    std::vector<std::string> _refusals;
};

} // namespace

std::vector<std::string> check_value_maps(const Schema& schema)
{
    return ValueMapCheck().run(schema);
}

} // namespace schemac
