// The SAN as a client sees it: target endpoints, the devices that logical units are, and the paths between.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"
#include "tests/module/RefreshLines.h"
#include "tests/support/Eventually.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

using namespace module_test;
using namespace std::chrono_literals;
using testing::Contains;
using testing::ElementsAre;
using testing::Not;
using testing::SizeIs;

namespace
{

constexpr const char* settingsFile = "/etc/tavrin_fc_provider.conf";

// --- instances of the default host

struct InstanceRow
{
    const char* className;
    const char* key;
    const char* value;
    const char* properties;
};

const InstanceRow instances[] = {
    {"TVRHBA_SCSIProtocolEndpoint", "Name", "1000027A51160210:50063D200110000A:0001000000000000", R"(
ConnectionType = 2
CreationClassName = "TVRHBA_SCSIProtocolEndpoint"
Description = "OLSTRA   MERIDIAN 7 DISK  Revision 0412 Serial Number OM70000002"
ElementName = "MERIDIAN 7 DISK "
EnabledDefault = 5
EnabledState = 0
FCID = 66048
IdentifyingDescriptions = {"OS Device Name"}
Name = "1000027A51160210:50063D200110000A:0001000000000000"
OperationalStatus = {0}
OtherIdentifyingInfo = {"/dev/sdb"}
ProtocolIFType = 56
ProtocolType = 18
RequestedState = 0
Role = 3
SCSIBusNumber = 5
SCSITargetNumber = 0
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TargetWWNN = "50063D2001100000"
TargetWWPN = "50063D200110000A"
TransitioningToState = 12
)"},
    {"TVRHBA_StorageVolume", "DeviceID",
     "1000027A51160210_50063D200110000A_6063D20000000001000000000000A002_0001000000000000", R"(
BlockSize = 512
CanDelete = true
Capacity = 536870912000
CapacityUnit = "Byte"
CreationClassName = "TVRHBA_StorageVolume"
Description = "OLSTRA   MERIDIAN 7 DISK  Revision 0412 Serial Number OM70000002"
DeviceID = "1000027A51160210_50063D200110000A_6063D20000000001000000000000A002_0001000000000000"
DeviceType = 0
ElementName = "Storage Volume: 1"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"OS Device Name", "Standard SCSI inquiry data"}
IsComposite = true
Name = "63D20000000001000000000000A002"
NameFormat = 9
NameNamespace = 2
NumberOfBlocks = 1048576000
OperationalStatus = {0}
OtherIdentifyingInfo = {"/dev/sdb", "OLSTRA   MERIDIAN 7 DISK  Revision 0412"}
Primordial = false
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
ThinlyProvisioned = false
TransitioningToState = 12
)"},
    {"TVRHBA_TapeDrive", "Name", "/dev/st1", R"(
CreationClassName = "TVRHBA_TapeDrive"
Description = "OLSTRA   SPINDLE LTO-7    Revision C7R1 Serial Number TL0042D001"
DeviceID = "1000027A51320241_50063D3002200001_50063D3002200001_0000000000000000"
DeviceType = 1
ElementName = "Tape Drive 0"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"OS Device Name", "standard SCSI Inquery data"}
Name = "/dev/st1"
OperationalStatus = {0}
OtherIdentifyingInfo = {"/dev/st1", "OLSTRA   SPINDLE LTO-7    C7R1"}
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"},
    {"TVRHBA_LogicalDisk", "ElementName", "Object-based storage device: 2", R"(
AdditionalAvailability = {3}
BlockSize = 4096
Capacity = 17179869184
CapacityUnit = "Byte"
CreationClassName = "TVRHBA_LogicalDisk"
Description = "KORUND   OBJECT STORE     Revision 1.03 Serial Number KO00000A71"
DeviceID = "1000027A51320240_50063D4003300001_607A1B00000000030000000000000C71_0002000000000000"
ElementName = "Object-based storage device: 2"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"OS Device Name", "Standard SCSI inquiry data"}
IsComposite = true
Name = "7A1B00000000030000000000000C71"
NameFormat = 12
NameNamespace = 8
NumberOfBlocks = 4194304
OperationalStatus = {0}
OtherIdentifyingInfo = {"/dev/sg2", "KORUND   OBJECT STORE     Revision 1.03"}
Primordial = false
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
ThinlyProvisioned = false
TransitioningToState = 12
)"},
    {"TVRHBA_SCSIArbitraryLogicalUnit", "ElementName", "Enclosure services 0", R"(
CreationClassName = "TVRHBA_SCSIArbitraryLogicalUnit"
Description = "OLSTRA   SHELF 24 SES     Revision 0009 Serial Number SH24000017"
DeviceID = "1000027A51320240_50063D4003300001_50063D4003300001_0000000000000000"
ElementName = "Enclosure services 0"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"OS Device Name", "Standard SCSI inquiry data"}
Name = "3D4003300001"
OperationalStatus = {0}
OtherDeviceType = "Peripheral devices type is 0x0D"
OtherIdentifyingInfo = {"/dev/sg1", "OLSTRA   SHELF 24 SES     Revision 0009"}
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"},
    {"TVRHBA_StorageExtent", "DeviceID", "1000027A51320241_50063D3002200001_00063D3002200002_0001000000000000", R"(
CreationClassName = "TVRHBA_StorageExtent"
Description = "OLSTRA   SPINDLE CHANGER  Revision 2.10 Serial Number TL0042C000"
DeviceID = "1000027A51320241_50063D3002200001_00063D3002200002_0001000000000000"
DeviceType = 8
ElementName = "Jukebox 1"
EnabledDefault = 2
EnabledState = 5
IdentifyingDescriptions = {"Standard SCSI inquiry data", "OS Device Name"}
IsComposite = true
Name = "00063D3002200002"
OperationalStatus = {0}
OtherIdentifyingInfo = {"/dev/sg3", "OLSTRA   SPINDLE CHANGER  Revision 2.10"}
Primordial = false
RequestedState = 12
SystemCreationClassName = "CIM_ComputerSystem"
SystemName = "tavrin-host.example.net"
TransitioningToState = 12
)"},
};

TEST(SanModel, InstancesHaveThesePropertiesAndNoOthers)
{
    Host host;
    for (const InstanceRow& row : instances)
        EXPECT_EQ(describe(theOne(host, row.className, row.key, row.value)), row.properties) << row.className;
    // The units that the four ports see; the second port's link is down.
    const std::pair<const char*, std::size_t> counts[] = {
        {"TVRHBA_SCSIProtocolEndpoint", 12},    {"TVRHBA_StorageVolume", 6}, {"TVRHBA_TapeDrive", 2},
        {"TVRHBA_SCSIArbitraryLogicalUnit", 1}, {"TVRHBA_LogicalDisk", 1},   {"TVRHBA_StorageExtent", 2}};
    for (const auto& [className, count] : counts)
        EXPECT_THAT(host.instancesOf(className), SizeIs(count)) << className;
    host.unload();
}

// --- associations

const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";

std::string endpoint(const std::string& className, const std::string& name)
{
    return "root/tavrin:" + className + ".Name=\"" + name +
           R"(",SystemCreationClassName="CIM_ComputerSystem",SystemName="tavrin-host.example.net",CreationClassName=")" +
           className + '"';
}

std::string device(const std::string& className, const std::string& id)
{
    return "root/tavrin:" + className +
           R"(.SystemCreationClassName="CIM_ComputerSystem",SystemName="tavrin-host.example.net",CreationClassName=")" +
           className + "\",DeviceID=\"" + id + '"';
}

struct UnitRow
{
    const char* className;
    const char* path; ///< class of the path to it
    const char* port;
    const char* remotePort;
    const char* identifier;
    const char* lun;
};

/// One of each class.
const UnitRow units[] = {
    {"StorageVolume", "StorageVolume", "1000027A51160210", "50063D200110000A", "6063D20000000001000000000000A002",
     "0001000000000000"},
    {"TapeDrive", "TapeDrive", "1000027A51320241", "50063D3002200001", "50063D3002200001", "0000000000000000"},
    {"LogicalDisk", "LogicalDisk", "1000027A51320240", "50063D4003300001", "607A1B00000000030000000000000C71",
     "0002000000000000"},
    {"SCSIArbitraryLogicalUnit", "ArbitraryLogicalUnit", "1000027A51320240", "50063D4003300001", "50063D4003300001",
     "0000000000000000"},
    {"StorageExtent", "StorageExtent", "1000027A51160210", "50063D3002200001", "00063D3002200002", "0001000000000000"},
};

std::vector<std::string> described(Host& host, const std::string& className)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(describe(object));
    return all;
}

TEST(SanModel, EachUnitHasASystemAPathAndAnEndpointThatTheSystemHosts)
{
    Host host;
    for (const UnitRow& row : units)
    {
        const std::string className = std::string("TVRHBA_") + row.className;
        const std::string names = std::string(row.port) + ":" + row.remotePort + ":" + row.lun;
        const std::string target = endpoint("TVRHBA_SCSIProtocolEndpoint", names);
        const std::string unit =
            device(className, std::string(row.port) + "_" + row.remotePort + "_" + row.identifier + "_" + row.lun);
        EXPECT_THAT(described(host, className + "SystemDevice"),
                    Contains("\nGroupComponent = " + computerSystem + "\nPartComponent = " + unit + "\n"))
            << row.className;
        EXPECT_THAT(described(host, std::string("TVRHBA_SCSIInitiatorTarget") + row.path + "Path"),
                    Contains("\nInitiator = " + endpoint("TVRHBA_SCSIProtocolInitiatorEndpoint", row.port) +
                             "\nLogicalUnit = " + unit + "\nTarget = " + target + "\n"))
            << row.className;
        EXPECT_THAT(described(host, "TVRHBA_LocalHostedAccessPoint"),
                    Contains("\nAntecedent = " + computerSystem + "\nDependent = " + target + "\n"));
        EXPECT_THAT(host.instancesOf(className + "SystemDevice"), SizeIs(host.instancesOf(className).size()));
    }
    EXPECT_THAT(host.instancesOf("TVRHBA_LocalHostedAccessPoint"), SizeIs(12));
    host.unload();
}

// --- hosts of one port

constexpr const char* portName = "1000027A000000A0";
constexpr const char* remoteName = "5063D20000000001";

/// One port that sees one target with these units.
std::string hostOf(const std::string& unitList, const std::string& portMembers = {})
{
    return std::string(R"({"targets": [{"name": "t", "wwpn": ")") + remoteName + R"(", "units": [)" + unitList +
           R"(]}], "adapters": [{"name": "Tavrin-A", "serialNumber": "S1", "nodeWwn": "2000027A000000A0", "ports": [
           {"wwpn": ")" +
           portName + R"(", "targets": ["t"])" + portMembers + "}]}]}";
}

constexpr const char* deviceClasses[] = {"TVRHBA_StorageVolume", "TVRHBA_TapeDrive", "TVRHBA_LogicalDisk",
                                         "TVRHBA_SCSIArbitraryLogicalUnit", "TVRHBA_StorageExtent"};

struct TypeRow
{
    unsigned type;
    const char* className;
    const char* elementName;
    const char* typeText; ///< OtherDeviceType, or else DeviceType
};

/// Each unit has its type for its number.
const TypeRow types[] = {
    {0, "TVRHBA_StorageVolume", "Storage Volume: 0", "0"},
    {1, "TVRHBA_TapeDrive", "Tape Drive 1", "1"},
    {2, "TVRHBA_StorageExtent", "Printer 2", "2"},
    {3, "TVRHBA_StorageExtent", "Processor 3", "3"},
    {4, "TVRHBA_StorageExtent", "Write-once device 4", "4"},
    {5, "TVRHBA_StorageExtent", "CD/DVD 5", "5"},
    {6, "TVRHBA_StorageExtent", "Scanner 6", "6"},
    {7, "TVRHBA_StorageExtent", "Optical memory device 7", "7"},
    {8, "TVRHBA_StorageExtent", "Jukebox 8", "8"},
    {9, "TVRHBA_StorageExtent", "Communications device 9", "9"},
    {10, "TVRHBA_StorageExtent", "Unknown device 10", "10"},
    {11, "TVRHBA_StorageExtent", "Unknown device 11", "11"},
    {12, "TVRHBA_SCSIArbitraryLogicalUnit", "Storage array controller 12", "Peripheral devices type is 0x0C"},
    {13, "TVRHBA_SCSIArbitraryLogicalUnit", "Enclosure services 13", "Peripheral devices type is 0x0D"},
    {14, "TVRHBA_StorageVolume", "Storage Volume: 14", "14"},
    {15, "TVRHBA_StorageExtent", "Optical card reader/writer 15", "15"},
    {16, "TVRHBA_SCSIArbitraryLogicalUnit", "Bridge controller 16", "Peripheral devices type is 0x10"},
    {17, "TVRHBA_LogicalDisk", "Object-based storage device: 17", ""},
    {18, "TVRHBA_StorageExtent", "Unknown device 18", "18"},
    {31, "TVRHBA_StorageExtent", "Unknown device 31", "31"},
};

TEST(SanModel, DeviceTypeChoosesTheClassAndTheName)
{
    std::string list;
    for (const TypeRow& row : types)
        list += (list.empty() ? "" : ", ") + ("{\"lun\": " + std::to_string(row.type)) +
                ", \"deviceType\": " + std::to_string(row.type) + "}";
    Host host(hostOf(list));
    std::map<unsigned, std::string> found;
    for (const char* className : deviceClasses)
        for (const broker::Object& object : host.instancesOf(className))
        {
            const std::string name = text(object, "ElementName");
            const auto type = static_cast<unsigned>(std::stoul(name.substr(name.rfind(' '))));
            const broker::Value number = object.get("DeviceType");
            found[type] += std::string(className) + " " + name + " " + text(object, "OtherDeviceType") +
                           (number.isNull() ? "" : std::to_string(number.asUnsigned()));
        }
    for (const TypeRow& row : types)
        EXPECT_EQ(found[row.type], std::string(row.className) + " " + row.elementName + " " + row.typeText);
    EXPECT_THAT(found, SizeIs(std::size(types)));
    host.unload();
}

struct IdentifierRow
{
    const char* designator;
    const char* identifier; ///< in the DeviceID
    const char* name;
    const char* format; ///< NameFormat, NameNamespace, OtherNameFormat, OtherNameNamespace
};

const IdentifierRow identifiers[] = {
    {R"({"type": 0, "value": "0011223344556677"})", "0011223344556677", "0011223344556677", "6 1  Vendor specific"},
    {R"({"type": 1, "value": "00112233445566778899AABB"})", "00112233445566778899AABB", "00112233445566778899AABB",
     "5 4  "},
    {R"({"type": 2, "value": "5011223344556677"})", "5011223344556677", "5011223344556677", "10 3  "},
    // NAA names by their formats; the lengths of the last four are no NAA name's.
    {R"({"type": 3, "value": "1011223344556677"})", "1011223344556677", "223344556677", "9 2  "},
    {R"({"type": 3, "value": "2011223344556677"})", "2011223344556677", "223344556677", "9 2  "},
    {R"({"type": 3, "value": "5011223344556677"})", "5011223344556677", "223344556677", "9 2  "},
    {R"({"type": 3, "value": "60112233445566778899AABBCCDDEEFF"})", "60112233445566778899AABBCCDDEEFF",
     "112233445566778899AABBCCDDEEFF", "9 2  "},
    {R"({"type": 3, "value": "3011223344556677"})", "3011223344556677", "3011223344556677", "9 2  "},
    {R"({"type": 3, "value": "5063D200000000010000"})", "", "D200000000010000", "9 2  "},
    {R"({"type": 3, "value": "3063D200000000010000"})", "", "", "9 2  "},
    {R"({"type": 3, "value": "5063"})", "", "", "9 2  "},
    {R"({"type": 3, "value": "60"})", "", "", "9 2  "},
    {R"({"type": 4, "value": "0000000000000001"})", "0000000000000001", "0000000000000001",
     "1 1 Relative target port identifier Relative target port idientifier"},
    {R"({"type": 5, "value": "5000000000000001"})", "5000000000000001", "5000000000000001",
     "1 1 Target port group Target port group"},
    {R"({"type": 6, "value": "0000000000000001"})", "0000000000000001", "0000000000000001",
     "1 1 Logical port group Logical unit group"},
    {R"({"type": 7, "value": "00112233445566778899AABBCCDDEEFF"})", "00112233445566778899AABBCCDDEEFF",
     "00112233445566778899AABBCCDDEEFF", "1 1 MD5 logical unit identifier MD5 logical unit identifier"},
    {R"({"type": 8, "text": "iqn.x.yz"})", "69716E2E782E797A", "69716E2E782E797A",
     "1 1 SCSI name std::string SCSI name std::string"},
    {R"({"type": 9, "value": "5000000000000001"})", "5000000000000001", "5000000000000001", "- -  "},
    {R"({"type": 15, "value": "5000000000000001"})", "5000000000000001", "5000000000000001", "- -  "},
};

TEST(SanModel, IdentifierGivesTheKeyTheNameAndItsFormat)
{
    std::string list;
    for (std::size_t i = 0; i < std::size(identifiers); i++)
        list += (i ? ", " : "") + ("{\"lun\": " + std::to_string(i)) + ", \"designators\": [" +
                identifiers[i].designator + "]}";
    list += R"(, {"lun": 200})"; // without a page of them
    Host host(hostOf(list));
    const std::vector<broker::Object> volumes = host.instancesOf("TVRHBA_StorageVolume");
    ASSERT_THAT(volumes, SizeIs(std::size(identifiers) + 1));
    for (std::size_t i = 0; i < std::size(identifiers); i++)
    {
        const IdentifierRow& row = identifiers[i];
        const std::string id = text(volumes[i], "DeviceID");
        const std::string start = std::string(portName) + "_" + remoteName + "_" + row.identifier + "_00";
        EXPECT_EQ(id.substr(0, start.size()), start) << row.designator;
        EXPECT_EQ(text(volumes[i], "Name"), row.name) << row.designator;
        std::string format;
        for (const char* property : {"NameFormat", "NameNamespace"})
        {
            const broker::Value value = volumes[i].get(property);
            format += (value.isNull() ? "-" : std::to_string(value.asUnsigned())) + " ";
        }
        format += text(volumes[i], "OtherNameFormat") + " " + text(volumes[i], "OtherNameNamespace");
        EXPECT_EQ(format, row.format) << row.designator;
    }
    EXPECT_EQ(text(volumes.back(), "DeviceID"), std::string(portName) + "_" + remoteName + "__00C8000000000000");
    EXPECT_EQ(host.logged("[TVR_ERR] INVALID Descriptor"), 5u);
    host.unload();
}

struct CapacityRow
{
    const char* unit;
    const char* className;
    const char* blocks; ///< BlockSize, NumberOfBlocks, Capacity, CapacityUnit; "-" where it is null
};

const CapacityRow capacities[] = {
    {R"("blocks": 1)", "TVRHBA_StorageVolume", "512 1 512 Byte"},
    {R"("blocks": 4294967295, "blockLength": 4096)", "TVRHBA_StorageVolume", "4096 4294967295 17592186040320 Byte"},
    {R"("lun": 0)", "TVRHBA_StorageVolume", "- - - -"},
    {R"("blocks": 8, "blockLength": 0)", "TVRHBA_StorageVolume", "- - - -"},
    {R"("deviceType": 1, "blocks": 8)", "TVRHBA_TapeDrive", "- - 4096 Byte"},
    {R"("deviceType": 17, "blocks": 8)", "TVRHBA_LogicalDisk", "512 8 4096 Byte"},
    {R"("deviceType": 17)", "TVRHBA_LogicalDisk", "- - - -"},
    {R"("deviceType": 13, "blocks": 8)", "TVRHBA_SCSIArbitraryLogicalUnit", "- - - -"},
    {R"("deviceType": 5, "blocks": 8)", "TVRHBA_StorageExtent", "512 8 4096 Byte"},
};

TEST(SanModel, CapacityIsThatOfUnitsThatTellBothOfItsFactors)
{
    for (const CapacityRow& row : capacities)
    {
        Host host(hostOf(std::string(R"({"lun": 0, )") + row.unit + "}"));
        const std::vector<broker::Object> objects = host.instancesOf(row.className);
        ASSERT_THAT(objects, SizeIs(1)) << row.unit;
        std::string blocks;
        for (const char* property : {"BlockSize", "NumberOfBlocks", "Capacity"})
        {
            const broker::Value value = objects[0].get(property);
            blocks += (value.isNull() ? "-" : std::to_string(value.asUnsigned())) + " ";
        }
        const std::string unit = text(objects[0], "CapacityUnit");
        EXPECT_EQ(blocks + (unit.empty() ? "-" : unit), row.blocks) << row.unit;
        host.unload();
    }
}

struct AnswerRow
{
    const char* fault;
    const char* description;
    const char* identifier;
    const char* capacity;
};

/// Calls of a unit's discovery: Inquiry, its pages 0x80 and 0x83, and Read Capacity.
TEST(SanModel, WhatAUnitDoesNotAnswerStaysUnknown)
{
    constexpr const char* full = "V        P                Revision R    Serial Number SN1";
    const AnswerRow rows[] = {
        {R"({"function": "HBA_SendScsiInquiry", "status": 1, "to": 1})",
         "Unknown Unknown Revision Unkn Serial Number SN1", "5011223344556677", "4096"},
        {R"({"function": "HBA_SendScsiInquiry", "status": 1, "from": 2, "to": 2})",
         "V        P                Revision R    Serial Number Unknown", "5011223344556677", "4096"},
        {R"({"function": "HBA_SendScsiInquiry", "status": 1, "from": 3})", full, "", "4096"},
        {R"({"function": "HBA_SendReadCapacity", "status": 1})", full, "5011223344556677", ""},
        {R"({"function": "LRM_GetOASLunList", "status": 1})", full, "5011223344556677", "4096"},
    };
    for (const AnswerRow& row : rows)
    {
        Host host(hostOf(R"({"lun": 300, "vendor": "V", "product": "P", "revision": "R", "serialNumber": "SN1",
                             "blocks": 8, "designators": [{"value": "5011223344556677"}]})"));
        host.addFault(row.fault);
        const std::vector<broker::Object> volumes = host.instancesOf("TVRHBA_StorageVolume");
        ASSERT_THAT(volumes, SizeIs(1)) << row.fault;
        EXPECT_EQ(text(volumes[0], "Description"), row.description) << row.fault;
        EXPECT_EQ(text(volumes[0], "DeviceID"),
                  std::string(portName) + "_" + remoteName + "_" + row.identifier + "_412C000000000000")
            << row.fault;
        const broker::Value capacity = volumes[0].get("Capacity");
        EXPECT_EQ(capacity.isNull() ? "" : std::to_string(capacity.asUnsigned()), row.capacity) << row.fault;
        host.unload();
    }
}

// --- what the log says

/// The lines from the beginning of the SAN maps' refresh to its clean end, without those of the reader that waits.
std::vector<std::string> sanLines(Host& host)
{
    std::vector<std::string> lines = host.log();
    lines.erase(lines.begin(), std::ranges::find(lines, "[TVR_DBG] PERF: updateSANMaps: Entry"));
    const auto end = std::ranges::find(lines, "[TVR_DBG] PERF: updateSANMaps: cleanExit");
    lines.erase(std::ranges::next(end, 1, lines.end()), lines.end());
    std::erase(lines, created);
    return lines;
}

TEST(SanModel, RefreshSaysWhatItDoes)
{
    Host host(hostOf(R"({"lun": 0, "designators": [{"value": "5011223344556677"}]}, {"lun": 1, "deviceType": 1},
                        {"lun": 2, "deviceType": 17}, {"lun": 3, "deviceType": 12}, {"lun": 4, "deviceType": 5})"));
    host.instancesOf("TVRHBA_StorageVolume");
    ASSERT_TRUE(host.awaitRefresh());
    constexpr const char* point = "[TVR_DBG] Generating TVRHBA_LocalHostedAccessPoint (Local Hosted Access Point "
                                  "1000027A000000A0:5063D20000000001:000";
    EXPECT_THAT(
        sanLines(host),
        ElementsAre(
            "[TVR_DBG] PERF: updateSANMaps: Entry", "[TVR_DBG] PERF: Entered clearSANMaps()", testing::_,
            "[TVR_DBG] Tavrin-A", "[TVR_DBG] Creating classes for port 0.",
            "[TVR_DBG] Creating classes for target 0 of 5.", std::string(point) + "0000000000000)",
            "[TVR_DBG] Target 0 is of type 0.",
            "[TVR_DBG] Generating TVRHBA_StorageVolumeSystemDevice (Storage Volume: "
            "1000027A000000A0_5063D20000000001_5011223344556677_0000000000000000)",
            "[TVR_DBG] creating TVRHBA_SCSIInitiatorTargetStorageVolumePath - Storage Volume",
            "[TVR_DBG] Creating classes for target 1 of 5.", std::string(point) + "1000000000000)",
            "[TVR_DBG] Target 1 is of type 1.", "[TVR_ERR] INVALID Descriptor",
            "[TVR_DBG] Generating TVRHBA_TapeDriveSystemDevice (Tape Drive: "
            "1000027A000000A0_5063D20000000001__0001000000000000)",
            "[TVR_DBG] creating TVRHBA_SCSIInitiatorTargetTapeDrivePath - Tape Drive",
            "[TVR_DBG] Creating classes for target 2 of 5.", std::string(point) + "2000000000000)",
            "[TVR_DBG] Target 2 is of type 17.", "[TVR_ERR] INVALID Descriptor",
            "[TVR_DBG] Generating TVRHBA_LogicalDiskSystemDevice (Logical Disk: "
            "1000027A000000A0_5063D20000000001__0002000000000000)",
            "[TVR_DBG] creating TVRHBA_SCSIInitiatorTargetLogicalDiskPath - Logical Disk",
            "[TVR_DBG] Creating classes for target 3 of 5.", std::string(point) + "3000000000000)",
            "[TVR_DBG] Target 3 is of type 12.", "[TVR_ERR] INVALID Descriptor",
            "[TVR_DBG] Generating TVRHBA_SCSIArbitraryLogicalUnitSystemDevice (SCSI Arbitrary Logical Unit: "
            "1000027A000000A0_5063D20000000001__0003000000000000)",
            "[TVR_DBG] creating TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath - SCSI Arbitrary Logical Unit",
            "[TVR_DBG] Creating classes for target 4 of 5.", std::string(point) + "4000000000000)",
            "[TVR_DBG] Target 4 is of type 5.", "[TVR_ERR] INVALID Descriptor",
            "[TVR_DBG] Generating TVRHBA_StorageExtentSystemDevice (Storage Extent: "
            "1000027A000000A0_5063D20000000001__0004000000000000)",
            "[TVR_DBG] creating TVRHBA_SCSIInitiatorTargetStorageExtentPath - Storage Extent",
            "[TVR_DBG] Set content: 1000027A000000A0|5063D20000000001",
            "[TVR_DBG] Found the FCPort Instance: 1000027A000000A0", "[TVR_DBG] SerialNumber + Sub-AdapterID: S1",
            "[TVR_DBG] Chip Tag: S1", "[TVR_DBG] TVR_MethodWrapper::GetOASLunList",
            "[TVR_DBG] Entering TVR_MethodWrapper::Id2HBAName", testing::_, testing::_, testing::_, testing::_,
            testing::_, testing::_, testing::_, testing::_, testing::_, testing::_, testing::_,
            "[TVR_DBG] RM_GetOASLunList error.", "[TVR_DBG] Exit GetOASLunList",
            "[TVR_DBG] Status: <2>:The operation is not supported",
            "[TVR_WARN] GetOASLunList failed. Unsupported Hardware", "[TVR_DBG] PERF: updateSANMaps: cleanExit"));
    host.unload();
}

TEST(SanModel, HostsWithNothingBehindThemHaveNoEntriesToScan)
{
    for (const std::string& scenario : {std::string("empty"), hostOf("")})
    {
        Host host(scenario);
        for (const char* className : deviceClasses)
            EXPECT_TRUE(host.instancesOf(className).empty());
        ASSERT_TRUE(host.awaitRefresh());
        EXPECT_EQ(host.logged("[TVR_WARN] No entries in the set"), 1u);
        EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateSANMaps: cleanExit"), 1u);
        EXPECT_EQ(host.calls("LRM_GetOASLunList"), 0u);
        host.unload();
    }
}

// --- priority lanes

struct LaneRow
{
    const char* portMembers;
    const char* fault;
    unsigned capability;
    const char* line;
};

TEST(SanModel, ChipsHavePriorityLanesWhereTheirPortsTellOfThem)
{
    const LaneRow rows[] = {
        {R"(, "priorityLanes": [{"target": "t", "lun": 1}])", "", 1, "[TVR_DBG] PrioLane State: 1"},
        {R"(, "priorityLanes": [])", "", 1, "[TVR_DBG] Exit GetOASLunList"},
        {"", "", 0, "[TVR_WARN] GetOASLunList failed. Unsupported Hardware"},
        {R"(, "priorityLanes": [])", R"({"function": "LRM_GetOASLunList", "status": 251})", 0,
         "[TVR_WARN] GetOASLunList failed."},
        {R"(, "priorityLanes": [])", R"({"function": "LRM_GetOASLunList", "status": 1})", 0,
         "[TVR_DBG] RM_GetOASLunList error."},
        {R"(, "priorityLanes": [{"target": "t", "lun": 1}])",
         R"({"function": "LRM_GetOASLunList", "hostile": "hugeCount"})", 1, "[TVR_DBG] PrioLane Lun: 1"},
    };
    for (const LaneRow& row : rows)
    {
        Host host(hostOf(R"({"lun": 1}, {"lun": 2})", row.portMembers));
        if (*row.fault)
            host.addFault(row.fault);
        host.instancesOf("TVRHBA_StorageVolume");
        const std::vector<broker::Object> chips = host.instancesOf("TVRHBA_Chip");
        ASSERT_THAT(chips, SizeIs(1));
        EXPECT_EQ(chips[0].get("PrioLaneCapability").asUnsigned(), row.capability) << row.portMembers << row.fault;
        EXPECT_THAT(host.log(), Contains(row.line));
        EXPECT_EQ(host.logged("[TVR_WARN] GetOASLunList"), row.line[5] == 'W' ? 1u : 0u)
            << "one call for both units of the target";
        host.unload();
    }
}

TEST(SanModel, OnlyTheChipWithLanesIsMarkedAndStaysTheEndThatItWas)
{
    Host host(R"({"targets": [{"name": "t", "wwpn": "5063D20000000001", "units": [{"lun": 0}]}], "adapters": [
        {"name": "A", "serialNumber": "S1", "attributes": {"subadapterId": "2"},
         "ports": [{"wwpn": "1000027A000000A0", "targets": ["t"]}]},
        {"name": "B", "serialNumber": "S2",
         "ports": [{"wwpn": "1000027A000000B0", "targets": ["t"], "priorityLanes": []}]},
        {"name": "C", "serialNumber": "S3", "attributes": {"subadapterId": "4"},
         "ports": [{"wwpn": "1000027A000000C0", "targets": ["t"], "priorityLanes": []}]}]})");
    EXPECT_THAT(host.instancesOf("TVRHBA_StorageVolume"), SizeIs(3));
    std::string chips;
    for (const broker::Object& chip : host.instancesOf("TVRHBA_Chip"))
        chips += text(chip, "Tag") + "=" + std::to_string(chip.get("PrioLaneCapability").asUnsigned()) + " ";
    EXPECT_EQ(chips, "S1:2=0 S2=1 S3:4=1 ");
    EXPECT_EQ(host.calls("LRM_GetOASLunList"), 5u) << "two have lists of the stored configuration";
    host.unload();
}

// --- refreshes that end early

TEST(SanModel, UnitThatIsSeenTwiceByOnePortEndsTheRefreshThere)
{
    // A library that maps the units of the whole adapter to each of its ports.
    Host host("multiport");
    EXPECT_THAT(host.instancesOf("TVRHBA_StorageVolume"), SizeIs(1)) << "the maps as they stood";
    EXPECT_THAT(host.instancesOf("TVRHBA_SCSIProtocolEndpoint"), SizeIs(1));
    EXPECT_THAT(host.instancesOf("TVRHBA_SCSIInitiatorTargetStorageVolumePath"), SizeIs(1));
    EXPECT_EQ(host.logged("[TVR_CRIT] Insert Failed : m_TVRHBA_SCSIProtocolEndpoint_map"), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] Set content"), 0u) << "no scan";
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateSANMaps: cleanExit"), 0u);
    host.unload();
}

TEST(SanModel, PortWithoutInitiatorEndpointEndsTheRefresh)
{
    Host host;
    setHostNames({.resolving = [] { throw std::runtime_error("no resolver today"); }});
    EXPECT_TRUE(host.instancesOf("TVRHBA_StorageVolume").empty());
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_GE(host.logged("[TVR_ERR] Could not find TVRHBA_SCSIProtocolEndpoint Initiator instance."), 1u);
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateSANMaps: cleanExit"), 0u);
    setHostNames({});
    EXPECT_THAT(host.instancesOf("TVRHBA_Card"), SizeIs(2)); // the next request makes up for it
    EXPECT_THAT(host.instancesOf("TVRHBA_StorageVolume"), SizeIs(6));
    host.unload();
}

// --- refreshes as a reader sees them

TEST(SanModel, ReadersOfTheFabricAskForItAndSeeWhatHasChanged)
{
    stopClock();
    Host host;
    host.write(settingsFile, "TVR_PROVIDER_REFRESH_SANDATA = FALSE");
    EXPECT_THAT(host.instancesOf("TVRHBA_Card"), SizeIs(2));
    ASSERT_TRUE(host.awaitRefresh());
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateSANMaps: Entry"), 0u);
    EXPECT_THAT(host.instancesOf("TVRHBA_StorageVolume"), SizeIs(6));
    ASSERT_TRUE(host.awaitRefresh(2));
    EXPECT_THAT(host.instancesOf("TVRHBA_TapeDrive"), SizeIs(2));
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateSANMaps: Entry"), 1u) << "one refresh is for all classes";

    // A fabric that has changed is seen when the cache has timed out and somebody asks for a class of it.
    host.addFault(R"({"function": "HBA_GetFcpTargetMapping", "subject": "Tavrin-TV3202-1", "status": 1})");
    advanceClock(10min);
    EXPECT_THAT(host.instancesOf("TVRHBA_Card"), SizeIs(2));
    EXPECT_TRUE(test_support::eventually([&] { return host.instancesOf("TVRHBA_StorageVolume").size() == 3; }));
    EXPECT_THAT(host.instancesOf("TVRHBA_LogicalDisk"), SizeIs(0));
    EXPECT_THAT(host.instancesOf("TVRHBA_LocalHostedAccessPoint"), SizeIs(7));
    host.unload();
}

} // namespace
