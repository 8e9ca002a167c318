// Instances of classes that no provider serves: the platform's computer system, chassis and base server profile.
#pragma once

#include "broker/core/Reply.h"
#include "broker/values/ClassInfo.h"

#include <map>
#include <mutex>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace broker
{

/// In lower case, and the interop namespace by the first of its names (Personality.h).
std::string canonicalNameSpace(std::string_view nameSpace);

/// Thread-safe. Properties of a stored instance are those of its class; its path is made of them.
class Store
{
public:
    explicit Store(const ClassTable& classes) : _classes(classes) {}

    /// Adds an instance; its keys come from its properties or its path, and the rest gets the schema's defaults.
    /// CMPI_RC_ERR_ALREADY_EXISTS, CMPI_RC_ERR_INVALID_CLASS, CMPI_RC_ERR_NO_SUCH_PROPERTY,
    /// CMPI_RC_ERR_INVALID_PARAMETER (a missing key).
    NamesReply create(Object object);
    /// All instances of exactly that class.
    std::vector<Object> enumerate(std::string_view nameSpace, std::string_view className) const;
    Reply get(const Path& path) const;
    /// Changes the listed properties, or those of the instance; keys stay.
    Outcome modify(const Object& object, const PropertyList& properties);
    Outcome remove(const Path& path);
    /// From now on the instances of the class are what they are, and changes CMPI_RC_ERR_NOT_SUPPORTED.
    void close(std::string_view className);
    std::size_t size() const;

private:
    const Object* find(const Path& path) const;
    Outcome changeable(const std::string& className) const;

    const ClassTable& _classes;
    mutable std::mutex _mutex;
    std::vector<Object> _objects;
    std::set<std::string, NameLess> _closed;
};

/// Reads a platform file (docs/tvrcim.md has its format) into the store. Throws std::runtime_error with the reason.
void loadPlatformFile(Store& store, const ClassTable& classes, const std::string& path);
/// The same from text.
void loadPlatform(Store& store, const ClassTable& classes, std::string_view json);

} // namespace broker
