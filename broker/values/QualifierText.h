// Names of the flags of the meta tables, and classes and instances as MOF.
#pragma once

#include "broker/values/ClassInfo.h"

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

/// The flag of a qualifier, in any case; 0 if the meta tables know none of that name.
std::uint32_t qualifierMask(std::string_view name);
/// Qualifiers among the flags; the bits for the kind of a feature (property, reference, method, class) are none.
std::vector<std::string> qualifierNames(std::uint32_t flags);

/// The class with its own features, as source text.
std::string mofText(const ClassInfo& info);
std::string mofText(const ClassInfo& info, const MethodInfo& method);
std::string mofText(const Object& object);

} // namespace broker
