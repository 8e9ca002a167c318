#include "broker/values/QualifierText.h"

#include "broker/values/SchemaText.h"
#include "broker/values/ValueText.h"
#include "runtime/meta/Meta.h"

#include <iterator>

namespace broker
{

namespace
{

/// The flags below this bit say what kind a feature is.
constexpr unsigned firstQualifier = 4;

/// A qualifier with a list of what the rows have.
std::string listQualifier(const char* name, ValueNames rows, const char* cimple::Value_Name::*member)
{
    std::string text;
    for (const cimple::Value_Name& row : rows)
        text += (text.empty() ? "" : ", ") + quoteText(row.*member);
    return name + (" { " + text + " }");
}

std::string textQualifier(const char* name, std::string_view text)
{
    return name + (" ( " + quoteText(text) + " )");
}

/// The qualifiers that tell people what a feature or parameter is.
std::vector<std::string> textQualifiers(const ClassInfo& info, std::string_view feature,
                                        std::string_view parameter = {})
{
    std::vector<std::string> items;
    if (const std::string_view description = descriptionOf(info, feature, parameter); !description.empty())
        items.push_back(textQualifier("Description", description));
    if (const std::string_view unit = unitOf(info, feature, parameter); !unit.empty())
        items.push_back(textQualifier("PUnit", unit));
    if (const ValueNames names = valueNames(info, feature, parameter); !names.empty())
    {
        items.push_back(listQualifier("ValueMap", names, &cimple::Value_Name::values));
        items.push_back(listQualifier("Values", names, &cimple::Value_Name::name));
    }
    if (const ValueNames bits = bitNames(info, feature, parameter); !bits.empty())
    {
        items.push_back(listQualifier("BitMap", bits, &cimple::Value_Name::values));
        items.push_back(listQualifier("BitValues", bits, &cimple::Value_Name::name));
    }
    return items;
}

/// The flags in a line, and each text in a line of its own.
std::string qualifierList(std::uint32_t flags, const std::vector<std::string>& texts, const std::string& indent)
{
    std::string list;
    for (const std::string& name : qualifierNames(flags))
        list += (list.empty() ? "" : ", ") + name;
    for (const std::string& text : texts)
        list += (list.empty() ? "" : ",\n" + indent + " ") + text;
    return list.empty() ? std::string() : indent + "[" + list + "]\n";
}

std::string declaration(const FeatureInfo& feature)
{
    const bool array = feature.type & CMPI_ARRAY;
    const std::string type = feature.isReference() ? feature.referenceClass + " REF"
                             : feature.referenceClass.empty()
                                 ? typeText(static_cast<CMPIType>(feature.type & ~CMPI_ARRAY))
                                 : "string";
    return type + " " + feature.name + (array ? "[]" : "");
}

std::string propertyText(const ClassInfo& info, const FeatureInfo& property)
{
    const std::string initial =
        property.defaultValue.isNull() ? std::string() : " = " + mofValue(property.defaultValue);
    return qualifierList(property.flags, textQualifiers(info, property.name), "    ") + "    " + declaration(property) +
           initial + ";\n";
}

} // namespace

std::uint32_t qualifierMask(std::string_view name)
{
    for (unsigned bit = firstQualifier; bit < std::size(cimple::flag_names); ++bit)
        if (sameName(cimple::flag_names[bit], name))
            return 1U << bit;
    return 0;
}

std::vector<std::string> qualifierNames(std::uint32_t flags)
{
    std::vector<std::string> names;
    for (unsigned bit = firstQualifier; bit < std::size(cimple::flag_names); ++bit)
        if (flags & (1U << bit))
            names.emplace_back(cimple::flag_names[bit]);
    return names;
}

std::string mofText(const ClassInfo& info, const MethodInfo& method)
{
    std::string text = qualifierList(method.flags, textQualifiers(info, method.name), "    ") + "    " +
                       typeText(method.returnType) + " " + method.name + "(";
    for (const FeatureInfo& parameter : method.parameters)
    {
        std::string qualifiers =
            qualifierList(parameter.flags, textQualifiers(info, method.name, parameter.name), "        ");
        if (qualifiers.empty())
            qualifiers = "        ";
        else
            qualifiers.back() = ' ';
        text += (&parameter == &method.parameters.front() ? "\n" : ",\n") + qualifiers + declaration(parameter);
    }
    return text + ");\n";
}

std::string mofText(const ClassInfo& info)
{
    const std::string_view description = descriptionOf(info);
    std::vector<std::string> texts;
    if (!description.empty())
        texts.push_back(textQualifier("Description", description));
    std::string text = qualifierList(info.flags, texts, "") + "class " + info.name;
    text += (info.superclass ? " : " + info.superclass->name : "") + "\n{\n";
    for (const FeatureInfo& property : info.properties)
        text += property.origin == &info ? propertyText(info, property) : "";
    for (const MethodInfo& method : info.methods)
        text += method.origin == &info ? mofText(info, method) : "";
    return text + "};\n";
}

std::string mofText(const Object& object)
{
    std::string text = "instance of " + object.path.className + "\n{\n";
    for (const Property& property : object.properties)
        text += "    " + property.name + " = " + mofValue(property.value) + ";\n";
    return text + "};\n";
}

} // namespace broker
