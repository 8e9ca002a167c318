// Where the broker gets its provider module, and which server it plays.
#pragma once

#include "broker/core/ModuleImage.h"
#include "broker/core/Personality.h"

#include <chrono>
#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace broker
{

struct Options
{
    std::string module = {};                 ///< path of the shared object, opened when `image` is null
    std::shared_ptr<ModuleImage> image = {}; ///< a module that is already at hand
    /// Path of the registration file: it names the namespaces and the provider of each class that is served.
    std::string registration = {};
    /// Without a registration file: namespaces that all of the module's classes are registered for.
    std::vector<std::string> moduleNamespaces = {"root/tavrin"};
    /// Further namespaces, in which only classes without a provider exist.
    std::vector<std::string> platformNamespaces = {"root/ibmse"};
    /// The server to play. A test may change single manners of it.
    Personality personality = strict;
    /// How long an up-call waits where one is let through at a time; then it answers CMPI_RC_ERROR_SYSTEM.
    std::chrono::milliseconds upcallWait = std::chrono::seconds(20);
    /// Dead objects that are kept, emptied, to recognise their use. Older ones are freed.
    std::size_t quarantine = 16384;
    /// Receives what providers log and trace.
    std::function<void(const std::string&)> log = {};
};

} // namespace broker
