// What the state and the measured values of a host's elements say: the judgement that all who show a host share.
#pragma once

#include "broker/values/Value.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

namespace broker
{

/// A text; empty for what is null or of another type.
std::string textOf(const Object& object, const std::string& property);
/// An integer that is no array; nothing for what is null or of another type.
std::optional<std::uint64_t> unsignedOf(const Object& object, const std::string& property);
/// An unsigned integer or a real.
std::optional<double> numberOf(const Object& object, const std::string& property);
/// The elements of an array; none of what is no array.
const Value::List& listOf(const Object& object, const std::string& property);

/// Of two arrays side by side, what one has where the other has that text; null if there is none.
const Value* besideText(const Object& object, const char* values, const char* texts, std::string_view text);

/// CIM_SoftwareIdentity.Classifications
enum class Software : std::uint16_t
{
    driver = 2,
    application = 5,
    firmware = 10,
    bootCode = 11,
};
bool isClassified(const Object& software, Software classification);
/// The version that a port starts with after a reset of its adapter, of what firmware it has; empty where that one runs
/// already, or where the adapter does not tell both.
std::string waitingFirmware(std::span<const Object* const> software);

/// A value of a port's OperationalStatus.
struct PortState
{
    std::uint64_t status;
    const char* text;
    const char* problem; ///< of the link; empty where that is well
    bool up = false;
    bool needsReset = false;
};
std::span<const PortState> portStates();
/// Null for a state that is none of the table's.
const PortState* portState(const Object& port);

/// A measured value, and limits that it should stay within.
struct Measure
{
    const char* name;
    const char* value;
    const char* highAlarm;
    const char* highWarning;
    const char* lowWarning = nullptr; ///< null if there is no low limit
    const char* lowAlarm = nullptr;
};
inline constexpr Measure boardTemperature{"temperature", "BoardTemperature", "ThresholdCriticalTemp",
                                          "ThresholdWarningTemp"};
inline constexpr Measure chipMeasures[] = {boardTemperature};
inline constexpr Measure transceiverMeasures[] = {
    {"temperature", "Temperature", "TemperatureHighAlarm", "TemperatureHighWarning", "TemperatureLowWarning",
     "TemperatureLowAlarm"},
    {"voltage", "Vcc", "VoltageHighAlarm", "VoltageHighWarning", "VoltageLowWarning", "VoltageLowAlarm"},
    {"bias current", "TxBiasCurrent", "CurrentHighAlarm", "CurrentHighWarning", "CurrentLowWarning", "CurrentLowAlarm"},
    {"transmit power", "TxPower", "TxPowerHighAlarm", "TxPowerHighWarning", "TxPowerLowWarning", "TxPowerLowAlarm"},
    {"receive power", "RxPower", "RxPowerHighAlarm", "RxPowerHighWarning", "RxPowerLowWarning", "RxPowerLowAlarm"},
};

/// Nothing where there is none. A low limit may be 0; a high one of 0 is none.
struct Limits
{
    std::optional<double> highAlarm, highWarning, lowWarning, lowAlarm;
};
/// Nothing where all of them are 0, as those of an element that has none.
std::optional<Limits> limitsOf(const Object& object, const Measure& measure);

enum class Excess
{
    none,
    aboveAlarm,
    aboveWarning,
    belowAlarm,
    belowWarning,
};
/// Nothing where there is no value or no limits.
std::optional<Excess> excessOf(const Object& object, const Measure& measure);

} // namespace broker
