// Function tables of instances and results.
#include "broker/core/Core.h"
#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"
#include "broker/values/ValueText.h"

#include <algorithm>

namespace broker
{

namespace
{

bool listed(const std::vector<std::string>& names, std::string_view name)
{
    return std::any_of(names.begin(), names.end(), [&](const std::string& n) { return sameName(n, name); });
}

/// Where a property goes under the instance's filter; null when it is dropped.
std::vector<Property>* placeOf(InstanceContent& content, std::string_view name)
{
    if (!content.filter || listed(content.filter->properties, name))
        return &content.object.properties;
    return listed(content.filter->keys, name) ? &content.hidden : nullptr;
}

const Value* findProperty(const InstanceContent& content, std::string_view name)
{
    const Property* property = findNamed(content.object.properties, name);
    return property ? &property->value : nullptr;
}

/// Text in the place of a number, at which the small-footprint broker ends.
bool isTextForNumber(const FeatureInfo& feature, const Value& value)
{
    const bool number = isInteger(feature.type) || feature.type == CMPI_real32 || feature.type == CMPI_real64;
    return number && value.type() == CMPI_string && !value.isNull();
}

/// The value of a property as the server reads it for the provider.
CMPIData readProperty(const Core& core, const FeatureInfo* feature, const Value& value, const char* function,
                      CMPIStatus* rc)
{
    const bool accepted = core.options.personality.wrongProperties == WrongProperties::accepted;
    if (accepted && feature && isTextForNumber(*feature, value))
    {
        core.violation(std::string(function) + " of '" + feature->name +
                       "', in which a client put text: the server crashes");
        setStatus(rc, CMPI_RC_ERR_FAILED);
        return nullData(feature->type, CMPI_badValue);
    }
    return answer(core, value, function, rc);
}

CMPIData getProperty(const CMPIInstance* instance, const char* name, CMPIStatus* rc)
{
    const auto* handle = open<InstanceHandle>(instance, "getProperty", rc);
    if (!handle || !name)
        return nullData(CMPI_null, CMPI_badValue);
    const FeatureInfo* feature = handle->content.info ? handle->content.info->property(name) : nullptr;
    if (const Value* value = findProperty(handle->content, name))
        return readProperty(*handle->core, feature, *value, "getProperty", rc);
    if (feature)
        return nullData(feature->type);
    setStatus(rc, CMPI_RC_ERR_NO_SUCH_PROPERTY);
    return nullData(CMPI_null, CMPI_notFound);
}

CMPIData getPropertyAt(const CMPIInstance* instance, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    const auto* handle = open<InstanceHandle>(instance, "getPropertyAt", rc);
    const Property* property =
        handle ? entryAt(*handle->core, handle->content.object.properties, index, name, "getPropertyAt", rc) : nullptr;
    if (!property)
        return nullData(CMPI_null, CMPI_notFound);
    const ClassInfo* info = handle->content.info;
    return readProperty(*handle->core, info ? info->property(property->name) : nullptr, property->value,
                        "getPropertyAt", rc);
}

CMPICount getPropertyCount(const CMPIInstance* instance, CMPIStatus* rc)
{
    const auto* handle = open<InstanceHandle>(instance, "getPropertyCount", rc);
    return handle ? static_cast<CMPICount>(handle->content.object.properties.size()) : 0;
}

/// What a server does with a value that a provider sets.
struct Taken
{
    CMPIrc status = CMPI_RC_OK;
    bool kept = true;
};

/// For a property of the class.
Taken takeKnown(const InstanceHandle& handle, const FeatureInfo& feature, const Value& value)
{
    const Core& core = *handle.core;
    const std::string reason = misfit(core, feature, value);
    if (reason.empty())
        return {};
    const std::string breach = "setProperty of " + handle.content.object.path.className + ": " + reason;
    switch (core.options.personality.wrongProperties)
    {
    case WrongProperties::accepted:
        if (!isTextForNumber(feature, value))
            return {};
        core.violation(breach + ": the server crashes");
        return {CMPI_RC_ERR_FAILED, false};
    case WrongProperties::violations:
        core.violation(breach);
        break;
    case WrongProperties::refused:
        break;
    }
    return {CMPI_RC_ERR_INVALID_DATA_TYPE, false};
}

/// For a property that the class lacks.
Taken takeUnknown(const InstanceHandle& handle, const char* name, const Value& value)
{
    const Value* present = findProperty(handle.content, name);
    switch (handle.core->options.personality.wrongProperties)
    {
    case WrongProperties::accepted:
        return present && present->type() != value.type() ? Taken{CMPI_RC_ERR_TYPE_MISMATCH, false} : Taken{};
    case WrongProperties::refused:
        return {CMPI_RC_OK, false};
    default:
        handle.core->violation("setProperty '" + std::string(name) + "', which class " +
                               handle.content.object.path.className + " lacks");
        return {CMPI_RC_ERR_NO_SUCH_PROPERTY, false};
    }
}

CMPIStatus setProperty(const CMPIInstance* instance, const char* name, const CMPIValue* value, CMPIType type)
{
    CMPIStatus status{};
    auto* handle = open<InstanceHandle>(instance, "setProperty", &status);
    if (!handle || !name)
        return makeStatus(handle ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    Value read = fromCmpi(*handle->core, value, type, "setProperty", status);
    if (status.rc != CMPI_RC_OK)
        return status;
    InstanceContent& content = handle->content;
    const FeatureInfo* feature = content.info ? content.info->property(name) : nullptr;
    const Taken taken = feature ? takeKnown(*handle, *feature, read) : takeUnknown(*handle, name, read);
    std::vector<Property>* place = taken.kept ? placeOf(content, name) : nullptr;
    if (place)
        setNamed(*place, feature ? feature->name : name, std::move(read));
    return makeStatus(taken.status);
}

CMPIObjectPath* getObjectPath(const CMPIInstance* instance, CMPIStatus* rc)
{
    const auto* handle = open<InstanceHandle>(instance, "getObjectPath", rc);
    return handle ? newHandle<PathHandle>(*handle->core, "getObjectPath", rc,
                                          {handle->content.pathFromKeys(), handle->content.info})
                  : nullptr;
}

CMPIStatus setPropertyFilter(CMPIInstance* instance, const char** properties, const char** keys)
{
    CMPIStatus status{};
    auto* handle = open<InstanceHandle>(instance, "setPropertyFilter", &status);
    if (!handle || !properties || handle->core->options.personality.propertyFilters == PropertyFilters::broker)
        return status;
    InstanceContent& content = handle->content;
    content.filter = PropertyFilter{readNames(properties), readNames(keys)};
    std::vector<Property> all = std::move(content.object.properties);
    all.insert(all.end(), content.hidden.begin(), content.hidden.end());
    content.object.properties.clear();
    content.hidden.clear();
    for (Property& property : all)
        if (std::vector<Property>* place = placeOf(content, property.name))
            place->push_back(std::move(property));
    return status;
}

CMPIStatus setObjectPath(CMPIInstance* instance, const CMPIObjectPath* path)
{
    CMPIStatus status{};
    auto* handle = open<InstanceHandle>(instance, "setObjectPath", &status);
    const auto* pathHandle = handle ? open<PathHandle>(path, "setObjectPath", &status) : nullptr;
    if (!pathHandle)
        return status;
    InstanceContent& content = handle->content;
    if (!sameName(pathHandle->content.path.className, content.object.path.className))
    {
        handle->core->violation("setObjectPath of another class than the instance's");
        return makeStatus(CMPI_RC_ERR_INVALID_PARAMETER);
    }
    content.object.path = pathHandle->content.path;
    for (const Property& key : pathHandle->content.path.keys)
    {
        const FeatureInfo* feature = content.info ? content.info->property(key.name) : nullptr;
        std::vector<Property>* place = placeOf(content, key.name);
        setNamed(place ? *place : content.hidden, key.name, feature ? narrowed(key.value, feature->type) : key.value);
    }
    return status;
}

// --- results -------------------------------------------------------------------------------------------

/// The open result if it takes results of that kind now; otherwise null, after reporting why it does not.
ResultHandle* openResult(const CMPIResult* result, ResultContent::Kind kind, const char* function, CMPIStatus& status)
{
    auto* handle = open<ResultHandle>(result, function, &status);
    if (!handle)
        return nullptr;
    const ResultContent& content = handle->content;
    const char* fault = content.done                     ? " after returnDone"
                        : content.kind != kind           ? " in an operation that gives no such result"
                        : content.given >= content.limit ? " though the operation gives only one result"
                                                         : nullptr;
    if (fault)
    {
        handle->core->violation(function + std::string(fault));
        status.rc = CMPI_RC_ERR_NOT_SUPPORTED;
        return nullptr;
    }
    return handle;
}

/// Counts a result that the client gets; false from him ends the provider's call.
CMPIStatus deliver(ResultHandle& result, bool taken)
{
    result.content.given++;
    if (Frame* frame = Frame::current(*result.core))
        frame->resultGiven();
    return makeStatus(taken ? CMPI_RC_OK : CMPI_RC_ERR_FAILED);
}

void checkReturned(const ResultHandle& result, const Path& path, const char* function)
{
    const Core& core = *result.core;
    const ClassInfo* expected = result.content.expectedClass;
    if (expected && !core.classes.isA(path.className, expected->name))
    {
        core.violation(std::string(function) + " of class " + path.className + " where " + expected->name +
                       " was asked for");
    }
    if (const std::string fault = pathFault(core, path); !fault.empty())
        core.violation(std::string(function) + ": " + fault);
}

CMPIStatus returnInstance(const CMPIResult* result, const CMPIInstance* instance)
{
    CMPIStatus status{};
    auto* handle = openResult(result, ResultContent::Kind::instances, "returnInstance", status);
    const auto* returned = handle ? open<InstanceHandle>(instance, "returnInstance", &status) : nullptr;
    if (!returned)
        return status;
    Object object = returned->content.object;
    object.path = returned->content.pathFromKeys();
    checkReturned(*handle, object.path, "returnInstance");
    for (const Property& property : object.properties)
    {
        const bool reference = property.value.type() == CMPI_ref && !property.value.isNull();
        if (const std::string fault = reference ? pathFault(*handle->core, property.value.asPath()) : std::string();
            !fault.empty())
            handle->core->violation("returnInstance: " + object.path.className + "." + property.name + " is " + fault);
    }
    return deliver(*handle, handle->content.objects.take(std::move(object)));
}

CMPIStatus returnObjectPath(const CMPIResult* result, const CMPIObjectPath* path)
{
    CMPIStatus status{};
    auto* handle = openResult(result, ResultContent::Kind::paths, "returnObjectPath", status);
    const auto* returned = handle ? open<PathHandle>(path, "returnObjectPath", &status) : nullptr;
    if (!returned)
        return status;
    checkReturned(*handle, returned->content.path, "returnObjectPath");
    return deliver(*handle, handle->content.paths.take(Path(returned->content.path)));
}

CMPIStatus returnData(const CMPIResult* result, const CMPIValue* value, const CMPIType type)
{
    CMPIStatus status{};
    auto* handle = openResult(result, ResultContent::Kind::data, "returnData", status);
    if (!handle)
        return status;
    Value data = fromCmpi(*handle->core, value, type, "returnData", status);
    const MethodInfo* method = handle->content.method;
    if (status.rc == CMPI_RC_OK && method && data.type() != method->returnType)
    {
        handle->core->violation("returnData of " + typeText(data.type()) + " where " + method->name + " returns " +
                                typeText(method->returnType));
    }
    if (status.rc != CMPI_RC_OK)
        return status;
    handle->content.data = std::move(data);
    handle->content.given++;
    return status;
}

CMPIStatus returnDone(const CMPIResult* result)
{
    CMPIStatus status{};
    auto* handle = open<ResultHandle>(result, "returnDone", &status);
    if (handle && handle->content.done)
        handle->core->violation("returnDone for a second time");
    if (handle)
        handle->content.done = true;
    return status;
}

CMPIResult* cloneResult(const CMPIResult* result, CMPIStatus* rc)
{
    if (open<ResultHandle>(result, "clone", rc))
        setStatus(rc, CMPI_RC_ERR_NOT_SUPPORTED);
    return nullptr;
}

} // namespace

Path InstanceContent::pathFromKeys() const
{
    Path path = object.path;
    if (!info)
        return path;
    path.keys.clear();
    for (const std::string& name : info->keys)
    {
        const Property* visible = findNamed(object.properties, name);
        const Property* key = visible ? visible : findNamed(hidden, name);
        if (key && !key->value.isNull())
            path.keys.push_back(*key);
    }
    return path;
}

constinit const Versions<CMPIInstanceFT> InstanceHandle::functions = inVersions<CMPIInstanceFT>({
    .ftVersion = 100,
    .release = releaseHandle<InstanceHandle>,
    .clone = cloneHandle<InstanceHandle>,
    .getProperty = getProperty,
    .getPropertyAt = getPropertyAt,
    .getPropertyCount = getPropertyCount,
    .setProperty = setProperty,
    .getObjectPath = getObjectPath,
    .setPropertyFilter = setPropertyFilter,
    .setObjectPath = setObjectPath,
});

constinit const Versions<CMPIResultFT> ResultHandle::functions = inVersions<CMPIResultFT>({
    .ftVersion = 100,
    .release = releaseHandle<ResultHandle>,
    .clone = cloneResult,
    .returnData = returnData,
    .returnInstance = returnInstance,
    .returnObjectPath = returnObjectPath,
    .returnDone = returnDone,
});

} // namespace broker
