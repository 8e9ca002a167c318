// What the values of methods mean: the names that the schema gives them.
#pragma once

#include "broker/values/ClassInfo.h"
#include "schema/ValueMaps.h"

#include <span>
#include <string>
#include <string_view>

namespace broker
{

using ValueNames = std::span<const cimple::Value_Name>;

/// The names of what a method of the class returns, or of a parameter of it, from the declaration nearest to the class
/// that has some; empty if there are none.
ValueNames valueNames(const ClassInfo& info, std::string_view method, std::string_view parameter = {});

/// The name of an integer; empty for one without, and for a value that is none.
std::string_view valueName(ValueNames names, const Value& value);

/// The value with its name, or those of an array, behind it: "5 (Invalid Parameter)".
std::string namedValueText(ValueNames names, const Value& value);

} // namespace broker
