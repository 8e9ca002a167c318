// The JSON interface of the port: what pages and scripts ask, and methods that they call.
#pragma once

#include "broker/core/Broker.h"
#include "broker/http/Site.h"

#include <string>

namespace web
{

/// What the port says of itself.
struct Facts
{
    std::string version;
    bool simulated = false;
};

/// Below /api/. The broker outlives the site.
http::Site apiSite(broker::Broker& broker, const std::string& nameSpace, const Facts& facts);

} // namespace web
