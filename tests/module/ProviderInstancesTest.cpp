// The module itself as instances: its identity, settings, record log and profiles.
#include "tests/module/Clock.h"
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAre;
using testing::ElementsAreArray;

namespace
{

const std::string computerSystem =
    R"(root/tavrin:CIM_ComputerSystem.Name="tavrin-host.example.net",CreationClassName="CIM_ComputerSystem")";
const std::string identity =
    R"(root/tavrin:TVRHBA_SoftwareIdentity.InstanceID="Tavrin CMPI HBA Provider v10.2.261-13")";
const std::string recordLog = R"(root/tavrin:TVRHBA_RecordLog.InstanceID="TVRHBA:ProviderLog:tavrin-host.example.net")";

std::vector<std::string> described(Host& host, const std::string& className)
{
    std::vector<std::string> all;
    for (const broker::Object& object : host.instancesOf(className))
        all.push_back(describe(object));
    return all;
}

TEST(ProviderInstances, IdentityTellsTheVersionAndBelongsToTheHost)
{
    setHostNames({});
    Host host;
    const broker::Object provider =
        theOne(host, "TVRHBA_SoftwareIdentity", "InstanceID", "Tavrin CMPI HBA Provider v10.2.261-13");
    const std::pair<const char*, std::uint64_t> version[] = {
        {"MajorVersion", 10}, {"MinorVersion", 2}, {"RevisionNumber", 261}, {"BuildNumber", 13}};
    for (const auto& [property, number] : version)
        EXPECT_EQ(provider.get(property).asUnsigned(), number) << property;
    EXPECT_EQ(text(provider, "VersionString"), "10.2.261-13");

    EXPECT_THAT(described(host, "TVRHBA_ProviderSoftwareIdentity"),
                ElementsAre("\nAntecedent = " + identity + "\nDependent = " + computerSystem + "\n"));
    EXPECT_THAT(described(host, "TVRHBA_InstalledSoftwareIdentity"),
                testing::Contains("\nInstalledSoftware = " + identity + "\nSystem = " + computerSystem + "\n"));
    EXPECT_THAT(described(host, "TVRHBA_SoftwareConformsToProfile"),
                testing::Contains("\nConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="
                                  "\"TVR:Software\"\nManagedElement = " +
                                  identity + "\n"));
    EXPECT_EQ(host.logged("[TVR_DBG] Generating TVRHBA_SoftwareConformsToProfile (CMPI HBA Provider, Software)"), 1u);
    host.unload();
}

// --- settings

/// The three settings with their present values.
std::vector<std::string> settings(unsigned cacheTimeout, unsigned adapterRefresh, unsigned sanRefresh)
{
    return {
        R"(
Description = "This setting defines the timeout value of Tavrin CIM Provider's internal cache"
InstanceID = "Tavrin HBA Provider:cachetimeout"
current = )" +
            std::to_string(cacheTimeout) + R"(
def = 10
highRange = 30
lowRange = 5
paramname = "cachetimeout"
)",
        R"(
Description = "This setting represents the Adapter data refresh setting value of Tavrin CIM Provider's internal cache"
InstanceID = "Tavrin HBA Provider:adapterrefresh"
current = )" +
            std::to_string(adapterRefresh) + R"(
def = 0
highRange = 1
lowRange = 0
paramname = "adapterrefresh"
)",
        R"(
Description = "This setting represents the SAN data refresh setting value of Tavrin CIM Provider's internal cache"
InstanceID = "Tavrin HBA Provider:sanrefresh"
current = )" +
            std::to_string(sanRefresh) + R"(
def = 1
highRange = 1
lowRange = 0
paramname = "sanrefresh"
)"};
}

TEST(ProviderInstances, SettingsShowTheirDefaultsInOrder)
{
    Host host;
    EXPECT_EQ(described(host, "TVRHBA_ProviderConfigSetting"), settings(10, 0, 1));
    host.unload();
}

TEST(ProviderInstances, SettingsShowWhatTheirFileSays)
{
    Host host;
    host.write("/etc/tavrin_fc_provider.conf",
               "TVR_PROVIDER_CACHE_TIMEOUT = 3\nTVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE\n"
               "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n");
    EXPECT_EQ(described(host, "TVRHBA_ProviderConfigSetting"), settings(3, 1, 0));
    host.unload();
}

broker::Object changedSetting(Host& host, const char* name, broker::Value current)
{
    return changed(theOne(host, "TVRHBA_ProviderConfigSetting", "paramname", name), "current", std::move(current));
}

TEST(ProviderInstances, ChangedSettingsAreShownAtOnceAndKeptInTheirFile)
{
    constexpr const char* file = "/etc/tavrin_fc_provider.conf";
    struct Change
    {
        const char* name;
        std::uint32_t value;
        CMPIrc status;
        const char* line;
    };
    const Change changes[] = {
        {"cachetimeout", 3, CMPI_RC_OK,
         "[TVR_WARN] Cache time-out is modified successfully"}, // below what is published
        {"cachetimeout", 31, CMPI_RC_ERR_INVALID_PARAMETER,
         "[TVR_ERR] The value provided for cache time-out is out of range"},
        {"cachetimeout", 0, CMPI_RC_ERR_INVALID_PARAMETER,
         "[TVR_ERR] The value provided for cache time-out is out of range"},
        {"adapterrefresh", 1, CMPI_RC_OK, "[TVR_WARN] Adapter refresh is modified successfully"},
        {"adapterrefresh", 0xFFFF'FFFF, CMPI_RC_ERR_INVALID_PARAMETER,
         "[TVR_ERR] The value provided for adapter refresh out is out of range"},
        {"sanrefresh", 0, CMPI_RC_OK, "[TVR_WARN] SAN refresh is modified successfully"},
        {"sanrefresh", 2, CMPI_RC_ERR_INVALID_PARAMETER,
         "[TVR_ERR] The value provided for SAN refresh out is out of range"},
    };
    Host host;
    for (const Change& change : changes)
    {
        SCOPED_TRACE(change.name + (" = " + std::to_string(change.value)));
        const std::size_t before = host.logged(change.line);
        const auto setting = changedSetting(host, change.name, broker::Value::uint32(change.value));
        EXPECT_EQ(host.broker().modifyInstance(setting).status, change.status);
        EXPECT_EQ(host.logged(change.line), before + 1);
    }
    EXPECT_EQ(described(host, "TVRHBA_ProviderConfigSetting"), settings(3, 1, 0));
    EXPECT_FALSE(std::filesystem::exists(host.root() / "etc/tavrin_fc_provider.conf"));

    host.unload();
    EXPECT_THAT(host.read(file), testing::HasSubstr("TVR_PROVIDER_CACHE_TIMEOUT = 3\n"
                                                    "TVR_PROVIDER_REFRESH_ADAPTERDATA = TRUE\n"
                                                    "TVR_PROVIDER_REFRESH_SANDATA = FALSE\n"));
    EXPECT_EQ(described(host, "TVRHBA_ProviderConfigSetting"), settings(3, 1, 0));
    host.unload();
}

TEST(ProviderInstances, AChangedTimeoutDecidesWhenTheNextRequestRefreshes)
{
    stopClock();
    Host host;
    described(host, "TVRHBA_ProviderConfigSetting");
    ASSERT_TRUE(host.awaitRefresh());
    host.broker().modifyInstance(changedSetting(host, "cachetimeout", broker::Value::uint32(2)));
    advanceClock(std::chrono::minutes(2));
    described(host, "TVRHBA_ProviderConfigSetting");
    EXPECT_TRUE(host.awaitRefresh(2));
    host.unload();
}

TEST(ProviderInstances, ChangedFlagsDecideWhatTheNextRefreshBuilds)
{
    const std::string adapters = "[TVR_DBG] PERF: Building Adapter Data...";
    const std::string fabric = "[TVR_DBG] PERF: Building SAN Data...";
    stopClock();
    Host host;
    described(host, "TVRHBA_ProviderConfigSetting");
    ASSERT_TRUE(host.awaitRefresh());
    const auto set = [&](const char* name, std::uint32_t value)
    {
        const auto setting = changedSetting(host, name, broker::Value::uint32(value));
        EXPECT_EQ(host.broker().modifyInstance(setting).status, CMPI_RC_OK);
    };
    set("sanrefresh", 0);
    const std::size_t scans = host.logged(fabric);
    advanceClock(std::chrono::minutes(10));
    described(host, "TVRHBA_ProviderConfigSetting");
    ASSERT_TRUE(host.awaitRefresh(2));
    EXPECT_EQ(host.logged(fabric), scans) << "a timeout alone scans no fabric any more";

    set("adapterrefresh", 1);
    const std::size_t builds = host.logged(adapters);
    host.instancesOf("TVRHBA_StorageVolume");
    ASSERT_TRUE(host.awaitRefresh(3));
    EXPECT_EQ(host.logged(adapters), builds + 1) << "a scan that a reader asks for brings the adapters along";
    EXPECT_EQ(host.logged(fabric), scans + 1);
    host.unload();
}

TEST(ProviderInstances, ChangesOfNoSettingOrOfNothingAreRefused)
{
    Host host;
    const auto refused = [&](const broker::Object& object) { return host.broker().modifyInstance(object).status; };
    auto unknown = changedSetting(host, "sanrefresh", broker::Value::uint32(0));
    unknown.path.keys.at(0).value = broker::Value::string("Tavrin HBA Provider:colour");
    EXPECT_EQ(refused(unknown), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(refused(changedSetting(host, "sanrefresh", broker::Value::null(CMPI_uint32))),
              CMPI_RC_ERR_INVALID_PARAMETER);
    const auto setting = changedSetting(host, "sanrefresh", broker::Value::uint32(0));
    EXPECT_EQ(host.broker().modifyInstance(setting, {{"ElementName"}}).status, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(host.logged("[TVR_ERR] Instance does not exist"), 2u);
    EXPECT_EQ(host.logged("[TVR_ERR] The value provided for SAN refresh out is out of range"), 1u) << "for a null";
    EXPECT_EQ(host.logged("[TVR_DBG] TVRHBA_ProviderConfigSetting_Provider::modify_instance()"), 3u);
    EXPECT_EQ(described(host, "TVRHBA_ProviderConfigSetting"), settings(10, 0, 1));
    host.unload();
}

// --- record log

TEST(ProviderInstances, RecordLogShowsTheLoggersState)
{
    setHostNames({});
    Host host;
    const std::string path = (host.root() / "provider.log").string();
    EXPECT_THAT(described(host, "TVRHBA_RecordLog"), testing::Contains(R"(
CurrentNumberOfRecords = 0
ElementName = "TVRHBA:ProviderLog:tavrin-host.example.net"
EnabledDefault = 2
EnabledState = 2
HealthState = 5
InstanceID = "TVRHBA:ProviderLog:tavrin-host.example.net"
LogLevel = 5
LogMode = 2
LogState = 4
MaxNumberOfRecords = 1024
Name = "Record logs for Tavrin CIM Provider"
OperationalStatus = {2}
OverwritePolicy = 2
RequestedState = 2
TracePath = ")" + path + R"("
TransitioningToState = 12
)"));
    EXPECT_THAT(described(host, "TVRHBA_EnabledRecordLogCapabilities"), testing::Contains(R"(
ElementName = "TVRHBA provider log capabilities"
ElementNameEditSupported = false
InstanceID = "TVRHBA provider log capabilities"
LogParamsSupported = {2, 3}
RequestedStatesSupported = {2, 3}
)"));
    EXPECT_THAT(described(host, "TVRHBA_RecordLogCapabilities"),
                ElementsAre("\nCapabilities = root/tavrin:TVRHBA_EnabledRecordLogCapabilities.InstanceID="
                            "\"TVRHBA provider log capabilities\"\nManagedElement = " +
                            recordLog + "\n"));
    EXPECT_THAT(described(host, "TVRHBA_ProviderUseOfLog"),
                testing::Contains("\nAntecedent = " + recordLog + "\nDependent = " + identity + "\n"));
    EXPECT_THAT(described(host, "TVRHBA_RecordLogConformsToProfile"),
                testing::Contains("\nConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID="
                                  "\"TVR:Record Log\"\nManagedElement = " +
                                  recordLog + "\n"));
    EXPECT_THAT(logAbout(host, {"TVRHBA:ProviderLog:"}),
                ElementsAre("[TVR_DBG] TVRHBA:ProviderLog:tavrin-host.example.net conformant to Record Log profile",
                            "[TVR_DBG] TVRHBA:ProviderLog:tavrin-host.example.net : Logging capabilities",
                            "[TVR_DBG] Tavrin CMPI HBA Provider v10.2.261-13 uses log : "
                            "TVRHBA:ProviderLog:tavrin-host.example.net"));
    host.unload();
}

TEST(ProviderInstances, RecordLogOfADisabledLoggerIsDisabled)
{
    Host host;
    host.write("/etc/tavrin_fc_provider.dmp", "1,3,0\n" + (host.root() / "provider.log").string());
    const broker::Object log = host.instancesOf("TVRHBA_RecordLog").back(); // behind the driver's
    EXPECT_EQ(log.get("RequestedState").asUnsigned(), 5u);
    EXPECT_EQ(log.get("EnabledState").asUnsigned(), 3u);
    EXPECT_EQ(log.get("LogLevel").asUnsigned(), 3u);
    EXPECT_EQ(log.get("LogMode").asUnsigned(), 1u);
    host.unload();
}

// --- profiles

struct ProfileRow
{
    const char* name;
    unsigned organization;
    const char* version;
};

/// In the order in which the computer system conforms to them.
const ProfileRow profiles[] = {
    {"Profile Registration", 2, "1.0.0"},
    {"Software Inventory", 2, "1.0.0"},
    {"Physical Package", 11, "1.3.0"},
    {"Host Discovered Resources", 11, "1.2.0"},
    {"FC HBA", 11, "1.2.0"},
    {"Storage HBA", 11, "1.4.0"},
    {"FC Initiator Ports", 11, "1.3.0"},
    {"Software", 11, "1.2.0"},
    {"Access Points", 11, "1.3.0"},
    {"PCI Device", 2, "1.0.0"},
    {"FCHBA Diagnostics", 2, "1.0.0"},
    {"Physical Asset", 2, "1.0.2"},
    {"Record Log", 2, "1.0.1"},
};

TEST(ProviderInstances, HostConformsToItsProfilesInOrder)
{
    setHostNames({});
    Host host;
    std::vector<std::string> conformances, lines;
    for (const ProfileRow& row : profiles)
    {
        const std::string id = std::string("TVR:") + row.name;
        conformances.push_back("\nConformantStandard = root/pg_interop:TVRHBA_RegisteredProfile.InstanceID=\"" + id +
                               "\"\nManagedElement = " + computerSystem + "\n");
        lines.push_back(std::string("[TVR_DBG] Generating TVRHBA_RegisteredProfile (") + row.name + ")");
        lines.push_back("[TVR_DBG] inside createComputerSystemConformsToProfile");
        lines.push_back("[TVR_DBG] Generating TVRHBA_ComputerSystemConformsToProfile (Computer System," + id + ")");
    }
    EXPECT_EQ(described(host, "TVRHBA_ComputerSystemConformsToProfile"), conformances);
    std::vector<std::string> logged =
        logAbout(host, {"Generating TVRHBA_RegisteredProfile", "inside create", "Generating TVRHBA_ComputerSystem"});
    std::erase_if(logged, [](const std::string& line) { return line.find("(Software Update)") != line.npos; });
    EXPECT_EQ(logged, lines);
    host.unload();
}

TEST(ProviderInstances, ProfilesAreAdvertisedInTheInteropNamespace)
{
    Host host;
    const broker::Reply reply = host.broker().enumerateInstances("root/pg_interop", "TVRHBA_RegisteredProfile");
    ASSERT_TRUE(reply.ok()) << reply.message;
    std::vector<std::string> actual, expected;
    for (const broker::Object& object : reply.objects)
    {
        EXPECT_EQ(object.path.nameSpace, "root/pg_interop");
        actual.push_back(describe(object));
    }
    for (const ProfileRow& row : profiles)
    {
        const std::string name = row.name;
        expected.push_back("\nAdvertiseTypeDescriptions = {\"SLP\"}\nAdvertiseTypes = {3}\nDescription = \"Tavrin " +
                           name + "\"\nElementName = \"Tavrin Registered " + name + "\"\nInstanceID = \"TVR:" + name +
                           "\"\nRegisteredName = \"" + name + "\"\nRegisteredOrganization = " +
                           std::to_string(row.organization) + "\nRegisteredVersion = \"" + row.version + "\"\n");
    }
    EXPECT_THAT(actual, testing::IsSupersetOf(expected));
    host.unload();
}

} // namespace
