// The readers of a scenario's parts. Each takes the part's object, refuses members that it does not know, and throws
// ScenarioError.
#pragma once

#include "simulator/JsonNode.h"
#include "simulator/Scenario.h"

namespace tvrsim
{

/// Units that flat space addressing can name.
constexpr std::uint32_t maximumUnits = 16384;

/// The members of `node` that `rows` name, and those under "raw".
void readAttributeMembers(JsonNode& node, std::span<const AttributeRow> rows, AttributeList& out);
/// The same for the object that is member `key` of `owner`, if there is one.
void readAttributes(JsonNode& owner, const char* key, std::span<const AttributeRow> rows, AttributeList& out);

std::vector<DriverParameter> readDriverParameters(JsonNode& owner);
RM_PciRegisters readPci(JsonNode node);
RM_VpdArea readVpd(JsonNode node);
RM_SffData readTransceiver(JsonNode node);
Diagnostics readDiagnostics(JsonNode node);
RM_FlashRegion readFlashRegion(JsonNode& node);
DumpFiles readDumps(JsonNode node);
RM_EventLogModule readTracedModule(JsonNode& node);
Target readTarget(JsonNode& node);
/// Ports refer to `targets` by name.
Adapter readAdapter(JsonNode& node, const std::vector<Target>& targets);
Fault readFaultRow(JsonNode& node);

} // namespace tvrsim
