// What the schema says to people of classes, properties, methods and parameters.
#pragma once

#include "broker/values/ClassInfo.h"
#include "schema/SchemaTexts.h"

#include <span>
#include <string_view>

namespace broker
{

/// The names of values, with the values that have them.
using ValueNames = std::span<const cimple::Value_Name>;

/// What instances of the class stand for; empty where its own declaration says nothing.
std::string_view descriptionOf(const ClassInfo& info);

// Of a property or method of the class, or of a parameter, from the declaration nearest to the class that has some;
// empty if none has. Names and unit of a method are those of what it returns.

std::string_view descriptionOf(const ClassInfo& info, std::string_view feature, std::string_view parameter = {});
/// The unit of a number, in the notation of the qualifier PUnit: "bit / second".
std::string_view unitOf(const ClassInfo& info, std::string_view feature, std::string_view parameter = {});
ValueNames valueNames(const ClassInfo& info, std::string_view feature, std::string_view parameter = {});
/// The names of bits, with their numbers.
ValueNames bitNames(const ClassInfo& info, std::string_view feature, std::string_view parameter = {});

} // namespace broker
