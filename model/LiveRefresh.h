// Live data: what a client must see as it is now, not as the last refresh found it.
#pragma once

#include "agent/ProviderAgent.h"
#include "runtime/adapter/Provider.h"
#include "schema/AllClasses.h"

namespace cimple
{

/// Updates what is selected of the map of one class of the Active form in place; the caller holds all locks of the
/// refresh.
template <class Record> void liveRefresh(ProviderAgent& agent, const Selection& selection);

template <> void liveRefresh<TVRHBA_FCPort>(ProviderAgent& agent, const Selection& selection);
template <> void liveRefresh<TVRHBA_FCPortStatistics>(ProviderAgent& agent, const Selection& selection);
template <> void liveRefresh<TVRHBA_DriverParams>(ProviderAgent& agent, const Selection& selection);
template <> void liveRefresh<TVRHBA_DriverParamGlobal>(ProviderAgent& agent, const Selection& selection);

} // namespace cimple
