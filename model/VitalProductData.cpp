#include "model/VitalProductData.h"

#include "agent/Build.h"
#include "device/TVR_MethodWrapper.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_ElementVPD.h"
#include "schema/TVRHBA_FRUElementVPD.h"
#include "schema/TVRHBA_FRUVitalProductData.h"
#include "schema/TVRHBA_FirmwareElementSoftwareIdentity.h"
#include "schema/TVRHBA_PCIDevice.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_Realizes.h"
#include "schema/TVRHBA_SoftwareIdentity.h"
#include "schema/TVRHBA_VitalProductData.h"

#include <algorithm>
#include <cstring>
#include <map>

namespace cimple
{

namespace
{

constexpr std::uint16_t notChangeable = 0; // CIM_SettingData.ChangeableType
constexpr std::uint16_t isCurrent = 1;     // CIM_ElementSettingData.IsCurrent

/// The keywords that tell one unit from another, however many its ports are.
constexpr std::string_view unitKeywords[] = {vpdProductKeyword, "PN", "SN", "EC", "MN", "YA"};

bool tellsOfUnit(const VpdField& field)
{
    return std::ranges::find(unitKeywords, field.keyword) != std::end(unitKeywords);
}

/// What the settings of a port and those of a card have in common.
void addField(auto& settings, const VpdField& field)
{
    settings.OtherIdentifyingInfo.value.append(field.value);
    settings.IdentifyingDescriptions.value.append(vpdName(field.keyword));
}

template <class Settings> Ref<Settings> makeSettings(const String& instanceId, const String& elementName)
{
    Ref<Settings> made = fresh<Settings>();
    made->InstanceID.set(instanceId);
    made->ElementName.set(elementName);
    made->ChangeableType.set(notChangeable);
    made->OtherIdentifyingInfo.null = 0;
    made->IdentifyingDescriptions.null = 0;
    return made;
}

/// The chips of a card with sub-adapters have data of their own, and are told apart in the name.
String portVpdName(const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    const auto number = static_cast<int>(adapter.portNumber);
    if (port.chipKind == ChipKind::SubAdapter)
        return formatText("TVR HBA VPD:%s:%s:Port:%d", adapter.serialNumber.c_str(), adapter.subadapterID.c_str(),
                          number);
    return formatText("TVR HBA VPD:%s:Port:%d", adapter.serialNumber.c_str(), number);
}

Ref<TVRHBA_VitalProductData> makePortVpd(const PortContext& port)
{
    Ref<TVRHBA_VitalProductData> made = makeSettings<TVRHBA_VitalProductData>(
        formatText("TVR FC HBA:VPD:%s", port.port.name.c_str()), portVpdName(port));
    made->Description.set("Vital product data of the FC port.");
    for (const VpdField& field : port.vpd)
        addField(*made, field);
    return made;
}

String fruId(const String& serialNumber)
{
    return formatText("TVR FC HBA:FRU VPD:%s", serialNumber.c_str());
}

Ref<TVRHBA_FRUVitalProductData> makeCardFru(const PortContext& port)
{
    const String serialNumber(port.on.attributes.serialNumber);
    Ref<TVRHBA_FRUVitalProductData> made = makeSettings<TVRHBA_FRUVitalProductData>(
        fruId(serialNumber), formatText("TVR HBA FRU:%s", serialNumber.c_str()));
    made->Description.set("Vital product data of the card.");
    for (const VpdField& field : port.vpd)
        if (tellsOfUnit(field))
            addField(*made, field);
    return made;
}

// --- what is taken over ------------------------------------------------------------------------------------

const String* valueOf(const TVRHBA_FRUVitalProductData& fru, std::string_view keyword)
{
    const std::string name = vpdName(keyword);
    const Array<String>& names = fru.IdentifyingDescriptions.value;
    for (std::uint32_t i = 0; i < names.size(); i++)
        if (names[i] == name.c_str() && fru.OtherIdentifyingInfo.value[i].size() > 0)
            return &fru.OtherIdentifyingInfo.value[i];
    return nullptr;
}

/// A property that a card is shown with, and the keyword that tells it where the adapter does not.
struct CardRow
{
    Property<String> TVRHBA_Card::*property;
    std::string_view keyword;
};

constexpr CardRow cardRows[] = {
    {&TVRHBA_Card::Manufacturer, "MN"},      {&TVRHBA_Card::Model, vpdProductKeyword},
    {&TVRHBA_Card::Name, vpdProductKeyword}, {&TVRHBA_Card::Description, vpdProductKeyword},
    {&TVRHBA_Card::PartNumber, "PN"},        {&TVRHBA_Card::VendorEquipmentType, "PN"},
    {&TVRHBA_Card::SerialNumber, "SN"},      {&TVRHBA_Card::Version, "EC"},
    {&TVRHBA_Card::UserTracking, "YA"},
};

void fillWhereEmpty(Property<String>& property, const String* value)
{
    if (value && (property.null || property.value.size() == 0))
        property.set(*value);
}

void completeCard(TVRHBA_Card& card, const TVRHBA_FRUVitalProductData& fru)
{
    for (const CardRow& row : cardRows)
        fillWhereEmpty(card.*row.property, valueOf(fru, row.keyword));
    if (card.CanBeFRUed.null)
        card.CanBeFRUed.set(true);
}

/// Null where there is no card, or nothing known of it.
const TVRHBA_FRUVitalProductData* fruOfCard(ProviderAgent& agent, const TVRHBA_Card* card)
{
    if (!card)
        return nullptr;
    const String id = fruId(card->Tag.value);
    return mapOf<TVRHBA_FRUVitalProductData>(agent).findFirst([&](const auto& known)
                                                              { return known.InstanceID.value == id; });
}

const TVRHBA_FRUVitalProductData* fruOfController(ProviderAgent& agent, const CIM_ManagedElement* controller)
{
    const TVRHBA_Realizes* realized = mapOf<TVRHBA_Realizes>(agent).findFirst(
        [&](const TVRHBA_Realizes& known) { return key_eq(known.Dependent, controller); });
    return realized ? fruOfCard(agent, mapOf<TVRHBA_Card>(agent).withKeysOf(realized->Antecedent)) : nullptr;
}

/// Firmware that runs on one unit alone has the unit's numbers.
void completeFirmware(ProviderAgent& agent)
{
    std::map<TVRHBA_SoftwareIdentity*, const TVRHBA_FRUVitalProductData*> units;
    const auto firmware = mapOf<TVRHBA_FirmwareElementSoftwareIdentity>(agent);
    for (std::size_t i = 0; const TVRHBA_FirmwareElementSoftwareIdentity* on = firmware.at(i); i++)
    {
        TVRHBA_SoftwareIdentity* identity = mapOf<TVRHBA_SoftwareIdentity>(agent).withKeysOf(on->Antecedent);
        if (!identity)
            continue;
        const TVRHBA_FRUVitalProductData* fru = fruOfController(agent, on->Dependent);
        const auto known = units.emplace(identity, fru).first;
        if (known->second != fru)
            known->second = nullptr;
    }
    for (const auto& [identity, fru] : units)
        if (fru)
        {
            fillWhereEmpty(identity->SerialNumber, valueOf(*fru, "SN"));
            fillWhereEmpty(identity->Manufacturer, valueOf(*fru, "MN"));
        }
}

} // namespace

std::uint32_t readVitalProductData(PortContext& port)
{
    return TVR_MethodWrapper::GetVPD(port.port.name.c_str(), &port.vpd) == RM_OK ? BUILD_DONE : BUILD_FAILED;
}

void createPortVpd(const PortContext& port, const TVRHBA_PCIDevice* device)
{
    ProviderAgent& agent = port.host.agent;
    const TVRHBA_VitalProductData* vpd = nullptr;
    if (!port.vpd.empty())
        if (const Ref<TVRHBA_VitalProductData> made = unlessOutOfMemory([&] { return makePortVpd(port); }))
            vpd = mapOf<TVRHBA_VitalProductData>(agent).insert(made, "Insert Failed : m_TVRHBA_VitalProductData_map");
    if (!vpd)
        TVR_LOG(TVR_DBG, "FC port %s CreateVPD failed", port.port.name.c_str());

    using OfDevice = TVRHBA_ElementVPD;
    join<OfDevice>(agent, &OfDevice::ManagedElement, device, &OfDevice::SettingData, vpd,
                   "Insert Failed : m_TVRHBA_ElementVPD_map", [](OfDevice& made) { made.IsCurrent.set(isCurrent); });
}

std::uint32_t updateCardFru(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    if (std::ranges::none_of(port.vpd, tellsOfUnit) || fruOfCard(agent, port.on.card))
        return BUILD_DONE;
    const TVRHBA_FRUVitalProductData* fru = mapOf<TVRHBA_FRUVitalProductData>(agent).insert(
        makeCardFru(port), "Insert Failed : m_TVRHBA_FRUVitalProductData_map");
    if (!fru)
        return BUILD_FAILED;
    using OfCard = TVRHBA_FRUElementVPD;
    const Joined joined =
        join<OfCard>(agent, &OfCard::ManagedElement, port.on.card, &OfCard::SettingData, fru,
                     "Insert Failed : m_TVRHBA_FRUElementVPD_map", [](OfCard& made) { made.IsCurrent.set(isCurrent); });
    return joined == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

std::uint32_t updateFruData(HostContext& host)
{
    const auto cards = mapOf<TVRHBA_Card>(host.agent);
    for (std::size_t i = 0; TVRHBA_Card* card = cards.at(i); i++)
        if (const TVRHBA_FRUVitalProductData* fru = fruOfCard(host.agent, card))
            completeCard(*card, *fru);
    completeFirmware(host.agent);
    return BUILD_DONE;
}

} // namespace cimple
