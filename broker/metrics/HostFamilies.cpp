#include "broker/metrics/HostFamilies.h"

#include "broker/health/PortCounters.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>
#include <map>

namespace metrics
{

using namespace broker;

namespace
{

// --- values -------------------------------------------------------------------------------------------------------

constexpr auto counter = prometheus::MetricType::Counter;
constexpr auto gauge = prometheus::MetricType::Gauge;

std::string textOf(const Value& value)
{
    return value.isNull() ? std::string() : valueText(value);
}

std::string textOf(const Object& object, const char* property)
{
    return textOf(object.get(property));
}

/// A number in the family's unit, without the last digits of a double, in which a division errs.
double inUnitOf(const FamilyRow& row, double number)
{
    if (row.divisor == 1)
        return number;
    double quotient = number / row.divisor;
    std::array<char, 32> text{};
    const auto end = std::to_chars(text.data(), text.data() + text.size(), quotient, std::chars_format::general,
                                   std::numeric_limits<double>::digits10)
                         .ptr;
    std::from_chars(text.data(), end, quotient);
    return quotient;
}

std::optional<double> quantity(const Object& object, const FamilyRow& row, const char* property)
{
    const auto found = numberOf(object, property);
    return found ? std::optional(inUnitOf(row, *found)) : std::nullopt;
}

/// The one of OtherIdentifyingInfo that a description stands for.
std::string identified(const Object& object, std::string_view description)
{
    const Value* value = besideText(object, "OtherIdentifyingInfo", "IdentifyingDescriptions", description);
    return value ? textOf(*value) : std::string();
}

Labels with(Labels labels, const Labels& further)
{
    labels.insert(labels.end(), further.begin(), further.end());
    return labels;
}

// --- what tells an instance ---------------------------------------------------------------------------------------

template <const auto& Name, const auto& Property> Labels keyed(const Object& object)
{
    return {{Name, textOf(object, Property)}};
}

constexpr char port[] = "port";
constexpr char card[] = "card";
constexpr char chip[] = "chip";
constexpr char tag[] = "Tag";
constexpr char deviceId[] = "DeviceID";
constexpr char elementName[] = "ElementName";

/// A transceiver's tag is its port and its serial number.
Labels portOfTransceiver(const Object& object)
{
    const std::string text = textOf(object, tag);
    return {{port, text.substr(0, text.find(':'))}};
}

Labels nothing(const Object&)
{
    return {};
}

// --- samples of an instance ---------------------------------------------------------------------------------------

void number(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    if (const auto value = quantity(object, row, row.property))
        series.add(row, labels, *value);
}

void isUp(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const PortState* state = portState(object);
    series.add(row, labels, state && state->up);
}

/// 0 is the speed of no link, and the one of a link of which the adapter does not tell it.
void linkSpeed(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const PortState* state = portState(object);
    const auto value = quantity(object, row, row.property);
    if (value && (*value > 0 || !(state && state->up)))
        series.add(row, labels, *value);
}

void needsReset(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const PortState* state = portState(object);
    series.add(row, labels, state && state->needsReset);
}

void states(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const PortState* present = portState(object);
    for (const PortState& state : portStates())
        series.add(row, with(labels, {{"state", state.text}}), &state == present);
    series.add(row, with(labels, {{"state", "unknown"}}), !present);
}

void portInfo(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    series.add(row,
               with(labels, {{"chip", identified(object, "SerialNumber + Sub-AdapterID")},
                             {"description", textOf(object, "Description")},
                             {"device", identified(object, "OS Device Name")},
                             {"fabric", textOf(object, "FabricName")},
                             {"firmware", textOf(object, "OperationalFirmware")}}),
               1);
}

void cardInfo(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    series.add(row,
               with(labels, {{"model", textOf(object, "Model")},
                             {"part_number", textOf(object, "PartNumber")},
                             {"serial_number", textOf(object, "SerialNumber")},
                             {"hardware_version", textOf(object, "Version")}}),
               1);
}

void transceiverInfo(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    series.add(row,
               with(labels, {{"manufacturer", textOf(object, "Manufacturer")},
                             {"part_number", textOf(object, "PartNumber")},
                             {"serial_number", textOf(object, "SerialNumber")}}),
               1);
}

void measured(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    if (const auto value = quantity(object, row, row.measure->value))
        series.add(row, labels, *value);
}

void thresholds(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const Limits limits = limitsOf(object, *row.measure).value_or(Limits{});
    const std::pair<const char*, std::optional<double>> named[] = {{"high alarm", limits.highAlarm},
                                                                   {"high warning", limits.highWarning},
                                                                   {"low warning", limits.lowWarning},
                                                                   {"low alarm", limits.lowAlarm}};
    for (const auto& [name, limit] : named)
        if (limit)
            series.add(row, with(labels, {{"threshold", name}}), inUnitOf(row, *limit));
}

/// A value beyond the limit of the alarm is beyond that of the warning as well.
void beyond(Series& series, const FamilyRow& row, const Object& object, const Labels& labels)
{
    const auto excess = excessOf(object, *row.measure);
    if (!excess)
        return;
    const bool alarm = excess == Excess::aboveAlarm || excess == Excess::belowAlarm;
    series.add(row, with(labels, {{"measure", row.measure->name}, {"level", "warning"}}), excess != Excess::none);
    series.add(row, with(labels, {{"measure", row.measure->name}, {"level", "alarm"}}), alarm);
}

// --- software -----------------------------------------------------------------------------------------------------

/// Empty for software of the host.
std::string portOfSoftware(const Object& object)
{
    const Value* wwpn = besideText(object, "IdentityInfoValue", "IdentityInfoType", "TAVRIN:PORT_WWPN");
    return wwpn ? textOf(*wwpn) : std::string();
}

/// Software of a kind by its name and version; firmware by its port too.
template <Software Classification>
void version(Series& series, const FamilyRow& row, const Object& object, const Labels&)
{
    Labels labels{{"name", textOf(object, "Name")}, {"version", textOf(object, "VersionString")}};
    if (!isClassified(object, Classification) || labels.back().second.empty())
        return;
    if (const std::string wwpn = portOfSoftware(object); !wwpn.empty())
        labels.emplace(labels.begin(), port, wwpn);
    series.add(row, labels, 1);
}

constexpr FamilyName firmwareWaiting{"tavrin_fc_port_firmware_waiting", gauge,
                                     "Whether the port starts with other firmware after a reset of its adapter."};

void waiting(Series& series, const std::vector<Object>& objects)
{
    std::map<std::string, std::vector<const Object*>> ports;
    for (const Object& object : objects)
        if (const std::string wwpn = portOfSoftware(object); !wwpn.empty())
            ports[wwpn].push_back(&object);
    for (const auto& [wwpn, software] : ports)
        series.add(firmwareWaiting, {{port, wwpn}}, !waitingFirmware(software).empty());
}

// --- the tables ---------------------------------------------------------------------------------------------------

constexpr double bitsPerByte = 8;
constexpr double thousandths = 1000;

constexpr FamilyRow numbers(const char* name, const char* property, double divisor, const char* help)
{
    return {{name, gauge, help}, number, property, divisor};
}

constexpr FamilyRow measures(const char* name, FamilyRow::Read read, const Measure& measure, const char* help,
                             double divisor = 1)
{
    return {{name, gauge, help}, read, "", divisor, &measure};
}

constexpr FamilyRow portFamilies[] = {
    {{"tavrin_fc_port_up", gauge, "Whether the port has a link."}, isUp},
    {{"tavrin_fc_port_state", gauge, "1 for the state that the port is in, 0 for all others."}, states},
    {{"tavrin_fc_port_reset_needed", gauge, "Whether the adapter waits for a reset."}, needsReset},
    {{"tavrin_fc_port_speed_bytes_per_second", gauge, "Speed of the link, where it is known; 0 without a link."},
     linkSpeed,
     "Speed",
     bitsPerByte},
    numbers("tavrin_fc_port_max_speed_bytes_per_second", "MaxSpeed", bitsPerByte, "The fastest speed of the port."),
    numbers("tavrin_fc_port_discovered_ports", "NumberOfDiscoveredPorts", 1,
            "Other ports that the port has found in the fabric."),
    {{"tavrin_fc_port_info", gauge, "What a port is and where it is."}, portInfo},
};

constexpr auto statisticsFamilies = []
{
    std::array<FamilyRow, std::size(counterRows)> rows{};
    std::ranges::transform(counterRows, rows.begin(),
                           [](const CounterRow& row) -> FamilyRow {
                               return {{row.family, counter, row.help}, number, row.property};
                           });
    return rows;
}();

constexpr FamilyRow cardFamilies[] = {
    {{"tavrin_fc_card_info", gauge, "What a card is."}, cardInfo},
};

constexpr FamilyRow chipFamilies[] = {
    measures("tavrin_fc_board_temperature_celsius", measured, boardTemperature, "Temperature of the board."),
    measures("tavrin_fc_board_temperature_threshold_celsius", thresholds, boardTemperature,
             "Limits of the board's temperature."),
    measures("tavrin_fc_board_beyond_threshold", beyond, boardTemperature,
             "Whether a value of the board is beyond its limit."),
};

constexpr const Measure& temperature = transceiverMeasures[0];
constexpr const Measure& voltage = transceiverMeasures[1];
constexpr const Measure& biasCurrent = transceiverMeasures[2];
constexpr const Measure& transmitPower = transceiverMeasures[3];
constexpr const Measure& receivePower = transceiverMeasures[4];

constexpr const char* beyondLimit = "tavrin_fc_transceiver_beyond_threshold";
constexpr const char* beyondHelp = "Whether a value of the transceiver is beyond its limit.";

constexpr FamilyRow transceiverFamilies[] = {
    {{"tavrin_fc_transceiver_info", gauge, "What a transceiver is."}, transceiverInfo},
    measures("tavrin_fc_transceiver_temperature_celsius", measured, temperature, "Temperature of the transceiver."),
    measures("tavrin_fc_transceiver_temperature_threshold_celsius", thresholds, temperature,
             "Limits of the transceiver's temperature."),
    measures("tavrin_fc_transceiver_voltage_volts", measured, voltage, "Supply voltage of the transceiver."),
    measures("tavrin_fc_transceiver_voltage_threshold_volts", thresholds, voltage, "Limits of the supply voltage."),
    measures("tavrin_fc_transceiver_bias_current_amperes", measured, biasCurrent, "Bias current of the laser.",
             thousandths),
    measures("tavrin_fc_transceiver_bias_current_threshold_amperes", thresholds, biasCurrent,
             "Limits of the bias current.", thousandths),
    measures("tavrin_fc_transceiver_transmit_power_watts", measured, transmitPower, "Optical power that is sent.",
             thousandths),
    measures("tavrin_fc_transceiver_transmit_power_threshold_watts", thresholds, transmitPower,
             "Limits of the power that is sent.", thousandths),
    measures("tavrin_fc_transceiver_receive_power_watts", measured, receivePower, "Optical power that is received.",
             thousandths),
    measures("tavrin_fc_transceiver_receive_power_threshold_watts", thresholds, receivePower,
             "Limits of the power that is received.", thousandths),
    measures(beyondLimit, beyond, temperature, beyondHelp),
    measures(beyondLimit, beyond, voltage, beyondHelp),
    measures(beyondLimit, beyond, biasCurrent, beyondHelp),
    measures(beyondLimit, beyond, transmitPower, beyondHelp),
    measures(beyondLimit, beyond, receivePower, beyondHelp),
};

constexpr FamilyRow softwareFamilies[] = {
    {{"tavrin_fc_firmware_info", gauge, "Firmware of a port: what runs and what it starts with next."},
     version<Software::firmware>},
    {{"tavrin_fc_driver_info", gauge, "The driver of the adapters."}, version<Software::driver>},
    {{"tavrin_fc_provider_info", gauge, "The provider module."}, version<Software::application>},
};

constexpr SourceRow sources[] = {
    {"TVRHBA_FCPort", keyed<port, deviceId>, portFamilies},
    {"TVRHBA_FCPortStatistics", keyed<port, elementName>, statisticsFamilies},
    {"TVRHBA_Card", keyed<card, tag>, cardFamilies},
    {"TVRHBA_Chip", keyed<chip, tag>, chipFamilies},
    {"TVRHBA_Transceiver", portOfTransceiver, transceiverFamilies},
    {"TVRHBA_SoftwareIdentity", nothing, softwareFamilies, waiting},
};

} // namespace

std::span<const SourceRow> hostSources()
{
    return sources;
}

void read(Series& series, const SourceRow& source, const std::vector<Object>& objects)
{
    for (const FamilyRow& row : source.families)
        for (const Object& object : objects)
            row.read(series, row, object, source.labels(object));
    if (source.together)
        source.together(series, objects);
}

} // namespace metrics
