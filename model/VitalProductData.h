// Vital product data: as instances of their own, and where they tell more of the hardware than its attributes do.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Reads those of a port, once for all steps that need them.
std::uint32_t readVitalProductData(PortContext& port);

} // namespace cimple
