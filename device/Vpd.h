// Vital product data of a PCI function (PCI Local Bus 3.0, appendix I).
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace cimple
{

struct VpdField
{
    std::string keyword; ///< two characters
    std::string value;   ///< printable: without the padding behind it, and as hexadecimal digits where it is no text
};

/// The keyword of the identifier string, which has none of its own in the area.
inline constexpr std::string_view vpdProductKeyword = "\x82\x82";

/// The fields of an area in their order, but for the checksum and the free room, which are about the area itself. What
/// does not fit the area, or the resource that it is in, ends the walk.
std::vector<VpdField> walkVpd(std::span<const std::uint8_t> area);

/// Under which name a keyword is published.
std::string vpdName(std::string_view keyword);

} // namespace cimple
