// What stands at a port: its transceiver, the flash memory behind it, and its dumps.
#include "simulator/ScenarioParts.h"

namespace tvrsim
{

namespace
{

/// Fills an array of words from the member `key`, an array of at most as many numbers.
template <std::size_t Size> void readWords(JsonNode& node, const char* key, std::uint16_t (&words)[Size])
{
    std::size_t word = 0;
    node.forEach(key,
                 [&](const JsonNode& item)
                 {
                     if (word == Size)
                         item.failWith("expected at most " + std::to_string(Size) + " words");
                     words[word++] = static_cast<std::uint16_t>(item.asNumber(UINT16_MAX));
                 });
}

/// A text that may fill its field.
template <std::size_t Size> void readField(JsonNode& node, const char* key, char (&field)[Size])
{
    std::string text;
    node.read(key, text, Size);
    text.copy(field, Size);
}

/// SFF-8472 bytes 96 to 105 of page A2h, in the units of table 9-2.
void readMeasured(JsonNode& node, RM_SffData& data)
{
    std::uint16_t raw[5] = {};
    readWords(node, "measured", raw);
    data.temperature = static_cast<float>(static_cast<std::int16_t>(raw[0])) / 256;
    data.vcc = static_cast<float>(raw[1]) / 10000;
    data.txBiasCurrent = static_cast<float>(raw[2]) / 500;
    data.txPower = static_cast<float>(raw[3]) / 10000;
    data.rxPower = static_cast<float>(raw[4]) / 10000;
}

} // namespace

RM_SffData readTransceiver(JsonNode node)
{
    RM_SffData data{};
    data.vendorPresent = node.has("vendor");
    data.identityPresent = node.has("identifier");
    data.diagnosticsPresent = node.has("measured");
    readField(node, "vendor", data.vendorName);
    readField(node, "partNumber", data.partNumber);
    readField(node, "revision", data.revision);
    readField(node, "serialNumber", data.serialNumber);
    readField(node, "dateCode", data.dateCode);
    if (node.has("oui"))
    {
        const std::vector<std::uint8_t> bytes = node.at("oui").asBytes(sizeof data.oui);
        std::copy(bytes.begin(), bytes.end(), data.oui);
    }
    node.read("identifier", data.identifier);
    node.read("extIdentifier", data.extIdentifier);
    node.read("connector", data.connector);
    node.read("waveLength", data.waveLength);
    readMeasured(node, data);
    readWords(node, "thresholds", data.thresholds);
    node.finish();
    return data;
}

RM_FlashRegion readFlashRegion(JsonNode& node)
{
    RM_FlashRegion region{};
    readField(node, "programType", region.programType);
    readField(node, "version", region.version);
    readField(node, "description", region.description);
    std::size_t id = 0;
    node.forEach("programId",
                 [&](const JsonNode& item)
                 {
                     if (id == std::size(region.programId))
                         item.failWith("expected at most 2 numbers");
                     region.programId[id++] = static_cast<std::uint32_t>(item.asNumber(UINT32_MAX));
                 });
    node.read("startAddress", region.startAddress);
    node.read("length", region.length);
    node.read("next", region.next);
    node.read("previous", region.previous);
    node.read("isWakeup", region.isWakeup);
    node.finish();
    return region;
}

DumpFiles readDumps(JsonNode node)
{
    DumpFiles dumps;
    node.read("directory", dumps.directory, RM_DUMP_PATH_SIZE - 1);
    node.read("retentionCount", dumps.retentionCount);
    node.forEach("files", [&](const JsonNode& item) { dumps.files.push_back(item.asText(RM_DUMP_PATH_SIZE - 1)); });
    node.finish();
    return dumps;
}

RM_EventLogModule readTracedModule(JsonNode& node)
{
    RM_EventLogModule module{};
    readField(node, "module", module.module);
    readField(node, "level", module.level);
    node.read("portMask", module.portMask);
    node.read("functionMask", module.functionMask);
    node.read("value", module.value);
    node.finish();
    return module;
}

} // namespace tvrsim
