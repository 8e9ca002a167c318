// The refresh as tables of steps. Each folder of the model offers functions; the program puts them in order and says
// what a failure of each does.
#pragma once

#include "agent/Build.h"
#include "agent/RefreshContext.h"

#include <optional>
#include <span>

namespace cimple
{

/// What a failed step does to its list.
enum class OnFailure
{
    Stop, ///< the list ends, and the refresh with it
    GoOn, ///< the next step
};

/// A step of the refresh for a host, an adapter or a port.
template <class Context> struct Step
{
    /// A BuildStatus. BUILD_NO_INSTANCE of a port's step ends that port alone, whatever the row says. A row without a
    /// function logs its text.
    std::uint32_t (*run)(Context& context);
    OnFailure onFailure;
    LogText failure; ///< none where the step says it itself
    /// With a text, what the step throws does not leave it: the maps of `cleared` are emptied, the text is logged, and
    /// the next step goes on.
    LogText exception = {};
    std::optional<MapGroup> cleared = {};
};

using HostStep = Step<HostContext>;
using AdapterStep = Step<AdapterContext>;
using PortStep = Step<PortContext>;

/// A row that logs how far the refresh has come.
template <class Context = HostContext> constexpr Step<Context> mark(const LogText& text)
{
    return {nullptr, OnFailure::GoOn, text};
}

struct RefreshSteps
{
    /// Asks the broker for what the adapter maps take from the platform, and keeps the answers in the agent. Called
    /// while the former maps still answer; no lock of the agent is held.
    void (*askPlatform)(ProviderAgent& agent) = [](ProviderAgent&) {};
    std::span<const HostStep> host = {};       ///< first, the maps are empty
    std::span<const HostStep> cards = {};      ///< where there are FC adapters
    std::span<const AdapterStep> adapter = {}; ///< of each, from within cards
    std::span<const PortStep> port = {};       ///< of each port of it, behind the adapter's steps
    std::span<const HostStep> closing = {};    ///< last
    std::span<const HostStep> san = {};        ///< of the SAN maps
};

/// Defined by the program that links the agent: the module has the model's steps, a test its own.
extern const RefreshSteps refreshSteps;

/// Clears and rebuilds the adapter maps; the caller holds the data mutex and the adapter maps' mutex. BUILD_DONE, or
/// BUILD_FAILED: nothing is rolled back.
std::uint32_t buildAdapterMaps(ProviderAgent& agent, const RefreshSteps& steps = refreshSteps);
/// The same for the SAN maps.
std::uint32_t buildSANMaps(ProviderAgent& agent, const RefreshSteps& steps = refreshSteps);
/// A step of the cards: each FC adapter with its ports, by the lists for these.
std::uint32_t buildAdapters(HostContext& host);

} // namespace cimple
