// Breaches of the CMPI contract, each seen and named.
#include "tests/unit/broker/FakeModule.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

namespace
{

using namespace broker;
using namespace broker_test;
using testing::HasSubstr;

/// Runs an enumeration of TST_Base's own provider with this body and returns the violations.
std::string breachesOf(const std::function<void(const Call&)>& body, Options options = {})
{
    Fixture fixture(std::move(options));
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   if (call.className == "TST_Base")
                   {
                       body(call);
                   }
                   return CMReturnDone(call.result);
               });
    fixture.broker->enumerateInstances(ns, "TST_Base");
    fixture.broker->unload();
    return fixture.violations();
}

CMPIValue number(unsigned value)
{
    CMPIValue result{};
    result.uint32 = value;
    return result;
}

TEST(Strictness, PropertiesMustBelongToTheClassWithTheirTypes)
{
    const std::string text = breachesOf(
        [](const Call& call)
        {
            CMPIInstance* instance = newBase(call, "a");
            const CMPIValue value = number(5);
            EXPECT_EQ(CMSetProperty(instance, "Level", &value, CMPI_uint16).rc, CMPI_RC_OK);
            EXPECT_EQ(CMSetProperty(instance, "Colour", &value, CMPI_uint16).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
            EXPECT_EQ(CMSetProperty(instance, "Level", &value, CMPI_uint32).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
            EXPECT_EQ(CMSetProperty(instance, "Level", nullptr, CMPI_uint16).rc, CMPI_RC_OK);
            EXPECT_EQ(CMSetProperty(instance, "Level", nullptr, CMPI_null).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
            CMPIValue path{};
            path.ref = newBasePath(call, "b"); // Next refers to a port
            EXPECT_EQ(CMSetProperty(instance, "Next", &path, CMPI_ref).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
            EXPECT_EQ(CMSetProperty(instance, "Names", reinterpret_cast<const CMPIValue*>("a"), CMPI_chars).rc,
                      CMPI_RC_ERR_INVALID_DATA_TYPE);
        });
    EXPECT_THAT(text, HasSubstr("enumerateInstances TST_Base: setProperty 'Colour', which class TST_Base lacks"));
    EXPECT_THAT(text, HasSubstr("'Level' is uint16, not uint32"));
    EXPECT_THAT(text, HasSubstr("'Next' holds a TST_Port, not a TST_Base"));
    EXPECT_THAT(text, HasSubstr("'Names' is string[], not string"));
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 5);
}

TEST(Strictness, ReturnedPathsNeedAllKeys)
{
    const std::string text = breachesOf(
        [](const Call& call)
        {
            CMReturnInstance(call.result,
                             CMNewInstance(call.mb, CMNewObjectPath(call.mb, ns, "TST_Base", nullptr), nullptr));
            CMPIInstance* pointing = newBase(call, "a");
            CMPIValue path{};
            path.ref = CMNewObjectPath(call.mb, ns, "TST_Port", nullptr);
            CMSetProperty(pointing, "Next", &path, CMPI_ref);
            CMReturnInstance(call.result, pointing);
            CMPIObjectPath* nowhere = newBasePath(call, "c");
            nowhere->ft->setNameSpace(nowhere, nullptr);
            CMReturnInstance(call.result, CMNewInstance(call.mb, nowhere, nullptr));
        });
    EXPECT_THAT(text, HasSubstr("a path of TST_Base without its key 'Id'"));
    EXPECT_THAT(text, HasSubstr("TST_Base.Next is a path of TST_Port without its key 'Number'"));
    EXPECT_THAT(text, HasSubstr("without a namespace"));
}

TEST(Strictness, KeysMustBelongToTheClass)
{
    const std::string text = breachesOf(
        [](const Call& call)
        {
            CMPIObjectPath* path = CMNewObjectPath(call.mb, ns, "TST_Port", nullptr);
            CMPIValue value{};
            value.uint64 = 9;
            EXPECT_EQ(CMAddKey(path, "Number", &value, CMPI_uint64).rc, CMPI_RC_OK); // as brokers pass integers
            value.uint64 = 70000;
            EXPECT_EQ(CMAddKey(path, "Number", &value, CMPI_uint64).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
            EXPECT_EQ(CMAddKey(path, "Ratio", &value, CMPI_real64).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        });
    EXPECT_THAT(text, HasSubstr("'Number' is uint16, not uint64"));
    EXPECT_THAT(text, HasSubstr("addKey 'Ratio', which is no key of TST_Port"));
}

TEST(Strictness, ResultsFitTheOperation)
{
    EXPECT_THAT(breachesOf([](const Call& call) { CMReturnObjectPath(call.result, newBasePath(call, "a")); }),
                HasSubstr("returnObjectPath in an operation that gives no such result"));
    const std::string late = breachesOf(
        [](const Call& call)
        {
            CMReturnDone(call.result);
            EXPECT_NE(CMReturnInstance(call.result, newBase(call, "a")).rc, CMPI_RC_OK);
        });
    EXPECT_THAT(late, HasSubstr("returnInstance after returnDone"));
    EXPECT_THAT(late, HasSubstr("returnDone for a second time"));
    EXPECT_THAT(breachesOf(
                    [](const Call& call)
                    {
                        CMPIObjectPath* system = CMNewObjectPath(call.mb, ns, "IBMSD_ComputerSystem", nullptr);
                        CMAddKey(system, "Name", reinterpret_cast<const CMPIValue*>("n"), CMPI_chars);
                        CMAddKey(system, "CreationClassName", reinterpret_cast<const CMPIValue*>("c"), CMPI_chars);
                        CMReturnInstance(call.result, CMNewInstance(call.mb, system, nullptr));
                    }),
                HasSubstr("returnInstance of class IBMSD_ComputerSystem where TST_Base was asked for"));
}

TEST(Strictness, SuccessNeedsDoneAndMethodsNeedData)
{
    Fixture fixture;
    fixture.on("deleteInstance", [](const Call&) { return ok; });
    fixture.on("invokeMethod", [](const Call& call) { return CMReturnDone(call.result); });
    fixture.on("getInstance", [](const Call& call) { return CMReturnDone(call.result); });
    fixture.on("modifyInstance", [](const Call&) { return ok; }); // gives nothing, so needs no end
    fixture.broker->deleteInstance(basePath("a"));
    EXPECT_THAT(fixture.violations(), HasSubstr("deleteInstance TST_Base: success without returnDone"));
    fixture.broker->invokeMethod(basePath("a"), "Add");
    EXPECT_THAT(fixture.violations(), HasSubstr("invokeMethod TST_Base.Add: success of a method without returnData"));
    EXPECT_EQ(fixture.broker->getInstance(basePath("a")).status, CMPI_RC_ERR_FAILED);
    EXPECT_THAT(fixture.violations(), HasSubstr("without an instance"));
    fixture.broker->clearViolations();
    EXPECT_TRUE(fixture.broker->modifyInstance({basePath("a"), {}}).ok());
    EXPECT_EQ(fixture.violations(), "");
}

TEST(Strictness, MethodsKeepToTheirDefinition)
{
    Fixture fixture;
    fixture.on("invokeMethod",
               [](const Call& call)
               {
                   const CMPIValue value = number(1);
                   EXPECT_EQ(CMAddArg(call.out, "A", &value, CMPI_uint32).rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
                   EXPECT_EQ(CMAddArg(call.out, "Sum", &value, CMPI_uint16).rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
                   CMReturnData(call.result, &value, CMPI_uint16);
                   CMReturnData(call.result, &value, CMPI_uint32);
                   return CMReturnDone(call.result);
               });
    fixture.broker->invokeMethod(basePath("a"), "Add");
    EXPECT_THAT(fixture.violations(), HasSubstr("addArg 'A', which is no output parameter of Add"));
    EXPECT_THAT(fixture.violations(), HasSubstr("'Sum' is uint32, not uint16"));
    EXPECT_THAT(fixture.violations(), HasSubstr("returnData of uint16 where Add returns uint32"));
    EXPECT_THAT(fixture.violations(), HasSubstr("returnData though the operation gives only one result"));
}

TEST(Objects, DieWithTheirRequest)
{
    Fixture fixture;
    CMPIString* kept = nullptr;
    CMPIInstance* instance = nullptr;
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   if (kept)
                   {
                       CMPIStatus rc{};
                       EXPECT_EQ(CMGetCharsPtr(kept, &rc), nullptr);
                       EXPECT_EQ(rc.rc, CMPI_RC_ERR_INVALID_HANDLE);
                       CMReturnInstance(call.result, instance);
                   }
                   kept = CMNewString(call.mb, "text", nullptr);
                   instance = newBase(call, "a");
                   return CMReturnDone(call.result);
               });
    fixture.broker->enumerateInstances(ns, "TST_Disk");
    EXPECT_EQ(fixture.violations(), "");
    fixture.broker->enumerateInstances(ns, "TST_Disk");
    EXPECT_THAT(fixture.violations(), HasSubstr("CMPIString.getCharPtr of an object whose request has ended"));
    EXPECT_THAT(fixture.violations(), HasSubstr("CMPIInstance.returnInstance of an object whose request has ended"));
}

TEST(Objects, ClonesLiveUntilTheyAreReleased)
{
    Fixture fixture;
    CMPIString* clone = nullptr;
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   clone = CMClone(CMNewString(call.mb, "text", nullptr), nullptr);
                   return CMReturnDone(call.result);
               });
    fixture.broker->enumerateInstances(ns, "TST_Disk");
    EXPECT_STREQ(CMGetCharsPtr(clone, nullptr), "text");
    EXPECT_EQ(fixture.broker->liveClones(), 1U);
    EXPECT_EQ(CMRelease(clone).rc, CMPI_RC_OK);
    EXPECT_EQ(fixture.violations(), "");
    EXPECT_EQ(CMRelease(clone).rc, CMPI_RC_ERR_INVALID_HANDLE);
    EXPECT_THAT(fixture.violations(), HasSubstr("release of a released clone"));
}

TEST(Objects, LeaksAndWrongReleasesAreReported)
{
    EXPECT_THAT(breachesOf([](const Call& call) { CMClone(newBasePath(call, "a"), nullptr); }),
                HasSubstr("a clone of a CMPIObjectPath was never released"));
    EXPECT_THAT(breachesOf([](const Call& call) { CMRelease(newBasePath(call, "a")); }),
                HasSubstr("CMPIObjectPath.release of an object that is no clone"));
    EXPECT_THAT(breachesOf([](const Call& call) { call.path->ft->getKeyCount(nullptr, nullptr); }),
                HasSubstr("getKeyCount of a null object"));
    EXPECT_THAT(breachesOf(
                    [](const Call& call)
                    {
                        CMPIString foreign{nullptr, CMNewString(call.mb, "", nullptr)->ft};
                        CMGetCharsPtr(&foreign, nullptr);
                    }),
                HasSubstr("no CMPIString of this broker"));
    EXPECT_THAT(breachesOf(
                    [](const Call& call)
                    {
                        const CMPIBroker copy = *call.mb;
                        CMNewString(&copy, "", nullptr);
                    }),
                HasSubstr("broker pointer that this provider was not given"));
}

TEST(Filter, DropsWhatIsNotListedAndHidesTheKeys)
{
    Fixture fixture;
    bool withKeys = true;
    fixture.on("enumerateInstances",
               [&](const Call& call)
               {
                   static const char* keys[] = {"Id", nullptr};
                   CMPIInstance* instance = newBase(call, "a");
                   const CMPIValue value = number(5);
                   CMSetPropertyFilter(instance, call.properties, withKeys ? keys : nullptr);
                   CMSetProperty(instance, "Level", &value, CMPI_uint16);
                   setString(instance, call.mb, "Id", "b");
                   CMPIValue list{};
                   list.array = CMNewArray(call.mb, 0, CMPI_string, nullptr);
                   CMSetProperty(instance, "Names", &list, CMPI_stringA);
                   CMReturnInstance(call.result, instance);
                   return CMReturnDone(call.result);
               });
    const std::vector<std::string> wanted{"level"};
    const Reply reply = fixture.broker->enumerateInstances(ns, "TST_Disk", wanted);
    ASSERT_EQ(reply.objects.size(), 1U);
    EXPECT_EQ(reply.objects.front(), (Object{basePath("b", "TST_Disk"), {{"Level", Value::uint16(5)}}}));
    EXPECT_EQ(fixture.violations(), "");
    withKeys = false; // the path goes with its keys
    fixture.broker->enumerateInstances(ns, "TST_Disk", wanted);
    EXPECT_THAT(fixture.violations(), HasSubstr("without its key 'Id'"));
}

TEST(ProviderThreads, AttachWithAPreparedContext)
{
    const std::string text = breachesOf(
        [](const Call& call)
        {
            CMPIContext* prepared = CBPrepareAttachThread(call.mb, call.ctx);
            std::thread(
                [&]
                {
                    EXPECT_EQ(CBAttachThread(call.mb, prepared).rc, CMPI_RC_OK);
                    CMPIStatus rc{};
                    CMPIObjectPath* path = CMNewObjectPath(call.mb, "root/ibmse", "IBMSD_ComputerSystem", nullptr);
                    CBEnumInstances(call.mb, prepared, path, nullptr, &rc);
                    EXPECT_EQ(rc.rc, CMPI_RC_OK);
                    EXPECT_EQ(CBDetachThread(call.mb, prepared).rc, CMPI_RC_OK);
                })
                .join();
        });
    EXPECT_EQ(text, "");
}

TEST(ProviderThreads, BreachesOfAttachmentAreReported)
{
    EXPECT_THAT(breachesOf(
                    [](const Call& call)
                    {
                        std::thread(
                            [&]
                            {
                                CMPIStatus rc{};
                                EXPECT_EQ(CBEnumInstances(call.mb, call.ctx, call.path, nullptr, &rc), nullptr);
                                EXPECT_EQ(rc.rc, CMPI_RC_ERR_FAILED);
                                EXPECT_EQ(CMNewString(call.mb, "", nullptr), nullptr);
                            })
                            .join();
                    }),
                HasSubstr("enumerateInstances on a thread that is not attached"));
    EXPECT_THAT(breachesOf([](const Call& call) { CBAttachThread(call.mb, call.ctx); }),
                HasSubstr("attachThread with a context that was not prepared"));
    EXPECT_THAT(breachesOf([](const Call& call) { CBPrepareAttachThread(call.mb, call.ctx); }),
                HasSubstr("1 prepared thread contexts were never detached"));
    EXPECT_THAT(breachesOf([](const Call& call) { CBDetachThread(call.mb, call.ctx); }),
                HasSubstr("detachThread with a context that is not attached"));
    EXPECT_THAT(breachesOf(
                    [](const Call& call)
                    {
                        CMPIStatus rc{};
                        CMPIContext* clone = call.ctx->ft->clone(call.ctx, nullptr);
                        CBEnumInstances(call.mb, clone, CMNewObjectPath(call.mb, "root/x", "TST_Base", nullptr),
                                        nullptr, &rc);
                        clone->ft->release(clone);
                    }),
                HasSubstr("with a context that is not the thread's current one"));
}

TEST(ProviderThreads, MarksAreCountedWhereTheyAreOffered)
{
    const auto takeMark = [](const Call& call)
    {
        const cimple::Broker_Memory_FT* table = cimple::broker_memory(call.mb);
        ASSERT_TRUE(table);
        void* mark = table->mark(call.mb, nullptr);
        EXPECT_EQ(table->release(call.mb, mark).rc, CMPI_RC_OK);
        table->mark(call.mb, nullptr);
    };
    EXPECT_EQ(breachesOf(takeMark, {.personality = smallFootprint}),
              "outside of a call: 1 marks were never released\n");
    EXPECT_EQ(breachesOf([](const Call& call) { EXPECT_EQ(cimple::broker_memory(call.mb), nullptr); }), "");
}

} // namespace
