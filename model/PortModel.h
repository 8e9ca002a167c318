// The logical side of a port: FC port, statistics, controllers, initiator endpoint, and what ties them to the host and
// to the hardware. All are steps of the refresh and return a BuildStatus; BUILD_NO_INSTANCE where an instance has the
// keys of another port's.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

std::uint32_t createFCPort(PortContext& port);
std::uint32_t createFCPortStatistics(PortContext& port);
std::uint32_t createSCSIProtocolController(PortContext& port);
std::uint32_t createPortController(PortContext& port);
/// The controller's transceiver; where there is none, nothing.
std::uint32_t createTransceiver(PortContext& port);
/// The programs in the flash memory behind the controller.
std::uint32_t createFlashImages(PortContext& port);
/// What ties the controller to port, card and system.
std::uint32_t createPortControllerAssociations(PortContext& port);
std::uint32_t createInitiatorEndpoint(PortContext& port);

} // namespace cimple
