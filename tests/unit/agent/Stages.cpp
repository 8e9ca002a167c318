// The agent's tests build no model.
#include "agent/ModelStages.h"

namespace cimple
{

const ModelStages modelStages = {
    .updateAdapterMaps = [](ProviderAgent&) -> std::uint32_t { return BUILD_DONE; },
    .updateSANMaps = [](ProviderAgent&) -> std::uint32_t { return BUILD_DONE; },
    .clearDriverLogMaps = [](ProviderAgent&) {},
    .clearPortVirtualizationMaps = [](ProviderAgent&) {},
    .clearDiagnosticMaps = [](ProviderAgent&) {},
};

} // namespace cimple
