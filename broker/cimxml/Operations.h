// The operations of CIM servers (DSP0200) on the broker: a request's text in, a response's text out.
#pragma once

#include "broker/cimxml/Pulls.h"
#include "broker/cimxml/Request.h"
#include "broker/core/Broker.h"
#include "broker/http/Site.h"

#include <functional>
#include <string>
#include <string_view>

namespace cimxml
{

/// Takes the next part of a response; false when nobody reads it any more.
using Output = std::function<bool(std::string_view)>;

/// Gives the response to a request in parts of about 64 KiB, while the provider is still at it. What is left of a
/// result that the client takes in parts goes to `pulls`. Failures of the operation are part of the response; false for
/// one that came behind the first part: then the response has no end, and its reader must be told so. A client who may
/// not change anything calls no methods either; what others do is told to the journal.
bool answer(broker::Broker& broker, Pulls& pulls, const Message& message, const Output& output,
            const http::Caller& caller = {.mayChange = true});

/// The same as one text, of a request's text. Throws HttpRefusal for what is no request.
std::string answer(broker::Broker& broker, Pulls& pulls, std::string_view request);

} // namespace cimxml
