// What a port controller has: its transceiver, and the programs in its flash memory.
#include "agent/Build.h"
#include "agent/SoftwareVersion.h"
#include "device/ForeignText.h"
#include "device/TVR_MethodWrapper.h"
#include "model/PortModel.h"
#include "schema/TVRHBA_ElementFlashImageSoftwareIdentity.h"
#include "schema/TVRHBA_FlashImageSoftwareIdentity.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_Transceiver.h"
#include "schema/TVRHBA_TransceiverComponent.h"

#include <algorithm>
#include <cctype>

namespace cimple
{

namespace
{

using Transceiver = TVRHBA_Transceiver;

// --- transceiver ---------------------------------------------------------------------------------------

using Scale = double (*)(unsigned raw);

double temperature(unsigned raw)
{
    return raw / 256.0;
}

/// Below zero a whole number of degrees, in the library's own terms.
double lowTemperature(unsigned raw)
{
    if (raw & 0x8000)
        return -static_cast<double>(((raw ^ 0x7FFF) + 1) / 2560);
    return temperature(raw);
}

double volts(unsigned raw)
{
    return raw * 100 / 1000000.0;
}

double milliamperes(unsigned raw)
{
    return 2 * raw / 1000.0;
}

double milliwatts(unsigned raw)
{
    return raw * 0.1 / 1000;
}

struct ThresholdRow
{
    Property<float> Transceiver::*property;
    Scale scale;
};

/// In the order of the record.
constexpr ThresholdRow thresholds[] = {
    {&Transceiver::TemperatureHighAlarm, temperature},
    {&Transceiver::TemperatureLowAlarm, lowTemperature},
    {&Transceiver::TemperatureHighWarning, temperature},
    {&Transceiver::TemperatureLowWarning, lowTemperature},
    {&Transceiver::VoltageHighAlarm, volts},
    {&Transceiver::VoltageLowAlarm, volts},
    {&Transceiver::VoltageHighWarning, volts},
    {&Transceiver::VoltageLowWarning, volts},
    {&Transceiver::CurrentHighAlarm, milliamperes},
    {&Transceiver::CurrentLowAlarm, milliamperes},
    {&Transceiver::CurrentHighWarning, milliamperes},
    {&Transceiver::CurrentLowWarning, milliamperes},
    {&Transceiver::TxPowerHighAlarm, milliwatts},
    {&Transceiver::TxPowerLowAlarm, milliwatts},
    {&Transceiver::TxPowerHighWarning, milliwatts},
    {&Transceiver::TxPowerLowWarning, milliwatts},
    {&Transceiver::RxPowerHighAlarm, milliwatts},
    {&Transceiver::RxPowerLowAlarm, milliwatts},
    {&Transceiver::RxPowerHighWarning, milliwatts},
    {&Transceiver::RxPowerLowWarning, milliwatts},
};
static_assert(std::size(thresholds) == std::extent_v<decltype(RM_SffData::thresholds)>);

/// From YYMMDD; a code of another form leaves the date null.
void setManufactureDate(Transceiver& instance, const char (&code)[6])
{
    if (!std::ranges::all_of(code, [](unsigned char c) { return std::isdigit(c) != 0; }))
        return;
    const auto number = [&](int at) { return (code[at] - '0') * 10 + code[at + 1] - '0'; };
    const int year = number(0) + (number(0) < 70 ? 2000 : 1900);
    Datetime date;
    if (date.parse(formatText("%04d%02d%02d000000.000000+000", year, number(2), number(4)).c_str()))
        instance.ManufactureDate.set(date);
}

void setIdentity(Transceiver& instance, const RM_SffData& data)
{
    instance.Identifier.set(data.identifier);
    instance.ExtIdentifier.set(data.extIdentifier);
    instance.Connector.set(data.connector);
    instance.WaveLength.set(data.waveLength);
}

void setDiagnostics(Transceiver& instance, const RM_SffData& data)
{
    instance.Temperature.set(data.temperature);
    instance.TemperatureUnit.set("Celsius");
    instance.Vcc.set(data.vcc);
    instance.TxBiasCurrent.set(data.txBiasCurrent);
    instance.TxPower.set(data.txPower);
    instance.RxPower.set(data.rxPower);
    for (std::size_t i = 0; i < std::size(thresholds); i++)
        (instance.*thresholds[i].property).set(static_cast<float>(thresholds[i].scale(data.thresholds[i])));
}

Ref<Transceiver> makeTransceiver(const PortContext& port, const RM_SffData& data)
{
    const String serialNumber(paddedText(data.serialNumber));
    const String tag = formatText("%s:%s", port.port.name.c_str(), serialNumber.c_str());
    const bool complete = data.identityPresent && data.vendorPresent && data.diagnosticsPresent;
    Ref<Transceiver> made = fresh<Transceiver>();
    made->ElementName.set(className<Transceiver>());
    made->CreationClassName.set(className<Transceiver>());
    made->Description.set("Tavrin PhysicalComponent Data");
    made->RemovalConditions.set(2);
    made->OperationalStatus.set({0});
    made->StatusDescriptions.set({"unknown"});
    made->Manufacturer.set(paddedText(data.vendorName));
    made->OUI.set(formatText("%02X-%02X-%02x", data.oui[0], data.oui[1], data.oui[2]));
    made->PartNumber.set(paddedText(data.partNumber));
    made->Version.set(paddedText(data.revision));
    made->SerialNumber.set(serialNumber);
    made->Tag.set(tag);
    made->Name.set(tag);
    made->InstanceID.set(tag);
    setManufactureDate(*made, data.dateCode);
    if (data.identityPresent)
        setIdentity(*made, data);
    made->SFPStatus.set(complete ? 0 : 1);
    if (data.diagnosticsPresent)
        setDiagnostics(*made, data);
    return made;
}

// --- flash memory --------------------------------------------------------------------------------------

using FlashImage = TVRHBA_FlashImageSoftwareIdentity;

Ref<FlashImage> makeFlashImage(const PortContext& port, const RM_FlashRegion& region)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    const String type(foreignText(region.programType));
    const String version(foreignText(region.version));
    const String id = formatText("FC HBA Flash Image %s v %s %s %s", type.c_str(), version.c_str(),
                                 adapter.model.c_str(), port.port.name.c_str());
    Ref<FlashImage> made = fresh<FlashImage>();
    made->ProgramType.set(type);
    made->ProgramID.set({region.programId[0], region.programId[1]});
    setFirmwareVersion(*made, version);
    made->Description.set(foreignText(region.description));
    made->ElementName.set(id);
    made->InstanceID.set(id);
    made->Name.set(type);
    made->Manufacturer.set(adapter.manufacturer);
    made->Classifications.set({11});
    made->ClassificationDescriptions.set({"Firmware Kernel"});
    made->IsEntity.set(true);
    made->StartAddress.set(region.startAddress);
    made->ProgramLength.set(region.length);
    made->Next.set(region.next);
    made->Previous.set(region.previous);
    made->IsWakeupParameter.set(region.isWakeup != 0);
    made->IdentityInfoValue.set({type, version});
    made->IdentityInfoType.set({"TAVRIN:FLASH_PROGRAM_TYPE", "TAVRIN:FLASH_PROGRAM_ID"});
    made->ReleaseDate.set(Datetime::now());
    return made;
}

std::uint32_t createFlashImage(PortContext& port, const RM_FlashRegion& region)
{
    ProviderAgent& agent = port.host.agent;
    const FlashImage* image =
        mapOf<FlashImage>(agent).insert(unlessOutOfMemory([&] { return makeFlashImage(port, region); }),
                                        "Insert Failed : m_TVRHBA_FlashImageSoftwareIdentity_map");
    if (!image)
        return BUILD_FAILED;
    using OfController = TVRHBA_ElementFlashImageSoftwareIdentity;
    switch (join<OfController>(agent, &OfController::Antecedent, image, &OfController::Dependent, port.controller,
                               "Insert Failed : m_TVRHBA_ElementFlashImageSoftwareIdentityInst_map ",
                               [](OfController& element)
                               {
                                   element.UpgradeCondition.set(3);
                                   element.ElementSoftwareStatus.set({6});
                               }))
    {
    case Joined::Made:
        return BUILD_DONE;
    case Joined::Refused:
        return BUILD_FAILED;
    default:
        TVR_LOG(TVR_DBG, "Failed to create ElementFlashImageSoftwareIdentityInst");
        return BUILD_DONE;
    }
}

} // namespace

std::uint32_t createTransceiver(PortContext& port)
{
    std::unique_ptr<RM_SffData> data;
    TVR_MethodWrapper::tvrcimGetDigitalDiagnosticsData(port.port.name.c_str(), data);
    const Transceiver* transceiver = data ? mapOf<Transceiver>(port.host.agent)
                                                .insert(unlessOutOfMemory([&] { return makeTransceiver(port, *data); }),
                                                        "Insert Failed : m_TVRHBA_Transceiver_map")
                                          : nullptr;
    if (!transceiver)
        return failed({TVR_DBG, "Failed Creating TVRHBA_Transceiver"}, BUILD_DONE);
    using Component = TVRHBA_TransceiverComponent;
    const Joined joined = join<Component>(port.host.agent, &Component::GroupComponent, port.controller,
                                          &Component::PartComponent, transceiver, "Insert Failed : m_Component_map");
    return joined == Joined::Refused ? BUILD_NO_INSTANCE : BUILD_DONE;
}

std::uint32_t createFlashImages(PortContext& port)
{
    std::vector<RM_FlashRegion> regions;
    TVR_MethodWrapper::GetFlashContents(port.port.name.c_str(), regions);
    for (const RM_FlashRegion& region : regions)
        if (createFlashImage(port, region) != BUILD_DONE)
            return BUILD_FAILED;
    return BUILD_DONE;
}

} // namespace cimple
