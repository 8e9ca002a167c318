#include "foundation/ClientText.h"

#include <cstddef>
#include <string>

namespace cimple
{

namespace
{

unsigned byteAt(std::string_view text, std::size_t index)
{
    return static_cast<unsigned char>(text[index]);
}

/// Bytes of the character at the head of the text; 0 where there is none that XML can hold.
std::size_t characterSize(std::string_view text)
{
    const unsigned lead = byteAt(text, 0);
    if (lead < 0x80)
        return lead >= 0x20 || lead == '\t' || lead == '\n' || lead == '\r';
    if (lead < 0xC2 || lead > 0xF4)
        return 0;
    const std::size_t size = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (text.size() < size)
        return 0;
    unsigned code = lead & (0x7F >> size);
    for (std::size_t i = 1; i < size; i++)
    {
        if ((byteAt(text, i) & 0xC0) != 0x80)
            return 0;
        code = code << 6 | (byteAt(text, i) & 0x3F);
    }
    constexpr unsigned least[] = {0, 0, 0x80, 0x800, 0x10000};
    const bool isSurrogate = code >= 0xD800 && code <= 0xDFFF;
    return code < least[size] || code > 0x10FFFF || isSurrogate || code == 0xFFFE || code == 0xFFFF ? 0 : size;
}

} // namespace

String clientText(std::string_view text)
{
    std::string valid(text);
    for (std::size_t i = 0; i < valid.size();)
    {
        const std::size_t size = characterSize(std::string_view(valid).substr(i));
        if (size == 0)
            valid[i] = '?';
        i += size == 0 ? 1 : size;
    }
    return valid;
}

} // namespace cimple
