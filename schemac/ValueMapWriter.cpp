// The value maps of methods and their parameters, for programs that show them; the meta tables have no qualifiers.
#include "schemac/CppNames.h"
#include "schemac/Output.h"
#include "schemac/Types.h"

namespace schemac
{

namespace
{

constexpr const char* header_text = R"(#pragma once

#include <cstddef>

namespace cimple
{

/// The name of a value, of a range such as "5..7" or "0x8000..", or of all others ("..").
struct Value_Name
{
    const char* values;
    const char* name;
};

/// Of what a method returns, or of a parameter of it, as the class declares or overrides the method.
struct Value_Map
{
    const char* class_name;
    const char* method;
    const char* parameter; ///< empty for what the method returns
    const Value_Name* names;
    std::size_t num_names;
};

extern const Value_Map value_maps[];
extern const std::size_t num_value_maps;

} // namespace cimple
)";

/// The rows that a feature's qualifiers give, a line each; empty without value map.
std::string rows_of(const Feature& feature)
{
    const Qualifier* map = find(feature.qualifiers, "ValueMap");
    const Qualifier* names = find(feature.qualifiers, "Values");
    if (!map || !names || !map->value || !names->value || map->value->items.size() != names->value->items.size())
        return {};
    std::string text;
    for (std::size_t i = 0; i < map->value->items.size(); i++)
        text += "    {" + as_string_literal(map->value->items[i].text) + ", " +
                as_string_literal(names->value->items[i].text) + "},\n";
    return text;
}

struct Tables
{
    std::string names;
    std::string maps;

    void add(const Class& c, const Feature& method, const Feature& feature, const std::string& parameter)
    {
        const std::string rows = rows_of(feature);
        if (rows.empty())
            return;
        const std::string name = method_record_name(c, method) + (parameter.empty() ? "" : "_" + parameter) + "_names";
        names += "constexpr Value_Name " + name + "[] = {\n" + rows + "};\n";
        maps += "    {" + as_string_literal(c.name) + ", " + as_string_literal(method.name) + ", " +
                as_string_literal(parameter) + ", " + name + ", std::size(" + name + ")},\n";
    }
};

} // namespace

OutputFiles write_value_maps(const Schema& schema)
{
    Tables tables;
    for (const Class& c : schema.classes)
    {
        for (const Feature& method : c.features)
        {
            if (method.kind != FeatureKind::Method)
                continue;
            tables.add(c, method, method, "");
            for (const Feature& parameter : method.parameters)
                tables.add(c, method, parameter, parameter.name);
        }
    }
    return {{"schema/ValueMaps.h", banner("the schema") + header_text},
            {"schema/ValueMaps.cpp",
             banner("the schema") +
                 "#include \"schema/ValueMaps.h\"\n\n#include <iterator>\n\nnamespace cimple\n{\n\n"
                 "namespace\n{\n\n" +
                 tables.names + "\n} // namespace\n\nconst Value_Map value_maps[] = {\n" + tables.maps +
                 "};\nconst std::size_t num_value_maps = std::size(value_maps);\n\n"
                 "} // namespace cimple\n"}};
}

} // namespace schemac
