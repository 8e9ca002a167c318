#include "schemac/MofText.h"

#include "schemac/Types.h"

namespace schemac
{

namespace
{

constexpr std::size_t line_width = 110;
constexpr std::size_t longest_on_line = 80; ///< of the text of a qualifier

/// Items with commas between them, in lines of bounded width that begin at `indent`. An item of several lines has
/// them to itself.
std::string listed(const std::vector<std::string>& items, const std::string& indent)
{
    std::string text;
    std::size_t used = indent.size();
    for (std::size_t i = 0; i < items.size(); i++)
    {
        if (i > 0)
        {
            const bool fits = used + items[i].size() + 2 <= line_width && items[i].find('\n') == std::string::npos;
            text += fits ? ", " : ",\n" + indent;
            used = fits ? used + 2 : indent.size();
        }
        text += items[i];
        used = items[i].find('\n') == std::string::npos ? used + items[i].size() : line_width;
    }
    return text;
}

/// A text as literals of bounded width, which compilers join, each on a line of its own.
std::string string_lines(std::string_view text, const std::string& indent)
{
    const std::size_t room = line_width - indent.size() - 2;
    std::string lines;
    while (!text.empty())
    {
        const std::size_t blank = text.size() > room ? text.rfind(' ', room - 1) : std::string_view::npos;
        const std::size_t length = blank == std::string_view::npos ? text.size() : blank + 1;
        lines += "\n" + indent + as_string_literal(text.substr(0, length));
        text.remove_prefix(length);
    }
    return lines;
}

std::string mof_of(const Literal& literal)
{
    switch (literal.kind)
    {
    case Literal::Kind::Null:
        return "NULL";
    case Literal::Kind::String:
        return as_string_literal(literal.text);
    default:
        return literal.text;
    }
}

std::string braced(const Value& value, const std::string& indent)
{
    std::vector<std::string> items;
    for (const Literal& item : value.items)
        items.push_back(mof_of(item));
    return "{ " + listed(items, indent) + " }";
}

std::string mof_of(const Value& value, const std::string& indent)
{
    return value.is_array ? braced(value, indent) : mof_of(value.items.front());
}

bool is_long(const Value& value)
{
    return !value.is_array && value.items.front().kind == Literal::Kind::String &&
           value.items.front().text.size() > longest_on_line;
}

std::string mof_of(const Qualifier& qualifier, const std::string& indent)
{
    if (!qualifier.value)
        return qualifier.name;
    if (is_long(*qualifier.value))
        return qualifier.name + " (" + string_lines(qualifier.value->items.front().text, indent + "   ") + " )";
    const std::string value = mof_of(*qualifier.value, indent + "   ");
    return qualifier.name + (qualifier.value->is_array ? " " + value : " ( " + value + " )");
}

/// The bracketed list in front of what it qualifies, with its line's end; nothing if it is empty.
std::string mof_of(const Qualifiers& qualifiers, const std::string& indent)
{
    std::vector<std::string> items;
    for (const Qualifier& qualifier : qualifiers)
        items.push_back(mof_of(qualifier, indent));
    return items.empty() ? "" : indent + "[" + listed(items, indent + " ") + "]\n";
}

std::string subscript_of(const Feature& feature)
{
    if (feature.subscript == 0)
        return "";
    return feature.subscript < 0 ? "[]" : "[" + std::to_string(feature.subscript) + "]";
}

/// Qualifiers, type and name, as features and parameters begin.
std::string declaration(const Feature& feature, const std::string& indent)
{
    const std::string type = feature.type.empty() ? feature.class_name + " REF" : feature.type;
    return mof_of(feature.qualifiers, indent) + indent + type + " " + feature.name + subscript_of(feature);
}

std::string mof_of(const Feature& feature)
{
    std::string text = declaration(feature, "   ");
    if (feature.kind == FeatureKind::Method)
    {
        text += "(";
        for (std::size_t i = 0; i < feature.parameters.size(); i++)
            text += (i == 0 ? "\n" : ",\n") + declaration(feature.parameters[i], "      ");
        text += ")";
    }
    if (feature.default_value)
        text += " = " + mof_of(*feature.default_value, "      ");
    return text + ";\n";
}

} // namespace

std::string mof_of(const QualifierDeclaration& declaration)
{
    std::string text = "Qualifier " + declaration.name + " : " + declaration.type + (declaration.is_array ? "[]" : "");
    if (declaration.default_value)
        text += " = " + mof_of(*declaration.default_value, "   ");
    text += ",\n    Scope(" + listed(declaration.scopes, "    ") + ")";
    if (!declaration.flavors.empty())
        text += ",\n    Flavor(" + listed(declaration.flavors, "    ") + ")";
    return text + ";\n";
}

std::string mof_of(const Class& c)
{
    std::string text = mof_of(c.qualifiers, "") + "class " + c.name +
                       (c.superclass_name.empty() ? "" : " : " + c.superclass_name) + " {\n";
    for (const Feature& feature : c.features)
        text += mof_of(feature);
    return text + "};\n";
}

} // namespace schemac
