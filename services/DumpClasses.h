// The dump service and what the library keeps of each port's dumps, as instances.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Makes them of the port controllers in the cache, whose data lock the caller holds. 0, 32769 if a port's name or a
/// map refuses, or 40008 without memory or a computer system; the first failure ends it, and what was made stays.
std::uint32_t FC_CreateDumpClasses(InstanceCache& cache);
std::uint32_t FC_ClearDumpClasses(InstanceCache& cache);

/// The step of the refresh: FC_CreateDumpClasses, and that it went well.
std::uint32_t createDumpClasses(HostContext& host);

} // namespace cimple
