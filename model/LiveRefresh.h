// Live data: what a client must see as it is now, not as the last refresh found it.
#pragma once

#include "agent/ProviderAgent.h"

namespace cimple
{

/// Updates the map of one active class in place; the caller holds all locks of the refresh. A class specialises it
/// when its live data are read; until then its map is served as it is.
template <class Record> void liveRefresh(ProviderAgent&) {}

} // namespace cimple
