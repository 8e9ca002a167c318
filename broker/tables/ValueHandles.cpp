// Function tables of the objects that hold values: strings, datetimes, arrays, enumerations, contexts, arguments and
// select expressions.
#include "broker/core/Core.h"
#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"

namespace broker
{

namespace
{

// --- strings and datetimes -----------------------------------------------------------------------------

const char* getCharPtr(const CMPIString* string, CMPIStatus* rc)
{
    const auto* handle = open<StringHandle>(string, "getCharPtr", rc);
    return handle && !handle->content.noCharacters ? handle->content.text.c_str() : nullptr;
}

CMPIUint64 getBinaryFormat(const CMPIDateTime* dateTime, CMPIStatus* rc)
{
    const auto* handle = open<DateTimeHandle>(dateTime, "getBinaryFormat", rc);
    return handle ? handle->content.microseconds() : 0;
}

CMPIString* getStringFormat(const CMPIDateTime* dateTime, CMPIStatus* rc)
{
    const auto* handle = open<DateTimeHandle>(dateTime, "getStringFormat", rc);
    return handle ? newString(*handle->core, "getStringFormat", rc, handle->content.text()) : nullptr;
}

CMPIBoolean isInterval(const CMPIDateTime* dateTime, CMPIStatus* rc)
{
    const auto* handle = open<DateTimeHandle>(dateTime, "isInterval", rc);
    return handle && handle->content.isInterval();
}

// --- arrays and enumerations ---------------------------------------------------------------------------

CMPICount getSize(const CMPIArray* array, CMPIStatus* rc)
{
    const auto* handle = open<ArrayHandle>(array, "getSize", rc);
    return handle ? static_cast<CMPICount>(handle->content.elements.size()) : 0;
}

CMPIType getSimpleType(const CMPIArray* array, CMPIStatus* rc)
{
    const auto* handle = open<ArrayHandle>(array, "getSimpleType", rc);
    return handle ? handle->content.elementType : CMPIType{CMPI_null};
}

CMPIData getElementAt(const CMPIArray* array, CMPICount index, CMPIStatus* rc)
{
    const auto* handle = open<ArrayHandle>(array, "getElementAt", rc);
    if (!handle)
        return nullData(CMPI_null, CMPI_badValue);
    if (index >= handle->content.elements.size())
    {
        setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
        return nullData(handle->content.elementType, CMPI_notFound);
    }
    return answer(*handle->core, handle->content.elements[index], "getElementAt", rc);
}

CMPIStatus setElementAt(CMPIArray* array, CMPICount index, const CMPIValue* value, CMPIType type)
{
    CMPIStatus status{};
    auto* handle = open<ArrayHandle>(array, "setElementAt", &status);
    if (!handle)
        return status;
    ArrayContent& content = handle->content;
    if (index >= content.elements.size())
    {
        handle->core->violation("setElementAt " + std::to_string(index) + " of an array of " +
                                std::to_string(content.elements.size()));
        return makeStatus(CMPI_RC_ERR_NO_SUCH_PROPERTY);
    }
    if (type == CMPI_null)
    {
        content.elements[index] = Value::null(content.elementType);
        return status;
    }
    Value element = fromCmpi(*handle->core, value, type, "setElementAt", status);
    if (status.rc == CMPI_RC_OK && element.type() != content.elementType)
    {
        handle->core->violation("setElementAt with another type than the array's");
        status.rc = CMPI_RC_ERR_TYPE_MISMATCH;
    }
    if (status.rc == CMPI_RC_OK)
        content.elements[index] = std::move(element);
    return status;
}

CMPIData getNext(const CMPIEnumeration* enumeration, CMPIStatus* rc)
{
    auto* handle = open<EnumerationHandle>(enumeration, "getNext", rc);
    if (!handle)
        return nullData(CMPI_null, CMPI_badValue);
    EnumerationContent& content = handle->content;
    if (content.next >= content.elements.size())
    {
        handle->core->violation("getNext behind the end of an enumeration");
        setStatus(rc, CMPI_RC_ERR_NOT_FOUND);
        return nullData(content.elementType, CMPI_notFound);
    }
    CMPIData data = answer(*handle->core, content.elements[content.next++], "getNext", rc);
    if (handle->core->options.personality.nullStates)
        data.state |= CMPI_nullValue;
    return data;
}

CMPIBoolean hasNext(const CMPIEnumeration* enumeration, CMPIStatus* rc)
{
    const auto* handle = open<EnumerationHandle>(enumeration, "hasNext", rc);
    return handle && handle->content.next < handle->content.elements.size();
}

CMPIArray* toArray(const CMPIEnumeration* enumeration, CMPIStatus* rc)
{
    const auto* handle = open<EnumerationHandle>(enumeration, "toArray", rc);
    return handle ? newHandle<ArrayHandle>(*handle->core, "toArray", rc,
                                           {handle->content.elementType, handle->content.elements})
                  : nullptr;
}

// --- lists of named values -----------------------------------------------------------------------------

template <class H> struct NamedAccess
{
    using Cmpi = typename H::Cmpi;

    static const std::vector<Property>& list(const H& handle)
    {
        if constexpr (std::is_same_v<H, ArgsHandle>)
            return handle.content.args;
        else
            return handle.content;
    }

    static CMPIData get(const Cmpi* object, const char* name, CMPIStatus* rc)
    {
        const H* handle = open<H>(object, "get", rc);
        const Property* property = handle && name ? findNamed(list(*handle), name) : nullptr;
        if (!property)
        {
            if (handle)
                setStatus(rc, absent(*handle->core));
            return nullData(CMPI_null, CMPI_notFound);
        }
        return value(*handle, *property, rc);
    }

    static CMPIData getAt(const Cmpi* object, CMPICount index, CMPIString** name, CMPIStatus* rc)
    {
        const H* handle = open<H>(object, "getAt", rc);
        const Property* property = handle ? entryAt(*handle->core, list(*handle), index, name, "getAt", rc) : nullptr;
        return property ? value(*handle, *property, rc) : nullData(CMPI_null, CMPI_notFound);
    }

    static CMPICount count(const Cmpi* object, CMPIStatus* rc)
    {
        const H* handle = open<H>(object, "getCount", rc);
        return handle ? static_cast<CMPICount>(list(*handle).size()) : 0;
    }

private:
    static CMPIrc absent(const Core& core)
    {
        return std::is_same_v<H, ArgsHandle> ? core.options.personality.missingArgument : CMPI_RC_ERR_NOT_FOUND;
    }

    static CMPIData value(const H& handle, const Property& property, CMPIStatus* rc)
    {
        if constexpr (std::is_same_v<H, ContextHandle>)
        {
            if (property.value.type() == CMPI_string && property.value.isNull()) // a principal without authentication
            {
                CMPIData data{};
                data.type = CMPI_string;
                data.value.string = newHandle<StringHandle>(*handle.core, "getEntry", rc, {"", true});
                return data;
            }
        }
        return answer(*handle.core, property.value, "get", rc);
    }
};

CMPIStatus addEntry(const CMPIContext* context, const char* name, const CMPIValue* value, const CMPIType type)
{
    CMPIStatus status{};
    auto* handle = open<ContextHandle>(context, "addEntry", &status);
    if (!handle || !name)
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    Value entry = fromCmpi(*handle->core, value, type, "addEntry", status);
    if (status.rc == CMPI_RC_OK)
        setNamed(handle->content, name, std::move(entry));
    return status;
}

CMPIStatus addArg(const CMPIArgs* args, const char* name, const CMPIValue* value, const CMPIType type)
{
    CMPIStatus status{};
    auto* handle = open<ArgsHandle>(args, "addArg", &status);
    if (!handle || !name)
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    const Core& core = *handle->core;
    Value argument = fromCmpi(core, value, type, "addArg", status);
    if (status.rc != CMPI_RC_OK)
        return status;
    if (const MethodInfo* method = handle->content.method)
    {
        const FeatureInfo* parameter = method->parameter(name);
        if (!parameter || !(parameter->flags & cimple::META_OUT))
        {
            core.violation("addArg '" + std::string(name) + "', which is no output parameter of " + method->name);
            return makeStatus(CMPI_RC_ERR_NO_SUCH_PROPERTY);
        }
        if (const std::string reason = misfit(core, *parameter, argument); !reason.empty())
        {
            core.violation("addArg: " + reason);
            return makeStatus(CMPI_RC_ERR_INVALID_DATA_TYPE);
        }
    }
    setNamed(handle->content.args, name, std::move(argument));
    return status;
}

// --- select expressions --------------------------------------------------------------------------------

template <class Answer> Answer notSupported(CMPIStatus* rc)
{
    setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return Answer{};
}

CMPIBoolean evaluate(const CMPISelectExp*, const CMPIInstance*, CMPIStatus* rc)
{
    return notSupported<CMPIBoolean>(rc);
}

CMPIString* getString(const CMPISelectExp* expression, CMPIStatus* rc)
{
    const auto* handle = open<SelectExpHandle>(expression, "getString", rc);
    return handle ? newString(*handle->core, "getString", rc, handle->content.query) : nullptr;
}

CMPISelectCond* getCondition(const CMPISelectExp*, CMPIStatus* rc)
{
    return notSupported<CMPISelectCond*>(rc);
}

CMPIBoolean evaluateUsingAccessor(const CMPISelectExp*, CMPIAccessor*, void*, CMPIStatus* rc)
{
    return notSupported<CMPIBoolean>(rc);
}

} // namespace

constinit const Versions<CMPIStringFT> StringHandle::functions = inVersions<CMPIStringFT>({
    .ftVersion = 100,
    .release = releaseHandle<StringHandle>,
    .clone = cloneHandle<StringHandle>,
    .getCharPtr = getCharPtr,
});

constinit const Versions<CMPIDateTimeFT> DateTimeHandle::functions = inVersions<CMPIDateTimeFT>({
    .ftVersion = 100,
    .release = releaseHandle<DateTimeHandle>,
    .clone = cloneHandle<DateTimeHandle>,
    .getBinaryFormat = getBinaryFormat,
    .getStringFormat = getStringFormat,
    .isInterval = isInterval,
});

constinit const Versions<CMPIArrayFT> ArrayHandle::functions = inVersions<CMPIArrayFT>({
    .ftVersion = 100,
    .release = releaseHandle<ArrayHandle>,
    .clone = cloneHandle<ArrayHandle>,
    .getSize = getSize,
    .getSimpleType = getSimpleType,
    .getElementAt = getElementAt,
    .setElementAt = setElementAt,
});

constinit const Versions<CMPIEnumerationFT> EnumerationHandle::functions = inVersions<CMPIEnumerationFT>({
    .ftVersion = 100,
    .release = releaseHandle<EnumerationHandle>,
    .clone = cloneHandle<EnumerationHandle>,
    .getNext = getNext,
    .hasNext = hasNext,
    .toArray = toArray,
});

constinit const Versions<CMPIContextFT> ContextHandle::functions = inVersions<CMPIContextFT>({
    .ftVersion = 100,
    .release = releaseHandle<ContextHandle>,
    .clone = cloneHandle<ContextHandle>,
    .getEntry = NamedAccess<ContextHandle>::get,
    .getEntryAt = NamedAccess<ContextHandle>::getAt,
    .getEntryCount = NamedAccess<ContextHandle>::count,
    .addEntry = addEntry,
});

constinit const Versions<CMPIArgsFT> ArgsHandle::functions = inVersions<CMPIArgsFT>({
    .ftVersion = 100,
    .release = releaseHandle<ArgsHandle>,
    .clone = cloneHandle<ArgsHandle>,
    .addArg = addArg,
    .getArg = NamedAccess<ArgsHandle>::get,
    .getArgAt = NamedAccess<ArgsHandle>::getAt,
    .getArgCount = NamedAccess<ArgsHandle>::count,
});

constinit const Versions<CMPISelectExpFT> SelectExpHandle::functions = inVersions<CMPISelectExpFT>({
    .ftVersion = 100,
    .release = releaseHandle<SelectExpHandle>,
    .clone = cloneHandle<SelectExpHandle>,
    .evaluate = evaluate,
    .getString = getString,
    .getDOC = getCondition,
    .getCOD = getCondition,
    .evaluateUsingAccessor = evaluateUsingAccessor,
});

} // namespace broker
