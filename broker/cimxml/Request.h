// The frame of a CIM-XML message: what a client asks for, before anything is known of classes.
#pragma once

#include "broker/cimxml/Decode.h"

#include <string>
#include <string_view>

namespace cimxml
{

/// One call. It refers to the document that it was read from.
struct Request
{
    std::string id; ///< of the message, to be repeated
    std::string name;
    bool extrinsic = false;
    std::string nameSpace; ///< as the client writes it
    pugi::xml_node call = {};

    /// The named parameter, in any case; a null node if the client gave none.
    pugi::xml_node parameter(std::string_view parameterName) const;
};

/// Throws HttpRefusal for another frame (DSP0200 7.3.1 has the statuses).
Request readRequest(const pugi::xml_document& document);

/// A message of a client, and the call in it. Throws HttpRefusal for what is none.
struct Message
{
    explicit Message(std::string_view text);

    pugi::xml_document document = {};
    Request request;
};

} // namespace cimxml
