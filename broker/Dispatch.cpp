#include "broker/Dispatch.h"

#include "broker/Handles.h"
#include "broker/Marshal.h"

#include <algorithm>
#include <iterator>
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
    {
        return {};
    }
    const StringHandle* text = status.msg ? open<StringHandle>(status.msg, "getCharPtr") : nullptr;
    return failure(status.rc, info.name + (text ? ": " + text->content.text : " answered so"));
}

const char* filterText(const std::string& text)
{
    return text.empty() ? nullptr : text.c_str();
}

/// The instance with the listed properties only.
Object filtered(Object object, const PropertyList& list)
{
    if (list)
    {
        std::erase_if(object.properties,
                      [&](const Property& property)
                      {
                          return std::none_of(list->begin(), list->end(),
                                              [&](const std::string& name) { return sameName(name, property.name); });
                      });
    }
    return object;
}

void append(Reply& answer, ResultContent&& result)
{
    std::move(result.objects.begin(), result.objects.end(), std::back_inserter(answer.objects));
}

void append(NamesReply& answer, ResultContent&& result)
{
    std::move(result.paths.begin(), result.paths.end(), std::back_inserter(answer.paths));
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

bool Dispatcher::servedByModule(std::string_view nameSpace) const
{
    const std::vector<std::string>& spaces = _core.options.moduleNamespaces;
    return std::any_of(spaces.begin(), spaces.end(),
                       [&](const std::string& space)
                       { return canonicalNameSpace(space) == canonicalNameSpace(nameSpace); });
}

const ClassInfo* Dispatcher::findClass(std::string_view nameSpace, std::string_view className, Outcome& outcome)
{
    const std::vector<std::string>& platform = _core.options.platformNamespaces;
    const bool served = servedByModule(nameSpace);
    if (!served && std::none_of(platform.begin(), platform.end(),
                                [&](const std::string& space)
                                { return canonicalNameSpace(space) == canonicalNameSpace(nameSpace); }))
    {
        outcome = failure(CMPI_RC_ERR_INVALID_NAMESPACE, "there is no namespace '" + std::string(nameSpace) + "'");
        return nullptr;
    }
    const ClassInfo* info = _core.classes.find(className);
    if (!info || (!served && _core.providers.find(className)))
    {
        outcome = failure(CMPI_RC_ERR_INVALID_CLASS,
                          "there is no class '" + std::string(className) + "' in " + std::string(nameSpace));
        return nullptr;
    }
    return info;
}

std::vector<Property> Dispatcher::contextEntries(std::string_view nameSpace) const
{
    const auto& principal = _core.options.principal;
    return {{CMPIInvocationFlags, Value::uint32(0)},
            {CMPIPrincipal, principal ? Value::string(*principal) : Value::null(CMPI_string)},
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
    {
        return {};
    }
    CallFrame frame(_core, &provider.broker.cmpi, what, contextEntries(nameSpace));
    ResultHandle* result = frame.make<ResultHandle>(std::move(expected));
    const CMPIStatus status = call(mi, frame, result);
    outcome = outcomeOf(status, *provider.info);
    if (Frame::current() != &frame)
    {
        _core.violation("the provider left an attachment on the broker's thread");
    }
    if (outcome.ok() && mustBeDone && !result->content.done)
    {
        _core.violation("success without returnDone");
    }
    if (outcome.ok() && result->content.kind == ResultKind::data && !result->content.data)
    {
        _core.violation("success of a method without returnData");
    }
    return std::move(result->content);
}

// --- instances -----------------------------------------------------------------------------------------

/// Enumerates through the providers and the store. `call` gets the MI, the context, the result and the class path;
/// `stored` adds one of the store's instances to the answer.
template <class Answer, class Call, class Stored>
Answer Dispatcher::enumerate(const char* operation, std::string_view nameSpace, std::string_view className, Call call,
                             Stored stored)
{
    Answer answer;
    const ClassInfo* root = findClass(nameSpace, className, answer);
    if (!root)
    {
        return answer;
    }
    const ResultKind kind = std::is_same_v<Answer, Reply> ? ResultKind::instances : ResultKind::paths;
    for (const ClassInfo* info : _core.classes.withSubclasses(*root))
    {
        Provider* provider = servedByModule(nameSpace) ? _core.providers.find(info->name) : nullptr;
        if (!provider)
        {
            for (Object& object : _core.store.enumerate(nameSpace, info->name))
            {
                stored(answer, std::move(object));
            }
            continue;
        }
        Outcome outcome;
        append(answer, run<Kind::instance>(*provider, operation + (" " + info->name), nameSpace,
                                           {.kind = kind, .expectedClass = info}, true, outcome,
                                           [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                                           {
                                               Path path{std::string(nameSpace), info->name, {}};
                                               return call(mi, frame.context, result, makePath(frame, std::move(path)));
                                           }));
        if (!outcome.ok())
        {
            return failed<Answer>(outcome);
        }
    }
    return answer;
}

Reply Dispatcher::enumerateInstances(std::string_view nameSpace, std::string_view className,
                                     const PropertyList& properties)
{
    NameList names(listOf(properties));
    return enumerate<Reply>(
        "enumerateInstances", nameSpace, className,
        [&](CMPIInstanceMI* mi, ContextHandle* context, ResultHandle* result, PathHandle* path)
        { return mi->ft->enumerateInstances(mi, context, result, path, names.get()); },
        [&](Reply& answer, Object&& object) { answer.objects.push_back(filtered(std::move(object), properties)); });
}

NamesReply Dispatcher::enumerateInstanceNames(std::string_view nameSpace, std::string_view className)
{
    return enumerate<NamesReply>(
        "enumerateInstanceNames", nameSpace, className,
        [&](CMPIInstanceMI* mi, ContextHandle* context, ResultHandle* result, PathHandle* path)
        { return mi->ft->enumerateInstanceNames(mi, context, result, path); },
        [](NamesReply& answer, Object&& object) { answer.paths.push_back(std::move(object.path)); });
}

Reply Dispatcher::getInstance(const Path& path, const PropertyList& properties)
{
    Reply answer;
    const ClassInfo* info = findClass(path.nameSpace, path.className, answer);
    if (!info)
    {
        return answer;
    }
    Provider* provider = _core.providers.find(info->name);
    if (!provider)
    {
        answer = _core.store.get(path);
        for (Object& object : answer.objects)
        {
            object = filtered(std::move(object), properties);
        }
        return answer;
    }
    NameList names(listOf(properties));
    append(answer, run<Kind::instance>(*provider, "getInstance " + info->name, path.nameSpace,
                                       {.kind = ResultKind::instances, .expectedClass = info, .limit = 1}, true, answer,
                                       [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result) {
                                           return mi->ft->getInstance(mi, frame.context, result, makePath(frame, path),
                                                                      names.get());
                                       }));
    if (answer.ok() && answer.objects.empty())
    {
        _core.violation("getInstance " + info->name + " answered OK without an instance");
        return failed<Reply>(failure(CMPI_RC_ERR_FAILED, info->name + " gave no instance"));
    }
    return answer.ok() ? answer : failed<Reply>(answer);
}

NamesReply Dispatcher::createInstance(const Object& object)
{
    NamesReply answer;
    const ClassInfo* info = findClass(object.path.nameSpace, object.path.className, answer);
    if (!info)
    {
        return answer;
    }
    Provider* provider = _core.providers.find(info->name);
    if (!provider)
    {
        return _core.store.create(object);
    }
    append(answer, run<Kind::instance>(*provider, "createInstance " + info->name, object.path.nameSpace,
                                       {.kind = ResultKind::paths, .expectedClass = info, .limit = 1}, true, answer,
                                       [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                                       {
                                           return mi->ft->createInstance(mi, frame.context, result,
                                                                         makePath(frame, object.path),
                                                                         makeInstance(frame, object));
                                       }));
    return answer.ok() ? answer : failed<NamesReply>(answer);
}

Outcome Dispatcher::modifyInstance(const Object& object, const PropertyList& properties)
{
    Outcome outcome;
    const ClassInfo* info = findClass(object.path.nameSpace, object.path.className, outcome);
    if (!info)
    {
        return outcome;
    }
    Provider* provider = _core.providers.find(info->name);
    if (!provider)
    {
        return _core.store.modify(object, properties);
    }
    NameList names(listOf(properties));
    run<Kind::instance>(*provider, "modifyInstance " + info->name, object.path.nameSpace, {}, false, outcome,
                        [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                        {
                            return mi->ft->modifyInstance(mi, frame.context, result, makePath(frame, object.path),
                                                          makeInstance(frame, object), names.get());
                        });
    return outcome;
}

Outcome Dispatcher::deleteInstance(const Path& path)
{
    Outcome outcome;
    const ClassInfo* info = findClass(path.nameSpace, path.className, outcome);
    if (!info)
    {
        return outcome;
    }
    Provider* provider = _core.providers.find(info->name);
    if (!provider)
    {
        return _core.store.remove(path);
    }
    run<Kind::instance>(*provider, "deleteInstance " + info->name, path.nameSpace, {}, true, outcome,
                        [&](CMPIInstanceMI* mi, Frame& frame, ResultHandle* result)
                        { return mi->ft->deleteInstance(mi, frame.context, result, makePath(frame, path)); });
    return outcome;
}

// --- associations --------------------------------------------------------------------------------------

std::vector<Provider*> Dispatcher::associationProviders(const Path& path, const AssociationFilter& filter,
                                                        Outcome& outcome)
{
    std::vector<Provider*> providers;
    const ClassInfo* source = findClass(path.nameSpace, path.className, outcome);
    for (const std::string& name : {filter.assocClass, filter.resultClass})
    {
        if (source && !name.empty() && !_core.classes.find(name))
        {
            outcome = failure(CMPI_RC_ERR_INVALID_PARAMETER, "there is no class '" + name + "'");
            return providers;
        }
    }
    if (!source || !servedByModule(path.nameSpace))
    {
        return providers;
    }
    for (const std::string& name : _core.providers.classNames())
    {
        const ClassInfo* association = _core.classes.find(name);
        const bool wanted = filter.assocClass.empty() || association->isA(filter.assocClass);
        if (wanted && _core.providers.serves(name, Kind::association) && canReference(*association, *source))
        {
            providers.push_back(_core.providers.find(name));
        }
    }
    return providers;
}

/// Calls all association providers in question. `call` gets the MI, the frame, the result, the path and the association
/// class to name (null for none).
template <class Answer, class Call>
Answer Dispatcher::fanOutAssociations(const char* operation, const Path& path, const AssociationFilter& filter,
                                      Call call)
{
    Answer answer;
    const ResultKind kind = std::is_same_v<Answer, Reply> ? ResultKind::instances : ResultKind::paths;
    for (Provider* provider : associationProviders(path, filter, answer))
    {
        const bool own = filter.assocClass.empty() && _core.options.fanout == Fanout::own_class;
        const std::string& assocClass = own ? provider->info->name : filter.assocClass;
        Outcome outcome;
        append(answer, run<Kind::association>(*provider, operation + (" " + provider->info->name), path.nameSpace,
                                              {.kind = kind}, true, outcome,
                                              [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result) {
                                                  return call(mi, frame, result, makePath(frame, path),
                                                              filterText(assocClass));
                                              }));
        if (!outcome.ok())
        {
            return failed<Answer>(outcome);
        }
    }
    return answer;
}

Reply Dispatcher::associators(const Path& path, const AssociationFilter& filter, const PropertyList& properties)
{
    NameList names(listOf(properties));
    return fanOutAssociations<Reply>(
        "associators", path, filter,
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        {
            return mi->ft->associators(mi, frame.context, result, source, assocClass, filterText(filter.resultClass),
                                       filterText(filter.role), filterText(filter.resultRole), names.get());
        });
}

NamesReply Dispatcher::associatorNames(const Path& path, const AssociationFilter& filter)
{
    return fanOutAssociations<NamesReply>(
        "associatorNames", path, filter,
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        {
            return mi->ft->associatorNames(mi, frame.context, result, source, assocClass,
                                           filterText(filter.resultClass), filterText(filter.role),
                                           filterText(filter.resultRole));
        });
}

Reply Dispatcher::references(const Path& path, const AssociationFilter& filter, const PropertyList& properties)
{
    NameList names(listOf(properties));
    return fanOutAssociations<Reply>(
        "references", path, filter,
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass) {
            return mi->ft->references(mi, frame.context, result, source, assocClass, filterText(filter.role),
                                      names.get());
        });
}

NamesReply Dispatcher::referenceNames(const Path& path, const AssociationFilter& filter)
{
    return fanOutAssociations<NamesReply>(
        "referenceNames", path, filter,
        [&](CMPIAssociationMI* mi, Frame& frame, ResultHandle* result, PathHandle* source, const char* assocClass)
        { return mi->ft->referenceNames(mi, frame.context, result, source, assocClass, filterText(filter.role)); });
}

// --- methods -------------------------------------------------------------------------------------------

MethodReply Dispatcher::invokeMethod(const Path& path, const std::string& method, const std::vector<Property>& in)
{
    MethodReply answer;
    const ClassInfo* info = findClass(path.nameSpace, path.className, answer);
    if (!info)
    {
        return answer;
    }
    Provider* provider = _core.providers.find(info->name);
    if (!provider)
    {
        return failed<MethodReply>(
            failure(CMPI_RC_ERR_METHOD_NOT_AVAILABLE, "no provider serves the methods of " + info->name));
    }
    const MethodInfo* definition = info->method(method);
    ResultContent result =
        run<Kind::method>(*provider, "invokeMethod " + info->name + "." + method, path.nameSpace,
                          {.kind = ResultKind::data, .limit = 1, .method = definition}, true, answer,
                          [&](CMPIMethodMI* mi, Frame& frame, ResultHandle* handle)
                          {
                              const ArgsHandle* inArgs = frame.make<ArgsHandle>({in, nullptr});
                              ArgsHandle* outArgs = frame.make<ArgsHandle>({{}, definition});
                              const CMPIStatus status = mi->ft->invokeMethod(
                                  mi, frame.context, handle, makePath(frame, path), method.c_str(), inArgs, outArgs);
                              answer.out = std::move(outArgs->content.args);
                              return status;
                          });
    if (!answer.ok())
    {
        return failed<MethodReply>(answer);
    }
    answer.returnValue = result.data.value_or(Value());
    return answer;
}

} // namespace broker
