// Priority lanes by name. A lane is a logical unit that an adapter serves before others; among the driver parameters it
// is called "Driver:<initiator>:<target>:<unit>:PrioLane" where the running driver knows of it, and "Config:..." where
// the stored configuration does.
#pragma once

#include "runtime/values/String.h"

#include <compare>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace cimple
{

/// Two ports by their WWPNs, 16 upper-case digits as in a DeviceID.
struct LanePath
{
    std::string initiator; ///< a port of the host or one of its virtual ports
    std::string target;

    auto operator<=>(const LanePath&) const = default;
};

/// The number that stands for all units of a target.
inline constexpr std::uint32_t allUnits = 256;
/// What a unit may be numbered by the operating system.
inline constexpr std::uint32_t maxLaneUnit = 0x7FFF'FFFF;

struct Lane
{
    LanePath path;
    std::uint32_t option = 0; ///< an RM_LaneOption
    std::uint32_t unit = 0;   ///< the operating system's number, or allUnits

    auto operator<=>(const Lane&) const = default;
};

/// Where the names of all lanes of a path begin, without the colon before the unit.
String laneNamePrefix(const LanePath& path, std::uint32_t option);
String laneName(const Lane& lane);

/// The parts of a name as far as they are there; they refer to its text.
struct LaneNameParts
{
    std::string_view option, initiator, target, rest;
};
LaneNameParts splitLaneName(std::string_view name);

/// Of the text "Driver" or "Config".
std::optional<std::uint32_t> laneOptionOf(std::string_view text);
/// Whether this may be a DeviceID.
bool isPlainWwpn(std::string_view text);
/// The lane of just this name; nothing for what laneName() would not write.
std::optional<Lane> parseLane(std::string_view name);

} // namespace cimple
