// What the module tells of its cache and its libraries.
#pragma once

#include "broker/core/Broker.h"
#include "module/Observe.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace broker
{

struct Observation : tavrin_fc_observation
{
    std::vector<std::pair<std::string, std::uint64_t>> callFailures = {}; ///< by entry point
};

/// Nothing of a module that tells nothing, or that is unloaded.
std::optional<Observation> observe(Broker& broker);
/// The same behind the end of a refresh that is running, for which it waits two seconds at the most.
std::optional<Observation> observeSettled(Broker& broker);

} // namespace broker
