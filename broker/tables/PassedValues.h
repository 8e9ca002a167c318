// What servers change in values on the way from a client to a provider and back.
#pragma once

#include "broker/core/Options.h"
#include "broker/core/Reply.h"

#include <vector>

namespace broker
{

/// The instance with the listed properties only.
Object filtered(Object object, const PropertyList& list);

/// Properties or parameters as clients get them from a provider.
std::vector<Property> delivered(std::vector<Property> properties, NullElements nullElements);

/// The path as a server hands it on that makes null of empty keys: in references, and in the path itself if it is the
/// `source` of associations.
Path withoutEmptyKeys(Path path, bool source);
std::vector<Property> withoutEmptyKeys(std::vector<Property> properties);

} // namespace broker
