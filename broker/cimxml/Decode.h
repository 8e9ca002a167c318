// Elements of CIM-XML (DSP0201) as values, paths and instances. What a client wrote may be anything.
#pragma once

#include "broker/values/ValueText.h"

#include <pugixml.hpp>

#include <stdexcept>
#include <string>
#include <string_view>

namespace cimxml
{

/// What is no request that a server processes: an HTTP status, and the CIMError header (DSP0200 7.3.1).
class HttpRefusal : public std::runtime_error
{
public:
    HttpRefusal(int httpStatus, const char* cimError, const std::string& text)
        : std::runtime_error(text), status(httpStatus), header(cimError)
    {}
    int status;
    const char* header;
};

/// Deeper elements are refused, which bounds what reading them takes.
inline constexpr int maxDepth = 64;

/// Reads a text as XML, without document types. Throws HttpRefusal for one that is not well-formed, or too deep.
void parseXml(pugi::xml_document& document, std::string_view text);

/// The only element inside of `parent` of that name; a null node if it has none. Names are as DSP0201 writes them.
pugi::xml_node childOf(const pugi::xml_node& parent, const char* name);
/// The first element inside; a null node if it has none.
pugi::xml_node firstElement(const pugi::xml_node& parent);

/// Reads elements for one namespace, with the types that the classes give. Everything throws std::invalid_argument,
/// with the reason, for what does not fit.
class Decoder
{
public:
    Decoder(const broker::ClassTable& classes, std::string_view nameSpace) : _classes(classes), _nameSpace(nameSpace) {}

    /// LOCALNAMESPACEPATH, or a NAMESPACEPATH around it.
    static std::string nameSpaceOf(const pugi::xml_node& path);
    /// INSTANCENAME or CLASSNAME, or one of the paths that hold them.
    broker::Path path(const pugi::xml_node& node) const;
    /// INSTANCE. Its path has the class, and the keys among the properties.
    broker::Object instance(const pugi::xml_node& node) const;
    /// VALUE.NAMEDINSTANCE, with the path that it names.
    broker::Object namedInstance(const pugi::xml_node& node) const;
    /// What stands inside of an element, as a value of that type: VALUE, VALUE.ARRAY, VALUE.REFERENCE, VALUE.REFARRAY;
    /// a null of it where nothing does.
    broker::Value value(const pugi::xml_node& parent, const broker::Target& target) const;

private:
    broker::Property key(const pugi::xml_node& binding, const broker::ClassInfo* info) const;
    broker::Value keyValue(const pugi::xml_node& node, const broker::FeatureInfo* known) const;
    broker::Value element(const pugi::xml_node& node, const broker::Target& target) const;
    broker::Value embedded(const pugi::xml_node& node) const;
    broker::Target target(const broker::FeatureInfo& feature) const { return {_classes, _nameSpace, feature}; }

    const broker::ClassTable& _classes;
    std::string _nameSpace;
    int _embedded = 0; ///< instances around, each inside of a text
};

} // namespace cimxml
