// The registered profiles and their references, which need no refresh.
#include "tests/module/Describe.h"
#include "tests/module/Walk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace module_test;
using testing::ElementsAreArray;
using testing::IsEmpty;

namespace
{

constexpr const char* interop = "root/pg_interop";

const std::vector<std::string> all = {
    "Profile Registration",
    "Software Inventory",
    "Physical Package",
    "Host Discovered Resources",
    "FC HBA",
    "Storage HBA",
    "FC Initiator Ports",
    "Software Update",
    "Record Log",
    "Software",
    "Access Points",
    "PCI Device",
    "FCHBA Diagnostics",
    "Physical Asset",
};
/// Neither the registration itself nor the last.
const std::vector<std::string> referring(all.begin() + 1, all.end() - 1);

std::vector<broker::Object> enumerated(Host& host, const std::string& className)
{
    broker::Reply reply = host.broker().enumerateInstances(interop, className);
    EXPECT_TRUE(reply.ok()) << reply.message;
    for (const broker::Object& object : reply.objects)
        EXPECT_EQ(object.path.nameSpace, interop);
    return std::move(reply.objects);
}

/// The profile at an end, by its name.
std::string endOf(const broker::Object& reference, const char* role)
{
    const broker::Path& path = reference.get(role).asPath();
    EXPECT_EQ(path.nameSpace, interop);
    return path.className + " " + path.key("InstanceID")->asString();
}

void expectProfiles(Host& host)
{
    std::vector<std::string> names;
    for (const broker::Object& profile : enumerated(host, "TVRHBA_RegisteredProfile"))
        names.push_back(text(profile, "RegisteredName"));
    EXPECT_THAT(names, ElementsAreArray(all));

    std::vector<std::string> dependents;
    for (const broker::Object& reference : enumerated(host, "TVRHBA_ReferencedProfile"))
    {
        EXPECT_EQ(endOf(reference, "Antecedent"), "TVRHBA_RegisteredProfile TVR:Profile Registration");
        dependents.push_back(endOf(reference, "Dependent"));
    }
    std::vector<std::string> expected;
    for (const std::string& name : referring)
        expected.push_back("TVRHBA_RegisteredProfile TVR:" + name);
    EXPECT_THAT(dependents, ElementsAreArray(expected));
}

TEST(ProfileProviders, AnswerFromTheirTable)
{
    Host host;
    addPlatform(host.broker());
    expectProfiles(host);
    const broker::Object update = theOne(host, "TVRHBA_RegisteredProfile", "RegisteredName", "Software Update");
    EXPECT_EQ(describe(update), R"(
AdvertiseTypeDescriptions = {"SLP"}
AdvertiseTypes = {3}
Description = "Tavrin Software Update"
ElementName = "Tavrin Registered Software Update"
InstanceID = "TVR:Software Update"
RegisteredName = "Software Update"
RegisteredOrganization = 2
RegisteredVersion = "1.0.0"
)");

    std::vector<std::string> antecedents, expected;
    for (const broker::Object& reference : enumerated(host, "TVRHBA_BaseServerReferencedProfile"))
    {
        EXPECT_EQ(endOf(reference, "Dependent"), "PG_RegisteredProfile base-server");
        antecedents.push_back(endOf(reference, "Antecedent"));
    }
    for (const std::string& name : referring)
        expected.push_back("TVRHBA_RegisteredProfile TVR:" + name);
    EXPECT_THAT(antecedents, ElementsAreArray(expected));
    EXPECT_THAT(logAbout(host, {"OMC_RegisteredBaseServerProfile"}),
                testing::ElementsAre(
                    "[TVR_DBG] up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile started",
                    "[TVR_DBG] up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile Passed"));
    EXPECT_EQ(host.logged("[TVR_DBG] PERF: updateAdapterMaps"), 0u) << "no refresh was asked for";
    host.unload();
}

TEST(ProfileProviders, AnswerWithoutBaseServerAndWithoutLibraries)
{
    Host host("default", {false, false, false});
    expectProfiles(host);
    EXPECT_THAT(enumerated(host, "TVRHBA_BaseServerReferencedProfile"), IsEmpty());
    EXPECT_EQ(host.logged("[TVR_DBG] up-call to enumerate OMC_RegisteredBaseServerProfile/PG_RegisteredProfile failed"),
              1u);
    host.unload();
}

} // namespace
