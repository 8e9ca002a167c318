// What a provider and a client meet in each of the servers that the broker plays: one table for a manner.
#include "tests/unit/broker/FakeModule.h"

#include "broker/core/Registration.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <set>
#include <thread>

#include <unistd.h>

namespace
{

using namespace broker;
using namespace broker_test;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

CMPIStatus done(const Call& call)
{
    return CMReturnDone(call.result);
}

/// Runs an enumeration of TST_Disk with this body in its provider.
Reply enumerateWith(Fixture& fixture, const std::function<void(const Call&)>& body,
                    const PropertyList& properties = std::nullopt)
{
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   body(call);
                   return done(call);
               });
    return fixture.broker->enumerateInstances(ns, "TST_Disk", properties);
}

/// Runs the body on a thread of the provider that is attached as it must be.
void onAttachedThread(const Call& call, const std::function<void(const Call&)>& body, CMPIrc detached)
{
    Call own = call;
    own.ctx = CBPrepareAttachThread(call.mb, call.ctx);
    std::thread(
        [&]
        {
            CBAttachThread(own.mb, own.ctx);
            body(own);
            EXPECT_EQ(CBDetachThread(own.mb, own.ctx).rc, detached);
        })
        .join();
}

CMPIrc upcall(const Call& call)
{
    CMPIStatus rc{};
    CBEnumInstances(call.mb, call.ctx, CMNewObjectPath(call.mb, "root/ibmse", "IBMSD_ComputerSystem", nullptr), nullptr,
                    &rc);
    return rc.rc;
}

class Manners : public testing::TestWithParam<Personality>
{};

INSTANTIATE_TEST_SUITE_P(Servers, Manners, testing::ValuesIn(personalities),
                         [](const auto& info)
                         {
                             std::string name = info.param.name;
                             std::erase(name, '-');
                             return name;
                         });

// --- the broker pointer --------------------------------------------------------------------------------

TEST(Personalities, TablesHaveTheVersionsAndSlotsOfTheServer)
{
    const struct
    {
        Personality personality;
        const char* name;
        unsigned version;
        int objects, services;
        bool allServices, marks;
        CMPIrc log;
    } rows[] = {{strict, "tvrcim", 100, 100, 100, true, false, CMPI_RC_OK},
                {smallFootprint, "RequestHandler", 0, 1, 200, false, true, CMPI_RC_ERR_NOT_SUPPORTED},
                {openGroup, "Pegasus", 200, 200, 200, true, false, CMPI_RC_OK}};
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.name);
        Fixture fixture({.personality = row.personality});
        std::set<const CMPIBroker*> pointers;
        fixture.on("enumerateInstances",
                   [&](const Call& call)
                   {
                       pointers.insert(call.mb);
                       EXPECT_STREQ(call.mb->bft->brokerName, row.name);
                       EXPECT_EQ(call.mb->bft->brokerVersion, row.version);
                       for (const int version : {call.mb->eft->ftVersion, call.ctx->ft->ftVersion,
                                                 call.result->ft->ftVersion, call.path->ft->ftVersion})
                       {
                           EXPECT_EQ(version, row.objects);
                       }
                       const CMPIBrokerExtFT& services = *call.mb->xft;
                       EXPECT_EQ(services.ftVersion, row.services);
                       EXPECT_EQ(services.joinThread && services.exitThread && services.cancelThread &&
                                     services.threadSleep && services.signalCondition,
                                 row.allServices);
                       EXPECT_TRUE(services.newThread && services.newMutex);
                       EXPECT_EQ(cimple::broker_memory(call.mb) != nullptr, row.marks);
                       EXPECT_EQ(call.mb->eft->logMessage(call.mb, 1, "id", "text", nullptr).rc, row.log);
                       return done(call);
                   });
        fixture.broker->enumerateInstances(ns, "TST_Base");
        EXPECT_EQ(pointers.size(), row.personality.pointerForEach ? 2U : 1U);
        EXPECT_EQ(fixture.violations(), "");
    }
    EXPECT_EQ(findPersonality("open-group")->objectVersion, 200);
    EXPECT_EQ(findPersonality("another"), nullptr);
}

// --- properties ----------------------------------------------------------------------------------------

TEST(Personalities, WrongPropertiesAreAnsweredAsTheServerDoes)
{
    const struct
    {
        Personality personality;
        CMPIrc unknown, changed, wrong, text, nullOfNoType;
        std::size_t shown; ///< properties of the instance at the end
        const char* violation;
    } rows[] = {
        {strict, CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_RC_ERR_NO_SUCH_PROPERTY, CMPI_RC_ERR_INVALID_DATA_TYPE,
         CMPI_RC_ERR_INVALID_DATA_TYPE, CMPI_RC_ERR_INVALID_DATA_TYPE, 1, "which class TST_Disk lacks"},
        {smallFootprint, CMPI_RC_OK, CMPI_RC_ERR_TYPE_MISMATCH, CMPI_RC_OK, CMPI_RC_ERR_FAILED, CMPI_RC_OK, 3,
         "'Level' is uint16, not string: the server crashes"},
        {openGroup, CMPI_RC_OK, CMPI_RC_OK, CMPI_RC_ERR_INVALID_DATA_TYPE, CMPI_RC_ERR_INVALID_DATA_TYPE,
         CMPI_RC_ERR_INVALID_DATA_TYPE, 2, ""},
    };
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.personality.name);
        Fixture fixture({.personality = row.personality});
        enumerateWith(fixture,
                      [&](const Call& call)
                      {
                          CMPIInstance* instance = newBase(call, "a");
                          CMPIValue value{};
                          value.uint32 = 5;
                          const auto* text = reinterpret_cast<const CMPIValue*>("5");
                          EXPECT_EQ(CMSetProperty(instance, "Colour", &value, CMPI_uint32).rc, row.unknown);
                          EXPECT_EQ(CMSetProperty(instance, "Colour", text, CMPI_chars).rc, row.changed);
                          EXPECT_EQ(CMSetProperty(instance, "Level", &value, CMPI_uint32).rc, row.wrong);
                          EXPECT_EQ(CMSetProperty(instance, "Level", text, CMPI_chars).rc, row.text);
                          EXPECT_EQ(CMSetProperty(instance, "Level", nullptr, CMPI_null).rc, row.nullOfNoType);
                          EXPECT_EQ(CMGetPropertyCount(instance, nullptr), row.shown);
                      });
        EXPECT_THAT(fixture.violations(), HasSubstr(row.violation));
        EXPECT_EQ(fixture.violations().empty(), std::strlen(row.violation) == 0);
    }
}

TEST_P(Manners, NewInstancesHaveTheSchemasDefaults)
{
    Fixture fixture({.personality = GetParam()});
    const Reply reply =
        enumerateWith(fixture, [](const Call& call) { CMReturnInstance(call.result, newBase(call, "a")); });
    ASSERT_EQ(reply.objects.size(), 1U);
    EXPECT_EQ(reply.objects[0].get("Level"), GetParam().schemaDefaults ? Value::uint16(3) : Value());
}

TEST_P(Manners, PropertyListsAreObeyedByTheInstanceOrByTheBroker)
{
    const bool byBroker = GetParam().propertyFilters == PropertyFilters::broker;
    for (const bool withKeys : {true, false})
    {
        Fixture fixture({.personality = GetParam()});
        const Reply reply = enumerateWith(
            fixture,
            [&](const Call& call)
            {
                static const char* keys[] = {"Id", nullptr};
                CMPIInstance* instance = newBase(call, "a");
                CMSetPropertyFilter(instance, call.properties, withKeys ? keys : nullptr);
                CMPIValue value{};
                value.uint64 = 7;
                CMSetProperty(instance, "Size", &value, CMPI_uint64);
                EXPECT_EQ(CMIsNullValue(CMGetProperty(instance, "Size", nullptr)), !byBroker);
                CMReturnInstance(call.result, instance);
            },
            std::vector<std::string>{"level"});
        ASSERT_EQ(reply.objects.size(), 1U);
        EXPECT_FALSE(reply.objects[0].has("Size") || reply.objects[0].has("Id"));
        EXPECT_EQ(reply.objects[0].path.keys.size(), withKeys || byBroker ? 1U : 0U);
    }
}

TEST_P(Manners, NullElementsOfStringArraysReachTheClientOrNot)
{
    Fixture fixture({.personality = GetParam()});
    const Reply reply = enumerateWith(fixture,
                                      [](const Call& call)
                                      {
                                          CMPIInstance* instance = newBase(call, "a");
                                          CMPIValue list{};
                                          list.array = CMNewArray(call.mb, 2, CMPI_string, nullptr);
                                          CMPIValue text{};
                                          text.string = CMNewString(call.mb, "x", nullptr);
                                          CMSetArrayElementAt(list.array, 1, &text, CMPI_string);
                                          CMSetProperty(instance, "Names", &list, CMPI_stringA);
                                          CMReturnInstance(call.result, instance);
                                      });
    const std::map<NullElements, Value::List> expected = {
        {NullElements::kept, {Value::null(CMPI_string), Value::string("x")}},
        {NullElements::left_out, {Value::string("x")}},
        {NullElements::empty_text, {Value::string(""), Value::string("x")}}};
    ASSERT_EQ(reply.objects.size(), 1U);
    EXPECT_EQ(reply.objects[0].get("Names").asList(), expected.at(GetParam().nullElements));
}

/// A client's text in the place of a number ends the server that does not look at it.
TEST_P(Manners, TextThatAClientPutIntoANumber)
{
    Fixture fixture({.personality = GetParam()});
    fixture.on("modifyInstance",
               [](const Call& call)
               {
                   CMGetProperty(call.instance, "Level", nullptr);
                   return done(call);
               });
    fixture.broker->modifyInstance({basePath("a"), {{"Level", Value::string("ten")}}});
    const bool crashes = GetParam().wrongProperties == WrongProperties::accepted;
    EXPECT_THAT(fixture.violations(),
                HasSubstr(crashes ? "'Level', in which a client put text: the server crashes" : ""));
    EXPECT_EQ(fixture.violations().empty(), !crashes);
}

// --- requests ------------------------------------------------------------------------------------------

/// A registration file with TST_Base and TST_Link in the interop namespace too, and none for TST_Port.
std::string registrationFile()
{
    const std::string path = testing::TempDir() + "personality-" + std::to_string(getpid()) + ".reg";
    std::ofstream(path) << "# comment\n[TST_Base]\n   provider: TST_Base\n   location: fake\n   type: instance method\n"
                           "   namespace: root/tavrin root/interop\n#\n"
                           "[TST_Disk]\n   provider: TST_Disk\n   namespace: root/tavrin\n#\n"
                           "[TST_Link]\n   provider: TST_Link\n   namespace: root/tavrin root/interop\n#\n";
    return path;
}

TEST(Personalities, ClassesAreServedWhereTheyAreRegistered)
{
    const struct
    {
        Personality personality;
        std::vector<std::string> interop; ///< names of the interop namespace
        std::vector<std::string> unknown;
    } rows[] = {{strict, {"interop", "root/interop", "root/pg_interop", "root/PG_InterOp"}, {"root/nowhere"}},
                {smallFootprint, {"root/interop", "root/pg_interop"}, {"interop", "root/nowhere"}},
                {openGroup, {"root/PG_InterOp", "ROOT/pg_interop"}, {"interop", "root/interop", "root/nowhere"}}};
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.personality.name);
        Fixture fixture({.registration = registrationFile(), .personality = row.personality});
        Broker& b = *fixture.broker;
        std::vector<std::string> asked;
        fixture.on("enumerateInstances",
                   [&](const Call& call)
                   {
                       asked.push_back(call.className);
                       CMPIStatus rc{};
                       CBGetInstance(call.mb, call.ctx, call.path, nullptr, &rc); // served, though not for this
                       EXPECT_EQ(rc.rc, CMPI_RC_ERR_NOT_SUPPORTED);
                       CMPIObjectPath* disk = CMNewObjectPath(call.mb, "root/PG_InterOp", "TST_Disk", nullptr);
                       CBGetInstance(call.mb, call.ctx, disk, nullptr, &rc);
                       EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_CLASS);
                       return done(call);
                   });
        for (const std::string& name : row.interop)
        {
            asked.clear();
            EXPECT_TRUE(b.enumerateInstances(name, "TST_Base").ok()) << name;
            EXPECT_THAT(asked, ElementsAre("TST_Base"));
            EXPECT_EQ(b.enumerateInstances(name, "TST_Disk").status, CMPI_RC_ERR_INVALID_CLASS);
            EXPECT_EQ(b.getInstance(Path{name, "TST_Port", {}}).status, CMPI_RC_ERR_INVALID_CLASS);
        }
        for (const std::string& name : row.unknown)
        {
            EXPECT_EQ(b.enumerateInstances(name, "TST_Base").status, CMPI_RC_ERR_INVALID_NAMESPACE) << name;
        }
        asked.clear();
        EXPECT_TRUE(b.enumerateInstances(ns, "TST_Base").ok());
        EXPECT_THAT(asked, ElementsAre("TST_Base", "TST_Disk"));
        EXPECT_THAT(b.nameSpacesOf("TST_Link"), ElementsAre("root/tavrin", "root/pg_interop"));
        EXPECT_THAT(b.nameSpacesOf("TST_Port"), IsEmpty());
    }
}

TEST(Personalities, RegistrationsMustBeWhole)
{
    EXPECT_EQ(parseRegistration("[A]\n provider: P\n namespace: a/b c\n").at("a").nameSpaces.size(), 2U);
    EXPECT_THROW(parseRegistration("[A]\n provider: P\n"), std::runtime_error);
    EXPECT_THROW(parseRegistration("[A]\n namespace: a\n"), std::runtime_error);
    EXPECT_THROW(readRegistration("/nonexistent"), std::runtime_error);
}

/// What the interop namespace has of its own is in the way of associations of the module.
TEST_P(Manners, AssociationsOfTheInteropNamespace)
{
    Fixture fixture({.registration = registrationFile(), .personality = GetParam()});
    fixture.on("references", done);
    Path base = basePath("a");
    base.nameSpace = "root/pg_interop";
    EXPECT_EQ(fixture.broker->references(base).status, GetParam().ownInterop ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
    EXPECT_EQ(fixture.broker->references(base, {.assocClass = "tst_link"}).status, CMPI_RC_OK);
    EXPECT_EQ(fixture.broker->references(basePath("a")).status, CMPI_RC_OK);
}

TEST_P(Manners, EmptyKeysArriveAsNull)
{
    Fixture fixture({.personality = GetParam()});
    const auto stateOf = [](const CMPIObjectPath* path, const char* key)
    { return CMGetKey(path, key, nullptr).state & CMPI_nullValue; };
    const unsigned null = GetParam().nullForEmptyKeys ? CMPI_nullValue : 0;
    fixture.on("references",
               [&](const Call& call)
               {
                   EXPECT_EQ(stateOf(call.path, "Id"), null);
                   return done(call);
               });
    fixture.on("deleteInstance",
               [&](const Call& call)
               {
                   if (call.className == "TST_Link")
                   {
                       EXPECT_EQ(stateOf(CMGetKey(call.path, "Left", nullptr).value.ref, "Id"), null);
                   }
                   else
                   {
                       EXPECT_EQ(stateOf(call.path, "Id"), 0);
                   }
                   return done(call);
               });
    EXPECT_TRUE(fixture.broker->references(basePath("")).ok());
    EXPECT_TRUE(fixture.broker->deleteInstance(basePath("")).ok());
    EXPECT_TRUE(fixture.broker->deleteInstance({ns, "TST_Link", {{"Left", Value::reference(basePath(""))}}}).ok());
    const Path bare{ns, "TST_Link", {{"Left", Value::reference({"", "TST_Base", {}})}}};
    EXPECT_EQ(fixture.broker->getInstance(bare).status,
              GetParam().bareReferences ? CMPI_RC_ERR_NOT_SUPPORTED : CMPI_RC_ERR_INVALID_CLASS);
    EXPECT_EQ(fixture.violations(), "");
}

TEST_P(Manners, OneOfSeveralThatDoesNotSupportTheRequest)
{
    Fixture fixture({.personality = GetParam()});
    std::vector<const char**> lists;
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   EXPECT_EQ(call.properties != nullptr, GetParam().listOfSuperclass && lists.size() < 2);
                   lists.push_back(call.properties);
                   return call.className == "TST_Disk" ? CMPIStatus{CMPI_RC_ERR_NOT_SUPPORTED, nullptr} : done(call);
               });
    EXPECT_EQ(fixture.broker->enumerateInstances(ns, "TST_Base").ok(), GetParam().skipsNotSupported);
    EXPECT_EQ(fixture.broker->enumerateInstances(ns, "TST_Disk").status, CMPI_RC_ERR_NOT_SUPPORTED);
}

TEST_P(Manners, ArgumentsThatAreNullOrMissing)
{
    Fixture fixture({.personality = GetParam()});
    fixture.on("invokeMethod",
               [](const Call& call)
               {
                   CMPIStatus rc{};
                   EXPECT_EQ(CMGetArgCount(call.in, nullptr), GetParam().nullArguments ? 1U : 0U);
                   CMGetArg(call.in, "Nope", &rc);
                   EXPECT_EQ(rc.rc, GetParam().missingArgument);
                   const CMPIValue value{};
                   CMReturnData(call.result, &value, CMPI_uint32);
                   return done(call);
               });
    EXPECT_TRUE(fixture.broker->invokeMethod(basePath("a"), "Add", {{"A", Value::null(CMPI_uint32)}}).ok());
    EXPECT_EQ(fixture.violations(), "");
}

// --- up-calls ------------------------------------------------------------------------------------------

TEST_P(Manners, ValidDataOfAnEnumerationMayCarryTheStateOfANull)
{
    Fixture fixture({.personality = GetParam()});
    fixture.broker->createInstance({{"root/ibmse", "IBMSD_ComputerSystem", {}},
                                    {{"CreationClassName", Value::string("c")}, {"Name", Value::string("box")}}});
    enumerateWith(fixture,
                  [](const Call& call)
                  {
                      CMPIObjectPath* path = CMNewObjectPath(call.mb, "root/ibmse", "IBMSD_ComputerSystem", nullptr);
                      CMPIEnumeration* found = CBEnumInstances(call.mb, call.ctx, path, nullptr, nullptr);
                      const CMPIData data = CMGetNext(found, nullptr);
                      EXPECT_TRUE(data.value.inst);
                      EXPECT_EQ(CMIsNullValue(data), GetParam().nullStates);
                      EXPECT_FALSE(CMHasNext(found, nullptr));
                  });
    EXPECT_EQ(fixture.violations(), "");
}

/// The server without marks needs none; in the other one a thread with up-calls must end between them.
TEST_P(Manners, ThreadsWithUpcallsEndWithTheirMarksReleased)
{
    const struct
    {
        const char* name;
        bool marks, upcalls, releases;
        bool survives;
    } rows[] = {{"marked and released", true, true, true, true},
                {"never marked", false, true, false, false},
                {"never released", true, true, false, false},
                {"without up-calls", false, false, false, true}};
    for (const auto& row : rows)
    {
        SCOPED_TRACE(row.name);
        Fixture fixture({.personality = GetParam()});
        enumerateWith(fixture,
                      [&](const Call& call)
                      {
                          const cimple::Broker_Memory_FT* memory = cimple::broker_memory(call.mb);
                          onAttachedThread(
                              call,
                              [&](const Call& own)
                              {
                                  const void* mark = memory && row.marks ? memory->mark(own.mb, nullptr) : nullptr;
                                  EXPECT_EQ(row.upcalls ? upcall(own) : CMPI_RC_OK, CMPI_RC_OK);
                                  CMPIString* text = CMNewString(own.mb, "made under the mark", nullptr);
                                  if (mark && row.releases)
                                  {
                                      EXPECT_EQ(memory->release(own.mb, mark).rc, CMPI_RC_OK);
                                      EXPECT_EQ(CMGetCharsPtr(text, nullptr), nullptr);
                                      fixture.broker->clearViolations();
                                  }
                              },
                              row.survives || !GetParam().marks ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
                      });
        const bool crashes = GetParam().marks && !row.survives;
        EXPECT_THAT(fixture.violations(), HasSubstr(crashes ? "the server crashes when the thread ends" : ""));
        EXPECT_EQ(fixture.violations().empty(), !crashes);
    }
}

/// While an up-call runs, with what it calls in turn, one from another thread waits, in vain if nothing frees the way.
TEST_P(Manners, OneUpcallAtATime)
{
    Fixture fixture({.personality = GetParam(), .upcallWait = std::chrono::milliseconds(0)});
    fixture.on("getInstance",
               [&](const Call& call)
               {
                   EXPECT_EQ(upcall(call), CMPI_RC_OK) << "within the up-call";
                   onAttachedThread(
                       call,
                       [](const Call& own)
                       { EXPECT_EQ(upcall(own), GetParam().oneUpcall ? CMPI_RC_ERROR_SYSTEM : CMPI_RC_OK); },
                       GetParam().marks ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
                   CMReturnInstance(call.result, newBase(call, "a"));
                   return done(call);
               });
    enumerateWith(fixture,
                  [](const Call& call)
                  {
                      CMPIStatus rc{};
                      CBGetInstance(call.mb, call.ctx, newBasePath(call, "a"), nullptr, &rc);
                      EXPECT_EQ(rc.rc, CMPI_RC_OK);
                      onAttachedThread(
                          call, [](const Call& own) { EXPECT_EQ(upcall(own), CMPI_RC_OK) << "after it"; },
                          GetParam().marks ? CMPI_RC_ERR_FAILED : CMPI_RC_OK);
                  });
}

} // namespace
