// What operations answer that have no result, and the life of a class's adapter, seen at the CMPI boundary itself.
#include "broker/core/Core.h"
#include "broker/tables/BrokerTables.h"
#include "broker/tables/Marshal.h"
#include "runtime/adapter/CMPI_Adapter.h"
#include "tests/module/Walk.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <functional>
#include <map>
#include <set>

using namespace module_test;
using broker::Path;
using broker::Value;

namespace
{

// --- through the broker --------------------------------------------------------------------------------

TEST(Status, InstancesAreNotCreatedChangedOrDeleted)
{
    // What an instance without keys and values meets where there is such an operation.
    const std::map<std::string, CMPIrc> created = {{"TVRHBA_DriverParams", CMPI_RC_ERR_INVALID_PARAMETER}};
    const std::map<std::string, CMPIrc> deleted = {{"TVRHBA_DriverParams", CMPI_RC_ERR_NOT_FOUND}};
    const std::map<std::string, CMPIrc> modified = {{"TVRHBA_FCPort", CMPI_RC_ERR_INVALID_PARAMETER},
                                                    {"TVRHBA_ProviderConfigSetting", CMPI_RC_ERR_FAILED},
                                                    {"TVRHBA_DumpData", CMPI_RC_ERR_FAILED}};
    Host host;
    for (const std::string& className : host.broker().servedClasses())
    {
        SCOPED_TRACE(className);
        const broker::Object object{{"root/tavrin", className, {}}, {}};
        const auto expected = [&](const std::map<std::string, CMPIrc>& known)
        {
            const auto place = known.find(className);
            return place == known.end() ? CMPI_RC_ERR_NOT_SUPPORTED : place->second;
        };
        EXPECT_EQ(host.broker().createInstance(object).status, expected(created));
        EXPECT_EQ(host.broker().deleteInstance(object.path).status, expected(deleted));
        EXPECT_EQ(host.broker().modifyInstance(object).status, expected(modified));
    }
    host.unload();
}

TEST(Status, UnknownKeysAreNotFound)
{
    Host host;
    for (const std::string className : {"TVRHBA_Card", "TVRHBA_CardContainsChip", "TVRHBA_RegisteredProfile"})
    {
        SCOPED_TRACE(className);
        Path path = host.instancesOf(className).at(0).path;
        EXPECT_TRUE(host.broker().getInstance(path).ok());
        for (broker::Property& key : path.keys)
            if (key.value.type() == CMPI_string)
                key.value = Value::string(key.value.asString() + "x");
            else
                key.value = Value::reference(host.instancesOf("TVRHBA_Product").at(0).path);
        EXPECT_EQ(host.broker().getInstance(path).status, CMPI_RC_ERR_NOT_FOUND);
        path.keys.pop_back();
        EXPECT_EQ(host.broker().getInstance(path).status, CMPI_RC_ERR_NOT_FOUND);
    }
    host.unload();
}

TEST(Status, MethodsWithoutABodyAreRefused)
{
    Host host;
    const struct
    {
        const char* className;
        const char* method;
        CMPIrc status;
    } rows[] = {
        {"TVRHBA_Card", "IsCompatible", CMPI_RC_ERR_NOT_SUPPORTED},
        {"TVRHBA_SoftwareInstallationService", "StartService", CMPI_RC_ERR_NOT_SUPPORTED},
        {"TVRHBA_Card", "ISCOMPATIBLE", CMPI_RC_ERR_NOT_SUPPORTED},
        {"TVRHBA_Card", "NoSuchMethod", CMPI_RC_ERR_METHOD_NOT_FOUND},
        {"TVRHBA_CardContainsChip", "IsCompatible", CMPI_RC_ERR_METHOD_NOT_FOUND},
        {"TVRHBA_Card", "TVRHBA_Card", CMPI_RC_ERR_METHOD_NOT_FOUND},
        {"TVRHBA_Card", "Tag", CMPI_RC_ERR_METHOD_NOT_FOUND},
    };
    for (const auto& row : rows)
        EXPECT_EQ(host.broker().invokeMethod({"root/tavrin", row.className, {}}, row.method).status, row.status)
            << row.className << "." << row.method;
    host.unload();
}

// --- at the boundary -----------------------------------------------------------------------------------

/// The module behind a broker's tables, without what a broker does around a provider's functions.
class Boundary : public testing::Test
{
protected:
    using Factory = void*(const CMPIBroker*, const CMPIContext*, CMPIStatus*);

    /// What one call gave.
    struct Answer
    {
        CMPIrc status;
        std::vector<Path> paths;
        std::vector<broker::Object> objects;
        bool done;
    };

    Boundary() : core(std::make_unique<broker::Core>(host.options))
    {
        broker::fillProviderBroker(providerBroker, *core);
    }

    ~Boundary() override
    {
        for (const broker::CleanupAnswer& answer : core->providers.cleanup({}, true)) // loaded by up-calls
            EXPECT_EQ(answer.status, CMPI_RC_OK) << answer.className;
        for (const broker::Violation& violation : core->violations.all())
            ADD_FAILURE() << violation.text;
    }

    template <class MI> MI* make(const std::string& factory)
    {
        broker::CallFrame frame(*core, &providerBroker.cmpi, factory, {});
        CMPIStatus status{CMPI_RC_ERROR, nullptr};
        auto* function = reinterpret_cast<Factory*>(core->image->symbol(factory));
        auto* mi = function ? static_cast<MI*>(function(&providerBroker.cmpi, frame.context, &status)) : nullptr;
        EXPECT_NE(mi, nullptr) << factory;
        EXPECT_EQ(status.rc, CMPI_RC_ERROR) << "the status argument is not written";
        return mi;
    }

    template <class MI> CMPIrc cleanup(MI* mi, bool terminating = false)
    {
        broker::CallFrame frame(*core, &providerBroker.cmpi, "cleanup", {});
        return mi->ft->cleanup(mi, frame.context, terminating).rc;
    }

    /// Calls a function of a provider; `call` gets context, result and path.
    template <class Call> Answer ask(broker::ResultContent::Kind kind, const Path& path, Call call)
    {
        broker::CallFrame frame(*core, &providerBroker.cmpi, "call", {});
        Answer answer = {};
        auto* result = frame.make<broker::ResultHandle>({.kind = kind});
        result->content.objects.take = [&answer](broker::Object&& object)
        {
            answer.objects.push_back(std::move(object));
            return true;
        };
        result->content.paths.take = [&answer](Path&& taken)
        {
            answer.paths.push_back(std::move(taken));
            return true;
        };
        const CMPIStatus status = call(frame, result, broker::makePath(frame, path));
        EXPECT_EQ(status.msg, nullptr);
        answer.status = status.rc;
        answer.done = result->content.done;
        return answer;
    }

    template <class MI> static std::uint32_t magicOf(const MI* mi)
    {
        return static_cast<const cimple::Static_Adapter_Data*>(static_cast<const void*>(mi->hdl))->magic;
    }

    static constexpr auto names = broker::ResultContent::Kind::paths;
    static constexpr auto instances = broker::ResultContent::Kind::instances;
    static constexpr auto nothing = broker::ResultContent::Kind::nothing;

    Host host;
    std::unique_ptr<broker::Core> core;
    broker::ProviderBroker providerBroker{};
};

TEST_F(Boundary, AnAdapterLivesAsLongAsItsFactoriesAreNotCleanedUp)
{
    const std::string name = "TVRHBA_CardContainsChip";
    const std::string agentEnd = "[TVR_DBG] Entering dtor ~ProviderAgent()";
    const Path path{"root/tavrin", name, {}};
    for (unsigned life = 1; life <= 2; life++)
    {
        auto* instance = make<CMPIInstanceMI>(name + "_Create_InstanceMI");
        auto* method = make<CMPIMethodMI>(name + "_Provider_Create_MethodMI");
        auto* association = make<CMPIAssociationMI>(name + "_Create_AssociationMI");
        EXPECT_EQ(instance->hdl, method->hdl);
        EXPECT_EQ(instance->hdl, association->hdl);
        EXPECT_EQ(make<CMPIInstanceMI>(name + "_Provider_Create_InstanceMI"), instance);

        const Answer all = ask(names, path,
                               [&](auto& frame, auto* result, auto* target) {
                                   return instance->ft->enumerateInstanceNames(instance, frame.context, result, target);
                               });
        EXPECT_EQ(all.status, CMPI_RC_OK);
        EXPECT_TRUE(all.done);
        EXPECT_EQ(all.paths.size(), 2u);

        for (const auto& clean : std::initializer_list<std::function<CMPIrc()>>{[&] { return cleanup(method); },
                                                                                [&] { return cleanup(instance); },
                                                                                [&] { return cleanup(instance); }})
        {
            EXPECT_EQ(clean(), CMPI_RC_OK);
            EXPECT_EQ(magicOf(association), 0x5DE2B131u);
            EXPECT_EQ(host.logged(agentEnd), life - 1);
        }
        EXPECT_EQ(cleanup(association, life == 2), CMPI_RC_OK);
        EXPECT_EQ(magicOf(association), 0xDDDDDDDDu);
        EXPECT_EQ(host.logged("[TVR_DBG] ProviderAgent::addRef["), life);
        EXPECT_EQ(host.logged("[TVR_DBG] ProviderAgent::releaseRef["), life);
        EXPECT_EQ(host.logged(agentEnd), life);
    }
}

TEST_F(Boundary, TheInstanceTableHasTheNameOfTheAssociations)
{
    auto* instance = make<CMPIInstanceMI>("TVRHBA_Card_Create_InstanceMI");
    auto* method = make<CMPIMethodMI>("TVRHBA_Card_Create_MethodMI");
    EXPECT_STREQ(instance->ft->miName, "associationTVRHBA_Card_Provider");
    EXPECT_EQ(method->ft->miName, nullptr);
    for (const int version :
         {instance->ft->ftVersion, instance->ft->miVersion, method->ft->ftVersion, method->ft->miVersion})
        EXPECT_EQ(version, 100);
    EXPECT_EQ(cleanup(instance), CMPI_RC_OK);
    EXPECT_EQ(cleanup(method), CMPI_RC_OK);
}

TEST_F(Boundary, InstanceOperationsFailForClassesOutsideTheRepository)
{
    auto* mi = make<CMPIInstanceMI>("TVRHBA_Card_Create_InstanceMI");
    auto* method = make<CMPIMethodMI>("TVRHBA_Card_Create_MethodMI");
    const Path path{"root/tavrin", "TVRHBA_NoSuchClass", {{"Tag", Value::string("x")}}};
    using Call = std::function<CMPIStatus(broker::Frame&, CMPIResult*, CMPIObjectPath*)>;
    const std::pair<const char*, Call> calls[] = {
        {"names", [&](auto& f, auto* r, auto* p) { return mi->ft->enumerateInstanceNames(mi, f.context, r, p); }},
        {"enumerate",
         [&](auto& f, auto* r, auto* p) { return mi->ft->enumerateInstances(mi, f.context, r, p, nullptr); }},
        {"get", [&](auto& f, auto* r, auto* p) { return mi->ft->getInstance(mi, f.context, r, p, nullptr); }},
        {"create",
         [&](auto& f, auto* r, auto* p) {
             return mi->ft->createInstance(mi, f.context, r, p, broker::makeInstance(f, {path, {}}));
         }},
        {"modify",
         [&](auto& f, auto* r, auto* p) {
             return mi->ft->modifyInstance(mi, f.context, r, p, broker::makeInstance(f, {path, {}}), nullptr);
         }},
        {"delete", [&](auto& f, auto* r, auto* p) { return mi->ft->deleteInstance(mi, f.context, r, p); }},
        {"invoke",
         [&](auto& f, auto* r, auto* p)
         {
             auto* in = f.template make<broker::ArgsHandle>({});
             auto* out = f.template make<broker::ArgsHandle>({});
             return method->ft->invokeMethod(method, f.context, r, p, "IsCompatible", in, out);
         }},
    };
    for (const auto& [name, call] : calls)
    {
        const Answer answer = ask(instances, path, call);
        EXPECT_EQ(answer.status, CMPI_RC_ERR_FAILED) << name;
        EXPECT_TRUE(answer.objects.empty() && !answer.done) << name;
    }
    EXPECT_EQ(ask(nothing, path,
                  [&](auto& f, auto* r, auto* p)
                  { return mi->ft->execQuery(mi, f.context, r, p, "select * from TVRHBA_Card", "WQL"); })
                  .status,
              CMPI_RC_ERR_NOT_SUPPORTED);
    EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
    EXPECT_EQ(cleanup(method), CMPI_RC_OK);
}

/// The association operations of one provider, with the class filter that they share.
template <class Ask> std::vector<std::string> askAll(CMPIAssociationMI* mi, const char* assocClass, Ask ask)
{
    std::vector<std::string> counts;
    const auto count = [&](const char* name, const auto& answer)
    {
        EXPECT_EQ(answer.status, CMPI_RC_OK) << name;
        EXPECT_TRUE(answer.done) << name;
        counts.push_back(name + (" " + std::to_string(answer.paths.size() + answer.objects.size())));
    };
    using Kind = broker::ResultContent::Kind;
    count("associators",
          ask(Kind::instances, [&](auto& f, auto* r, auto* p)
              { return mi->ft->associators(mi, f.context, r, p, assocClass, nullptr, nullptr, nullptr, nullptr); }));
    count("associatorNames",
          ask(Kind::paths, [&](auto& f, auto* r, auto* p)
              { return mi->ft->associatorNames(mi, f.context, r, p, assocClass, nullptr, nullptr, nullptr); }));
    count("references", ask(Kind::instances, [&](auto& f, auto* r, auto* p)
                            { return mi->ft->references(mi, f.context, r, p, assocClass, nullptr, nullptr); }));
    count("referenceNames", ask(Kind::paths, [&](auto& f, auto* r, auto* p)
                                { return mi->ft->referenceNames(mi, f.context, r, p, assocClass, nullptr); }));
    return counts;
}

TEST_F(Boundary, AssociationsOfClassesOutsideTheRepositoryAreEmpty)
{
    auto* mi = make<CMPIAssociationMI>("TVRHBA_CardContainsChip_Create_AssociationMI");
    const Path path{"root/tavrin", "TVRHBA_NoSuchClass", {{"Tag", Value::string("x")}}};
    EXPECT_THAT(askAll(mi, nullptr, [&](auto kind, auto call) { return ask(kind, path, call); }),
                testing::ElementsAre("associators 0", "associatorNames 0", "references 0", "referenceNames 0"));
    EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
}

/// Servers leave the filter by class to the provider, and name the association's class or that of the ends.
TEST_F(Boundary, AssociationClassesAreThoseOfTheAdapterOrOfTheEnds)
{
    auto* mi = make<CMPIAssociationMI>("TVRHBA_CardContainsChip_Create_AssociationMI");
    auto* cards = make<CMPIInstanceMI>("TVRHBA_Card_Create_InstanceMI");
    const Answer all =
        ask(names, {"root/tavrin", "TVRHBA_Card", {}},
            [&](auto& f, auto* r, auto* p) { return cards->ft->enumerateInstanceNames(cards, f.context, r, p); });
    ASSERT_EQ(all.paths.size(), 2u);
    const struct
    {
        const char* assocClass;
        std::vector<std::string> counts;
    } rows[] = {
        {nullptr, {"associators 1", "associatorNames 1", "references 1", "referenceNames 1"}},
        {"", {"associators 1", "associatorNames 1", "references 1", "referenceNames 1"}},
        {"tvrhba_cardcontainschip", {"associators 1", "associatorNames 1", "references 1", "referenceNames 1"}},
        {"CIM_Component", {"associators 1", "associatorNames 1", "references 1", "referenceNames 1"}},
        {"TVRHBA_Chip", {"associators 1", "associatorNames 1", "references 0", "referenceNames 0"}},
        {"CIM_PhysicalElement", {"associators 1", "associatorNames 1", "references 0", "referenceNames 0"}},
        {"TVRHBA_Card", {"associators 0", "associatorNames 0", "references 0", "referenceNames 0"}},
        {"TVRHBA_CardContainsConnector", {"associators 0", "associatorNames 0", "references 0", "referenceNames 0"}},
    };
    for (const auto& row : rows)
        EXPECT_EQ(askAll(mi, row.assocClass, [&](auto kind, auto call) { return ask(kind, all.paths[0], call); }),
                  row.counts)
            << (row.assocClass ? row.assocClass : "null");
    EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
    EXPECT_EQ(cleanup(cards), CMPI_RC_OK);
}

// --- the runtime's log ---------------------------------------------------------------------------------

/// "FILE(LINE)" of the log's first line with this message.
std::string placeOf(const std::string& log, const std::string& message)
{
    const std::size_t end = log.find(": " + message + "\n");
    return end == std::string::npos ? "" : log.substr(0, end).substr(log.rfind(' ', end) + 1);
}

TEST(RuntimeLog, TracesOperationsWithTheirStatus)
{
    Host host;
    setenv("CIMPLE_HOME", host.root().c_str(), 1);
    host.write("/.cimplerc", "# comment\nLOG_LEVEL = dbg\n");
    const Path noCard{"root/tavrin", "TVRHBA_Card", {}};
    EXPECT_TRUE(host.enumerate("TVRHBA_Card").ok());
    host.broker().getInstance(noCard);
    host.broker().deleteInstance(noCard);
    host.broker().createInstance({noCard, {}});
    host.broker().invokeMethod(noCard, "NoSuchMethod");
    host.unload();

    const std::string log = host.read("/.cimple/messages");
    std::size_t at = 0;
    for (const char* text : {"enter: enumInstances()", "return: enumInstances(): CMPI_RC_OK", "enter: getInstance()",
                             "return: getInstance(): CMPI_RC_ERR_NOT_FOUND", "enter: deleteInstance()",
                             "return: deleteInstance(): CMPI_RC_ERR_NOT_SUPPORTED", "enter: createInstance()",
                             "return: createInstance(): CMPI_RC_ERR_NOT_SUPPORTED", "enter: invokeMethod()",
                             "NoSuchMethod\n", "return: invokeMethod(): CMPI_RC_ERR_METHOD_NOT_FOUND",
                             "return: cleanup(): cleanup decrement\n", "return: cleanup(): cleanup unload\n"})
    {
        at = log.find(text, at);
        ASSERT_NE(at, std::string::npos) << text << " is missing or out of order in\n" << log;
    }

    // Each operation is shown at its own line, on the way in and out.
    EXPECT_EQ(placeOf(log, "enter: getInstance()"), placeOf(log, "return: getInstance(): CMPI_RC_ERR_NOT_FOUND"));
    std::set<std::string> places;
    for (const char* name : {"enumInstances", "getInstance", "deleteInstance", "createInstance"})
        places.insert(placeOf(log, "enter: " + std::string(name) + "()"));
    EXPECT_THAT(places,
                testing::AllOf(testing::SizeIs(4), testing::Each(testing::StartsWith("CMPI_AdapterInstances.cpp("))));
}

TEST_F(Boundary, TheRuntimeLogShowsAClassThatAssociationsPassOver)
{
    setenv("CIMPLE_HOME", host.root().c_str(), 1);
    host.write("/.cimplerc", "LOG_LEVEL=DBG");
    auto* mi = make<CMPIAssociationMI>("TVRHBA_CardContainsChip_Create_AssociationMI");
    const Path path{"root/tavrin", "TVRHBA_NoSuchClass", {}};
    EXPECT_EQ(ask(names, path,
                  [&](auto& f, auto* r, auto* p)
                  { return mi->ft->referenceNames(mi, f.context, r, p, nullptr, nullptr); })
                  .status,
              CMPI_RC_OK);
    EXPECT_EQ(cleanup(mi), CMPI_RC_OK);
    EXPECT_NE(host.read("/.cimple/messages").find("return: referenceNames(): CMPI_RC_ERR_INVALID_CLASS"),
              std::string::npos);
}

} // namespace
