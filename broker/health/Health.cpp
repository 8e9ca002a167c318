#include "broker/health/Health.h"

#include <algorithm>

namespace broker
{

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
        return value.asReal();
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

namespace
{

constexpr PortState allPortStates[] = {
    {2, "up", "", true},
    {1, "link down", "LINK DOWN"}, // or bypassed, which is none either
    {10, "offline", "OFFLINE"},
    {11, "in diagnosis", "IN DIAGNOSIS"},
    {6, "error", "ERROR"},
    {32776, "loopback", "LOOPBACK"},
    {32788, "up, needs a reset", "NEEDS RESET", true, true},
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
    const auto limit = [&](const char* property) { return property ? numberOf(object, property).value_or(0) : 0; };
    const Limits limits{limit(measure.highAlarm), limit(measure.highWarning), limit(measure.lowWarning),
                        limit(measure.lowAlarm)};
    const bool none =
        limits.highAlarm == 0 && limits.highWarning == 0 && limits.lowWarning == 0 && limits.lowAlarm == 0;
    return none ? std::nullopt : std::optional(limits);
}

std::optional<Excess> excessOf(const Object& object, const Measure& measure)
{
    const auto value = numberOf(object, measure.value);
    const auto limits = limitsOf(object, measure);
    if (!value || !limits)
        return std::nullopt;
    if (limits->highAlarm != 0 && *value >= limits->highAlarm)
        return Excess::aboveAlarm;
    if (limits->highWarning != 0 && *value >= limits->highWarning)
        return Excess::aboveWarning;
    if (measure.lowAlarm && *value <= limits->lowAlarm)
        return Excess::belowAlarm;
    return measure.lowWarning && *value <= limits->lowWarning ? Excess::belowWarning : Excess::none;
}

} // namespace broker
