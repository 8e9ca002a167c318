// The operations of CIM servers (DSP0200) on the broker: a request's text in, a response's text out.
#pragma once

#include "broker/cimxml/Pulls.h"
#include "broker/core/Broker.h"

#include <string>
#include <string_view>

namespace cimxml
{

/// The response to a request. What is left of a result that the client takes in parts goes to `pulls`. Failures of the
/// operation are part of it; throws HttpRefusal for what is no request.
std::string answer(broker::Broker& broker, Pulls& pulls, std::string_view request);

} // namespace cimxml
