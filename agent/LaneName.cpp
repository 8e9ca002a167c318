#include "agent/LaneName.h"

#include "agent/Build.h"

#include <algorithm>
#include <charconv>
#include <iterator>

namespace cimple
{

namespace
{

/// By RM_LaneOption.
constexpr std::string_view optionTexts[] = {"Driver", "Config"};
constexpr std::string_view lastPart = "PrioLane";

/// What stands before the next colon, which goes as well.
std::string_view takePart(std::string_view& text)
{
    const std::size_t colon = std::min(text.find(':'), text.size());
    const std::string_view part = text.substr(0, colon);
    text.remove_prefix(std::min(colon + 1, text.size()));
    return part;
}

} // namespace

String laneNamePrefix(const LanePath& path, std::uint32_t option)
{
    return joinTexts({optionTexts[option], ":", path.initiator, ":", path.target});
}

String laneName(const Lane& lane)
{
    return joinTexts({laneNamePrefix(lane.path, lane.option).view(), ":", std::to_string(lane.unit), ":", lastPart});
}

LaneNameParts splitLaneName(std::string_view name)
{
    LaneNameParts parts;
    parts.option = takePart(name);
    parts.initiator = takePart(name);
    parts.target = takePart(name);
    parts.rest = name;
    return parts;
}

std::optional<std::uint32_t> laneOptionOf(std::string_view text)
{
    const auto place = std::ranges::find(optionTexts, text);
    if (place == std::end(optionTexts))
        return std::nullopt;
    return static_cast<std::uint32_t>(place - optionTexts);
}

bool isPlainWwpn(std::string_view text)
{
    constexpr std::size_t digits = 16;
    return text.size() == digits && text.find_first_not_of("0123456789ABCDEF") == text.npos;
}

std::optional<Lane> parseLane(std::string_view name)
{
    const LaneNameParts parts = splitLaneName(name);
    const auto option = laneOptionOf(parts.option);
    if (!option || !isPlainWwpn(parts.initiator) || !isPlainWwpn(parts.target))
        return std::nullopt;
    Lane lane{{std::string(parts.initiator), std::string(parts.target)}, *option};
    std::from_chars(parts.rest.data(), parts.rest.data() + parts.rest.size(), lane.unit);
    // Signs, leading zeros, numbers that do not fit and whatever else follows show in the name that this lane has.
    if (lane.unit > maxLaneUnit || laneName(lane).view() != name)
        return std::nullopt;
    return lane;
}

} // namespace cimple
