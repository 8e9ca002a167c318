// The function tables that a provider gets with its broker pointer.
#pragma once

#include "broker/core/Options.h"
#include "broker/core/Providers.h"

namespace broker
{

extern const CMPIBrokerFT upcallTable;
extern const CMPIBrokerEncFT factoryTable;
extern const CMPIBrokerExtFT servicesTable;

/// The three tables as a server numbers and fills them.
struct BrokerTables
{
    explicit BrokerTables(const Personality& personality);

    CMPIBrokerFT upcalls;
    CMPIBrokerEncFT factories;
    CMPIBrokerExtFT services;
};

/// A broker with the core's tables (and that of marks, where the server has it).
void fillProviderBroker(ProviderBroker& broker, Core& core);

/// The broker behind a pointer that a provider hands in. A pointer that no provider of this thread's frame was given is
/// a violation; the answer is null for a pointer that is not ours.
Core* openBroker(const CMPIBroker* broker, const char* function);

} // namespace broker
