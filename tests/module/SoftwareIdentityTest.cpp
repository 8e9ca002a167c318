// The software of the adapters: the driver, and per port what its adapter reports.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::Contains;
using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

constexpr const char* provider = "Tavrin CMPI HBA Provider v10.2.261-13";
const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";

std::string identity(const std::string& id)
{
    return "root/tavrin:TVRHBA_SoftwareIdentity.InstanceID=\"" + id + "\"";
}

std::string device(const std::string& className, const std::string& id)
{
    return "root/tavrin:" + className +
           ".SystemCreationClassName=\"CIM_ComputerSystem\","
           "SystemName=\"tavrin-host.example.net\",CreationClassName=\"" +
           className + "\",DeviceID=\"" + id + "\"";
}

std::string service(const std::string& className, const std::string& name)
{
    return "root/tavrin:" + className + ".Name=\"" + name +
           "\",SystemCreationClassName=\"CIM_ComputerSystem\","
           "SystemName=\"tavrin-host.example.net\",CreationClassName=\"" +
           className + "\"";
}

std::vector<std::string> ids(Host& host)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf("TVRHBA_SoftwareIdentity"))
        all.push_back(text(object, "InstanceID"));
    return all;
}

/// The ends of the associations of a class with an identity, as "ID -> rest of the description".
std::vector<std::string> described(Host& host, const std::string& className)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(describe(object));
    return all;
}

// Cards of device id 0xE200 tell of kernel, boot BIOS and stubs, and have none.
const char* const defaultIds[] = {
    provider,
    "TVR FC HBA: Driver tvrfc v12.0.0.1",
    "TVR FC HBA: Operational Firmware v11.4.210.8 TV1602:1000027A51160210",
    "TVR FC HBA: Firmware On Flash v11.4.210.8 TV1602:1000027A51160210",
    "TVR FC HBA: Universal Boot Image v11.4.204.11 TV1602:1000027A51160210",
    "TVR FC HBA: x86 Boot BIOS v11.4.204.2 TV1602:1000027A51160210",
    "TVR FC HBA: EFI Boot Image v11.4.204.0 TV1602:1000027A51160210",
    "TVR FC HBA: FCode Boot Image v4.05a8 TV1602:1000027A51160210",
    "TVR FC HBA: Initial Firmware v1.40a3 TV1602:1000027A51160210",
    "TVR FC HBA: Operational Firmware v11.4.210.8 TV1602:1000027A51160211",
    "TVR FC HBA: Firmware On Flash v11.4.210.8 TV1602:1000027A51160211",
    "TVR FC HBA: Universal Boot Image v11.4.204.11 TV1602:1000027A51160211",
    "TVR FC HBA: x86 Boot BIOS v11.4.204.2 TV1602:1000027A51160211",
    "TVR FC HBA: EFI Boot Image v11.4.204.0 TV1602:1000027A51160211",
    "TVR FC HBA: FCode Boot Image v4.05a8 TV1602:1000027A51160211",
    "TVR FC HBA: Initial Firmware v1.40a3 TV1602:1000027A51160211",
    "TVR FC HBA: Operational Firmware v12.0.100.0 TV3202:1000027A51320240",
    "TVR FC HBA: Firmware On Flash v12.0.100.0 TV3202:1000027A51320240",
    "TVR FC HBA: Boot BIOS v12.0.90.0 TV3202:1000027A51320240",
    "TVR FC HBA: Universal Boot Image v12.0.90.0 TV3202:1000027A51320240",
    "TVR FC HBA: x86 Boot BIOS v12.0.88.0 TV3202:1000027A51320240",
    "TVR FC HBA: EFI Boot Image v12.0.90.0 TV3202:1000027A51320240",
    "TVR FC HBA: Kernel v12.0.100.0 TV3202:1000027A51320240",
    "TVR FC HBA: Initial Firmware v12.0.100.0 TV3202:1000027A51320240",
    "TVR FC HBA: ULP Functional Firmware v12.0.100.0 TV3202:1000027A51320240",
    "TVR FC HBA: Operational Firmware v12.0.100.0 TV3202:1000027A51320241",
    "TVR FC HBA: Firmware On Flash v12.0.100.0 TV3202:1000027A51320241",
    "TVR FC HBA: Boot BIOS v12.0.90.0 TV3202:1000027A51320241",
    "TVR FC HBA: Universal Boot Image v12.0.90.0 TV3202:1000027A51320241",
    "TVR FC HBA: x86 Boot BIOS v12.0.88.0 TV3202:1000027A51320241",
    "TVR FC HBA: EFI Boot Image v12.0.90.0 TV3202:1000027A51320241",
    "TVR FC HBA: Kernel v12.0.100.0 TV3202:1000027A51320241",
    "TVR FC HBA: Initial Firmware v12.0.100.0 TV3202:1000027A51320241",
    "TVR FC HBA: ULP Functional Firmware v12.0.100.0 TV3202:1000027A51320241",
};
constexpr std::size_t ofPorts = std::size(defaultIds) - 2;

struct InstanceRow
{
    const char* id;
    const char* properties;
};

const InstanceRow instances[] = {
    {"TVR FC HBA: Driver tvrfc v12.0.0.1", R"(
BuildNumber = 1
ClassificationDescriptions = {"Driver"}
Classifications = {2}
Description = "Driver of the Fibre Channel HBAs"
ElementName = "TVR FC HBA Driver tvrfc"
IdentityInfoType = {"TAVRIN:SOFTWARE_NAME"}
IdentityInfoValue = {"tvrfc"}
InstanceID = "TVR FC HBA: Driver tvrfc v12.0.0.1"
IsEntity = true
IsLargeBuildNumber = false
MajorVersion = 12
Manufacturer = "Tavrin Corporation"
MinorVersion = 0
Name = "tvrfc"
RevisionNumber = 0
VersionString = "12.0.0.1"
)"},
    {"TVR FC HBA: FCode Boot Image v4.05a8 TV1602:1000027A51160211", R"(
BuildNumber = 8
ClassificationDescriptions = {"FCode Boot Image"}
Classifications = {11}
Description = "Boot image of the Fibre Channel HBA for hosts with Open Firmware"
ElementName = "TVR FC HBA FCode Boot Image"
IdentityInfoType = {"TAVRIN:SOFTWARE_NAME", "TAVRIN:ADAPTER_MODEL", "TAVRIN:PORT_WWPN"}
IdentityInfoValue = {"FCode Boot Image", "TV1602", "1000027A51160211"}
InstanceID = "TVR FC HBA: FCode Boot Image v4.05a8 TV1602:1000027A51160211"
IsEntity = true
IsLargeBuildNumber = false
MajorVersion = 4
Manufacturer = "Tavrin Corporation"
MinorVersion = 0
Name = "FCode Boot Image"
ReleaseType = "a"
RevisionNumber = 5
TestReleaseVersion = ""
VersionString = "4.05a8"
)"},
    {"TVR FC HBA: ULP Functional Firmware v12.0.100.0 TV3202:1000027A51320240", R"(
BuildNumber = 0
ClassificationDescriptions = {"ULP Functional Firmware"}
Classifications = {10}
Description = "Functional firmware stub of the Fibre Channel HBA's upper layer protocols"
ElementName = "TVR FC HBA ULP Functional Firmware"
IdentityInfoType = {"TAVRIN:SOFTWARE_NAME", "TAVRIN:ADAPTER_MODEL", "TAVRIN:PORT_WWPN"}
IdentityInfoValue = {"SLI-4", "TV3202", "1000027A51320240"}
InstanceID = "TVR FC HBA: ULP Functional Firmware v12.0.100.0 TV3202:1000027A51320240"
IsEntity = true
IsLargeBuildNumber = false
MajorVersion = 12
Manufacturer = "Tavrin Corporation"
MinorVersion = 0
Name = "ULP Functional Firmware"
RevisionNumber = 100
SerialNumber = "TV32B71155"
VersionString = "12.0.100.0"
)"},
};

TEST(SoftwareIdentities, AreThoseThatTheAdaptersReport)
{
    Host host;
    EXPECT_THAT(ids(host), ElementsAreArray(defaultIds));
    for (const InstanceRow& row : instances)
        EXPECT_EQ(describe(theOne(host, "TVRHBA_SoftwareIdentity", "InstanceID", row.id)), row.properties);
    EXPECT_EQ(host.logged("[TVR_DBG] Generating TVRHBA_SoftwareConformsToProfile (Firmware TV1602:1000027A51160210, "
                          "Software Inventory)"),
              7u);
    EXPECT_EQ(host.logged("[TVR_CRIT] Insert Failed"), 0u);
    host.unload();
}

TEST(SoftwareIdentities, AreTiedToPortHostProfileAndServices)
{
    setHostNames({});
    Host host;
    const std::string controller = device("TVRHBA_PortController", "1000027A51320241");
    const std::string driver = identity(defaultIds[1]);
    const std::string operational = identity("TVR FC HBA: Operational Firmware v12.0.100.0 TV3202:1000027A51320241");
    const std::string onFlash = identity("TVR FC HBA: Firmware On Flash v12.0.100.0 TV3202:1000027A51320241");
    const std::string kernel = identity("TVR FC HBA: Kernel v12.0.100.0 TV3202:1000027A51320241");
    const std::string boot = identity("TVR FC HBA: Boot BIOS v12.0.90.0 TV3202:1000027A51320241");
    const auto ofController = [&](const std::string& software, const std::string& status)
    {
        return "\nAntecedent = " + software + "\nDependent = " + controller + "\nElementSoftwareStatus = {" + status +
               "}\nUpgradeCondition = 3\n";
    };

    const std::vector<std::string> asSoftware = described(host, "TVRHBA_ElementSoftwareIdentity");
    EXPECT_THAT(asSoftware, SizeIs(4 + 2 * 4 + 2 * 4)); // the drivers, and the boot images
    EXPECT_THAT(asSoftware, testing::IsSupersetOf({ofController(driver, "2, 6"), ofController(boot, "6")}));
    const std::vector<std::string> asFirmware = described(host, "TVRHBA_FirmwareElementSoftwareIdentity");
    EXPECT_THAT(asFirmware, SizeIs(2 * 3 + 2 * 5));
    EXPECT_THAT(asFirmware, testing::IsSupersetOf({ofController(operational, "2, 6"), ofController(onFlash, "3, 6"),
                                                   ofController(kernel, "6")}));

    const std::vector<std::string> onSystem = described(host, "TVRHBA_InstalledSoftwareIdentity");
    EXPECT_THAT(onSystem, SizeIs(std::size(defaultIds)));
    for (const std::string& software : {driver, operational, boot})
        EXPECT_THAT(onSystem, Contains("\nInstalledSoftware = " + software + "\nSystem = " + computerSystem + "\n"));

    const std::vector<std::string> conforming = described(host, "TVRHBA_SoftwareConformsToProfile");
    EXPECT_THAT(conforming, SizeIs(1 + ofPorts));
    EXPECT_THAT(conforming, Contains("\nConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="
                                     "\"TVR:Software Inventory\"\nManagedElement = " +
                                     kernel + "\n"));

    const std::vector<std::string> affected = described(host, "TVRHBA_InstallServiceAffectsFirmwareIdentity");
    EXPECT_THAT(affected, SizeIs(ofPorts));
    EXPECT_THAT(affected,
                Contains("\nAffectedElement = " + onFlash + "\nAffectingElement = " +
                         service("TVRHBA_SoftwareInstallationService", "TVRHBA_FCSoftwareInstallationService") +
                         "\nElementEffects = {5}\n"));

    const std::vector<std::string> ofTags = described(host, "TVRHBA_FCTagElementSoftwareIdentity");
    EXPECT_THAT(ofTags, SizeIs(4));
    EXPECT_THAT(ofTags, Contains("\nAntecedent = " + operational +
                                 "\nDependent = " + service("TVRHBA_FCTagService", "TVRHBA_FCTagService") +
                                 "\nElementSoftwareStatus = {2, 6}\n"));

    EXPECT_THAT(described(host, "TVRHBA_FCDriverServiceAffectsDriver"),
                ElementsAre("\nAffectedElement = " + driver + "\nAffectingElement = " +
                            service("TVRHBA_FCHBADriverParamService", "TVRHBA_FCHBADriverParamService") +
                            "\nElementEffects = {5}\n"));
    host.unload();
}

/// A host of one adapter that reports everything.
std::string everything(const std::string& deviceId)
{
    return R"({"adapters": [{"name": "a", "serialNumber": "S", "model": "M", "driverName": "d", "driverVersion": "x",
        "attributes": {"deviceId": ")" +
           deviceId + R"(", "operationalFirmware": "op", "firmwareOnFlash": "fl", "bootBiosVersion": "bb",
        "fcUniversalVersion": "un", "fcX86BiosVersion": "x8", "fcEfiVersion": "ef", "fcFcodeVersion": "fc",
        "kernelVersion": "ke", "initialFirmware": "in", "sli1FirmwareName": "s1", "sli2FirmwareName": "s2",
        "sli3FirmwareName": "s3", "spFirmwareVersion": "sp", "ulpFirmwareVersion": "ul"},
        "ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}]})";
}

TEST(SoftwareIdentities, OfDeviceE200HaveNoKernelBootBiosOrStubs)
{
    struct Row
    {
        const char* name;
        const char* version;
        bool ofE200;
    };
    const Row rows[] = {
        {"Operational Firmware", "op", true},
        {"Firmware On Flash", "fl", true},
        {"Boot BIOS", "bb", false},
        {"Universal Boot Image", "un", true},
        {"x86 Boot BIOS", "x8", true},
        {"EFI Boot Image", "ef", true},
        {"FCode Boot Image", "fc", true},
        {"Kernel", "ke", false},
        {"Initial Firmware", "in", true},
        {"SLI-1 Functional Firmware", "s1", false},
        {"SLI-2 Functional Firmware", "s2", false},
        {"SLI-3 Functional Firmware", "s3", false},
        {"SP Functional Firmware", "sp", false},
        {"ULP Functional Firmware", "ul", false},
    };
    for (const bool isE200 : {true, false})
    {
        Host host(everything(isE200 ? "0xE200" : "0xE201"));
        std::vector<std::string> expected{provider, "TVR FC HBA: Driver d vx"};
        for (const Row& row : rows)
            if (row.ofE200 || !isE200)
                expected.push_back(std::string("TVR FC HBA: ") + row.name + " v" + row.version + " M:1000000000000001");
        EXPECT_THAT(ids(host), ElementsAreArray(expected));
        host.unload();
    }
}

TEST(SoftwareIdentities, VersionsOfNoKnownFormHaveNoNumbers)
{
    struct Row
    {
        const char* version;
        const char* numbers; ///< major, minor, revision, build
    };
    const Row rows[] = {
        {"1.11a5", "1 1 1 5"}, {"12.4", "12 4"},  {"1.2.3.65535", "1 2 3 65535"},
        {"1.2.3.65536", ""},   {"1.2.3.4.5", ""}, {"12", ""},
        {"1..2", ""},          {"1.2.", ""},      {"12.4.0.3-rc", ""},
        {"10.11a5", ""},       {"-1.2", ""},
    };
    for (const Row& row : rows)
    {
        Host host(R"({"adapters": [{"name": "a", "serialNumber": "S", "model": "M", "attributes":
            {"operationalFirmware": ")" +
                  std::string(row.version) + R"("}, "ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]}]})");
        const broker::Object made = theOne(host, "TVRHBA_SoftwareIdentity", "VersionString", row.version);
        std::string numbers;
        for (const char* property : {"MajorVersion", "MinorVersion", "RevisionNumber", "BuildNumber"})
            if (!made.get(property).isNull())
                numbers += (numbers.empty() ? "" : " ") + std::to_string(made.get(property).asUnsigned());
        EXPECT_EQ(numbers, row.numbers) << row.version;
        host.unload();
    }
}

TEST(SoftwareIdentities, EachDriverOfAHostIsOne)
{
    Host host(R"({"templates": {"t": {"driverName": "d", "driverVersion": "1", "serialNumber": "S", "model": "M"}},
        "adapters": [
        {"template": "t", "name": "Tavrin-a", "ports": [{"wwpn": "10:00:00:00:00:00:00:01"}]},
        {"template": "t", "name": "Tavrin-b", "driverVersion": "2", "ports": [{"wwpn": "10:00:00:00:00:00:00:02"}]},
        {"template": "t", "name": "Tavrin-c", "ports": [{"wwpn": "10:00:00:00:00:00:00:03"}]},
        {"template": "t", "name": "Tavrin-d", "driverName": "", "driverVersion": "",
         "ports": [{"wwpn": "10:00:00:00:00:00:00:04"}]}]})");
    EXPECT_THAT(ids(host), ElementsAre(provider, "TVR FC HBA: Driver d v1", "TVR FC HBA: Driver d v2"));
    std::vector<std::string> driverOfPort;
    for (const broker::Object& object : host.instancesOf("TVRHBA_ElementSoftwareIdentity"))
        driverOfPort.push_back(object.get("Dependent").asPath().key("DeviceID")->asString().substr(14) + " " +
                               object.get("Antecedent").asPath().key("InstanceID")->asString());
    EXPECT_THAT(driverOfPort,
                ElementsAre("01 TVR FC HBA: Driver d v1", "02 TVR FC HBA: Driver d v2", "03 TVR FC HBA: Driver d v1"));
    EXPECT_THAT(host.instancesOf("TVRHBA_FCDriverServiceAffectsDriver"), SizeIs(2));
    host.unload();
}

TEST(SoftwareIdentities, PortsOfOneAdapterHaveTheirOwn)
{
    Host host("multiport");
    std::vector<std::string> ports;
    for (const broker::Object& object : host.instancesOf("TVRHBA_FirmwareElementSoftwareIdentity"))
        if (object.get("Antecedent").asPath().key("InstanceID")->asString().find("Operational") != std::string::npos)
            ports.push_back(object.get("Dependent").asPath().key("DeviceID")->asString());
    EXPECT_THAT(ports, ElementsAre("1000027A51320D00", "1000027A51320D01"));
    host.unload();
}

} // namespace
