#include "simulator/ScenarioParts.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

constexpr const char* effectKeys[] = {"status", "delayMs", "gate", "truncate", "hostile"};

std::size_t readTruncate(const JsonNode& node, const std::string& function, unsigned effects)
{
    if (!(effects & truncatable))
        node.failWith(function + " has no output that can be cut");
    return node.asNumber(UINT32_MAX);
}

Hostile readHostile(const JsonNode& node, const std::string& function, unsigned effects)
{
    const std::string kind = node.asText(255);
    std::string expected = "a kind that " + function + " can show:";
    for (const HostileRow& row : hostileRows)
        if (effects & bit(row.kind))
        {
            if (kind == row.name)
                return row.kind;
            expected += std::string(" ") + row.name;
        }
    node.fail(effects & ~truncatable ? expected : "no hostile output of " + function);
}

} // namespace

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

    if (std::ranges::count_if(effectKeys, [&](const char* key) { return node.has(key); }) != 1)
        node.failWith("expected exactly one of: status, delayMs, gate, truncate, hostile");
    if (node.has("status"))
        fault.status = static_cast<std::int32_t>(node.at("status").asNumber(INT32_MAX));
    if (node.has("delayMs"))
        fault.delay = std::chrono::milliseconds(node.at("delayMs").asNumber(3'600'000));
    node.read("gate", fault.gate);
    if (node.has("truncate"))
        fault.truncate = readTruncate(node.at("truncate"), fault.function, effects);
    if (node.has("hostile"))
        fault.hostile = readHostile(node.at("hostile"), fault.function, effects);
    node.finish();
    return fault;
}

} // namespace tvrsim
