// What the commands read of the broker's answers.
#pragma once

#include "broker/tvrcim/Commands.h"
#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <cstdint>
#include <string>

namespace tvrcim
{

/// A text property; empty for a null.
inline std::string textOf(const broker::Object& object, const char* property)
{
    const broker::Json value = toJson(object.get(property));
    return value.is_string() ? value.get<std::string>() : std::string();
}

/// A number; 0 for a null.
inline std::uint64_t numberOf(const broker::Object& object, const char* property)
{
    const broker::Value& value = object.get(property);
    return value.isNull() ? 0 : value.asUnsigned();
}

} // namespace tvrcim
