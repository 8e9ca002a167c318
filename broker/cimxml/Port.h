// The entrance of CIM clients to a port: operations over HTTP (DSP0200).
#pragma once

#include "broker/core/Broker.h"
#include "broker/http/Site.h"

namespace cimxml
{

/// Takes what is posted, wherever to. The broker outlives it.
http::Site site(broker::Broker& broker);

} // namespace cimxml
