#include "broker/values/QualifierText.h"

#include "broker/values/ValueText.h"
#include "runtime/meta/Meta.h"

#include <iterator>

namespace broker
{

namespace
{

/// The flags below this bit say what kind a feature is.
constexpr unsigned firstQualifier = 4;

std::string qualifierList(std::uint32_t flags, const char* indent)
{
    std::string text;
    for (const std::string& name : qualifierNames(flags))
        text += (text.empty() ? "[" : ", ") + name;
    return text.empty() ? std::string() : indent + text + "]\n";
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

std::string propertyText(const FeatureInfo& property)
{
    const std::string initial =
        property.defaultValue.isNull() ? std::string() : " = " + mofValue(property.defaultValue);
    return qualifierList(property.flags, "    ") + "    " + declaration(property) + initial + ";\n";
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

std::string mofText(const MethodInfo& method)
{
    std::string text =
        qualifierList(method.flags, "    ") + "    " + typeText(method.returnType) + " " + method.name + "(";
    for (const FeatureInfo& parameter : method.parameters)
    {
        std::string qualifiers = qualifierList(parameter.flags, "");
        if (!qualifiers.empty())
            qualifiers.back() = ' ';
        text += (&parameter == &method.parameters.front() ? "\n        " : ",\n        ") + qualifiers +
                declaration(parameter);
    }
    return text + ");\n";
}

std::string mofText(const ClassInfo& info)
{
    std::string text = qualifierList(info.flags, "") + "class " + info.name;
    text += (info.superclass ? " : " + info.superclass->name : "") + "\n{\n";
    for (const FeatureInfo& property : info.properties)
        text += property.origin == &info ? propertyText(property) : "";
    for (const MethodInfo& method : info.methods)
        text += method.origin == &info ? mofText(method) : "";
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
