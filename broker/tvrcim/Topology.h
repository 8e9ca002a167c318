// The host as a picture: cards, ports, and the targets and units that these reach, in graphviz's language.
#pragma once

#include "broker/host/HostReport.h"

#include <string>

namespace tvrcim
{

/// A graph in the DOT language. A target that several ports reach is drawn once, and so are its units. Where there are
/// many targets or units, one box with their number stands for them, unless `all` are wanted.
std::string topologyDot(const broker::HostNode& host, bool all = false);

} // namespace tvrcim
