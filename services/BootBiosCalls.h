// Whether an adapter's boot code is enabled, through the RM library.
#pragma once

#include "device/RmApi.h"

#include <cstdint>

namespace cimple
{

/// `state` gets the library's number, 1 if it is enabled, and stays on a failure. Returns 0, or 1 for any failure.
std::uint32_t tvrcimGetBootBiosState(const HBA_WWN& wwpn, std::uint32_t* state);

/// `control` begins with "e" to enable or "d" to disable, in either case. The library's status; 4 for a null and 1 for
/// another control.
std::uint32_t tvrcimSetBootBiosState(const HBA_WWN& wwpn, const char* control);

} // namespace cimple
