// Where an operation goes: to the store or to the module's providers, to one of them or to many.
#pragma once

#include "broker/core/Core.h"
#include "broker/core/Reply.h"
#include "broker/tables/Handles.h"

#include <string>
#include <string_view>
#include <vector>

namespace broker
{

/// Answers clients and up-calls alike. Unknown namespace: CMPI_RC_ERR_INVALID_NAMESPACE; unknown class:
/// CMPI_RC_ERR_INVALID_CLASS, also for a class of the module where it is not registered. When one of several providers
/// fails, the whole operation fails with its status.
class Dispatcher
{
public:
    explicit Dispatcher(Core& core) : _core(core) {}

    /// The class's instances and those of its subclasses, each from its own class's provider.
    Outcome enumerateInstances(std::string_view nameSpace, std::string_view className, const PropertyList& properties,
                               const ObjectSink& sink);
    Outcome enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink);
    Reply getInstance(const Path& path, const PropertyList& properties);
    /// The path of the new instance.
    NamesReply createInstance(const Object& object);
    Outcome modifyInstance(const Object& object, const PropertyList& properties);
    Outcome deleteInstance(const Path& path);
    /// Asked of all association providers that can refer to the path's class; nothing is filtered here.
    Outcome associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                        const ObjectSink& sink);
    Outcome associatorNames(const Path& path, const AssociationFilter& filter, const PathSink& sink);
    Outcome references(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                       const ObjectSink& sink);
    Outcome referenceNames(const Path& path, const AssociationFilter& filter, const PathSink& sink);
    MethodReply invokeMethod(const Path& path, const std::string& method, const std::vector<Property>& in);
    /// Null, with the reason in `outcome`, where the namespace has no such class.
    const ClassInfo* findClass(std::string_view nameSpace, std::string_view className, Outcome& outcome);
    bool exists(std::string_view nameSpace) const;
    /// All names by which namespaces can be reached.
    std::vector<std::string> nameSpaces() const;

private:
    const ClassInfo* findClassOf(const Path& path, Outcome& outcome);
    Provider* providerOf(const ClassInfo& info, std::string_view nameSpace) const;
    bool skips(const Outcome& outcome, std::size_t providers) const;
    PropertyList listOfSuperclass(std::string_view className) const;
    /// Handles for what a request has.
    PathHandle* passed(Frame& frame, const Path& path, bool source = false) const;
    InstanceHandle* passed(Frame& frame, const Object& object) const;
    std::vector<Property> passed(const std::vector<Property>& arguments) const;
    /// What a provider gives, on its way to the sink: as the server hands it on, and cut to the list where it does
    /// that.
    ResultContent resultFor(const ObjectSink& sink, const PropertyList& properties) const;
    static ResultContent resultFor(const PathSink& sink);
    std::vector<Property> contextEntries(std::string_view nameSpace) const;
    const ClassInfo* associationSource(const Path& path, const AssociationFilter& filter, Outcome& outcome);
    std::vector<Provider*> associationProviders(const Path& path, const AssociationFilter& filter, Outcome& outcome);

    template <Kind K, class Call>
    ResultContent run(Provider& provider, const std::string& what, std::string_view nameSpace, ResultContent expected,
                      bool mustBeDone, Outcome& outcome, Call call);
    template <class Call, class Stored>
    Outcome enumerate(const char* operation, std::string_view nameSpace, std::string_view className,
                      const ResultContent& result, Call call, Stored stored);
    template <class Call>
    Outcome fanOutAssociations(const char* operation, const Path& path, const AssociationFilter& filter,
                               const ResultContent& result, Call call);

    Core& _core;
};

} // namespace broker
