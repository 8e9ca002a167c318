#include "runtime/threads/Thread.h"

#include "runtime/adapter/CMPI_Thread_Context.h"
#include "runtime/threads/cimom.h"
#include "tests/support/NoMemory.h"
#include "tests/unit/cmpi/FakeBroker.h"
#include "tests/unit/runtime/Records.h"

#include <cerrno>
#include <csignal>
#include <gtest/gtest.h>
#include <stdexcept>
#include <thread>

namespace cimple
{
namespace
{

using namespace fake;
using test_support::withEachAllocationFailing;

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

TEST(Threads, leave_the_signals_of_the_host_to_the_host)
{
    sigset_t before, after;
    pthread_sigmask(SIG_SETMASK, nullptr, &before);
    sigset_t seen;
    run([](void* mask) -> void*
        { return pthread_sigmask(SIG_SETMASK, nullptr, static_cast<sigset_t*>(mask)), nullptr; },
        &seen);
    for (int host : {SIGTERM, SIGINT, SIGHUP, SIGCHLD, SIGPIPE, SIGUSR1, SIGALRM, SIGRTMIN})
        EXPECT_EQ(sigismember(&seen, host), 1) << host;
    for (int fault : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP, SIGSYS, SIGABRT})
        EXPECT_EQ(sigismember(&seen, fault), 0) << fault;
    pthread_sigmask(SIG_SETMASK, nullptr, &after);
    for (int number = 1; number < SIGRTMAX; ++number)
        EXPECT_EQ(sigismember(&after, number), sigismember(&before, number)) << number;
}

TEST(Threads, that_throw_end_alone)
{
    EXPECT_EQ(run([](void*) -> void* { throw std::runtime_error("thread"); }), nullptr);
    Broker broker(200);
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    EXPECT_EQ(run([](void*) -> void* { throw 1; }), nullptr);
    EXPECT_EQ(broker.events, (Events{"prepare", "attach", "mark", "release", "detach"}));
}

TEST(Threads, that_cannot_be_made_are_an_error_number)
{
    Broker broker;
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    Thread thread;
    int error = 0;
    const auto create = [&]
    {
        error = -1; // should it throw
        error = Thread::create_joinable(thread, return_top, nullptr);
    };
    const auto check = [&](bool failed)
    {
        EXPECT_TRUE(failed ? error == ENOMEM || error == EAGAIN : error == 0) << error;
        void* top = nullptr;
        EXPECT_TRUE(error != 0 || Thread::join(thread, top) == 0);
        EXPECT_EQ(top != nullptr, error == 0);
    };
    EXPECT_GE(withEachAllocationFailing(create, check), 3u) << "the record, the context, the thread";

    broker.prepares = false;
    EXPECT_EQ(Thread::create_joinable(thread, return_top, nullptr), EAGAIN);
}

TEST(Threads, go_without_a_broker_that_does_not_attach_them)
{
    Broker broker(200);
    CMPI_Thread_Context context(broker.handle(), broker.context(), nullptr);
    const Pushed_Context pushed(context);
    broker.attach_answer = CMPI_RC_ERR_FAILED;
    EXPECT_EQ(run(return_top), nullptr);
    EXPECT_EQ(broker.events, (Events{"prepare", "attach"}));

    broker.attach_answer = CMPI_RC_OK;
    broker.marks = false;
    broker.events.clear();
    EXPECT_NE(run(return_top), nullptr);
    EXPECT_EQ(broker.events, (Events{"prepare", "attach", "mark", "detach"})) << "nothing to release";
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

/// One broker marks the data of an enumeration as null, and leaves its status as it was.
TEST_F(Upcall, enumerations_end_where_the_instances_end)
{
    broker.fetched_state = CMPI_nullValue;
    broker.fetched_answer = CMPI_RC_ERR_FAILED;
    const auto count = [&]
    {
        int found = 0;
        Instance_Enumerator instances;
        EXPECT_EQ(cimom::enum_instances("root/a", disk.get(), instances), 0);
        for (; instances.more(); instances.next())
            ++found;
        return found;
    };
    EXPECT_EQ(count(), 0);
    ASSERT_EQ(cimom::create_instance("root/a", disk.get()), 0);
    ASSERT_EQ(cimom::create_instance("root/a", disk.get()), 0);
    EXPECT_EQ(count(), 2);
    broker.stored.insert(broker.stored.begin() + 1, nullptr);
    EXPECT_EQ(count(), 1) << "no instance in the data is the end";
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
