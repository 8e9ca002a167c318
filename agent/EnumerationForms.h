// What the class providers share: joining the agent, and the fixed forms of enumeration.
#pragma once

#include "agent/ProviderAgent.h"
#include "runtime/adapter/Provider.h"

namespace cimple
{

/// Makes the agent on first call. Takes a reference and returns 0, or LOAD_FAILED and no reference.
int loadProvider();
/// Gives the reference back; returns 0.
int unloadProvider(const char* providerName);

/// Copies what is selected of the map under the locks, then gives the copies to the handler. Every failure leaves a log
/// line and ends the enumeration with what was sent; the status is always 0. A handler that must know whether it was
/// given everything is told by a null instance with ENUM_INSTANCES_FAILED. A second map, if there is one, comes behind
/// the first.
int enumeratePlain(Instance_Map InstanceCache::*map, Instance_Map InstanceCache::*second, const char* providerName,
                   Instance_Handler handler, void* client, const Selection& selection);

/// The same for SAN classes, whose maps are built when one of them is asked for.
int enumerateSan(Instance_Map InstanceCache::*map, const char* providerName, Instance_Handler handler, void* client,
                 const Selection& selection);

/// Updates what is selected of a map from the hardware; the caller holds all locks of the refresh.
using LiveRefresh = void (*)(ProviderAgent& agent, const Selection& selection);

/// The same after a live refresh, serialised by the class's own mutex.
int enumerateActive(Instance_Map InstanceCache::*map, const char* providerName, Mutex& classMutex, LiveRefresh refresh,
                    Instance_Handler handler, void* client, const Selection& selection);

} // namespace cimple
