// What goes to which provider, what comes back, and loading and unloading.
#include "tests/unit/broker/FakeModule.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <thread>

namespace
{

using namespace broker;
using namespace broker_test;
using testing::ElementsAre;
using testing::HasSubstr;

CMPIStatus done(const Call& call)
{
    return CMReturnDone(call.result);
}

/// Serves one instance named after the provider's class.
CMPIStatus serveOne(const Call& call)
{
    CMPIInstance* instance = newBase(call, call.className.c_str());
    CMReturnInstance(call.result, instance);
    return done(call);
}

CMPIStatus serveOneName(const Call& call)
{
    CMReturnObjectPath(call.result, newBasePath(call, call.className.c_str()));
    return done(call);
}

TEST(Dispatch, EnumerationAsksEachSubclassByItsOwnName)
{
    Fixture fixture;
    fixture.on("enumerateInstances", serveOne);
    fixture.on("enumerateInstanceNames", serveOneName);
    const Reply reply = fixture.broker->enumerateInstances(ns, "tst_base");
    ASSERT_TRUE(reply.ok()) << reply.message;
    ASSERT_EQ(reply.objects.size(), 2U);
    EXPECT_EQ(reply.objects[0].path, basePath("TST_Base"));
    EXPECT_EQ(reply.objects[1].path, basePath("TST_Disk", "TST_Disk"));
    EXPECT_EQ(fixture.broker->enumerateInstanceNames(ns, "TST_Disk").paths.size(), 1U);
    EXPECT_EQ(fixture.violations(), "");
}

TEST(Dispatch, NamespacesAndClassesMustExist)
{
    Fixture fixture;
    fixture.on("enumerateInstances", serveOne);
    Broker& b = *fixture.broker;
    EXPECT_EQ(b.enumerateInstances("root/nowhere", "TST_Base").status, CMPI_RC_ERR_INVALID_NAMESPACE);
    EXPECT_EQ(b.enumerateInstances(ns, "Nope").status, CMPI_RC_ERR_INVALID_CLASS);
    // The module's classes exist where they are registered only.
    EXPECT_EQ(b.enumerateInstances("root/ibmse", "TST_Base").status, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(b.getInstance({ns, "Nope", {}}).status, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(b.associators({ns, "Nope", {}}).status, CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(b.associators(basePath("a"), {.assocClass = "Nope"}).status, CMPI_RC_ERR_INVALID_PARAMETER);
    EXPECT_TRUE(fixture.module->made.empty());
}

TEST(Dispatch, OneFailureFailsTheWholeOperation)
{
    Fixture fixture;
    fixture.on("enumerateInstances",
               [](const Call& call)
               {
                   return call.className == "TST_Disk"
                              ? CMPIStatus{CMPI_RC_ERR_ACCESS_DENIED, CMNewString(call.mb, "locked", nullptr)}
                              : serveOne(call);
               });
    const Reply reply = fixture.broker->enumerateInstances(ns, "TST_Base");
    EXPECT_EQ(reply.status, CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(reply.message, "TST_Disk: locked");
    EXPECT_TRUE(reply.objects.empty());
}

/// A server that streams cannot keep what a provider made for all results of a call.
TEST(Dispatch, SinksGetResultsOneByOneAndMayForgetTheirObjects)
{
    for (const bool forgets : {false, true})
    {
        Fixture fixture;
        std::string late;
        fixture.on("enumerateInstanceNames",
                   [&](const Call& call)
                   {
                       const CMPIObjectPath* early = newBasePath(call, "early");
                       const CMPIObjectPath* second = nullptr;
                       const CMPIObjectPath* used = nullptr;
                       for (int i = 0; i < 1000; i++)
                       {
                           const CMPIObjectPath* path = newBasePath(call, "1");
                           second = i == 1 ? path : second;
                           used = i == 2 ? path : used;
                           CMReturnObjectPath(call.result, path);
                           if (used)
                               CMGetClassName(used, nullptr);
                       }
                       EXPECT_TRUE(CMGetClassName(early, nullptr));
                       EXPECT_TRUE(CMGetClassName(used, nullptr));
                       EXPECT_EQ(CMGetClassName(second, nullptr) != nullptr, !forgets);
                       CMReturnDone(call.result);
                       return ok;
                   });
        std::size_t taken = 0;
        const auto take = [&](Path&&)
        {
            taken++;
            return true;
        };
        EXPECT_TRUE(fixture.broker->enumerateInstanceNames(ns, "TST_Disk", {take, forgets}).ok());
        EXPECT_EQ(taken, 1000u);
        EXPECT_EQ(fixture.violations().empty(), !forgets) << fixture.violations();
    }
}

TEST(Dispatch, AssociationsFanOutToWhatCanReferToTheClass)
{
    for (const auto& [personality, expected] : {std::pair{strict, "(null)"}, {openGroup, "TST_Link"}})
    {
        Fixture fixture({.personality = personality});
        std::vector<std::string> seen;
        const auto note = [&](const Call& call)
        {
            seen.push_back(call.operation + " " + call.assocClass + " " + call.role);
            return done(call);
        };
        for (const char* operation : {"associators", "associatorNames", "references", "referenceNames"})
        {
            fixture.on(operation, note);
        }
        Broker& b = *fixture.broker;
        const Path disk = basePath("d", "TST_Disk"); // a subclass of what Left refers to
        EXPECT_TRUE(b.associators(disk).ok());
        EXPECT_TRUE(b.associatorNames(disk, {.assocClass = "TST_Link", .role = "Left"}).ok());
        EXPECT_TRUE(b.references(disk).ok());
        EXPECT_TRUE(b.referenceNames(disk, {.assocClass = "TST_Base"}).ok()); // no association derives from it
        EXPECT_THAT(seen,
                    ElementsAre(std::string("associators ") + expected + " (null)", "associatorNames TST_Link Left",
                                std::string("references ") + expected + " (null)"));
        EXPECT_TRUE(b.associators({ns, "IBMSD_ComputerSystem", {}}).ok());
        EXPECT_EQ(seen.size(), 3U);
        EXPECT_EQ(fixture.violations(), "");
    }
}

TEST(Dispatch, RequestsCarryKeysAndPropertiesAsServersPassThem)
{
    for (const auto& [personality, type] : {std::pair{openGroup, CMPI_sint64}, {smallFootprint, CMPI_uint64}})
    {
        Fixture fixture({.personality = personality});
        fixture.on("getInstance",
                   [type = type](const Call& call)
                   {
                       const CMPIData number = CMGetKey(call.path, "number", nullptr);
                       EXPECT_EQ(number.type, type);
                       EXPECT_EQ(number.state, CMPI_keyValue);
                       EXPECT_EQ(number.value.uint64, 7U);
                       EXPECT_STREQ(call.properties[0], "Ratio");
                       EXPECT_EQ(call.properties[1], nullptr);
                       CMPIInstance* port = CMNewInstance(call.mb, call.path, nullptr);
                       EXPECT_EQ(CMGetProperty(port, "Number", nullptr).type, CMPI_uint16);
                       CMReturnInstance(call.result, port);
                       return done(call);
                   });
        const Path port{ns,
                        "TST_Port",
                        {{"Number", Value::uint16(7)}, {"Up", Value::boolean(false)}, {"Name", Value::string("p")}}};
        const Reply reply = fixture.broker->getInstance(port, std::vector<std::string>{"Ratio"});
        ASSERT_TRUE(reply.ok());
        EXPECT_EQ(reply.objects.front().path, port);
        EXPECT_EQ(fixture.violations(), "");
    }
}

TEST(Dispatch, ContextTellsUserNamespaceAndFlags)
{
    for (const auto& [personality, principal] : {std::pair{strict, "root"}, {smallFootprint, nullptr}, {openGroup, ""}})
    {
        Fixture fixture({.personality = personality});
        fixture.on("deleteInstance",
                   [principal = principal](const Call& call)
                   {
                       const CMPIData user = CMGetContextEntry(call.ctx, CMPIPrincipal, nullptr);
                       EXPECT_EQ(user.type, CMPI_string);
                       EXPECT_STREQ(CMGetCharsPtr(user.value.string, nullptr), principal);
                       const CMPIData space = CMGetContextEntry(call.ctx, CMPIInitNameSpace, nullptr);
                       EXPECT_STREQ(CMGetCharsPtr(space.value.string, nullptr), ns);
                       EXPECT_EQ(CMGetContextEntry(call.ctx, CMPIInvocationFlags, nullptr).type, CMPI_uint32);
                       return done(call);
                   });
        EXPECT_TRUE(fixture.broker->deleteInstance(basePath("a")).ok());
        EXPECT_EQ(fixture.violations(), "");
    }
}

TEST(Dispatch, MethodsPassArgumentsBothWays)
{
    Fixture fixture;
    fixture.on("invokeMethod",
               [](const Call& call)
               {
                   EXPECT_EQ(call.method, "Add");
                   CMPIValue value{};
                   value.uint32 = CMGetArg(call.in, "a", nullptr).value.uint32 + 1;
                   CMAddArg(call.out, "Sum", &value, CMPI_uint32);
                   CMPIValue list{};
                   list.array = CMNewArray(call.mb, 2, CMPI_string, nullptr);
                   CMPIValue note{};
                   note.string = CMNewString(call.mb, "one", nullptr);
                   CMSetArrayElementAt(list.array, 0, &note, CMPI_string);
                   CMAddArg(call.out, "Notes", &list, CMPI_stringA);
                   value.uint32 = 0;
                   CMReturnData(call.result, &value, CMPI_uint32);
                   return done(call);
               });
    const MethodReply reply = fixture.broker->invokeMethod(basePath("a"), "Add", {{"A", Value::uint32(41)}});
    ASSERT_TRUE(reply.ok());
    EXPECT_EQ(reply.returnValue, Value::uint32(0));
    EXPECT_THAT(
        reply.out,
        ElementsAre(Property{"Sum", Value::uint32(42)},
                    Property{"Notes", Value::array(CMPI_string, {Value::string("one"), Value::null(CMPI_string)})}));
    EXPECT_EQ(fixture.violations(), "");
}

TEST(Dispatch, UpcallsReachTheStoreAndOtherProviders)
{
    Fixture fixture;
    Object system{{"root/ibmse", "IBMSD_ComputerSystem", {}},
                  {{"CreationClassName", Value::string("c")}, {"Name", Value::string("box")}}};
    ASSERT_TRUE(fixture.broker->createInstance(system).ok());
    fixture.on("getInstance", serveOne);
    fixture.on("enumerateInstances",
               [](const Call& call)
               {
                   CMPIStatus rc{};
                   CMPIObjectPath* path = CMNewObjectPath(call.mb, "root/ibmse", "IBMSD_ComputerSystem", nullptr);
                   CMPIEnumeration* found = CBEnumInstances(call.mb, call.ctx, path, nullptr, &rc);
                   EXPECT_EQ(rc.rc, CMPI_RC_OK);
                   EXPECT_TRUE(CMHasNext(found, nullptr));
                   const CMPIData element = CMGetNext(found, nullptr);
                   EXPECT_EQ(element.type, CMPI_instance);
                   const CMPIData name = CMGetProperty(element.value.inst, "Name", nullptr);
                   EXPECT_STREQ(CMGetCharsPtr(name.value.string, nullptr), "box");
                   EXPECT_FALSE(CMHasNext(found, nullptr));

                   CMPIInstance* other = CBGetInstance(call.mb, call.ctx, newBasePath(call, "x"), nullptr, &rc);
                   EXPECT_EQ(rc.rc, CMPI_RC_OK);
                   CMReturnInstance(call.result, other);

                   CBEnumInstances(call.mb, call.ctx, CMNewObjectPath(call.mb, "root/no", "TST_Base", nullptr), nullptr,
                                   &rc);
                   EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_NAMESPACE);
                   CBEnumInstances(call.mb, call.ctx, CMNewObjectPath(call.mb, ns, "Nope", nullptr), nullptr, &rc);
                   EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_CLASS);
                   return done(call);
               });
    EXPECT_EQ(fixture.broker->enumerateInstances(ns, "TST_Disk").objects.size(), 1U);
    EXPECT_EQ(fixture.violations(), "");
}

TEST(Loading, FactoriesAreCalledAsTheServerDoes)
{
    for (const auto& [personality, expected] :
         {std::pair{openGroup, std::vector<std::string>{"TST_Link Instance"}},
          {smallFootprint, std::vector<std::string>{"TST_Link Instance", "TST_Link Association"}}})
    {
        Fixture fixture({.personality = personality});
        fixture.on("enumerateInstances", done);
        EXPECT_TRUE(fixture.broker->enumerateInstances(ns, "TST_Link").ok());
        EXPECT_TRUE(fixture.broker->enumerateInstances(ns, "TST_Link").ok());
        EXPECT_EQ(fixture.module->made, expected);
    }
    Fixture fixture;
    EXPECT_TRUE(fixture.broker->loadProvider("TST_Base", {Kind::method, Kind::instance}).ok());
    EXPECT_THAT(fixture.module->made, ElementsAre("TST_Base Method", "TST_Base Instance"));
    EXPECT_EQ(fixture.broker->loadProvider("TST_Base", {Kind::association}).status, CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(fixture.broker->loadProvider("Nope", {Kind::instance}).status, CMPI_RC_ERR_INVALID_CLASS);
}

TEST(Loading, CleanupAnswersDecideWhatStaysLoaded)
{
    Fixture fixture;
    CMPIrc answer = CMPI_RC_DO_NOT_UNLOAD;
    fixture.on("enumerateInstances", done);
    fixture.on("cleanup", [&](const Call&) { return CMPIStatus{answer, nullptr}; });
    Broker& b = *fixture.broker;
    b.enumerateInstances(ns, "TST_Disk");
    EXPECT_EQ(b.cleanup("TST_Disk", false).front().status, CMPI_RC_DO_NOT_UNLOAD);
    b.enumerateInstances(ns, "TST_Disk");
    EXPECT_EQ(fixture.module->made.size(), 1U);
    answer = CMPI_RC_OK;
    EXPECT_EQ(b.cleanup("", false).size(), 1U);
    EXPECT_TRUE(b.cleanup("", false).empty());
    b.enumerateInstances(ns, "TST_Disk");
    EXPECT_EQ(fixture.module->made.size(), 2U);
}

TEST(Loading, UnloadCleansUpAndClosesTheModule)
{
    for (const auto& [personality, expected] : {std::pair{openGroup, 3}, {smallFootprint, 2}})
    {
        Fixture fixture({.personality = personality});
        int cleanups = 0;
        fixture.on("cleanup",
                   [&](const Call& call)
                   {
                       EXPECT_TRUE(call.terminating);
                       ++cleanups;
                       return ok;
                   });
        Broker& b = *fixture.broker;
        b.loadProvider("TST_Base", {Kind::instance, Kind::method});
        b.loadProvider("TST_Disk", {Kind::instance});
        b.unload();
        EXPECT_EQ(cleanups, expected);
        EXPECT_EQ(fixture.module.use_count(), 1); // the broker let go of it
        EXPECT_FALSE(b.loaded());
        EXPECT_EQ(b.enumerateInstances(ns, "TST_Base").status, CMPI_RC_ERR_FAILED);
        EXPECT_TRUE(b.classes().find("TST_Base"));
        EXPECT_EQ(fixture.violations(), "");
    }
}

TEST(Threads, SixtyFourClientsAtOnce)
{
    Fixture fixture;
    std::atomic<int> running{0};
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   ++running;
                   CMPIStatus rc{};
                   CMPIInstance* instance = CBGetInstance(call.mb, call.ctx, newBasePath(call, "x"), nullptr, &rc);
                   CMReturnInstance(call.result, instance);
                   return done(call);
               });
    fixture.on("getInstance", serveOne);
    std::atomic<int> good{0};
    std::vector<std::thread> clients;
    for (int i = 0; i < 64; ++i)
    {
        clients.emplace_back(
            [&]
            {
                for (int round = 0; round < 20; ++round)
                {
                    good += fixture.broker->enumerateInstances(ns, "TST_Base").objects.size() == 2;
                }
            });
    }
    for (std::thread& client : clients)
    {
        client.join();
    }
    EXPECT_EQ(good, 64 * 20);
    EXPECT_EQ(running, 2 * 64 * 20);
    EXPECT_EQ(fixture.module->made.size(), 2U); // each provider once
    EXPECT_EQ(fixture.violations(), "");
}

} // namespace
