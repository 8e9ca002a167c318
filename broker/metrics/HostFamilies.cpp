#include "broker/metrics/HostFamilies.h"

#include "broker/values/ValueText.h"

#include <algorithm>
#include <array>
#include <charconv>

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

/// The digits that a real of 32 bits has: further ones are of no meaning.
double decimal(double real)
{
    constexpr int digits = 7;
    std::array<char, 32> text{};
    const auto end =
        std::to_chars(text.data(), text.data() + text.size(), real, std::chars_format::general, digits).ptr;
    std::from_chars(text.data(), end, real);
    return real;
}

/// The property's value in the family's unit.
std::optional<double> quantity(const Object& object, const FamilyRow& row, const char* property)
{
    const auto found = numberOf(object, property);
    if (!found)
        return std::nullopt;
    const bool isShort = object.get(property).type() == CMPI_real32;
    return isShort ? decimal(*found / row.divisor) : *found / row.divisor;
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
    const struct
    {
        const char* name;
        const char* property;
    } limits[] = {{"high alarm", row.measure->highAlarm},
                  {"high warning", row.measure->highWarning},
                  {"low warning", row.measure->lowWarning},
                  {"low alarm", row.measure->lowAlarm}};
    if (!limitsOf(object, *row.measure))
        return;
    for (const auto& limit : limits)
        if (const auto value = limit.property ? quantity(object, row, limit.property) : std::nullopt)
            series.add(row, with(labels, {{"threshold", limit.name}}), *value);
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

// CIM_SoftwareIdentity.Classifications
constexpr std::uint64_t driver = 2;
constexpr std::uint64_t application = 5;
constexpr std::uint64_t firmware = 10;

bool isClassified(const Object& object, std::uint64_t classification)
{
    return std::ranges::any_of(listOf(object, "Classifications"), [&](const Value& value)
                               { return !value.isNull() && value.asUnsigned() == classification; });
}

/// Software of a kind by its name and version; firmware by its port too.
template <std::uint64_t Classification>
void version(Series& series, const FamilyRow& row, const Object& object, const Labels&)
{
    Labels labels{{"name", textOf(object, "Name")}, {"version", textOf(object, "VersionString")}};
    if (!isClassified(object, Classification) || labels.back().second.empty())
        return;
    if (const Value* wwpn = besideText(object, "IdentityInfoValue", "IdentityInfoType", "TAVRIN:PORT_WWPN"))
        labels.emplace(labels.begin(), port, textOf(*wwpn));
    series.add(row, labels, 1);
}

// --- the tables ---------------------------------------------------------------------------------------------------

constexpr double bitsPerByte = 8;
constexpr double thousandths = 1000;

constexpr FamilyRow counts(const char* name, const char* property, const char* help)
{
    return {{name, counter, help}, number, property};
}

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
    numbers("tavrin_fc_port_speed_bytes_per_second", "Speed", bitsPerByte, "Speed of the link; 0 without one."),
    numbers("tavrin_fc_port_max_speed_bytes_per_second", "MaxSpeed", bitsPerByte, "The fastest speed of the port."),
    numbers("tavrin_fc_port_discovered_ports", "NumberOfDiscoveredPorts", 1,
            "Other ports that the port has found in the fabric."),
    {{"tavrin_fc_port_info", gauge, "What a port is and where it is."}, portInfo},
};

constexpr FamilyRow statisticsFamilies[] = {
    counts("tavrin_fc_port_transmitted_bytes_total", "BytesTransmitted", "Bytes that the port sent."),
    counts("tavrin_fc_port_received_bytes_total", "BytesReceived", "Bytes that the port received."),
    counts("tavrin_fc_port_transmitted_frames_total", "PacketsTransmitted", "Frames that the port sent."),
    counts("tavrin_fc_port_received_frames_total", "PacketsReceived", "Frames that the port received."),
    counts("tavrin_fc_port_loop_initializations_total", "LIPCount",
           "Loop initialization primitives (LIP) on the link."),
    counts("tavrin_fc_port_not_operational_sequences_total", "NOSCount",
           "Not operational sequences (NOS) on the link."),
    counts("tavrin_fc_port_error_frames_total", "ErrorFrames", "Frames received with an error."),
    counts("tavrin_fc_port_dumped_frames_total", "DumpedFrames", "Frames dropped for want of buffers of the host."),
    counts("tavrin_fc_port_link_failures_total", "LinkFailures", "Failures of the link."),
    counts("tavrin_fc_port_signal_losses_total", "LossOfSignalCounter", "Losses of the signal."),
    counts("tavrin_fc_port_synchronization_losses_total", "LossOfSyncCounter", "Losses of synchronization."),
    counts("tavrin_fc_port_primitive_sequence_errors_total", "PrimitiveSeqProtocolErrCount",
           "Errors of the primitive sequence protocol."),
    counts("tavrin_fc_port_crc_errors_total", "CRCErrors", "Frames with a wrong checksum."),
    counts("tavrin_fc_port_invalid_transmission_words_total", "InvalidTransmissionWords",
           "Invalid transmission words received."),
    counts("tavrin_fc_port_short_frames_total", "FramesTooShort", "Frames below the smallest size."),
    counts("tavrin_fc_port_long_frames_total", "FramesTooLong", "Frames above the largest size."),
    counts("tavrin_fc_port_address_errors_total", "AddressErrors", "Frames with an address that is unknown here."),
    counts("tavrin_fc_port_credits_not_provided_total", "BufferCreditNotProvided",
           "Times at which the port provided no buffer credit."),
    counts("tavrin_fc_port_credits_not_received_total", "BufferCreditNotReceived",
           "Times at which the port received no buffer credit."),
    counts("tavrin_fc_port_delimiter_errors_total", "DelimiterErrors", "Frames with a wrong delimiter."),
    counts("tavrin_fc_port_disparity_errors_total", "EncodingDisparityErrors", "Errors of the running disparity."),
    counts("tavrin_fc_port_link_resets_received_total", "LinkResetsReceived", "Link resets received."),
    counts("tavrin_fc_port_link_resets_transmitted_total", "LinkResetsTransmitted", "Link resets sent."),
    counts("tavrin_fc_port_multicast_frames_received_total", "MulticastFramesReceived", "Multicast frames received."),
    counts("tavrin_fc_port_multicast_frames_transmitted_total", "MulticastFramesTransmitted", "Multicast frames sent."),
    counts("tavrin_fc_port_fabric_busy_frames_total", "FBSYFrames", "Frames answered by a busy fabric."),
    counts("tavrin_fc_port_port_busy_frames_total", "PBSYFrames", "Frames answered by a busy port."),
    counts("tavrin_fc_port_fabric_reject_frames_total", "FRJTFrames", "Frames rejected by the fabric."),
    counts("tavrin_fc_port_port_reject_frames_total", "PRJTFrames", "Frames rejected by a port."),
    counts("tavrin_fc_port_class1_frames_received_total", "RXClass1Frames", "Frames of class 1 received."),
    counts("tavrin_fc_port_class1_frames_transmitted_total", "TXClass1Frames", "Frames of class 1 sent."),
    counts("tavrin_fc_port_class1_fabric_busy_frames_total", "Class1FBSY",
           "Frames of class 1 answered by a busy fabric."),
    counts("tavrin_fc_port_class1_port_busy_frames_total", "Class1PBSY", "Frames of class 1 answered by a busy port."),
    counts("tavrin_fc_port_class1_fabric_reject_frames_total", "Class1FRJT",
           "Frames of class 1 rejected by the fabric."),
    counts("tavrin_fc_port_class1_port_reject_frames_total", "Class1PRJT", "Frames of class 1 rejected by a port."),
    counts("tavrin_fc_port_class2_frames_received_total", "RXClass2Frames", "Frames of class 2 received."),
    counts("tavrin_fc_port_class2_frames_transmitted_total", "TXClass2Frames", "Frames of class 2 sent."),
    counts("tavrin_fc_port_class2_fabric_busy_frames_total", "Class2FBSY",
           "Frames of class 2 answered by a busy fabric."),
    counts("tavrin_fc_port_class2_port_busy_frames_total", "Class2PBSY", "Frames of class 2 answered by a busy port."),
    counts("tavrin_fc_port_class2_fabric_reject_frames_total", "Class2FRJT",
           "Frames of class 2 rejected by the fabric."),
    counts("tavrin_fc_port_class2_port_reject_frames_total", "Class2PRJT", "Frames of class 2 rejected by a port."),
    counts("tavrin_fc_port_class3_frames_received_total", "RXClass3Frames", "Frames of class 3 received."),
    counts("tavrin_fc_port_class3_frames_transmitted_total", "TXClass3Frames", "Frames of class 3 sent."),
    counts("tavrin_fc_port_class3_discarded_frames_total", "Class3FramesDiscarded", "Frames of class 3 dropped."),
    counts("tavrin_fc_port_broadcast_frames_received_total", "RXBroadcastFrames", "Broadcast frames received."),
    counts("tavrin_fc_port_broadcast_frames_transmitted_total", "TXBroadcastFrames", "Broadcast frames sent."),
};

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
     version<firmware>},
    {{"tavrin_fc_driver_info", gauge, "The driver of the adapters."}, version<driver>},
    {{"tavrin_fc_provider_info", gauge, "The provider module."}, version<application>},
};

constexpr SourceRow sources[] = {
    {"TVRHBA_FCPort", keyed<port, deviceId>, portFamilies},
    {"TVRHBA_FCPortStatistics", keyed<port, elementName>, statisticsFamilies},
    {"TVRHBA_Card", keyed<card, tag>, cardFamilies},
    {"TVRHBA_Chip", keyed<chip, tag>, chipFamilies},
    {"TVRHBA_Transceiver", portOfTransceiver, transceiverFamilies},
    {"TVRHBA_SoftwareIdentity", nothing, softwareFamilies},
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
}

} // namespace metrics
