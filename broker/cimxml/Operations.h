// The operations of CIM servers (DSP0200) on the broker: a request's text in, a response's text out.
#pragma once

#include "broker/core/Broker.h"

#include <string>
#include <string_view>

namespace cimxml
{

/// The response to a request. Failures of the operation are part of it; throws HttpRefusal for what is no request.
std::string answer(broker::Broker& broker, std::string_view request);

} // namespace cimxml
