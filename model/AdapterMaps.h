// The adapter-side half of the instance cache.
#pragma once

#include "agent/ProviderAgent.h"

#include <cstdint>

namespace cimple
{

/// Clears and rebuilds the adapter maps. 0 on the clean exit, otherwise BUILD_FAILED; nothing is rolled back.
std::uint32_t buildAdapterMaps(ProviderAgent& agent);

} // namespace cimple
