// The adapter half of the cache on a host without libraries: what a client cannot see, and the steps that fail.
#include "agent/RefreshSteps.h"
#include "model/ComputerSystem.h"
#include "model/Profiles.h"
#include "model/ProviderInstances.h"
#include "runtime/meta/Print.h"
#include "schema/TVRHBA_RecordLog.h"
#include "schema/TVRHBA_RecordLogCapabilities.h"
#include "schema/TVRHBA_RecordLogConformsToProfile.h"
#include "tests/module/HostNames.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <optional>
#include <sstream>
#include <stdexcept>

using namespace cimple;
using testing::Contains;
using testing::ElementsAre;
using testing::Not;
using testing::UnorderedElementsAre;

namespace
{

namespace fs = std::filesystem;

fs::path makeRoot()
{
    std::string name = (fs::temp_directory_path() / "tvr-model-XXXXXX").string();
    if (!mkdtemp(name.data()))
        throw std::runtime_error("no temporary folder");
    return name;
}

/// An agent with files of its own, which logs everything to one of them.
class AdapterMaps : public testing::Test
{
protected:
    AdapterMaps() : root(makeRoot())
    {
        write("/proc/version", "Linux version 6.1.0");
        write("/etc/issue", "Debian 12");
        write("/etc/tavrin_fc_provider.dmp", "2,5,1\n" + (root / "provider.log").string());
        setenv("TVR_FILE_ROOT", root.c_str(), 1);
        module_test::setHostNames({});
        agent = ProviderAgent::instance();
        ProviderAgent::addRef();
        agent->m_pData = std::make_unique<Data>(); // without libraries there is none
        host.emplace(*agent);
    }
    ~AdapterMaps() override
    {
        host.reset();
        ProviderAgent::releaseRef();
        fs::remove_all(root);
    }

    void write(const std::string& path, const std::string& content) const
    {
        const fs::path file = root.string() + path;
        fs::create_directories(file.parent_path());
        std::ofstream(file) << content;
    }

    /// Lines of the log from their level on.
    std::vector<std::string> log() const
    {
        std::vector<std::string> lines;
        std::ifstream file(root / "provider.log");
        for (std::string line; std::getline(file, line);)
            if (const std::size_t level = line.find("][TVR_"); level != line.npos)
                lines.push_back(line.substr(level + 1));
        return lines;
    }

    const fs::path root;
    ProviderAgent* agent;
    std::optional<HostContext> host; ///< for steps that are run by themselves
};

/// The declarations and values of all properties that are not null, in the order of the class.
std::vector<std::string> properties(const Instance* instance)
{
    Buffer text;
    print(text, instance);
    std::istringstream lines(std::string(text.data(), text.size()));
    std::vector<std::string> all;
    for (std::string line; std::getline(lines, line);)
        if (line.find(" = ") != line.npos && !line.ends_with(" = NULL;"))
            all.push_back(line.substr(line.find_first_not_of(' ')));
    return all;
}

TEST_F(AdapterMaps, GeneratedComputerSystemHasThesePropertiesAndNoOthers)
{
    ASSERT_EQ(createComputerSystem(*host), BUILD_DONE);
    EXPECT_THAT(
        properties(host->system),
        UnorderedElementsAre(
            R"(string Description = "Linux version 6.1.0 with Tavrin CMPI HBA Provider v10.2.261-13";)",
            R"(string ElementName = "tavrin-host.example.net";)", R"(string Name = "tavrin-host.example.net";)",
            R"(uint16 OperationalStatus[] = {2};)", R"(uint16 EnabledState = 0;)", R"(uint16 RequestedState = 12;)",
            R"(uint16 EnabledDefault = 2;)", R"(uint16 TransitioningToState = 12;)",
            R"(string CreationClassName = "CIM_ComputerSystem";)", R"(string NameFormat = "Other";)",
            R"(string OtherIdentifyingInfo[] = {"192.0.2.17", "Linux version 6.1.0", "Debian 12"};)",
            R"(string IdentifyingDescriptions[] = {"TAVRIN:IP_ADDRESS", "TAVRIN:OS_NAME", "TAVRIN:OS_EXTENDED_INFO"};)",
            R"(uint16 Dedicated[] = {0};)", R"(uint16 ResetCapability = 2;)",
            R"(uint16 PowerManagementCapabilities[] = {0};)"));
    EXPECT_TRUE(agent->m_bOwnComputerSystem);
    EXPECT_STREQ(agent->m_hostName.c_str(), "tavrin-host.example.net");
    EXPECT_STREQ(agent->m_ipAddress.c_str(), "192.0.2.17");
}

TEST_F(AdapterMaps, UnknownAddressStaysUnknown)
{
    module_test::setHostNames({"short", std::nullopt});
    ASSERT_EQ(createComputerSystem(*host), BUILD_DONE);
    EXPECT_STREQ(host->system->Name.value.c_str(), "short");
    EXPECT_STREQ(host->system->OtherIdentifyingInfo.value[0].c_str(), "unknown");
    EXPECT_STREQ(agent->m_hostName.c_str(), "short");
    EXPECT_STREQ(agent->m_ipAddress.c_str(), "unknown");
}

TEST_F(AdapterMaps, GeneratedChassisHasThesePropertiesAndNoOthers)
{
    ASSERT_EQ(createChassis(*host), BUILD_DONE);
    EXPECT_THAT(properties(host->chassis.get()),
                UnorderedElementsAre(R"(string Tag = "TVR HBA:Chassis";)",
                                     R"(string CreationClassName = "CIM_Chassis";)",
                                     R"(string ElementName = "TVR HBA:Chassis";)", R"(uint16 PackageType = 3;)",
                                     R"(uint16 ChassisPackageType = 0;)",
                                     R"(uint16 RemovalConditions = 2;)")); // the schema's default
}

TEST_F(AdapterMaps, ProfileIsRegisteredOnce)
{
    const TVRHBA_RegisteredProfile* first = createRegisteredProfile(*host, profileRow("Software"));
    EXPECT_EQ(createRegisteredProfile(*host, profileRow("Software")), first);
    EXPECT_EQ(agent->m_TVRHBA_RegisteredProfile_map.size(), 1u);
    EXPECT_STREQ(first->RegisteredVersion.value.c_str(), "1.2.0");
    EXPECT_THAT(log(), Contains("[TVR_DBG] Got TVRHBA_RegisteredProfile in the map (Software)"));
}

TEST_F(AdapterMaps, RefusedInsertsStopTheirStepWithTheirText)
{
    ASSERT_EQ(createComputerSystem(*host), BUILD_DONE);
    createProfiles(*host);
    struct Row
    {
        std::uint32_t (*step)(HostContext&);
        const char* line;
    };
    const Row rows[] = {
        {createProviderSoftwareIdentity, "[TVR_CRIT] Insert Failed : m_TVRHBA_SoftwareIdentity_map"},
        {createProviderConfigSettings, "[TVR_CRIT] Insert Failed : m_TVRHBA_ProviderConfigSetting_map"},
        {createProviderRecordLog, "[TVR_CRIT] Insert Failed : m_TVRHBA_TVRHBA_RecordLog_map"},
    };
    for (const Row& row : rows)
    {
        EXPECT_EQ(row.step(*host), BUILD_DONE) << row.line;
        EXPECT_THAT(log(), Not(Contains(row.line)));
        EXPECT_EQ(row.step(*host), BUILD_FAILED) << row.line;
        EXPECT_THAT(log(), Contains(row.line));
    }

    agent->m_TVRHBA_RecordLog_map.clear();
    EXPECT_EQ(createProviderRecordLog(*host), BUILD_FAILED);
    EXPECT_THAT(log(), Contains("[TVR_CRIT] Insert Failed : m_TVRHBA_TVRHBA_EnabledRecordLogCapabilities_map"));
    EXPECT_THAT(log(), Contains("[TVR_CRIT] Insert Failed : m_TVRHBA_ComputerSystemConformsToProfile_map"));

    EXPECT_EQ(createComputerSystem(*host), BUILD_FAILED);
    EXPECT_THAT(log(), Contains("[TVR_CRIT] Insert Failed : m_TVRHBA_ComputerSystem_map"));
}

TEST_F(AdapterMaps, RecordLogNeedsTheProfileRegistration)
{
    ASSERT_EQ(createComputerSystem(*host), BUILD_DONE);
    EXPECT_EQ(createProviderRecordLog(*host), BUILD_FAILED);
    EXPECT_THAT(log(), Contains("[TVR_CRIT] Missing Profile Registration Profile instance"));
    EXPECT_EQ(agent->m_TVRHBA_RecordLog_map.size(), 1u);
    EXPECT_EQ(agent->m_TVRHBA_RecordLogConformsToProfile_map.size(), 0u);
    EXPECT_EQ(agent->m_TVRHBA_EnabledRecordLogCapabilities_map.size(), 0u);
}

// --- refreshes that the libraries never bring about

/// An adapter of the device model that is no FCAdapter, whatever its type says.
class ForeignAdapter : public Adapter
{
public:
    ForeignAdapter(const std::string& adapterName, std::uint32_t type) : Adapter(adapterName, 0, type) {}
    const std::string& getName() const override { return name; }
    const std::uint32_t& getAdapterNumber() const override { return adapterNumber; }
    const std::uint32_t& getFunctionType() const override { return functionType; }
    AdapterAttributes* getAttributes() const override { return nullptr; }
    AdapterStatistics* getStatistics() const override { return nullptr; }
    unsigned getPortCount() const override { return 0; }
    std::vector<Port*>& getPorts() override { return ports; }
    Port* getPort(unsigned) const override { throw std::out_of_range("port"); }
    void rescanTargets() override {}
};

TEST_F(AdapterMaps, AdaptersOfOtherTypesAreSkipped)
{
    agent->m_pData->adapters.push_back(new ForeignAdapter("eth0", 2));
    agent->m_pData->adapters.push_back(new ForeignAdapter("eth1", 0));
    agent->m_pData->dataValid = true;
    EXPECT_EQ(buildAdapterMaps(*agent), BUILD_DONE);
    EXPECT_THAT(log(), Contains("[TVR_DBG] Skippping Non FC Adapter [eth0]"));
    EXPECT_THAT(log(), Contains("[TVR_DBG] Skippping Non FC Adapter [eth1]"));
    EXPECT_THAT(log(), Contains("[TVR_DBG] Done with the Driver Parameter fetching"));
    EXPECT_EQ(log().back(), "[TVR_DBG] PERF: updateAdapterMaps: cleanExit");
    EXPECT_EQ(agent->m_TVRHBA_Card_map.size(), 0u);
    EXPECT_EQ(agent->m_TVRHBA_ProviderUseOfLog_map.size(), 1u);
}

TEST_F(AdapterMaps, ExceptionEndsTheAdaptersAndNotTheRefresh)
{
    agent->m_pData->adapters.push_back(new ForeignAdapter("no FCAdapter", 1));
    agent->m_pData->dataValid = true;
    EXPECT_EQ(buildAdapterMaps(*agent), BUILD_DONE);
    EXPECT_THAT(log(), Contains("[TVR_DBG] Unknown Exception in FC card discovery"));
    EXPECT_THAT(log(), Not(Contains("[TVR_DBG] Done with the Driver Parameter fetching")));
    EXPECT_EQ(log().back(), "[TVR_DBG] PERF: updateAdapterMaps: cleanExit");
}

TEST_F(AdapterMaps, WithoutTheDeviceModelTheRefreshStopsBehindTheProfiles)
{
    agent->m_pData.reset();
    EXPECT_EQ(buildAdapterMaps(*agent), BUILD_FAILED);
    EXPECT_EQ(log().back(), "[TVR_CRIT] Could not locate the data pointer - Serious issue");
    EXPECT_EQ(agent->m_TVRHBA_RegisteredProfile_map.size(), 12u);
    EXPECT_EQ(agent->m_CIM_ComputerSystem_map.size(), 1u);
    EXPECT_EQ(agent->m_CIM_Chassis_map.size(), 0u);
}

TEST_F(AdapterMaps, AssociationsShareCopiesOfTheirEnds)
{
    agent->updateAdapterMaps();
    auto* recordLog = static_cast<TVRHBA_RecordLog*>(agent->m_TVRHBA_RecordLog_map.at(0));
    const auto* capabilities =
        static_cast<TVRHBA_RecordLogCapabilities*>(agent->m_TVRHBA_RecordLogCapabilities_map.at(0));
    const auto* conforms =
        static_cast<TVRHBA_RecordLogConformsToProfile*>(agent->m_TVRHBA_RecordLogConformsToProfile_map.at(0));
    const Instance* end = capabilities->ManagedElement;
    EXPECT_EQ(conforms->ManagedElement, end);
    EXPECT_NE(recordLog, end);
    EXPECT_TRUE(identical(recordLog, end));
    recordLog->ElementName.set("changed");
    EXPECT_STRNE(capabilities->ManagedElement->ElementName.value.c_str(), "changed");
}

TEST_F(AdapterMaps, EveryRefreshBeginsWithEmptyMaps)
{
    EXPECT_EQ(buildAdapterMaps(*agent), BUILD_FAILED); // no adapters, so no identity of the provider
    EXPECT_EQ(log().back(), "[TVR_DBG] Missing Provider Software Identity");
    EXPECT_EQ(buildAdapterMaps(*agent), BUILD_FAILED);
    EXPECT_EQ(agent->m_CIM_ComputerSystem_map.size(), 1u);
    EXPECT_EQ(agent->m_CIM_Chassis_map.size(), 1u);
    EXPECT_EQ(agent->m_TVRHBA_RegisteredProfile_map.size(), 13u);
    EXPECT_EQ(agent->m_TVRHBA_RecordLogCapabilities_map.size(), 1u);
    for (const std::string& line : log())
        EXPECT_EQ(line.find("Insert Failed"), line.npos) << line;
}

} // namespace
