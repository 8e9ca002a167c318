// What the services ask of the driver: parameters, and units that it serves with priority. They return the library's
// status, or 1 without a call where an argument is refused.
#pragma once

#include "device/RmApi.h"
#include "runtime/values/String.h"

#include <cstdint>

namespace cimple
{

/// Sets a parameter of the adapter behind a port; `cw1` is 1 for all adapters, `cw2` for a value that outlives the
/// driver. Name and value must fit the library's 255 characters.
RM_STATUS tvrcimSetDriverParam(const String& deviceId, const HBA_WWN& wwpn, std::uint8_t cw1, std::uint8_t cw2,
                               const char* name, const char* value);

/// Sets whether a unit of a target has a priority lane from a port, or from the virtual port `virtualPort` of it, which
/// is null for the port itself. `lun` is a number, 256 for all units; `option` an RM_LaneOption.
RM_STATUS SetOASLunState(const char* initiator, const char* target, const char* lun, const char* virtualPort,
                         std::uint32_t state, std::uint32_t option);

} // namespace cimple
