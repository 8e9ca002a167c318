// Reading text: lines, words and numbers.
#pragma once

#include "runtime/base/TextLines.h"

#include <cstdint>
#include <string>
#include <string_view>

namespace cimple
{

/// The number at the start of the text in base 10, 0 if there is none. Clamped to 32 bits, so that a long row of
/// digits is out of every range.
std::int32_t parseDecimal(std::string_view text);

/// The text with its ASCII letters in lower case, in every locale.
std::string lowerCase(std::string_view text);

} // namespace cimple
