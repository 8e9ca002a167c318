// The hardware: product, port group, card, chip, PCI device and connector of each port, with their associations. All
// are steps of the refresh and return a BuildStatus.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

/// Product and port group of an adapter: those with its serial number and node WWN, or new ones.
std::uint32_t createPackageInstances(AdapterContext& on);

/// Card of an adapter: the one with its serial number, or a new one.
std::uint32_t createCardInstances(AdapterContext& on);

/// What a new card is associated with. On the further ports of a new card the cache refuses the first association,
/// which ends this step and not the run.
std::uint32_t createCardAssociations(PortContext& port);

/// Chip of a port: the one with its adapter's serial number and sub-adapter, or a new one.
std::uint32_t createChipInstances(PortContext& port);

/// PCI device of a port, from its registers.
std::uint32_t createPCIDeviceInstance(PortContext& port);

/// Connector of a port. BUILD_NO_INSTANCE: the connector, or an association of it, has the keys of another port's.
std::uint32_t createPhysicalConnectorInstances(PortContext& port);

} // namespace cimple
