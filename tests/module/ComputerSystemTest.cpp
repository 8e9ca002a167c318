// The host's computer system and chassis: found in the platform's namespace, or made up.
#include "tests/module/Describe.h"
#include "tests/module/HostNames.h"

#include "broker/values/ValueText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using testing::SizeIs;

namespace
{

/// Paths at one end of an association.
std::vector<std::string> ends(Host& host, const std::string& className, const std::string& role)
{
    std::vector<std::string> paths;
    for (const broker::Object& object : host.instancesOf(className))
        paths.push_back(broker::valueText(object.get(role)));
    return paths;
}

/// What the module logs about the binding, in order.
std::vector<std::string> bindingLog(const Host& host)
{
    return logAbout(host, {"up-call", "hostname", "Host Name :", "Host ipAddress", "gethostby", "All clear",
                           "do nothing", "Could not create"});
}

const char* const notFound[] = {
    "[TVR_DBG] up-call to enumerate CIM_ComputerSystem started",
    "[TVR_DBG] up-call to enumerate CIM_ComputerSystem created--calling now",
    "[TVR_DBG] up-call to enumerate CIM_ComputerSystem started",
    "[TVR_INFO] up-call to enumerate CIM_ComputerSystem created",
    "[TVR_DBG] up-call method failed",
};

/// The log of a host whose platform has no computer system and no chassis, with what is said about its names.
std::vector<std::string> generatedLog(const std::vector<std::string>& aboutNames)
{
    std::vector<std::string> lines(std::begin(notFound), std::end(notFound));
    lines.insert(lines.end(), aboutNames.begin(), aboutNames.end());
    for (const char* line : {"[TVR_DBG] All clear -created tvrhba computer system instance",
                             "[TVR_DBG] up-call to enumerate CIM_Chassis started",
                             "[TVR_DBG] up-call to enumerate CIM_Chassis created--calling now",
                             "[TVR_DBG] up-call to enumerate CIM_Chassis started",
                             "[TVR_DBG] up-call method to get the chassis is failed"})
        lines.push_back(line);
    return lines;
}

struct NamesRow
{
    const char* name;
    HostNames answers;
    const char* systemName;
    std::vector<std::string> log;
};

class GeneratedComputerSystem : public testing::TestWithParam<NamesRow>
{};

TEST_P(GeneratedComputerSystem, IsNamedAsTheHostIs)
{
    setHostNames(GetParam().answers);
    Host host("empty");
    const std::string systemName = GetParam().systemName;
    EXPECT_EQ(text(host.instancesOf("TVRHBA_RecordLog").back(), "InstanceID"), "TVRHBA:ProviderLog:" + systemName);
    EXPECT_THAT(ends(host, "TVRHBA_ComputerSystemConformsToProfile", "ManagedElement"),
                AllOf(SizeIs(13), Each("root/tavrin:CIM_ComputerSystem.Name=\"" + systemName +
                                       "\",CreationClassName=\"CIM_ComputerSystem\"")));
    EXPECT_THAT(bindingLog(host), ElementsAreArray(generatedLog(GetParam().log)));
    host.unload();
}

INSTANTIATE_TEST_SUITE_P(
    Names, GeneratedComputerSystem,
    testing::Values(
        NamesRow{"Resolved",
                 {},
                 "tavrin-host.example.net",
                 {"[TVR_DBG] Host Name : tavrin-host", "[TVR_DBG] Host ipAddress : 192.0.2.17"}},
        NamesRow{"HighAddressBytes",
                 {"short", HostAddress{"long", {255, 128, 0, 254}}},
                 "long",
                 {"[TVR_DBG] Host Name : short", "[TVR_DBG] Host ipAddress : 255.128.0.254"}},
        NamesRow{"ManyAliases",
                 {"tavrin-host", HostAddress{"long", {192, 0, 2, 1}}, 100'000},
                 "long",
                 {"[TVR_DBG] Host Name : tavrin-host", "[TVR_DBG] Host ipAddress : 192.0.2.1"}},
        NamesRow{"AliasesWithoutEnd",
                 {"tavrin-host", HostAddress{"long", {192, 0, 2, 1}}, 1'000'000'000},
                 "tavrin-host",
                 {"[TVR_DBG] Host Name : tavrin-host",
                  "[TVR_ERR] Error! gethostbyname() failed, using 'unknown' for IP address."}},
        NamesRow{"Unresolved",
                 {"tavrin-host", std::nullopt},
                 "tavrin-host",
                 {"[TVR_DBG] Host Name : tavrin-host",
                  "[TVR_ERR] Error! gethostbyname() failed, using 'unknown' for IP address."}},
        NamesRow{"Nameless",
                 {std::nullopt, std::nullopt},
                 "unknown",
                 {"[TVR_ERR] Error! gethostname() failed err : 1 , using 'unknown' for hostname and IP address"}}),
    [](const auto& row) { return row.param.name; });

TEST(ComputerSystem, FailedUpcallFindsNothing)
{
    setHostNames({});
    Host host("empty");
    host.options.platformNamespaces = {};
    EXPECT_THAT(host.instancesOf("TVRHBA_ComputerSystemConformsToProfile"), SizeIs(13));
    EXPECT_THAT(bindingLog(host), ElementsAre("[TVR_DBG] up-call to enumerate CIM_ComputerSystem started",
                                              "[TVR_DBG] up-call to enumerate CIM_ComputerSystem created--calling now",
                                              "[TVR_INFO] up-call to enumerate CIM_ComputerSystem created",
                                              "[TVR_DBG] up-call method failed", "[TVR_DBG] Host Name : tavrin-host",
                                              "[TVR_DBG] Host ipAddress : 192.0.2.17",
                                              "[TVR_DBG] All clear -created tvrhba computer system instance",
                                              "[TVR_DBG] up-call to enumerate CIM_Chassis started",
                                              "[TVR_DBG] up-call to enumerate CIM_Chassis created--calling now",
                                              "[TVR_DBG] up-call method to get the chassis is failed"));
    host.unload();
}

constexpr const char* platform = R"({"instances": [
    {"class": "IBMSD_ComputerSystem", "properties": {"CreationClassName": "IBMSD_ComputerSystem", "Name": "first"}},
    {"class": "IBMSD_ComputerSystem", "properties": {"CreationClassName": "IBMSD_ComputerSystem", "Name": "second"}},
    {"class": "IBMSD_Chassis", "properties": {"CreationClassName": "IBMSD_Chassis", "Tag": "rack 4"}}]})";

TEST(ComputerSystem, ThatOfThePlatformStandsForTheHost)
{
    setHostNames({});
    Host host;
    broker::loadPlatform(host.broker().store(), host.broker().classes(), platform);
    const char* const system =
        R"(root/ibmse:IBMSD_ComputerSystem.Name="first",CreationClassName="IBMSD_ComputerSystem")";

    EXPECT_THAT(ends(host, "TVRHBA_SystemDevice", "GroupComponent"), AllOf(SizeIs(4), Each(system)));
    EXPECT_THAT(ends(host, "TVRHBA_HostedCollection", "Antecedent"), AllOf(SizeIs(4), Each(system)));
    EXPECT_THAT(ends(host, "TVRHBA_ChassisContainsCard", "GroupComponent"),
                AllOf(SizeIs(2), Each(R"(root/ibmse:IBMSD_Chassis.Tag="rack 4",CreationClassName="IBMSD_Chassis")")));
    for (const broker::Object& device : host.instancesOf("TVRHBA_PCIDevice"))
    {
        EXPECT_EQ(text(device, "SystemCreationClassName"), "IBMSD_ComputerSystem");
        EXPECT_EQ(text(device, "SystemName"), "first");
    }
    EXPECT_EQ(text(host.instancesOf("TVRHBA_RecordLog").back(), "InstanceID"), "TVRHBA:ProviderLog:first");

    // The platform answers for the profiles of its own system; the profiles themselves are there.
    EXPECT_THAT(host.instancesOf("TVRHBA_ComputerSystemConformsToProfile"), IsEmpty());
    EXPECT_GE(host.instancesOf("TVRHBA_RegisteredProfile").size(), 13u);
    std::vector<std::string> lines = {"[TVR_DBG] up-call to enumerate CIM_ComputerSystem started",
                                      "[TVR_DBG] up-call to enumerate CIM_ComputerSystem created--calling now",
                                      "[TVR_DBG] up-call to enumerate CIM_ComputerSystem started",
                                      "[TVR_DBG] up-call - found the correct CIM_ComputerSystem to link",
                                      "[TVR_INFO] up-call to enumerate CIM_ComputerSystem created",
                                      "[TVR_DBG] All clear -created tvrhba computer system instance",
                                      "[TVR_DBG] up-call to enumerate CIM_Chassis started",
                                      "[TVR_DBG] up-call to enumerate CIM_Chassis created--calling now",
                                      "[TVR_DBG] up-call to enumerate CIM_Chassis started",
                                      "[TVR_DBG] up-call - found the correct CIM_Chassis to link"};
    lines.resize(lines.size() + 13, "[TVR_DBG] This is IBM/VMWare comp Sys - do nothing");
    EXPECT_THAT(bindingLog(host), ElementsAreArray(lines));
    host.unload();
}

TEST(ComputerSystem, AssociatorsReachThePlatform)
{
    Host host;
    broker::loadPlatform(host.broker().store(), host.broker().classes(), platform);
    const broker::Object device = host.instancesOf("TVRHBA_PCIDevice").at(0);
    const broker::Reply reply = host.broker().associators(device.path, {.assocClass = "TVRHBA_SystemDevice"});
    ASSERT_THAT(reply.objects, SizeIs(1)) << reply.message;
    EXPECT_EQ(reply.objects[0].path.nameSpace, "root/ibmse");
    EXPECT_EQ(text(reply.objects[0], "Name"), "first");
    host.unload();
}

} // namespace
