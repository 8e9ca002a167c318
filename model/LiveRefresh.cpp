#include "model/LiveRefresh.h"

#include "agent/SharedEnds.h"
#include "model/DriverParameters.h"

namespace cimple
{

template <> void liveRefresh<TVRHBA_DriverParams>(ProviderAgent& agent)
{
    const SharedEnds ends;
    rebuildDriverParameters(agent);
}

template <> void liveRefresh<TVRHBA_DriverParamGlobal>(ProviderAgent& agent)
{
    const SharedEnds ends;
    rebuildGlobalDriverParameters(agent);
}

} // namespace cimple
