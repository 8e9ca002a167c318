#include "broker/tvrcim/Arguments.h"

#include "broker/tvrcim/Progress.h"
#include "broker/values/PathText.h"

#include <algorithm>
#include <cctype>
#include <filesystem>
#include <fstream>
#include <iterator>

namespace tvrcim
{

using namespace broker;

namespace
{

/// Runs a reader of text, whose refusals get the argument's name.
template <class Read> auto read(const std::string& argument, Read reader)
{
    try
    {
        return reader();
    }
    catch (const std::invalid_argument& error)
    {
        throw UsageError(argument + ": " + error.what());
    }
}

bool hasKeysOf(const Path& path, const Path& part)
{
    return std::ranges::all_of(part.keys,
                               [&](const Property& key)
                               {
                                   const Value* value = path.key(key.name);
                                   return value && valueText(*value) == valueText(key.value);
                               });
}

NamesReply namesOfClass(const Session& session, const Path& path)
{
    const Progress progress(session.progress, path.className);
    NamesReply known = session.broker.enumerateInstanceNames(path.nameSpace, path.className);
    if (!known.ok())
        throw CimError(known);
    return known;
}

/// The keys that the path leaves out are those of the only instance with the others.
Path completed(const Session& session, const Path& path, const std::string& argument)
{
    const std::string missing = missingKey(path, session.broker.classes());
    if (missing.empty())
        return path;
    NamesReply known = namesOfClass(session, path);
    std::erase_if(known.paths, [&](const Path& candidate) { return !hasKeysOf(candidate, path); });
    if (known.paths.empty())
    {
        throw CimError({CMPI_RC_ERR_NOT_FOUND,
                        argument + ": there is no " + pathText(path) + "; its key '" + missing + "' is left out"});
    }
    if (known.paths.size() > 1)
    {
        throw UsageError(argument + ": the key '" + missing + "' of " + path.className + " is missing, and " +
                         std::to_string(known.paths.size()) + " instances have the others");
    }
    return known.paths.front();
}

/// A reference as it goes out: of a class that the feature allows, and with all keys.
Value resolved(const Session& session, const FeatureInfo& feature, const Value& value)
{
    if (value.isNull() || !feature.isReference())
        return value;
    if (value.isArray())
    {
        Value::List list;
        for (const Value& element : value.asList())
            list.push_back(resolved(session, feature, element));
        return Value::array(CMPI_ref, std::move(list));
    }
    const Path& path = value.asPath();
    if (!session.broker.classes().find(path.className))
        throw UsageError(feature.name + ": there is no class '" + path.className + "'");
    if (!feature.referenceClass.empty() && !session.broker.classes().isA(path.className, feature.referenceClass))
        throw UsageError(feature.name + ": " + path.className + " is no " + feature.referenceClass);
    return Value::reference(completed(session, path, feature.name));
}

Value bytesOf(const std::string& name, const std::string& file)
{
    std::ifstream stream(file, std::ios::binary);
    if (!stream || !std::filesystem::is_regular_file(file))
        throw UsageError(name + ": cannot read the file '" + file + "'");
    Value::List bytes;
    for (auto byte = std::istreambuf_iterator<char>(stream); byte != std::istreambuf_iterator<char>(); ++byte)
        bytes.push_back(Value::uint8(static_cast<std::uint8_t>(*byte)));
    return Value::array(CMPI_uint8, std::move(bytes));
}

const FeatureInfo& featureNamed(const Assignable& assignable, const std::string& name)
{
    const auto feature =
        std::ranges::find_if(assignable.features, [&](const FeatureInfo& f) { return sameName(f.name, name); });
    if (feature == assignable.features.end())
        throw UsageError("'" + name + "': " + assignable.owner + " has none of that name");
    const bool isOutput = (feature->flags & cimple::META_OUT) && !(feature->flags & cimple::META_IN);
    if (isOutput)
        throw UsageError("'" + name + "': that is what " + assignable.owner + " gives back");
    return *feature;
}

Value valueOf(const Session& session, const Assignable& assignable, const FeatureInfo& feature, const std::string& text)
{
    if (feature.type == CMPI_uint8A && text.starts_with('@'))
        return bytesOf(feature.name, text.substr(1));
    const Target target(session.broker.classes(), assignable.nameSpace, feature);
    return resolved(session, feature, read(feature.name, [&] { return parseValue(target, text); }));
}

} // namespace

Path pathOf(const Session& session, const std::string& text, const std::string& argument)
{
    return read(argument, [&] { return parsePath(text, session.broker.classes(), session.nameSpace); });
}

Path instancePathOf(const Session& session, const std::string& text, const std::string& argument)
{
    return completed(session, pathOf(session, text, argument), argument);
}

std::vector<Property> parseAssignments(const Session& session, const Assignable& assignable,
                                       const std::vector<std::string>& texts)
{
    std::vector<Property> result;
    for (const std::string& text : texts)
    {
        const std::size_t mark = text.find('=');
        if (mark == std::string::npos)
            throw UsageError("'" + text + "': an assignment is written name=value");
        const FeatureInfo& feature = featureNamed(assignable, text.substr(0, mark));
        if (findNamed(result, feature.name))
            throw UsageError(feature.name + ": it is given twice");
        result.push_back({feature.name, valueOf(session, assignable, feature, text.substr(mark + 1))});
    }
    return result;
}

std::string plainWwn(std::string text)
{
    std::erase(text, ':');
    std::ranges::transform(text, text.begin(), [](unsigned char c) { return std::toupper(c); });
    return text;
}

Path portControllerOf(const Session& session, const std::string& wwpn)
{
    const NamesReply known = namesOfClass(session, {session.nameSpace, "TVRHBA_PortController", {}});
    std::string ports;
    for (const Path& path : known.paths)
    {
        const std::string id = path.key("DeviceID")->asString();
        if (id == plainWwn(wwpn))
            return path;
        ports += (ports.empty() ? "" : ", ") + id;
    }
    throw UsageError("PORT: there is no port '" + wwpn + "'; " +
                     (ports.empty() ? "the host has none" : "the host has " + ports));
}

} // namespace tvrcim
