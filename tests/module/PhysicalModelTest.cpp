// The hardware as a client sees it: product, port group, card, chip and connector, and their associations.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::Each;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

/// The texts of one property over all instances of a class.
std::vector<std::string> texts(Host& host, const std::string& className, const std::string& property)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(text(object, property));
    return all;
}

// --- paths of the default host's objects

const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";
const std::string chassis = R"(root/tavrin:CIM_Chassis.Tag="TVR HBA:Chassis",CreationClassName="CIM_Chassis")";
const std::string providerIdentity =
    R"(root/tavrin:TVRHBA_SoftwareIdentity.InstanceID="Tavrin CMPI HBA Provider v10.2.261-13")";
const std::string products[] = {
    R"(root/tavrin:TVRHBA_Product.Name="TV1602",IdentifyingNumber="TV16A02417",Vendor="Tavrin Corporation",Version="00000006")",
    R"(root/tavrin:TVRHBA_Product.Name="TV3202",IdentifyingNumber="TV32B71155",Vendor="Tavrin Corporation",Version="0000000C")",
};

std::string physical(const std::string& className, const std::string& tag)
{
    return "root/tavrin:" + className + ".Tag=\"" + tag + "\",CreationClassName=\"" + className + "\"";
}
std::string profile(const std::string& name)
{
    return "root/pg_interop:TVRHBA_RegisteredProfile.InstanceID=\"TVR:" + name + "\"";
}
std::string pciDevice(const std::string& id)
{
    return "root/tavrin:TVRHBA_PCIDevice.SystemCreationClassName=\"CIM_ComputerSystem\","
           "SystemName=\"tavrin-host.example.net\",CreationClassName=\"TVRHBA_PCIDevice\",DeviceID=\"" +
           id + "\"";
}
std::string portGroup(const std::string& wwn)
{
    return "root/tavrin:TVRHBA_LogicalPortGroup.InstanceID=\"TVR FC HBA:" + wwn + "\"";
}

const std::string cards[] = {physical("TVRHBA_Card", "TV16A02417"), physical("TVRHBA_Card", "TV32B71155")};
const std::string chips[] = {physical("TVRHBA_Chip", "TV16A02417"), physical("TVRHBA_Chip", "TV32B71155")};
const std::string connectors[] = {
    physical("TVRHBA_PhysicalConnector", "1000027A51160210"), physical("TVRHBA_PhysicalConnector", "1000027A51160211"),
    physical("TVRHBA_PhysicalConnector", "1000027A51320240"), physical("TVRHBA_PhysicalConnector", "1000027A51320241")};
const std::string devices[] = {pciDevice("1000027A51160210:0xE200"), pciDevice("1000027A51160211:0xE200"),
                               pciDevice("1000027A51320240:0x7410"), pciDevice("1000027A51320241:0x7410")};

// --- instances

struct InstanceRow
{
    const char* className;
    const char* key;   ///< a property that tells the instance
    const char* value; ///< and its text
    const char* properties;
};

/// The second function of the first card, and what it shares with the first.
const InstanceRow secondAdapter[] = {
    {"TVRHBA_Product", "IdentifyingNumber", "TV16A02417", R"(
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
ElementName = "Tavrin TV1602 FV11.4.210.8 DV12.0.0.1"
IdentifyingNumber = "TV16A02417"
Name = "TV1602"
Vendor = "Tavrin Corporation"
Version = "00000006"
)"},
    {"TVRHBA_LogicalPortGroup", "Name", "2000027A51160211", R"(
Description = "The Fibre Channel ports of the HBA."
ElementName = "TV16A02417"
InstanceID = "TVR FC HBA:2000027A51160211"
Name = "2000027A51160211"
NameFormat = "WWN"
)"},
    {"TVRHBA_Card", "Tag", "TV16A02417", R"(
CanBeFRUed = true
CreationClassName = "TVRHBA_Card"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
DeviceID = 57856
ElementName = "TVR FCHBA:TV1602:TV16A02417"
HostingBoard = false
Manufacturer = "Tavrin Corporation"
Model = "TV1602"
ModelID = 1602
Name = "TV1602"
OtherIdentifyingInfo = "TV16A02417"
PackageType = 9
PartNumber = "TV1602"
RemovalConditions = 2
SKU = ""
SLIMode = 3
SerialNumber = "TV16A02417"
TVRSerialNumber = "TV16A02417"
Tag = "TV16A02417"
UserTracking = "RACK 12 SLOT 3"
VendorEquipmentType = "TV1602-M8"
VendorSpecID = 3791658362
Version = "00000006"
)"},
    {"TVRHBA_Chip", "Tag", "TV16A02417", R"(
BoardTemperature = 47
CreationClassName = "TVRHBA_Chip"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
ElementName = "TVR HBA ASIC:TV1602:TV16A02417"
Manufacturer = "Tavrin Corporation"
Model = "TV1602"
Name = "TV1602"
PrioLaneCapability = 0
RemovalConditions = 2
SerialNumber = "TV16A02417"
SubAdapterId = ""
Tag = "TV16A02417"
TemperatureUnit = "Celsius"
ThresholdCriticalTemp = 95
ThresholdWarningTemp = 85
)"},
    {"TVRHBA_PhysicalConnector", "Tag", "1000027A51160211", R"(
ConnectorLayout = 12
CreationClassName = "TVRHBA_PhysicalConnector"
Description = "Tavrin TV1602 8Gb 2-port PCIe Fibre Channel Adapter"
ElementName = "TVR HBA Port:TV16A02417:Network Connector:1"
InstanceID = "TV16A02417:1"
Manufacturer = "Tavrin Corporation"
Model = "TV1602"
Name = "1000027A51160211"
OtherIdentifyingInfo = "LocalPhysicalPort:1,Transceiver:SFP"
SerialNumber = "TV16A02417"
Tag = "1000027A51160211"
)"},
};

TEST(PhysicalModel, InstancesHaveThesePropertiesAndNoOthers)
{
    Host host;
    for (const InstanceRow& row : secondAdapter)
        EXPECT_EQ(describe(theOne(host, row.className, row.key, row.value)), row.properties) << row.className;
    host.unload();
}

// --- associations

using Ends = std::vector<std::pair<std::string, std::string>>;

struct AssociationRow
{
    const char* className;
    const char* firstRole;
    const char* secondRole;
    Ends ends;
    std::string more = {}; ///< a property beside the two references
};

const AssociationRow associations[] = {
    {"TVRHBA_HostedCollection",
     "Antecedent",
     "Dependent",
     {{computerSystem, portGroup("2000027A51160210")},
      {computerSystem, portGroup("2000027A51160211")},
      {computerSystem, portGroup("2000027A51320240")},
      {computerSystem, portGroup("2000027A51320241")}}},
    {"TVRHBA_ProductPhysicalComponent",
     "GroupComponent",
     "PartComponent",
     {{products[0], cards[0]}, {products[1], cards[1]}}},
    {"TVRHBA_ProviderElementSoftwareIdentity",
     "Antecedent",
     "Dependent",
     {{providerIdentity, cards[0]}, {providerIdentity, cards[1]}},
     "ElementSoftwareStatus = {2, 6}\n"},
    {"TVRHBA_CardConformsToProfile",
     "ConformantStandard",
     "ManagedElement",
     {{profile("Physical Asset"), cards[0]}, {profile("Physical Asset"), cards[1]}}},
    {"TVRHBA_ChassisContainsCard", "GroupComponent", "PartComponent", {{chassis, cards[0]}, {chassis, cards[1]}}},
    {"TVRHBA_CardContainsChip", "GroupComponent", "PartComponent", {{cards[0], chips[0]}, {cards[1], chips[1]}}},
    {"TVRHBA_ProductPhysicalConnector",
     "GroupComponent",
     "PartComponent",
     {{products[0], connectors[0]},
      {products[0], connectors[1]},
      {products[1], connectors[2]},
      {products[1], connectors[3]}}},
    {"TVRHBA_CardContainsConnector",
     "GroupComponent",
     "PartComponent",
     {{cards[0], connectors[0]}, {cards[0], connectors[1]}, {cards[1], connectors[2]}, {cards[1], connectors[3]}}},
    {"TVRHBA_ConnectorDependsOnChip",
     "Antecedent",
     "Dependent",
     {{connectors[0], chips[0]}, {connectors[1], chips[0]}, {connectors[2], chips[1]}, {connectors[3], chips[1]}}},
    {"TVRHBA_PCIElementConformsToProfile",
     "ConformantStandard",
     "ManagedElement",
     {{profile("PCI Device"), devices[0]},
      {profile("PCI Device"), devices[1]},
      {profile("PCI Device"), devices[2]},
      {profile("PCI Device"), devices[3]}}},
    {"TVRHBA_SystemDevice",
     "GroupComponent",
     "PartComponent",
     {{computerSystem, devices[0]},
      {computerSystem, devices[1]},
      {computerSystem, devices[2]},
      {computerSystem, devices[3]}}},
};

TEST(PhysicalModel, AssociationsJoinTheseInstances)
{
    setHostNames({});
    Host host;
    for (const AssociationRow& row : associations)
    {
        std::vector<std::string> expected, actual;
        for (const auto& [first, second] : row.ends)
            expected.push_back(std::string("\n") + row.firstRole + " = " + first + "\n" + row.secondRole + " = " +
                               second + "\n" + row.more);
        for (const broker::Object& object : host.instancesOf(row.className))
            actual.push_back(describe(object));
        EXPECT_EQ(actual, expected) << row.className;
    }

    // One for each installation service and chip.
    const std::size_t services = host.instancesOf("TVRHBA_SoftwareInstallationService").size();
    const std::vector<broker::Object> affects = host.instancesOf("TVRHBA_InstallServiceAffectsChip");
    EXPECT_THAT(affects, SizeIs(2 * services));
    for (const broker::Object& object : affects)
        EXPECT_THAT(describe(object), testing::HasSubstr("ElementEffects = {5}\n"));
    host.unload();
}

TEST(PhysicalModel, AssociatorsLeadFromCardToChip)
{
    Host host;
    const broker::Object card = theOne(host, "TVRHBA_Card", "Tag", "TV32B71155");
    const broker::Reply reply = host.broker().associators(card.path, {.assocClass = "TVRHBA_CardContainsChip"});
    ASSERT_THAT(reply.objects, SizeIs(1)) << reply.message;
    EXPECT_EQ(text(reply.objects[0], "ElementName"), "TVR HBA ASIC:TV3202:TV32B71155");
    host.unload();
}

// --- shared hardware

TEST(PhysicalModel, IndexCountsTheAdaptersOfTheModel)
{
    Host host("mixed");
    EXPECT_THAT(texts(host, "TVRHBA_PCIDevice", "ElementName"), ElementsAre("Tavrin:FCAdapter0", "Tavrin:FCAdapter1"));
    EXPECT_THAT(texts(host, "TVRHBA_Card", "Tag"), ElementsAre("TV32M00001", "TV16M00001"));
    EXPECT_THAT(texts(host, "TVRHBA_PhysicalConnector", "Tag"), ElementsAre("1000027A51AA0002", "1000027A51AA0008"));
    host.unload();
}

TEST(PhysicalModel, SubAdaptersHaveChipsOfTheirOwnOnOneCard)
{
    Host host("subadapter");
    EXPECT_THAT(texts(host, "TVRHBA_Card", "Tag"), ElementsAre("TV64S00031"));
    EXPECT_THAT(texts(host, "TVRHBA_Product", "IdentifyingNumber"), ElementsAre("TV64S00031"));
    EXPECT_THAT(texts(host, "TVRHBA_Chip", "Tag"), ElementsAre("TV64S00031:1", "TV64S00031:2"));
    EXPECT_THAT(texts(host, "TVRHBA_Chip", "SubAdapterId"), ElementsAre("1", "2"));
    EXPECT_THAT(texts(host, "TVRHBA_Chip", "SerialNumber"), Each("TV64S00031"));
    EXPECT_THAT(texts(host, "TVRHBA_PCIDevice", "ElementName"),
                ElementsAre("Tavrin:FCAdapter0", "Tavrin:FCAdapter1", "Tavrin:FCAdapter2", "Tavrin:FCAdapter3"));

    std::vector<std::string> chipOfConnector;
    for (const broker::Object& object : host.instancesOf("TVRHBA_ConnectorDependsOnChip"))
        chipOfConnector.push_back(object.get("Antecedent").asPath().key("Tag")->asString() + " on " +
                                  object.get("Dependent").asPath().key("Tag")->asString());
    EXPECT_THAT(chipOfConnector, ElementsAre("1000027A51640400 on TV64S00031:1", "1000027A51640401 on TV64S00031:1",
                                             "1000027A51640402 on TV64S00031:2", "1000027A51640403 on TV64S00031:2"));
    EXPECT_THAT(host.instancesOf("TVRHBA_CardContainsChip"), SizeIs(2));
    EXPECT_EQ(host.logged("[TVR_DBG] Card is created. Creating the associations"), 1u);
    host.unload();
}

/// A host of one adapter without attributes that a test does not name.
std::string oneAdapter(const std::string& members, const std::string& ports)
{
    return R"({"adapters": [{"name": "Tavrin-TV1602-1", "serialNumber": "S1", "model": "TV1602", )" + members +
           R"("ports": [)" + ports + "]}]}";
}

TEST(PhysicalModel, TemperatureIsNullWhenTheBoardGivesNone)
{
    const std::string port = R"({"wwpn": "10:00:00:00:00:00:00:01"})";
    {
        Host host(oneAdapter(R"("temperature": {"board": 0, "warning": 85, "critical": 95}, )", port));
        const broker::Object chip = theOne(host, "TVRHBA_Chip", "Tag", "S1");
        for (const char* name : {"BoardTemperature", "ThresholdCriticalTemp", "ThresholdWarningTemp"})
            EXPECT_TRUE(chip.get(name).isNull()) << name;
        EXPECT_EQ(text(chip, "TemperatureUnit"), "Celsius");
        host.unload();
    }
    Host host(oneAdapter(R"("temperature": {"board": 1, "warning": 255, "critical": 0}, )", port));
    const broker::Object chip = theOne(host, "TVRHBA_Chip", "Tag", "S1");
    EXPECT_EQ(chip.get("BoardTemperature").asUnsigned(), 1u);
    EXPECT_EQ(chip.get("ThresholdCriticalTemp").asUnsigned(), 0u);
    EXPECT_EQ(chip.get("ThresholdWarningTemp").asUnsigned(), 255u);
    host.unload();
}

TEST(PhysicalModel, FunctionsOfOneNodeShareTheirPortGroup)
{
    Host host(R"({"adapters": [
        {"name": "a", "serialNumber": "S1", "model": "M", "nodeWwn": "20:00:00:00:00:00:00:0a",
         "ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]},
        {"name": "b", "serialNumber": "S1", "model": "M", "nodeWwn": "20:00:00:00:00:00:00:0a",
         "ports": [{"wwpn": "10:00:00:00:00:00:00:02"}]}]})");
    EXPECT_THAT(texts(host, "TVRHBA_LogicalPortGroup", "InstanceID"), ElementsAre("TVR FC HBA:200000000000000A"));
    EXPECT_THAT(texts(host, "TVRHBA_Card", "Tag"), ElementsAre("S1"));
    EXPECT_THAT(texts(host, "TVRHBA_Chip", "Tag"), ElementsAre("S1"));
    EXPECT_THAT(host.instancesOf("TVRHBA_HostedCollection"), SizeIs(1));
    EXPECT_THAT(host.instancesOf("TVRHBA_PhysicalConnector"), SizeIs(2));
    EXPECT_THAT(host.instancesOf("TVRHBA_PCIDevice"), SizeIs(2));
    host.unload();
}

TEST(PhysicalModel, ConnectorsOfOneAdapterAreNamedAfterTheirPorts)
{
    Host host("multiport");
    host.write("/etc/tavrin_fc_provider.conf", "TVR_PROVIDER_REFRESH_SANDATA = FALSE");
    EXPECT_THAT(texts(host, "TVRHBA_PCIDevice", "DeviceID"),
                ElementsAre("1000027A51320D00:0x7410", "1000027A51320D01:0x7410"));
    for (const char* property : {"Tag", "Name"})
        EXPECT_THAT(texts(host, "TVRHBA_PhysicalConnector", property),
                    ElementsAre("1000027A51320D00", "1000027A51320D01"));
    for (const char* association :
         {"TVRHBA_ProductPhysicalConnector", "TVRHBA_CardContainsConnector", "TVRHBA_ConnectorDependsOnChip"})
        EXPECT_THAT(host.instancesOf(association), SizeIs(2)) << association;
    EXPECT_THAT(
        logAbout(host, {"Creating classes for port", "Card is created", "Insert Failed", "Instances failed"}),
        ElementsAre("[TVR_DBG] Creating classes for port 0.", "[TVR_DBG] Card is created. Creating the associations",
                    "[TVR_DBG] Creating classes for port 1.", "[TVR_DBG] Card is created. Creating the associations",
                    "[TVR_CRIT] Insert Failed : m_TVRHBA_ProductPhysicalComponent_map"));
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateAdapterMaps: cleanExit"), 1u);
    host.unload();
}

TEST(PhysicalModel, HostWithoutAdaptersHasNoHardware)
{
    Host host("empty");
    for (const char* className : {"TVRHBA_Product", "TVRHBA_LogicalPortGroup", "TVRHBA_Card", "TVRHBA_Chip",
                                  "TVRHBA_PCIDevice", "TVRHBA_PhysicalConnector", "TVRHBA_SoftwareIdentity",
                                  "TVRHBA_ProviderConfigSetting", "TVRHBA_ProviderUseOfLog"})
        EXPECT_THAT(host.instancesOf(className), IsEmpty()) << className;
    EXPECT_THAT(host.instancesOf("TVRHBA_RecordLog"), SizeIs(1));
    EXPECT_THAT(host.instancesOf("TVRHBA_RecordLogCapabilities"), SizeIs(1));
    EXPECT_THAT(logAbout(host, {"up-call method to get the chassis", "No FC card", "FC_CreateDumpClasses",
                                "Driver Parameter fetching", "Missing Provider", "Create the Diagnostic classes"}),
                ElementsAre("[TVR_DBG] up-call method to get the chassis is failed", "[TVR_DBG] No FC card found",
                            "[TVR_DBG] Missing Provider Software Identity"));
    host.unload();
}

TEST(PhysicalModel, CleanRefreshEndsWithTheseLines)
{
    Host host;
    host.instancesOf("TVRHBA_Card");
    EXPECT_THAT(logAbout(host, {"updateAdapterMaps: ", "Driver Parameter fetching", "Calling FC_CreateDumpClasses",
                                "uses log", "Create the Diagnostic classes"}),
                ElementsAre("[TVR_DBG]  updateAdapterMaps: Entry", "[TVR_DBG] Done with the Driver Parameter fetching",
                            "[TVR_DBG] Calling FC_CreateDumpClasses", testing::_, testing::_,
                            "[TVR_DBG] Create the Diagnostic classes", "[TVR_DBG] PERF: updateAdapterMaps: cleanExit"));
    host.unload();
}

} // namespace
