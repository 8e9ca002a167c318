// UTF-8 in texts that may hold anything.
#pragma once

#include <cstddef>
#include <string_view>

namespace broker
{

/// Length of the character of several bytes at the head of the text, which is not empty; 0 if there is none.
std::size_t longCharacter(std::string_view text);

} // namespace broker
