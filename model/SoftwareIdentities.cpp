#include "model/SoftwareIdentities.h"

#include "agent/DriverIdentity.h"
#include "agent/SoftwareVersion.h"
#include "device/Data.h"
#include "model/Affects.h"
#include "schema/TVRHBA_ElementSoftwareIdentity.h"
#include "schema/TVRHBA_FCDriverServiceAffectsDriver.h"
#include "schema/TVRHBA_FCHBADriverParamService.h"
#include "schema/TVRHBA_FCTagElementSoftwareIdentity.h"
#include "schema/TVRHBA_FCTagService.h"
#include "schema/TVRHBA_FirmwareElementSoftwareIdentity.h"
#include "schema/TVRHBA_InstallServiceAffectsFirmwareIdentity.h"
#include "schema/TVRHBA_InstalledSoftwareIdentity.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SoftwareConformsToProfile.h"
#include "schema/TVRHBA_SoftwareIdentity.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"

#include <string>
#include <vector>

namespace cimple
{

namespace
{

using Identity = TVRHBA_SoftwareIdentity;
using Attributes = FCAdapterAttributes;

// CIM_SoftwareIdentity.Classifications
constexpr std::uint16_t driver = 2;
constexpr std::uint16_t firmware = 10;
constexpr std::uint16_t bootCode = 11;

// CIM_ElementSoftwareIdentity
constexpr std::uint16_t ownerUpgradeable = 3;
constexpr std::uint16_t current = 2;
constexpr std::uint16_t next = 3;
constexpr std::uint16_t installed = 6;

// --- driver

Ref<Identity> makeDriverIdentity(const Attributes& attributes)
{
    const String name(attributes.driverName);
    Ref<Identity> identity = fresh<Identity>();
    identity->InstanceID.set(driverIdentityId(attributes));
    identity->Name.set(name);
    identity->ElementName.set(formatText("TVR FC HBA Driver %s", name.c_str()));
    identity->Description.set("Driver of the Fibre Channel HBAs");
    identity->Manufacturer.set(attributes.manufacturer);
    setVersion(*identity, attributes.driverVersion);
    identity->Classifications.set({driver});
    identity->ClassificationDescriptions.set({"Driver"});
    identity->IdentityInfoType.set({"TAVRIN:SOFTWARE_NAME"});
    identity->IdentityInfoValue.set({name});
    identity->IsEntity.set(true);
    return identity;
}

void installOnSystem(const HostContext& host, const Identity* identity)
{
    using Installed = TVRHBA_InstalledSoftwareIdentity;
    join<Installed>(host.agent, &Installed::System, host.system, &Installed::InstalledSoftware, identity,
                    "Insert Failed : m_TVRHBA_InstalledSoftwareIdentity_map");
}

// --- firmware and images of a port

/// How a port controller has a software.
enum class Tie
{
    Firmware, ///< runs it
    Image,    ///< offers it to the host's boot
};

/// Adapters of device id 0xE200 report what their kernel and stubs would be, and have none.
enum class On
{
    AllAdapters,
    NotE200,
};

struct SoftwareRow
{
    const char* name;
    std::string Attributes::*version;
    std::string Attributes::*programName; ///< null where the adapter tells no name beside the version
    std::uint16_t classification;
    Tie tie;
    std::uint16_t status; ///< CIM_ElementSoftwareIdentity.ElementSoftwareStatus, beside "installed"
    On on;
    const char* description;
};

constexpr SoftwareRow softwareRows[] = {
    {"Operational Firmware", &Attributes::operationalFirmware, nullptr, firmware, Tie::Firmware, current,
     On::AllAdapters, "Firmware that the Fibre Channel HBA runs"},
    {"Firmware On Flash", &Attributes::firmwareOnFlash, nullptr, firmware, Tie::Firmware, next, On::AllAdapters,
     "Firmware that the Fibre Channel HBA starts with next"},
    {"Boot BIOS", &Attributes::bootBiosVersion, nullptr, bootCode, Tie::Image, 0, On::NotE200,
     "Boot code of the Fibre Channel HBA"},
    {"Universal Boot Image", &Attributes::fcUniversalVersion, nullptr, bootCode, Tie::Image, 0, On::AllAdapters,
     "Boot image of the Fibre Channel HBA for all kinds of hosts"},
    {"x86 Boot BIOS", &Attributes::fcX86BiosVersion, nullptr, bootCode, Tie::Image, 0, On::AllAdapters,
     "Boot image of the Fibre Channel HBA for x86 hosts"},
    {"EFI Boot Image", &Attributes::fcEfiVersion, nullptr, bootCode, Tie::Image, 0, On::AllAdapters,
     "Boot image of the Fibre Channel HBA for hosts with EFI"},
    {"FCode Boot Image", &Attributes::fcFcodeVersion, nullptr, bootCode, Tie::Image, 0, On::AllAdapters,
     "Boot image of the Fibre Channel HBA for hosts with Open Firmware"},
    {"Kernel", &Attributes::kernelVersion, nullptr, firmware, Tie::Firmware, 0, On::NotE200,
     "Kernel of the firmware of the Fibre Channel HBA"},
    {"Initial Firmware", &Attributes::initialFirmware, nullptr, firmware, Tie::Firmware, 0, On::AllAdapters,
     "Firmware that the Fibre Channel HBA loads first"},
    {"SLI-1 Functional Firmware", &Attributes::sli1FirmwareName, nullptr, firmware, Tie::Firmware, 0, On::NotE200,
     "Functional firmware stub of the Fibre Channel HBA for SLI-1"},
    {"SLI-2 Functional Firmware", &Attributes::sli2FirmwareName, nullptr, firmware, Tie::Firmware, 0, On::NotE200,
     "Functional firmware stub of the Fibre Channel HBA for SLI-2"},
    {"SLI-3 Functional Firmware", &Attributes::sli3FirmwareName, nullptr, firmware, Tie::Firmware, 0, On::NotE200,
     "Functional firmware stub of the Fibre Channel HBA for SLI-3"},
    {"SP Functional Firmware", &Attributes::spFirmwareVersion, &Attributes::spFirmwareName, firmware, Tie::Firmware, 0,
     On::NotE200, "Functional firmware stub of the Fibre Channel HBA's service processor"},
    {"ULP Functional Firmware", &Attributes::ulpFirmwareVersion, &Attributes::ulpFirmwareName, firmware, Tie::Firmware,
     0, On::NotE200, "Functional firmware stub of the Fibre Channel HBA's upper layer protocols"},
};

bool isReported(const SoftwareRow& row, const PortContext& port)
{
    const Attributes& attributes = port.on.attributes;
    return !(attributes.*row.version).empty() && (row.on == On::AllAdapters || attributes.deviceID != 0xE200);
}

Ref<Identity> makeIdentity(const SoftwareRow& row, const PortContext& port)
{
    const Attributes& attributes = port.on.attributes;
    const std::string& version = attributes.*row.version;
    const String name(row.name);
    const bool isNamed = row.programName && !(attributes.*row.programName).empty();
    const String programName = isNamed ? String(attributes.*row.programName) : name;
    Ref<Identity> identity = fresh<Identity>();
    identity->InstanceID.set(formatText("TVR FC HBA: %s v%s %s:%s", row.name, version.c_str(), attributes.model.c_str(),
                                        port.port.name.c_str()));
    identity->Name.set(name);
    identity->ElementName.set(formatText("TVR FC HBA %s", row.name));
    identity->Description.set(row.description);
    identity->Manufacturer.set(attributes.manufacturer);
    setVersion(*identity, version);
    identity->Classifications.set({row.classification});
    identity->ClassificationDescriptions.set({name});
    identity->IdentityInfoType.set({"TAVRIN:SOFTWARE_NAME", "TAVRIN:ADAPTER_MODEL", "TAVRIN:PORT_WWPN"});
    identity->IdentityInfoValue.set({programName, String(attributes.model), String(port.port.name)});
    identity->IsEntity.set(true);
    return identity;
}

template <class Of>
void tieToController(const PortContext& port, const Identity* identity, std::uint16_t status, const LogText& refused)
{
    join<Of>(port.host.agent, &Of::Antecedent, identity, &Of::Dependent, port.controller, refused,
             [&](Of& of)
             {
                 of.UpgradeCondition.set(ownerUpgradeable);
                 if (status)
                     of.ElementSoftwareStatus.set({status, installed});
                 else
                     of.ElementSoftwareStatus.set({installed});
             });
}

void tieAsSoftware(const PortContext& port, const Identity* identity, std::uint16_t status)
{
    tieToController<TVRHBA_ElementSoftwareIdentity>(port, identity, status,
                                                    "Insert Failed : m_TVRHBA_ElementSoftwareIdentity_map");
}

void tieAsFirmware(const PortContext& port, const Identity* identity, std::uint16_t status)
{
    tieToController<TVRHBA_FirmwareElementSoftwareIdentity>(
        port, identity, status, "Insert Failed : m_TVRHBA_FirmwareElementSoftwareIdentity_map");
}

void conformToSoftwareInventory(const PortContext& port, const Identity* identity)
{
    TVR_LOG(TVR_DBG, "Generating TVRHBA_SoftwareConformsToProfile (Firmware %s:%s, Software Inventory)",
            port.on.attributes.model.c_str(), port.port.name.c_str());
    using Conforms = TVRHBA_SoftwareConformsToProfile;
    join<Conforms>(port.host.agent, &Conforms::ConformantStandard, port.host.profiles.find("Software Inventory"),
                   &Conforms::ManagedElement, identity, "Insert Failed : m_TVRHBA_SoftwareConformsToProfile_map");
}

/// The table of tags is kept by the firmware that the adapter runs.
void tieToTagService(const HostContext& host, const Identity* identity)
{
    using Of = TVRHBA_FCTagElementSoftwareIdentity;
    join<Of>(host.agent, &Of::Antecedent, identity, &Of::Dependent, host.tagService,
             "Insert Failed : m_TVRHBA_FCTagElementSoftwareIdentity_map",
             [](Of& of) {
                 of.ElementSoftwareStatus.set({current, installed});
             });
}

} // namespace

std::uint32_t createDriverSoftwareIdentities(HostContext& host)
{
    ProviderAgent& agent = host.agent;
    for (const Adapter* adapter : agent.m_pData->adapters)
    {
        const auto* fcAdapter = dynamic_cast<const FCAdapter*>(adapter);
        const Attributes* attributes = fcAdapter ? fcAdapter->getAttributes() : nullptr;
        const bool isTold = attributes && !(attributes->driverName.empty() && attributes->driverVersion.empty());
        if (!isTold || findDriverIdentity(agent, *attributes))
            continue;
        Identity* identity = mapOf<Identity>(agent).insert(makeDriverIdentity(*attributes),
                                                           "Insert Failed : m_TVRHBA_SoftwareIdentity_map");
        if (!identity)
            return BUILD_FAILED;
        if (!host.driverIdentity)
            host.driverIdentity = identity;
        installOnSystem(host, identity);
        affect<TVRHBA_FCDriverServiceAffectsDriver>(agent, host.parameterService, identity,
                                                    "Insert Failed : m_TVRHBA_FCDriverServiceAffectsDriver_map");
    }
    return BUILD_DONE;
}

std::uint32_t createPortSoftwareIdentities(PortContext& port)
{
    const HostContext& host = port.host;
    tieAsSoftware(port, findDriverIdentity(host.agent, port.on.attributes), current);
    for (const SoftwareRow& row : softwareRows)
    {
        if (!isReported(row, port))
            continue;
        const Identity* identity =
            mapOf<Identity>(host.agent)
                .insert(makeIdentity(row, port), "Insert Failed : m_TVRHBA_SoftwareIdentity_map");
        if (!identity)
            return BUILD_NO_INSTANCE;
        installOnSystem(host, identity);
        if (row.tie == Tie::Firmware)
            tieAsFirmware(port, identity, row.status);
        else
            tieAsSoftware(port, identity, row.status);
        conformToSoftwareInventory(port, identity);
        affect<TVRHBA_InstallServiceAffectsFirmwareIdentity>(
            host.agent, host.installationService, identity,
            "Insert Failed : m_TVRHBA_InstallServiceAffectsFirmwareIdentity_map");
        if (row.status == current)
            tieToTagService(host, identity);
    }
    return BUILD_DONE;
}

} // namespace cimple
