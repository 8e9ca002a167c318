#include "simulator/ScenarioParts.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

constexpr NamedNumber portTypes[] = {
    {"unknown", HBA_PORTTYPE_UNKNOWN},  {"other", HBA_PORTTYPE_OTHER},   {"notPresent", HBA_PORTTYPE_NOTPRESENT},
    {"nPort", HBA_PORTTYPE_NPORT},      {"nlPort", HBA_PORTTYPE_NLPORT}, {"privateLoop", HBA_PORTTYPE_LPORT},
    {"pointToPoint", HBA_PORTTYPE_PTP},
};

constexpr NamedNumber portStates[] = {
    {"unknown", HBA_PORTSTATE_UNKNOWN},
    {"online", HBA_PORTSTATE_ONLINE},
    {"offline", HBA_PORTSTATE_OFFLINE},
    {"bypassed", HBA_PORTSTATE_BYPASSED},
    {"diagnostics", HBA_PORTSTATE_DIAGNOSTICS},
    {"linkDown", HBA_PORTSTATE_LINKDOWN},
    {"error", HBA_PORTSTATE_ERROR},
    {"loopback", HBA_PORTSTATE_LOOPBACK},
};

void readFc4Types(JsonNode& node, const char* key, std::array<std::uint8_t, 32>& out)
{
    out[2] = 0x01; // FCP
    if (!node.has(key))
        return;
    out = {};
    std::ranges::copy(node.at(key).asBytes(out.size()), out.begin());
}

std::size_t readTargetName(const JsonNode& node, const std::vector<Target>& targets)
{
    const auto place = std::ranges::find(targets, node.asText(255), &Target::name);
    if (place == targets.end())
        node.fail("the name of a target");
    return static_cast<std::size_t>(place - targets.begin());
}

std::vector<std::size_t> readTargetNames(JsonNode& node, const std::vector<Target>& targets)
{
    std::vector<std::size_t> indexes;
    node.forEach("targets",
                 [&](const JsonNode& item)
                 {
                     const std::size_t index = readTargetName(item, targets);
                     if (std::ranges::find(indexes, index) != indexes.end())
                         item.fail("each target once");
                     indexes.push_back(index);
                 });
    return indexes;
}

RM_VirtualMachine readMachine(JsonNode node)
{
    RM_VirtualMachine machine{};
    node.at("name").asText(sizeof machine.name - 1).copy(machine.name, sizeof machine.name - 1);
    node.at("uuid").asText(sizeof machine.uuid - 1).copy(machine.uuid, sizeof machine.uuid - 1);
    node.finish();
    return machine;
}

PriorityLane readPriorityLane(JsonNode& node, const std::vector<Target>& targets)
{
    PriorityLane lane;
    lane.target = readTargetName(node.at("target"), targets);
    lane.lun = static_cast<std::uint32_t>(node.at("lun").asNumber(maximumUnits - 1));
    node.read("state", lane.states[RM_LANE_DRIVER]);
    lane.states[RM_LANE_CONFIG] = lane.states[RM_LANE_DRIVER];
    node.read("configState", lane.states[RM_LANE_CONFIG]);
    node.finish();
    return lane;
}

VirtualPort readVirtualPort(JsonNode& node, const std::vector<Target>& targets)
{
    VirtualPort vport;
    vport.wwpn = node.at("wwpn").asWwn();
    vport.wwnn = vport.wwpn;
    node.readWwn("wwnn", vport.wwnn);
    node.readWwn("fabricName", vport.fabricName);
    node.read("fcId", vport.fcId);
    node.readNamed("state", vport.state, portStates);
    node.read("symbolicName", vport.symbolicName);
    vport.targets = readTargetNames(node, targets);
    if (node.has("virtualMachine"))
        vport.machine = readMachine(node.at("virtualMachine"));
    node.forEach("priorityLanes",
                 [&](JsonNode& item) { vport.priorityLanes.push_back(readPriorityLane(item, targets)); });
    node.finish();
    return vport;
}

constexpr NamedNumber beaconStates[] = {
    {"notAvailable", RM_BEACON_NOT_AVAILABLE}, {"off", RM_BEACON_OFF}, {"on", RM_BEACON_ON}};

RM_QosInfo readQos(JsonNode node)
{
    RM_QosInfo qos{};
    node.read("supported", qos.supported);
    node.read("enabled", qos.enabled);
    node.read("priority", qos.priority);
    node.read("bandwidth", qos.bandwidth);
    node.finish();
    return qos;
}

PortNames readPortNames(JsonNode node)
{
    PortNames names;
    names.wwpn = node.at("wwpn").asWwn();
    names.wwnn = names.wwpn;
    node.readWwn("wwnn", names.wwnn);
    node.finish();
    return names;
}

NameManagement readNames(JsonNode node)
{
    NameManagement names;
    node.read("available", names.available);
    node.read("capability", names.capability);
    if (node.has("activation"))
        names.activation = static_cast<std::uint32_t>(node.at("activation").asNumber(UINT32_MAX));
    const auto pair = [&](const char* key, std::optional<PortNames>& out)
    {
        if (node.has(key))
            out = readPortNames(node.at(key));
    };
    pair("factory", names.factory);
    pair("nonVolatile", names.nonVolatile);
    pair("volatile", names.volatileNames);
    node.finish();
    return names;
}

Port readPort(JsonNode& node, const std::vector<Target>& targets)
{
    Port port;
    port.wwpn = node.at("wwpn").asWwn();
    port.wwnn = port.wwpn;
    node.readWwn("wwnn", port.wwnn);
    if (node.has("names"))
        port.names = readNames(node.at("names"));
    node.read("listedTwice", port.listedTwice);
    node.readWwn("fabricName", port.fabricName);
    node.read("fcId", port.fcId);
    node.readNamed("type", port.type, portTypes);
    node.readNamed("state", port.state, portStates);
    node.read("supportedClasses", port.supportedClasses);
    readFc4Types(node, "supportedFc4Types", port.supportedFc4Types);
    readFc4Types(node, "activeFc4Types", port.activeFc4Types);
    node.read("symbolicName", port.symbolicName);
    node.read("osDeviceName", port.osDeviceName);
    node.read("supportedSpeed", port.supportedSpeed);
    node.read("speed", port.speed);
    node.read("maxFrameSize", port.maxFrameSize);
    node.read("discoveredPorts", port.discoveredPorts);
    node.read("scsiBus", port.scsiBus);
    readAttributes(node, "attributes", portAttributeRows, port.attributes);
    readAttributes(node, "statistics", statisticsRows, port.statistics);
    readAttributes(node, "growth", statisticsRows, port.growth);
    if (node.has("pci"))
        port.pci = readPci(node.at("pci"));
    if (node.has("vpd"))
        port.vpd = readVpd(node.at("vpd"));
    if (node.has("transceiver"))
        port.transceiver = readTransceiver(node.at("transceiver"));
    if (node.has("beacon"))
        port.beacon = node.at("beacon").asNamed(beaconStates);
    node.forEach("flash",
                 [&](JsonNode& item)
                 {
                     if (port.flash.size() == RM_MAX_FLASH_REGIONS)
                         item.failWith("expected at most 64 regions");
                     port.flash.push_back(readFlashRegion(item));
                 });
    if (node.has("dumps"))
        port.dumps = readDumps(node.at("dumps"));
    node.forEach("tracedModules",
                 [&](JsonNode& item)
                 {
                     if (port.tracedModules.size() == RM_MAX_EVENT_LOG_MODULES)
                         item.failWith("expected at most 64 modules");
                     port.tracedModules.push_back(readTracedModule(item));
                 });
    if (node.has("qos"))
        port.qos = readQos(node.at("qos"));
    port.targets = readTargetNames(node, targets);
    node.forEach("virtualPorts", [&](JsonNode& item) { port.virtualPorts.push_back(readVirtualPort(item, targets)); });
    if (node.has("priorityLanes"))
        port.priorityLanes.emplace();
    node.forEach("priorityLanes",
                 [&](JsonNode& item) { port.priorityLanes->push_back(readPriorityLane(item, targets)); });
    if (node.has("diagnostics"))
        port.diagnostics = readDiagnostics(node.at("diagnostics"));
    node.finish();
    return port;
}

/// The attribute that carries the temperature of the board and its two limits, a byte each.
void readTemperature(JsonNode& adapter, AttributeList& out)
{
    if (!adapter.has("temperature"))
        return;
    JsonNode node = adapter.at("temperature");
    std::uint8_t board = 0, warning = 0, critical = 0;
    node.read("board", board);
    node.read("warning", warning);
    node.read("critical", critical);
    node.finish();
    const std::uint32_t word = static_cast<std::uint32_t>(board | warning << 8 | critical << 16);
    setAttribute(out, numberAttribute(RM_HA_BOARD_TEMPERATURE, word));
}

std::vector<RM_Feature> readFeatures(JsonNode node)
{
    std::vector<RM_Feature> features;
    for (const auto& [tag, value] : node.numberedMembers())
        features.push_back({tag, static_cast<std::uint32_t>(value.asNumber(UINT32_MAX))});
    std::ranges::sort(features, {}, &RM_Feature::tag);
    return features;
}

RM_DriverParam readDriverParameter(JsonNode& node)
{
    RM_DriverParam parameter{};
    node.at("name").asText(sizeof parameter.name - 1).copy(parameter.name, sizeof parameter.name - 1);
    node.read("low", parameter.lowRange);
    node.read("high", parameter.highRange);
    node.read("default", parameter.def);
    parameter.current = parameter.def;
    node.read("current", parameter.current);
    parameter.exportFlag = 1;
    node.read("export", parameter.exportFlag);
    node.read("dynamic", parameter.dynamic);
    std::string help;
    node.read("help", help, sizeof parameter.help - 1);
    help.copy(parameter.help, sizeof parameter.help - 1);
    node.finish();
    return parameter;
}

CPQFC_QosEntry readTag(JsonNode& node)
{
    CPQFC_QosEntry entry{};
    entry.src_wwpn = toHba(node.at("source").asWwn());
    entry.tgt_wwpn = toHba(node.at("target").asWwn());
    node.read("tag", entry.tag);
    node.finish();
    return entry;
}

void readTagging(JsonNode node, Adapter& adapter)
{
    bool isOn = false;
    node.read("on", isOn);
    adapter.tagging = isOn;
    node.forEach("table", [&](JsonNode& item) { adapter.tags.push_back(readTag(item)); });
    node.finish();
}

} // namespace

std::vector<DriverParameter> readDriverParameters(JsonNode& owner)
{
    std::vector<DriverParameter> parameters;
    owner.forEach("driverParameters",
                  [&](JsonNode& item)
                  {
                      const RM_DriverParam parameter = readDriverParameter(item);
                      parameters.push_back({parameter, parameter});
                  });
    return parameters;
}

Adapter readAdapter(JsonNode& node, const std::vector<Target>& targets)
{
    Adapter adapter;
    adapter.name = node.at("name").asText(255);
    node.read("manufacturer", adapter.manufacturer, 63);
    node.read("serialNumber", adapter.serialNumber, 63);
    node.read("model", adapter.model);
    node.read("modelDescription", adapter.modelDescription);
    node.readWwn("nodeWwn", adapter.nodeWwn);
    node.read("nodeSymbolicName", adapter.nodeSymbolicName);
    node.read("hardwareVersion", adapter.hardwareVersion);
    node.read("driverVersion", adapter.driverVersion);
    node.read("optionRomVersion", adapter.optionRomVersion);
    node.read("firmwareVersion", adapter.firmwareVersion);
    node.read("driverName", adapter.driverName);
    node.read("firmwareFamily", adapter.firmwareFamily);
    node.read("vendorSpecificId", adapter.vendorSpecificId);
    node.read("driverType", adapter.driverType);
    node.read("stale", adapter.stale);
    readTemperature(node, adapter.attributes);
    readAttributes(node, "attributes", adapterAttributeRows, adapter.attributes);
    if (node.has("features"))
        adapter.features = readFeatures(node.at("features"));
    adapter.driverParameters = readDriverParameters(node);
    if (node.has("tagging"))
        readTagging(node.at("tagging"), adapter);
    node.forEach("ports", [&](JsonNode& item) { adapter.ports.push_back(readPort(item, targets)); });
    node.finish();
    return adapter;
}

} // namespace tvrsim
