// World Wide Names as numbers, so that they can be compared and used as keys.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace tvrsim
{

/// The eight bytes of a World Wide Name, the first one most significant.
using Wwn = std::uint64_t;

Wwn fromHba(const HBA_WWN& name);
HBA_WWN toHba(Wwn name);

/// "10:00:02:7A:51:00:00:01"
std::string wwnText(Wwn name);

/// 16 hexadecimal digits, with or without a colon after each pair.
std::optional<Wwn> parseWwn(std::string_view text);

} // namespace tvrsim
