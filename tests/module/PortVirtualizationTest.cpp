// Virtual ports as a client sees them.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAre;
using testing::SizeIs;

namespace
{

const char* const classes[] = {
    "TVRHBA_VirtualFCPort",
    "TVRHBA_VirtualSCSIProtocolTargetEndpoint",
    "TVRHBA_VirtualStorageVolume",
    "TVRHBA_ResourcePool",
    "TVRHBA_HostedResourcePool",
    "TVRHBA_ElementAllocatedFromPool",
    "TVRHBA_VPortHostedDependency",
    "TVRHBA_VMSystemDevice",
    "TVRHBA_VirtualDeviceSAPImplementation",
    "TVRHBA_VirtualLocalHostedAccessPoint",
    "TVRHBA_VirtualStorageVolumeSystemDevice",
    "TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath",
};

std::vector<std::string> textsOf(Host& host, const std::string& className, const std::string& property)
{
    std::vector<std::string> texts;
    for (const broker::Object& object : host.instancesOf(className))
        texts.push_back(text(object, property));
    return texts;
}

// --- the default host

struct InstanceRow
{
    const char* className;
    const char* key;
    const char* value;
    const char* properties;
};

const InstanceRow instances[] = {
    {"TVRHBA_VirtualFCPort", "DeviceID", "2001027A51320240", R"(
ActiveCOS = {2, 3}
ActiveMaximumTransmissionUnit = 2048
CreationClassName = "TVRHBA_VirtualFCPort"
Description = "Tavrin TV3202 16Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = "2001027A51320240"
ElementName = "virtual port of guest-1"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"Physical Port WWPN", "NodeWWN", "FC ID", "Fabric Name", "Virtual Machine Name", "Virtual Machine UUID"}
LinkTechnology = 4
MaxSpeed = 16000000000
Name = "2001027A51320240"
NetworkAddresses = {"2001027A51320240"}
OperationalStatus = {2}
OtherIdentifyingInfo = {"1000027A51320240", "2002027A51320240", "010601", "1000063D2000A001", "guest-1", "6f2d1c34-0b8e-4a55-9c1f-0242ac120002"}
OtherPortType = "N"
PermanentAddress = "2001027A51320240"
PortNumber = 0
PortType = 10
RequestedState = 12
Speed = 16000000000
StatusDescriptions = {"OK"}
SupportedCOS = {2, 3}
SupportedFC4Types = {8}
SupportedMaximumTransmissionUnit = 2048
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
UsageRestriction = 4
)"},
    {"TVRHBA_SCSIProtocolInitiatorEndpoint", "Name", "2001027A51320240", R"(
ConnectionType = 2
CreationClassName = "TVRHBA_SCSIProtocolInitiatorEndpoint"
Description = "Tavrin TV3202 16Gb 2-port PCIe Fibre Channel Adapter"
ElementName = "virtual port of guest-1"
EnabledDefault = 5
EnabledState = 0
Name = "2001027A51320240"
OperationalStatus = {0}
ProtocolIFType = 56
ProtocolType = 18
RequestedState = 0
Role = 2
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"},
    {"TVRHBA_VirtualSCSIProtocolTargetEndpoint", "Name", "2001027A51320240:50063D200110000B:0000000000000000", R"(
ConnectionType = 2
CreationClassName = "TVRHBA_VirtualSCSIProtocolTargetEndpoint"
Description = "OLSTRA   MERIDIAN 7 DISK  Revision 0412 Serial Number OM70000001"
ElementName = "MERIDIAN 7 DISK "
EnabledDefault = 5
EnabledState = 0
Name = "2001027A51320240:50063D200110000B:0000000000000000"
OperationalStatus = {0}
ProtocolIFType = 56
ProtocolType = 18
RequestedState = 0
Role = 3
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"},
    {"TVRHBA_VirtualStorageVolume", "ElementName", "Storage Volume: 0", R"(
BlockSize = 512
CanDelete = true
Capacity = 107374182400
CapacityUnit = "Byte"
CreationClassName = "TVRHBA_VirtualStorageVolume"
Description = "OLSTRA   MERIDIAN 7 DISK  Revision 0412 Serial Number OM70000001"
DeviceID = "2001027A51320240_50063D200110000B_6063D20000000001000000000000A001_0000000000000000"
ElementName = "Storage Volume: 0"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"Standard SCSI inquiry data"}
IsComposite = true
Name = "63D20000000001000000000000A001"
NameFormat = 9
NameNamespace = 2
NumberOfBlocks = 209715200
OperationalStatus = {0}
OtherIdentifyingInfo = {"OLSTRA   MERIDIAN 7 DISK  Revision 0412"}
Primordial = false
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
ThinlyProvisioned = false
TransitioningToState = 12
)"},
    {"TVRHBA_ResourcePool", "PoolID", "1000027A51320240", R"(
AllocationUnits = "count"
ConsumedResourceUnits = "count"
CurrentlyConsumedResource = 1
Description = "The virtual ports that an FC port can carry."
ElementName = "Virtual ports of FC port 1000027A51320240"
InstanceID = "TVR FC HBA:Virtual Ports:1000027A51320240"
PoolID = "1000027A51320240"
Primordial = true
Reserved = 1
ResourceSubType = "Virtual FC Port"
ResourceType = 7
)"},
};

TEST(PortVirtualization, InstancesHaveThesePropertiesAndNoOthers)
{
    setHostNames({});
    Host host;
    for (const InstanceRow& row : instances)
        EXPECT_EQ(describe(theOne(host, row.className, row.key, row.value)), row.properties) << row.className;
    EXPECT_THAT(textsOf(host, "TVRHBA_ResourcePool", "PoolID"),
                ElementsAre("1000027A51160210", "1000027A51160211", "1000027A51320240", "1000027A51320241"));
    EXPECT_EQ(host.logged("[TVR_ERR] CreatePortVirtualizationClasses failed: 32769"), 0u);
    host.unload();
}

const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";
const std::string machine =
    R"(root/tavrin:CIM_ComputerSystem.Name="6f2d1c34-0b8e-4a55-9c1f-0242ac120002",CreationClassName="CIM_ComputerSystem")";
const std::string pool = R"(root/tavrin:TVRHBA_ResourcePool.InstanceID="TVR FC HBA:Virtual Ports:1000027A51320240")";

std::string onSystem(const std::string& className, const std::string& id)
{
    return "root/tavrin:" + className + R"(.SystemCreationClassName="CIM_ComputerSystem",)" +
           R"(SystemName="tavrin-host.example.net",CreationClassName=")" + className + R"(",DeviceID=")" + id + '"';
}
std::string endpoint(const std::string& className, const std::string& name)
{
    return "root/tavrin:" + className + R"(.Name=")" + name + R"(",SystemCreationClassName="CIM_ComputerSystem",)" +
           R"(SystemName="tavrin-host.example.net",CreationClassName=")" + className + '"';
}

const std::string virtualPort = onSystem("TVRHBA_VirtualFCPort", "2001027A51320240");
const std::string initiator = endpoint("TVRHBA_SCSIProtocolInitiatorEndpoint", "2001027A51320240");
const std::string target =
    endpoint("TVRHBA_VirtualSCSIProtocolTargetEndpoint", "2001027A51320240:50063D200110000B:0000000000000000");
const std::string volume =
    onSystem("TVRHBA_VirtualStorageVolume",
             "2001027A51320240_50063D200110000B_6063D20000000001000000000000A001_0000000000000000");

TEST(PortVirtualization, AssociationsJoinTheseInstances)
{
    setHostNames({});
    const std::pair<const char*, std::string> rows[] = {
        {"TVRHBA_ElementAllocatedFromPool", "\nAntecedent = " + pool + "\nDependent = " + virtualPort + "\n"},
        {"TVRHBA_VPortHostedDependency",
         "\nAntecedent = " + onSystem("TVRHBA_FCPort", "1000027A51320240") + "\nDependent = " + virtualPort + "\n"},
        {"TVRHBA_VMSystemDevice", "\nGroupComponent = " + machine + "\nPartComponent = " + virtualPort + "\n"},
        {"TVRHBA_VirtualDeviceSAPImplementation",
         "\nAntecedent = " + virtualPort + "\nDependent = " + initiator + "\n"},
        {"TVRHBA_VirtualLocalHostedAccessPoint", "\nAntecedent = " + computerSystem + "\nDependent = " + target + "\n"},
        {"TVRHBA_VirtualStorageVolumeSystemDevice",
         "\nGroupComponent = " + computerSystem + "\nPartComponent = " + volume + "\n"},
        {"TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath", "\nInitiator = " + initiator +
                                                                 "\nLogicalUnit = " + volume +
                                                                 "\nLogicalUnitNumber = 0\nTarget = " + target + "\n"},
    };
    Host host;
    for (const auto& [className, expected] : rows)
    {
        const std::vector<broker::Object> found = host.instancesOf(className);
        ASSERT_THAT(found, SizeIs(1)) << className;
        EXPECT_EQ(describe(found[0]), expected) << className;
    }
    EXPECT_THAT(host.instancesOf("TVRHBA_HostedResourcePool"), SizeIs(4));
    EXPECT_THAT(host.instancesOf("TVRHBA_LocalHostedInitiatorAccessPoint"), SizeIs(5));

    // The machine's system is served by others.
    const broker::Reply machines =
        host.broker().associators(theOne(host, "TVRHBA_VirtualFCPort", "DeviceID", "2001027A51320240").path,
                                  {.assocClass = "TVRHBA_VMSystemDevice"});
    ASSERT_THAT(machines.objects, SizeIs(1)) << machines.message;
    EXPECT_EQ(text(machines.objects[0], "ElementName"), "guest-1");
    host.unload();
}

TEST(PortVirtualization, DriverParametersAreThoseOfThePhysicalPort)
{
    const auto parametersOf = [](Host& host, const std::string& association, const std::string& port)
    {
        std::vector<std::string> parameters;
        for (const broker::Object& object : host.instancesOf(association))
            if (object.get("ManagedElement").asPath().key("DeviceID")->asString() == port)
                parameters.push_back(object.get("SettingData").asPath().key("InstanceID")->asString() + " " +
                                     std::to_string(object.get("IsDefault").asUnsigned()));
        return parameters;
    };
    Host host;
    const auto physical = parametersOf(host, "TVRHBA_DriverParameterAffectsFCPort", "1000027A51320240");
    ASSERT_FALSE(physical.empty());
    EXPECT_EQ(parametersOf(host, "TVRHBA_DriverParamAffectsVirtualFCPort", "2001027A51320240"), physical);
    // They follow when the parameters are read again.
    EXPECT_FALSE(host.instancesOf("TVRHBA_DriverParams").empty());
    EXPECT_EQ(parametersOf(host, "TVRHBA_DriverParamAffectsVirtualFCPort", "2001027A51320240"), physical);
    EXPECT_THAT(logAbout(host, {"m_TVRHBA_DriverParamAffectsVirtualFCPort_map"}), testing::IsEmpty());
    host.unload();
}

// --- several of everything

/// Two virtual ports of two targets each, with and without a machine; one target has a disk, a tape and an enclosure.
const char* const several = R"({
  "targets": [
    {"name": "A", "wwpn": "500000000000000A",
     "units": [{"lun": 0, "blocks": 8, "designators": [{"value": "500000000000000A"}]},
               {"lun": 1, "deviceType": 1}, {"lun": 300, "deviceType": 14, "blocks": 8}]},
    {"name": "B", "wwpn": "500000000000000B", "units": [{"lun": 0, "deviceType": 13}, {"lun": 7, "blocks": 2}]}],
  "adapters": [
    {"name": "a", "serialNumber": "S", "model": "M",
     "ports": [{"wwpn": "1000000000000001", "pci": {"deviceId": 1},
                "virtualPorts": [
                  {"wwpn": "2000000000000001", "targets": ["A", "B"],
                   "virtualMachine": {"name": "guest", "uuid": ""}},
                  {"wwpn": "2000000000000002", "state": "linkDown", "targets": ["A"]},
                  {"wwpn": "2000000000000003", "targets": ["B"]}]}]}]})";

TEST(PortVirtualization, SeveralPortsTargetsAndUnits)
{
    setHostNames({});
    Host host(several);
    EXPECT_THAT(textsOf(host, "TVRHBA_VirtualFCPort", "DeviceID"),
                ElementsAre("2000000000000001", "2000000000000002", "2000000000000003"));
    EXPECT_THAT(
        textsOf(host, "TVRHBA_VirtualSCSIProtocolTargetEndpoint", "Name"),
        ElementsAre(
            "2000000000000001:500000000000000A:0000000000000000", "2000000000000001:500000000000000A:0001000000000000",
            "2000000000000001:500000000000000A:412C000000000000", "2000000000000001:500000000000000B:0000000000000000",
            "2000000000000001:500000000000000B:0007000000000000", "2000000000000003:500000000000000B:0000000000000000",
            "2000000000000003:500000000000000B:0007000000000000"));
    EXPECT_THAT(textsOf(host, "TVRHBA_VirtualStorageVolume", "DeviceID"),
                ElementsAre("2000000000000001_500000000000000A_500000000000000A_0000000000000000",
                            "2000000000000001_500000000000000A__412C000000000000",
                            "2000000000000001_500000000000000B__0007000000000000",
                            "2000000000000003_500000000000000B__0007000000000000"))
        << "disks alone";
    EXPECT_THAT(textsOf(host, "TVRHBA_VirtualStorageVolume", "ElementName"),
                ElementsAre("Storage Volume: 0", "Storage Volume: 300", "Storage Volume: 7", "Storage Volume: 7"));
    std::vector<std::string> systems;
    for (const broker::Object& object : host.instancesOf("TVRHBA_VMSystemDevice"))
        systems.push_back(object.get("GroupComponent").asPath().key("Name")->asString());
    EXPECT_THAT(systems, ElementsAre("guest", "tavrin-host.example.net", "tavrin-host.example.net"))
        << "by name where it has no UUID; a port of no machine is the host's";
    const broker::Object only = theOne(host, "TVRHBA_ResourcePool", "PoolID", "1000000000000001");
    EXPECT_EQ(only.get("Reserved").asUnsigned(), 3u);
    EXPECT_THAT(host.instancesOf("TVRHBA_ElementAllocatedFromPool"), SizeIs(3));
    EXPECT_THAT(host.instancesOf("TVRHBA_VirtualSCSIInitiatorTargetLogicalUnitPath"), SizeIs(4));
    host.unload();
}

// --- failing calls

struct FaultRow
{
    const char* fault;
    std::size_t pools, ports, endpoints, volumes;
    const char* line; ///< of the log; null where nothing failed
};

TEST(PortVirtualization, WhatCanBeReadStands)
{
    const FaultRow rows[] = {
        {R"("LRM_VPList", "status": 2)", 0, 0, 0, 0, nullptr},
        {R"("LRM_VPList", "status": 148)", 0, 0, 0, 0, "[TVR_ERR] ListVPorts failed on FC port 1000000000000001: 148"},
        {R"("LRM_VPGetAttributes", "status": 97)", 1, 3, 7, 4,
         "[TVR_ERR] ListVPortAttributes failed on FC port 1000000000000001: 97"},
        {R"("LRM_GetVMFromVPort", "status": 149)", 1, 3, 7, 4,
         "[TVR_ERR] ListVMfromVPort failed on FC port 1000000000000001: 149"},
        {R"("LRM_VPListTargets", "subject": "2000000000000001", "status": 5)", 1, 3, 2, 1,
         "[TVR_ERR] ListVPortTargets failed on FC port 1000000000000001: 5"},
        {R"("LRM_VpScsiReportLUNs", "subject": "2000000000000003", "status": 8)", 1, 3, 5, 3,
         "[TVR_ERR] ListVPortLuns failed on FC port 1000000000000001: 8"},
        {R"("LRM_VpScsiInquiry", "from": 1, "to": 1, "status": 150)", 1, 3, 7, 3,
         "[TVR_ERR] VPortLunAttr failed on FC port 1000000000000001: 150"},
        // Capacity, and pages of vital product data, which a unit need not have.
        {R"("LRM_VpScsiReadCapacity", "status": 150)", 1, 3, 7, 4, nullptr},
        {R"("LRM_VpScsiInquiry", "from": 2, "to": 3, "status": 150)", 1, 3, 7, 4, nullptr},
    };
    for (const FaultRow& row : rows)
    {
        SCOPED_TRACE(row.fault);
        Host host(several);
        host.addFault(std::string(R"({"function": )") + row.fault + "}");
        EXPECT_THAT(host.instancesOf("TVRHBA_ResourcePool"), SizeIs(row.pools));
        EXPECT_THAT(host.instancesOf("TVRHBA_VirtualFCPort"), SizeIs(row.ports));
        EXPECT_THAT(host.instancesOf("TVRHBA_VirtualSCSIProtocolTargetEndpoint"), SizeIs(row.endpoints));
        EXPECT_THAT(host.instancesOf("TVRHBA_VirtualStorageVolume"), SizeIs(row.volumes));
        EXPECT_THAT(host.instancesOf("TVRHBA_RecordLog"), SizeIs(2)) << "the refresh goes on";
        EXPECT_TRUE(!row.line || host.logged(row.line) > 0);
        EXPECT_EQ(host.logged("[TVR_ERR] CreatePortVirtualizationClasses failed: 32769"), row.line ? 1u : 0u);
        host.unload();
    }
}

TEST(PortVirtualization, HostileAnswersDoNoHarm)
{
    const char* const faults[] = {
        R"("LRM_VPList", "hostile": "hugeCount")",          R"("LRM_VPList", "hostile": "allOnes")",
        R"("LRM_VPGetAttributes", "hostile": "allOnes")",   R"("LRM_VPGetAttributes", "hostile": "unterminatedText")",
        R"("LRM_GetVMFromVPort", "hostile": "allOnes")",    R"("LRM_VPListTargets", "hostile": "hugeCount")",
        R"("LRM_VPListTargets", "hostile": "allOnes")",     R"("LRM_VpScsiReportLUNs", "hostile": "hugeLength")",
        R"("LRM_VpScsiReportLUNs", "hostile": "allOnes")",  R"("LRM_VpScsiInquiry", "hostile": "allOnes")",
        R"("LRM_VpScsiReadCapacity", "hostile": "allOnes")"};
    for (const char* const fault : faults)
    {
        SCOPED_TRACE(fault);
        Host host(several);
        host.addFault(std::string(R"({"function": )") + fault + "}");
        for (const char* const className : classes)
            EXPECT_EQ(host.enumerate(className).status, CMPI_RC_OK) << className;
        EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateAdapterMaps: cleanExit"), 1u);
        host.unload();
    }
}

} // namespace
