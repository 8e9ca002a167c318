#include "broker/cimxml/Decode.h"

namespace cimxml
{

using namespace broker;
using pugi::xml_node;

namespace
{

[[noreturn]] void refuseDocument(const std::string& text)
{
    throw HttpRefusal(400, "request-not-well-formed", text);
}

bool isNamed(const xml_node& node, std::string_view name)
{
    return name == node.name();
}

[[noreturn]] void refuse(const xml_node& node, const std::string& what)
{
    throw std::invalid_argument((*node.name() ? node.name() : std::string("the element")) + ": " + what);
}

std::string attributeOf(const xml_node& node, const char* name)
{
    const pugi::xml_attribute attribute = node.attribute(name);
    if (!attribute)
        refuse(node, std::string("there is no ") + name);
    return attribute.value();
}

/// The depth is followed without recursion, which an attacker would choose the depth of.
void expectShallow(const xml_node& root)
{
    int depth = 0;
    xml_node node = root;
    for (;;)
    {
        if (xml_node child = node.first_child())
        {
            if (++depth > maxDepth)
                refuseDocument("elements are nested too deeply");
            node = child;
            continue;
        }
        while (node != root && !node.next_sibling())
        {
            node = node.parent();
            --depth;
        }
        if (node == root)
            return;
        node = node.next_sibling();
    }
}

std::string textOf(const xml_node& node)
{
    std::string text;
    for (const xml_node& part : node.children())
        if (part.type() == pugi::node_pcdata || part.type() == pugi::node_cdata)
            text += part.value();
    return text;
}

/// A key whose class is not known has the type that it looks like.
CMPIType typeOfKey(const xml_node& node, std::string_view text)
{
    const std::string_view kind = node.attribute("VALUETYPE").value();
    if (kind == "boolean")
        return CMPI_boolean;
    if (kind == "numeric")
        return text.starts_with('-') ? CMPI_sint64 : CMPI_uint64;
    return CMPI_string;
}

constexpr const char* wrappers[] = {"OBJECTPATH", "INSTANCEPATH",   "LOCALINSTANCEPATH",
                                    "CLASSPATH",  "LOCALCLASSPATH", "VALUE.REFERENCE"};

bool isWrapper(const xml_node& node)
{
    for (const char* name : wrappers)
        if (isNamed(node, name))
            return true;
    return false;
}

} // namespace

void parseXml(pugi::xml_document& document, std::string_view text)
{
    // Blanks are part of values; a document type has no use here, and is left unread.
    const pugi::xml_parse_result result = document.load_buffer(
        text.data(), text.size(), pugi::parse_default | pugi::parse_ws_pcdata_single, pugi::encoding_utf8);
    if (!result)
        refuseDocument(result.description());
    expectShallow(document);
}

xml_node childOf(const xml_node& parent, const char* name)
{
    return parent.child(name);
}

xml_node firstElement(const xml_node& parent)
{
    for (const xml_node& child : parent.children())
        if (child.type() == pugi::node_element)
            return child;
    return {};
}

std::string Decoder::nameSpaceOf(const xml_node& path)
{
    if (isNamed(path, "NAMESPACEPATH"))
        return nameSpaceOf(childOf(path, "LOCALNAMESPACEPATH"));
    std::string nameSpace;
    for (const xml_node& part : path.children("NAMESPACE"))
        nameSpace += (nameSpace.empty() ? "" : "/") + attributeOf(part, "NAME");
    return nameSpace;
}

Path Decoder::path(const xml_node& node) const
{
    if (isWrapper(node))
    {
        std::string nameSpace = _nameSpace;
        for (const char* name : {"NAMESPACEPATH", "LOCALNAMESPACEPATH"})
            if (const xml_node space = childOf(node, name))
                nameSpace = nameSpaceOf(space);
        for (const xml_node& child : node.children())
            if (isWrapper(child) || isNamed(child, "INSTANCENAME") || isNamed(child, "CLASSNAME"))
                return Decoder(_classes, nameSpace).path(child);
        refuse(node, "there is no name in it");
    }
    if (isNamed(node, "CLASSNAME"))
        return {_nameSpace, attributeOf(node, "NAME"), {}};
    if (!isNamed(node, "INSTANCENAME"))
        refuse(node, "that is no object path");
    Path path{_nameSpace, attributeOf(node, "CLASSNAME"), {}};
    const ClassInfo* info = _classes.find(path.className);
    for (const xml_node& binding : node.children("KEYBINDING"))
        path.keys.push_back(key(binding, info));
    const xml_node only = firstElement(node); // DSP0201 5.2.4.5: a single key needs no name
    if (path.keys.empty() && only && info && info->keys.size() == 1)
        path.keys.push_back({info->keys[0], keyValue(only, info->property(info->keys[0]))});
    return path;
}

Property Decoder::key(const xml_node& binding, const ClassInfo* info) const
{
    const std::string name = attributeOf(binding, "NAME");
    const FeatureInfo* known = info ? info->property(name) : nullptr;
    return {known ? known->name : name, keyValue(firstElement(binding), known)};
}

Value Decoder::keyValue(const xml_node& node, const FeatureInfo* known) const
{
    if (isNamed(node, "VALUE.REFERENCE"))
        return Value::reference(path(node));
    if (!isNamed(node, "KEYVALUE"))
        refuse(node, "that is no value of a key");
    const std::string text = textOf(node);
    return parseScalar(known ? target(*known) : Target(_classes, _nameSpace, typeOfKey(node, text)), text);
}

Object Decoder::instance(const xml_node& node) const
{
    if (!isNamed(node, "INSTANCE"))
        refuse(node, "that is no INSTANCE");
    Object object;
    object.path = {_nameSpace, attributeOf(node, "CLASSNAME"), {}};
    const ClassInfo* info = _classes.find(object.path.className);
    if (!info)
        refuse(node, "there is no class '" + object.path.className + "'");
    for (const xml_node& child : node.children())
    {
        if (!std::string_view(child.name()).starts_with("PROPERTY"))
            continue;
        const std::string name = attributeOf(child, "NAME");
        const FeatureInfo* known = info->property(name);
        if (!known)
            refuse(child, info->name + " has no property '" + name + "'");
        object.set(known->name, value(child, target(*known)));
        if (known->isKey() && !object.get(known->name).isNull())
            object.path.setKey(known->name, object.get(known->name));
    }
    return object;
}

Object Decoder::namedInstance(const xml_node& node) const
{
    const xml_node name = childOf(node, "INSTANCENAME"), inside = childOf(node, "INSTANCE");
    if (!name || !inside)
        refuse(node, "INSTANCENAME and INSTANCE are needed");
    Object object = instance(inside);
    object.path = path(name);
    return object;
}

Value Decoder::value(const xml_node& parent, const Target& target) const
{
    const xml_node node = firstElement(parent);
    if (!node)
        return Value::null(target.type);
    const bool array = isNamed(node, "VALUE.ARRAY") || isNamed(node, "VALUE.REFARRAY");
    if (array != ((target.type & CMPI_ARRAY) != 0))
        refuse(node, "that is no " + typeText(target.type));
    if (!array)
        return element(node, target);
    Value::List list;
    for (const xml_node& child : node.children())
        if (child.type() == pugi::node_element)
            list.push_back(element(child, target.element()));
    return Value::array(target.element().type, std::move(list));
}

Value Decoder::element(const xml_node& node, const Target& target) const
{
    if (isNamed(node, "VALUE.NULL"))
        return Value::null(target.type);
    if (isNamed(node, "VALUE.REFERENCE") && target.type == CMPI_ref)
        return Value::reference(path(node));
    if (!isNamed(node, "VALUE") || target.type == CMPI_ref)
        refuse(node, "that is no " + typeText(target.type));
    if (target.type == CMPI_instance)
        return embedded(node);
    return parseScalar(target, textOf(node));
}

/// An instance inside of a text.
Value Decoder::embedded(const xml_node& node) const
{
    constexpr int mostEmbedded = 8;
    Decoder inside = *this;
    if (++inside._embedded > mostEmbedded)
        refuse(node, "instances are embedded too deeply");
    const std::string text = textOf(node);
    pugi::xml_document document;
    parseXml(document, text);
    return Value::instance(inside.instance(firstElement(document)));
}

} // namespace cimxml
