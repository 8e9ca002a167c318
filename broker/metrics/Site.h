// What monitoring scrapes.
#pragma once

#include "broker/core/Broker.h"
#include "broker/http/Site.h"

#include <string>

namespace metrics
{

/// The path /metrics. The broker outlives the site.
http::Site site(broker::Broker& broker, const std::string& nameSpace);

} // namespace metrics
