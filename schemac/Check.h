// Resolves a schema and refuses declarations that the meta tables or a CIM server could not take.
#pragma once

#include "schemac/Model.h"

#include <string>
#include <vector>

namespace schemac
{

/// Resolves superclasses, members and key counts, and returns all refusals ("file:line: reason") in the order of
/// the sources. The fields are of use only when there are none. Members point into `schema`.
std::vector<std::string> check(Schema& schema);

/// The part that concerns qualifiers: declared, allowed where they stand, each once and with a fitting value.
std::vector<std::string> check_qualifiers(const Schema& schema);

/// The part that concerns what people are shown of values: a name for each value or bit, values of the type, each once,
/// and units of numbers alone.
std::vector<std::string> check_value_maps(const Schema& schema);

} // namespace schemac
