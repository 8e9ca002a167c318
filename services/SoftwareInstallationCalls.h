// What the installation of software asks of the RM library.
#pragma once

#include "agent/LogText.h"
#include "agent/ProviderAgent.h"
#include "device/RmApi.h"

#include <cstdint>

namespace cimple
{

/// Whether a regular file is there; logs one of the texts if not.
bool isFileThere(const char* file, const LogText& notFound, const LogText& notReadable);

/// Writes the firmware of a file to the flash memory behind a port: RM status, 1 where the port or the file is none.
RM_STATUS tvrcimDownloadFW(const HBA_WWN& wwpn, const char* file);

/// Reads the version of the firmware in the flash memory anew into the identity in the cache, whose key stays what it
/// is until the next refresh. The caller holds the data lock.
void UpdateFirmwareOnFlash(ProviderAgent& agent, const HBA_WWN& wwpn);

/// `dynamic` gets 1 if the port changed at once and 0 if it will at the next reboot.
RM_STATUS SetPortEnabled(const HBA_WWN& wwpn, std::uint32_t enabled, std::uint32_t& dynamic);

/// Forward error correction of a port's link: `enabled` as the library has it.
RM_STATUS SetFECState(const HBA_WWN& wwpn, std::uint32_t enabled);

} // namespace cimple
