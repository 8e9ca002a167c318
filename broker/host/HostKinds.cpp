#include "broker/host/HostKinds.h"

#include "broker/host/ReadableText.h"
#include "broker/values/ValueText.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <optional>
#include <stdexcept>

namespace broker
{

namespace
{

// --- values ---------------------------------------------------------------------------------------------------

std::string textOf(const Value& value)
{
    return value.isNull() ? std::string() : withSingleBlanks(valueText(value));
}

std::string hexadecimal(std::uint64_t number, int digits)
{
    std::array<char, 32> text{};
    std::snprintf(text.data(), text.size(), "0x%0*llX", digits, static_cast<unsigned long long>(number));
    return text.data();
}

// --- texts of facts -----------------------------------------------------------------------------------------------

std::string plain(const Object& object, const FactRow& row)
{
    return textOf(object.get(row.property));
}

std::string id(const Object& object, const FactRow& row)
{
    const auto number = unsignedOf(object, row.property);
    return number ? hexadecimal(*number, 4) : std::string();
}

/// The address of a port in a fabric, which one without a link does not have.
std::string fabricAddress(const Object& object, const FactRow& row)
{
    const auto number = unsignedOf(object, row.property);
    return number.value_or(0) ? hexadecimal(*number, 6) : std::string();
}

/// A name that is no name if it is 0.
std::string worldWideName(const Object& object, const FactRow& row)
{
    const std::string text = plain(object, row);
    return text.find_first_not_of('0') == std::string::npos ? std::string() : text;
}

std::string speed(const Object& object, const FactRow& row)
{
    return speedText(unsignedOf(object, row.property).value_or(0));
}

std::string size(const Object& object, const FactRow& row)
{
    const auto bytes = unsignedOf(object, row.property);
    return bytes ? sizeText(*bytes) : std::string();
}

/// A number with its unit.
std::string measure(const Object& object, const FactRow& row)
{
    const std::string text = plain(object, row);
    return text.empty() ? text : text + " " + row.detail;
}

std::string temperature(const Object& object, const FactRow& row)
{
    const std::string text = plain(object, row);
    const std::string unit = textOf(object.get("TemperatureUnit"));
    return text.empty() ? text : text + " " + (unit == "Celsius" ? "°C" : unit);
}

std::string first(const Object& object, const FactRow& row)
{
    const Value::List& list = listOf(object, row.property);
    return list.empty() ? std::string() : textOf(list.front());
}

/// The one of OtherIdentifyingInfo that the row's detail describes.
std::string identified(const Object& object, const FactRow& row)
{
    const Value* value = besideText(object, row.property, "IdentifyingDescriptions", row.detail);
    return value ? textOf(*value) : std::string();
}

std::string yes(const Object& object, const FactRow& row)
{
    const Value& value = object.get(row.property);
    return !value.isNull() && value.type() == CMPI_boolean && value.asBoolean() ? row.detail : "";
}

std::string beacon(const Object& object, const FactRow& row)
{
    constexpr std::uint64_t on = 2;
    return unsignedOf(object, row.property) == on ? "on" : "";
}

std::string type(const Object& object, const FactRow& row)
{
    const std::string text = plain(object, row);
    constexpr std::size_t letters = 2; // of N, NL, F, ...; what is longer says itself what it is
    return text.size() <= letters && !text.empty() ? text + " port" : text == "Unknown" ? "" : text;
}

// --- states and problems ----------------------------------------------------------------------------------------

std::string state(const Object& object, const FactRow&)
{
    const PortState* row = portState(object);
    return row ? row->text : "state unknown";
}

/// A port that is down without anybody's having wanted it.
bool isLost(const PortState& state)
{
    constexpr std::uint64_t wanted[] = {11, 32776, 32790}; // in diagnosis, loopback, disabled
    return !state.up && std::ranges::find(wanted, state.status) == std::end(wanted);
}

std::vector<Problem> portProblems(const Object& port)
{
    const PortState* row = portState(port);
    if (!row)
        return {{"STATE UNKNOWN"}};
    std::vector<Problem> problems;
    if (*row->problem)
        problems.push_back({row->problem, isLost(*row)});
    if (row->needsReset)
        problems.push_back({"NEEDS RESET"});
    return problems;
}

/// "ABOVE WARNING" and the like; empty for a value within the limits.
const char* excessText(Excess excess)
{
    switch (excess)
    {
    case Excess::aboveAlarm:
        return "ABOVE CRITICAL";
    case Excess::aboveWarning:
        return "ABOVE WARNING";
    case Excess::belowAlarm:
        return "BELOW CRITICAL";
    case Excess::belowWarning:
        return "BELOW WARNING";
    case Excess::none:
        break;
    }
    return "";
}

template <const auto& Rows> std::vector<Problem> measureProblems(const Object& object)
{
    std::vector<Problem> problems;
    for (const Measure& row : Rows)
        if (const auto excess = excessOf(object, row); excess.value_or(Excess::none) != Excess::none)
            problems.push_back({inCapitals(row.name) + " " + excessText(*excess),
                                *excess == Excess::aboveAlarm || *excess == Excess::belowAlarm});
    return problems;
}

// --- the tables ---------------------------------------------------------------------------------------------------

const std::vector<FactRow> softwareFacts = {{"version", "VersionString", plain, inLine}};

const std::vector<FactRow> unitFacts = {
    {"capacity", "Capacity", size, inLine | pictured},
    {"device", "OtherIdentifyingInfo", first, inLine},
    {"description", "Description", plain, inLine | pictured},
};

const KindRow allKinds[] = {
    {hostKind,
     "computer systems",
     nullptr,
     "Name",
     {{"class", "Class", plain}, {"namespace", "NameSpace", plain}, {"chassis", "Chassis", plain}}},
    {"Driver", "drivers", "TVRHBA_SoftwareIdentity", "Name", softwareFacts, Appears::itself, nullptr, Software::driver},
    {"Provider", "providers", "TVRHBA_SoftwareIdentity", "Name", softwareFacts, Appears::itself, nullptr,
     Software::application},
    {"Product",
     "products",
     "TVRHBA_Product",
     "Name",
     {{"description", "Description", plain},
      {"vendor", "Vendor", plain},
      {"serial number", "IdentifyingNumber", plain},
      {"hardware version", "Version", plain}}},
    {"Card",
     "cards",
     "TVRHBA_Card",
     "ElementName",
     {{"model", "Model", plain, pictured},
      {"part number", "PartNumber", plain},
      {"serial number", "SerialNumber", plain, pictured | labelled},
      {"version", "Version", plain},
      {"SLI mode", "SLIMode", plain}}},
    {"Chip",
     "chips",
     "TVRHBA_Chip",
     "ElementName",
     {{"temperature", "BoardTemperature", temperature, inLine},
      {"warning at", "ThresholdWarningTemp", temperature, inLine | labelled},
      {"critical at", "ThresholdCriticalTemp", temperature, inLine | labelled}},
     Appears::itself,
     measureProblems<chipMeasures>},
    {"Connector",
     "connectors",
     "TVRHBA_PhysicalConnector",
     "ElementName",
     {{"port", "OtherIdentifyingInfo", plain, inLine}}},
    {"Port controller", "port controllers", "TVRHBA_PortController", "DeviceID", {}, Appears::through},
    {"FC port",
     "FC ports",
     "TVRHBA_FCPort",
     "DeviceID",
     {{"state", "OperationalStatus", state, inLine | pictured},
      {"speed", "Speed", speed, inLine | pictured},
      {"type", "OtherPortType", type, inLine},
      {"fabric", "FabricName", worldWideName, inLine | labelled | pictured},
      {"name", "ElementName", plain},
      {"node WWN", "OtherIdentifyingInfo", identified, below, "NodeWWN"},
      {"device", "OtherIdentifyingInfo", identified, below, "OS Device Name"},
      {"FC ID", "FCID", fabricAddress},
      {"fastest speed", "MaxSpeed", speed},
      {"discovered ports", "NumberOfDiscoveredPorts", plain},
      {"beacon", "LocationIndicator", beacon}},
     Appears::itself,
     portProblems},
    {"Transceiver",
     "transceivers",
     "TVRHBA_Transceiver",
     "PartNumber",
     {{"manufacturer", "Manufacturer", plain, inLine},
      {"serial number", "SerialNumber", plain, inLine | labelled},
      {"temperature", "Temperature", temperature, inLine},
      {"voltage", "Vcc", measure, below, "V"},
      {"bias current", "TxBiasCurrent", measure, below, "mA"},
      {"transmit power", "TxPower", measure, below, "mW"},
      {"receive power", "RxPower", measure, below, "mW"},
      {"wave length", "WaveLength", measure, below, "nm"}},
     Appears::itself,
     measureProblems<transceiverMeasures>},
    {"Firmware", "firmware identities", "TVRHBA_SoftwareIdentity", "Name", softwareFacts, Appears::itself, nullptr,
     Software::firmware},
    {"Boot image", "boot images", "TVRHBA_SoftwareIdentity", "Name", softwareFacts, Appears::itself, nullptr,
     Software::bootCode},
    {"Flash image",
     "flash images",
     "TVRHBA_FlashImageSoftwareIdentity",
     "Name",
     {{"version", "VersionString", plain, inLine},
      {"size", "ProgramLength", size, inLine},
      {"description", "Description", plain, inLine},
      {"wakeup", "IsWakeupParameter", yes, inLine, "runs at the next start"}}},
    {"Initiator", "initiators", "TVRHBA_SCSIProtocolInitiatorEndpoint", "Name", {}, Appears::through},
    {"Virtual port",
     "virtual ports",
     "TVRHBA_VirtualFCPort",
     "DeviceID",
     {{"state", "OperationalStatus", state, inLine | pictured},
      {"speed", "Speed", speed, inLine},
      {"fabric", "OtherIdentifyingInfo", identified, inLine | labelled, "Fabric Name"},
      {"name", "ElementName", plain},
      {"node WWN", "OtherIdentifyingInfo", identified, below, "NodeWWN"},
      {"FC ID", "OtherIdentifyingInfo", identified, below, "FC ID"},
      {"virtual machine", "OtherIdentifyingInfo", identified, pictured | labelled, "Virtual Machine Name"}},
     Appears::itself,
     portProblems},
    {targetKind, "targets", nullptr, "Name", {}, Appears::summed},
    {"Volume", "volumes", "TVRHBA_StorageVolume", "ElementName", unitFacts, Appears::unit},
    {"Disk", "disks", "TVRHBA_LogicalDisk", "ElementName", unitFacts, Appears::unit},
    {"Tape drive", "tape drives", "TVRHBA_TapeDrive", "ElementName", unitFacts, Appears::unit},
    {"Device", "devices", "TVRHBA_StorageExtent", "ElementName", unitFacts, Appears::unit},
    {"Controller", "controllers", "TVRHBA_SCSIArbitraryLogicalUnit", "ElementName", unitFacts, Appears::unit},
    {"Virtual volume",
     "virtual volumes",
     "TVRHBA_VirtualStorageVolume",
     "ElementName",
     {{"capacity", "Capacity", size, inLine | pictured}, {"description", "Description", plain, inLine | pictured}},
     Appears::unit},
    {"PCI device",
     "PCI devices",
     "TVRHBA_PCIDevice",
     "DeviceID",
     {{"element", "ElementName", plain, inLine},
      {"bus", "BusNumber", plain, inLine | labelled},
      {"function", "FunctionNumber", plain, inLine | labelled},
      {"vendor", "VendorID", id},
      {"subsystem", "SubsystemID", id},
      {"revision", "RevisionID", plain}}},
};

constexpr EdgeRow allEdges[] = {
    {hostKind, "TVRHBA_InstalledSoftwareIdentity", "Driver"},
    {hostKind, "TVRHBA_InstalledSoftwareIdentity", "Provider"},
    {hostKind, "TVRHBA_SystemDevice", "PCI device"},
    {"Product", "TVRHBA_ProductPhysicalComponent", "Card"},
    {"Card", "TVRHBA_CardContainsChip", "Chip"},
    {"Card", "TVRHBA_CardContainsConnector", "Connector"},
    {"Connector", "TVRHBA_FCRealizes", "FC port"},
    {"FC port", "TVRHBA_ControlledBy", "Port controller"},
    {"Port controller", "TVRHBA_TransceiverComponent", "Transceiver"},
    {"Port controller", "TVRHBA_FirmwareElementSoftwareIdentity", "Firmware"},
    {"Port controller", "TVRHBA_ElementSoftwareIdentity", "Boot image"},
    {"Port controller", "TVRHBA_ElementFlashImageSoftwareIdentity", "Flash image"},
    {"FC port", "TVRHBA_DeviceSAPImplementation", "Initiator"},
    {"FC port", "TVRHBA_VPortHostedDependency", "Virtual port"},
    {"Virtual port", "TVRHBA_VirtualDeviceSAPImplementation", "Initiator"},
    {"Initiator", "TVRHBA_SCSIInitiatorTargetStorageVolumePath", "Volume", "Target"},
    {"Initiator", "TVRHBA_SCSIInitiatorTargetLogicalDiskPath", "Disk", "Target"},
    {"Initiator", "TVRHBA_SCSIInitiatorTargetTapeDrivePath", "Tape drive", "Target"},
    {"Initiator", "TVRHBA_SCSIInitiatorTargetStorageExtentPath", "Device", "Target"},
    {"Initiator", "TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath", "Controller", "Target"},
    {"Initiator", "TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath", "Virtual volume", "Target"},
};

} // namespace

std::span<const KindRow> kinds()
{
    return allKinds;
}

const KindRow& kindNamed(const std::string& name)
{
    const auto* row = std::ranges::find(allKinds, name, &KindRow::name);
    if (row == std::end(allKinds))
        throw std::out_of_range("there is no kind " + name);
    return *row;
}

std::span<const EdgeRow> edges()
{
    return allEdges;
}

} // namespace broker
