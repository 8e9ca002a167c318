#include "broker/values/OneLine.h"

#include "broker/values/Utf8.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <string_view>
#include <utility>

namespace broker
{

namespace
{

/// Of characters beyond ASCII: those that control terminals, turn the text around, break its line, or show nothing.
constexpr std::pair<char32_t, char32_t> unseen[] = {{0x80, 0x9F},     {0xAD, 0xAD},     {0x61C, 0x61C},
                                                    {0x200B, 0x200F}, {0x2028, 0x202E}, {0x2060, 0x2069},
                                                    {0xFEFF, 0xFEFF}, {0xFFF9, 0xFFFB}};

/// The number of a character of several bytes.
char32_t codePoint(std::string_view character)
{
    constexpr unsigned bitsOfByte = 6;
    char32_t code = static_cast<unsigned char>(character[0]) & (0x7FU >> character.size());
    for (const char c : character.substr(1))
        code = code << bitsOfByte | (static_cast<unsigned char>(c) & 0x3FU);
    return code;
}

/// Length of the character of several bytes at the head; 0 if there is none, or one that is not seen.
std::size_t printableCharacter(std::string_view text)
{
    const std::size_t length = longCharacter(text);
    const char32_t code = length == 0 ? 0 : codePoint(text.substr(0, length));
    const bool isUnseen =
        std::ranges::any_of(unseen, [&](const auto& range) { return code >= range.first && code <= range.second; });
    return isUnseen ? 0 : length;
}

} // namespace

std::string oneLine(const std::string& text)
{
    std::string result;
    for (std::string_view rest = text; !rest.empty();)
    {
        const auto c = static_cast<unsigned char>(rest.front());
        const std::size_t length = c >= ' ' && c < 0x7f ? 1 : printableCharacter(rest);
        if (length == 0)
        {
            std::array<char, 8> escape{};
            std::snprintf(escape.data(), escape.size(), "\\x%02x", static_cast<unsigned>(c));
            result += c == '\n' ? "\\n" : c == '\t' ? "\\t" : escape.data();
        }
        result += rest.substr(0, length);
        rest.remove_prefix(std::max<std::size_t>(length, 1));
    }
    return result;
}

} // namespace broker
