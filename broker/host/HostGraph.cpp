#include "broker/host/HostGraph.h"

#include "broker/values/ValueText.h"

#include <algorithm>
#include <set>

namespace broker
{

namespace
{

/// One text for all paths of an instance, whatever the order of their keys. Namespaces are left out: classes of the
/// module are the same instances in each.
std::string pathId(const Path& path)
{
    std::vector<std::string> keys;
    keys.reserve(path.keys.size());
    for (const Property& key : path.keys)
        keys.push_back(lowerCase(key.name) + quoteText(key.value.isNull() ? "" : valueText(key.value)));
    std::sort(keys.begin(), keys.end());
    std::string id = lowerCase(path.className);
    for (const std::string& key : keys)
        id += key;
    return id;
}

bool isOf(const KindRow& kind, const Object& object)
{
    if (!kind.className || !sameName(kind.className, object.path.className))
        return false;
    return !kind.classification || isClassified(object, *kind.classification);
}

/// The middle of "initiator:target port:unit".
std::string targetPort(const Path& endpoint)
{
    const Value* name = endpoint.key("Name");
    const std::string text = name && !name->isNull() ? valueText(*name) : "";
    const std::size_t first = text.find(':');
    const std::size_t second = text.find(':', first + 1);
    return second == std::string::npos ? text : text.substr(first + 1, second - first - 1);
}

bool sameKind(const Element& element, const char* name)
{
    return std::string_view(element.kind->name) == name;
}

/// Of units, which may be many, what their kind shows; of others all, since what is wrong with them is read of more.
PropertyList shownProperties(const KindRow& kind)
{
    if (kind.appears != Appears::unit)
        return std::nullopt;
    std::vector<std::string> names{kind.nameProperty, "DeviceID", "Capacity"};
    for (const FactRow& row : kind.facts)
        names.emplace_back(row.property);
    return names;
}

/// Null for what is no reference.
const Path* pathOf(const Value& value)
{
    return value.type() == CMPI_ref && !value.isNull() ? &value.asPath() : nullptr;
}

} // namespace

HostGraph::HostGraph(Broker& broker, const std::string& nameSpace) : _broker(broker), _nameSpace(nameSpace)
{
    take({});
    findChassis();
}

HostGraph::HostGraph(Broker& broker, const std::string& nameSpace, std::span<const std::string_view> wanted)
    : _broker(broker), _nameSpace(nameSpace)
{
    take(wanted);
}

/// All kinds where none are named.
void HostGraph::take(std::span<const std::string_view> wanted)
{
    const auto isWanted = [&](const char* kind)
    { return wanted.empty() || std::ranges::find(wanted, std::string_view(kind)) != wanted.end(); };
    _elements.push_back({&kindNamed(hostKind), {}});
    std::set<std::string> asked;
    for (const KindRow& kind : kinds())
        if (kind.className && isWanted(kind.name) && asked.insert(kind.className).second)
            takeElements(kind);
    for (const EdgeRow& row : edges())
        if (isWanted(row.whole) && isWanted(row.part) && asked.insert(row.association).second)
            takeParts(row.association);
    if (_firstFailure && !_anyAnswered)
        throw *_firstFailure;
}

/// Whether the broker answered; notes the failure where it did not.
bool HostGraph::answered(const std::string& className, const Outcome& outcome)
{
    if (outcome.ok())
        return _anyAnswered = true;
    const CimError error(outcome);
    if (!_firstFailure)
        _firstFailure = error;
    _failures.push_back(failureText(className, error));
    return false;
}

void HostGraph::takeElements(const KindRow& first)
{
    const std::size_t known = _elements.size();
    const auto take = [&](Object&& object)
    {
        const auto kind = std::ranges::find_if(kinds(), [&](const KindRow& row) { return isOf(row, object); });
        if (kind != kinds().end())
            _elements.emplace_back(Element{&*kind, std::move(object)});
        return true;
    };
    if (!answered(first.className,
                  _broker.enumerateInstances(_nameSpace, first.className, shownProperties(first), {take, true})))
        _elements.resize(known, _elements.front());
    for (std::size_t i = known; i < _elements.size(); i++)
        _byPath.emplace(pathId(_elements[i].object.path), &_elements[i]);
}

void HostGraph::takeParts(const std::string& association)
{
    std::vector<const EdgeRow*> rows;
    for (const EdgeRow& row : edges())
        if (association == row.association)
            rows.push_back(&row);
    const auto take = [&](Path&& path)
    {
        for (const EdgeRow* row : rows)
            join(*row, path);
        return true;
    };
    answered(association, _broker.enumerateInstanceNames(_nameSpace, association, {take, true}));
}

/// Ends are told apart by their kinds. What is no element is the host, where a host is expected.
void HostGraph::join(const EdgeRow& row, const Path& association)
{
    Element* whole = nullptr;
    Element* part = nullptr;
    const Path* other = nullptr;
    for (const Property& key : association.keys)
    {
        const Path* path = pathOf(key.value);
        Element* element = path ? find(*path) : nullptr;
        if (!element)
            other = path ? path : other;
        else if (sameKind(*element, row.part))
            part = element;
        else if (sameKind(*element, row.whole))
            whole = element;
    }
    if (!whole && other && sameKind(host(), row.whole))
    {
        whole = &host();
        nameHost(*other);
    }
    if (!whole || !part)
        return;
    const Value* endpoint = row.target ? association.key(row.target) : nullptr;
    if (const Path* path = endpoint ? pathOf(*endpoint) : nullptr)
        whole = &targetOf(*whole, row.association, *path);
    whole->parts.push_back({row.association, part});
}

Element* HostGraph::find(const Path& path) const
{
    const auto found = _byPath.find(pathId(path));
    return found == _byPath.end() ? nullptr : found->second;
}

Element& HostGraph::targetOf(Element& initiator, const char* association, const Path& endpoint)
{
    const std::string port = targetPort(endpoint);
    Element*& target = _targets[{&initiator, port}];
    if (!target)
    {
        target = &_elements.emplace_back(Element{&kindNamed(targetKind), {endpoint, {{"Name", Value::string(port)}}}});
        if (target->object.path.nameSpace.empty())
            target->object.path.nameSpace = _nameSpace;
        initiator.parts.push_back({association, target});
    }
    return *target;
}

void HostGraph::nameHost(const Path& path)
{
    Object& object = host().object;
    if (object.has("Class"))
        return;
    const Value* name = path.key("Name");
    object.set("Name", name ? *name : Value());
    object.set("Class", Value::string(path.className));
    object.set("NameSpace", Value::string(path.nameSpace));
}

/// The chassis belongs to the platform as the computer system does: associations alone tell of it.
void HostGraph::findChassis()
{
    const char* containment = "TVRHBA_ChassisContainsCard";
    const NamesReply reply = _broker.enumerateInstanceNames(_nameSpace, containment);
    answered(containment, reply);
    for (const Path& association : reply.paths)
    {
        const Value* end = association.key("GroupComponent");
        const Path* chassis = end ? pathOf(*end) : nullptr;
        const Value* tag = chassis ? chassis->key("Tag") : nullptr;
        if (tag)
            return host().object.set("Chassis", *tag);
    }
}

} // namespace broker
