// What every enumeration of the cache is made of: copies under the locks, then the handler under none.
#pragma once

#include "agent/Instance_Map.h"
#include "agent/ProviderAgent.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

/// One enumeration: what somebody wants of a map, and the copies of it. An enumeration of its own copies under a
/// MethodGuard, lets go of it, and delivers.
class Reading
{
public:
    /// The maps and `selection` stay the caller's. What is in `second` comes behind what is in `cached`.
    Reading(const Instance_Map& cached, const Selection& selection, const Instance_Map* second = nullptr)
        : _cached(cached), _second(second), _selection(selection), _local(cached.meta_class)
    {}

    /// The caller holds m_DataMutex.
    void copy(const RefreshStage& stage);
    /// Gives the copies to the handler, which is told where they are not all there is, and logs the end of the
    /// enumeration.
    void deliver(const char* providerName, Instance_Handler handler, void* client);

    /// Tells the handler that what it was given is not all there is. The enumeration's own status stays a success.
    static void cutShort(Instance_Handler handler, void* client) { handler(nullptr, ENUM_INSTANCES_FAILED, client); }

private:
    enum class Copied
    {
        all,
        incomplete, ///< all that is there, of maps whose refresh left something out
        refused,    ///< the copy ended early, and nothing of it is sent
    };

    const Instance_Map& _cached;
    const Instance_Map* _second;
    const Selection& _selection;
    Instance_Map _local;
    Copied _copied = Copied::all;
};

} // namespace cimple
