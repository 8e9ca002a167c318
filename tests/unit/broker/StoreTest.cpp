// The store of platform instances, by itself and behind the broker.
#include "tests/unit/broker/FakeModule.h"

#include "broker/core/Store.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using namespace broker;
using broker_test::Fixture;
using broker_test::testClasses;
using testing::HasSubstr;

constexpr const char* platform = R"({"instances": [
  {"class": "IBMSD_ComputerSystem",
   "properties": {"CreationClassName": "IBMSD_ComputerSystem", "Name": "box"}}]})";

Object systemNamed(const std::string& name)
{
    Object object;
    object.path = {"root/ibmse", "IBMSD_ComputerSystem", {}};
    object.set("CreationClassName", Value::string("IBMSD_ComputerSystem"));
    object.set("Name", Value::string(name));
    return object;
}

TEST(Store, KeepsOneInstanceForAKey)
{
    Store store(testClasses());
    const NamesReply made = store.create(systemNamed("box"));
    ASSERT_TRUE(made.ok());
    EXPECT_EQ(made.paths.front().keys.size(), 2U);
    EXPECT_EQ(store.create(systemNamed("box")).status, CMPI_RC_ERR_ALREADY_EXISTS);
    EXPECT_TRUE(store.create(systemNamed("other")).ok());
    EXPECT_EQ(store.enumerate("ROOT/ibmse", "ibmsd_computersystem").size(), 2U);
    EXPECT_EQ(store.enumerate("root/tavrin", "IBMSD_ComputerSystem").size(), 0U);
    ASSERT_TRUE(store.remove(made.paths.front()).ok());
    EXPECT_EQ(store.remove(made.paths.front()).status, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(store.get(made.paths.front()).status, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(store.size(), 1U);
}

TEST(Store, FillsDefaultsAndRefusesWhatTheClassLacks)
{
    Store store(testClasses());
    const Path path = store.create(systemNamed("box")).paths.front();
    EXPECT_EQ(store.get(path).objects.front().get("ElementName"), Value::string("host"));
    Object wrong = systemNamed("x");
    wrong.set("Colour", Value::string("red"));
    EXPECT_EQ(store.create(wrong).status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    Object keyless = systemNamed("x");
    keyless.properties.pop_back();
    EXPECT_EQ(store.create(keyless).status, CMPI_RC_ERR_INVALID_PARAMETER);
    keyless.path.className = "Nope";
    EXPECT_EQ(store.create(keyless).status, CMPI_RC_ERR_INVALID_CLASS);
}

TEST(Store, ModifyChangesTheListedPropertiesAndNoKey)
{
    Store store(testClasses());
    Object change = systemNamed("box");
    change.path = store.create(change).paths.front();
    change.set("ElementName", Value::string("new"));
    change.set("Name", Value::string("renamed"));
    EXPECT_TRUE(store.modify(change, std::vector<std::string>{"Name"}).ok());
    EXPECT_EQ(store.get(change.path).objects.front().get("ElementName"), Value::string("host"));
    EXPECT_TRUE(store.modify(change, std::nullopt).ok());
    EXPECT_EQ(store.get(change.path).objects.front().get("ElementName"), Value::string("new"));
    EXPECT_EQ(store.get(change.path).objects.front().get("Name"), Value::string("box"));
    EXPECT_EQ(store.modify(change, std::vector<std::string>{"Colour"}).status, CMPI_RC_ERR_NO_SUCH_PROPERTY);
}

TEST(Store, PlatformFilesSayWhatIsWrong)
{
    Store store(testClasses());
    loadPlatform(store, testClasses(), platform);
    EXPECT_EQ(store.enumerate("root/ibmse", "IBMSD_ComputerSystem").size(), 1U);
    const auto refusal = [&](const char* text)
    {
        try
        {
            loadPlatform(store, testClasses(), text);
        }
        catch (const std::runtime_error& error)
        {
            return std::string(error.what());
        }
        return std::string();
    };
    EXPECT_THAT(refusal("{"), HasSubstr("\"instances\""));
    EXPECT_THAT(refusal(R"({"instances": {}})"), HasSubstr("\"instances\""));
    EXPECT_THAT(refusal(R"({"instances": [{"class": "Nope"}]})"), HasSubstr("'Nope'"));
    EXPECT_THAT(refusal(platform), HasSubstr("exists"));
    EXPECT_THROW(loadPlatformFile(store, testClasses(), "/nonexistent"), std::runtime_error);
}

TEST(Store, ServesClassesWithoutAProviderThroughTheBroker)
{
    Fixture fixture;
    Broker& b = *fixture.broker;
    const NamesReply made = b.createInstance(systemNamed("box"));
    ASSERT_TRUE(made.ok()) << made.message;
    const Path path = made.paths.front();
    EXPECT_EQ(b.enumerateInstanceNames("root/ibmse", "IBMSD_ComputerSystem").paths.size(), 1U);
    const Reply some = b.getInstance(path, std::vector<std::string>{"elementname"});
    ASSERT_TRUE(some.ok());
    EXPECT_EQ(some.objects.front().properties.size(), 1U);
    EXPECT_EQ(some.objects.front().path.keys.size(), 2U);
    EXPECT_TRUE(b.deleteInstance(path).ok());
    EXPECT_EQ(b.getInstance(path).status, CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(b.invokeMethod(path, "Start").status, CMPI_RC_ERR_METHOD_NOT_AVAILABLE);
    EXPECT_EQ(fixture.violations(), "");
}

TEST(Store, TheTwoNamesOfTheInteropNamespaceAreOne)
{
    Fixture fixture({.platformNamespaces = {"root/ibmse", "root/pg_interop"}});
    Object object = systemNamed("box");
    object.path.nameSpace = "root/interop";
    ASSERT_TRUE(fixture.broker->createInstance(object).ok());
    const Reply reply = fixture.broker->enumerateInstances("root/PG_InterOp", "IBMSD_ComputerSystem");
    ASSERT_EQ(reply.objects.size(), 1U);
    EXPECT_EQ(reply.objects.front().path.nameSpace, "root/PG_InterOp");
}

} // namespace
