#include "simulator/Wwn.h"

#include <charconv>
#include <cstdio>

namespace tvrsim
{

Wwn fromHba(const HBA_WWN& name)
{
    Wwn value = 0;
    for (std::uint8_t byte : name.wwn)
        value = value << 8 | byte;
    return value;
}

HBA_WWN toHba(Wwn name)
{
    HBA_WWN out;
    for (int i = 7; i >= 0; --i, name >>= 8)
        out.wwn[i] = static_cast<std::uint8_t>(name);
    return out;
}

std::string wwnText(Wwn name)
{
    const HBA_WWN bytes = toHba(name);
    char text[24];
    const HBA_UINT8* b = bytes.wwn;
    std::snprintf(text, sizeof text, "%02X:%02X:%02X:%02X:%02X:%02X:%02X:%02X", b[0], b[1], b[2], b[3], b[4], b[5],
                  b[6], b[7]);
    return text;
}

std::optional<Wwn> parseWwn(std::string_view text)
{
    std::string digits;
    const bool colons = text.size() == 23;
    for (std::size_t i = 0; i < text.size(); ++i)
        if (!colons || i % 3 != 2)
            digits += text[i];
        else if (text[i] != ':')
            return std::nullopt;
    Wwn value = 0;
    const char* end = digits.data() + digits.size();
    const auto [stop, error] = std::from_chars(digits.data(), end, value, 16);
    if (digits.size() != 16 || error != std::errc() || stop != end)
        return std::nullopt;
    return value;
}

} // namespace tvrsim
