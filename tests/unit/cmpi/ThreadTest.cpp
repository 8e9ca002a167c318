#include "runtime/Thread.h"

#include "runtime/CMPI_Thread_Context.h"
#include "runtime/cimom.h"
#include "tests/unit/cmpi/FakeBroker.h"
#include "tests/unit/runtime/Records.h"

#include <gtest/gtest.h>
#include <thread>

namespace cimple
{
namespace
{

using namespace fake;

void* return_top(void*)
{
    return Thread_Context::top();
}

void* run(Thread::Proc proc, void* arg = nullptr)
{
    Thread thread;
    void* value = &thread;
    EXPECT_EQ(Thread::create_joinable(thread, proc, arg), 0);
    EXPECT_EQ(Thread::join(thread, value), 0);
    return value;
}

using Events = std::vector<std::string>;

TEST(Threads, run_without_hooks_where_the_creator_has_no_context)
{
    EXPECT_EQ(run(return_top), nullptr);
}

TEST(Threads, inherit_an_attachment_of_their_own)
{
    Broker broker;
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    const void* seen = run(return_top);
    EXPECT_NE(seen, nullptr);
    EXPECT_NE(seen, &context);
    EXPECT_EQ(broker.events, (Events{"prepare", "attach", "detach"})) << "no memory functions in a 1.0 broker";
    EXPECT_EQ(broker.faults, Events());
    EXPECT_EQ(Thread_Context::top(), &context);
}

TEST(Threads, keep_their_broker_objects_between_mark_and_release)
{
    Broker broker(200);
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    const Events whole = {"prepare", "attach", "mark", "release", "detach"};
    run(return_top);
    EXPECT_EQ(broker.events, whole);

    broker.events.clear();
    int number = 0;
    EXPECT_EQ(run([](void* arg) -> void* { Thread::exit(arg); }, &number), &number);
    EXPECT_EQ(broker.events, whole) << "an early end runs the exit hook once";
    EXPECT_EQ(broker.faults, Events());
}

TEST(Threads, contexts_nest)
{
    Broker broker;
    CMPI_Thread_Context outer(broker.handle(), broker.context(), nullptr);
    CMPI_Thread_Context inner(broker.handle(), broker.context(), nullptr);
    Thread_Context::push(&outer);
    Thread_Context::push(&inner);
    EXPECT_EQ(inner.prev, &outer);
    Thread_Context::pop();
    EXPECT_EQ(Thread_Context::top(), &outer);
    EXPECT_EQ(inner.prev, nullptr);
    Thread_Context::pop();
    Thread_Context::pop(); // nothing left
    EXPECT_EQ(Thread_Context::top(), nullptr);
}

TEST(Mutexes, tell_busy_from_free)
{
    Mutex recursive(true);
    recursive.lock();
    EXPECT_EQ(recursive.try_lock(), 0);
    std::thread([&] { EXPECT_EQ(recursive.try_lock(), 16); }).join();
    recursive.unlock();
    recursive.unlock();
    std::thread(
        [&]
        {
            EXPECT_EQ(recursive.try_lock(), 0);
            recursive.unlock();
        })
        .join();
}

TEST(Upcalls, fail_quietly_without_a_context)
{
    const Ref<> disk(make_named<T_Disk>("h", "d"));
    const Ref<> record(create(&T_Disk_Reset::static_meta_method));
    Instance_Enumerator instances;
    String user("kept");
    EXPECT_EQ(cimom::enum_instances("root/a", disk.get(), instances), -1);
    EXPECT_FALSE(instances.more());
    instances.next();
    EXPECT_EQ(instances.get(), nullptr);
    EXPECT_EQ(cimom::get_instance("root/a", disk.get()), nullptr);
    EXPECT_EQ(cimom::create_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::delete_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::modify_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::invoke_method("root/a", disk.get(), record.get()), -1);
    cimom::allow_unload(false);
    EXPECT_FALSE(cimom::get_username(user));
    EXPECT_EQ(user, "kept");
}

struct Upcall : testing::Test
{
    Broker broker;
    CMPI_Thread_Context context{broker.handle(), broker.context(), nullptr};
    const Pushed_Context pushed{context};
    const Ref<T_Disk> disk{make_named<T_Disk>("h", "d")};
};

TEST_F(Upcall, instances_go_to_the_broker_and_come_back)
{
    disk->Caption.set("mine");
    ASSERT_EQ(cimom::create_instance("root/a", disk.get()), 0);
    const Ref<> found(cimom::get_instance("root/a", disk.get()));
    ASSERT_TRUE(found);
    EXPECT_EQ(static_cast<T_Disk*>(found.get())->Caption.value, "mine");
    EXPECT_EQ(found->__name_space, "root/a");

    Instance_Enumerator instances;
    ASSERT_EQ(cimom::enum_instances("root/a", disk.get(), instances), 0);
    ASSERT_EQ(cimom::enum_instances("root/a", disk.get(), instances), 0) << "the former enumeration is dropped";
    int count = 0;
    for (; instances.more(); instances.next(), ++count)
        EXPECT_TRUE(key_eq(Ref<>(instances.get()).get(), disk.get()));
    EXPECT_EQ(count, 1);
    instances.next();
    EXPECT_EQ(instances.get(), nullptr);

    broker.upcall_answer = CMPI_RC_ERR_ACCESS_DENIED;
    EXPECT_EQ(cimom::create_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::modify_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::delete_instance("root/a", disk.get()), -1);
    EXPECT_EQ(cimom::enum_instances("root/a", disk.get(), instances), -1);
    EXPECT_EQ(cimom::get_instance("root/a", nullptr), nullptr);
}

TEST_F(Upcall, methods_send_their_arguments_and_bring_the_return_value)
{
    const Ref<> record(create(&T_Disk_Reset::static_meta_method));
    auto& reset = static_cast<T_Disk_Reset&>(*record);
    nullify(&reset, true, true, 1);
    reset.Force.set(true);
    ASSERT_EQ(cimom::invoke_method("root/a", disk.get(), &reset), 0);
    EXPECT_EQ(reset.return_value.value, 1u) << "the fake counts the arguments";
    EXPECT_TRUE(reset.Force.value && !reset.Force.is_null()) << "no Out parameter";
    EXPECT_EQ(broker.events, Events{"Reset"});

    broker.upcall_answer = CMPI_RC_ERR_METHOD_NOT_FOUND;
    EXPECT_EQ(cimom::invoke_method("root/a", disk.get(), &reset), -1);
    EXPECT_EQ(cimom::invoke_method("root/a", disk.get(), nullptr), -1);
}

TEST_F(Upcall, user_names_may_be_missing)
{
    String user("old");
    EXPECT_FALSE(cimom::get_username(user));
    broker.principal = string_of(broker.string("root"));
    EXPECT_TRUE(cimom::get_username(user));
    EXPECT_EQ(user, "root");
    broker.principal = string_of(nullptr);
    EXPECT_TRUE(cimom::get_username(user));
    EXPECT_TRUE(user.empty());
    broker.principal = uint64_of(1);
    EXPECT_FALSE(cimom::get_username(user));
}

} // namespace
} // namespace cimple
