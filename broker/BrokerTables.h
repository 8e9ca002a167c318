// The function tables that a provider gets with its broker pointer.
#pragma once

#include "broker/Providers.h"

namespace broker
{

extern const CMPIBrokerFT upcallTable;
extern const CMPIBrokerEncFT factoryTable;
extern const CMPIBrokerExtFT servicesTable;

/// A broker with the three tables (and that of marks, if the options ask for it) for one provider.
void fillProviderBroker(ProviderBroker& broker, Core& core);

/// The broker behind a pointer that a provider hands in. A pointer that no provider of this thread's frame was given is
/// a violation; the answer is null for a pointer that is not ours.
Core* openBroker(const CMPIBroker* broker, const char* function);

} // namespace broker
