// Vital product data: as instances of their own, and where they tell more of the hardware than its attributes do.
#pragma once

#include "agent/RefreshContext.h"

#include <cstdint>

namespace cimple
{

class TVRHBA_PCIDevice;

/// Step of a port: reads its vital product data, once for all that need them.
std::uint32_t readVitalProductData(PortContext& port);

/// Those of a port, tied to its PCI device. A failure is logged and is none of the device's.
void createPortVpd(const PortContext& port, const TVRHBA_PCIDevice* device);

/// Step of a port: what its vital product data tell of the card as a unit to be replaced, unless another port of the
/// card has told it.
std::uint32_t updateCardFru(PortContext& port);

/// Step of the host: completes the cards, and the firmware on them, with what is known of the units.
std::uint32_t updateFruData(HostContext& host);

} // namespace cimple
