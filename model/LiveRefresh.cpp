#include "model/LiveRefresh.h"

namespace cimple
{

// No step puts an instance of these classes in the cache, so there is none to bring up to date.

template <> void liveRefresh<TVRHBA_DriverParams>(ProviderAgent&) {}

template <> void liveRefresh<TVRHBA_DriverParamGlobal>(ProviderAgent&) {}

} // namespace cimple
