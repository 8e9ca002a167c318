// The head of every method, and of what changes an instance.
#pragma once

#include "agent/Maps.h"
#include "agent/MethodOutcome.h"
#include "agent/ProviderAgent.h"
#include "device/TVR_MethodWrapper.h"
#include "schema/CIM_LogicalDevice.h"

#include <cstdint>

namespace cimple
{

/// What methods, changes of instances and enumerations of their own stand on: asks for a refresh if one is due, waits
/// for the adapter data and maps, and holds m_DataMutex as long as it lives.
class MethodGuard
{
public:
    explicit MethodGuard(ProviderAgent& agent);

private:
    struct Ready
    {
        explicit Ready(ProviderAgent& agent);
    };
    Ready _ready;
    Auto_Mutex _dataLock;
};

/// What a service says when it is called wrongly, and how its methods, or the changes of its instances, then end.
struct ServiceTexts
{
    LogText wrongService = {};  ///< called on an instance that is not the service
    LogText noTarget = {};      ///< without a target
    LogText unknownTarget = {}; ///< with a target that is not in the model
    LogText noPlainName = {};   ///< Id2HBAName failed for its name
    LogText noWwn = {};         ///< str2HBAName failed
    MethodEnd ofService = {33068};
    MethodEnd ofTarget = {32968};
    MethodEnd ofNoTarget = ofTarget;
    MethodEnd ofName = {32968};
    bool anyServiceWithoutOne = false; ///< with no service in the cache, each instance passes for it
};

/// Logs the entry, asks for a refresh if one is due, waits for the adapter data and maps, and holds the data lock as
/// long as it lives. What it then looks up is there, or it ends the method with the service's text and value. It ends a
/// method that comes when the agent has ended, whose maps and libraries go then.
class MethodCall
{
public:
    explicit MethodCall(const LogText& entry);

    ProviderAgent& agent() { return _agent; }

    /// The service in the cache that the method was called on; null where the texts let any pass.
    template <class Service> Service* self(const Instance* reference, const ServiceTexts& texts)
    {
        const TypedMap<Service> services = mapOf<Service>(_agent);
        Service* service = services.withKeysOf(reference);
        if (!service && !(texts.anyServiceWithoutOne && services.size() == 0))
            end(texts.wrongService, texts.ofService);
        return service;
    }

    /// The port, or port controller, in the cache that a parameter refers to by its DeviceID.
    template <class Target> Target& target(const Target* reference, const ServiceTexts& texts)
    {
        return target<Target>(static_cast<const Instance*>(reference), texts);
    }
    /// The same for a parameter that may refer to anything: what is no device is not in the model.
    template <class Target> Target& target(const Instance* reference, const ServiceTexts& texts)
    {
        if (!reference)
            end(texts.noTarget, texts.ofNoTarget);
        const auto* named = cast<CIM_LogicalDevice>(reference);
        Target* found = !named ? nullptr
                               : mapOf<Target>(_agent).findFirst(
                                     [&](const Target& known) {
                                         return !known.DeviceID.null && !named->DeviceID.null &&
                                                known.DeviceID.value == named->DeviceID.value;
                                     });
        if (!found)
            end(texts.unknownTarget, texts.ofTarget);
        return *found;
    }

    /// Does what takes long and needs nothing of the cache, without the data lock, and gives what `work` returns. What
    /// was looked up before may be gone then. Ends the method if the agent has ended meanwhile, and its libraries with
    /// it.
    template <class Work> auto withoutLock(Work work)
    {
        auto result = [&]
        {
            const Auto_Unlock released(_agent.m_DataMutex);
            return work();
        }();
        endIfAgentHas();
        return result;
    }

    /// What the method changed is seen once the adapters have been read again, which the next request begins.
    void refreshAfterwards() { _agent.m_bAdapterRefreshPending = true; }

    /// The WWPN that a port's DeviceID is the text of.
    HBA_WWN wwpn(const String& deviceId, const ServiceTexts& texts);

    /// All three, for a method of a service with a port as its target: the port's WWPN.
    template <class Service, class Target>
    HBA_WWN portOf(const Instance* reference, const Target* port, const ServiceTexts& texts)
    {
        self<Service>(reference, texts);
        return wwpn(target(port, texts).DeviceID.value, texts);
    }

    /// Logs the text and ends the method.
    [[noreturn]] static void end(const LogText& why, const MethodEnd& with);

private:
    static ProviderAgent& enter(const LogText& entry);
    void endIfAgentHas() const;

    ProviderAgent& _agent;
    MethodGuard _guard;
};

} // namespace cimple
