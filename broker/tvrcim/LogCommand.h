// The logs of the provider and of its driver, for people.
#pragma once

#include "broker/tvrcim/Commands.h"

namespace tvrcim
{

/// Switches the log on that the command asks for, and prints its entries, the newest last; with `follow` for ever, or
/// until nobody reads the output.
void showLog(Session& session, const Command& command);

} // namespace tvrcim
