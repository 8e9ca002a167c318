#include "simulator/ScenarioReader.h"

#include "simulator/Generator.h"
#include "simulator/ScenarioParts.h"

#include <nlohmann/json.hpp>

#include <fstream>
#include <iterator>
#include <set>

namespace tvrsim
{

namespace
{

using nlohmann::json;

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
    node.read("tagging", scenario.hasTagging);
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
    scenario.driverParameters = readDriverParameters(root);
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

Diagnostics readDiagnostics(std::string_view text, const std::string& file)
{
    const json document = parse(text, file);
    return readDiagnostics(JsonNode(document, "", file));
}

} // namespace tvrsim
