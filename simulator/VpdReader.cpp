#include "simulator/ScenarioParts.h"

#include <algorithm>
#include <iterator>
#include <numeric>

namespace tvrsim
{

namespace
{

using Bytes = std::vector<std::uint8_t>;

void append(Bytes& to, std::string_view bytes)
{
    to.insert(to.end(), bytes.begin(), bytes.end());
}

void append(Bytes& to, const Bytes& bytes)
{
    to.insert(to.end(), bytes.begin(), bytes.end());
}

Bytes readValue(JsonNode& node)
{
    Bytes value;
    if (node.isObject())
    {
        value = node.at("value").asBytes(255);
        node.finish();
    }
    else
        append(value, node.asText(255));
    return value;
}

Bytes readKeywords(JsonNode node)
{
    Bytes keywords;
    for (auto& [keyword, value] : node.members())
    {
        if (keyword.size() != 2)
            value.failWith("expected a keyword of two characters as the member's name");
        const Bytes bytes = readValue(value);
        append(keywords, keyword);
        keywords.push_back(static_cast<std::uint8_t>(bytes.size()));
        append(keywords, bytes);
    }
    return keywords;
}

void appendResource(Bytes& area, std::uint8_t tag, const Bytes& content)
{
    area.push_back(tag);
    area.push_back(static_cast<std::uint8_t>(content.size()));
    area.push_back(static_cast<std::uint8_t>(content.size() >> 8));
    append(area, content);
}

Bytes readResources(JsonNode& node)
{
    Bytes area;
    if (node.has("product"))
    {
        Bytes product;
        append(product, node.at("product").asText(255));
        appendResource(area, 0x82, product);
    }
    if (node.has("readOnly"))
    {
        Bytes keywords = readKeywords(node.at("readOnly"));
        append(keywords, Bytes{'R', 'V', 1, 0});
        appendResource(area, 0x90, keywords);
        area.back() = static_cast<std::uint8_t>(-std::accumulate(area.begin(), area.end(), 0)); // the sum becomes 0
    }
    if (node.has("readWrite"))
    {
        Bytes keywords = readKeywords(node.at("readWrite"));
        append(keywords, Bytes{'R', 'W', 4, 0, 0, 0, 0});
        appendResource(area, 0x91, keywords);
    }
    area.push_back(0x78);
    return area;
}

} // namespace

RM_VpdArea readVpd(JsonNode node)
{
    RM_VpdArea area{};
    const Bytes bytes = node.has("raw") ? node.at("raw").asBytes(sizeof area.data) : readResources(node);
    node.finish();
    if (bytes.size() > sizeof area.data)
        node.failWith("expected at most " + std::to_string(sizeof area.data) + " bytes of vital product data");
    area.length = static_cast<std::uint32_t>(bytes.size());
    std::ranges::copy(bytes, area.data);
    return area;
}

} // namespace tvrsim
