// What the schema tells people of classes, properties, methods and parameters, and which qualifiers it declares, for
// programs that show it; the meta tables have no qualifiers.
#include "schemac/CppNames.h"
#include "schemac/Output.h"
#include "schemac/Types.h"

#include <algorithm>

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

/// What the declaration of a class, or of a feature in it, says beyond its type. Texts that it lacks are empty.
struct Schema_Text
{
    const char* class_name;
    const char* feature;   ///< a property, reference or method; empty for the class itself
    const char* parameter; ///< empty for the feature itself; a method's names and unit are of what it returns
    const char* description;
    const char* unit; ///< in the notation of the qualifier PUnit
    const Value_Name* names;
    std::size_t num_names;
    const Value_Name* bits; ///< names of bits, by their numbers
    std::size_t num_bits;
};

/// Those of a class stand together.
extern const Schema_Text schema_texts[];
extern const std::size_t num_schema_texts;

/// A qualifier as it is declared.
struct Qualifier_Text
{
    const char* name;
    const char* type;
    bool is_array;
    const char* default_value; ///< null for none
    const char* scopes;        ///< what may have it, with blanks around each: " class property "
    bool overridable;
    bool to_subclass;
    bool translatable;
};

/// In the order of their declarations.
extern const Qualifier_Text qualifier_texts[];
extern const std::size_t num_qualifier_texts;

} // namespace cimple
)";

/// The rows that a map of values or bits gives, a line each; empty without one.
std::string rows_of(const Qualifiers& qualifiers, const char* map_name, const char* names_name)
{
    const Qualifier* map = find(qualifiers, map_name);
    const Qualifier* names = find(qualifiers, names_name);
    if (!map || !names || !map->value || !names->value || map->value->items.size() != names->value->items.size())
        return {};
    std::string text;
    for (std::size_t i = 0; i < map->value->items.size(); i++)
        text += "    {" + as_string_literal(map->value->items[i].text) + ", " +
                as_string_literal(names->value->items[i].text) + "},\n";
    return text;
}

std::string literal_of(const Qualifiers& qualifiers, std::string_view name)
{
    const std::string* text = text_of(qualifiers, name);
    return as_string_literal(text ? *text : std::string());
}

struct Tables
{
    std::string names;
    std::string texts;

    void add(const Class& c, const std::string& feature, const std::string& parameter, const Qualifiers& qualifiers)
    {
        const std::string rows = rows_of(qualifiers, "ValueMap", "Values");
        const std::string bits = rows_of(qualifiers, "BitMap", "BitValues");
        if (rows.empty() && bits.empty() && !text_of(qualifiers, "Description") && !text_of(qualifiers, "PUnit"))
            return;
        const std::string name = c.name + "_" + feature + (parameter.empty() ? "" : "_" + parameter);
        texts += "    {" + as_string_literal(c.name) + ", " + as_string_literal(feature) + ", " +
                 as_string_literal(parameter) + ", " + literal_of(qualifiers, "Description") + ", " +
                 literal_of(qualifiers, "PUnit") + ", " + add_names(name + "_names", rows) + ", " +
                 add_names(name + "_bits", bits) + "},\n";
    }

    /// A table of these rows, as a pointer and a number; none if there are no rows.
    std::string add_names(const std::string& name, const std::string& rows)
    {
        if (rows.empty())
            return "nullptr, 0";
        names += "constexpr Value_Name " + name + "[] = {\n" + rows + "};\n";
        return name + ", std::size(" + name + ")";
    }

    void add(const Class& c)
    {
        add(c, "", "", c.qualifiers);
        for (const Feature& feature : c.features)
        {
            add(c, feature.name, "", feature.qualifiers);
            for (const Feature& parameter : feature.parameters)
                add(c, feature.name, parameter.name, parameter.qualifiers);
        }
    }
};

std::string as_bool(bool value)
{
    return value ? "true" : "false";
}

std::string row_of(const QualifierDeclaration& declaration)
{
    const auto has_flavor = [&](std::string_view name)
    {
        return std::any_of(declaration.flavors.begin(), declaration.flavors.end(),
                           [&](const std::string& flavor) { return same_name(flavor, name); });
    };
    const bool has_default = declaration.default_value && !declaration.is_array &&
                             declaration.default_value->items.front().kind != Literal::Kind::Null;
    std::string scopes = " ";
    for (const std::string& scope : declaration.scopes)
        scopes += scope + " ";
    return "    {" + as_string_literal(declaration.name) + ", " + as_string_literal(declaration.type) + ", " +
           as_bool(declaration.is_array) + ", " +
           (has_default ? as_string_literal(declaration.default_value->items.front().text) : "nullptr") + ", " +
           as_string_literal(scopes) + ", " + as_bool(!has_flavor("DisableOverride")) + ", " +
           as_bool(!has_flavor("Restricted")) + ", " + as_bool(has_flavor("Translatable")) + "},\n";
}

} // namespace

OutputFiles write_texts(const Schema& schema)
{
    Tables tables;
    for (const Class& c : schema.classes)
        tables.add(c);
    std::string qualifiers;
    for (const QualifierDeclaration& declaration : schema.qualifiers)
        qualifiers += row_of(declaration);
    return {{"schema/SchemaTexts.h", banner("the schema") + header_text},
            {"schema/SchemaTexts.cpp",
             banner("the schema") +
                 "#include \"schema/SchemaTexts.h\"\n\n#include <iterator>\n\nnamespace cimple\n{\n\n"
                 "namespace\n{\n\n" +
                 tables.names + "\n} // namespace\n\nconst Schema_Text schema_texts[] = {\n" + tables.texts +
                 "};\nconst std::size_t num_schema_texts = std::size(schema_texts);\n\n"
                 "const Qualifier_Text qualifier_texts[] = {\n" +
                 qualifiers +
                 "};\nconst std::size_t num_qualifier_texts = std::size(qualifier_texts);\n\n"
                 "} // namespace cimple\n"}};
}

} // namespace schemac
