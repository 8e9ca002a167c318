// Scenarios and faults from JSON text; docs/scenarios.md describes the format.
#pragma once

#include "simulator/JsonNode.h"
#include "simulator/Scenario.h"

#include <string>
#include <string_view>

namespace tvrsim
{

/// The believable host of scenarios/default.json.
extern const char* const defaultScenarioText;

/// Throws ScenarioError. `file` names the source in messages.
Scenario readScenario(std::string_view text, const std::string& file);
Scenario readScenarioFile(const std::string& file);

/// One fault row. Throws ScenarioError.
Fault readFault(std::string_view text, const std::string& file);

/// One attribute as {"name": value}, by a name of adapters, ports, statistics or the server, or under "raw" by its
/// number; null makes it absent. Throws ScenarioError.
Attribute readAttribute(std::string_view text, const std::string& file);

/// The diagnostics of a port, as the member of that name in a scenario has them. Throws ScenarioError.
Diagnostics readDiagnostics(std::string_view text, const std::string& file);

} // namespace tvrsim
