#include "model/PhysicalModel.h"

#include "model/Affects.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_CardConformsToProfile.h"
#include "schema/TVRHBA_CardContainsChip.h"
#include "schema/TVRHBA_CardContainsConnector.h"
#include "schema/TVRHBA_ChassisContainsCard.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_ConnectorDependsOnChip.h"
#include "schema/TVRHBA_HostedCollection.h"
#include "schema/TVRHBA_InstallServiceAffectsChip.h"
#include "schema/TVRHBA_LogicalPortGroup.h"
#include "schema/TVRHBA_PhysicalConnector.h"
#include "schema/TVRHBA_Product.h"
#include "schema/TVRHBA_ProductPhysicalComponent.h"
#include "schema/TVRHBA_ProductPhysicalConnector.h"
#include "schema/TVRHBA_ProviderElementSoftwareIdentity.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SoftwareIdentity.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"

namespace cimple
{

namespace
{

/// The texts that the hardware instances of one adapter share.
struct HardwareTexts
{
    explicit HardwareTexts(const FCAdapterAttributes& attributes)
        : manufacturer(attributes.manufacturer), serialNumber(attributes.serialNumber), model(attributes.model),
          modelDescription(attributes.modelDescription), hardwareVersion(attributes.hardwareVersion)
    {}
    String manufacturer;
    String serialNumber;
    String model;
    String modelDescription;
    String hardwareVersion;
};

Ref<TVRHBA_Product> makeProduct(const FCAdapterAttributes& attributes)
{
    const HardwareTexts texts(attributes);
    Ref<TVRHBA_Product> product = fresh<TVRHBA_Product>();
    product->Description.set(texts.modelDescription);
    product->ElementName.set(attributes.nodeSymbolicName);
    product->Name.set(texts.model);
    product->IdentifyingNumber.set(texts.serialNumber);
    product->Vendor.set(texts.manufacturer);
    product->Version.set(texts.hardwareVersion);
    return product;
}

Ref<TVRHBA_LogicalPortGroup> makePortGroup(const FCAdapterAttributes& attributes)
{
    const String nodeWWN(attributes.nodeWWN);
    Ref<TVRHBA_LogicalPortGroup> group = fresh<TVRHBA_LogicalPortGroup>();
    group->InstanceID.set(formatText("TVR FC HBA:%s", nodeWWN.c_str()));
    group->Description.set("The Fibre Channel ports of the HBA.");
    group->Name.set(nodeWWN);
    group->NameFormat.set("WWN");
    group->ElementName.set(attributes.serialNumber);
    return group;
}

Ref<TVRHBA_Card> makeCard(const FCAdapterAttributes& attributes)
{
    const HardwareTexts texts(attributes);
    Ref<TVRHBA_Card> card = fresh<TVRHBA_Card>();
    card->CreationClassName.set(className<TVRHBA_Card>());
    card->Tag.set(texts.serialNumber);
    card->OtherIdentifyingInfo.set(texts.serialNumber);
    card->Name.set(texts.model);
    card->Manufacturer.set(texts.manufacturer);
    card->Model.set(texts.model);
    card->Description.set(texts.modelDescription);
    card->SerialNumber.set(texts.serialNumber);
    card->TVRSerialNumber.set(texts.serialNumber);
    card->PartNumber.set(texts.model);
    card->SKU.set("");
    card->PackageType.set(9);
    card->VendorSpecID.set(attributes.vendorSpecificID);
    card->DeviceID.set(attributes.deviceID);
    card->ModelID.set(attributes.modelID);
    card->SLIMode.set(attributes.sliMode);
    card->HostingBoard.set(false);
    card->ElementName.set(formatText("TVR FCHBA:%s:%s", texts.model.c_str(), texts.serialNumber.c_str()));
    card->Version.set(texts.hardwareVersion);
    return card;
}

ChipKind chipKind(const FCAdapterAttributes& attributes)
{
    if (!attributes.subadapterID.empty())
        return ChipKind::SubAdapter;
    return attributes.deviceID == 0xE200 ? ChipKind::E200 : ChipKind::Other;
}

String chipTag(const FCAdapterAttributes& attributes)
{
    if (attributes.subadapterID.empty())
        return attributes.serialNumber;
    return attributes.serialNumber + ":" + attributes.subadapterID;
}

Ref<TVRHBA_Chip> makeChip(const FCAdapterAttributes& attributes)
{
    const HardwareTexts texts(attributes);
    Ref<TVRHBA_Chip> chip = fresh<TVRHBA_Chip>();
    chip->CreationClassName.set(className<TVRHBA_Chip>());
    chip->Tag.set(chipTag(attributes));
    chip->Name.set(texts.model);
    chip->Manufacturer.set(texts.manufacturer);
    chip->Description.set(texts.modelDescription);
    chip->Model.set(texts.model);
    chip->SerialNumber.set(texts.serialNumber);
    chip->SubAdapterId.set(attributes.subadapterID);
    chip->ElementName.set(formatText("TVR HBA ASIC:%s:%s", texts.model.c_str(), texts.serialNumber.c_str()));
    if (attributes.boardTemperature > 0)
    {
        chip->BoardTemperature.set(attributes.boardTemperature);
        chip->ThresholdCriticalTemp.set(attributes.boardTemperatureState);
        chip->ThresholdWarningTemp.set(attributes.boardTemperatureThreshold);
    }
    chip->TemperatureUnit.set("Celsius");
    chip->PrioLaneCapability.set(0);
    return chip;
}

/// An adapter object has its own port as port 0; further ports of the same object are told apart by their own WWPNs.
String connectorTag(const PortContext& port)
{
    return String(port.index == 0 ? port.on.attributes.port0WWPN : port.port.name);
}

Ref<TVRHBA_PhysicalConnector> makeConnector(const FCAdapterAttributes& attributes, const String& tag)
{
    const HardwareTexts texts(attributes);
    const auto port = static_cast<int>(attributes.portNumber);
    Ref<TVRHBA_PhysicalConnector> connector = fresh<TVRHBA_PhysicalConnector>();
    connector->CreationClassName.set(className<TVRHBA_PhysicalConnector>());
    connector->Tag.set(tag);
    connector->InstanceID.set(formatText("%s:%d", texts.serialNumber.c_str(), port));
    connector->OtherIdentifyingInfo.set(formatText("LocalPhysicalPort:%d,Transceiver:SFP", port));
    connector->Name.set(tag);
    connector->Manufacturer.set(texts.manufacturer);
    connector->Model.set(texts.model);
    connector->Description.set(texts.modelDescription);
    connector->ElementName.set(formatText("TVR HBA Port:%s:Network Connector:%d", texts.serialNumber.c_str(), port));
    connector->ConnectorLayout.set(12);
    connector->SerialNumber.set(texts.serialNumber);
    return connector;
}

} // namespace

std::uint32_t createPackageInstances(AdapterContext& on)
{
    ProviderAgent& agent = on.host.agent;
    const String serialNumber(on.attributes.serialNumber);
    on.product = mapOf<TVRHBA_Product>(agent).findFirst([&](const auto& known)
                                                        { return known.IdentifyingNumber.value == serialNumber; });
    if (!on.product)
        on.product =
            mapOf<TVRHBA_Product>(agent).insert(makeProduct(on.attributes), "Insert Failed : m_TVRHBA_Product_map");
    if (!on.product)
        return BUILD_FAILED;

    Ref<TVRHBA_LogicalPortGroup> made = makePortGroup(on.attributes);
    on.group = mapOf<TVRHBA_LogicalPortGroup>(agent).withKeysOf(made.get());
    if (on.group)
        return BUILD_DONE;
    on.group = mapOf<TVRHBA_LogicalPortGroup>(agent).insert(made, "Insert Failed : m_TVRHBA_LogicalPortGroup_map");
    if (!on.group)
        return BUILD_FAILED;
    using Hosted = TVRHBA_HostedCollection;
    const Joined hosted = join<Hosted>(agent, &Hosted::Antecedent, on.host.system, &Hosted::Dependent, on.group,
                                       "Insert Failed : m_TVRHBA_HostedCollection_map");
    return hosted == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

std::uint32_t createCardInstances(AdapterContext& on)
{
    ProviderAgent& agent = on.host.agent;
    const String serialNumber(on.attributes.serialNumber);
    on.card = mapOf<TVRHBA_Card>(agent).findLast([&](const auto& known)
                                                 { return known.TVRSerialNumber.value == serialNumber; });
    on.cardIsNew = !on.card;
    if (on.cardIsNew)
        on.card = mapOf<TVRHBA_Card>(agent).insert(makeCard(on.attributes), "Insert Failed : m_TVRHBA_Card_map");
    return on.card ? BUILD_DONE : BUILD_FAILED;
}

std::uint32_t createCardAssociations(PortContext& port)
{
    if (!port.on.cardIsNew)
        return BUILD_DONE;
    TVR_LOG(TVR_DBG, "Card is created. Creating the associations");
    HostContext& host = port.host;
    const TVRHBA_Card* card = port.on.card;

    using Component = TVRHBA_ProductPhysicalComponent;
    if (join<Component>(host.agent, &Component::GroupComponent, port.on.product, &Component::PartComponent, card,
                        "Insert Failed : m_TVRHBA_ProductPhysicalComponent_map") == Joined::Refused)
        return BUILD_FAILED;

    using Identity = TVRHBA_ProviderElementSoftwareIdentity;
    if (join<Identity>(host.agent, &Identity::Antecedent, host.providerIdentity, &Identity::Dependent, card,
                       "Insert Failed (CNA): m_TVRHBA_ProviderElementSoftwareIdentity_map",
                       [](Identity& identity) {
                           identity.ElementSoftwareStatus.set({2, 6});
                       }) == Joined::Refused)
        return BUILD_FAILED;

    using Conforms = TVRHBA_CardConformsToProfile;
    if (join<Conforms>(host.agent, &Conforms::ConformantStandard, host.profiles.find("Physical Asset"),
                       &Conforms::ManagedElement, card,
                       "Insert Failed : m_TVRHBA_CardConformsToProfile_map") == Joined::Refused)
        return BUILD_FAILED;

    using Contains = TVRHBA_ChassisContainsCard;
    const Joined contained = join<Contains>(host.agent, &Contains::GroupComponent, host.chassis.get(),
                                            &Contains::PartComponent, card, "Insert Failed:TVRHBA_ChassisContainsCard");
    return contained == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

std::uint32_t createChipInstances(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    const FCAdapterAttributes& attributes = port.on.attributes;
    port.chipKind = chipKind(attributes);
    const String tag = chipTag(attributes);
    port.chip = mapOf<TVRHBA_Chip>(agent).findLast([&](const auto& known) { return known.Tag.value == tag; });
    if (port.chip)
        return BUILD_DONE;
    port.chip = mapOf<TVRHBA_Chip>(agent).insert(makeChip(attributes), "Insert Failed : m_TVRHBA_Chip_map");
    if (!port.chip)
        return BUILD_FAILED;

    using Contains = TVRHBA_CardContainsChip;
    if (join<Contains>(agent, &Contains::GroupComponent, port.on.card, &Contains::PartComponent, port.chip,
                       "Insert Failed : TVRHBA_Container") == Joined::Refused)
        return BUILD_FAILED;

    affect<TVRHBA_InstallServiceAffectsChip>(agent, port.host.installationService, port.chip,
                                             "Insert Failed:TVRHBA_InstallServiceAffectsChip");
    return BUILD_DONE;
}

std::uint32_t createPhysicalConnectorInstances(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    port.connector = mapOf<TVRHBA_PhysicalConnector>(agent).insert(
        makeConnector(port.on.attributes, connectorTag(port)), "Insert Failed (HBA): m_TVRHBA_PhysicalConnector");
    if (!port.connector)
        return BUILD_NO_INSTANCE;

    using OfProduct = TVRHBA_ProductPhysicalConnector;
    if (join<OfProduct>(agent, &OfProduct::GroupComponent, port.on.product, &OfProduct::PartComponent, port.connector,
                        "Insert Failed (HBA): TVRHBA_ProductPhysicalConnector") == Joined::Refused)
        return BUILD_NO_INSTANCE;

    using OnCard = TVRHBA_CardContainsConnector;
    if (join<OnCard>(agent, &OnCard::GroupComponent, port.on.card, &OnCard::PartComponent, port.connector,
                     "Insert Failed (HBA): TVRHBA_CardContainsConnector") == Joined::Refused)
        return BUILD_NO_INSTANCE;

    using OnChip = TVRHBA_ConnectorDependsOnChip;
    const Joined onChip = join<OnChip>(agent, &OnChip::Antecedent, port.connector, &OnChip::Dependent, port.chip,
                                       "Insert Failed (CNA): TVRHBA_ConnectorDependsOnChip");
    return onChip == Joined::Refused ? BUILD_NO_INSTANCE : BUILD_DONE;
}

} // namespace cimple
