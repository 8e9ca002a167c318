// Steps of the tests that walk all that the module serves.
#pragma once

#include "tests/module/Host.h"

#include <string>
#include <vector>

namespace module_test
{

/// The references of an association instance, by name.
std::vector<broker::Property> referencesOf(const broker::Object& association);
/// Text by which two paths of one instance are equal, whatever the order of their keys.
std::string identity(const broker::Path& path);
/// Texts of paths, sorted.
std::vector<std::string> identities(const std::vector<broker::Path>& paths);
std::vector<broker::Path> pathsOf(const std::vector<broker::Object>& objects);
/// Instances of exactly this class.
std::vector<broker::Object> exactInstancesOf(broker::Broker& broker, const std::string& className);

/// Gives the broker what other providers serve on a real host: computer system, chassis and the base server profile.
void addPlatform(broker::Broker& broker);

} // namespace module_test
