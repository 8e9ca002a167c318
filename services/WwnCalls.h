// The World Wide Names of a port, through the RM library.
#pragma once

#include "device/RmApi.h"

#include <cstdint>
#include <string>

namespace cimple
{

/// Status of a name that the library does not take for a port.
inline constexpr RM_STATUS wwnNotValid = 40000 + RM_ERROR_INVALID_WWN;

/// Gives the port other names of the kind `type`, an RM_WwnType of 0 or 1. Names that a virtual port of this host has
/// are refused with RM_ERROR_DUPLICATE_WWN before the library is asked; `duplicate` then tells what they repeat, and is
/// 0 otherwise. The library's status, or wwnNotValid. Throws std::bad_alloc.
RM_STATUS ChangeWWN(const HBA_WWN& wwpn, const HBA_WWN& newWwpn, const HBA_WWN& newWwnn, std::uint32_t type,
                    std::uint16_t* duplicate);

/// Gives the port back its names of the factory, or its non-volatile ones, by `type` as RM_RestoreWWN_t has it.
RM_STATUS RestoreWWN(const HBA_WWN& wwpn, std::uint32_t type);

/// The names of one kind, an RM_WwnType, as "10:00:00:90:fa:94:27:79". The texts are left as they are
/// where the port has none. Throws std::bad_alloc.
RM_STATUS ReadWWN(const HBA_WWN& wwpn, std::uint32_t type, std::string* wwpnText, std::string* wwnnText);

/// What the adapter can do with names, in bits of RM_WwnCapability.
RM_STATUS GetWWNCapability(const HBA_WWN& wwpn, std::uint32_t* capability);

} // namespace cimple
