// What the agent's refresh calls in the layers above it.
#pragma once

#include <cstdint>

namespace cimple
{

class ProviderAgent;

/// Status of routines that build instances.
enum BuildStatus : std::uint32_t
{
    BUILD_DONE = 0,
    BUILD_NO_INSTANCE = 0x8000, ///< an instance could not be allocated
    BUILD_FAILED = 0x8001,      ///< a step failed; the caller stops
};

struct ModelStages
{
    /// Clears and rebuilds the adapter maps; the caller holds the data mutex and the adapter maps' mutex.
    std::uint32_t (*updateAdapterMaps)(ProviderAgent& agent);
    /// The same for the SAN maps.
    std::uint32_t (*updateSANMaps)(ProviderAgent& agent);
    /// Empty the maps of the subsystems that fill their own.
    void (*clearDriverLogMaps)(ProviderAgent& agent);
    void (*clearPortVirtualizationMaps)(ProviderAgent& agent);
    void (*clearDiagnosticMaps)(ProviderAgent& agent);
};

/// Defined by the program that links the agent: the module has the model's functions, a test its own.
extern const ModelStages modelStages;

} // namespace cimple
