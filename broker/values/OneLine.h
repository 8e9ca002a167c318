// Texts of others, safe to print.
#pragma once

#include <string>

namespace broker
{

/// Line breaks, other control characters, and those that turn the text around or show nothing as escapes of their
/// bytes, so that a value stays on its line, reads as it is and does nothing to the terminal; bytes that are no UTF-8
/// too.
std::string oneLine(const std::string& text);

} // namespace broker
