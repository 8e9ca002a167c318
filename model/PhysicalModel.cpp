#include "model/PhysicalModel.h"

#include "model/Build.h"
#include "model/ComputerSystem.h"
#include "schema/TVRHBA_CardConformsToProfile.h"
#include "schema/TVRHBA_CardContainsChip.h"
#include "schema/TVRHBA_CardContainsConnector.h"
#include "schema/TVRHBA_ChassisContainsCard.h"
#include "schema/TVRHBA_ConnectorDependsOnChip.h"
#include "schema/TVRHBA_HostedCollection.h"
#include "schema/TVRHBA_InstallServiceAffectsChip.h"
#include "schema/TVRHBA_ProductPhysicalComponent.h"
#include "schema/TVRHBA_ProductPhysicalConnector.h"
#include "schema/TVRHBA_ProviderElementSoftwareIdentity.h"

#include <stdexcept>

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
    Ref<TVRHBA_Product> product(create<TVRHBA_Product>(true));
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
    Ref<TVRHBA_LogicalPortGroup> group(create<TVRHBA_LogicalPortGroup>(true));
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
    Ref<TVRHBA_Card> card(create<TVRHBA_Card>(true));
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
    Ref<TVRHBA_Chip> chip(create<TVRHBA_Chip>(true));
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

Ref<TVRHBA_PhysicalConnector> makeConnector(const FCAdapterAttributes& attributes)
{
    const HardwareTexts texts(attributes);
    const String port0WWPN(attributes.port0WWPN);
    const auto port = static_cast<int>(attributes.portNumber);
    Ref<TVRHBA_PhysicalConnector> connector(create<TVRHBA_PhysicalConnector>(true));
    connector->CreationClassName.set(className<TVRHBA_PhysicalConnector>());
    connector->Tag.set(port0WWPN);
    connector->InstanceID.set(formatText("%s:%d", texts.serialNumber.c_str(), port));
    connector->OtherIdentifyingInfo.set(formatText("LocalPhysicalPort:%d,Transceiver:SFP", port));
    connector->Name.set(port0WWPN);
    connector->Manufacturer.set(texts.manufacturer);
    connector->Model.set(texts.model);
    connector->Description.set(texts.modelDescription);
    connector->ElementName.set(formatText("TVR HBA Port:%s:Network Connector:%d", texts.serialNumber.c_str(), port));
    connector->ConnectorLayout.set(12);
    connector->SerialNumber.set(texts.serialNumber);
    return connector;
}

} // namespace

const FCAdapterAttributes& attributesOf(const FCAdapter& adapter)
{
    const auto* attributes = dynamic_cast<const FCAdapterAttributes*>(adapter.getAttributes());
    if (!attributes)
        throw std::runtime_error("FC adapter without attributes");
    return *attributes;
}

std::uint32_t createPackageInstances(ProviderAgent& agent, const FCAdapter& adapter, TVRHBA_Product*& product,
                                     TVRHBA_LogicalPortGroup*& group)
{
    const FCAdapterAttributes& attributes = attributesOf(adapter);
    const String serialNumber(attributes.serialNumber);
    product = findFirst<TVRHBA_Product>(agent.m_TVRHBA_Product_map, [&](const auto& known)
                                        { return known.IdentifyingNumber.value == serialNumber; });
    if (!product)
        product = insert(agent.m_TVRHBA_Product_map, makeProduct(attributes), "Insert Failed : m_TVRHBA_Product_map");
    if (!product)
        return BUILD_FAILED;

    Ref<TVRHBA_LogicalPortGroup> made = makePortGroup(attributes);
    group = findFirst<TVRHBA_LogicalPortGroup>(agent.m_TVRHBA_LogicalPortGroup_map, [&](const auto& known)
                                               { return known.InstanceID.value == made->InstanceID.value; });
    if (group)
        return BUILD_DONE;
    group = insert(agent.m_TVRHBA_LogicalPortGroup_map, made, "Insert Failed : m_TVRHBA_LogicalPortGroup_map");
    if (!group)
        return BUILD_FAILED;
    using Hosted = TVRHBA_HostedCollection;
    auto hosted = associate<Hosted>(&Hosted::Antecedent, computerSystem(agent), &Hosted::Dependent, group);
    if (hosted && !insert(agent.m_TVRHBA_HostedCollection_map, hosted, "Insert Failed : m_TVRHBA_HostedCollection_map"))
        return BUILD_FAILED;
    return BUILD_DONE;
}

std::uint32_t createCardInstances(ProviderAgent& agent, const FCAdapter& adapter, TVRHBA_Card*& card, bool& isNew)
{
    const FCAdapterAttributes& attributes = attributesOf(adapter);
    const String serialNumber(attributes.serialNumber);
    card = findLast<TVRHBA_Card>(agent.m_TVRHBA_Card_map,
                                 [&](const auto& known) { return known.TVRSerialNumber.value == serialNumber; });
    isNew = !card;
    if (isNew)
        card = insert(agent.m_TVRHBA_Card_map, makeCard(attributes), "Insert Failed : m_TVRHBA_Card_map");
    return card ? BUILD_DONE : BUILD_FAILED;
}

std::uint32_t createCardAssociations(ProviderAgent& agent, const TVRHBA_Card* card, const CardSurroundings& around)
{
    using Component = TVRHBA_ProductPhysicalComponent;
    auto component = associate<Component>(&Component::GroupComponent, around.product, &Component::PartComponent, card);
    if (component && !insert(agent.m_TVRHBA_ProductPhysicalComponent_map, component,
                             "Insert Failed : m_TVRHBA_ProductPhysicalComponent_map"))
        return BUILD_FAILED;

    using Identity = TVRHBA_ProviderElementSoftwareIdentity;
    auto identity = associate<Identity>(&Identity::Antecedent, around.providerIdentity, &Identity::Dependent, card);
    if (identity)
    {
        identity->ElementSoftwareStatus.set({2, 6});
        if (!insert(agent.m_TVRHBA_ProviderElementSoftwareIdentity_map, identity,
                    "Insert Failed (CNA): m_TVRHBA_ProviderElementSoftwareIdentity_map"))
            return BUILD_FAILED;
    }

    using Conforms = TVRHBA_CardConformsToProfile;
    auto conforms =
        associate<Conforms>(&Conforms::ConformantStandard, around.physicalAsset, &Conforms::ManagedElement, card);
    if (conforms && !insert(agent.m_TVRHBA_CardConformsToProfile_map, conforms,
                            "Insert Failed : m_TVRHBA_CardConformsToProfile_map"))
        return BUILD_FAILED;

    using Contains = TVRHBA_ChassisContainsCard;
    auto contains = associate<Contains>(&Contains::GroupComponent, around.chassis, &Contains::PartComponent, card);
    if (contains &&
        !insert(agent.m_TVRHBA_ChassisContainsCard_map, contains, "Insert Failed:TVRHBA_ChassisContainsCard"))
        return BUILD_FAILED;
    return BUILD_DONE;
}

std::uint32_t createChipInstances(ProviderAgent& agent, const FCAdapter& adapter, const TVRHBA_Card* card,
                                  const TVRHBA_SoftwareInstallationService* installService, TVRHBA_Chip*& chip,
                                  ChipKind& kind)
{
    const FCAdapterAttributes& attributes = attributesOf(adapter);
    kind = chipKind(attributes);
    const String tag = chipTag(attributes);
    chip = findLast<TVRHBA_Chip>(agent.m_TVRHBA_Chip_map, [&](const auto& known) { return known.Tag.value == tag; });
    if (chip)
        return BUILD_DONE;
    chip = insert(agent.m_TVRHBA_Chip_map, makeChip(attributes), "Insert Failed : m_TVRHBA_Chip_map");
    if (!chip)
        return BUILD_FAILED;

    using Contains = TVRHBA_CardContainsChip;
    auto contains = associate<Contains>(&Contains::GroupComponent, card, &Contains::PartComponent, chip);
    if (contains && !insert(agent.m_TVRHBA_CardContainsChip_map, contains, "Insert Failed : TVRHBA_Container"))
        return BUILD_FAILED;

    using Affects = TVRHBA_InstallServiceAffectsChip;
    auto affects = associate<Affects>(&Affects::AffectingElement, installService, &Affects::AffectedElement, chip);
    if (affects)
    {
        affects->ElementEffects.set({5});
        insert(agent.m_TVRHBA_InstallServiceAffectsChip_map, affects, "Insert Failed:TVRHBA_InstallServiceAffectsChip");
    }
    return BUILD_DONE;
}

std::uint32_t createPhysicalConnectorInstances(ProviderAgent& agent, const FCAdapter& adapter, const TVRHBA_Chip* chip,
                                               const TVRHBA_Card* card, const TVRHBA_Product* product,
                                               TVRHBA_PhysicalConnector*& connector)
{
    connector = insert(agent.m_TVRHBA_PhysicalConnector_map, makeConnector(attributesOf(adapter)),
                       "Insert Failed (HBA): m_TVRHBA_PhysicalConnector");
    if (!connector)
        return BUILD_FAILED;

    using OfProduct = TVRHBA_ProductPhysicalConnector;
    auto ofProduct = associate<OfProduct>(&OfProduct::GroupComponent, product, &OfProduct::PartComponent, connector);
    if (ofProduct && !insert(agent.m_TVRHBA_ProductPhysicalConnector_map, ofProduct,
                             "Insert Failed (HBA): TVRHBA_ProductPhysicalConnector"))
        return BUILD_FAILED;
    if (!card || !chip)
        return BUILD_DONE;

    using OnCard = TVRHBA_CardContainsConnector;
    auto onCard = associate<OnCard>(&OnCard::GroupComponent, card, &OnCard::PartComponent, connector);
    if (onCard &&
        !insert(agent.m_TVRHBA_CardContainsConnector_map, onCard, "Insert Failed (HBA): TVRHBA_CardContainsConnector"))
        return BUILD_FAILED;

    using OnChip = TVRHBA_ConnectorDependsOnChip;
    auto onChip = associate<OnChip>(&OnChip::Antecedent, connector, &OnChip::Dependent, chip);
    if (onChip && !insert(agent.m_TVRHBA_ConnectorDependsOnChip_map, onChip,
                          "Insert Failed (CNA): TVRHBA_ConnectorDependsOnChip"))
        return BUILD_FAILED;
    return BUILD_DONE;
}

} // namespace cimple
