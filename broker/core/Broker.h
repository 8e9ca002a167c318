// An embedded CIM broker for one provider module: the client side of it, for tests and tools.
//
//   broker::Broker b({.module = "libtavrin_fc_provider.so"});
//   broker::Reply cards = b.enumerateInstances("root/tavrin", "TVRHBA_Card");
#pragma once

#include "broker/core/Options.h"
#include "broker/core/Providers.h"
#include "broker/core/Reply.h"
#include "broker/core/Store.h"
#include "broker/core/Violations.h"
#include "broker/values/ClassInfo.h"

#include <functional>
#include <memory>
#include <shared_mutex>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

/// All operations may be called from many threads at once. They never throw for what a provider does; they answer a CIM
/// status. It is strict: each breach of the CMPI contract is collected as a violation while the operation goes on.
class Broker
{
public:
    /// Opens the module and reads its class definitions. Throws std::runtime_error when it cannot.
    explicit Broker(Options options);
    /// Unloads if that was not done.
    ~Broker();
    Broker(const Broker&) = delete;
    Broker& operator=(const Broker&) = delete;

    // Of operations whose results may be many there are two forms: one gives them to a sink as they come, the other
    // collects them.
    Outcome enumerateInstances(std::string_view nameSpace, std::string_view className, const PropertyList& properties,
                               const ObjectSink& sink);
    Outcome enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink);
    Outcome associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                        const ObjectSink& sink);
    Outcome associatorNames(const Path& path, const AssociationFilter& filter, const PathSink& sink);
    Outcome references(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                       const ObjectSink& sink);
    Outcome referenceNames(const Path& path, const AssociationFilter& filter, const PathSink& sink);
    Reply enumerateInstances(std::string_view nameSpace, std::string_view className,
                             const PropertyList& properties = std::nullopt);
    NamesReply enumerateInstanceNames(std::string_view nameSpace, std::string_view className);
    /// One instance when the status is OK.
    Reply getInstance(const Path& path, const PropertyList& properties = std::nullopt);
    Reply associators(const Path& path, const AssociationFilter& filter = {},
                      const PropertyList& properties = std::nullopt);
    NamesReply associatorNames(const Path& path, const AssociationFilter& filter = {});
    /// `filter` has a class in `assocClass` and a role; the rest is not used.
    Reply references(const Path& path, const AssociationFilter& filter = {},
                     const PropertyList& properties = std::nullopt);
    NamesReply referenceNames(const Path& path, const AssociationFilter& filter = {});
    /// The path of the new instance.
    NamesReply createInstance(const Object& object);
    Outcome modifyInstance(const Object& object, const PropertyList& properties = std::nullopt);
    Outcome deleteInstance(const Path& path);
    MethodReply invokeMethod(const Path& path, const std::string& method, const std::vector<Property>& in = {});

    /// Whether the namespace is there, and has the class, as the operations would say.
    Outcome findNameSpace(std::string_view nameSpace);
    Outcome findClass(std::string_view nameSpace, std::string_view className);
    const ClassTable& classes() const;
    /// Adds a class of the broker's own, of which the store has the instances. Before the first operation.
    void declare(const ClassDeclaration& declaration);
    /// All names by which namespaces can be reached.
    std::vector<std::string> nameSpaces();
    Store& store();
    /// Classes that the module serves, in its order of linking.
    const std::vector<std::string>& servedClasses() const;
    /// Namespaces that the class is registered for, in lower case; none for a class that the module does not serve.
    std::vector<std::string> nameSpacesOf(std::string_view className) const;
    /// Calls `use` with the address of a function that the module exports, which stays loaded meanwhile; not where it
    /// has none of that name or is unloaded.
    void withFunction(const std::string& name, const std::function<void(void*)>& use);
    /// Whether the module has a factory of that kind for the class.
    bool serves(std::string_view className, Kind kind) const;

    /// Calls the class's factories of these kinds that were not called yet.
    Outcome loadProvider(std::string_view className, const std::vector<Kind>& kinds);
    /// Calls cleanup of each loaded MI of the class, or of all classes for an empty name. An MI that answers OK is
    /// loaded again at its next use.
    std::vector<CleanupAnswer> cleanup(std::string_view className, bool terminating);
    /// Waits for running operations, cleans up everything with `terminating` set, closes the module and looks for
    /// clones, thread contexts and marks that the provider left. Operations answer CMPI_RC_ERR_FAILED from then on.
    std::vector<CleanupAnswer> unload();
    bool loaded() const;

    std::vector<Violation> violations() const;
    void clearViolations();
    std::size_t liveClones() const;
    /// What the provider delivered as indications.
    std::vector<Object> indications() const;

private:
    template <class Answer, class Operation> Answer guarded(Operation operation);

    std::unique_ptr<Core> _core;
    mutable std::shared_mutex _gate; ///< shared by operations, taken alone by load and unload
};

} // namespace broker
