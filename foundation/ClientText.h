// Foreign text on its way to clients.
#pragma once

#include "runtime/values/String.h"

#include <string_view>

namespace cimple
{

/// The text with a question mark for each byte that is not of a UTF-8 character, and for each control character that
/// XML, in which servers answer, cannot hold.
String clientText(std::string_view text);

} // namespace cimple
