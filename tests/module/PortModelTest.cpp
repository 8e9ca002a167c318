// The ports as a client sees them: FC port, statistics, controllers, transceiver, flash images and endpoint, what ties
// them together, and what is read live.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include "broker/values/PathText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <regex>

using namespace module_test;
using namespace std::chrono_literals;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

constexpr const char* ports[] = {"1000027A51160210", "1000027A51160211", "1000027A51320240", "1000027A51320241"};

/// Without the moments, which no test can know.
std::string withoutTimes(const std::string& description)
{
    static const std::regex times("(StartStatisticTime|StatisticTime|ReleaseDate) = [^\n]*\n");
    return std::regex_replace(description, times, "");
}

// --- instances

struct InstanceRow
{
    const char* className;
    const char* key;   ///< a property that tells the instance
    const char* value; ///< and its text
    const char* properties;
};

/// A port whose link is down and whose transceiver says little, and another where all is well.
const InstanceRow instances[] = {
    {"TVRHBA_FCPort", "DeviceID", "1000027A51160211", R"~(
ActiveCOS = {2, 3}
ActiveMaximumTransmissionUnit = 2048
AdapterName = "Tavrin-TV1602-2"
CreationClassName = "TVRHBA_FCPort"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = "1000027A51160211"
ElementName = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1 port 1"
FCID = 0
FECState = 2
FWDownloadStatus = 0
FabricName = "0000000000000000"
IdentifyingDescriptions = {"VPD:PRODUCT_NAME", "VPD:EC_LEVEL", "VPD:MANUFACTURER_ID", "VPD:PART_NUMBER", "VPD:SERIAL_NUMBER", "VPD:V0", "VPD:YA", "VPD:YX (VPD-W)", "OS Device Name", "TAVRIN:IEEE_ADDRESS", "SerialNumber + Sub-AdapterID", "NodeWWN", "NodeSymbolicName"}
LinkTechnology = 4
LocationIndicator = 3
MaxSpeed = 8000000000
Name = "1000027A51160211"
NetworkAddresses = {"1000027A51160211"}
NumberOfDiscoveredPorts = 0
OperationalFirmware = "11.4.210.8"
OperationalStatus = {1}
OtherIdentifyingInfo = {"Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter", "C-5124", "1D7A", "TV1602-M8", "TV16A02417", "PCIe 2.0 x8", "RACK 12 SLOT 3", "SERVICE 2019-04", "/sys/class/fc_host/host6", "02:7a:51:16:02:11", "TV16A02417", "2000027A51160211", "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"}
OtherPortType = "Unknown"
PermanentAddress = "1000027A51160211"
PortNumber = 1
PortType = 0
Speed = 0
StatusDescriptions = {"Other"}
SupportedCOS = {2, 3}
SupportedFC4Types = {5, 8, 32, 5, 8, 32}
SupportedMaximumTransmissionUnit = 2048
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
UsageRestriction = 4
)~"},
    {"TVRHBA_FCPort", "DeviceID", "1000027A51320240", R"~(
ActiveCOS = {2, 3}
ActiveMaximumTransmissionUnit = 2048
AdapterName = "Tavrin-TV3202-1"
CreationClassName = "TVRHBA_FCPort"
Description = "Tavrin TV3202 16Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = "1000027A51320240"
ElementName = "Tavrin TV3202 FV12.0.100.0 DV12.0.0.1 port 0"
FCID = 67072
FECState = 1
FWDownloadStatus = 0
FabricName = "1000063D2000A001"
IdentifyingDescriptions = {"VPD:PRODUCT_NAME", "VPD:EXT_CAPABILITY", "VPD:EC_LEVEL", "VPD:FABRIC_GEOGRAPHY", "VPD:LOCATION", "VPD:MANUFACTURER_ID", "VPD:PCI_GEOGRAPHY", "VPD:PART_NUMBER", "VPD:SERIAL_NUMBER", "OS Device Name", "TAVRIN:IEEE_ADDRESS", "SerialNumber + Sub-AdapterID", "NodeWWN", "NodeSymbolicName"}
LinkTechnology = 4
LocationIndicator = 2
MaxSpeed = 16000000000
Name = "1000027A51320240"
NetworkAddresses = {"1000027A51320240"}
NumberOfDiscoveredPorts = 5
OperationalFirmware = "12.0.100.0"
OperationalStatus = {2}
OtherIdentifyingInfo = {"Tavrin TV3202 16Gb 2-port PCIe Fibre Channel Adapter", "01080010", "A-7306", "FC01", "SLOT 5", "1D7A", "0000:08", "TV3202-M16", "TV32B71155", "/sys/class/fc_host/host7", "02:7a:51:32:02:40", "TV32B71155", "2000027A51320240", "Tavrin TV3202 FV12.0.100.0 DV12.0.0.1"}
OtherPortType = "N"
PermanentAddress = "1000027A51320240"
PortNumber = 0
PortType = 10
Speed = 16000000000
StatusDescriptions = {"OK"}
SupportedCOS = {2, 3}
SupportedFC4Types = {5, 8, 32, 5, 8, 32}
SupportedMaximumTransmissionUnit = 2048
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
UsageRestriction = 4
)~"},
    {"TVRHBA_FCPortStatistics", "ElementName", "1000027A51160211", R"~(
BytesReceived = 2445000704
BytesTransmitted = 1608754176
CRCErrors = 0
DelimiterErrors = 0
Description = "Statistics for the FC port."
DumpedFrames = 0
ElementName = "1000027A51160211"
ErrorFrames = 0
FBSYFrames = 0
InstanceID = "TVR FC HBA:HBA Statistics:1000027A51160211"
InvalidTransmissionWords = 12
LinkFailures = 7
LinkResetsReceived = 2
LinkResetsTransmitted = 1
LossOfSignalCounter = 7
LossOfSyncCounter = 3
NOSCount = 2
PBSYFrames = 0
PacketsReceived = 0
PacketsTransmitted = 0
PrimitiveSeqProtocolErrCount = 0
)~"},
    {"TVRHBA_SCSIProtocolController", "DeviceID", "1000027A51160211", R"~(
CreationClassName = "TVRHBA_SCSIProtocolController"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = "1000027A51160211"
ElementName = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"
EnabledDefault = 2
EnabledState = 5
MaxUnitsControlled = 1
Name = "1000027A51160211"
NameFormat = 2
OperationalStatus = {1}
RequestedState = 12
StatusDescriptions = {"Other"}
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)~"},
    {"TVRHBA_PortController", "DeviceID", "1000027A51160211", R"~(
Availability = 3
ControllerType = 4
CreationClassName = "TVRHBA_PortController"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = "1000027A51160211"
ElementName = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"
EnabledDefault = 2
EnabledState = 5
MaxNumberControlled = 1
Name = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"
OperationalStatus = {1}
ProtocolDescription = "SCSI Fibre Channel Protocol"
ProtocolSupported = 10
RequestedState = 5
StatusDescriptions = {"Other"}
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)~"},
    {"TVRHBA_SCSIProtocolInitiatorEndpoint", "Name", "1000027A51160211", R"~(
ConnectionType = 2
CreationClassName = "TVRHBA_SCSIProtocolInitiatorEndpoint"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
ElementName = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"
EnabledDefault = 5
EnabledState = 0
Name = "1000027A51160211"
OperationalStatus = {0}
ProtocolIFType = 56
ProtocolType = 18
RequestedState = 0
Role = 2
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)~"},
    {"TVRHBA_Transceiver", "SerialNumber", "OP8G440017", R"~(
Connector = 7
CreationClassName = "TVRHBA_Transceiver"
CurrentHighAlarm = 15
CurrentHighWarning = 14
CurrentLowAlarm = 2
CurrentLowWarning = 3
Description = "Tavrin PhysicalComponent Data"
ElementName = "TVRHBA_Transceiver"
ExtIdentifier = 4
Identifier = 3
InstanceID = "1000027A51160210:OP8G440017"
ManufactureDate = "20130904000000.000000+000"
Manufacturer = "OPTENNA"
Name = "1000027A51160210:OP8G440017"
OUI = "00-02-7a"
OperationalStatus = {0}
PartNumber = "OPT8-SW-850"
RemovalConditions = 2
RxPower = 0.421
RxPowerHighAlarm = 1.5849
RxPowerHighWarning = 1
RxPowerLowAlarm = 0.0282
RxPowerLowWarning = 0.0355
SFPStatus = 0
SerialNumber = "OP8G440017"
StatusDescriptions = {"unknown"}
Tag = "1000027A51160210:OP8G440017"
Temperature = 38.5
TemperatureHighAlarm = 90
TemperatureHighWarning = 85
TemperatureLowAlarm = -13
TemperatureLowWarning = 0
TemperatureUnit = "Celsius"
TxBiasCurrent = 6.82
TxPower = 0.548
TxPowerHighAlarm = 1.2589
TxPowerHighWarning = 1
TxPowerLowAlarm = 0.1445
TxPowerLowWarning = 0.1585
Vcc = 3.295
Version = "B2"
VoltageHighAlarm = 3.7
VoltageHighWarning = 3.6
VoltageLowAlarm = 2.9
VoltageLowWarning = 3
WaveLength = 850
)~"},
    {"TVRHBA_Transceiver", "SerialNumber", "OP8G440018", R"~(
CreationClassName = "TVRHBA_Transceiver"
Description = "Tavrin PhysicalComponent Data"
ElementName = "TVRHBA_Transceiver"
InstanceID = "1000027A51160211:OP8G440018"
ManufactureDate = "19991231000000.000000+000"
Manufacturer = "OPTENNA"
Name = "1000027A51160211:OP8G440018"
OUI = "00-02-7a"
OperationalStatus = {0}
PartNumber = "OPT8-SW-850"
RemovalConditions = 2
SFPStatus = 1
SerialNumber = "OP8G440018"
StatusDescriptions = {"unknown"}
Tag = "1000027A51160211:OP8G440018"
Version = "B2"
)~"},
    {"TVRHBA_FlashImageSoftwareIdentity", "Name", "FC Firmware", R"~(
BuildNumber = 3
ClassificationDescriptions = {"Firmware Kernel"}
Classifications = {11}
Description = "Fibre Channel firmware"
ElementName = "FC HBA Flash Image FC Firmware v 1.40a3 TV1602 1000027A51160210"
IdentityInfoType = {"TAVRIN:FLASH_PROGRAM_TYPE", "TAVRIN:FLASH_PROGRAM_ID"}
IdentityInfoValue = {"FC Firmware", "1.40a3"}
InstanceID = "FC HBA Flash Image FC Firmware v 1.40a3 TV1602 1000027A51160210"
IsEntity = true
IsLargeBuildNumber = false
IsWakeupParameter = true
MajorVersion = 1
Manufacturer = "Tavrin Corporation"
MinorVersion = 4
Name = "FC Firmware"
Next = 655360
Previous = 0
ProgramID = {42472451, 1}
ProgramLength = 524288
ProgramType = "FC Firmware"
ReleaseType = "a"
RevisionNumber = 0
StartAddress = 131072
TestReleaseVersion = ""
VersionString = "1.40a3"
)~"},
    {"TVRHBA_FlashImageSoftwareIdentity", "Name", "Boot BIOS", R"~(
ClassificationDescriptions = {"Firmware Kernel"}
Classifications = {11}
Description = "Multi-boot image"
ElementName = "FC HBA Flash Image Boot BIOS v 11.4.204.11 TV1602 1000027A51160210"
IdentityInfoType = {"TAVRIN:FLASH_PROGRAM_TYPE", "TAVRIN:FLASH_PROGRAM_ID"}
IdentityInfoValue = {"Boot BIOS", "11.4.204.11"}
InstanceID = "FC HBA Flash Image Boot BIOS v 11.4.204.11 TV1602 1000027A51160210"
IsEntity = true
IsLargeBuildNumber = false
IsWakeupParameter = false
Manufacturer = "Tavrin Corporation"
Name = "Boot BIOS"
Next = 0
Previous = 131072
ProgramID = {184863755, 2}
ProgramLength = 262144
ProgramType = "Boot BIOS"
StartAddress = 655360
VersionString = "11.4.204.11"
)~"},
};

TEST(PortModel, InstancesHaveThesePropertiesAndNoOthers)
{
    setHostNames({});
    Host host;
    host.options.personality.schemaDefaults = false; // what the module leaves null stays null
    for (const InstanceRow& row : instances)
        EXPECT_EQ(withoutTimes(describe(theOne(host, row.className, row.key, row.value))), row.properties)
            << row.className;
    for (const char* className :
         {"TVRHBA_FCPort", "TVRHBA_FCPortStatistics", "TVRHBA_SCSIProtocolController", "TVRHBA_PortController"})
        EXPECT_THAT(host.instancesOf(className), SizeIs(4)) << className;
    EXPECT_THAT(host.instancesOf("TVRHBA_SCSIProtocolInitiatorEndpoint"), SizeIs(5)) << "one is a virtual port's";
    EXPECT_THAT(host.instancesOf("TVRHBA_Transceiver"), SizeIs(3));
    EXPECT_EQ(host.logged("[TVR_DBG] Failed Creating TVRHBA_Transceiver"), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] Unable to obtain transceiver data for this host bus adapter."), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] Failed to retrieve the flash contents. Exited with ErrorCode 2"), 2u);
    EXPECT_EQ(host.logged("[TVR_DBG] Ending of Software Installation Service"), 4u);
    host.unload();
}

// --- associations

struct AssociationRow
{
    const char* className;
    const char* firstRole;
    const char* first; ///< what the first end's path holds; %s is the WWPN
    const char* secondRole;
    const char* second;
    std::size_t ofVirtualPorts = 0; ///< behind those of the ports
};

const AssociationRow associations[] = {
    {"TVRHBA_FCPortSystemDevice", "GroupComponent", ":CIM_ComputerSystem.", "PartComponent",
     ":TVRHBA_FCPort.*DeviceID=\"%s\""},
    {"TVRHBA_MemberOfCollection", "Collection", ":TVRHBA_LogicalPortGroup.", "Member",
     ":TVRHBA_FCPort.*DeviceID=\"%s\""},
    {"TVRHBA_FCRealizes", "Antecedent", ":TVRHBA_PhysicalConnector.Tag=\"%s\"", "Dependent",
     ":TVRHBA_FCPort.*DeviceID=\"%s\""},
    {"TVRHBA_ElementStatisticalData", "ManagedElement", ":TVRHBA_FCPort.*DeviceID=\"%s\"", "Stats",
     ":TVRHBA_FCPortStatistics.*Statistics:%s\""},
    {"TVRHBA_ProtocolControllerForPort", "Antecedent", ":TVRHBA_SCSIProtocolController.*DeviceID=\"%s\"", "Dependent",
     ":TVRHBA_FCPort.*DeviceID=\"%s\""},
    {"TVRHBA_SCSIProtocolControllerSystemDevice", "GroupComponent", ":CIM_ComputerSystem.", "PartComponent",
     ":TVRHBA_SCSIProtocolController.*DeviceID=\"%s\""},
    {"TVRHBA_ProductElementComponent", "GroupComponent", ":TVRHBA_Product.", "PartComponent",
     ":TVRHBA_PortController.*DeviceID=\"%s\""},
    {"TVRHBA_PHYConnectorRealizesPortController", "Antecedent", ":TVRHBA_PhysicalConnector.Tag=\"%s\"", "Dependent",
     ":TVRHBA_PortController.*DeviceID=\"%s\""},
    {"TVRHBA_ControlledBy", "Antecedent", ":TVRHBA_PortController.*DeviceID=\"%s\"", "Dependent",
     ":TVRHBA_FCPort.*DeviceID=\"%s\""},
    {"TVRHBA_Realizes", "Antecedent", ":TVRHBA_Card.", "Dependent", ":TVRHBA_PortController.*DeviceID=\"%s\""},
    {"TVRHBA_PortControllerSystemDevice", "GroupComponent", ":CIM_ComputerSystem.", "PartComponent",
     ":TVRHBA_PortController.*DeviceID=\"%s\""},
    {"TVRHBA_DeviceSAPImplementation", "Antecedent", ":TVRHBA_FCPort.*DeviceID=\"%s\"", "Dependent",
     ":TVRHBA_SCSIProtocolInitiatorEndpoint.Name=\"%s\""},
    {"TVRHBA_LocalHostedInitiatorAccessPoint", "Antecedent", ":CIM_ComputerSystem.", "Dependent",
     ":TVRHBA_SCSIProtocolInitiatorEndpoint.Name=\"%s\"", 1},
};

std::string endOf(const broker::Object& association, const char* role)
{
    return broker::fullPathText(association.get(role).asPath());
}

void expectEnd(const broker::Object& association, const char* role, std::string pattern, const std::string& wwpn)
{
    if (const std::size_t place = pattern.find("%s"); place != std::string::npos)
        pattern.replace(place, 2, wwpn);
    EXPECT_TRUE(std::regex_search(endOf(association, role), std::regex(pattern)))
        << role << " is " << endOf(association, role) << " and not " << pattern;
}

TEST(PortModel, EachPortIsTiedToItsHardwareAndHost)
{
    Host host;
    for (const AssociationRow& row : associations)
    {
        SCOPED_TRACE(row.className);
        const std::vector<broker::Object> all = host.instancesOf(row.className);
        ASSERT_THAT(all, SizeIs(std::size(ports) + row.ofVirtualPorts));
        for (std::size_t i = 0; i < std::size(ports); i++)
        {
            expectEnd(all[i], row.firstRole, row.first, ports[i]);
            expectEnd(all[i], row.secondRole, row.second, ports[i]);
        }
    }
    for (const broker::Object& controlled : host.instancesOf("TVRHBA_ControlledBy"))
    {
        const bool linkDown = endOf(controlled, "Dependent").find(ports[1]) != std::string::npos;
        EXPECT_EQ(controlled.get("AccessState").asUnsigned(), linkDown ? 2u : 1u);
    }
    for (const broker::Object& element : host.instancesOf("TVRHBA_ElementFlashImageSoftwareIdentity"))
    {
        EXPECT_EQ(element.get("UpgradeCondition").asUnsigned(), 3u);
        EXPECT_THAT(describe(element), testing::HasSubstr("ElementSoftwareStatus = {6}\n"));
    }
    EXPECT_THAT(host.instancesOf("TVRHBA_ElementFlashImageSoftwareIdentity"), SizeIs(3));
    EXPECT_THAT(host.instancesOf("TVRHBA_TransceiverComponent"), SizeIs(3));
    host.unload();
}

TEST(PortModel, PortsAndControllersConformToTheseProfiles)
{
    Host host;
    const auto profilesOf = [&](const char* className, const char* wwpn)
    {
        std::vector<std::string> profiles;
        for (const broker::Object& conforms : host.instancesOf(className))
            if (endOf(conforms, "ManagedElement").find(wwpn) != std::string::npos)
                profiles.push_back(conforms.get("ConformantStandard").asPath().key("InstanceID")->asString());
        return profiles;
    };
    for (const char* wwpn : ports)
    {
        EXPECT_THAT(profilesOf("TVRHBA_FCPortConformsToProfile", wwpn),
                    ElementsAre("TVR:Physical Package", "TVR:Host Discovered Resources", "TVR:FC Initiator Ports",
                                "TVR:Access Points"));
        EXPECT_THAT(profilesOf("TVRHBA_PortControllerConformsToProfile", wwpn),
                    ElementsAre("TVR:Storage HBA", "TVR:FC HBA"));
    }
    EXPECT_THAT(logAbout(host, {"ConformsToProfile (FC Port TV1602:1000027A51160210",
                                "ConformsToProfile (Port Controller TV1602:1000027A51160210"}),
                ElementsAre("[TVR_DBG] Generating TVRHBA_FCPortConformsToProfile (FC Port TV1602:1000027A51160210, "
                            "Physical Package)",
                            "[TVR_DBG] Generating TVRHBA_FCPortConformsToProfile (FC Port TV1602:1000027A51160210, "
                            "Host Discovered Resource)",
                            "[TVR_DBG] Generating TVRHBA_FCPortConformsToProfile (FC Port TV1602:1000027A51160210, "
                            "FC Initiator Port)",
                            "[TVR_DBG] Generating TVRHBA_FCPortConformsToProfile (FC Port TV1602:1000027A51160210, "
                            "Access Points)",
                            "[TVR_DBG] Generating TVRHBA_PortControllerConformsToProfile (Port Controller "
                            "TV1602:1000027A51160210, Storage HBA)",
                            "[TVR_DBG] Generating TVRHBA_PortControllerConformsToProfile (Port Controller "
                            "TV1602:1000027A51160210, FC HBA)"));
    host.unload();
}

// --- hosts of their own

/// A host of one adapter with one port that has these members.
std::string onePort(const std::string& members)
{
    return R"({"adapters": [{"name": "Tavrin-1", "serialNumber": "S1", "model": "M1", "manufacturer": "Maker",
               "ports": [{"wwpn": "10:00:00:00:00:00:00:01")" +
           members + "}]}]}";
}

TEST(PortModel, AccessStateAndStatusFollowThePortState)
{
    const struct
    {
        unsigned state;
        const char* port;
        const char* controllers;
        unsigned access;
    } states[] = {
        {1, "{0}", "{0}", 0},      {2, "{2}", "{2}", 1},      {3, "{10}", "{10}", 2},    {7, "{6}", "{6}", 2},
        {8, "{32776}", "{11}", 2}, {20, "{32788}", "{0}", 2}, {22, "{32790}", "{0}", 2},
    };
    for (const auto& row : states)
    {
        SCOPED_TRACE(row.state);
        Host host(onePort(R"(, "state": )" + std::to_string(row.state)));
        const auto statusOf = [&](const char* className)
        {
            const std::string text = describe(host.instancesOf(className).at(0));
            const std::size_t begin = text.find("OperationalStatus = ") + 20;
            return text.substr(begin, text.find('\n', begin) - begin);
        };
        EXPECT_EQ(statusOf("TVRHBA_FCPort"), row.port);
        EXPECT_EQ(statusOf("TVRHBA_PortController"), row.controllers);
        EXPECT_EQ(statusOf("TVRHBA_SCSIProtocolController"), row.controllers);
        EXPECT_EQ(host.instancesOf("TVRHBA_ControlledBy").at(0).get("AccessState").asUnsigned(), row.access);
        host.unload();
    }
}

TEST(PortModel, TransceiverShowsWhatItsFlagsCover)
{
    const std::string identity = R"("identifier": 3, "waveLength": 1310)";
    const std::string vendor = R"("vendor": "V", "serialNumber": "T1")";
    const std::string measured = R"("measured": ["0xFF00"], "thresholds": ["0x8000", "0x8000", "0xFFFF", "0xFFFF"])";
    const struct
    {
        std::string members;
        bool identity, measured;
        unsigned status;
    } cases[] = {
        {identity + "," + vendor + "," + measured, true, true, 0},
        {identity + "," + vendor, true, false, 1},
        {vendor + "," + measured, false, true, 1},
        {identity + "," + measured, true, true, 1},
    };
    for (const auto& row : cases)
    {
        SCOPED_TRACE(row.members);
        Host host(onePort(R"(, "transceiver": {)" + row.members + "}"));
        const broker::Object transceiver = host.instancesOf("TVRHBA_Transceiver").at(0);
        for (const char* name : {"Identifier", "ExtIdentifier", "Connector", "WaveLength"})
            EXPECT_EQ(transceiver.get(name).isNull(), !row.identity) << name;
        for (const char* name : {"Temperature", "TemperatureUnit", "Vcc", "RxPowerLowWarning"})
            EXPECT_EQ(transceiver.get(name).isNull(), !row.measured) << name;
        EXPECT_EQ(transceiver.get("SFPStatus").asUnsigned(), row.status);
        EXPECT_TRUE(transceiver.get("ManufactureDate").isNull()) << "no date code";
        if (row.measured)
        {
            // -1 degree; highs are unsigned, lows below zero are whole degrees in the library's own terms.
            EXPECT_THAT(describe(transceiver), testing::AllOf(testing::HasSubstr("\nTemperature = -1\n"),
                                                              testing::HasSubstr("TemperatureHighAlarm = 128\n"),
                                                              testing::HasSubstr("TemperatureLowAlarm = -25\n"),
                                                              testing::HasSubstr("TemperatureLowWarning = -12\n")));
        }
        host.unload();
    }
}

TEST(PortModel, DateCodesBelow70AreOfThisCentury)
{
    const std::pair<const char*, const char*> codes[] = {
        {"690102", "20690102000000.000000+000"},
        {"700102", "19700102000000.000000+000"},
        {"991231", "19991231000000.000000+000"},
        {"16O211", ""},
        {"1602", ""},
    };
    for (const auto& [code, date] : codes)
    {
        Host host(onePort(std::string(R"(, "transceiver": {"dateCode": ")") + code + "\"}"));
        const broker::Value made = host.instancesOf("TVRHBA_Transceiver").at(0).get("ManufactureDate");
        EXPECT_EQ(made.isNull() ? "" : made.asDateTime().text(), date) << code;
        host.unload();
    }
}

TEST(PortModel, FlashListsAreBoundedByTheirRoom)
{
    std::string regions;
    for (int i = 0; i < 64; i++)
        regions += (i ? "," : "") + std::string(R"({"programType": "P)") + std::to_string(i) + "\"}";
    {
        Host host(onePort(R"(, "flash": [)" + regions + "]"));
        EXPECT_THAT(host.instancesOf("TVRHBA_FlashImageSoftwareIdentity"), SizeIs(64));
        host.unload();
    }
    {
        // A count past the room is cut to it; behind the one region the list is empty, and empty regions are equal.
        Host host(onePort(R"(, "flash": [{"programType": "P"}])"));
        host.addFault(R"({"function": "LRM_DiagGetLoadListParams", "hostile": "hugeCount"})");
        EXPECT_THAT(host.instancesOf("TVRHBA_FlashImageSoftwareIdentity"), SizeIs(2));
        EXPECT_EQ(host.logged("[TVR_CRIT] Insert Failed : m_TVRHBA_FlashImageSoftwareIdentity_map"), 1u);
        EXPECT_THAT(host.instancesOf("TVRHBA_SCSIProtocolInitiatorEndpoint"), SizeIs(1)) << "the chain goes on";
        host.unload();
    }
}

// --- the beacon

TEST(PortModel, BeaconIsShownAsTheLibraryHasIt)
{
    const struct
    {
        const char* fault;
        const char* line;
        unsigned value;
    } cases[] = {
        {nullptr, "[TVR_DBG] Beacon state = 'On'", 2},
        {R"("status": 2)", "[TVR_DBG] Beaconing not supported on host or adapter", 4},
        {R"("status": 63)", "[TVR_DBG] Diagnostics not available", 4},
        {R"("status": 1)", "[TVR_DBG] Unable to get the beacon state", 0},
        {R"("hostile": "allOnes")", "[TVR_DBG] Beacon state = 'Unknown'", 0},
    };
    for (const auto& row : cases)
    {
        SCOPED_TRACE(row.line);
        Host host(onePort(R"(, "beacon": "on")"));
        if (row.fault)
            host.addFault(R"({"function": "LRM_DiagBeaconState", )" + std::string(row.fault) + "}");
        EXPECT_EQ(host.instancesOf("TVRHBA_FCPort").at(0).get("LocationIndicator").asUnsigned(), row.value);
        EXPECT_GE(host.logged(row.line), 1u);
        host.unload();
    }
}

TEST(PortModel, BeaconIsLitByLocationIndicatorAlone)
{
    Host host;
    const broker::Object port = theOne(host, "TVRHBA_FCPort", "DeviceID", ports[0]);
    const auto beacon = [&] { return host.broker().getInstance(port.path).objects.at(0).get("LocationIndicator"); };
    const auto modify = [&](const broker::Object& object) { return host.broker().modifyInstance(object).status; };
    EXPECT_EQ(beacon().asUnsigned(), 3u);
    EXPECT_EQ(modify(changed(port, "LocationIndicator", broker::Value::uint16(2))), CMPI_RC_OK);
    EXPECT_EQ(beacon().asUnsigned(), 2u) << "read back from the adapter";
    EXPECT_EQ(host.calls("LRM_DiagBeacon"), 1u);

    EXPECT_EQ(modify(changed(port, "LocationIndicator", broker::Value::uint16(4))), CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(modify(changed(port, "ElementName", broker::Value::string("mine"))), CMPI_RC_ERR_INVALID_PARAMETER);
    broker::Object unknown = changed(port, "LocationIndicator", broker::Value::uint16(3));
    for (broker::Property& key : unknown.path.keys)
        if (key.name == "DeviceID")
            key.value = broker::Value::string("1000027A51160299");
    EXPECT_EQ(modify(unknown), CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_EQ(host.calls("LRM_DiagBeacon"), 1u) << "refusals touch nothing";
    EXPECT_EQ(beacon().asUnsigned(), 2u);
    EXPECT_THAT(logAbout(host, {"BeaconState :", "LocationIndicator,", "Invalid instance", "Beacon state modified"}),
                ElementsAre("[TVR_DBG] Input BeaconState : 2", "[TVR_DBG] Beacon state modified successfully",
                            "[TVR_DBG] Input BeaconState : 4",
                            "[TVR_DBG] Invalid LocationIndicator, Valid values are '2' or '3'",
                            // without a list of properties, all that are not sent are wanted null
                            "[TVR_DBG] Input BeaconState : 0",
                            "[TVR_DBG] Invalid LocationIndicator, Valid values are '2' or '3'",
                            "[TVR_DBG] Invalid instance of TVRHBA_FCPort Data"));
    host.unload();
}

// --- what is read live

TEST(PortModel, StateAndCountersAreThoseOfNow)
{
    stopClock();
    Host host;
    const auto port = [&] { return theOne(host, "TVRHBA_FCPort", "DeviceID", ports[0]); };
    const auto counters = [&] { return theOne(host, "TVRHBA_FCPortStatistics", "ElementName", ports[0]); };
    EXPECT_THAT(describe(port()), testing::HasSubstr("OperationalStatus = {2}\n"));
    EXPECT_EQ(counters().get("PacketsReceived").asUnsigned(), 2211904u);

    host.setPortState(ports[0], 6);
    host.setAttribute(ports[0], R"({"rxFrames": 2211905})");
    host.setAttribute(ports[0], R"({"nosCount": "0xFFFFFFFFFFFFFFFF"})");
    EXPECT_THAT(describe(port()), testing::HasSubstr("OperationalStatus = {1}\n"));
    EXPECT_EQ(counters().get("PacketsReceived").asUnsigned(), 2211905u);
    EXPECT_TRUE(counters().get("NOSCount").isNull()) << "the port has ceased to count it";
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateAdapterMaps: cleanExit"), 1u) << "no refresh in between";

    // What cannot be read stays.
    host.addFault(R"({"function": "LRM_GetPortStatistics", "status": 1})");
    host.addFault(R"({"function": "LRM_GetPortAttributes", "status": 1})");
    host.setPortState(ports[0], 2);
    host.setAttribute(ports[0], R"({"rxFrames": 1})");
    EXPECT_THAT(describe(port()), testing::HasSubstr("OperationalStatus = {1}\n"));
    EXPECT_EQ(counters().get("PacketsReceived").asUnsigned(), 2211905u);
    EXPECT_EQ(host.logged("[TVR_DBG] FC Port statistics error occurred,retain the old statistics !!!"), 4u);
    host.unload();
}

TEST(PortModel, WordsStandInForBytesThatAreNotCounted)
{
    Host host(onePort(R"(, "statistics": {"rxWords": 10, "txWords": 11, "txBytes": 7})"));
    const broker::Object counters = host.instancesOf("TVRHBA_FCPortStatistics").at(0);
    EXPECT_EQ(counters.get("BytesReceived").asUnsigned(), 40u);
    EXPECT_EQ(counters.get("BytesTransmitted").asUnsigned(), 7u);
    EXPECT_TRUE(counters.get("PacketsReceived").isNull());
    EXPECT_TRUE(counters.get("StartStatisticTime").isNull());
    EXPECT_FALSE(counters.get("StatisticTime").isNull());
    host.unload();
}

} // namespace
