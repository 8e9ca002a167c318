// The module's providers: which classes they serve, and the MI structures that their factories made.
#pragma once

#include "broker/core/Registration.h"
#include "broker/core/Reply.h"
#include "broker/values/ClassInfo.h"

#include <array>
#include <atomic>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

struct Core;

enum class Kind
{
    instance,
    association,
    method,
};
inline constexpr std::array allKinds{Kind::instance, Kind::association, Kind::method};
const char* kindName(Kind kind); ///< "Instance", ... as in factory symbols

/// A broker as a provider sees it: the structure of CMPI 1.0 with what a later one has behind it.
struct ProviderBroker
{
    CMPIBroker cmpi;
    const void* marks; ///< the table of marks or null
};

/// What a cleanup call answered.
struct CleanupAnswer
{
    std::string className;
    Kind kind;
    CMPIrc status;
};

/// One class's provider.
struct Provider
{
    /// `nameSpace` in any case and by any of its names.
    bool isRegisteredFor(std::string_view nameSpace) const;

    const ClassInfo* info = {};
    std::vector<std::string> nameSpaces; ///< canonical names of those that it is registered for
    std::string factories;               ///< the head of the names of its factories
    ProviderBroker ownBroker{};
    const CMPIBroker* broker = {}; ///< what its factories get
    std::recursive_mutex mutex;    ///< guards what follows
    std::array<void*, allKinds.size()> mi{};
    std::array<std::uint64_t, allKinds.size()> loadOrder{};
};

class ProviderTable
{
public:
    explicit ProviderTable(Core& core);

    /// The class's provider, or null. Any case.
    Provider* find(std::string_view className);
    /// Whether the module has a factory of that kind for the class.
    bool serves(std::string_view className, Kind kind) const;
    /// Whether a class is registered for the namespace of that canonical name.
    bool inUse(const std::string& nameSpace) const { return _nameSpaces.count(nameSpace) > 0; }
    const std::set<std::string>& nameSpaces() const { return _nameSpaces; } ///< canonical names of those in use
    /// Classes with a provider, in the module's order of linking.
    const std::vector<std::string>& classNames() const { return _names; }

    /// Makes the MI by its factory if there is none yet. On failure `outcome` says why and the answer is null.
    void* load(Provider& provider, Kind kind, Outcome& outcome);
    /// Cleans up the MIs of one class, or of all classes when the name is empty. The answers OK and, at shutdown, any
    /// answer let go of the MI.
    std::vector<CleanupAnswer> cleanup(std::string_view className, bool terminating);
    /// As at the end of a server: cleanup as the options say, then every MI is let go of.
    std::vector<CleanupAnswer> shutdown();

private:
    std::unique_ptr<Provider> describe(const ClassInfo& info);
    void* create(Provider& provider, Kind kind, Outcome& outcome);
    CleanupAnswer cleanupOne(Provider& provider, Kind kind, bool terminating);

    Core& _core;
    ProviderBroker _sharedBroker{}; ///< where all providers get one
    Registration _registration;
    std::set<std::string> _nameSpaces;
    std::map<std::string, std::unique_ptr<Provider>, NameLess> _providers;
    std::vector<std::string> _names;
    std::atomic<std::uint64_t> _loads{0};
};

} // namespace broker
