// The hardware: product, port group, card, chip, PCI device and connector of each port, with their associations.
#pragma once

#include "agent/ModelStages.h"
#include "agent/ProviderAgent.h"
#include "device/FCAdapter.h"
#include "device/FCPort.h"
#include "schema/CIM_Chassis.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_LogicalPortGroup.h"
#include "schema/TVRHBA_PhysicalConnector.h"
#include "schema/TVRHBA_Product.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SoftwareIdentity.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"

namespace cimple
{

/// What tells the versions of a chip apart; handed on to the vital product data.
enum class ChipKind
{
    E200 = 1,       ///< device id 0xE200
    SubAdapter = 2, ///< one of several on a card
    Other = 3,
};

/// All out arguments are instances in the cache, which owns them. Each function returns a BuildStatus.
/// Product and port group of an adapter: those with its serial number and node WWN, or new ones.
std::uint32_t createPackageInstances(ProviderAgent& agent, const FCAdapter& adapter, TVRHBA_Product*& product,
                                     TVRHBA_LogicalPortGroup*& group);

/// Card of an adapter: the one with its serial number, or a new one.
std::uint32_t createCardInstances(ProviderAgent& agent, const FCAdapter& adapter, TVRHBA_Card*& card, bool& isNew);

/// What a new card is associated with; ends the first time that the cache refuses an association.
struct CardSurroundings
{
    const TVRHBA_Product* product;
    const TVRHBA_SoftwareIdentity* providerIdentity;
    const TVRHBA_RegisteredProfile* physicalAsset;
    const CIM_Chassis* chassis;
};
std::uint32_t createCardAssociations(ProviderAgent& agent, const TVRHBA_Card* card, const CardSurroundings& around);

/// Chip of an adapter: the one with its serial number and sub-adapter, or a new one.
std::uint32_t createChipInstances(ProviderAgent& agent, const FCAdapter& adapter, const TVRHBA_Card* card,
                                  const TVRHBA_SoftwareInstallationService* installService, TVRHBA_Chip*& chip,
                                  ChipKind& kind);

/// PCI device of a port, from its registers. BUILD_NO_INSTANCE skips the rest of the port.
std::uint32_t createPCIDeviceInstance(ProviderAgent& agent, unsigned adapterIndex, unsigned portIndex,
                                      const FCPort& port, const FCAdapter& adapter,
                                      const TVRHBA_RegisteredProfile* pciDeviceProfile);

/// Connector of a port.
std::uint32_t createPhysicalConnectorInstances(ProviderAgent& agent, const FCAdapter& adapter, const TVRHBA_Chip* chip,
                                               const TVRHBA_Card* card, const TVRHBA_Product* product,
                                               TVRHBA_PhysicalConnector*& connector);

/// The attributes that every adapter of the model is built with.
const FCAdapterAttributes& attributesOf(const FCAdapter& adapter);

} // namespace cimple
