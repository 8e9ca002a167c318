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
    Reply enumerateInstances(std::string_view nameSpace, std::string_view className, const PropertyList& properties);
    NamesReply enumerateInstanceNames(std::string_view nameSpace, std::string_view className);
    Reply getInstance(const Path& path, const PropertyList& properties);
    /// The path of the new instance.
    NamesReply createInstance(const Object& object);
    Outcome modifyInstance(const Object& object, const PropertyList& properties);
    Outcome deleteInstance(const Path& path);
    /// Asked of all association providers that can refer to the path's class; nothing is filtered here.
    Reply associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties);
    NamesReply associatorNames(const Path& path, const AssociationFilter& filter);
    Reply references(const Path& path, const AssociationFilter& filter, const PropertyList& properties);
    NamesReply referenceNames(const Path& path, const AssociationFilter& filter);
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
    Reply cut(Reply answer, const PropertyList& properties) const;
    std::vector<Property> contextEntries(std::string_view nameSpace) const;
    const ClassInfo* associationSource(const Path& path, const AssociationFilter& filter, Outcome& outcome);
    std::vector<Provider*> associationProviders(const Path& path, const AssociationFilter& filter, Outcome& outcome);

    template <Kind K, class Call>
    ResultContent run(Provider& provider, const std::string& what, std::string_view nameSpace, ResultContent expected,
                      bool mustBeDone, Outcome& outcome, Call call);
    template <class Answer, class Call, class Stored>
    Answer enumerate(const char* operation, std::string_view nameSpace, std::string_view className, Call call,
                     Stored stored);
    template <class Answer, class Call>
    Answer fanOutAssociations(const char* operation, const Path& path, const AssociationFilter& filter, Call call);

    Core& _core;
};

} // namespace broker
