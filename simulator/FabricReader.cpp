#include "simulator/ScenarioParts.h"

#include <algorithm>
#include <set>

namespace tvrsim
{

namespace
{

constexpr NamedNumber scsiOperations[] = {
    {"any", static_cast<std::uint32_t>(ScsiOperation::any)},
    {"inquiry", static_cast<std::uint32_t>(ScsiOperation::inquiry)},
    {"vitalProductData", static_cast<std::uint32_t>(ScsiOperation::vitalProductData)},
    {"readCapacity", static_cast<std::uint32_t>(ScsiOperation::readCapacity)},
};

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

} // namespace

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

} // namespace tvrsim
