// What the port says of itself, so that a client finds namespaces and, from there, profiles: the object manager and the
// namespaces as instances in the interop namespace.
#pragma once

#include "broker/core/Broker.h"

namespace cimxml
{

/// Adds the classes, which no module has, and their instances. Before the first operation, once for a broker.
void describePort(broker::Broker& broker);

} // namespace cimxml
