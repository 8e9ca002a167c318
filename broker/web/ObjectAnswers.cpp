// Classes, their instances, and what associations join these to.
#include "broker/host/ReadableText.h"
#include "broker/http/Memory.h"
#include "broker/values/PathText.h"
#include "broker/values/SchemaText.h"
#include "broker/values/ValueText.h"
#include "broker/web/Asking.h"

#include <algorithm>

namespace web
{

using namespace broker;

namespace
{

constexpr std::size_t usualCount = 100;
constexpr std::size_t largestCount = 500;
constexpr std::string_view instancesEnd = "/instances";

std::string describedClass(const Question& question, const std::string& name)
{
    Query(question.request.params, {});
    const ClassInfo& info = classNamed(question.state, name);
    Json json = toJson(info);
    json["association"] = info.isAssociation();
    json["namespaces"] = question.state.broker.nameSpacesOf(info.name);
    return jsonText(json);
}

Kept<InstanceTable>::Pointer readTable(State& state, const ClassInfo& info, const std::string& nameSpace)
{
    const auto table = std::make_shared<InstanceTable>(state.broker.classes(), info);
    const auto take = [&](Object&& object)
    {
        table->add(object);
        return true;
    };
    const Outcome outcome = state.broker.enumerateInstances(nameSpace, info.name, std::nullopt, {take, true});
    http::giveBackMemory(table->bytes());
    if (!outcome.ok())
        throw CimError(outcome);
    return table;
}

Json rowOf(const InstanceTable& table, std::size_t row)
{
    Json values = Json::array();
    for (std::size_t column = 0; column < table.columns().size(); column++)
    {
        const auto text = table.text(row, column);
        values.push_back(text ? Json(*text) : Json());
    }
    return {{"path", table.path(row)}, {"values", std::move(values)}};
}

std::string instances(const Question& question, const std::string& name)
{
    const Query query(question.request.params, {"from", "count", "sort", "descending", "find", "namespace"});
    Page page = Page::of(query, usualCount, largestCount);
    const Selection selection{query.text("sort"), query.flag("descending"), query.text("find")};
    State& state = question.state;
    const ClassInfo& info = classNamed(state, name);
    const std::string nameSpace = nameSpaceOf(state, info.name, query.text("namespace"));
    const auto table = state.tables.get(lowerCase(nameSpace) + ":" + info.name, keptFor,
                                        [&] { return readTable(state, info, nameSpace); });
    const std::vector<std::size_t> rows = table->select(selection);
    Json shown = Json::array();
    for (const std::size_t end = page.cutTo(rows.size()); page.from < end; page.from++)
        shown.push_back(rowOf(*table, rows[page.from]));
    return jsonText({{"class", info.name},
                     {"namespace", nameSpace},
                     {"total", table->size()},
                     {"matching", rows.size()},
                     {"columns", table->columns()},
                     {"rows", std::move(shown)}});
}

/// The whole path of what a value refers to.
Json referenceOf(const Value& value, const std::string& nameSpace)
{
    if (value.type() != CMPI_ref || value.isNull())
        return nullptr;
    Path path = value.asPath();
    if (path.nameSpace.empty())
        path.nameSpace = nameSpace;
    return fullPathText(path);
}

Json propertyOf(const Path& path, const ClassInfo* info, const Property& property)
{
    const FeatureInfo* feature = info ? info->property(property.name) : nullptr;
    const Value& value = property.value;
    return {{"name", property.name},
            {"type", typeText(feature ? feature->type : value.type())},
            {"key", feature && feature->isKey()},
            {"value", toJson(value)},
            {"text", value.isNull() ? Json() : Json(shownText(info, value, property.name))},
            {"reference", referenceOf(value, path.nameSpace)},
            {"description", info ? Json(descriptionOf(*info, property.name)) : Json("")}};
}

bool isOwnNoise(const Property& key)
{
    return sameName(key.name, "SystemCreationClassName") || sameName(key.name, "SystemName") ||
           sameName(key.name, "CreationClassName");
}

/// The references among the keys of an association that lead away from an instance; both of one that joins it to
/// itself.
void addEnds(Ends& ends, const Path& association, const Path& from)
{
    bool isPassed = false; // the end where we are
    for (const Property& key : association.keys)
    {
        if (key.value.type() != CMPI_ref || key.value.isNull())
            continue;
        Path path = key.value.asPath();
        if (!isPassed && sameObject(path, from))
        {
            isPassed = true;
            continue;
        }
        if (path.nameSpace.empty())
            path.nameSpace = from.nameSpace;
        ends.size += 2 * fullPathText(path).size() + sizeof(Ends::End) + path.keys.size() * sizeof(Property);
        ends.list.push_back({association.className, key.name, std::move(path)});
    }
}

Kept<Ends>::Pointer readEnds(State& state, const Path& path)
{
    const auto ends = std::make_shared<Ends>();
    const auto take = [&](Path&& association)
    {
        addEnds(*ends, association, path);
        return true;
    };
    const Outcome outcome = state.broker.referenceNames(path, {}, {take, true});
    if (!outcome.ok())
        throw CimError(outcome);
    return ends;
}

} // namespace

std::string shortName(const Path& path)
{
    std::string name;
    for (const Property& key : path.keys)
    {
        if (isOwnNoise(key) || key.value.isNull())
            continue;
        const std::string text =
            key.value.type() == CMPI_ref ? shortName(key.value.asPath()) : oneLine(valueText(key.value));
        name += (name.empty() ? "" : ", ") + text;
    }
    return name;
}

Path pathNamed(const State& state, const char* name, const std::string& text)
{
    try
    {
        Path path = parsePath(text, state.broker.classes(), state.nameSpace);
        const std::string missing = missingKey(path, state.broker.classes());
        if (!missing.empty())
            throw std::invalid_argument("it has no " + missing);
        return path;
    }
    catch (const std::invalid_argument& error)
    {
        throw ArgumentFailure(std::string(name) + ": " + error.what());
    }
}

std::string classes(const Question& question)
{
    Query(question.request.params, {});
    const Broker& broker = question.state.broker;
    Json list = Json::array();
    for (const std::string& name : broker.servedClasses())
    {
        const ClassInfo& info = classNamed(question.state, name);
        list.push_back({{"name", info.name},
                        {"description", descriptionOf(info)},
                        {"association", info.isAssociation()},
                        {"namespaces", broker.nameSpacesOf(name)},
                        {"methods", broker.serves(name, Kind::method) ? info.methods.size() : 0}});
    }
    return jsonText(list);
}

std::string classOrInstances(const Question& question)
{
    const std::string& rest = question.rest;
    if (rest.ends_with(instancesEnd))
        return instances(question, rest.substr(0, rest.size() - instancesEnd.size()));
    return describedClass(question, rest);
}

std::string instance(const Question& question)
{
    const Query query(question.request.params, {"path"});
    State& state = question.state;
    const Path asked = pathNamed(state, "path", query.required("path"));
    const Reply reply = checked(state.broker.getInstance(asked));
    const Object& object = reply.objects.front();
    const ClassInfo* info = state.broker.classes().find(object.path.className);
    Json properties = Json::array();
    for (const Property& property : object.properties)
        properties.push_back(propertyOf(asked, info, property));
    return jsonText({{"path", fullPathText(asked)},
                     {"class", info ? info->name : object.path.className},
                     {"namespace", asked.nameSpace},
                     {"properties", std::move(properties)}});
}

std::string associations(const Question& question)
{
    const Query query(question.request.params, {"path", "from", "count"});
    Page page = Page::of(query, usualCount, largestCount);
    State& state = question.state;
    const Path path = pathNamed(state, "path", query.required("path"));
    const auto ends = state.ends.get(fullPathText(path), keptFor, [&] { return readEnds(state, path); });
    Json items = Json::array();
    for (const std::size_t end = page.cutTo(ends->list.size()); page.from < end; page.from++)
    {
        const Ends::End& shown = ends->list[page.from];
        items.push_back({{"association", shown.association},
                         {"role", shown.role},
                         {"path", fullPathText(shown.path)},
                         {"class", shown.path.className},
                         {"name", shortName(shown.path)}});
    }
    return jsonText({{"total", ends->list.size()}, {"items", std::move(items)}});
}

} // namespace web
