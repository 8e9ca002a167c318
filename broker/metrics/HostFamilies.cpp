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
    const Value::List& descriptions = listOf(object, "IdentifyingDescriptions");
    const Value::List& values = listOf(object, "OtherIdentifyingInfo");
    for (std::size_t i = 0; i < std::min(descriptions.size(), values.size()); ++i)
        if (textOf(descriptions[i]) == description)
            return textOf(values[i]);
    return {};
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

/// The one of IdentityInfoValue that a type stands for.
std::string identityInfo(const Object& object, std::string_view type)
{
    const Value::List& types = listOf(object, "IdentityInfoType");
    const Value::List& values = listOf(object, "IdentityInfoValue");
    for (std::size_t i = 0; i < std::min(types.size(), values.size()); ++i)
        if (textOf(types[i]) == type)
            return textOf(values[i]);
    return {};
}

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
    if (const std::string wwpn = identityInfo(object, "TAVRIN:PORT_WWPN"); !wwpn.empty())
        labels.emplace(labels.begin(), port, wwpn);
    series.add(row, labels, 1);
}

// --- the tables ---------------------------------------------------------------------------------------------------

constexpr double bitsPerByte = 8;
constexpr double thousandths = 1000;

constexpr FamilyRow portFamilies[] = {
    {{"tavrin_fc_port_up", gauge, "Whether the port has a link."}, isUp},
    {{"tavrin_fc_port_state", gauge, "1 for the state that the port is in, 0 for all others."}, states},
    {{"tavrin_fc_port_reset_needed", gauge, "Whether the adapter waits for a reset."}, needsReset},
    {{"tavrin_fc_port_speed_bytes_per_second", gauge, "Speed of the link; 0 without one."},
     number,
     "Speed",
     bitsPerByte},
    {{"tavrin_fc_port_max_speed_bytes_per_second", gauge, "The fastest speed of the port."},
     number,
     "MaxSpeed",
     bitsPerByte},
    {{"tavrin_fc_port_discovered_ports", gauge, "Other ports that the port has found in the fabric."},
     number,
     "NumberOfDiscoveredPorts"},
    {{"tavrin_fc_port_info", gauge, "What a port is and where it is."}, portInfo},
};

constexpr FamilyRow statisticsFamilies[] = {
    {{"tavrin_fc_port_transmitted_bytes_total", counter, "Bytes that the port sent."}, number, "BytesTransmitted"},
    {{"tavrin_fc_port_received_bytes_total", counter, "Bytes that the port received."}, number, "BytesReceived"},
    {{"tavrin_fc_port_transmitted_frames_total", counter, "Frames that the port sent."}, number, "PacketsTransmitted"},
    {{"tavrin_fc_port_received_frames_total", counter, "Frames that the port received."}, number, "PacketsReceived"},
    {{"tavrin_fc_port_loop_initializations_total", counter, "Loop initialization primitives (LIP) on the link."},
     number,
     "LIPCount"},
    {{"tavrin_fc_port_not_operational_sequences_total", counter, "Not operational sequences (NOS) on the link."},
     number,
     "NOSCount"},
    {{"tavrin_fc_port_error_frames_total", counter, "Frames received with an error."}, number, "ErrorFrames"},
    {{"tavrin_fc_port_dumped_frames_total", counter, "Frames dropped for want of buffers of the host."},
     number,
     "DumpedFrames"},
    {{"tavrin_fc_port_link_failures_total", counter, "Failures of the link."}, number, "LinkFailures"},
    {{"tavrin_fc_port_signal_losses_total", counter, "Losses of the signal."}, number, "LossOfSignalCounter"},
    {{"tavrin_fc_port_synchronization_losses_total", counter, "Losses of synchronization."},
     number,
     "LossOfSyncCounter"},
    {{"tavrin_fc_port_primitive_sequence_errors_total", counter, "Errors of the primitive sequence protocol."},
     number,
     "PrimitiveSeqProtocolErrCount"},
    {{"tavrin_fc_port_crc_errors_total", counter, "Frames with a wrong checksum."}, number, "CRCErrors"},
    {{"tavrin_fc_port_invalid_transmission_words_total", counter, "Invalid transmission words received."},
     number,
     "InvalidTransmissionWords"},
    {{"tavrin_fc_port_short_frames_total", counter, "Frames below the smallest size."}, number, "FramesTooShort"},
    {{"tavrin_fc_port_long_frames_total", counter, "Frames above the largest size."}, number, "FramesTooLong"},
    {{"tavrin_fc_port_address_errors_total", counter, "Frames with an address that is unknown here."},
     number,
     "AddressErrors"},
    {{"tavrin_fc_port_credits_not_provided_total", counter,
      "Times at which the other end had no buffer credit left to send with."},
     number,
     "BufferCreditNotProvided"},
    {{"tavrin_fc_port_credits_not_received_total", counter,
      "Times at which the port had no buffer credit left to send with."},
     number,
     "BufferCreditNotReceived"},
    {{"tavrin_fc_port_delimiter_errors_total", counter, "Frames with a wrong delimiter."}, number, "DelimiterErrors"},
    {{"tavrin_fc_port_disparity_errors_total", counter, "Errors of the running disparity."},
     number,
     "EncodingDisparityErrors"},
    {{"tavrin_fc_port_link_resets_received_total", counter, "Link resets received."}, number, "LinkResetsReceived"},
    {{"tavrin_fc_port_link_resets_transmitted_total", counter, "Link resets sent."}, number, "LinkResetsTransmitted"},
    {{"tavrin_fc_port_multicast_frames_received_total", counter, "Multicast frames received."},
     number,
     "MulticastFramesReceived"},
    {{"tavrin_fc_port_multicast_frames_transmitted_total", counter, "Multicast frames sent."},
     number,
     "MulticastFramesTransmitted"},
    {{"tavrin_fc_port_fabric_busy_frames_total", counter, "Frames answered by a busy fabric."}, number, "FBSYFrames"},
    {{"tavrin_fc_port_port_busy_frames_total", counter, "Frames answered by a busy port."}, number, "PBSYFrames"},
    {{"tavrin_fc_port_fabric_reject_frames_total", counter, "Frames rejected by the fabric."}, number, "FRJTFrames"},
    {{"tavrin_fc_port_port_reject_frames_total", counter, "Frames rejected by a port."}, number, "PRJTFrames"},
    {{"tavrin_fc_port_class1_frames_received_total", counter, "Frames of class 1 received."}, number, "RXClass1Frames"},
    {{"tavrin_fc_port_class1_frames_transmitted_total", counter, "Frames of class 1 sent."}, number, "TXClass1Frames"},
    {{"tavrin_fc_port_class1_fabric_busy_frames_total", counter, "Frames of class 1 answered by a busy fabric."},
     number,
     "Class1FBSY"},
    {{"tavrin_fc_port_class1_port_busy_frames_total", counter, "Frames of class 1 answered by a busy port."},
     number,
     "Class1PBSY"},
    {{"tavrin_fc_port_class1_fabric_reject_frames_total", counter, "Frames of class 1 rejected by the fabric."},
     number,
     "Class1FRJT"},
    {{"tavrin_fc_port_class1_port_reject_frames_total", counter, "Frames of class 1 rejected by a port."},
     number,
     "Class1PRJT"},
    {{"tavrin_fc_port_class2_frames_received_total", counter, "Frames of class 2 received."}, number, "RXClass2Frames"},
    {{"tavrin_fc_port_class2_frames_transmitted_total", counter, "Frames of class 2 sent."}, number, "TXClass2Frames"},
    {{"tavrin_fc_port_class2_fabric_busy_frames_total", counter, "Frames of class 2 answered by a busy fabric."},
     number,
     "Class2FBSY"},
    {{"tavrin_fc_port_class2_port_busy_frames_total", counter, "Frames of class 2 answered by a busy port."},
     number,
     "Class2PBSY"},
    {{"tavrin_fc_port_class2_fabric_reject_frames_total", counter, "Frames of class 2 rejected by the fabric."},
     number,
     "Class2FRJT"},
    {{"tavrin_fc_port_class2_port_reject_frames_total", counter, "Frames of class 2 rejected by a port."},
     number,
     "Class2PRJT"},
    {{"tavrin_fc_port_class3_frames_received_total", counter, "Frames of class 3 received."}, number, "RXClass3Frames"},
    {{"tavrin_fc_port_class3_frames_transmitted_total", counter, "Frames of class 3 sent."}, number, "TXClass3Frames"},
    {{"tavrin_fc_port_class3_discarded_frames_total", counter, "Frames of class 3 dropped."},
     number,
     "Class3FramesDiscarded"},
    {{"tavrin_fc_port_broadcast_frames_received_total", counter, "Broadcast frames received."},
     number,
     "RXBroadcastFrames"},
    {{"tavrin_fc_port_broadcast_frames_transmitted_total", counter, "Broadcast frames sent."},
     number,
     "TXBroadcastFrames"},
};

constexpr FamilyRow cardFamilies[] = {
    {{"tavrin_fc_card_info", gauge, "What a card is."}, cardInfo},
};

constexpr FamilyRow chipFamilies[] = {
    {{"tavrin_fc_board_temperature_celsius", gauge, "Temperature of the board."}, measured, "", 1, &boardTemperature},
    {{"tavrin_fc_board_temperature_threshold_celsius", gauge, "Limits of the board's temperature."},
     thresholds,
     "",
     1,
     &boardTemperature},
    {{"tavrin_fc_board_beyond_threshold", gauge, "Whether a value of the board is beyond its limit."},
     beyond,
     "",
     1,
     &boardTemperature},
};

constexpr const Measure* temperature = &transceiverMeasures[0];
constexpr const Measure* voltage = &transceiverMeasures[1];
constexpr const Measure* biasCurrent = &transceiverMeasures[2];
constexpr const Measure* transmitPower = &transceiverMeasures[3];
constexpr const Measure* receivePower = &transceiverMeasures[4];

constexpr FamilyName beyondLimit = {"tavrin_fc_transceiver_beyond_threshold", gauge,
                                    "Whether a value of the transceiver is beyond its limit."};

constexpr FamilyRow transceiverFamilies[] = {
    {{"tavrin_fc_transceiver_info", gauge, "What a transceiver is."}, transceiverInfo},
    {{"tavrin_fc_transceiver_temperature_celsius", gauge, "Temperature of the transceiver."},
     measured,
     "",
     1,
     temperature},
    {{"tavrin_fc_transceiver_temperature_threshold_celsius", gauge, "Limits of the transceiver's temperature."},
     thresholds,
     "",
     1,
     temperature},
    {{"tavrin_fc_transceiver_voltage_volts", gauge, "Supply voltage of the transceiver."}, measured, "", 1, voltage},
    {{"tavrin_fc_transceiver_voltage_threshold_volts", gauge, "Limits of the supply voltage."},
     thresholds,
     "",
     1,
     voltage},
    {{"tavrin_fc_transceiver_bias_current_amperes", gauge, "Bias current of the laser."},
     measured,
     "",
     thousandths,
     biasCurrent},
    {{"tavrin_fc_transceiver_bias_current_threshold_amperes", gauge, "Limits of the bias current."},
     thresholds,
     "",
     thousandths,
     biasCurrent},
    {{"tavrin_fc_transceiver_transmit_power_watts", gauge, "Optical power that is sent."},
     measured,
     "",
     thousandths,
     transmitPower},
    {{"tavrin_fc_transceiver_transmit_power_threshold_watts", gauge, "Limits of the power that is sent."},
     thresholds,
     "",
     thousandths,
     transmitPower},
    {{"tavrin_fc_transceiver_receive_power_watts", gauge, "Optical power that is received."},
     measured,
     "",
     thousandths,
     receivePower},
    {{"tavrin_fc_transceiver_receive_power_threshold_watts", gauge, "Limits of the power that is received."},
     thresholds,
     "",
     thousandths,
     receivePower},
    {beyondLimit, beyond, "", 1, temperature},
    {beyondLimit, beyond, "", 1, voltage},
    {beyondLimit, beyond, "", 1, biasCurrent},
    {beyondLimit, beyond, "", 1, transmitPower},
    {beyondLimit, beyond, "", 1, receivePower},
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
