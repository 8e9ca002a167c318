#include "simulator/ScenarioReader.h"

#include "simulator/Generator.h"

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <set>

namespace tvrsim
{

namespace
{

using nlohmann::json;

constexpr std::size_t maximumUnits = 16384; // what flat space addressing can name

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

constexpr NamedNumber scsiOperations[] = {
    {"any", static_cast<std::uint32_t>(ScsiOperation::any)},
    {"inquiry", static_cast<std::uint32_t>(ScsiOperation::inquiry)},
    {"vitalProductData", static_cast<std::uint32_t>(ScsiOperation::vitalProductData)},
    {"readCapacity", static_cast<std::uint32_t>(ScsiOperation::readCapacity)},
};

// Attributes.

Attribute attributeOf(const AttributeRow& row, const JsonNode& value)
{
    if (value.value().is_null())
        return {row.id, AttributeForm::absent, {}};
    switch (row.form)
    {
    case AttributeForm::number:
        return numberAttribute(row.id, static_cast<std::uint32_t>(value.asNumber(UINT32_MAX)));
    case AttributeForm::counter:
        return counterAttribute(row.id, value.asNumber(UINT64_MAX));
    case AttributeForm::text:
        return textAttribute(row.id, value.asText(255));
    default:
        const std::vector<std::uint8_t> bytes = value.asBytes(255);
        return {row.id, AttributeForm::bytes, std::string(bytes.begin(), bytes.end())};
    }
}

/// Attributes by their numbers, as bytes.
void readRawAttributes(JsonNode node, AttributeList& out)
{
    for (const auto& [id, value] : node.numberedMembers())
        setAttribute(out, attributeOf({"", id, AttributeForm::bytes}, value));
}

void readAttributeMembers(JsonNode& node, std::span<const AttributeRow> rows, AttributeList& out)
{
    for (const AttributeRow& row : rows)
        if (node.has(row.key))
            setAttribute(out, attributeOf(row, node.at(row.key)));
    if (node.has("raw"))
        readRawAttributes(node.at("raw"), out);
}

void readAttributes(JsonNode& owner, const char* key, std::span<const AttributeRow> rows, AttributeList& out)
{
    if (!owner.has(key))
        return;
    JsonNode node = owner.at(key);
    readAttributeMembers(node, rows, out);
    node.finish();
}

// PCI registers.

struct PciField
{
    const char* key;
    std::uint8_t offset;
    std::uint8_t width; ///< bytes
};

constexpr PciField pciFields[] = {
    {"vendorId", 0, 2},
    {"deviceId", 2, 2},
    {"command", 4, 2},
    {"status", 6, 2},
    {"revision", 8, 1},
    {"progIf", 9, 1},
    {"subClass", 10, 1},
    {"baseClass", 11, 1},
    {"cacheLineSize", 12, 1},
    {"latencyTimer", 13, 1},
    {"headerType", 14, 1},
    {"builtInSelfTest", 15, 1},
    {"baseAddress0", 16, 4},
    {"baseAddress1", 20, 4},
    {"baseAddress2", 24, 4},
    {"baseAddress3", 28, 4},
    {"baseAddress4", 32, 4},
    {"baseAddress5", 36, 4},
    {"cis", 40, 4},
    {"subVendorId", 44, 2},
    {"subsystemId", 46, 2},
    {"expansionRomBaseAddress", 48, 4},
    {"capabilitiesPointer", 52, 1},
    {"interruptLine", 60, 1},
    {"interruptPin", 61, 1},
    {"minimumGrant", 62, 1},
    {"maximumLatency", 63, 1},
};

RM_PciRegisters readPci(JsonNode node)
{
    RM_PciRegisters registers{};
    node.read("type", registers.pciType);
    for (const PciField& field : pciFields)
        if (node.has(field.key))
        {
            const std::uint64_t value = node.at(field.key).asNumber((std::uint64_t{1} << 8 * field.width) - 1);
            for (std::uint8_t byte = 0; byte < field.width; ++byte)
                registers.header[field.offset + byte] = static_cast<std::uint8_t>(value >> 8 * byte);
        }
    std::size_t word = 0;
    node.forEach("area",
                 [&](const JsonNode& item)
                 {
                     if (word == std::size(registers.area))
                         item.failWith("expected at most " + std::to_string(std::size(registers.area)) + " words");
                     registers.area[word++] = static_cast<std::uint32_t>(item.asNumber(UINT32_MAX));
                 });
    node.finish();
    return registers;
}

// Logical units and targets.

CheckCondition readCheckCondition(JsonNode& node)
{
    CheckCondition condition;
    std::uint32_t operation = static_cast<std::uint32_t>(condition.operation);
    node.readNamed("command", operation, scsiOperations);
    condition.operation = static_cast<ScsiOperation>(operation);
    if (node.has("page"))
        condition.page = static_cast<std::uint8_t>(node.at("page").asNumber(255));
    node.read("times", condition.times);
    node.read("key", condition.key);
    node.read("code", condition.code);
    node.read("qualifier", condition.qualifier);
    node.finish();
    return condition;
}

Designator readDesignator(JsonNode& node)
{
    Designator designator;
    node.read("type", designator.type);
    node.read("codeSet", designator.codeSet);
    node.read("association", designator.association);
    constexpr std::size_t longest = 251;
    if (node.has("text"))
    {
        const std::string text = node.at("text").asText(longest);
        designator.value.assign(text.begin(), text.end());
        designator.codeSet = 2;
    }
    else
        designator.value = node.at("value").asBytes(longest);
    node.finish();
    return designator;
}

LogicalUnit readUnit(JsonNode& node)
{
    LogicalUnit unit;
    unit.number = static_cast<std::uint32_t>(node.at("lun").asNumber(maximumUnits - 1));
    if (node.has("deviceType"))
        unit.deviceType = static_cast<std::uint8_t>(node.at("deviceType").asNumber(31));
    if (node.has("deviceQualifier"))
        unit.deviceQualifier = static_cast<std::uint8_t>(node.at("deviceQualifier").asNumber(7));
    node.read("vendor", unit.vendor, 8);
    node.read("product", unit.product, 16);
    node.read("revision", unit.revision, 4);
    if (node.has("serialNumber"))
        unit.serialNumber = node.at("serialNumber").asText(251);
    node.read("blocks", unit.blocks);
    node.read("blockLength", unit.blockLength);
    node.forEach("designators", [&](JsonNode& item) { unit.designators.push_back(readDesignator(item)); });
    node.forEach("checkConditions", [&](JsonNode& item) { unit.checkConditions.push_back(readCheckCondition(item)); });
    node.finish();
    return unit;
}

Target readTarget(JsonNode& node)
{
    Target target;
    target.name = node.at("name").asText(255);
    target.wwpn = node.at("wwpn").asWwn();
    node.readWwn("wwnn", target.wwnn);
    node.read("fcId", target.fcId);
    std::set<std::uint32_t> numbers;
    node.forEach("units",
                 [&](JsonNode& item)
                 {
                     target.units.push_back(readUnit(item));
                     if (!numbers.insert(target.units.back().number).second)
                         item.at("lun").fail("a number that no other unit of the target has");
                 });
    std::ranges::sort(target.units, {}, &LogicalUnit::number);
    node.finish();
    return target;
}

// Ports and adapters.

void readFc4Types(JsonNode& node, const char* key, std::array<std::uint8_t, 32>& out)
{
    out[2] = 0x01; // FCP
    if (!node.has(key))
        return;
    out = {};
    std::ranges::copy(node.at(key).asBytes(out.size()), out.begin());
}

std::vector<std::size_t> readTargetNames(JsonNode& node, const std::vector<Target>& targets)
{
    std::vector<std::size_t> indexes;
    node.forEach("targets",
                 [&](const JsonNode& item)
                 {
                     const auto place = std::ranges::find(targets, item.asText(255), &Target::name);
                     if (place == targets.end())
                         item.fail("the name of a target");
                     const auto index = static_cast<std::size_t>(place - targets.begin());
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
    node.finish();
    return vport;
}

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

Port readPort(JsonNode& node, const std::vector<Target>& targets)
{
    Port port;
    port.wwpn = node.at("wwpn").asWwn();
    port.wwnn = port.wwpn;
    node.readWwn("wwnn", port.wwnn);
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
    if (node.has("pci"))
        port.pci = readPci(node.at("pci"));
    if (node.has("qos"))
        port.qos = readQos(node.at("qos"));
    port.targets = readTargetNames(node, targets);
    node.forEach("virtualPorts", [&](JsonNode& item) { port.virtualPorts.push_back(readVirtualPort(item, targets)); });
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
    node.read("vendorSpecificId", adapter.vendorSpecificId);
    node.read("driverType", adapter.driverType);
    node.read("stale", adapter.stale);
    readTemperature(node, adapter.attributes);
    readAttributes(node, "attributes", adapterAttributeRows, adapter.attributes);
    if (node.has("features"))
        adapter.features = readFeatures(node.at("features"));
    node.forEach("ports", [&](JsonNode& item) { adapter.ports.push_back(readPort(item, targets)); });
    node.finish();
    return adapter;
}

// Faults.

Fault readFaultRow(JsonNode& node)
{
    Fault fault;
    fault.function = node.at("function").asText(255);
    unsigned effects = 0;
    if (!findEntryPoint(fault.function, effects))
        node.at("function").fail("the name of a function that the simulator exports");
    node.read("subject", fault.subject);
    if (const std::optional<Wwn> name = parseWwn(fault.subject))
        fault.subject = wwnText(*name);
    node.read("from", fault.from);
    node.read("to", fault.to);

    int set = 0;
    if (node.has("status") && ++set)
        fault.status = static_cast<std::int32_t>(node.at("status").asNumber(INT32_MAX));
    if (node.has("delayMs") && ++set)
        fault.delay = std::chrono::milliseconds(node.at("delayMs").asNumber(3'600'000));
    if (node.has("gate") && ++set)
        fault.gate = node.at("gate").asText(255);
    if (node.has("truncate") && ++set)
    {
        fault.truncate = node.at("truncate").asNumber(UINT32_MAX);
        if (!(effects & truncatable))
            node.at("truncate").failWith(fault.function + " has no output that can be cut");
    }
    if (node.has("hostile") && ++set)
    {
        const std::string kind = node.at("hostile").asText(255);
        std::string expected = "a kind that " + fault.function + " can show:";
        for (const HostileRow& row : hostileRows)
            if (effects & bit(row.kind))
            {
                expected += std::string(" ") + row.name;
                if (kind == row.name)
                    fault.hostile = row.kind;
            }
        if (!fault.hostile)
            node.at("hostile").fail(effects & ~truncatable ? expected : "no hostile output of " + fault.function);
    }
    node.finish();
    if (set != 1)
        node.failWith("expected exactly one of: status, delayMs, gate, truncate, hostile");
    return fault;
}

// The document.

/// Lays each object that has a member "template" over the object of that name in /templates.
void applyTemplates(json& value, const json& templates, const std::string& path, const std::string& file)
{
    if (value.is_object() && value.contains("template"))
    {
        const json name = value["template"];
        if (!name.is_string() || !templates.is_object() || !templates.contains(name.get_ref<const std::string&>()))
            JsonNode(name, path + "/template", file).fail("the name of a member of /templates");
        json merged = templates[name.get_ref<const std::string&>()];
        value.erase("template");
        merged.merge_patch(value);
        value = std::move(merged);
    }
    if (value.is_object())
        for (auto& [key, member] : value.items())
            applyTemplates(member, templates, path + '/' + key, file);
    else if (value.is_array())
        for (std::size_t i = 0; i < value.size(); ++i)
            applyTemplates(value[i], templates, path + '/' + std::to_string(i), file);
}

json parse(std::string_view text, const std::string& file)
{
    try
    {
        return json::parse(text);
    }
    catch (const json::parse_error& error)
    {
        // The library's text goes on after the place and a hyphen with what it expected.
        throw ScenarioError(file + ": " + std::string(error.what()));
    }
}

/// What the whole host must keep, listed and generated members together.
void checkNames(const Scenario& scenario, const std::string& file)
{
    std::set<std::string> adapterNames, targetNames;
    std::set<Wwn> portNames;
    const auto require = [&](bool fresh, const std::string& path, const std::string& what)
    {
        if (!fresh)
            throw ScenarioError(file + ": " + path + ": expected a name of its own, found " + what + " twice");
    };
    for (std::size_t a = 0; a < scenario.adapters.size(); ++a)
    {
        const std::string path = "/adapters/" + std::to_string(a);
        require(adapterNames.insert(scenario.adapters[a].name).second, path, '"' + scenario.adapters[a].name + '"');
        for (std::size_t p = 0; p < scenario.adapters[a].ports.size(); ++p)
        {
            const Port& port = scenario.adapters[a].ports[p];
            const std::string portPath = path + "/ports/" + std::to_string(p);
            require(portNames.insert(port.wwpn).second, portPath, wwnText(port.wwpn));
            for (std::size_t v = 0; v < port.virtualPorts.size(); ++v)
                require(portNames.insert(port.virtualPorts[v].wwpn).second,
                        portPath + "/virtualPorts/" + std::to_string(v), wwnText(port.virtualPorts[v].wwpn));
        }
    }
    for (std::size_t t = 0; t < scenario.targets.size(); ++t)
    {
        const Target& target = scenario.targets[t];
        const std::string path = "/targets/" + std::to_string(t);
        require(targetNames.insert(target.name).second, path, '"' + target.name + '"');
        require(portNames.insert(target.wwpn).second, path, wwnText(target.wwpn));
    }
}

GeneratorSettings readGenerate(JsonNode node)
{
    GeneratorSettings settings;
    node.read("seed", settings.seed);
    const auto count = [&](const char* key, std::uint32_t& out, std::uint32_t maximum)
    {
        if (node.has(key))
            out = static_cast<std::uint32_t>(node.at(key).asNumber(maximum));
    };
    count("adapters", settings.adapters, 256);
    count("portsPerAdapter", settings.portsPerAdapter, 16);
    count("targetsPerPort", settings.targetsPerPort, 1024);
    count("unitsPerTarget", settings.unitsPerTarget, maximumUnits);
    node.forEach("deviceTypes", [&](const JsonNode& item)
                 { settings.deviceTypes.push_back(static_cast<std::uint8_t>(item.asNumber(31))); });
    constexpr std::uint64_t most = 1 << 20;
    const std::uint64_t targets = std::uint64_t{settings.adapters} * settings.portsPerAdapter * settings.targetsPerPort;
    if (targets * settings.unitsPerTarget > most || targets > 65536)
        node.failWith("expected at most " + std::to_string(most) + " units and 65536 targets in all");
    node.finish();
    return settings;
}

void readLibrary(JsonNode node, Scenario& scenario)
{
    node.read("version", scenario.libraryVersion);
    node.read("miliVersion", scenario.miliVersion);
    node.finish();
}

Scenario readDocument(JsonNode root)
{
    Scenario scenario;
    std::string description;
    root.read("description", description, 65536);
    root.has("templates");
    if (root.has("library"))
        readLibrary(root.at("library"), scenario);
    readAttributes(root, "server", serverAttributeRows, scenario.serverAttributes);
    root.forEach("targets", [&](JsonNode& item) { scenario.targets.push_back(readTarget(item)); });
    root.forEach("adapters", [&](JsonNode& item) { scenario.adapters.push_back(readAdapter(item, scenario.targets)); });
    root.forEach("faults", [&](JsonNode& item) { scenario.faults.push_back(readFaultRow(item)); });
    if (root.has("generate"))
        generate(readGenerate(root.at("generate")), scenario);
    root.finish();
    return scenario;
}

} // namespace

Scenario readScenario(std::string_view text, const std::string& file)
{
    json document = parse(text, file);
    if (document.is_object())
    {
        const json templates = document.value("templates", json::object());
        document.erase("templates");
        applyTemplates(document, templates, "", file);
    }
    Scenario scenario = readDocument(JsonNode(document, "", file));
    checkNames(scenario, file);
    return scenario;
}

Scenario readScenarioFile(const std::string& file)
{
    std::ifstream stream(file, std::ios::binary);
    const std::string text{std::istreambuf_iterator<char>(stream), std::istreambuf_iterator<char>()};
    if (!stream.is_open() || stream.bad())
        throw ScenarioError(file + ": cannot be read");
    return readScenario(text, file);
}

Fault readFault(std::string_view text, const std::string& file)
{
    const json document = parse(text, file);
    JsonNode node(document, "", file);
    return readFaultRow(node);
}

Attribute readAttribute(std::string_view text, const std::string& file)
{
    const json document = parse(text, file);
    JsonNode node(document, "", file);
    AttributeList list;
    for (const auto rows : {adapterAttributeRows, portAttributeRows, statisticsRows, serverAttributeRows})
        readAttributeMembers(node, rows, list);
    node.finish();
    if (list.size() != 1)
        node.failWith("expected exactly one attribute");
    return list.front();
}

} // namespace tvrsim
