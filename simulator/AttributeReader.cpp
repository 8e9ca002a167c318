#include "simulator/ScenarioParts.h"

namespace tvrsim
{

namespace
{

Attribute attributeOf(const AttributeRow& row, const JsonNode& value)
{
    if (value.isNull())
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

} // namespace

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

} // namespace tvrsim
