// Which provider of the module serves which class in which namespaces: the registration that CIM servers read.
#pragma once

#include "broker/values/ClassInfo.h"

#include <string>
#include <string_view>
#include <vector>

namespace broker
{

struct RegisteredClass
{
    std::string provider; ///< the head of the names of its factories
    std::vector<std::string> nameSpaces;
};
using Registration = std::map<std::string, RegisteredClass, NameLess>; ///< by class

/// Reads the small-footprint broker's form: a stanza "[Class]" with lines "name: value" for each class. Names that the
/// broker has no use for are passed over. Throws std::runtime_error for a stanza without a provider or a namespace.
Registration parseRegistration(std::string_view text);
/// The same from a file.
Registration readRegistration(const std::string& path);

} // namespace broker
