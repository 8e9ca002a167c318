// Names compare without case: one character through a table, without the locale, and whole names.
#pragma once

#include <array>
#include <strings.h>

namespace cimple
{

inline constexpr std::array<unsigned char, 256> lower_case = []
{
    std::array<unsigned char, 256> table{};
    for (unsigned c = 0; c < table.size(); ++c)
        table[c] = static_cast<unsigned char>(c >= 'A' && c <= 'Z' ? c - 'A' + 'a' : c);
    return table;
}();

constexpr unsigned char to_lower(char c)
{
    return lower_case[static_cast<unsigned char>(c)];
}

/// Case-insensitive name compare: first the lower-cased first characters, then strcasecmp.
inline bool eqi(const char* a, const char* b)
{
    if (!a || !b)
        return a == b;
    return to_lower(*a) == to_lower(*b) && strcasecmp(a, b) == 0;
}

} // namespace cimple
