// The table by which a provider calls back into the broker, and the attachment of its own threads.
#include "broker/core/Core.h"
#include "broker/core/Dispatch.h"
#include "broker/tables/BrokerTables.h"
#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"

#include <type_traits>

namespace broker
{

namespace
{

/// What an up-call needs; `frame` is null when the call must fail.
struct Upcall
{
    Core* core = nullptr;
    Frame* frame = nullptr;
};

/// Checks broker, thread and context. An up-call with a context that is not the thread's current one is reported and
/// goes on.
Upcall enter(const CMPIBroker* mb, const CMPIContext* ctx, const char* function, CMPIStatus* rc)
{
    Upcall upcall;
    upcall.core = openBroker(mb, function);
    if (!upcall.core)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return upcall;
    }
    upcall.frame = openFrame(*upcall.core, function, rc);
    if (upcall.frame && ctx != upcall.frame->context)
        upcall.core->violation(std::string(function) + " with a context that is not the thread's current one");
    return upcall;
}

/// The same with the path of an operation, on its way into the server.
struct PathUpcall : Upcall
{
    const PathHandle* path = nullptr;

    PathUpcall(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* object, const char* function,
               CMPIStatus* rc)
        : Upcall(enter(mb, ctx, function, rc))
    {
        path = frame ? open<PathHandle>(object, function, rc) : nullptr;
        if (path)
        {
            frame->unmarkedWork |= !frame->marked();
            takeChannel(rc);
        }
    }
    PathUpcall(const PathUpcall&) = delete;
    PathUpcall& operator=(const PathUpcall&) = delete;
    ~PathUpcall()
    {
        if (_inChannel)
            core->channel.leave();
    }
    explicit operator bool() const { return path != nullptr; }
    const Path& object() const { return path->content.path; }
    Dispatcher dispatcher() const { return Dispatcher(*core); }

private:
    void takeChannel(CMPIStatus* rc)
    {
        if (!core->options.personality.oneUpcall)
            return;
        _inChannel = core->channel.enter(core->options.upcallWait);
        if (!_inChannel)
        {
            path = nullptr;
            setStatus(rc, CMPI_RC_ERROR_SYSTEM);
        }
    }

    bool _inChannel = false;
};

PropertyList propertyList(const char** properties)
{
    return properties ? PropertyList(readNames(properties)) : std::nullopt;
}

std::string text(const char* characters)
{
    return characters ? characters : "";
}

std::vector<Object>& resultsOf(Reply& reply)
{
    return reply.objects;
}

std::vector<Path>& resultsOf(NamesReply& reply)
{
    return reply.paths;
}

Value elementOf(Object&& object)
{
    return Value::instance(std::move(object));
}

Value elementOf(Path&& path)
{
    return Value::reference(std::move(path));
}

/// The results as an enumeration of the frame; null when the operation failed.
template <class Answer> CMPIEnumeration* enumeration(Frame& frame, Answer&& reply, CMPIStatus* rc)
{
    setStatus(rc, reply.status);
    if (!reply.ok())
        return nullptr;
    EnumerationContent content{std::is_same_v<Answer, Reply> ? CMPI_instance : CMPI_ref, {}, 0};
    for (auto& result : resultsOf(reply))
        content.elements.push_back(elementOf(std::move(result)));
    return frame.make<EnumerationHandle>(std::move(content));
}

/// The up-calls that enumerate. `ask` gets a dispatcher and the path, and returns the reply.
template <class Ask>
CMPIEnumeration* enumerated(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                            const char* function, CMPIStatus* rc, Ask ask)
{
    const PathUpcall call(mb, ctx, path, function, rc);
    return call ? enumeration(*call.frame, ask(call.dispatcher(), call.object()), rc) : nullptr;
}

// --- threads -------------------------------------------------------------------------------------------

CMPIContext* prepareAttachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    const Upcall upcall = enter(mb, ctx, "prepareAttachThread", nullptr);
    if (!upcall.frame)
        return nullptr;
    auto frame = std::make_unique<Frame>(*upcall.core, mb, "attached thread of " + upcall.frame->what,
                                         upcall.frame->context->content);
    CMPIContext* context = frame->context;
    upcall.core->attachments.add(context, std::move(frame));
    return context;
}

CMPIStatus attachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    Core* core = openBroker(mb, "attachThread");
    Frame* frame = core ? core->attachments.find(ctx) : nullptr;
    if (!frame || frame->attached)
    {
        reportViolation(core, frame ? "attachThread with a context that is attached"
                                    : "attachThread with a context that was not prepared for it");
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    frame->attached = true;
    frame->push();
    return makeStatus(CMPI_RC_OK);
}

CMPIStatus detachThread(const CMPIBroker* mb, const CMPIContext* ctx)
{
    Core* core = openBroker(mb, "detachThread");
    std::unique_ptr<Frame> frame = core ? core->attachments.take(ctx) : nullptr;
    if (!frame || (frame->attached && !frame->pop()))
    {
        reportViolation(core, "detachThread with a context that is not attached to this thread");
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    if (core->options.personality.marks && frame->attached && (frame->unmarkedWork || frame->marked()))
    {
        core->violation("up-calls of " + frame->what +
                        " outside of mark and release: the server crashes when the thread ends");
        return makeStatus(CMPI_RC_ERR_FAILED);
    }
    return makeStatus(CMPI_RC_OK); // the frame's end frees the context and what was made on the thread
}

// --- instances -----------------------------------------------------------------------------------------

CMPIStatus deliverIndication(const CMPIBroker* mb, const CMPIContext* ctx, const char* ns,
                             const CMPIInstance* indication)
{
    CMPIStatus status{};
    const Upcall upcall = enter(mb, ctx, "deliverIndication", &status);
    const auto* handle = upcall.frame ? open<InstanceHandle>(indication, "deliverIndication", &status) : nullptr;
    if (handle)
    {
        Object object = handle->content.object;
        object.path.nameSpace = text(ns);
        const std::lock_guard lock(upcall.core->indicationMutex);
        upcall.core->indications.push_back(std::move(object));
    }
    return status;
}

CMPIEnumeration* enumerateInstanceNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                        CMPIStatus* rc)
{
    return enumerated(mb, ctx, path, "enumerateInstanceNames", rc,
                      [&](Dispatcher dispatcher, const Path& of)
                      {
                          return collectPaths(
                              [&](const PathSink& sink)
                              { return dispatcher.enumerateInstanceNames(of.nameSpace, of.className, sink); });
                      });
}

CMPIEnumeration* enumerateInstances(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                    const char** properties, CMPIStatus* rc)
{
    return enumerated(
        mb, ctx, path, "enumerateInstances", rc,
        [&](Dispatcher dispatcher, const Path& of)
        {
            return collectObjects(
                [&](const ObjectSink& sink)
                { return dispatcher.enumerateInstances(of.nameSpace, of.className, propertyList(properties), sink); });
        });
}

CMPIInstance* getInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                          const char** properties, CMPIStatus* rc)
{
    const PathUpcall call(mb, ctx, path, "getInstance", rc);
    if (!call)
        return nullptr;
    Reply reply = call.dispatcher().getInstance(call.object(), propertyList(properties));
    setStatus(rc, reply.status);
    if (!reply.ok())
        return nullptr;
    InstanceHandle* instance = makeInstance(*call.frame, std::move(reply.objects.front()));
    if (properties) // keys that the list leaves out are in the path alone
        instance->ft->setPropertyFilter(instance, properties, NameList(&instance->content.info->keys).get());
    return instance;
}

/// An instance that a provider hands in, under the path that it gives with it.
Object instanceAt(const InstanceHandle& instance, const Path& path)
{
    Object object = instance.content.object;
    const Path own = instance.content.pathFromKeys();
    object.path = path;
    if (path.keys.empty())
        object.path.keys = own.keys;
    return object;
}

CMPIObjectPath* createInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                               const CMPIInstance* inst, CMPIStatus* rc)
{
    const PathUpcall call(mb, ctx, path, "createInstance", rc);
    const auto* instance = call ? open<InstanceHandle>(inst, "createInstance", rc) : nullptr;
    if (!instance)
        return nullptr;
    NamesReply reply = call.dispatcher().createInstance(instanceAt(*instance, call.object()));
    setStatus(rc, reply.status);
    return reply.ok() && !reply.paths.empty() ? makePath(*call.frame, std::move(reply.paths.front())) : nullptr;
}

CMPIStatus modifyInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                          const CMPIInstance* inst, const char** properties)
{
    CMPIStatus status{};
    const PathUpcall call(mb, ctx, path, "modifyInstance", &status);
    const auto* instance = call ? open<InstanceHandle>(inst, "modifyInstance", &status) : nullptr;
    return instance ? makeStatus(call.dispatcher()
                                     .modifyInstance(instanceAt(*instance, call.object()), propertyList(properties))
                                     .status)
                    : status;
}

CMPIStatus deleteInstance(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path)
{
    CMPIStatus status{};
    const PathUpcall call(mb, ctx, path, "deleteInstance", &status);
    return call ? makeStatus(call.dispatcher().deleteInstance(call.object()).status) : status;
}

CMPIEnumeration* execQuery(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath*, const char*,
                           const char*, CMPIStatus* rc)
{
    if (enter(mb, ctx, "execQuery", rc).frame)
        setStatus(rc, CMPI_RC_ERR_QUERY_LANGUAGE_NOT_SUPPORTED);
    return nullptr;
}

// --- associations --------------------------------------------------------------------------------------

CMPIEnumeration* associators(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                             const char* assocClass, const char* resultClass, const char* role, const char* resultRole,
                             const char** properties, CMPIStatus* rc)
{
    const AssociationFilter filter{text(assocClass), text(resultClass), text(role), text(resultRole)};
    return enumerated(mb, ctx, path, "associators", rc,
                      [&](Dispatcher dispatcher, const Path& source)
                      {
                          return collectObjects(
                              [&](const ObjectSink& sink)
                              { return dispatcher.associators(source, filter, propertyList(properties), sink); });
                      });
}

CMPIEnumeration* associatorNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                 const char* assocClass, const char* resultClass, const char* role,
                                 const char* resultRole, CMPIStatus* rc)
{
    const AssociationFilter filter{text(assocClass), text(resultClass), text(role), text(resultRole)};
    return enumerated(mb, ctx, path, "associatorNames", rc,
                      [&](Dispatcher dispatcher, const Path& source) {
                          return collectPaths([&](const PathSink& sink)
                                              { return dispatcher.associatorNames(source, filter, sink); });
                      });
}

CMPIEnumeration* references(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                            const char* resultClass, const char* role, const char** properties, CMPIStatus* rc)
{
    const AssociationFilter filter{text(resultClass), "", text(role), ""};
    return enumerated(mb, ctx, path, "references", rc,
                      [&](Dispatcher dispatcher, const Path& source)
                      {
                          return collectObjects(
                              [&](const ObjectSink& sink)
                              { return dispatcher.references(source, filter, propertyList(properties), sink); });
                      });
}

CMPIEnumeration* referenceNames(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path,
                                const char* resultClass, const char* role, CMPIStatus* rc)
{
    const AssociationFilter filter{text(resultClass), "", text(role), ""};
    return enumerated(mb, ctx, path, "referenceNames", rc,
                      [&](Dispatcher dispatcher, const Path& source) {
                          return collectPaths([&](const PathSink& sink)
                                              { return dispatcher.referenceNames(source, filter, sink); });
                      });
}

// --- methods and properties ----------------------------------------------------------------------------

CMPIData invokeMethod(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path, const char* method,
                      const CMPIArgs* in, CMPIArgs* out, CMPIStatus* rc)
{
    const PathUpcall call(mb, ctx, path, "invokeMethod", rc);
    const ArgsHandle* inArgs = call && in ? open<ArgsHandle>(in, "invokeMethod", rc) : nullptr;
    ArgsHandle* outArgs = call && out ? open<ArgsHandle>(out, "invokeMethod", rc) : nullptr;
    if (!call || (in && !inArgs) || (out && !outArgs))
        return nullData(CMPI_null, CMPI_badValue);
    MethodReply reply = call.dispatcher().invokeMethod(call.object(), text(method),
                                                       inArgs ? inArgs->content.args : std::vector<Property>());
    setStatus(rc, reply.status);
    if (!reply.ok())
        return nullData(CMPI_null, CMPI_badValue);
    if (outArgs)
        outArgs->content.args = std::move(reply.out);
    return toCmpi(*call.frame, reply.returnValue);
}

CMPIStatus setProperty(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path, const char* name,
                       const CMPIValue* value, CMPIType type)
{
    CMPIStatus status{};
    const PathUpcall call(mb, ctx, path, "setProperty", &status);
    if (!call || !name)
        return call ? makeStatus(CMPI_RC_ERR_INVALID_PARAMETER) : status;
    Value read = fromCmpi(*call.core, value, type, "setProperty", status);
    if (status.rc != CMPI_RC_OK)
        return status;
    const Object object{call.object(), {{name, std::move(read)}}};
    return makeStatus(call.dispatcher().modifyInstance(object, std::vector<std::string>{name}).status);
}

CMPIData getProperty(const CMPIBroker* mb, const CMPIContext* ctx, const CMPIObjectPath* path, const char* name,
                     CMPIStatus* rc)
{
    const PathUpcall call(mb, ctx, path, "getProperty", rc);
    if (!call)
        return nullData(CMPI_null, CMPI_badValue);
    if (!name || !call.path->content.info || !call.path->content.info->property(name))
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullData(CMPI_null, CMPI_notFound);
    }
    const Reply reply = call.dispatcher().getInstance(call.object(), std::vector<std::string>{name});
    setStatus(rc, reply.status);
    const Value null = Value::null(call.path->content.info->property(name)->type);
    const bool set = reply.ok() && reply.objects.front().has(name);
    return toCmpi(*call.frame, set ? reply.objects.front().get(name) : null);
}

// --- marks ---------------------------------------------------------------------------------------------

/// The table that a broker of CMPI 2.0 has behind the four of 1.0. Of its functions no server has more than two.
struct MarkTable
{
    int ftVersion;
    const void* (*mark)(const CMPIBroker* mb, CMPIStatus* rc);
    CMPIStatus (*release)(const CMPIBroker* mb, const void* mark);
    void* others[12];
};

const void* takeMark(const CMPIBroker* mb, CMPIStatus* rc)
{
    Core* core = openBroker(mb, "mark");
    Frame* frame = core ? openFrame(*core, "mark", rc) : nullptr;
    if (!frame)
    {
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
        return nullptr;
    }
    ++core->openMarks;
    return frame->mark();
}

CMPIStatus releaseMark(const CMPIBroker* mb, const void* mark)
{
    Core* core = openBroker(mb, "release");
    Frame* frame = core ? Frame::current(*core) : nullptr;
    const std::size_t ended = frame ? frame->release(mark) : 0;
    if (ended == 0)
    {
        reportViolation(core, "release of a mark that this thread did not take");
        return makeStatus(CMPI_RC_ERR_INVALID_HANDLE);
    }
    core->openMarks -= ended;
    return makeStatus(CMPI_RC_OK);
}

const MarkTable markTable{.ftVersion = 200, .mark = takeMark, .release = releaseMark, .others = {}};

} // namespace

const CMPIBrokerFT upcallTable{
    .brokerCapabilities = CMPI_MB_InstanceManipulation | CMPI_MB_AssociationTraversal | CMPI_MB_OSEncapsulationSupport,
    .brokerVersion = 100,
    .brokerName = "tvrcim",
    .prepareAttachThread = prepareAttachThread,
    .attachThread = attachThread,
    .detachThread = detachThread,
    .deliverIndication = deliverIndication,
    .enumerateInstanceNames = enumerateInstanceNames,
    .getInstance = getInstance,
    .createInstance = createInstance,
    .modifyInstance = modifyInstance,
    .deleteInstance = deleteInstance,
    .execQuery = execQuery,
    .enumerateInstances = enumerateInstances,
    .associators = associators,
    .associatorNames = associatorNames,
    .references = references,
    .referenceNames = referenceNames,
    .invokeMethod = invokeMethod,
    .setProperty = setProperty,
    .getProperty = getProperty,
};

BrokerTables::BrokerTables(const Personality& personality)
    : upcalls(upcallTable), factories(factoryTable), services(servicesTable)
{
    upcalls.brokerCapabilities = personality.capabilities;
    upcalls.brokerVersion = personality.brokerVersion;
    upcalls.brokerName = personality.brokerName;
    factories.ftVersion = personality.objectVersion;
    services.ftVersion = personality.servicesVersion;
    if (!personality.allServices)
    {
        services.joinThread = nullptr;
        services.exitThread = nullptr;
        services.cancelThread = nullptr;
        services.threadSleep = nullptr;
        services.signalCondition = nullptr;
    }
}

void fillProviderBroker(ProviderBroker& broker, Core& core)
{
    broker.cmpi.hdl = &core;
    broker.cmpi.bft = &core.tables.upcalls;
    broker.cmpi.eft = &core.tables.factories;
    broker.cmpi.xft = &core.tables.services;
    broker.marks = core.options.personality.marks ? &markTable : nullptr;
}

Core* openBroker(const CMPIBroker* broker, const char* function)
{
    if (!broker || !broker->eft || broker->eft->newInstance != factoryTable.newInstance)
    {
        reportViolation(nullptr, std::string(function) + " of a broker that is not this one");
        return nullptr;
    }
    auto* core = static_cast<Core*>(broker->hdl);
    const Frame* frame = Frame::current(*core);
    if (frame && frame->broker != broker)
        core->violation(std::string(function) + " through a broker pointer that this provider was not given");
    return core;
}

} // namespace broker
