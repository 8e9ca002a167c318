// Values, paths, instances and classes as elements of CIM-XML (DSP0201).
#pragma once

#include "broker/cimxml/XmlText.h"
#include "broker/values/ClassInfo.h"

#include <functional>
#include <string>
#include <string_view>

namespace cimxml
{

/// What stands for this host in paths. Clients print it.
inline constexpr std::string_view hostName = "localhost";

/// "string", "uint16" and the like, "reference" for one: as TYPE and PARAMTYPE have them, without the array.
std::string xmlType(CMPIType type);

void writeNameSpace(XmlText& xml, std::string_view nameSpace); ///< LOCALNAMESPACEPATH
void writeInstanceName(XmlText& xml, const broker::Path& path);
void writeInstancePath(XmlText& xml, const broker::Path& path); ///< INSTANCEPATH, with host and namespace
/// VALUE, VALUE.ARRAY, VALUE.REFERENCE or VALUE.REFARRAY; nothing for a null. Nulls among the elements of an array are
/// empty strings, and left out of any other.
void writeValue(XmlText& xml, const broker::Value& value);
/// PROPERTY, PROPERTY.ARRAY or PROPERTY.REFERENCE; `known` is its declaration, or null.
void writeProperty(XmlText& xml, const broker::Property& property, const broker::FeatureInfo* known);
/// INSTANCE; `info` is its class, or null.
void writeInstance(XmlText& xml, const broker::Object& object, const broker::ClassInfo* info);

/// Which of its features a class shows.
struct ClassView
{
    bool localOnly = false; ///< those that the class itself declares
    bool qualifiers = true;
    bool origin = false;                              ///< CLASSORIGIN and PROPAGATED
    std::function<bool(std::string_view)> shows = {}; ///< of a property's name; all without it
};

void writeClass(XmlText& xml, const broker::ClassInfo& info, const ClassView& view);

} // namespace cimxml
