// An adapter whose process runs out of memory: at whatever allocation, it answers FAILED or serves, and goes on.
#include "runtime/adapter/CMPI_Thread_Context.h"
#include "runtime/threads/cimom.h"
#include "tests/support/NoMemory.h"
#include "tests/unit/cmpi/FakeProvider.h"

#include <thread>

namespace cimple
{
namespace
{

using namespace fake;
using test_support::NoMemory;
using test_support::withEachAllocationFailing;

struct Adapter_Memory : testing::Test
{
    Broker broker;
    Results results;
    CMPIResult* result = broker.result(results);

    CMPIObjectPath* path(const char* name, const char* class_name = "T_Base")
    {
        return broker.path(class_name,
                           {{"System", string_of(broker.string("h"))}, {"Name", string_of(broker.string(name))}});
    }

    std::size_t sent() const { return results.paths.size() + results.instances.size() + results.data.size(); }

    void forget(Provider& provider)
    {
        provider.model.reset();
        provider.received.reset();
        results = Results();
    }

    /// `call` answers OK with all results, or FAILED when an allocation fails, and leaves nothing behind.
    template <class Call> void sweep(Provider& provider, const char* name, Call call)
    {
        EXPECT_EQ(call().rc, CMPI_RC_OK) << name;
        const std::size_t all = sent();
        forget(provider);

        CMPIrc rc = CMPI_RC_OK;
        const auto check = [&](bool failed)
        {
            EXPECT_TRUE(rc == CMPI_RC_OK ? sent() == all : failed && rc == CMPI_RC_ERR_FAILED)
                << name << " answered " << rc << " and " << sent() << " results";
            EXPECT_EQ(Thread_Context::top(), nullptr);
            forget(provider);
            rc = CMPI_RC_NEVER_UNLOAD; // should the next run throw
        };
        EXPECT_GT(withEachAllocationFailing([&] { rc = call().rc; }, check), 2u) << name;

        std::thread([&] { EXPECT_EQ(call().rc, CMPI_RC_OK) << "no lock is left"; }).join();
        forget(provider);
    }
};

TEST_F(Adapter_Memory, missing_fails_an_operation_on_instances)
{
    Provider provider(T_Disk::static_meta_class);
    auto* mi = provider.make<CMPIInstanceMI>(broker, 'I');
    const auto& ft = *mi->ft;
    for (const char* name : {"d0", "d1"})
        provider.instances.push_back(Ref<>(make_named<T_Disk>("h", name)));
    for (Operation change : {OP_CREATE_INSTANCE, OP_MODIFY_INSTANCE, OP_DELETE_INSTANCE})
        provider.answers[change] = PROVIDER_OK;
    const CMPIContext* context = broker.context();
    const CMPIObjectPath* disk = path("d1", "T_Disk");
    const CMPIInstance* inst =
        broker.instance(path("d1", "T_Disk"), {{"Caption", string_of(broker.string("new"))},
                                               {"Twin", data_of(CMPI_ref, CMPIValue{.ref = path("twin")})}});
    const char* wanted[] = {"Caption", "Twin", nullptr};

    sweep(provider, "names", [&] { return ft.enumerateInstanceNames(mi, context, result, disk); });
    sweep(provider, "instances", [&] { return ft.enumerateInstances(mi, context, result, disk, wanted); });
    sweep(provider, "get", [&] { return ft.getInstance(mi, context, result, disk, wanted); });
    sweep(provider, "create", [&] { return ft.createInstance(mi, context, result, disk, inst); });
    sweep(provider, "modify", [&] { return ft.modifyInstance(mi, context, result, disk, inst, wanted); });
    sweep(provider, "delete", [&] { return ft.deleteInstance(mi, context, result, disk); });

    auto* method = provider.make<CMPIMethodMI>(broker, 'M');
    const CMPIArgs* in = broker.args({{"Target", data_of(CMPI_ref, CMPIValue{.ref = path("target")})}});
    CMPIArgs* out = broker.args();
    provider.method = [](Instance* record) { static_cast<T_Disk_Reset*>(record)->return_value.set(0); };
    sweep(provider, "method",
          [&] { return method->ft->invokeMethod(method, context, result, disk, "Reset", in, out); });
    method->ft->cleanup(method, context, 1);
    mi->ft->cleanup(mi, context, 1);
}

TEST_F(Adapter_Memory, missing_fails_an_association_operation)
{
    Provider provider(T_SubLink::static_meta_class);
    auto* mi = provider.make<CMPIAssociationMI>(broker, 'A');
    const auto& ft = *mi->ft;
    for (const char* name : {"b", "c"})
    {
        provider.instances.push_back(
            Ref<>(make_link<T_SubLink>(make_named<T_Base>("h", "a"), make_named<T_Base>("h", name))));
        broker.stored.push_back(broker.instance(path(name), {}));
    }
    const CMPIContext* context = broker.context();
    const CMPIObjectPath* source = path("a");
    const char* role = "Antecedent";

    sweep(provider, "associators",
          [&] { return ft.associators(mi, context, result, source, nullptr, nullptr, role, nullptr, nullptr); });
    sweep(provider, "associatorNames",
          [&] { return ft.associatorNames(mi, context, result, source, nullptr, nullptr, role, nullptr); });
    sweep(provider, "references", [&] { return ft.references(mi, context, result, source, nullptr, role, nullptr); });
    sweep(provider, "referenceNames", [&] { return ft.referenceNames(mi, context, result, source, nullptr, role); });
    ft.cleanup(mi, context, 1);
}

TEST_F(Adapter_Memory, missing_for_an_adapter_gives_none_and_keeps_no_provider)
{
    Provider provider(T_Disk::static_meta_class);
    CMPIInstanceMI* mi = nullptr;
    const std::size_t failures = withEachAllocationFailing(
        [&] { mi = provider.make<CMPIInstanceMI>(broker, 'I'); },
        [&](bool failed)
        {
            EXPECT_EQ(provider.data.adapter == nullptr, mi == nullptr);
            EXPECT_TRUE(failed || mi);
            if (mi)
                mi->ft->cleanup(mi, broker.context(), 0);
            EXPECT_EQ(provider.count(OP_CREATE_PROVIDER), provider.count(OP_DESTROY_PROVIDER));
        });
    EXPECT_GE(failures, 2u) << "the adapter, the thread's context";

    mi = provider.make<CMPIInstanceMI>(broker, 'I');
    {
        const NoMemory memory(0, 1);
        EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_ERR_FAILED);
    }
    EXPECT_EQ(mi->ft->cleanup(mi, broker.context(), 0).rc, CMPI_RC_OK) << "asked again later";
}

TEST_F(Adapter_Memory, missing_for_an_upcall_is_no_answer)
{
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    const Ref<T_Base> model(make_named<T_Base>("h", "x"));
    broker.stored.push_back(broker.instance(path("x"), {{"Caption", string_of(broker.string("c"))}}));

    bool found = false;
    const auto get = [&] { found = Ref<>(cimom::get_instance("root/a", model.get())).get() != nullptr; };
    const auto list = [&]
    {
        Instance_Enumerator instances;
        found = cimom::enum_instances("root/a", model.get(), instances) == 0 && instances.more();
    };
    withEachAllocationFailing(get, [&](bool failed) { EXPECT_TRUE(found || failed); });
    withEachAllocationFailing(list, [&](bool failed) { EXPECT_TRUE(found || failed); });
}

/// A provider that could not show all says so with a null instance before the last one.
TEST_F(Adapter_Memory, a_list_cut_short_is_served_but_proves_nothing_missing)
{
    Provider provider(T_Disk::static_meta_class);
    auto* mi = provider.make<CMPIInstanceMI>(broker, 'I');
    provider.instances.push_back(Ref<>(make_named<T_Disk>("h", "d0")));
    provider.cut_short = true;
    const auto get = [&](const char* name)
    { return mi->ft->getInstance(mi, broker.context(), result, path(name, "T_Disk"), nullptr).rc; };
    EXPECT_EQ(get("d0"), CMPI_RC_OK);
    EXPECT_EQ(get("d1"), CMPI_RC_ERR_FAILED);
    results = Results();
    EXPECT_EQ(mi->ft->enumerateInstances(mi, broker.context(), result, path("", "T_Disk"), nullptr).rc, CMPI_RC_OK);
    EXPECT_EQ(results.instances.size(), 1u);
    provider.cut_short = false;
    EXPECT_EQ(get("d1"), CMPI_RC_ERR_NOT_FOUND);
    mi->ft->cleanup(mi, broker.context(), 0);
}

} // namespace
} // namespace cimple
