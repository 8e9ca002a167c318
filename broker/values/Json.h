// Values, paths, instances and classes as JSON, and back.
#pragma once

#include "broker/values/ClassInfo.h"
#include "broker/values/ValueText.h"

#include <nlohmann/json_fwd.hpp>

namespace broker
{

/// Members keep their order, so that output is stable.
using Json = nlohmann::ordered_json;

/// The document, or a discarded one where the text is no JSON.
Json parseJson(std::string_view text);
/// Bytes that are no UTF-8 are replaced.
std::string jsonText(const Json& json, bool indented = false);

/// Numbers, booleans and arrays as such; strings, datetimes and references (full paths) as strings; an embedded
/// instance as an object; a real that is no number as null.
Json toJson(const Value& value);
/// {"class", "namespace", "path", "properties": {...}}
Json toJson(const Object& object);
Json toJson(const ClassInfo& info);
/// A method of the class.
Json toJson(const ClassInfo& info, const MethodInfo& method);
/// The properties alone, by name.
Json propertiesToJson(const std::vector<Property>& properties);

/// Reads a value of the target's type. Throws std::invalid_argument with the reason.
Value valueFromJson(const Target& target, const Json& json);
/// Reads {"class": ..., "properties": {...}}, with "namespace" if it differs from the given one. Throws
/// std::invalid_argument for an unknown class or property and for a value of the wrong type.
Object objectFromJson(const ClassTable& classes, std::string_view nameSpace, const Json& json);

} // namespace broker
