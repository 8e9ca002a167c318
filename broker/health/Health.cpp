#include "broker/health/Health.h"

#include "broker/values/ValueText.h"

#include <algorithm>

namespace broker
{

std::string textOf(const Object& object, const std::string& property)
{
    const Value& value = object.get(property);
    return value.isNull() || value.type() != CMPI_string ? std::string() : value.asString();
}

std::optional<std::uint64_t> unsignedOf(const Object& object, const std::string& property)
{
    const Value& value = object.get(property);
    if (value.isNull() || value.isArray() || integerBits(value.type()) == 0)
        return std::nullopt;
    return value.asUnsigned();
}

std::optional<double> numberOf(const Object& object, const std::string& property)
{
    const Value& value = object.get(property);
    if (!value.isNull() && (value.type() == CMPI_real32 || value.type() == CMPI_real64))
        return decimalOf(value);
    const auto whole = unsignedOf(object, property);
    return whole ? std::optional<double>(static_cast<double>(*whole)) : std::nullopt;
}

const Value::List& listOf(const Object& object, const std::string& property)
{
    static const Value::List none;
    const Value& value = object.get(property);
    return value.isNull() || !value.isArray() ? none : value.asList();
}

const Value* besideText(const Object& object, const char* values, const char* texts, std::string_view text)
{
    const Value::List& names = listOf(object, texts);
    const Value::List& all = listOf(object, values);
    for (std::size_t i = 0; i < std::min(names.size(), all.size()); ++i)
        if (!names[i].isNull() && names[i].type() == CMPI_string && names[i].asString() == text)
            return &all[i];
    return nullptr;
}

bool isClassified(const Object& software, Software classification)
{
    const auto number = static_cast<std::uint64_t>(classification);
    return std::ranges::any_of(listOf(software, "Classifications"),
                               [&](const Value& value) { return !value.isNull() && value.asUnsigned() == number; });
}

namespace
{

std::string versionOf(std::span<const Object* const> software, std::string_view name)
{
    const auto found =
        std::ranges::find_if(software, [&](const Object* object)
                             { return isClassified(*object, Software::firmware) && textOf(*object, "Name") == name; });
    return found == software.end() ? std::string() : textOf(**found, "VersionString");
}

} // namespace

std::string waitingFirmware(std::span<const Object* const> software)
{
    const std::string running = versionOf(software, "Operational Firmware");
    const std::string onFlash = versionOf(software, "Firmware On Flash");
    return running.empty() || running == onFlash ? std::string() : onFlash;
}

namespace
{

constexpr PortState allPortStates[] = {
    {2, "up", "", true},
    {1, "link down", "LINK DOWN"}, // or bypassed, which is none either
    {10, "offline", "OFFLINE"},
    {11, "in diagnosis", "IN DIAGNOSIS"},
    {6, "error", "ERROR"},
    {32776, "loopback", "LOOPBACK"},
    {32788, "up, needs a reset", "", true, true},
    {32789, "link down, needs a reset", "LINK DOWN", false, true},
    {32790, "disabled", "DISABLED"},
};

} // namespace

std::span<const PortState> portStates()
{
    return allPortStates;
}

const PortState* portState(const Object& port)
{
    const Value::List& list = listOf(port, "OperationalStatus");
    if (list.empty() || list.front().isNull())
        return nullptr;
    const auto* row = std::ranges::find(allPortStates, list.front().asUnsigned(), &PortState::status);
    return row == std::end(allPortStates) ? nullptr : row;
}

std::optional<Limits> limitsOf(const Object& object, const Measure& measure)
{
    const auto limit = [&](const char* property) { return property ? numberOf(object, property) : std::nullopt; };
    const auto high = [&](const char* property)
    {
        const auto found = limit(property);
        return found == 0 ? std::nullopt : found;
    };
    const Limits limits{high(measure.highAlarm), high(measure.highWarning), limit(measure.lowWarning),
                        limit(measure.lowAlarm)};
    const bool any = limits.highAlarm || limits.highWarning || limits.lowWarning.value_or(0) != 0 ||
                     limits.lowAlarm.value_or(0) != 0;
    return any ? std::optional(limits) : std::nullopt;
}

std::optional<Excess> excessOf(const Object& object, const Measure& measure)
{
    const auto value = numberOf(object, measure.value);
    const auto limits = limitsOf(object, measure);
    if (!value || !limits)
        return std::nullopt;
    if (limits->highAlarm && *value >= *limits->highAlarm)
        return Excess::aboveAlarm;
    if (limits->highWarning && *value >= *limits->highWarning)
        return Excess::aboveWarning;
    if (limits->lowAlarm && *value <= *limits->lowAlarm)
        return Excess::belowAlarm;
    return limits->lowWarning && *value <= *limits->lowWarning ? Excess::belowWarning : Excess::none;
}

} // namespace broker
