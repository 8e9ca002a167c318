#include "model/PortVirtualization.h"

#include "agent/Build.h"
#include "device/ForeignText.h"
#include "device/TVR_MethodWrapper.h"
#include "model/FcpEndpoint.h"
#include "model/PortValues.h"
#include "model/UnitNames.h"
#include "schema/TVRHBA_DriverParamAffectsVirtualFCPort.h"
#include "schema/TVRHBA_DriverParameterAffectsFCPort.h"
#include "schema/TVRHBA_DriverParams.h"
#include "schema/TVRHBA_ElementAllocatedFromPool.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_HostedResourcePool.h"
#include "schema/TVRHBA_LocalHostedInitiatorAccessPoint.h"
#include "schema/TVRHBA_ResourcePool.h"
#include "schema/TVRHBA_SCSIProtocolInitiatorEndpoint.h"
#include "schema/TVRHBA_VMSystemDevice.h"
#include "schema/TVRHBA_VPortHostedDependency.h"
#include "schema/TVRHBA_VirtualDeviceSAPImplementation.h"
#include "schema/TVRHBA_VirtualFCPort.h"
#include "schema/TVRHBA_VirtualLocalHostedAccessPoint.h"
#include "schema/TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath.h"
#include "schema/TVRHBA_VirtualSCSIProtocolTargetEndpoint.h"
#include "schema/TVRHBA_VirtualStorageVolume.h"
#include "schema/TVRHBA_VirtualStorageVolumeSystemDevice.h"

#include <algorithm>
#include <cstring>
#include <vector>

namespace cimple
{

namespace
{

/// Virtual ports of a port that are looked at, and logical units behind one of them.
constexpr std::size_t maxVirtualPorts = 256;
constexpr std::size_t maxUnits = 65536;

constexpr std::uint32_t nPort = HBA_PORTTYPE_NPORT;
constexpr std::uint16_t scsiFcp = 8;

/// A physical port, and what came of the step so far.
struct PhysicalPort
{
    HostContext& host;
    const TVRHBA_FCPort& port;
    bool& complete; ///< false once something was left out

    const char* wwpn() const { return port.DeviceID.value.c_str(); }

    /// For the status of a query.
    bool succeeded(RM_STATUS status, const char* what) const
    {
        if (status == RM_OK)
            return true;
        complete = false;
        TVR_LOG(TVR_ERR, "%s failed on FC port %s: %d", what, wwpn(), status);
        return false;
    }
    void note(Joined joined) const { complete = complete && joined != Joined::NoInstance && joined != Joined::Refused; }
    template <class Record> Record* note(Record* inserted) const
    {
        complete = complete && inserted;
        return inserted;
    }
};

/// A virtual port, as far as the library tells of it.
struct VirtualPort
{
    const PhysicalPort& on;
    const RM_VPortEntry& entry;
    String wwpn;
    String symbolicName = {};
    String fabricName = {};
    RM_VirtualMachine machine = {};      ///< texts are empty if it is given to none
    Ref<CIM_ComputerSystem> system = {}; ///< the virtual machine's, or the host's
    TVRHBA_VirtualFCPort* port = nullptr;
    TVRHBA_SCSIProtocolInitiatorEndpoint* initiator = nullptr;
};

/// A logical unit behind it.
struct VirtualUnit
{
    const VirtualPort& behind;
    String target;
    std::string lun; ///< 16 hexadecimal digits
    std::uint16_t number;
    VPortLunAttributes attributes = {};
    TVRHBA_VirtualSCSIProtocolTargetEndpoint* endpoint = nullptr;

    ProviderAgent& agent() const { return behind.on.host.agent; }
    const CIM_ComputerSystem* system() const { return behind.on.host.system; }
};

// --- the port ------------------------------------------------------------------------------------------------

void readAttributes(VirtualPort& vport)
{
    RM_VPortAttributes attributes{};
    if (!vport.on.succeeded(TVR_MethodWrapper::ListVPortAttributes(vport.on.wwpn(), vport.wwpn.c_str(), &attributes),
                            "ListVPortAttributes"))
        return;
    vport.symbolicName = foreignText(attributes.symbolicName);
    if (std::ranges::any_of(attributes.fabricName.wwn, [](std::uint8_t byte) { return byte != 0; }))
        vport.fabricName = wwnText(attributes.fabricName);
}

/// The system of a virtual machine, which others than this module serve: it is the end of associations alone.
Ref<CIM_ComputerSystem> makeMachine(const RM_VirtualMachine& machine)
{
    Ref<CIM_ComputerSystem> made = fresh<CIM_ComputerSystem>();
    made->CreationClassName.set(className<CIM_ComputerSystem>());
    made->Name.set(machine.uuid[0] ? machine.uuid : machine.name); // names of machines may be alike
    made->ElementName.set(machine.name);
    made->NameFormat.set("Other");
    return made;
}

void readMachine(VirtualPort& vport)
{
    const RM_STATUS status = TVR_MethodWrapper::ListVMfromVPort(vport.on.wwpn(), vport.wwpn.c_str(), &vport.machine);
    // A port that is given to no machine is the host's.
    if (status != RM_ERROR_NOT_SUPPORTED)
        vport.on.succeeded(status, "ListVMfromVPort");
    if (vport.machine.name[0] || vport.machine.uuid[0])
        vport.system = makeMachine(vport.machine);
}

/// Adds one value and its description, where there is a value.
void identify(TVRHBA_VirtualFCPort& port, const String& value, const char* description)
{
    if (value.size() == 0)
        return;
    port.OtherIdentifyingInfo.value.append(value);
    port.IdentifyingDescriptions.value.append(description);
}

void setIdentifiers(TVRHBA_VirtualFCPort& port, const VirtualPort& vport)
{
    port.OtherIdentifyingInfo.null = 0;
    port.IdentifyingDescriptions.null = 0;
    identify(port, vport.on.port.DeviceID.value, "Physical Port WWPN");
    identify(port, wwnText(vport.entry.wwnn), "NodeWWN");
    identify(port, formatText("%06X", vport.entry.fcId), "FC ID");
    identify(port, vport.fabricName, "Fabric Name");
    identify(port, vport.machine.name, "Virtual Machine Name");
    identify(port, vport.machine.uuid, "Virtual Machine UUID");
}

/// What a virtual port has of the physical one: link, speed and frames.
void setLink(TVRHBA_VirtualFCPort& port, const TVRHBA_FCPort& physical)
{
    port.PortNumber = physical.PortNumber;
    port.Speed = physical.Speed;
    port.MaxSpeed = physical.MaxSpeed;
    port.SupportedCOS = physical.SupportedCOS;
    port.ActiveCOS = physical.ActiveCOS;
    port.SupportedMaximumTransmissionUnit = physical.SupportedMaximumTransmissionUnit;
    port.ActiveMaximumTransmissionUnit = physical.ActiveMaximumTransmissionUnit;
    port.LinkTechnology = physical.LinkTechnology;
    port.UsageRestriction = physical.UsageRestriction;
}

Ref<TVRHBA_VirtualFCPort> makePort(const VirtualPort& vport)
{
    const ValueText type = portType(nPort);
    const ValueText status = portStatus(vport.entry.state);
    Ref<TVRHBA_VirtualFCPort> made = fresh<TVRHBA_VirtualFCPort>();
    made->Description = vport.on.port.Description;
    setSystem(*made, *vport.on.host.system);
    made->CreationClassName.set(className<TVRHBA_VirtualFCPort>());
    made->Name.set(vport.wwpn);
    made->DeviceID.set(vport.wwpn);
    made->ElementName.set(vport.symbolicName);
    made->PermanentAddress.set(vport.wwpn);
    made->NetworkAddresses.set({vport.wwpn});
    made->PortType.set(type.value);
    made->OtherPortType.set(type.text);
    made->OperationalStatus.set({status.value});
    made->StatusDescriptions.set({status.text});
    made->SupportedFC4Types.set({scsiFcp});
    setIdentifiers(*made, vport);
    setLink(*made, vport.on.port);
    return made;
}

/// That of the physical port under the virtual one's names.
Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> makeInitiator(const VirtualPort& vport,
                                                        const TVRHBA_SCSIProtocolInitiatorEndpoint& physical)
{
    Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> made(clone_of(&physical));
    made->Name.set(vport.wwpn);
    made->ElementName.set(vport.symbolicName);
    return made;
}

void associatePort(const VirtualPort& vport)
{
    HostContext& host = vport.on.host;
    using Hosted = TVRHBA_VPortHostedDependency;
    vport.on.note(join<Hosted>(host.agent, &Hosted::Antecedent, &vport.on.port, &Hosted::Dependent, vport.port,
                               "Insert Failed : m_TVRHBA_VPortHostedDependency_map"));

    using OfMachine = TVRHBA_VMSystemDevice;
    const CIM_ComputerSystem* system = vport.system ? vport.system.get() : host.system;
    vport.on.note(join<OfMachine>(host.agent, &OfMachine::GroupComponent, system, &OfMachine::PartComponent, vport.port,
                                  "Insert Failed : m_TVRHBA_VMSystemDevice_map"));
}

void createInitiator(VirtualPort& vport)
{
    HostContext& host = vport.on.host;
    const auto initiators = mapOf<TVRHBA_SCSIProtocolInitiatorEndpoint>(host.agent);
    const TVRHBA_SCSIProtocolInitiatorEndpoint* physical =
        initiators.findFirst([&](const auto& known) { return known.Name.value == vport.on.port.DeviceID.value; });
    if (!physical)
        return;
    vport.initiator = vport.on.note(initiators.insert(makeInitiator(vport, *physical),
                                                      "Insert Failed : m_TVRHBA_SCSIProtocolInitiatorEndpoint_map"));

    using Implements = TVRHBA_VirtualDeviceSAPImplementation;
    vport.on.note(join<Implements>(host.agent, &Implements::Antecedent, vport.port, &Implements::Dependent,
                                   vport.initiator, "Insert Failed : m_TVRHBA_VirtualDeviceSAPImplementation_map"));
    using Hosted = TVRHBA_LocalHostedInitiatorAccessPoint;
    vport.on.note(join<Hosted>(host.agent, &Hosted::Antecedent, host.system, &Hosted::Dependent, vport.initiator,
                               "Insert Failed : m_TVRHBA_LocalHostedInitiatorAccessPoint_map"));
}

// --- what it reaches -----------------------------------------------------------------------------------------

String inquiryText(const StandardInquiry& inquiry)
{
    return formatText("%.8s %.16s Revision %.4s", inquiry.vendor.c_str(), inquiry.product.c_str(),
                      inquiry.revision.c_str());
}

String description(const VirtualUnit& unit)
{
    return formatText("%s Serial Number %.40s", inquiryText(unit.attributes.inquiry).c_str(),
                      unit.attributes.serialNumber.c_str());
}

Ref<TVRHBA_VirtualSCSIProtocolTargetEndpoint> makeTargetEndpoint(const VirtualUnit& unit)
{
    Ref<TVRHBA_VirtualSCSIProtocolTargetEndpoint> made =
        makeFcpEndpoint<TVRHBA_VirtualSCSIProtocolTargetEndpoint>(*unit.system(), EndpointRole::Target);
    made->Description.set(description(unit));
    made->ElementName.set(unit.attributes.inquiry.product);
    made->Name.set(formatText("%s:%s:%s", unit.behind.wwpn.c_str(), unit.target.c_str(), unit.lun.c_str()));
    return made;
}

void createTargetEndpoint(VirtualUnit& unit)
{
    const PhysicalPort& on = unit.behind.on;
    unit.endpoint = on.note(
        mapOf<TVRHBA_VirtualSCSIProtocolTargetEndpoint>(unit.agent())
            .insert(makeTargetEndpoint(unit), "Insert Failed : m_TVRHBA_VirtualSCSIProtocolTargetEndpoint_map"));
    using Hosted = TVRHBA_VirtualLocalHostedAccessPoint;
    on.note(join<Hosted>(unit.agent(), &Hosted::Antecedent, unit.system(), &Hosted::Dependent, unit.endpoint,
                         "Insert Failed : m_TVRHBA_VirtualLocalHostedAccessPoint_map"));
}

/// A volume is a block device, which SCSI knows as disk and as simplified disk.
bool isVolume(const VPortLunAttributes& attributes)
{
    return attributes.inquiry.deviceType == 0 || attributes.inquiry.deviceType == 14;
}

void setCapacity(TVRHBA_VirtualStorageVolume& volume, const ReadCapacity& capacity)
{
    if (capacity.blockLength == 0)
        return;
    const std::uint64_t blocks = capacity.lastLba + 1;
    volume.BlockSize.set(capacity.blockLength);
    volume.NumberOfBlocks.set(blocks);
    volume.Capacity.set(capacity.blockLength * blocks);
    volume.CapacityUnit.set("Byte");
}

Ref<TVRHBA_VirtualStorageVolume> makeVolume(const VirtualUnit& unit)
{
    char identifier[33];
    descriptorToString(identifier, &unit.attributes.designator);
    Ref<TVRHBA_VirtualStorageVolume> made = fresh<TVRHBA_VirtualStorageVolume>();
    made->Description.set(description(unit));
    setSystem(*made, *unit.system());
    made->CreationClassName.set(className<TVRHBA_VirtualStorageVolume>());
    made->DeviceID.set(
        formatText("%s_%s_%s_%s", unit.behind.wwpn.c_str(), unit.target.c_str(), identifier, unit.lun.c_str()));
    made->ElementName.set(formatText("Storage Volume: %d", unit.number));
    made->Name.set(refinedName(unit.attributes.designator, identifier));
    if (identifier[0])
        setNameFormat(*made, unit.attributes.designator);
    made->OperationalStatus.set({0});
    setCapacity(*made, unit.attributes.capacity);
    made->OtherIdentifyingInfo.set({inquiryText(unit.attributes.inquiry)});
    made->IdentifyingDescriptions.set({"Standard SCSI inquiry data"});
    return made;
}

void createVolume(const VirtualUnit& unit)
{
    const PhysicalPort& on = unit.behind.on;
    const TVRHBA_VirtualStorageVolume* volume =
        on.note(mapOf<TVRHBA_VirtualStorageVolume>(unit.agent())
                    .insert(makeVolume(unit), "Insert Failed : m_TVRHBA_VirtualStorageVolume_map"));

    using OfSystem = TVRHBA_VirtualStorageVolumeSystemDevice;
    on.note(join<OfSystem>(unit.agent(), &OfSystem::GroupComponent, unit.system(), &OfSystem::PartComponent, volume,
                           "Insert Failed : m_TVRHBA_VirtualStorageVolumeSystemDevice_map"));

    using Path = TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath;
    if (!unit.behind.initiator)
        return;
    on.note(join<Path>(unit.agent(), &Path::Target, unit.endpoint, &Path::LogicalUnit, volume,
                       "Insert Failed : m_TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath_map",
                       [&](Path& path)
                       {
                           path.Initiator = shared_end(unit.behind.initiator).release();
                           path.LogicalUnitNumber.set(unit.number);
                       }));
}

VirtualUnit unitOf(const VirtualPort& behind, const String& target, HBA_UINT64 lun)
{
    std::uint8_t bytes[sizeof lun];
    std::memcpy(bytes, &lun, sizeof lun);
    // The first level of the field, peripheral or flat space addressing (SAM-4, 4.6).
    const auto number = static_cast<std::uint16_t>((bytes[0] & 0x3F) << 8 | bytes[1]);
    return {behind, target, lunText(static_cast<std::uint64_t>(lun)), number};
}

void createUnit(const VirtualPort& vport, const String& target, HBA_UINT64 lun)
{
    VirtualUnit unit = unitOf(vport, target, lun);
    const bool known = vport.on.succeeded(
        TVR_MethodWrapper::VPortLunAttr(vport.on.wwpn(), vport.wwpn.c_str(), target.c_str(), lun, &unit.attributes),
        "VPortLunAttr");
    createTargetEndpoint(unit);
    if (known && isVolume(unit.attributes))
        createVolume(unit);
}

void createUnits(const VirtualPort& vport)
{
    std::vector<RM_VPortTarget> targets;
    vport.on.succeeded(TVR_MethodWrapper::ListVPortTargets(vport.on.wwpn(), vport.wwpn.c_str(), &targets),
                       "ListVPortTargets");
    std::size_t room = maxUnits;
    for (const RM_VPortTarget& entry : targets)
    {
        const String target(wwnText(entry.wwpn));
        std::vector<HBA_UINT64> luns;
        vport.on.succeeded(TVR_MethodWrapper::ListVPortLuns(vport.on.wwpn(), vport.wwpn.c_str(), target.c_str(), &luns),
                           "ListVPortLuns");
        luns.resize(std::min(luns.size(), room));
        room -= luns.size();
        for (const HBA_UINT64 lun : luns)
            createUnit(vport, target, lun);
        if (room == 0)
            break;
    }
}

/// The units of a port that is known to be down are not asked for.
bool reachesUnits(std::uint32_t state)
{
    return state == HBA_PORTSTATE_ONLINE || state == HBA_PORTSTATE_UNKNOWN;
}

/// Null if there is one of this name.
TVRHBA_VirtualFCPort* createVirtualPort(const PhysicalPort& on, const RM_VPortEntry& entry)
{
    VirtualPort vport{on, entry, wwnText(entry.wwpn)};
    readAttributes(vport);
    readMachine(vport);
    vport.port = on.note(mapOf<TVRHBA_VirtualFCPort>(on.host.agent)
                             .insert(makePort(vport), "Insert Failed : m_TVRHBA_VirtualFCPort_map"));
    if (!vport.port)
        return nullptr;
    associatePort(vport);
    createInitiator(vport);
    if (reachesUnits(entry.state))
        createUnits(vport);
    return vport.port;
}

// --- where they come from ------------------------------------------------------------------------------------

/// How many a port can have is not told: Capacity stays null.
Ref<TVRHBA_ResourcePool> makePool(const PhysicalPort& on, std::size_t virtualPorts)
{
    constexpr std::uint16_t fcHba = 7;
    Ref<TVRHBA_ResourcePool> made = fresh<TVRHBA_ResourcePool>();
    made->InstanceID.set(formatText("TVR FC HBA:Virtual Ports:%s", on.wwpn()));
    made->PoolID = on.port.DeviceID;
    made->ElementName.set(formatText("Virtual ports of FC port %s", on.wwpn()));
    made->Description.set("The virtual ports that an FC port can carry.");
    made->Primordial.set(true);
    made->ResourceType.set(fcHba);
    made->ResourceSubType.set("Virtual FC Port");
    made->AllocationUnits.set("count");
    made->Reserved.set(virtualPorts);
    made->CurrentlyConsumedResource.set(virtualPorts);
    return made;
}

void createPool(const PhysicalPort& on, const std::vector<TVRHBA_VirtualFCPort*>& virtualPorts)
{
    ProviderAgent& agent = on.host.agent;
    const TVRHBA_ResourcePool* pool = on.note(mapOf<TVRHBA_ResourcePool>(agent).insert(
        makePool(on, virtualPorts.size()), "Insert Failed : m_TVRHBA_ResourcePool_map"));

    using Hosted = TVRHBA_HostedResourcePool;
    on.note(join<Hosted>(agent, &Hosted::GroupComponent, on.host.system, &Hosted::PartComponent, pool,
                         "Insert Failed : m_TVRHBA_HostedResourcePool_map"));
    using Allocated = TVRHBA_ElementAllocatedFromPool;
    for (const TVRHBA_VirtualFCPort* port : virtualPorts)
        on.note(join<Allocated>(agent, &Allocated::Antecedent, pool, &Allocated::Dependent, port,
                                "Insert Failed : m_TVRHBA_ElementAllocatedFromPool_map"));
}

/// A port without a list of virtual ports, or of a library that knows of none, cannot carry any.
bool cannotCarryAny(RM_STATUS status)
{
    return status == RM_ERROR_NOT_SUPPORTED || status == RM_ERROR;
}

void createVirtualPorts(const PhysicalPort& on)
{
    std::vector<RM_VPortEntry> entries;
    const RM_STATUS status = TVR_MethodWrapper::ListVPorts(on.wwpn(), &entries);
    if (cannotCarryAny(status) || !on.succeeded(status, "ListVPorts"))
        return;
    entries.resize(std::min(entries.size(), maxVirtualPorts));
    std::vector<TVRHBA_VirtualFCPort*> made;
    for (const RM_VPortEntry& entry : entries)
        if (TVRHBA_VirtualFCPort* port = createVirtualPort(on, entry))
            made.push_back(port);
    createPool(on, made);
}

/// The settings of a physical port for one of its virtual ports.
void takeParameters(ProviderAgent& agent, const TVRHBA_VPortHostedDependency& hosted)
{
    const TVRHBA_VirtualFCPort* port = mapOf<TVRHBA_VirtualFCPort>(agent).withKeysOf(hosted.Dependent);
    const auto physical = mapOf<TVRHBA_DriverParameterAffectsFCPort>(agent);
    using Affects = TVRHBA_DriverParamAffectsVirtualFCPort;
    for (std::size_t i = 0; const TVRHBA_DriverParameterAffectsFCPort* of = physical.at(i); i++)
        if (key_eq(of->ManagedElement, hosted.Antecedent))
            join<Affects>(agent, &Affects::ManagedElement, port, &Affects::SettingData,
                          mapOf<TVRHBA_DriverParams>(agent).withKeysOf(of->SettingData),
                          "Insert Failed : m_TVRHBA_DriverParamAffectsVirtualFCPort_map",
                          [&](Affects& made)
                          {
                              made.IsDefault = of->IsDefault;
                              made.IsCurrent = of->IsCurrent;
                          });
}

} // namespace

std::uint32_t createPortVirtualization(HostContext& host)
{
    bool complete = true;
    const auto ports = mapOf<TVRHBA_FCPort>(host.agent);
    for (std::size_t i = 0; const TVRHBA_FCPort* port = ports.at(i); i++)
        createVirtualPorts({host, *port, complete});
    rebuildVirtualPortParameters(host.agent);
    return complete ? BUILD_DONE : BUILD_FAILED;
}

void rebuildVirtualPortParameters(ProviderAgent& agent)
{
    mapOf<TVRHBA_DriverParamAffectsVirtualFCPort>(agent).clear();
    const auto hosted = mapOf<TVRHBA_VPortHostedDependency>(agent);
    for (std::size_t i = 0; const TVRHBA_VPortHostedDependency* port = hosted.at(i); i++)
        takeParameters(agent, *port);
}

} // namespace cimple
