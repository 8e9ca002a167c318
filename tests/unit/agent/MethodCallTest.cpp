// The head of methods, in the methods of a service as its provider would have them.
#include "agent/MethodCall.h"
#include "agent/Build.h"
#include "agent/ProviderProc.h"
#include "device/TVR_MethodWrapper.h"
#include "schema/TVRHBA_ConcreteJob.h"
#include "schema/TVRHBA_FCHBAWWNService.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_RecordLog.h"
#include "tests/support/LogCollector.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <future>
#include <optional>
#include <stdexcept>

using namespace cimple;
using testing::ElementsAre;

namespace
{

using Service = TVRHBA_FCHBAWWNService;
using Change = TVRHBA_FCHBAWWNService_ChangeWWN_method;
using Capability = TVRHBA_FCHBAWWNService_GetWWNCapability_method;
using Restore = TVRHBA_FCHBAWWNService_RestoreWWN_method;

constexpr ServiceTexts texts = {
    .wrongService = {TVR_ERR, "Invalid instance of a service"},
    .noTarget = {TVR_ERR, "Target has a null pointer"},
    .unknownTarget = {TVR_ERR, "A_Provider::Wrong DeviceID passed"},
    .noPlainName = {TVR_ERR, "A_Provider::Id2HBAName failed"},
    .noWwn = {TVR_ERR, "A_Provider::str2HBAName failed"},
    .ofTarget = {5},
    .ofName = {6},
};
constexpr ServiceTexts changeTexts = {
    .noTarget = {TVR_ERR, "No port"},
    .unknownTarget = {TVR_ERR, "Unknown port"},
    .ofTarget = {0, MODIFY_INSTANCE_NOT_FOUND},
    .anyServiceWithoutOne = true,
};

bool isDataLocked(ProviderAgent& agent)
{
    return std::async(std::launch::async,
                      [&]
                      {
                          if (agent.m_DataMutex.try_lock() == EBUSY)
                              return true;
                          agent.m_DataMutex.unlock();
                          return false;
                      })
        .get();
}

std::uint32_t changeWWN(const Instance* reference, Change& parameters)
{
    MethodCall call({TVR_DBG, "Entering ChangeWWN"});
    call.self<Service>(reference, texts);
    const TVRHBA_FCPort& port = call.target(parameters.Target, texts);
    const HBA_WWN wwpn = call.wwpn(port.DeviceID.value, texts);
    parameters.WWNOperationStatus.set(wwpn.wwn[7]);
    // The data stay locked as long as the call lives.
    return isDataLocked(call.agent()) ? 0 : 77;
}

std::uint32_t restoreWWN(const Instance*, Restore&)
{
    throw std::runtime_error("broken");
}

std::uint32_t getWWNCapability(const Instance*, Capability&)
{
    throw MethodEnd{0, INVOKE_METHOD_UNSUPPORTED};
}

/// A provider of which the procedure needs no more than is asked of it here.
struct Provider
{
    using Record = Service;
    int load() { return 0; }
    int unload() { return 0; }
    int enum_instances(const Instance*, Instance_Handler, void*, const Selection&) { return 0; }
    int modify_instance(const Instance* instance, const Instance*)
    {
        MethodCall call({TVR_DBG, "modify_instance"});
        call.target(static_cast<const TVRHBA_PortController*>(instance), changeTexts);
        return 0;
    }
    int create_instance(Instance*) { throw std::runtime_error("no room"); }
    int delete_instance(const Instance*) { return 0; }
    static std::span<const MethodRow> methods()
    {
        return methodTable<Service, &changeWWN, &restoreWWN, &getWWNCapability>;
    }
};
static_assert(duties<Provider> == (Methods | Modifies | Creates | Deletes));

std::uint32_t changeState(const Instance*, TVRHBA_ConcreteJob_RequestStateChange_method&)
{
    return 0;
}

struct JobProvider
{
    using Record = TVRHBA_ConcreteJob;
    static std::span<const MethodRow> methods() { return methodTable<TVRHBA_ConcreteJob, &changeState>; }
};

class MethodCalls : public testing::Test
{
protected:
    MethodCalls() : agent(*ProviderAgent::instance()), change(create<Change>())
    {
        ProviderAgent::addRef();
        Ref<Service> service = fresh<Service>();
        service->Name.set("the service");
        mapOf<Service>(agent).insert(service, "refused");
        reference.reset(clone_of(service.get()));
        Ref<TVRHBA_FCPort> port = fresh<TVRHBA_FCPort>();
        port->DeviceID.set("10000000C9ABCDEF");
        mapOf<TVRHBA_FCPort>(agent).insert(port, "refused");
        change->Target = create<TVRHBA_FCPort>();
        change->Target->DeviceID.set("10000000C9ABCDEF");
        // A refresh that ended in time, and its log lines, are over.
        agent.BuildCimpleInfo();
        {
            MethodGuard ready(agent);
        }
        log.emplace(TVR_ERR);
    }
    ~MethodCalls() override
    {
        log->stopCollecting();
        ProviderAgent::releaseRef();
    }

    template <class Parameters> int call(const Ref<Parameters>& parameters)
    {
        return invokeMethod<Provider>(reference.get(), parameters.get());
    }

    ProviderAgent& agent;
    Ref<Service> reference;
    Ref<Change> change;
    std::optional<test_support::LogCollector> log; ///< of failures
};

TEST_F(MethodCalls, ServiceTargetAndNameAreGivenUnderTheLock)
{
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 0u);
    EXPECT_EQ(change->return_value.null, 0);
    EXPECT_EQ(change->WWNOperationStatus.value, 0xEF);
}

TEST_F(MethodCalls, LongWorkIsDoneWithoutTheLock)
{
    MethodCall call(LogText{});
    EXPECT_TRUE(isDataLocked(agent));
    EXPECT_FALSE(call.withoutLock([&] { return isDataLocked(agent); }));
    EXPECT_THROW(call.withoutLock([]() -> int { throw std::runtime_error("broken"); }), std::runtime_error);
    EXPECT_TRUE(isDataLocked(agent));
}

TEST_F(MethodCalls, WhatIsWrongEndsTheMethodWithItsTextAndValue)
{
    change->Target->DeviceID.set("1000000000000000");
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 5u);
    change->Target->DeviceID.null = 1;
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 5u);
    unref(change->Target);
    change->Target = nullptr;
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 5u);
    reference->Name.set("another service");
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 33068u);
    EXPECT_THAT(log->messages(), ElementsAre("A_Provider::Wrong DeviceID passed", "A_Provider::Wrong DeviceID passed",
                                             "Target has a null pointer", "Invalid instance of a service"));
}

TEST_F(MethodCalls, NamesThatAreNoWwnEndTheMethod)
{
    mapOf<TVRHBA_FCPort>(agent).first()->DeviceID.set("no name");
    change->Target->DeviceID.set("no name");
    EXPECT_EQ(call(change), 0);
    EXPECT_EQ(change->return_value.value, 6u);
    EXPECT_THAT(log->messages(), ElementsAre("INVALID HBA Name", "A_Provider::str2HBAName failed"));
}

TEST_F(MethodCalls, ExceptionsBecomeFailureAndOtherEndsTheirStatus)
{
    const Ref<Restore> restore(create<Restore>());
    EXPECT_EQ(call(restore), 0);
    EXPECT_EQ(restore->return_value.value, methodFailed);
    EXPECT_THAT(log->messages(), ElementsAre("A method ended with an exception: broken"));

    const Ref<Capability> capability(create<Capability>());
    capability->return_value.null = 1;
    EXPECT_EQ(call(capability), INVOKE_METHOD_UNSUPPORTED);
    EXPECT_EQ(capability->return_value.null, 1);

    const Ref<TVRHBA_FCHBAWWNService_ReadWWN_method> withoutBody(create<TVRHBA_FCHBAWWNService_ReadWWN_method>());
    EXPECT_EQ(call(withoutBody), INVOKE_METHOD_UNSUPPORTED);
    const Ref<TVRHBA_RecordLog_SetLogParams_method> ofAnother(create<TVRHBA_RecordLog_SetLogParams_method>());
    EXPECT_EQ(call(ofAnother), NO_SUCH_OPERATION);
}

TEST_F(MethodCalls, ChangesOfInstancesEndWithAStatus)
{
    Provider provider;
    const auto ask = [&](int operation, Instance* instance)
    {
        return providerProc<Provider>(nullptr, operation, &provider, instance, nullptr, nullptr, nullptr, nullptr,
                                      nullptr, nullptr);
    };
    Ref<TVRHBA_PortController> controller = fresh<TVRHBA_PortController>();
    controller->DeviceID.set("the controller");
    EXPECT_EQ(ask(OP_MODIFY_INSTANCE, controller.get()), MODIFY_INSTANCE_NOT_FOUND);
    mapOf<TVRHBA_PortController>(agent).insert(Ref(clone_of(controller.get())), "refused");
    EXPECT_EQ(ask(OP_MODIFY_INSTANCE, controller.get()), 0);
    EXPECT_EQ(ask(OP_CREATE_INSTANCE, controller.get()), CREATE_INSTANCE_FAILED);
    EXPECT_EQ(ask(OP_DELETE_INSTANCE, controller.get()), 0);
    EXPECT_THAT(log->messages(), ElementsAre("Unknown port", "A method ended with an exception: no room"));

    // What a class can do is asked with a null instance.
    EXPECT_EQ(ask(OP_MODIFY_INSTANCE, nullptr), MODIFY_INSTANCE_INVALID_PARAMETER);
    EXPECT_EQ(ask(OP_CREATE_INSTANCE, nullptr), CREATE_INSTANCE_INVALID_PARAMETER);
    EXPECT_EQ(ask(OP_DELETE_INSTANCE, nullptr), DELETE_INSTANCE_FAILED);
}

TEST_F(MethodCalls, AnyServicePassesWhereTheCacheHasNone)
{
    MethodCall call({TVR_DBG, "entry"});
    reference->Name.set("another service");
    EXPECT_THROW(call.self<Service>(reference.get(), changeTexts), MethodEnd);
    mapOf<Service>(agent).clear();
    EXPECT_EQ(call.self<Service>(reference.get(), changeTexts), nullptr);
    EXPECT_THROW(call.self<Service>(reference.get(), texts), MethodEnd);
}

TEST(MethodRows, TakeNoRecordOfASuperclassesMethodOfTheSameName)
{
    const Ref<TVRHBA_ConcreteJob_RequestStateChange_method> own(create<TVRHBA_ConcreteJob_RequestStateChange_method>());
    EXPECT_EQ(invokeMethod<JobProvider>(nullptr, own.get()), 0);
    const Ref<CIM_ConcreteJob_RequestStateChange_method> inherited(create<CIM_ConcreteJob_RequestStateChange_method>());
    EXPECT_EQ(invokeMethod<JobProvider>(nullptr, inherited.get()), INVOKE_METHOD_FAILED);
}

} // namespace
