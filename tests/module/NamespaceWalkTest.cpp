// Walks across namespaces: management tools find a provider's profiles in the interop namespace and follow them to the
// hardware, whose classes live elsewhere.
#include "tests/module/Clock.h"
#include "tests/module/Host.h"
#include "tests/module/RefreshLines.h"
#include "tests/module/Walk.h"

#include "broker/values/PathText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

using namespace module_test;
using namespace std::chrono_literals;
using broker::AssociationFilter;
using broker::Object;
using broker::Path;

namespace
{

constexpr const char* interop = "root/pg_interop";

class NamespaceWalk : public testing::TestWithParam<bool>
{
protected:
    NamespaceWalk()
    {
        if (GetParam())
            addPlatform(host.broker());
    }

    /// Filters that lead along the association. One server's interop namespace lets only its own name through.
    std::vector<AssociationFilter> filters(const std::string& association, const std::string& role) const
    {
        std::vector<AssociationFilter> all = {{association, "", "", ""}, {association, "", role, ""}};
        if (!host.options.personality.ownInterop)
            for (const char* other : {"", "CIM_ElementConformsToProfile"})
                all.push_back({other, "", role, ""});
        return all;
    }

    Path profile(const std::string& name)
    {
        const broker::Reply profiles = host.broker().enumerateInstances(interop, "TVRHBA_RegisteredProfile");
        EXPECT_TRUE(profiles.ok()) << profiles.message;
        for (const Object& object : profiles.objects)
            if (text(object, "InstanceID") == "TVR:" + name)
                return object.path;
        ADD_FAILURE() << "no profile " << name;
        return {};
    }

    /// Follows the source and expects instances at these paths, each as its own server has it, where it has one.
    std::vector<Object> follow(const Path& source, const AssociationFilter& filter, const std::string& className,
                               const std::string& nameSpace)
    {
        SCOPED_TRACE(broker::fullPathText(source) + " by " + filter.assocClass + " as " + filter.role);
        broker::Reply found = host.broker().associators(source, filter);
        EXPECT_TRUE(found.ok()) << broker::statusName(found.status) << " " << found.message;
        std::erase_if(found.objects, [&](const Object& object) { return object.path.className != className; });
        for (const Object& object : found.objects)
        {
            EXPECT_TRUE(broker::sameName(object.path.nameSpace, nameSpace)) << broker::fullPathText(object.path);
            EXPECT_GT(object.properties.size(), object.path.keys.size()) << "an instance without properties";
        }

        broker::NamesReply names = host.broker().associatorNames(source, filter);
        EXPECT_TRUE(names.ok()) << names.message;
        std::erase_if(names.paths, [&](const Path& path) { return path.className != className; });
        EXPECT_EQ(identities(names.paths), identities(pathsOf(found.objects)));
        return std::move(found.objects);
    }

    Host host;
};

TEST_P(NamespaceWalk, LeadsFromAProfileToTheCardsAndBack)
{
    const Path physicalAsset = profile("Physical Asset");
    for (const AssociationFilter& filter : filters("TVRHBA_CardConformsToProfile", "ConformantStandard"))
    {
        const std::vector<Object> cards = follow(physicalAsset, filter, "TVRHBA_Card", "root/tavrin");
        ASSERT_EQ(cards.size(), 2u);
        for (const Object& card : cards)
        {
            EXPECT_TRUE(host.broker().getInstance(card.path).ok());
            for (const std::string role : {"", "ManagedElement"})
            {
                const auto profiles = follow(card.path, {"TVRHBA_CardConformsToProfile", "", role, ""},
                                             "TVRHBA_RegisteredProfile", interop);
                ASSERT_EQ(profiles.size(), 1u);
                EXPECT_EQ(identity(profiles[0].path), identity(physicalAsset));
            }
        }
    }
    for (const char* nameSpace : {interop, "root/tavrin"})
    {
        const broker::Reply references = host.broker().enumerateInstances(nameSpace, "TVRHBA_CardConformsToProfile");
        ASSERT_EQ(references.objects.size(), 2u) << nameSpace;
        for (const Object& reference : references.objects)
        {
            EXPECT_EQ(reference.get("ManagedElement").asPath().nameSpace, "root/tavrin");
            EXPECT_EQ(reference.get("ConformantStandard").asPath().nameSpace, interop);
        }
    }
    host.unload();
}

/// Nobody serves a computer system that the module made up; what the association holds of it is the answer.
TEST_P(NamespaceWalk, LeadsToTheSystemWhoeverServesIt)
{
    const bool platform = GetParam();
    const std::string system = platform ? "IBMSD_ComputerSystem" : "CIM_ComputerSystem";
    const std::string nameSpace = platform ? "root/ibmse" : "root/tavrin";
    const std::string chassis = platform ? "IBMSD_Chassis" : "CIM_Chassis";
    const Object device = host.instancesOf("TVRHBA_PCIDevice").at(0);
    EXPECT_EQ(follow(device.path, {"TVRHBA_SystemDevice"}, system, nameSpace).size(), 1u);
    const Object card = host.instancesOf("TVRHBA_Card").at(0);
    EXPECT_EQ(follow(card.path, {"TVRHBA_ChassisContainsCard"}, chassis, nameSpace).size(), 1u);
    EXPECT_EQ(follow(card.path, {}, chassis, nameSpace).size(), 1u) << "unfiltered";

    const Path registration = profile("Profile Registration");
    for (const AssociationFilter& filter : filters("TVRHBA_ComputerSystemConformsToProfile", "ConformantStandard"))
    {
        const std::vector<Object> systems = follow(registration, filter, system, nameSpace);
        ASSERT_EQ(systems.size(), platform ? 0u : 1u) << "a platform's system has profiles of its own";
        for (const Object& found : systems)
            EXPECT_EQ(text(found, "NameFormat"), "Other");
    }
    const broker::Reply cut =
        host.broker().associators(device.path, {"TVRHBA_SystemDevice"}, std::vector<std::string>{"Name"});
    ASSERT_EQ(cut.objects.size(), 1u) << cut.message;
    EXPECT_FALSE(cut.objects[0].get("Name").isNull());
    EXPECT_TRUE(cut.objects[0].get("ElementName").isNull()) << "not on the property list";
    host.unload();
}

struct Step
{
    const char* association;
    const char* role; ///< of where the step begins
    const char* to;
};

struct WalkRow
{
    const char* profile;
    std::vector<Step> steps;
};

const Step portOfController = {"TVRHBA_ControlledBy", "Antecedent", "TVRHBA_FCPort"};
const Step endpointOfPort = {"TVRHBA_DeviceSAPImplementation", "Antecedent", "TVRHBA_SCSIProtocolInitiatorEndpoint"};
const Step unitOfEndpoint = {"TVRHBA_SCSIInitiatorTargetStorageVolumePath", "Initiator", "TVRHBA_StorageVolume"};
const Step systemOfPort = {"TVRHBA_FCPortSystemDevice", "PartComponent", nullptr};

/// What implements each profile leads to the logical units behind it, or to the system that all belongs to.
const WalkRow walks[] = {
    {"FC HBA",
     {{"TVRHBA_PortControllerConformsToProfile", "ConformantStandard", "TVRHBA_PortController"},
      portOfController,
      endpointOfPort,
      unitOfEndpoint}},
    {"Storage HBA",
     {{"TVRHBA_PortControllerConformsToProfile", "ConformantStandard", "TVRHBA_PortController"},
      portOfController,
      systemOfPort}},
    {"FC Initiator Ports",
     {{"TVRHBA_FCPortConformsToProfile", "ConformantStandard", "TVRHBA_FCPort"}, endpointOfPort, unitOfEndpoint}},
    {"Host Discovered Resources",
     {{"TVRHBA_FCPortConformsToProfile", "ConformantStandard", "TVRHBA_FCPort"}, endpointOfPort, unitOfEndpoint}},
    {"Access Points", {{"TVRHBA_FCPortConformsToProfile", "ConformantStandard", "TVRHBA_FCPort"}, systemOfPort}},
    {"Physical Package",
     {{"TVRHBA_FCPortConformsToProfile", "ConformantStandard", "TVRHBA_FCPort"},
      {"TVRHBA_FCRealizes", "Dependent", "TVRHBA_PhysicalConnector"},
      {"TVRHBA_CardContainsConnector", "PartComponent", "TVRHBA_Card"}}},
    {"PCI Device",
     {{"TVRHBA_PCIElementConformsToProfile", "ConformantStandard", "TVRHBA_PCIDevice"},
      {"TVRHBA_SystemDevice", "PartComponent", nullptr}}},
};

TEST_P(NamespaceWalk, LeadsFromEachProfileToAUnitOrTheSystemAndBack)
{
    const std::string system = GetParam() ? "IBMSD_ComputerSystem" : "CIM_ComputerSystem";
    const std::string platformNamespace = GetParam() ? "root/ibmse" : "root/tavrin";
    for (const WalkRow& row : walks)
    {
        SCOPED_TRACE(row.profile);
        Path here = profile(row.profile);
        for (const Step& step : row.steps)
        {
            const std::string to = step.to ? step.to : system;
            const std::string& nameSpace = step.to ? "root/tavrin" : platformNamespace;
            const std::vector<Object> found = follow(here, {step.association, "", step.role, ""}, to, nameSpace);
            if (here.nameSpace != interop)
            {
                EXPECT_EQ(identities(pathsOf(follow(here, {"", "", step.role, ""}, to, nameSpace))).size() >=
                              found.size(),
                          true)
                    << "unfiltered";
            }
            ASSERT_FALSE(found.empty()) << step.association << " leads nowhere";
            if (nameSpace == "root/ibmse") // the module's associations are not served there
                break;
            const std::vector<Object> back =
                follow(found[0].path, {step.association, "", "", ""}, here.className, here.nameSpace);
            EXPECT_THAT(identities(pathsOf(back)), testing::Contains(identity(here))) << step.association;
            here = found[0].path;
        }
    }
    host.unload();
}

INSTANTIATE_TEST_SUITE_P(Hosts, NamespaceWalk, testing::Bool(),
                         [](const auto& row) { return row.param ? "WithPlatform" : "WithoutPlatform"; });

/// One server lets a single up-call of the module through at a time. Clients whose answers need up-calls meet refreshes
/// that need them too.
TEST(UpcallChannel, RefreshesAndAssociatorsShareIt)
{
    Host host;
    host.options.personality = broker::openGroup;
    host.options.upcallWait = 10s;
    addPlatform(host.broker());
    stopClock();
    const Path card = host.instancesOf("TVRHBA_Card").at(0).path;
    ASSERT_TRUE(host.awaitRefresh());

    constexpr unsigned rounds = 240; // of which many meet in one refresh
    std::atomic<unsigned> failures{0};
    std::vector<std::thread> clients;
    for (unsigned client = 0; client < 4; client++)
        clients.emplace_back(
            [&]
            {
                for (unsigned round = 0; round < rounds && failures == 0; round++)
                {
                    advanceClock(10min);
                    const broker::Reply reply = host.broker().associators(card, {"", "CIM_PhysicalElement", "", ""});
                    failures += !reply.ok();
                }
            });
    for (std::thread& client : clients)
        client.join();
    EXPECT_EQ(failures, 0u) << "an up-call waited for one that waited for the refresh, which waited for it";
    EXPECT_GT(host.logged(begun), 15u);
    host.unload();
}

} // namespace
