// How a broker behaves where CIM servers differ, and where it gets its provider module.
#pragma once

#include "broker/ModuleImage.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace broker
{

/// Association class that a provider is given when the client names none.
enum class Fanout
{
    null_class,
    own_class, ///< the provider's own registered class
};

/// Which of a class's factories are called at its first use.
enum class LoadKinds
{
    lazy, ///< only the kind that the request needs
    all,
};

/// Which loaded providers get a cleanup call when everything is unloaded.
enum class CleanupCalls
{
    each,
    last_of_kind, ///< only the one loaded last of each kind, as if the library were one provider
};

/// Type in which integer keys reach a provider, whatever the class says.
enum class IntegerKeys
{
    signed64,
    unsigned64,
};

struct Options
{
    std::string module = {};                 ///< path of the shared object, opened when `image` is null
    std::shared_ptr<ModuleImage> image = {}; ///< a module that is already at hand
    bool globalSymbols = false;              ///< open the shared object with RTLD_GLOBAL
    Fanout fanout = Fanout::null_class;
    LoadKinds loadKinds = LoadKinds::lazy;
    CleanupCalls cleanupCalls = CleanupCalls::each;
    IntegerKeys integerKeys = IntegerKeys::signed64;
    /// Nothing stands for a principal without authentication: a string whose characters are a null pointer.
    std::optional<std::string> principal = "root";
    /// Namespaces that the module's classes are registered for.
    std::vector<std::string> moduleNamespaces = {"root/tavrin", "root/pg_interop"};
    /// Further namespaces, in which only classes without a provider exist.
    std::vector<std::string> platformNamespaces = {"root/ibmse"};
    /// Offer the table of marks behind the broker, as one server does beyond CMPI 1.0.
    bool marks = false;
    /// Dead objects that are kept, emptied, to recognise their use. Older ones are freed.
    std::size_t quarantine = 16384;
    /// Receives what providers log and trace.
    std::function<void(const std::string&)> log = {};
};

} // namespace broker
