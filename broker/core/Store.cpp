#include "broker/core/Store.h"

#include "broker/core/Personality.h"
#include "broker/values/Json.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <stdexcept>

namespace broker
{

namespace
{

NamesReply refused(CMPIrc status, std::string message)
{
    NamesReply reply;
    reply.status = status;
    reply.message = std::move(message);
    return reply;
}

std::string notFoundText(const Path& path)
{
    return "there is no such instance of " + path.className;
}

} // namespace

std::string canonicalNameSpace(std::string_view nameSpace)
{
    std::string name = lowerCase(nameSpace);
    const bool interop = std::find(interopNames.begin(), interopNames.end(), name) != interopNames.end();
    return interop ? std::string(interopNames.front()) : name;
}

NamesReply Store::create(Object object)
{
    const ClassInfo* info = _classes.find(object.path.className);
    if (!info)
        return refused(CMPI_RC_ERR_INVALID_CLASS, "there is no class '" + object.path.className + "'");
    Object stored;
    stored.path.nameSpace = canonicalNameSpace(object.path.nameSpace);
    stored.path.className = info->name;
    for (const Property& property : object.properties)
        if (!info->property(property.name))
            return refused(CMPI_RC_ERR_NO_SUCH_PROPERTY, info->name + " has no property '" + property.name + "'");
    for (const FeatureInfo& feature : info->properties)
    {
        const Value* key = feature.isKey() ? object.path.key(feature.name) : nullptr;
        const Value value = object.has(feature.name) ? object.get(feature.name) : key ? *key : feature.defaultValue;
        if (feature.isKey() && value.isNull())
            return refused(CMPI_RC_ERR_INVALID_PARAMETER, info->name + " needs its key '" + feature.name + "'");
        if (feature.isKey())
            stored.path.keys.push_back({feature.name, value});
        if (!value.isNull())
            stored.properties.push_back({feature.name, value});
    }
    const std::lock_guard lock(_mutex);
    if (const Outcome outcome = changeable(info->name); !outcome.ok())
        return refused(outcome.status, outcome.message);
    if (find(stored.path))
        return refused(CMPI_RC_ERR_ALREADY_EXISTS, "an instance of " + info->name + " with these keys exists");
    NamesReply reply;
    reply.paths.push_back(stored.path);
    _objects.push_back(std::move(stored));
    return reply;
}

std::vector<Object> Store::enumerate(std::string_view nameSpace, std::string_view className) const
{
    const std::string space = canonicalNameSpace(nameSpace);
    std::vector<Object> found;
    const std::lock_guard lock(_mutex);
    for (const Object& object : _objects)
    {
        if (object.path.nameSpace == space && sameName(object.path.className, className))
        {
            found.push_back(object);
            found.back().path.nameSpace = nameSpace;
        }
    }
    return found;
}

Reply Store::get(const Path& path) const
{
    const std::lock_guard lock(_mutex);
    Reply reply;
    if (const Object* object = find(path))
    {
        reply.objects.push_back(*object);
        reply.objects.back().path.nameSpace = path.nameSpace;
        return reply;
    }
    reply.status = CMPI_RC_ERR_NOT_FOUND;
    reply.message = notFoundText(path);
    return reply;
}

Outcome Store::modify(const Object& object, const PropertyList& properties)
{
    const std::lock_guard lock(_mutex);
    auto* stored = const_cast<Object*>(find(object.path));
    const ClassInfo* info = _classes.find(object.path.className);
    if (!stored || !info)
        return {CMPI_RC_ERR_NOT_FOUND, notFoundText(object.path)};
    if (const Outcome outcome = changeable(info->name); !outcome.ok())
        return outcome;
    std::vector<std::string> names = properties.value_or(std::vector<std::string>());
    if (!properties)
    {
        std::transform(object.properties.begin(), object.properties.end(), std::back_inserter(names),
                       [](const Property& property) { return property.name; });
    }
    for (const std::string& name : names)
    {
        const FeatureInfo* feature = info->property(name);
        if (!feature)
            return {CMPI_RC_ERR_NO_SUCH_PROPERTY, info->name + " has no property '" + name + "'"};
        if (feature->isKey())
            continue;
        if (object.get(name).isNull())
            std::erase_if(stored->properties, [&](const Property& property) { return sameName(property.name, name); });
        else
            stored->set(feature->name, object.get(name));
    }
    return {};
}

Outcome Store::remove(const Path& path)
{
    const std::lock_guard lock(_mutex);
    const Object* stored = find(path);
    if (!stored)
        return {CMPI_RC_ERR_NOT_FOUND, notFoundText(path)};
    if (const Outcome outcome = changeable(path.className); !outcome.ok())
        return outcome;
    _objects.erase(_objects.begin() + (stored - _objects.data()));
    return {};
}

void Store::close(std::string_view className)
{
    const std::lock_guard lock(_mutex);
    _closed.emplace(className);
}

Outcome Store::changeable(const std::string& className) const
{
    if (!_closed.contains(className))
        return {};
    return {CMPI_RC_ERR_NOT_SUPPORTED, "instances of " + className + " cannot be changed"};
}

std::size_t Store::size() const
{
    const std::lock_guard lock(_mutex);
    return _objects.size();
}

const Object* Store::find(const Path& path) const
{
    Path wanted = path;
    wanted.nameSpace = canonicalNameSpace(path.nameSpace);
    const auto it = std::find_if(_objects.begin(), _objects.end(),
                                 [&](const Object& object) { return sameObject(object.path, wanted); });
    return it == _objects.end() ? nullptr : &*it;
}

// --- platform files ------------------------------------------------------------------------------------

void loadPlatform(Store& store, const ClassTable& classes, std::string_view json)
{
    const Json document = parseJson(json);
    if (document.is_discarded() || !document.is_object() || !document.contains("instances") ||
        !document["instances"].is_array())
        throw std::runtime_error("a platform file is a JSON object with a list \"instances\"");
    for (const Json& instance : document["instances"])
    {
        try
        {
            const NamesReply reply = store.create(objectFromJson(classes, "root/ibmse", instance));
            if (!reply.ok())
                throw std::invalid_argument(reply.message);
        }
        catch (const std::exception& error)
        {
            throw std::runtime_error("platform file, " + jsonText(instance).substr(0, 80) + ": " + error.what());
        }
    }
}

void loadPlatformFile(Store& store, const ClassTable& classes, const std::string& path)
{
    std::ifstream file(path);
    if (!file)
        throw std::runtime_error("cannot read the platform file " + path);
    loadPlatform(store, classes, std::string(std::istreambuf_iterator<char>(file), {}));
}

} // namespace broker
