// The device of a logical unit: its class follows from the SCSI peripheral device type.
#pragma once

#include "agent/Build.h"
#include "agent/RefreshContext.h"
#include "runtime/meta/Prototype.h"
#include "schema/TVRHBA_LogicalDisk.h"
#include "schema/TVRHBA_SCSIArbitraryLogicalUnit.h"
#include "schema/TVRHBA_SCSIProtocolEndpoint.h"
#include "schema/TVRHBA_SCSIProtocolInitiatorEndpoint.h"
#include "schema/TVRHBA_StorageExtent.h"
#include "schema/TVRHBA_StorageVolume.h"
#include "schema/TVRHBA_TapeDrive.h"

#include <cstdint>

namespace cimple
{

/// What the devices of a class have in common, whatever the unit.
struct DevicePrototypes
{
    explicit DevicePrototypes(const CIM_ComputerSystem& system);
    Prototype<TVRHBA_StorageVolume> volume;
    Prototype<TVRHBA_TapeDrive> tape;
    Prototype<TVRHBA_LogicalDisk> disk;
    Prototype<TVRHBA_SCSIArbitraryLogicalUnit> arbitrary;
    Prototype<TVRHBA_StorageExtent> extent;
    String capacityUnit = "Byte";
};

/// A logical unit behind a port, with the texts that its instances share and the ends of its associations. The
/// instances of the SAN maps are such ends themselves: nothing writes to them once they are in their maps.
struct LogicalUnit
{
    ProviderAgent& agent;
    const DevicePrototypes& prototypes;
    const Target& target;
    const Ref<CIM_ComputerSystem>& system;
    const Ref<TVRHBA_SCSIProtocolInitiatorEndpoint>& initiator;
    String inquiry;          ///< what the unit says of itself
    String description = {}; ///< the same with its serial number
    String osDeviceName = {};
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint = {};
    char identifier[33] = {};
    String deviceId = {};
};

/// The device, its association with the system, and the path to it. A BuildStatus.
std::uint32_t createLogicalDevice(const LogicalUnit& unit);

} // namespace cimple
