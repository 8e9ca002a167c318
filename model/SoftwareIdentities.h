// The software of the adapters as instances: the driver, and per port the firmware and the images on its flash.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Step of the host: the driver of the FC adapters; where they have several, one identity for each of them.
std::uint32_t createDriverSoftwareIdentities(HostContext& host);

/// Step of a port: what its adapter reports of its software, and the port's driver. BUILD_NO_INSTANCE: an identity has
/// the keys of another port's.
std::uint32_t createPortSoftwareIdentities(PortContext& port);

} // namespace cimple
