// JSON that clients send.
#pragma once

#include "broker/values/Json.h"

#include <string_view>

namespace web
{

inline constexpr int deepestBody = 32;
inline constexpr std::size_t mostMembers = 1000; ///< of an object: finding one takes as many steps

/// Throws ArgumentFailure for what is no JSON, or is nested more deeply or has larger objects than anybody needs.
broker::Json parseBody(std::string_view text);

} // namespace web
