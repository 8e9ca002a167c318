#include "broker/core/Dispatch.h"

#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"
#include "broker/tables/PassedValues.h"

#include <algorithm>
#include <iterator>
#include <set>
#include <span>
#include <type_traits>

namespace broker
{

namespace
{

using ResultKind = ResultContent::Kind;

template <Kind K>
using MiOf = std::conditional_t<K == Kind::instance, CMPIInstanceMI,
                                std::conditional_t<K == Kind::association, CMPIAssociationMI, CMPIMethodMI>>;

Outcome failure(CMPIrc status, std::string message)
{
    return {status, std::move(message)};
}

Outcome outcomeOf(const CMPIStatus& status, const ClassInfo& info)
{
    if (status.rc == CMPI_RC_OK)
        return {};
    const StringHandle* text = status.msg ? open<StringHandle>(status.msg, "getCharPtr") : nullptr;
    return failure(status.rc, info.name + (text ? ": " + text->content.text : " answered so"));
}

const char* filterText(const std::string& text)
{
    return text.empty() ? nullptr : text.c_str();
}

template <class Answer> Answer failed(const Outcome& outcome)
{
    Answer answer;
    static_cast<Outcome&>(answer) = outcome;
    return answer;
}

const std::vector<std::string>* listOf(const PropertyList& properties)
{
    return properties ? &*properties : nullptr;
}

bool canReference(const ClassInfo& association, const ClassInfo& source)
{
    return std::any_of(association.properties.begin(), association.properties.end(),
                       [&](const FeatureInfo& property)
                       { return property.isReference() && source.isA(property.referenceClass); });
}

} // namespace

// --- where things are ----------------------------------------------------------------------------------

bool Dispatcher::exists(std::string_view nameSpace) const
{
    const std::span<const std::string_view> known = _core.options.personality.knownInteropNames();
    const std::string wanted = canonicalNameSpace(nameSpace);
    if (wanted == interopNames.front() &&
        std::none_of(known.begin(), known.end(), [&](std::string_view name) { return sameName(name, nameSpace); }))
        return false;
    const std::vector<std::string>& platform = _core.options.platformNamespaces;
    return _core.providers.inUse(wanted) ||
           std::any_of(platform.begin(), platform.end(),
                       [&](const std::string& space) { return canonicalNameSpace(space) == wanted; });
}

std::vector<std::string> Dispatcher::nameSpaces() const
{
    std::set<std::string> names = _core.providers.nameSpaces();
    for (const std::string& name : _core.options.platformNamespaces)
        names.insert(canonicalNameSpace(name));
    if (names.contains(std::string(interopNames.front())))
    {
        const std::span<const std::string_view> known = _core.options.personality.knownInteropNames();
        names.insert(known.begin(), known.end());
    }
    return {names.begin(), names.end()};
}

/// The class's provider if it is registered for the namespace, otherwise null.
Provider* Dispatcher::providerOf(const ClassInfo& info, std::string_view nameSpace) const
{
    Provider* provider = _core.providers.find(info.name);
    return provider && provider->isRegisteredFor(nameSpace) ? provider : nullptr;
}

/// A class without a provider exists in every namespace, one with a provider where that is registered.
const ClassInfo* Dispatcher::findClass(std::string_view nameSpace, std::string_view className, Outcome& outcome)
{
    if (!exists(nameSpace))
    {
        outcome = failure(CMPI_RC_ERR_INVALID_NAMESPACE, "there is no namespace '" + std::string(nameSpace) + "'");
        return nullptr;
    }
    const ClassInfo* info = _core.classes.find(className);
    if (!info || (_core.providers.find(info->name) && !providerOf(*info, nameSpace)))
    {
        outcome = failure(CMPI_RC_ERR_INVALID_CLASS,
                          "there is no class '" + std::string(className) + "' in " + std::string(nameSpace));
        return nullptr;
    }
    return info;
}

/// The class of a path that a request names.
const ClassInfo* Dispatcher::findClassOf(const Path& path, Outcome& outcome)
{
    const ClassInfo* info = findClass(path.nameSpace, path.className, outcome);
    const bool bare = std::any_of(path.keys.begin(), path.keys.end(),
                                  [](const Property& key) {
                                      return key.value.type() == CMPI_ref && !key.value.isNull() &&
                                             key.value.asPath().nameSpace.empty();
                                  });
    if (info && bare && !_core.options.personality.bareReferences)
    {
        outcome =
            failure(CMPI_RC_ERR_INVALID_CLASS, "a key of " + info->name + " refers to a path without a namespace");
        return nullptr;
    }
    return info;
}

// --- what a server makes of a request ------------------------------------------------------------------

PathHandle* Dispatcher::passed(Frame& frame, const Path& path, bool source) const
{
    return makePath(frame, _core.options.personality.nullForEmptyKeys ? withoutEmptyKeys(path, source) : path);
}

InstanceHandle* Dispatcher::passed(Frame& frame, const Object& object) const
{
    if (!_core.options.personality.nullForEmptyKeys)
        return makeInstance(frame, object);
    return makeInstance(frame, {withoutEmptyKeys(object.path, false), withoutEmptyKeys(object.properties)});
}

std::vector<Property> Dispatcher::passed(const std::vector<Property>& arguments) const
{
    const Personality& personality = _core.options.personality;
    std::vector<Property> result = personality.nullForEmptyKeys ? withoutEmptyKeys(arguments) : arguments;
    if (!personality.nullArguments)
        std::erase_if(result, [](const Property& argument) { return argument.value.isNull(); });
    return result;
}

/// The property list that a provider gets for an enumeration without one.
PropertyList Dispatcher::listOfSuperclass(std::string_view className) const
{
    const ClassInfo* root = _core.classes.find(className);
    if (!root || !_core.options.personality.listOfSuperclass || root->subclasses.empty())
        return std::nullopt;
    std::vector<std::string> names;
    std::transform(root->properties.begin(), root->properties.end(), std::back_inserter(names),
                   [](const FeatureInfo& property) { return property.name; });
    return names;
}

std::vector<Property> Dispatcher::contextEntries(std::string_view nameSpace) const
{
    const char* principal = _core.options.personality.principal;
    return {{CMPIInvocationFlags, Value::uint32(0)},
            {CMPIPrincipal, principal ? Value::string(principal) : Value::null(CMPI_string)},
            {CMPIInitNameSpace, Value::string(std::string(nameSpace))}};
}

// --- one call into a provider --------------------------------------------------------------------------

/// Loads the provider, calls it in a frame of its own and checks how it ended. `call` gets the MI, the frame and the
/// result, and returns the provider's status.
template <Kind K, class Call>
ResultContent Dispatcher::run(Provider& provider, const std::string& what, std::string_view nameSpace,
                              ResultContent expected, bool mustBeDone, Outcome& outcome, Call call)
{
    auto* mi = static_cast<MiOf<K>*>(_core.providers.load(provider, K, outcome));
    if (!mi)
        return {};
    CallFrame frame(_core, provider.broker, what, contextEntries(nameSpace));
    frame.forgets = expected.objects.forgets || expected.paths.forgets;
    ResultHandle* result = frame.make<ResultHandle>(std::move(expected));
    const CMPIStatus status = call(mi, frame, result);
    outcome = outcomeOf(status, *provider.info);
    if (Frame::current() != &frame)
        _core.violation("the provider left an attachment on the broker's thread");
    if (outcome.ok() && mustBeDone && !result->content.done)
        _core.violation("success without returnDone");
    if (outcome.ok() && result->content.kind == ResultKind::data && !result->content.data)
        _core.violation("success of a method without returnData");
    return outcome.ok() ? std::move(result->content) : ResultContent();
}

/// Whether the failure of one of so many providers leaves the request to the others.
bool Dispatcher::skips(const Outcome& outcome, std::size_t providers) const
{
    return _core.options.personality.skipsNotSupported && providers > 1 && outcome.status == CMPI_RC_ERR_NOT_SUPPORTED;
}

ResultContent Dispatcher::resultFor(const ObjectSink& sink, const PropertyList& properties) const
{
    const Personality& personality = _core.options.personality;
    const bool cuts = personality.propertyFilters == PropertyFilters::broker;
    const auto take = [&sink, &personality, list = cuts ? properties : std::nullopt](Object&& object)
    {
        object.properties = delivered(std::move(object.properties), personality.nullElements);
        return sink.take(filtered(std::move(object), list));
    };
    return {.kind = ResultKind::instances, .objects = {take, sink.forgets}};
}

ResultContent Dispatcher::resultFor(const PathSink& sink)
{
    return {.kind = ResultKind::paths, .paths = sink};
}

// --- instances -----------------------------------------------------------------------------------------

/// Enumerates through the providers and the store. `call` gets the MI, the context, the result and the class path;
/// `stored` gives one of the store's instances to the client, and says whether he wants more.
template <class Call, class Stored>
Outcome Dispatcher::enumerate(const char* operation, std::string_view nameSpace, std::string_view className,
                              const ResultContent& result, Call call, Stored stored)
{
    Outcome outcome;
    const ClassInfo* root = findClass(nameSpace, className, outcome);
    if (!root)
        return outcome;
    const std::vector<const ClassInfo*> family = _core.classes.withSubclasses(*root);
    const auto served = [&](const ClassInfo* info) { return providerOf(*info, nameSpace) != nullptr; };
    const auto providers = static_cast<std::size_t>(std::count_if(family.begin(), family.end(), served));
    for (const ClassInfo* info : family)
    {
        Provider* provider = providerOf(*info, nameSpace);
        if (!provider)
        {
            for (Object& object : _core.store.enumerate(nameSpace, info->name))
                if (!stored(std::move(object)))
                    return failure(CMPI_RC_ERR_FAILED, "the client wants no more");
            continue;
        }
        const auto ask = [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* results) {
            return call(mi, frame.context, results, makePath(frame, {std::string(nameSpace), info->name, {}}));
        };
        ResultContent expected = result;
        expected.expectedClass = info;
        run<Kind::instance>(*provider, operation + (" " + info->name), nameSpace, std::move(expected), true, outcome,
                            ask);
        if (!outcome.ok() && !skips(outcome, providers))
            return outcome;
    }
    return {};
}

Outcome Dispatcher::enumerateInstances(std::string_view nameSpace, std::string_view className,
                                       const PropertyList& properties, const ObjectSink& sink)
{
    const PropertyList list = properties ? properties : listOfSuperclass(className);
    NameList names(listOf(list));
    return enumerate(
        "enumerateInstances", nameSpace, className, resultFor(sink, list),
        [&](CMPIInstanceMI* mi, ContextHandle* context, ResultHandle* result, PathHandle* path)
        { return mi->ft->enumerateInstances(mi, context, result, path, names.get()); },
        [&](Object&& object) { return sink.take(filtered(std::move(object), list)); });
}

Outcome Dispatcher::enumerateInstanceNames(std::string_view nameSpace, std::string_view className, const PathSink& sink)
{
    return enumerate(
        "enumerateInstanceNames", nameSpace, className, resultFor(sink),
        [&](CMPIInstanceMI* mi, ContextHandle* context, ResultHandle* result, PathHandle* path)
        { return mi->ft->enumerateInstanceNames(mi, context, result, path); },
        [&](Object&& object) { return sink.take(std::move(object.path)); });
}

Reply Dispatcher::getInstance(const Path& path, const PropertyList& properties)
{
    Reply answer;
    const ClassInfo* info = findClassOf(path, answer);
    if (!info)
        return answer;
    Provider* provider = providerOf(*info, path.nameSpace);
    if (!provider)
    {
        answer = _core.store.get(path);
        for (Object& object : answer.objects)
            object = filtered(std::move(object), properties);
        return answer;
    }
    NameList names(listOf(properties));
    const auto ask = [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
    { return mi->ft->getInstance(mi, frame.context, result, passed(frame, path), names.get()); };
    answer = collectObjects(
        [&](const ObjectSink& sink)
        {
            ResultContent expected = resultFor(sink, properties);
            expected.expectedClass = info;
            expected.limit = 1;
            Outcome outcome;
            run<Kind::instance>(*provider, "getInstance " + info->name, path.nameSpace, std::move(expected), true,
                                outcome, ask);
            return outcome;
        });
    if (answer.ok() && answer.objects.empty())
    {
        _core.violation("getInstance " + info->name + " answered OK without an instance");
        return failed<Reply>(failure(CMPI_RC_ERR_FAILED, info->name + " gave no instance"));
    }
    return answer;
}

NamesReply Dispatcher::createInstance(const Object& object)
{
    NamesReply answer;
    const ClassInfo* info = findClassOf(object.path, answer);
    if (!info)
        return answer;
    Provider* provider = providerOf(*info, object.path.nameSpace);
    if (!provider)
        return _core.store.create(object);
    const auto ask = [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
    { return mi->ft->createInstance(mi, frame.context, result, passed(frame, object.path), passed(frame, object)); };
    return collectPaths(
        [&](const PathSink& sink)
        {
            ResultContent expected = resultFor(sink);
            expected.expectedClass = info;
            expected.limit = 1;
            Outcome outcome;
            run<Kind::instance>(*provider, "createInstance " + info->name, object.path.nameSpace, std::move(expected),
                                true, outcome, ask);
            return outcome;
        });
}

Outcome Dispatcher::modifyInstance(const Object& object, const PropertyList& properties)
{
    Outcome outcome;
    const ClassInfo* info = findClassOf(object.path, outcome);
    if (!info)
        return outcome;
    Provider* provider = providerOf(*info, object.path.nameSpace);
    if (!provider)
        return _core.store.modify(object, properties);
    NameList names(listOf(properties));
    run<Kind::instance>(*provider, "modifyInstance " + info->name, object.path.nameSpace, {}, false, outcome,
                        [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                        {
                            return mi->ft->modifyInstance(mi, frame.context, result, passed(frame, object.path),
                                                          passed(frame, object), names.get());
                        });
    return outcome;
}

Outcome Dispatcher::deleteInstance(const Path& path)
{
    Outcome outcome;
    const ClassInfo* info = findClassOf(path, outcome);
    if (!info)
        return outcome;
    Provider* provider = providerOf(*info, path.nameSpace);
    if (!provider)
        return _core.store.remove(path);
    run<Kind::instance>(*provider, "deleteInstance " + info->name, path.nameSpace, {}, true, outcome,
                        [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                        { return mi->ft->deleteInstance(mi, frame.context, result, passed(frame, path)); });
    return outcome;
}

// --- associations --------------------------------------------------------------------------------------

/// The class that a request starts from; null with the reason where no provider is asked.
const ClassInfo* Dispatcher::associationSource(const Path& path, const AssociationFilter& filter, Outcome& outcome)
{
    const ClassInfo* source = findClassOf(path, outcome);
    if (!source)
        return nullptr;
    for (const std::string& name : {filter.assocClass, filter.resultClass})
        if (!name.empty() && !_core.classes.find(name))
        {
            outcome = failure(CMPI_RC_ERR_INVALID_PARAMETER, "there is no class '" + name + "'");
            return nullptr;
        }
    const ClassInfo* named = _core.classes.find(filter.assocClass);
    if (_core.options.personality.ownInterop &&
        canonicalNameSpace(path.nameSpace) == canonicalNameSpace("root/interop") &&
        !(named && _core.providers.find(named->name)))
    {
        outcome = failure(CMPI_RC_ERR_FAILED, "the server's own interop provider does not know " + source->name);
        return nullptr;
    }
    return source;
}

std::vector<Provider*> Dispatcher::associationProviders(const Path& path, const AssociationFilter& filter,
                                                        Outcome& outcome)
{
    std::vector<Provider*> providers;
    const ClassInfo* source = associationSource(path, filter, outcome);
    if (!source)
        return providers;
    for (const std::string& name : _core.providers.classNames())
    {
        const ClassInfo* association = _core.classes.find(name);
        const bool wanted = filter.assocClass.empty() || association->isA(filter.assocClass);
        Provider* provider = providerOf(*association, path.nameSpace);
        if (wanted && provider && _core.providers.serves(name, Kind::association) &&
            canReference(*association, *source))
            providers.push_back(provider);
    }
    return providers;
}

/// Calls all association providers in question. `call` gets the MI, the frame, the result, the path and the association
/// class to name (null for none).
template <class Call>
Outcome Dispatcher::fanOutAssociations(const char* operation, const Path& path, const AssociationFilter& filter,
                                       const ResultContent& result, Call call)
{
    Outcome outcome;
    const std::vector<Provider*> providers = associationProviders(path, filter, outcome);
    for (Provider* provider : providers)
    {
        const bool own = filter.assocClass.empty() && _core.options.personality.fanout == Fanout::own_class;
        const std::string& assocClass = own ? provider->info->name : filter.assocClass;
        const auto ask = [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* results)
        { return call(mi, frame, results, passed(frame, path, true), filterText(assocClass)); };
        run<Kind::association>(*provider, operation + (" " + provider->info->name), path.nameSpace, result, true,
                               outcome, ask);
        if (!outcome.ok() && !skips(outcome, providers.size()))
            return outcome;
        outcome = {};
    }
    return outcome;
}

Outcome Dispatcher::associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                                const ObjectSink& sink)
{
    NameList names(listOf(properties));
    return fanOutAssociations(
        "associators", path, filter, resultFor(sink, properties),
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        {
            return mi->ft->associators(mi, frame.context, result, source, assocClass, filterText(filter.resultClass),
                                       filterText(filter.role), filterText(filter.resultRole), names.get());
        });
}

Outcome Dispatcher::associatorNames(const Path& path, const AssociationFilter& filter, const PathSink& sink)
{
    return fanOutAssociations(
        "associatorNames", path, filter, resultFor(sink),
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        {
            return mi->ft->associatorNames(mi, frame.context, result, source, assocClass,
                                           filterText(filter.resultClass), filterText(filter.role),
                                           filterText(filter.resultRole));
        });
}

Outcome Dispatcher::references(const Path& path, const AssociationFilter& filter, const PropertyList& properties,
                               const ObjectSink& sink)
{
    NameList names(listOf(properties));
    return fanOutAssociations(
        "references", path, filter, resultFor(sink, properties),
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass) {
            return mi->ft->references(mi, frame.context, result, source, assocClass, filterText(filter.role),
                                      names.get());
        });
}

Outcome Dispatcher::referenceNames(const Path& path, const AssociationFilter& filter, const PathSink& sink)
{
    return fanOutAssociations(
        "referenceNames", path, filter, resultFor(sink),
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        { return mi->ft->referenceNames(mi, frame.context, result, source, assocClass, filterText(filter.role)); });
}

// --- methods -------------------------------------------------------------------------------------------

MethodReply Dispatcher::invokeMethod(const Path& path, const std::string& method, const std::vector<Property>& in)
{
    MethodReply answer;
    const ClassInfo* info = findClassOf(path, answer);
    if (!info)
        return answer;
    Provider* provider = providerOf(*info, path.nameSpace);
    if (!provider)
    {
        return failed<MethodReply>(
            failure(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "no provider serves the methods of " + info->name));
    }
    const MethodInfo* definition = info->method(method);
    const auto ask = [&](CMPIMethodMI* mi, Frame& frame, ResultHandle* result)
    {
        const ArgsHandle* inArgs = frame.make<ArgsHandle>({passed(in), nullptr});
        ArgsHandle* outArgs = frame.make<ArgsHandle>({{}, definition});
        const CMPIStatus status =
            mi->ft->invokeMethod(mi, frame.context, result, passed(frame, path), method.c_str(), inArgs, outArgs);
        answer.out = delivered(std::move(outArgs->content.args), _core.options.personality.nullElements);
        return status;
    };
    ResultContent result =
        run<Kind::method>(*provider, "invokeMethod " + info->name + "." + method, path.nameSpace,
                          {.kind = ResultKind::data, .limit = 1, .method = definition}, true, answer, ask);
    if (!answer.ok())
        return failed<MethodReply>(answer);
    answer.returnValue = result.data.value_or(Value());
    return answer;
}

} // namespace broker
