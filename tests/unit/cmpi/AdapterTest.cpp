#include "runtime/adapter/CMPI_Adapter.h"

#include "runtime/threads/Thread_Context.h"
#include "runtime/threads/cimom.h"
#include "tests/unit/cmpi/FakeProvider.h"

#include <gtest/gtest.h>
#include <stdexcept>
#include <thread>

namespace cimple
{
namespace
{

using namespace fake;

/// A T_Disk with its keys set, in no namespace.
Ref<> disk(const char* name, const char* caption = "")
{
    T_Disk* made = make_named<T_Disk>("h", name);
    made->Caption.set(caption);
    return Ref<>(made);
}

struct Adapter : testing::Test
{
    Broker broker;
    Provider provider{T_Disk::static_meta_class};
    CMPIInstanceMI* mi = nullptr;
    Results results;

    void SetUp() override
    {
        mi = provider.make<CMPIInstanceMI>(broker, 'I');
        ASSERT_TRUE(mi);
        provider.instances = {disk("d0", "first"), disk("d1", "second")};
    }
    void TearDown() override
    {
        while (provider.data.adapter)
            mi->ft->cleanup(mi, broker.context(), 1);
        EXPECT_EQ(broker.faults, std::vector<std::string>());
    }

    CMPIObjectPath* path(const char* name, const char* class_name = "T_Disk")
    {
        std::vector<Entry> keys;
        if (name)
            keys = {{"System", string_of(broker.string("h"))}, {"Name", string_of(broker.string(name))}};
        return broker.path(class_name, keys);
    }
    CMPIrc names(CMPIObjectPath* of)
    {
        return mi->ft->enumerateInstanceNames(mi, broker.context(), broker.result(results), of).rc;
    }
    CMPIrc enumerate(const char** properties = nullptr)
    {
        return mi->ft->enumerateInstances(mi, broker.context(), broker.result(results), path(nullptr), properties).rc;
    }
    CMPIrc get(CMPIObjectPath* of)
    {
        return mi->ft->getInstance(mi, broker.context(), broker.result(results), of, nullptr).rc;
    }
};

std::string name_key(const Named& named)
{
    const CMPIData* name = named.find("Name");
    return name ? text(name->value.string) : "";
}

// --- life -------------------------------------------------------------------------------------------------------

TEST_F(Adapter, lives_from_the_first_factory_call_to_the_last_cleanup)
{
    auto* method = provider.make<CMPIMethodMI>(broker, 'M');
    auto* association = provider.make<CMPIAssociationMI>(broker, 'A');
    EXPECT_EQ(provider.data.magic, 0x5DE2B131u);
    EXPECT_EQ(provider.make<CMPIInstanceMI>(broker, 'X'), nullptr) << "an unknown kind counts nothing";
    EXPECT_EQ(mi->hdl, &provider.data);
    EXPECT_EQ(mi->ft->ftVersion, 100);
    EXPECT_STREQ(mi->ft->miName, "associationT_Provider");
    EXPECT_EQ(method->ft->miName, nullptr);

    EXPECT_EQ(method->ft->cleanup(method, broker.context(), 0).rc, CMPI_RC_OK);
    EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_OK);
    EXPECT_EQ(provider.count(OP_UNLOAD), 0);
    EXPECT_EQ(association->ft->cleanup(association, broker.context(), 0).rc, CMPI_RC_OK);
    for (Operation once : {OP_CREATE_PROVIDER, OP_LOAD, OP_UNLOAD, OP_DESTROY_PROVIDER})
        EXPECT_EQ(provider.count(once), 1) << once;
    EXPECT_EQ(provider.data.magic, 0xDDDDDDDDu);

    EXPECT_EQ(names(path(nullptr)), CMPI_RC_ERR_FAILED) << "a late call finds no adapter";
    EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_ERR_FAILED);

    ASSERT_TRUE(provider.make<CMPIInstanceMI>(broker, 'I'));
    EXPECT_EQ(provider.count(OP_LOAD), 2);
}

TEST_F(Adapter, unloads_behind_the_last_request_in_flight)
{
    auto* method = provider.make<CMPIMethodMI>(broker, 'M');
    CMPIArgs* args = broker.args();
    provider.method = [&](Instance*)
    {
        EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_OK);
        EXPECT_EQ(method->ft->cleanup(method, broker.context(), 0).rc, CMPI_RC_OK);
        EXPECT_EQ(provider.data.magic, 0xDDDDDDDDu);
        EXPECT_EQ(provider.count(OP_UNLOAD), 0);
    };
    method->ft->invokeMethod(method, broker.context(), broker.result(results), path("d0"), "Reset", args, args);
    for (Operation once : {OP_UNLOAD, OP_DESTROY_PROVIDER})
        EXPECT_EQ(provider.count(once), 1) << once;
}

TEST_F(Adapter, stays_while_the_provider_forbids_unloading)
{
    auto* method = provider.make<CMPIMethodMI>(broker, 'M');
    CMPIArgs* args = broker.args();
    Thread late;
    std::atomic<bool> gone = false;
    // An up-call forbids it, and one of a thread that outlives the adapter does no harm.
    provider.method = [&](Instance*)
    {
        cimom::allow_unload(false);
        Thread::create_joinable(
            late,
            [](void* arg) -> void*
            {
                while (!*static_cast<std::atomic<bool>*>(arg))
                    std::this_thread::yield();
                cimom::allow_unload(false);
                return nullptr;
            },
            &gone);
    };
    method->ft->invokeMethod(method, broker.context(), broker.result(results), path("d0"), "Reset", args, args);
    EXPECT_EQ(method->ft->cleanup(method, broker.context(), 1).rc, CMPI_RC_OK);
    EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_DO_NOT_UNLOAD);
    EXPECT_EQ(provider.count(OP_UNLOAD), 0);
    EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 1).rc, CMPI_RC_OK);
    EXPECT_EQ(provider.count(OP_DESTROY_PROVIDER), 1);
    gone = true;
    void* value = nullptr;
    Thread::join(late, value);
}

TEST_F(Adapter, may_be_entered_again_on_the_thread_that_loads)
{
    Provider other(T_Disk::static_meta_class);
    bool context = false;
    CMPIMethodMI* inner = nullptr;
    other.on_load = [&]
    {
        context = Thread_Context::top() != nullptr;
        inner = other.make<CMPIMethodMI>(broker, 'M');
    };
    auto* outer = other.make<CMPIInstanceMI>(broker, 'I');
    ASSERT_TRUE(outer && inner && context);
    EXPECT_EQ(other.count(OP_CREATE_PROVIDER), 1);
    EXPECT_EQ(other.data.adapter->load_count, 2);
    EXPECT_EQ(Thread_Context::top(), nullptr);
    outer->ft->cleanup(outer, broker.context(), 0);
    inner->ft->cleanup(inner, broker.context(), 0);
}

TEST_F(Adapter, survives_a_provider_that_throws)
{
    Provider bad(T_Disk::static_meta_class);
    bad.on_load = [] { throw std::runtime_error("load"); };
    bad.method = [](Instance*) { throw 1; };
    auto* method = bad.make<CMPIMethodMI>(broker, 'M');
    ASSERT_TRUE(method);
    CMPIArgs* args = broker.args();
    EXPECT_EQ(
        method->ft->invokeMethod(method, broker.context(), broker.result(results), path("d0"), "Reset", args, args).rc,
        CMPI_RC_ERR_FAILED);
    EXPECT_EQ(Thread_Context::top(), nullptr);
    method->ft->cleanup(method, broker.context(), 0);
}

/// Factories, operations and cleanups of one class from several threads: each life has one create and one destroy.
TEST_F(Adapter, is_safe_to_make_use_and_drop_from_several_threads)
{
    Provider shared(T_Disk::static_meta_class);
    const auto work = [&]
    {
        Results own;
        Broker own_broker;
        for (int i = 0; i < 50; ++i)
        {
            auto* instances = shared.make<CMPIInstanceMI>(own_broker, 'I');
            instances->ft->createInstance(instances, own_broker.context(), own_broker.result(own),
                                          own_broker.path("T_Nothing"), nullptr);
            instances->ft->cleanup(instances, own_broker.context(), 0);
        }
    };
    Broker longest; // the adapter keeps the broker of the first factory call
    auto* first = shared.make<CMPIInstanceMI>(longest, 'I');
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i)
        threads.emplace_back(work);
    for (std::thread& thread : threads)
        thread.join();
    first->ft->cleanup(first, longest.context(), 0);
    EXPECT_EQ(shared.data.adapter, nullptr);
    EXPECT_EQ(shared.count(OP_CREATE_PROVIDER), 1);
    EXPECT_EQ(shared.count(OP_DESTROY_PROVIDER), 1);
}

// --- instances ----------------------------------------------------------------------------------------------------

TEST_F(Adapter, enumerates_names_and_instances_in_the_request_namespace)
{
    set_name_space(provider.instances[0].get(), "root/elsewhere", true);
    ASSERT_EQ(names(path(nullptr)), CMPI_RC_OK);
    ASSERT_EQ(results.paths.size(), 2u);
    EXPECT_EQ(named(results.paths[0]).name_space, "root/a");
    EXPECT_EQ(name_key(named(results.paths[1])), "d1");
    EXPECT_EQ(results.done, 1);
    EXPECT_TRUE(static_cast<T_Disk*>(provider.model.get())->Size.is_null());

    const char* wanted[] = {"Caption", nullptr};
    ASSERT_EQ(enumerate(wanted), CMPI_RC_OK);
    ASSERT_EQ(results.instances.size(), 2u);
    EXPECT_EQ(named(named(results.instances[0]).path).name_space, "root/a");
    EXPECT_EQ(named(results.instances[0]).filter_keys.size(), 2u);
    EXPECT_FALSE(static_cast<T_Disk*>(provider.model.get())->Caption.is_null());
    EXPECT_TRUE(static_cast<T_Disk*>(provider.model.get())->Size.is_null());
    EXPECT_EQ(results.done, 2);
}

TEST_F(Adapter, reports_what_the_enumeration_or_the_broker_refuses)
{
    provider.answers[OP_ENUM_INSTANCES] = ENUM_INSTANCES_ACCESS_DENIED;
    EXPECT_EQ(enumerate(), CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_EQ(results.done, 0);

    provider.answers[OP_ENUM_INSTANCES] = 17; // no number of an enumeration
    EXPECT_EQ(names(path(nullptr)), CMPI_RC_OK);
    EXPECT_EQ(results.done, 0);

    provider.answers[OP_ENUM_INSTANCES] = PROVIDER_OK;
    results = Results();
    results.answer = CMPI_RC_ERR_FAILED;
    EXPECT_EQ(enumerate(), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(results.instances.size(), 1u) << "the first refusal ends the results";
    EXPECT_EQ(enumerate(), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(names(path(nullptr, "T_Nothing")), CMPI_RC_ERR_FAILED);
}

TEST_F(Adapter, finds_an_instance_by_enumeration)
{
    ASSERT_EQ(get(path("d1")), CMPI_RC_OK);
    ASSERT_EQ(results.instances.size(), 1u);
    EXPECT_EQ(text(named(results.instances[0]).find("Caption")->value.string), "second");
    EXPECT_EQ(results.done, 1);
    EXPECT_EQ(get(path("D1")), CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(get(path(nullptr)), CMPI_RC_ERR_NOT_FOUND);
    provider.answers[OP_ENUM_INSTANCES] = ENUM_INSTANCES_FAILED;
    EXPECT_EQ(get(path("d1")), CMPI_RC_ERR_NOT_FOUND);
    provider.answers[OP_GET_INSTANCE] = GET_INSTANCE_ACCESS_DENIED;
    EXPECT_EQ(get(path("d1")), CMPI_RC_ERR_ACCESS_DENIED);
    provider.answers[OP_GET_INSTANCE] = PROVIDER_OK; // without an instance
    EXPECT_EQ(get(path("d1")), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(results.done, 1);
}

TEST_F(Adapter, passes_changes_with_a_model_of_what_changes)
{
    const char* wanted[] = {"Caption", nullptr};
    CMPIInstance* changed = broker.instance(
        path("d0"), {{"Caption", string_of(broker.string("new"))}, {"Vendor", string_of(broker.string("v"))}});
    const auto modify = [&]
    { return mi->ft->modifyInstance(mi, broker.context(), broker.result(results), path("d0"), changed, wanted).rc; };
    EXPECT_EQ(modify(), CMPI_RC_ERR_NOT_SUPPORTED);
    provider.answers[OP_MODIFY_INSTANCE] = PROVIDER_OK;
    EXPECT_EQ(modify(), CMPI_RC_OK);
    const auto& received = static_cast<const T_Disk&>(*provider.received);
    EXPECT_EQ(received.Name.value, "d0") << "keys come from the path where the properties lack them";
    EXPECT_EQ(received.Caption.value, "new");
    const auto& model = static_cast<const T_Disk&>(*provider.model);
    EXPECT_FALSE(model.Caption.is_null());
    EXPECT_TRUE(model.Vendor.is_null());
    EXPECT_FALSE(model.Name.is_null());
}

TEST_F(Adapter, maps_creation_deletion_and_queries)
{
    CMPIInstance* made = broker.instance(
        path("d9"), {{"System", string_of(broker.string("h"))}, {"Name", string_of(broker.string("d9"))}});
    const auto create = [&]
    { return mi->ft->createInstance(mi, broker.context(), broker.result(results), path(nullptr), made).rc; };
    EXPECT_EQ(create(), CMPI_RC_ERR_NOT_SUPPORTED);
    provider.answers[OP_CREATE_INSTANCE] = PROVIDER_OK;
    EXPECT_EQ(create(), CMPI_RC_OK);
    ASSERT_EQ(results.paths.size(), 1u);
    EXPECT_EQ(name_key(named(results.paths[0])), "d9");

    provider.answers[OP_DELETE_INSTANCE] = DELETE_INSTANCE_NOT_FOUND;
    EXPECT_EQ(mi->ft->deleteInstance(mi, broker.context(), broker.result(results), path("d9")).rc,
              CMPI_RC_ERR_NOT_FOUND);
    EXPECT_EQ(mi->ft->execQuery(mi, broker.context(), broker.result(results), path(nullptr), "q", "l").rc,
              CMPI_RC_ERR_NOT_SUPPORTED);
}

/// One server crashes in its own getters when a client put text into a number.
TEST_F(Adapter, refuses_changes_that_a_class_has_not_before_it_reads_them)
{
    const CMPIInstance unreadable{};
    const auto rcs = [&](CMPIObjectPath* of, const CMPIInstance* inst)
    {
        CMPIResult* result = broker.result(results);
        return std::vector<CMPIrc>{mi->ft->createInstance(mi, broker.context(), result, of, inst).rc,
                                   mi->ft->modifyInstance(mi, broker.context(), result, of, inst, nullptr).rc,
                                   mi->ft->deleteInstance(mi, broker.context(), result, of).rc};
    };
    EXPECT_EQ(rcs(path("d0"), &unreadable), std::vector<CMPIrc>(3, CMPI_RC_ERR_NOT_SUPPORTED));
    EXPECT_EQ(rcs(path("d0", "T_Nothing"), &unreadable), std::vector<CMPIrc>(3, CMPI_RC_ERR_FAILED));
    EXPECT_FALSE(provider.received) << "the provider was asked with nothing to act on";

    const CMPIInstance* inst = broker.instance(path("d0"), {});
    provider.answers[OP_CREATE_INSTANCE] = CREATE_INSTANCE_INVALID_PARAMETER;
    provider.answers[OP_MODIFY_INSTANCE] = MODIFY_INSTANCE_INVALID_PARAMETER;
    provider.answers[OP_DELETE_INSTANCE] = DELETE_INSTANCE_FAILED;
    EXPECT_EQ(rcs(path("d0"), inst),
              (std::vector<CMPIrc>{CMPI_RC_ERR_INVALID_PARAMETER, CMPI_RC_ERR_INVALID_PARAMETER, CMPI_RC_ERR_FAILED}));
    EXPECT_TRUE(provider.received);
}

TEST_F(Adapter, refuses_requests_with_handles_missing)
{
    auto* method = provider.make<CMPIMethodMI>(broker, 'M');
    auto* association = provider.make<CMPIAssociationMI>(broker, 'A');
    auto* indication = provider.make<CMPIIndicationMI>(broker, 'N');
    const CMPIInstanceMIFT& i = *mi->ft;
    const CMPIAssociationMIFT& a = *association->ft;
    const CMPIIndicationMIFT& n = *indication->ft;
    const CMPIResult* result = broker.result(results);
    const CMPIContext* context = broker.context();
    CMPIObjectPath* of = path("d0");
    const CMPIInstance* inst = broker.instance(of, {});
    CMPIArgs* args = broker.args();
    const char* none = nullptr;
    const auto invoke = [&](const CMPIObjectPath* target, const char* name, const CMPIArgs* in, CMPIArgs* out)
    { return method->ft->invokeMethod(method, context, result, target, name, in, out); };

    const CMPIStatus answers[] = {
        i.enumerateInstanceNames(nullptr, context, result, of),
        i.enumerateInstanceNames(mi, nullptr, result, of),
        i.enumerateInstanceNames(mi, context, nullptr, of),
        i.enumerateInstanceNames(mi, context, result, nullptr),
        i.enumerateInstances(mi, context, result, nullptr, nullptr),
        i.getInstance(mi, context, result, nullptr, nullptr),
        i.getInstance(mi, context, nullptr, of, nullptr),
        i.createInstance(mi, context, result, of, nullptr),
        i.createInstance(mi, context, result, nullptr, inst),
        i.modifyInstance(mi, context, result, of, nullptr, nullptr),
        i.modifyInstance(mi, context, result, nullptr, inst, nullptr),
        i.deleteInstance(mi, context, result, nullptr),
        i.deleteInstance(mi, context, nullptr, of),
        i.cleanup(nullptr, context, 0),
        a.associators(association, context, result, nullptr, none, none, none, none, nullptr),
        a.associatorNames(association, context, result, nullptr, none, none, none, none),
        a.references(association, context, result, nullptr, none, none, nullptr),
        a.referenceNames(association, context, nullptr, of, none, none),
        invoke(nullptr, "Reset", args, args),
        invoke(of, nullptr, args, args),
        invoke(of, "Reset", nullptr, args),
        invoke(of, "Reset", args, nullptr),
        n.activateFilter(indication, context, nullptr, "", of, 0),
        n.deActivateFilter(indication, context, nullptr, "", of, 0),
        n.enableIndications(indication, nullptr),
        n.disableIndications(nullptr, context),
    };
    for (const CMPIStatus& answer : answers)
        EXPECT_EQ(answer.rc, CMPI_RC_ERR_INVALID_PARAMETER) << &answer - answers;
}

TEST_F(Adapter, takes_null_texts_of_a_path)
{
    CMPIObjectPath* of = path("d0");
    named(of).texts_are_null = true;
    EXPECT_EQ(get(of), CMPI_RC_ERR_FAILED);
    EXPECT_EQ(names(of), CMPI_RC_ERR_FAILED);
}

// --- methods ------------------------------------------------------------------------------------------------------

struct Methods : Adapter
{
    CMPIrc call(const char* name, const char* class_name = "T_Disk")
    {
        auto* method = provider.make<CMPIMethodMI>(broker, 'M');
        const CMPIArgs* in = broker.args({{"Force", string_of(broker.string("TRUE"))}});
        CMPIArgs* out = broker.args();
        return method->ft
            ->invokeMethod(method, broker.context(), broker.result(results), path("d0", class_name), name, in, out)
            .rc;
    }
};

TEST_F(Methods, return_data_on_every_success)
{
    bool forced = false;
    provider.method = [&](Instance* record)
    {
        auto& reset = static_cast<T_Disk_Reset&>(*record);
        forced = reset.Force.value && !reset.Force.is_null();
        reset.return_value.set(5);
    };
    EXPECT_EQ(call("reset"), CMPI_RC_OK);
    EXPECT_TRUE(forced);

    provider.method = [](Instance*) {};
    provider.answers[OP_INVOKE_METHOD] = NO_SUCH_OPERATION; // a class without a dispatcher
    EXPECT_EQ(call("Reset"), CMPI_RC_OK);
    ASSERT_EQ(results.data.size(), 2u);
    EXPECT_EQ(results.data[0].value.uint32, 5u);
    EXPECT_EQ(results.data[1].type, CMPI_uint32);
    EXPECT_TRUE(CMIsNullValue(results.data[1]));
    EXPECT_EQ(results.done, 2);
}

TEST_F(Methods, fail_without_data)
{
    EXPECT_EQ(call("Nothing"), CMPI_RC_ERR_METHOD_NOT_FOUND);
    EXPECT_EQ(call("Caption"), CMPI_RC_ERR_METHOD_NOT_FOUND) << "a property";
    EXPECT_EQ(call("Reset", "T_Nothing"), CMPI_RC_ERR_FAILED);
    provider.answers[OP_INVOKE_METHOD] = INVOKE_METHOD_UNSUPPORTED;
    EXPECT_EQ(call("Reset"), CMPI_RC_ERR_NOT_SUPPORTED);
    provider.answers[OP_INVOKE_METHOD] = INVOKE_METHOD_ACCESS_DENIED;
    EXPECT_EQ(call("Reset"), CMPI_RC_ERR_ACCESS_DENIED);
    EXPECT_TRUE(results.data.empty());
    EXPECT_EQ(results.done, 0);
}

// --- indications ----------------------------------------------------------------------------------------------------

TEST_F(Adapter, counts_filters_and_enables_indications_once)
{
    auto* indication = provider.make<CMPIIndicationMI>(broker, 'N');
    const CMPIIndicationMIFT& ft = *indication->ft;
    for (const char* query : {"a", "b", "a"})
        ft.activateFilter(indication, broker.context(), broker.filter(query), "", nullptr, 0);
    const Array<Indication_Filter>& filters = provider.data.adapter->filters;
    ASSERT_EQ(filters.size(), 2u);
    EXPECT_EQ(filters[0].count, 2u);
    for (const char* query : {"a", "unknown", "a"})
        EXPECT_EQ(ft.deActivateFilter(indication, broker.context(), broker.filter(query), "", nullptr, 0).rc,
                  CMPI_RC_OK);
    ASSERT_EQ(filters.size(), 1u);
    EXPECT_EQ(filters[0].query, "b");

    EXPECT_EQ(ft.enableIndications(indication, broker.context()).rc, CMPI_RC_OK);
    EXPECT_EQ(ft.enableIndications(indication, broker.context()).rc, CMPI_RC_OK);
    EXPECT_EQ(provider.count(OP_ENABLE_INDICATIONS), 1);
    provider.answers[OP_DISABLE_INDICATIONS] = DISABLE_INDICATIONS_FAILED;
    EXPECT_EQ(ft.disableIndications(indication, broker.context()).rc, CMPI_RC_ERR_FAILED);
    EXPECT_EQ(ft.disableIndications(indication, broker.context()).rc, CMPI_RC_OK) << "not enabled any more";
}

} // namespace
} // namespace cimple
