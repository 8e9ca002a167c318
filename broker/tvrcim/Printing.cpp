#include "broker/tvrcim/Printing.h"

#include "broker/host/ReadableText.h"
#include "broker/values/PathText.h"
#include "broker/values/QualifierText.h"
#include "broker/values/ValueMap.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <cstdio>
#include <iterator>

namespace tvrcim
{

using namespace broker;

namespace
{

std::string joined(const std::vector<std::string>& names)
{
    std::string text;
    for (const std::string& name : names)
        text += (text.empty() ? "" : ", ") + name;
    return text;
}

void printBlock(std::ostream& out, const ClassTable& classes, const Object& object)
{
    std::size_t width = 0;
    for (const Property& property : object.properties)
        width = std::max(width, property.name.size());
    out << pathText(object.path) << '\n';
    const ClassInfo* info = classes.find(object.path.className);
    for (const Property& property : object.properties)
        out << "    " << padded(property.name, width) << "  " << shownText(info, property.value, property.name) << '\n';
}

void printColumns(std::ostream& out, const ClassTable& classes, const std::vector<Object>& objects,
                  const std::vector<std::string>& columns)
{
    Table table(columns);
    for (const Object& object : objects)
    {
        const ClassInfo* info = classes.find(object.path.className);
        std::vector<std::string> row;
        for (const std::string& column : columns)
            row.push_back(object.has(column) ? shownText(info, object.get(column), column) : "-");
        table.add(std::move(row));
    }
    table.print(out);
}

std::string typeOf(const FeatureInfo& feature)
{
    return feature.referenceClass.empty() ? typeText(feature.type)
                                          : typeText(feature.type) + " " + feature.referenceClass;
}

std::string directionOf(const FeatureInfo& parameter)
{
    const bool in = parameter.flags & cimple::META_IN;
    const bool out = parameter.flags & cimple::META_OUT;
    return in && out ? "in out" : out ? "out" : "in";
}

std::string parameterList(const MethodInfo& method)
{
    std::vector<std::string> texts;
    for (const FeatureInfo& parameter : method.parameters)
        texts.push_back(directionOf(parameter) + " " + typeOf(parameter) + " " + parameter.name);
    return joined(texts);
}

constexpr const char* returned = "(returned)";

constexpr std::size_t textWidth = 100; ///< of descriptions
constexpr const char* textIndent = "    ";

void printText(std::ostream& out, std::string_view text, const std::string& indent)
{
    for (const std::string& line : lines(std::string(text), textWidth - indent.size()))
        out << indent << line << '\n';
}

/// What the schema says of a property, a method or a parameter.
struct Meaning
{
    Meaning(const ClassInfo& info, std::string_view feature, std::string_view parameter = {})
        : description(descriptionOf(info, feature, parameter)), unit(unitOf(info, feature, parameter))
    {
        for (const cimple::Value_Name& row : valueNames(info, feature, parameter))
            values.emplace_back(row.values, row.name);
        for (const cimple::Value_Name& row : bitNames(info, feature, parameter))
            values.emplace_back("bit " + std::string(row.values), row.name);
    }

    std::string_view description;
    std::string_view unit;
    std::vector<std::pair<std::string, std::string>> values; ///< with their names
};

/// The name and the unit on a line of their own; false for a meaning that says nothing.
bool printHeading(std::ostream& out, const std::string& of, const Meaning& meaning)
{
    if (meaning.description.empty() && meaning.unit.empty() && meaning.values.empty())
        return false;
    out << '\n' << of << (meaning.unit.empty() ? "" : ", in " + std::string(meaning.unit)) << '\n';
    return true;
}

/// With a line for each value that has a name.
void printMeaning(std::ostream& out, const std::string& of, const Meaning& meaning)
{
    if (!printHeading(out, of, meaning))
        return;
    printText(out, meaning.description, textIndent);
    std::size_t width = 0;
    for (const auto& [values, name] : meaning.values)
        width = std::max(width, values.size());
    for (const auto& [values, name] : meaning.values)
        out << textIndent << padded(values, width) << "  " << name << '\n';
}

/// In few lines.
void printShortly(std::ostream& out, const std::string& of, const Meaning& meaning)
{
    if (!printHeading(out, of, meaning))
        return;
    printText(out, meaning.description, textIndent);
    std::vector<std::string> items;
    for (const auto& [values, name] : meaning.values)
        items.push_back(values == name ? name : values + " " + name);
    printText(out, joined(items), textIndent);
}

/// The type with the qualifiers that are not the direction.
std::string qualifiedType(const FeatureInfo& parameter)
{
    constexpr std::uint32_t direction = cimple::META_IN | cimple::META_OUT;
    const std::string qualifiers = joined(qualifierNames(parameter.flags & ~direction));
    return typeOf(parameter) + (qualifiers.empty() ? "" : " (" + qualifiers + ")");
}

void printMethod(std::ostream& out, const ClassInfo& info, const MethodInfo& method)
{
    out << info.name << '.' << method.name;
    if (method.origin != &info)
        out << ", declared in " << method.origin->name;
    out << '\n';
    printText(out, descriptionOf(info, method.name), "");
    out << '\n';
    Table table({"PARAMETER", "DIRECTION", "TYPE"});
    for (const FeatureInfo& parameter : method.parameters)
        table.add({parameter.name, directionOf(parameter), qualifiedType(parameter)});
    table.add({returned, "", typeText(method.returnType)});
    table.print(out);
    for (const FeatureInfo& parameter : method.parameters)
        printMeaning(out, parameter.name, {info, method.name, parameter.name});
    Meaning result(info, method.name);
    result.description = {}; // stands above
    printMeaning(out, returned, result);
}

void printClassTable(std::ostream& out, const ClassInfo& info)
{
    out << info.name;
    for (const ClassInfo* ancestor = info.superclass; ancestor; ancestor = ancestor->superclass)
        out << " : " << ancestor->name;
    const std::vector<std::string> qualifiers = qualifierNames(info.flags);
    out << (qualifiers.empty() ? "\n" : "\n[" + joined(qualifiers) + "]\n");
    printText(out, descriptionOf(info), "");
    out << '\n';
    Table properties({"PROPERTY", "TYPE", "QUALIFIERS", "DEFAULT", "DECLARED IN"});
    for (const FeatureInfo& property : info.properties)
    {
        const bool initial = !property.defaultValue.isNull();
        properties.add({property.name, typeOf(property), joined(qualifierNames(property.flags)),
                        initial ? valueText(property.defaultValue) : "", property.origin->name});
    }
    properties.print(out);
    if (!info.methods.empty())
        out << '\n';
    Table methods({"METHOD", "RETURNS", "PARAMETERS", "DECLARED IN"});
    for (const MethodInfo& method : info.methods)
        methods.add({method.name, typeText(method.returnType), parameterList(method), method.origin->name});
    if (!info.methods.empty())
        methods.print(out);
    for (const FeatureInfo& property : info.properties)
        printShortly(out, property.name, {info, property.name});
    for (const MethodInfo& method : info.methods)
        printShortly(out, method.name, {info, method.name});
}

} // namespace

void Table::print(std::ostream& out) const
{
    std::vector<std::size_t> widths(_rows.front().size());
    for (const auto& row : _rows)
        for (std::size_t i = 0; i < row.size(); ++i)
            widths[i] = std::max(widths[i], displayWidth(row[i]));
    for (const auto& row : _rows)
    {
        std::string line;
        for (std::size_t i = 0; i < row.size(); ++i)
            line += padded(row[i], widths[i]) + "  ";
        line.erase(line.find_last_not_of(' ') + 1);
        out << line << '\n';
    }
}

void printJson(std::ostream& out, const Json& json)
{
    out << jsonText(json, true) << '\n';
}

void printObjects(std::ostream& out, Format format, const ClassTable& classes, const std::vector<Object>& objects,
                  const PropertyList& columns)
{
    if (format == Format::json)
    {
        Json list = Json::array();
        std::transform(objects.begin(), objects.end(), std::back_inserter(list),
                       [](const Object& object) { return toJson(object); });
        printJson(out, list);
        return;
    }
    if (format == Format::table && columns)
    {
        printColumns(out, classes, objects, *columns);
        return;
    }
    for (const Object& object : objects)
    {
        out << (&object == &objects.front() ? "" : "\n");
        if (format == Format::mof)
            out << mofText(object);
        else
            printBlock(out, classes, object);
    }
}

void printPaths(std::ostream& out, Format format, const std::vector<Path>& paths)
{
    if (format == Format::json)
    {
        Json list = Json::array();
        for (const Path& path : paths)
            list.push_back({{"class", path.className}, {"namespace", path.nameSpace}, {"path", pathText(path)}});
        printJson(out, list);
        return;
    }
    for (const Path& path : paths)
        out << fullPathText(path) << '\n';
}

void printClass(std::ostream& out, Format format, const ClassInfo& info)
{
    switch (format)
    {
    case Format::json:
        printJson(out, toJson(info));
        break;
    case Format::mof:
        out << mofText(info);
        break;
    default:
        printClassTable(out, info);
    }
}

void printClasses(std::ostream& out, Format format, const std::vector<const ClassInfo*>& classes)
{
    if (format == Format::json)
    {
        Json list = Json::array();
        for (const ClassInfo* info : classes)
        {
            list.push_back({{"name", info->name},
                            {"description", descriptionOf(*info)},
                            {"superclass", info->superclass ? Json(info->superclass->name) : Json(nullptr)},
                            {"association", info->isAssociation()},
                            {"keys", info->keys}});
        }
        printJson(out, list);
        return;
    }
    if (format == Format::mof)
    {
        for (const ClassInfo* info : classes)
            out << mofText(*info) << '\n';
        return;
    }
    Table table({"CLASS", "SUPERCLASS", "KIND", "KEYS"});
    for (const ClassInfo* info : classes)
    {
        const char* kind = info->isAssociation() ? "association" : info->isAbstract() ? "abstract" : "class";
        table.add({info->name, info->superclass ? info->superclass->name : "-", kind, joined(info->keys)});
    }
    table.print(out);
}

void printMethods(std::ostream& out, Format format, const ClassInfo& info,
                  const std::vector<const MethodInfo*>& methods)
{
    if (format == Format::json)
    {
        Json list = Json::array();
        for (const MethodInfo* method : methods)
            list.push_back(toJson(info, *method));
        printJson(out, list);
        return;
    }
    for (const MethodInfo* method : methods)
    {
        if (format == Format::mof)
            out << mofText(info, *method);
        else
            printMethod(out << (method == methods.front() ? "" : "\n"), info, *method);
    }
}

void printMethodReply(std::ostream& out, Format format, const ClassInfo& info, const MethodInfo& method,
                      const MethodReply& reply)
{
    if (format == Format::json)
    {
        const std::string_view meaning = valueName(valueNames(info, method.name), reply.returnValue);
        printJson(out, {{"returnValue", toJson(reply.returnValue)},
                        {"meaning", meaning.empty() ? Json(nullptr) : Json(meaning)},
                        {"out", propertiesToJson(reply.out)}});
        return;
    }
    Table table({"PARAMETER", "VALUE"});
    table.add({returned, shownText(&info, reply.returnValue, method.name)});
    for (const Property& parameter : reply.out)
        table.add({parameter.name, shownText(&info, parameter.value, method.name, parameter.name)});
    table.print(out);
}

} // namespace tvrcim
