// Object paths as text: Class.key="value",key=5
//
// A namespace stands in front with a colon (root/tavrin:Class...), a host in front of that
// (//host/root/tavrin:Class...). Strings, datetimes and references are quoted, quotes and backslashes in them escaped
// by a backslash; a reference is a quoted path. Bytes that are no UTF-8 and control characters are written \xHH.
// Integers and booleans are bare.
#pragma once

#include "broker/values/ClassInfo.h"

#include <string>
#include <string_view>

namespace broker
{

/// Without host and namespace. References in it keep their namespaces.
std::string pathText(const Path& path);
/// With what it has of host and namespace.
std::string fullPathText(const Path& path);

/// References in references, where nobody needs more than two.
inline constexpr std::size_t deepestPath = 16;

/// Reads a path. Keys get the types that the class says; those of an unknown class the types that they look like. A
/// text without quotes is accepted for a string up to the next comma. Throws std::invalid_argument with the reason.
/// `depth` is how many references it is within; beyond `deepestPath` it is refused.
Path parsePath(std::string_view text, const ClassTable& classes, std::string_view defaultNameSpace,
               std::size_t depth = 0);

/// The first key of the class that the path lacks; empty if it is complete or the class unknown.
std::string missingKey(const Path& path, const ClassTable& classes);

} // namespace broker
