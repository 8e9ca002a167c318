#include "broker/cimxml/Encode.h"

#include "broker/values/QualifierText.h"
#include "broker/values/SchemaText.h"
#include "broker/values/ValueText.h"

#include <array>
#include <charconv>
#include <optional>

namespace cimxml
{

using namespace broker;

namespace
{

CMPIType elementType(CMPIType type)
{
    return static_cast<CMPIType>(type & ~CMPI_ARRAY);
}

bool isEmbedded(CMPIType type)
{
    return elementType(type) == CMPI_instance;
}

/// DSP0201 5.2.2.2: not a number and the infinities have names.
std::string realText(double number)
{
    if (number != number)
        return "NaN";
    if (number - number != 0)
        return number < 0 ? "-INF" : "INF";
    std::array<char, 64> buffer{};
    const auto result =
        std::to_chars(buffer.data(), buffer.data() + buffer.size(), number, std::chars_format::scientific);
    std::string text(buffer.data(), result.ptr);
    if (text.find('.') == text.npos)
        text.insert(text.find('e'), ".0"); // a real has a fraction
    return text;
}

/// One UTF-16 code unit as UTF-8; half of a pair is no character.
std::string characterText(std::uint64_t unit)
{
    if (unit < 0x80)
        return {static_cast<char>(unit)};
    if (unit < 0x800)
        return {static_cast<char>(0xC0 | unit >> 6), static_cast<char>(0x80 | (unit & 0x3F))};
    return {static_cast<char>(0xE0 | unit >> 12), static_cast<char>(0x80 | (unit >> 6 & 0x3F)),
            static_cast<char>(0x80 | (unit & 0x3F))};
}

std::string embeddedText(const Object& object)
{
    std::string text;
    XmlText xml(text);
    writeInstance(xml, object, nullptr);
    return text;
}

std::string scalarText(const Value& value)
{
    switch (value.type())
    {
    case CMPI_boolean:
        return value.asBoolean() ? "TRUE" : "FALSE";
    case CMPI_real32:
    case CMPI_real64:
        return realText(value.asReal());
    case CMPI_char16:
        return characterText(value.asUnsigned());
    case CMPI_instance:
        return embeddedText(value.asObject());
    default:
        return valueText(value);
    }
}

void writeReference(XmlText& xml, const Path& path)
{
    const XmlElement reference(xml, "VALUE.REFERENCE");
    if (path.nameSpace.empty())
        writeInstanceName(xml, path);
    else
        writeInstancePath(xml, path);
}

void writeElement(XmlText& xml, const Value& value, CMPIType type)
{
    if (value.isNull() && type == CMPI_string)
        xml.leaf("VALUE", "");
    else if (!value.isNull() && type == CMPI_ref)
        writeReference(xml, value.asPath());
    else if (!value.isNull())
        xml.leaf("VALUE", scalarText(value));
}

void writeKey(XmlText& xml, const Property& key)
{
    const XmlElement binding(xml, "KEYBINDING", {{"NAME", key.name}});
    if (key.value.isNull())
        return xml.leaf("KEYVALUE", "", {{"VALUETYPE", "string"}});
    const CMPIType type = key.value.type();
    if (type == CMPI_ref)
        return writeReference(xml, key.value.asPath());
    const bool numeric = isInteger(type) || type == CMPI_real32 || type == CMPI_real64;
    xml.leaf("KEYVALUE", scalarText(key.value),
             {{"VALUETYPE", type == CMPI_boolean ? "boolean"
                            : numeric            ? "numeric"
                                                 : "string"}});
}

// --- classes

void writeFlag(XmlText& xml, std::string_view name)
{
    const XmlElement qualifier(xml, "QUALIFIER", {{"NAME", name}, {"TYPE", "boolean"}});
    xml.leaf("VALUE", "TRUE");
}

void writeTexts(XmlText& xml, std::string_view name, const std::vector<std::string>& texts)
{
    const XmlElement qualifier(xml, "QUALIFIER", {{"NAME", name}, {"TYPE", "string"}});
    const XmlElement array(xml, "VALUE.ARRAY");
    for (const std::string& text : texts)
        xml.leaf("VALUE", text);
}

void writeFlags(XmlText& xml, std::uint32_t flags)
{
    for (const std::string& name : qualifierNames(flags))
        writeFlag(xml, name);
}

void writeText(XmlText& xml, std::string_view name, std::string_view text)
{
    if (text.empty())
        return;
    const XmlElement qualifier(xml, "QUALIFIER", {{"NAME", name}, {"TYPE", "string"}});
    xml.leaf("VALUE", text);
}

void writeNames(XmlText& xml, std::string_view ofValues, std::string_view ofNames, ValueNames names)
{
    std::vector<std::string> values, texts;
    for (const cimple::Value_Name& row : names)
    {
        values.emplace_back(row.values);
        texts.emplace_back(row.name);
    }
    if (names.empty())
        return;
    writeTexts(xml, ofValues, values);
    writeTexts(xml, ofNames, texts);
}

/// What the schema says to people of a feature, or of a parameter of it.
void writeTextsOf(XmlText& xml, const ClassInfo& info, std::string_view feature, std::string_view parameter = {})
{
    writeText(xml, "Description", descriptionOf(info, feature, parameter));
    writeText(xml, "PUnit", unitOf(info, feature, parameter));
    writeNames(xml, "ValueMap", "Values", valueNames(info, feature, parameter));
    writeNames(xml, "BitMap", "BitValues", bitNames(info, feature, parameter));
}

void writeEmbedded(XmlText& xml, const FeatureInfo& feature)
{
    if (isEmbedded(feature.type))
        writeText(xml, "EmbeddedInstance", feature.referenceClass);
}

/// Writes an element whose attributes the view may widen by the class that declares it.
template <class Content>
void writeFeature(XmlText& xml, const char* element, const ClassInfo& info, const ClassView& view,
                  std::string_view name, XmlAttribute kind, const ClassInfo* origin, Content content)
{
    const bool inherited = origin && origin != &info;
    if (view.origin && origin)
        xml.open(element,
                 {{"NAME", name}, kind, {"CLASSORIGIN", origin->name}, {"PROPAGATED", inherited ? "true" : "false"}});
    else
        xml.open(element, {{"NAME", name}, kind});
    content();
    xml.close(element);
}

void writeDeclaration(XmlText& xml, const ClassInfo& info, const FeatureInfo& feature, const ClassView& view)
{
    const bool array = feature.type & CMPI_ARRAY;
    const std::string type = xmlType(feature.type);
    const XmlAttribute kind =
        feature.isReference() ? XmlAttribute{"REFERENCECLASS", feature.referenceClass} : XmlAttribute{"TYPE", type};
    const char* element = feature.isReference() ? "PROPERTY.REFERENCE" : array ? "PROPERTY.ARRAY" : "PROPERTY";
    writeFeature(xml, element, info, view, feature.name, kind, feature.origin,
                 [&]
                 {
                     if (view.qualifiers)
                     {
                         writeFlags(xml, feature.flags);
                         writeEmbedded(xml, feature);
                         writeTextsOf(xml, info, feature.name);
                     }
                     writeValue(xml, feature.defaultValue);
                 });
}

void writeParameter(XmlText& xml, const ClassInfo& info, const MethodInfo& method, const FeatureInfo& parameter,
                    const ClassView& view)
{
    const bool array = parameter.type & CMPI_ARRAY;
    const std::string type = xmlType(parameter.type);
    const XmlAttribute kind =
        parameter.isReference() ? XmlAttribute{"REFERENCECLASS", parameter.referenceClass} : XmlAttribute{"TYPE", type};
    const char* element = parameter.isReference() ? (array ? "PARAMETER.REFARRAY" : "PARAMETER.REFERENCE")
                          : array                 ? "PARAMETER.ARRAY"
                                                  : "PARAMETER";
    const XmlElement whole(xml, element, {{"NAME", parameter.name}, kind});
    if (!view.qualifiers)
        return;
    writeFlags(xml, parameter.flags);
    writeEmbedded(xml, parameter);
    writeTextsOf(xml, info, method.name, parameter.name);
}

void writeMethod(XmlText& xml, const ClassInfo& info, const MethodInfo& method, const ClassView& view)
{
    const std::string type = xmlType(method.returnType);
    writeFeature(xml, "METHOD", info, view, method.name, {"TYPE", type}, method.origin,
                 [&]
                 {
                     if (view.qualifiers)
                     {
                         writeFlags(xml, method.flags);
                         writeTextsOf(xml, info, method.name);
                     }
                     for (const FeatureInfo& parameter : method.parameters)
                         writeParameter(xml, info, method, parameter, view);
                 });
}

} // namespace

std::string xmlType(CMPIType type)
{
    return isEmbedded(type) ? "string" : typeText(elementType(type));
}

void writeNameSpace(XmlText& xml, std::string_view nameSpace)
{
    const XmlElement path(xml, "LOCALNAMESPACEPATH");
    while (!nameSpace.empty())
    {
        const std::size_t end = nameSpace.find('/');
        xml.leaf("NAMESPACE", "", {{"NAME", nameSpace.substr(0, end)}});
        nameSpace.remove_prefix(end == std::string_view::npos ? nameSpace.size() : end + 1);
    }
}

void writeInstanceName(XmlText& xml, const Path& path)
{
    const XmlElement name(xml, "INSTANCENAME", {{"CLASSNAME", path.className}});
    for (const Property& key : path.keys)
        writeKey(xml, key);
}

void writeInstancePath(XmlText& xml, const Path& path)
{
    const XmlElement whole(xml, "INSTANCEPATH");
    {
        const XmlElement space(xml, "NAMESPACEPATH");
        xml.leaf("HOST", hostName);
        writeNameSpace(xml, path.nameSpace);
    }
    writeInstanceName(xml, path);
}

void writeValue(XmlText& xml, const Value& value)
{
    if (value.isNull())
        return;
    const CMPIType type = elementType(value.type());
    if (!value.isArray())
        return writeElement(xml, value, type);
    const XmlElement array(xml, type == CMPI_ref ? "VALUE.REFARRAY" : "VALUE.ARRAY");
    for (const Value& element : value.asList())
        writeElement(xml, element, type);
}

void writeProperty(XmlText& xml, const Property& property, const FeatureInfo* known)
{
    const CMPIType type = known ? known->type : property.value.type();
    if (elementType(type) == CMPI_ref)
    {
        const XmlElement whole(xml, "PROPERTY.REFERENCE", {{"NAME", property.name}});
        return writeValue(xml, property.value);
    }
    const char* element = type & CMPI_ARRAY ? "PROPERTY.ARRAY" : "PROPERTY";
    const std::string typeName = type == CMPI_null ? "string" : xmlType(type);
    if (isEmbedded(type))
        xml.open(element, {{"NAME", property.name}, {"TYPE", typeName}, {"EmbeddedObject", "instance"}});
    else
        xml.open(element, {{"NAME", property.name}, {"TYPE", typeName}});
    writeValue(xml, property.value);
    xml.close(element);
}

void writeInstance(XmlText& xml, const Object& object, const ClassInfo* info)
{
    const XmlElement instance(xml, "INSTANCE", {{"CLASSNAME", object.path.className}});
    for (const Property& property : object.properties)
        writeProperty(xml, property, info ? info->property(property.name) : nullptr);
}

void writeClass(XmlText& xml, const ClassInfo& info, const ClassView& view)
{
    const auto isShown = [&](const auto& feature) { return !view.localOnly || feature.origin == &info; };
    if (info.superclass)
        xml.open("CLASS", {{"NAME", info.name}, {"SUPERCLASS", info.superclass->name}});
    else
        xml.open("CLASS", {{"NAME", info.name}});
    if (view.qualifiers)
    {
        writeFlags(xml, info.flags);
        writeText(xml, "Description", descriptionOf(info));
    }
    for (const FeatureInfo& property : info.properties)
        if (isShown(property) && (!view.shows || view.shows(property.name)))
            writeDeclaration(xml, info, property, view);
    for (const MethodInfo& method : info.methods)
        if (isShown(method))
            writeMethod(xml, info, method, view);
    xml.close("CLASS");
}

} // namespace cimxml
