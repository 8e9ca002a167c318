// Lower case of one character without the locale, through a table: the first test of every name compare.
#pragma once

#include <array>

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

} // namespace cimple
