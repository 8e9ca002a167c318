// Reads the subset of MOF that the schema sources use.
#pragma once

#include "schemac/Model.h"

#include <string>
#include <string_view>

namespace schemac
{

/// Appends the declarations in `text` to the schema; `file` names the text in refusals. Throws SyntaxError at
/// the first thing that is not of the subset: qualifier declarations and classes with properties, references
/// and methods. No pragmas, instances, aliases or flavors on a qualifier's use.
void parse(std::string_view text, const std::string& file, Schema& schema);

} // namespace schemac
