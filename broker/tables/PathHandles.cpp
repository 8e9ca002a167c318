// Function table of object paths.
#include "broker/core/Core.h"
#include "broker/tables/Handles.h"
#include "broker/tables/Marshal.h"
#include "broker/values/PathText.h"
#include "broker/values/QualifierText.h"

namespace broker
{

namespace
{

/// Sets a text of the path; null clears it.
template <std::string Path::*Member> CMPIStatus setText(CMPIObjectPath* path, const char* text)
{
    CMPIStatus status{};
    if (auto* handle = open<PathHandle>(path, "set", &status))
    {
        handle->content.path.*Member = text ? text : "";
        handle->content.info = handle->core->classes.find(handle->content.path.className);
    }
    return status;
}

template <std::string Path::*Member> CMPIString* getText(const CMPIObjectPath* path, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "get", rc);
    return handle ? newString(*handle->core, "get", rc, handle->content.path.*Member) : nullptr;
}

/// Whether a key may have this value: its own type, or the 64-bit integer that brokers use for integer keys.
std::string keyMisfit(const Core& core, const FeatureInfo& feature, const Value& value)
{
    const bool wide = value.type() == CMPI_sint64 || value.type() == CMPI_uint64;
    return misfit(core, feature, wide ? narrowed(value, feature.type) : value);
}

CMPIStatus addKey(CMPIObjectPath* path, const char* name, const CMPIValue* value, const CMPIType type)
{
    CMPIStatus status{};
    auto* handle = open<PathHandle>(path, "addKey", &status);
    if (!handle || !name)
        return makeStatus(handle ? CMPI_RC_ERR_INVALID_PARAMETER : CMPI_RC_ERR_INVALID_HANDLE);
    const Core& core = *handle->core;
    Value key = fromCmpi(core, value, type, "addKey", status);
    if (status.rc != CMPI_RC_OK)
        return status;
    if (const ClassInfo* info = handle->content.info)
    {
        const FeatureInfo* feature = info->property(name);
        if (!feature || !feature->isKey())
        {
            core.violation("addKey '" + std::string(name) + "', which is no key of " + info->name);
            return makeStatus(CMPI_RC_ERR_NO_SUCH_PROPERTY);
        }
        if (const std::string reason = keyMisfit(core, *feature, key); !reason.empty())
        {
            core.violation("addKey of " + info->name + ": " + reason);
            return makeStatus(CMPI_RC_ERR_INVALID_DATA_TYPE);
        }
    }
    handle->content.path.setKey(name, std::move(key));
    return status;
}

CMPIData keyAnswer(const PathHandle& handle, const Value& key, const char* function, CMPIStatus* rc)
{
    Frame* frame = openFrame(*handle.core, function, rc);
    return frame ? keyToCmpi(*frame, key) : nullData(key.type(), CMPI_badValue);
}

CMPIData getKey(const CMPIObjectPath* path, const char* name, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "getKey", rc);
    const Value* key = handle && name ? handle->content.path.key(name) : nullptr;
    if (!key)
    {
        if (handle)
            setStatus(rc, CMPI_RC_ERR_NOT_FOUND);
        return nullData(CMPI_null, CMPI_notFound);
    }
    return keyAnswer(*handle, *key, "getKey", rc);
}

CMPIData getKeyAt(const CMPIObjectPath* path, CMPICount index, CMPIString** name, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "getKeyAt", rc);
    const Property* key =
        handle ? entryAt(*handle->core, handle->content.path.keys, index, name, "getKeyAt", rc) : nullptr;
    return key ? keyAnswer(*handle, key->value, "getKeyAt", rc) : nullData(CMPI_null, CMPI_notFound);
}

CMPICount getKeyCount(const CMPIObjectPath* path, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "getKeyCount", rc);
    return handle ? static_cast<CMPICount>(handle->content.path.keys.size()) : 0;
}

CMPIStatus setNameSpaceFromObjectPath(CMPIObjectPath* path, const CMPIObjectPath* from)
{
    CMPIStatus status{};
    auto* target = open<PathHandle>(path, "setNameSpaceFromObjectPath", &status);
    const auto* source = target ? open<PathHandle>(from, "setNameSpaceFromObjectPath", &status) : nullptr;
    if (source)
        target->content.path.nameSpace = source->content.path.nameSpace;
    return status;
}

CMPIStatus setHostAndNameSpaceFromObjectPath(CMPIObjectPath* path, const CMPIObjectPath* from)
{
    const CMPIStatus status = setNameSpaceFromObjectPath(path, from);
    if (status.rc == CMPI_RC_OK)
        open<PathHandle>(path, "setHost")->content.path.host = open<PathHandle>(from, "setHost")->content.path.host;
    return status;
}

// --- qualifiers: the flags of the class definitions ----------------------------------------------------

CMPIData qualifierAnswer(const std::uint32_t* flags, const char* qualifier, CMPIStatus* rc)
{
    const std::uint32_t mask = qualifier ? qualifierMask(qualifier) : 0;
    if (!flags || !mask || !(*flags & mask))
    {
        setStatus(rc, CMPI_RC_ERR_NOT_FOUND);
        return nullData(CMPI_null, CMPI_notFound);
    }
    CMPIData data{};
    data.type = CMPI_boolean;
    data.value.boolean = 1;
    return data;
}

const ClassInfo* classOf(const CMPIObjectPath* path, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "getQualifier", rc);
    return handle ? handle->content.info : nullptr;
}

CMPIData getClassQualifier(const CMPIObjectPath* path, const char* qualifier, CMPIStatus* rc)
{
    const ClassInfo* info = classOf(path, rc);
    return qualifierAnswer(info ? &info->flags : nullptr, qualifier, rc);
}

CMPIData getPropertyQualifier(const CMPIObjectPath* path, const char* property, const char* qualifier, CMPIStatus* rc)
{
    const ClassInfo* info = classOf(path, rc);
    const FeatureInfo* feature = info && property ? info->property(property) : nullptr;
    return qualifierAnswer(feature ? &feature->flags : nullptr, qualifier, rc);
}

CMPIData getMethodQualifier(const CMPIObjectPath* path, const char* method, const char* qualifier, CMPIStatus* rc)
{
    const ClassInfo* info = classOf(path, rc);
    const MethodInfo* found = info && method ? info->method(method) : nullptr;
    return qualifierAnswer(found ? &found->flags : nullptr, qualifier, rc);
}

CMPIData getParameterQualifier(const CMPIObjectPath* path, const char* method, const char* parameter,
                               const char* qualifier, CMPIStatus* rc)
{
    const ClassInfo* info = classOf(path, rc);
    const MethodInfo* found = info && method ? info->method(method) : nullptr;
    const FeatureInfo* feature = found && parameter ? found->parameter(parameter) : nullptr;
    return qualifierAnswer(feature ? &feature->flags : nullptr, qualifier, rc);
}

CMPIString* toString(const CMPIObjectPath* path, CMPIStatus* rc)
{
    const auto* handle = open<PathHandle>(path, "toString", rc);
    return handle ? newString(*handle->core, "toString", rc, fullPathText(handle->content.path)) : nullptr;
}

} // namespace

constinit const Versions<CMPIObjectPathFT> PathHandle::functions = inVersions<CMPIObjectPathFT>({
    .ftVersion = 100,
    .release = releaseHandle<PathHandle>,
    .clone = cloneHandle<PathHandle>,
    .setNameSpace = setText<&Path::nameSpace>,
    .getNameSpace = getText<&Path::nameSpace>,
    .setHostname = setText<&Path::host>,
    .getHostname = getText<&Path::host>,
    .setClassName = setText<&Path::className>,
    .getClassName = getText<&Path::className>,
    .addKey = addKey,
    .getKey = getKey,
    .getKeyAt = getKeyAt,
    .getKeyCount = getKeyCount,
    .setNameSpaceFromObjectPath = setNameSpaceFromObjectPath,
    .setHostAndNameSpaceFromObjectPath = setHostAndNameSpaceFromObjectPath,
    .getClassQualifier = getClassQualifier,
    .getPropertyQualifier = getPropertyQualifier,
    .getMethodQualifier = getMethodQualifier,
    .getParameterQualifier = getParameterQualifier,
    .toString = toString,
});

} // namespace broker
