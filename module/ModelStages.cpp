#include "agent/ModelStages.h"

#include "model/AdapterMaps.h"
#include "model/Slices.h"

namespace cimple
{

const ModelStages modelStages = {
    .updateAdapterMaps = buildAdapterMaps,
    .updateSANMaps = updateSANMaps,
    .clearDriverLogMaps = clearDriverLogMaps,
    .clearPortVirtualizationMaps = clearPortVirtualizationMaps,
    .clearDiagnosticMaps = [](ProviderAgent& agent) { ClearDiagnosticClassMaps(agent, 0); },
};

} // namespace cimple
