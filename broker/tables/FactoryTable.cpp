// The table by which a provider makes objects, asks about them and logs.
#include "broker/core/Core.h"
#include "broker/tables/BrokerTables.h"
#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"
#include "broker/values/PathText.h"
#include "broker/values/QualifierText.h"
#include "broker/values/ValueText.h"

namespace broker
{

namespace
{

/// The broker's own core; a pointer that is not ours answers CMPI_RC_ERR_INVALID_HANDLE.
Core* openFor(const CMPIBroker* broker, const char* function, CMPIStatus* rc)
{
    Core* core = openBroker(broker, function);
    setStatus(rc, core ? CMPI_RC_OK : CMPI_RC_ERR_INVALID_HANDLE);
    return core;
}

template <class H>
typename H::Cmpi* make(const CMPIBroker* broker, const char* function, CMPIStatus* rc, typename H::Content content)
{
    const Core* core = openFor(broker, function, rc);
    return core ? newHandle<H>(*core, function, rc, std::move(content)) : nullptr;
}

CMPIInstance* newInstance(const CMPIBroker* mb, const CMPIObjectPath* path, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "newInstance", rc);
    const auto* handle = core ? open<PathHandle>(path, "newInstance", rc) : nullptr;
    Frame* frame = handle ? openFrame(*core, "newInstance", rc) : nullptr;
    if (!frame)
        return nullptr;
    if (!handle->content.info)
    {
        core->violation("newInstance of the unknown class '" + handle->content.path.className + "'");
        setStatus(rc, CMPI_RC_ERR_INVALID_CLASS);
        return nullptr;
    }
    Object object{handle->content.path, {}};
    if (core->options.personality.schemaDefaults)
    {
        for (const FeatureInfo& feature : handle->content.info->properties)
            if (!feature.defaultValue.isNull() && !object.path.key(feature.name))
                object.set(feature.name, feature.defaultValue);
    }
    return makeInstance(*frame, std::move(object));
}

CMPIObjectPath* newObjectPath(const CMPIBroker* mb, const char* ns, const char* className, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "newObjectPath", rc);
    if (!core)
        return nullptr;
    Path path{ns ? ns : "", className ? className : "", {}};
    const ClassInfo* info = core->classes.find(path.className);
    return newHandle<PathHandle>(*core, "newObjectPath", rc, {std::move(path), info});
}

CMPIArgs* newArgs(const CMPIBroker* mb, CMPIStatus* rc)
{
    return make<ArgsHandle>(mb, "newArgs", rc, {});
}

CMPIString* newStringOf(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    return make<StringHandle>(mb, "newString", rc, {text ? text : "", false});
}

CMPIArray* newArray(const CMPIBroker* mb, CMPICount size, CMPIType elementType, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "newArray", rc);
    if (!core)
        return nullptr;
    if (elementType & CMPI_ARRAY)
    {
        core->violation("newArray with an array as the type of its elements");
        setStatus(rc, CMPI_RC_ERR_INVALID_DATA_TYPE);
        return nullptr;
    }
    const CMPIType type = elementType == CMPI_chars ? CMPI_string : elementType;
    return newHandle<ArrayHandle>(*core, "newArray", rc, {type, Value::List(size, Value::null(type))});
}

CMPIDateTime* newDateTime(const CMPIBroker* mb, CMPIStatus* rc)
{
    return make<DateTimeHandle>(mb, "newDateTime", rc, DateTime::now());
}

CMPIDateTime* newDateTimeFromBinary(const CMPIBroker* mb, CMPIUint64 microseconds, CMPIBoolean isInterval,
                                    CMPIStatus* rc)
{
    return make<DateTimeHandle>(mb, "newDateTimeFromBinary", rc,
                                DateTime::fromMicroseconds(microseconds, isInterval != 0));
}

CMPIDateTime* newDateTimeFromChars(const CMPIBroker* mb, const char* text, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "newDateTimeFromChars", rc);
    const auto parsed = DateTime::parse(text ? text : "");
    if (core && !parsed)
    {
        core->violation("newDateTimeFromChars of '" + std::string(text ? text : "") + "'");
        setStatus(rc, CMPI_RC_ERR_INVALID_PARAMETER);
    }
    return core && parsed ? newHandle<DateTimeHandle>(*core, "newDateTimeFromChars", rc, *parsed) : nullptr;
}

CMPISelectExp* newSelectExp(const CMPIBroker* mb, const char* query, const char* lang, CMPIArray** projection,
                            CMPIStatus* rc)
{
    if (projection)
        *projection = nullptr;
    return make<SelectExpHandle>(mb, "newSelectExp", rc, {query ? query : "", lang ? lang : ""});
}

CMPIBoolean classPathIsA(const CMPIBroker* mb, const CMPIObjectPath* path, const char* className, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "classPathIsA", rc);
    const auto* handle = core ? open<PathHandle>(path, "classPathIsA", rc) : nullptr;
    if (handle && !handle->content.info)
        setStatus(rc, CMPI_RC_ERR_INVALID_CLASS);
    return handle && handle->content.info && className && handle->content.info->isA(className);
}

// --- questions about any object ------------------------------------------------------------------------

/// The object if it is one of ours and alive; otherwise a violation.
Tracked* openObject(const Core& core, const void* object, const char* function, CMPIStatus* rc)
{
    Tracked* tracked = openAny(object);
    const bool usable = tracked && tracked->alive;
    if (!usable)
    {
        core.violation(std::string(function) + (tracked ? " of a dead object" : " of no object of this broker"));
        setStatus(rc, CMPI_RC_ERR_INVALID_HANDLE);
    }
    return usable ? tracked : nullptr;
}

std::string describe(const Tracked& object)
{
    if (const auto* path = dynamic_cast<const PathHandle*>(&object))
        return fullPathText(path->content.path);
    if (const auto* instance = dynamic_cast<const InstanceHandle*>(&object))
        return mofText(instance->content.object);
    if (const auto* string = dynamic_cast<const StringHandle*>(&object))
        return string->content.text;
    if (const auto* dateTime = dynamic_cast<const DateTimeHandle*>(&object))
        return dateTime->content.text();
    if (const auto* array = dynamic_cast<const ArrayHandle*>(&object))
        return valueText(Value::array(array->content.elementType, array->content.elements));
    return object.kind();
}

CMPIString* toString(const CMPIBroker* mb, const void* object, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "toString", rc);
    const Tracked* tracked = core ? openObject(*core, object, "toString", rc) : nullptr;
    return tracked ? newString(*core, "toString", rc, describe(*tracked)) : nullptr;
}

CMPIBoolean isOfType(const CMPIBroker* mb, const void* object, const char* typeName, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "isOfType", rc);
    const Tracked* tracked = core ? openObject(*core, object, "isOfType", rc) : nullptr;
    return tracked && typeName && std::string_view(tracked->kind()) == typeName;
}

CMPIString* getType(const CMPIBroker* mb, const void* object, CMPIStatus* rc)
{
    const Core* core = openFor(mb, "getType", rc);
    const Tracked* tracked = core ? openObject(*core, object, "getType", rc) : nullptr;
    return tracked ? newString(*core, "getType", rc, tracked->kind()) : nullptr;
}

// --- messages ------------------------------------------------------------------------------------------

CMPIString* getMessage(const CMPIBroker* mb, const char*, const char* defaultText, CMPIStatus* rc, CMPICount, ...)
{
    return newStringOf(mb, defaultText, rc); // there are no message catalogs
}

CMPIStatus writeLog(const CMPIBroker* mb, const char* function, const char* origin, const char* text,
                    const CMPIString* string)
{
    CMPIStatus status{};
    const Core* core = openFor(mb, function, &status);
    if (core && !core->options.personality.keepsLogs)
        return makeStatus(CMPI_RC_ERR_NOT_SUPPORTED);
    const StringHandle* handle = core && string ? open<StringHandle>(string, function, &status) : nullptr;
    if (core && core->options.log)
    {
        core->options.log(std::string(origin ? origin : "") + ": " +
                          (handle ? handle->content.text : std::string(text ? text : "")));
    }
    return status;
}

CMPIStatus logMessage(const CMPIBroker* mb, int, const char* id, const char* text, const CMPIString* string)
{
    return writeLog(mb, "logMessage", id, text, string);
}

CMPIStatus trace(const CMPIBroker* mb, int, const char* component, const char* text, const CMPIString* string)
{
    return writeLog(mb, "trace", component, text, string);
}

} // namespace

const CMPIBrokerEncFT factoryTable{
    .ftVersion = 100,
    .newInstance = newInstance,
    .newObjectPath = newObjectPath,
    .newArgs = newArgs,
    .newString = newStringOf,
    .newArray = newArray,
    .newDateTime = newDateTime,
    .newDateTimeFromBinary = newDateTimeFromBinary,
    .newDateTimeFromChars = newDateTimeFromChars,
    .newSelectExp = newSelectExp,
    .classPathIsA = classPathIsA,
    .toString = toString,
    .isOfType = isOfType,
    .getType = getType,
    .getMessage = getMessage,
    .logMessage = logMessage,
    .trace = trace,
};

} // namespace broker
