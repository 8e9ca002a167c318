// The device of a logical unit: its class follows from the SCSI peripheral device type.
#pragma once

#include "agent/Build.h"
#include "agent/RefreshContext.h"
#include "schema/TVRHBA_SCSIProtocolEndpoint.h"
#include "schema/TVRHBA_SCSIProtocolInitiatorEndpoint.h"

#include <cstdint>

namespace cimple
{

/// A logical unit behind a port, with the texts that its instances share and the ends of its associations.
struct LogicalUnit
{
    ProviderAgent& agent;
    const Target& target;
    Ref<CIM_ComputerSystem> system;
    Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> initiator;
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint = {};
    String osDeviceName = {};
    String description = {}; ///< what the unit says of itself
    String inquiry = {};     ///< the same without the serial number
    String identifier = {};
    String deviceId = {};
};

/// The device, its association with the system, and the path to it. A BuildStatus.
std::uint32_t createLogicalDevice(const LogicalUnit& unit);

} // namespace cimple
