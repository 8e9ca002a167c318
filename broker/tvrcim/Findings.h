// What a check of the host finds, each thing with what to do about it.
#pragma once

#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <ostream>
#include <string>
#include <vector>

namespace tvrcim
{

enum class State
{
    ok,
    note,    ///< nothing is wrong, and something that a host may have is not used
    warning, ///< the provider works without, or works worse
    missing, ///< the provider cannot do its work without
    wrong,   ///< what is there cannot be used
};

struct Finding
{
    State state = State::ok;
    std::string subject = {};
    std::string text = {};
    std::string remedy = {};
    broker::Json facts = broker::Json::object(); ///< of the text, for programs
};

using Findings = std::vector<Finding>;

/// Whether nothing is missing or wrong.
bool isComplete(const Findings& findings);

/// A line each, the remedy in the next one, and at the end how all stands.
void printFindings(std::ostream& out, const Findings& findings, bool colour);
/// {"state", "subject", "text", "remedy"} and the facts.
broker::Json toJson(const Findings& findings);

} // namespace tvrcim
