// What the values of properties and methods mean: the names that the schema gives them.
#pragma once

#include "broker/values/SchemaText.h"

#include <string>
#include <string_view>

namespace broker
{

/// The name of an integer; empty for one without, and for a value that is none.
std::string_view valueName(ValueNames names, const Value& value);

/// The value behind its name, or those of an array: "Invalid Parameter (5)". A name that is the value stands alone.
std::string namedValueText(ValueNames names, const Value& value);

/// One value with its name behind it, for sentences: "5 (Invalid Parameter)".
std::string valueWithName(ValueNames names, const Value& value);

/// The value behind the names of its bits, or those of an array: "CRC, Signal loss (65540)".
std::string namedBitsText(ValueNames bits, const Value& value);

} // namespace broker
