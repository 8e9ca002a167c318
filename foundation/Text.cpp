#include "foundation/Text.h"

#include <algorithm>
#include <cstdlib>

namespace cimple
{

std::int32_t parseDecimal(std::string_view text)
{
    const long value = std::strtol(std::string(text).c_str(), nullptr, 10);
    return static_cast<std::int32_t>(std::clamp<long>(value, INT32_MIN, INT32_MAX));
}

std::string lowerCase(std::string_view text)
{
    std::string lower(text);
    std::ranges::transform(lower, lower.begin(),
                           [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c; });
    return lower;
}

} // namespace cimple
