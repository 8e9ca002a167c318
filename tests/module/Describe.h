// Instances as text, so that an expectation reads like a table and a difference shows as one.
#pragma once

#include "tests/module/Host.h"

namespace module_test
{

/// Every property that is not null as "Name = value", a line each, in the order of the names; texts are quoted,
/// references are paths. What is not listed is null.
std::string describe(const broker::Object& object);

/// The only instance of the class whose property has this text.
broker::Object theOne(Host& host, const std::string& className, const std::string& property, const std::string& value);

/// The instance with another value of one property and nothing else, as a client sends a change.
broker::Object changed(const broker::Object& instance, const char* property, broker::Value value);

/// Lines of the log that hold one of the words.
std::vector<std::string> logAbout(const Host& host, const std::vector<std::string>& words);

} // namespace module_test
