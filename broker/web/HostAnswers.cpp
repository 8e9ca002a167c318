// The host as a tree, what is wrong with it, and its ports as they are now.
#include "broker/core/Observation.h"
#include "broker/health/Health.h"
#include "broker/health/PortCounters.h"
#include "broker/host/HostGraph.h"
#include "broker/host/HostReport.h"
#include "broker/host/ReadableText.h"
#include "broker/values/PathText.h"
#include "broker/values/SchemaText.h"
#include "broker/values/ValueText.h"
#include "broker/web/Asking.h"

#include <algorithm>
#include <array>
#include <map>

namespace web
{

using namespace broker;

namespace
{

Json pathJson(const Path& path)
{
    return path.className.empty() ? Json() : Json(fullPathText(path));
}

const char* severity(bool critical)
{
    return critical ? "critical" : "warning";
}

// --- the tree -----------------------------------------------------------------------------------------------------

Json treeOf(const HostNode& node);

/// Those that are not too many of their sort.
Json childrenOf(const HostNode& node)
{
    const auto targets = static_cast<std::size_t>(std::ranges::count(node.children, targetKind, &HostNode::kind));
    const auto units = static_cast<std::size_t>(std::ranges::count(node.children, true, &HostNode::isUnit));
    Json children = Json::array();
    for (const HostNode& child : node.children)
        if ((child.kind != targetKind || targets <= listedTargets) && (!child.isUnit || units <= listedUnits))
            children.push_back(treeOf(child));
    return children;
}

Json treeOf(const HostNode& node)
{
    Json facts = Json::array();
    for (const HostFact& fact : node.facts)
        if (!(fact.place & isProblem))
            facts.push_back({{"label", fact.label}, {"text", fact.text}});
    Json problems = Json::array();
    for (const Problem& problem : node.problems)
        problems.push_back({{"severity", severity(problem.critical)}, {"text", problem.text}});
    Json json{{"kind", node.kind},
              {"name", node.name},
              {"path", pathJson(node.path)},
              {"facts", std::move(facts)},
              {"problems", std::move(problems)},
              {"units", node.units},
              {"bytes", node.bytes},
              {"contents", node.units > 0 ? Json(unitsText(node)) : Json()}};
    if (node.kind == targetKind)
        json["wwpn"] = node.name;
    if (const auto targets = std::ranges::count(node.children, targetKind, &HostNode::kind); targets > 0)
        json["targets"] = targets;
    json["children"] = childrenOf(node);
    return json;
}

// --- counters -----------------------------------------------------------------------------------------------------

struct Counter
{
    std::string name;
    const CounterRow* row; ///< null for one that nothing is known of
    std::uint64_t value;
    bool hasGrown; ///< an error counter that does, or did not long ago
};

/// By WWPN, in which the key of a port's statistics ends.
using CountersByPort = std::map<std::string, std::vector<Counter>>;

CountersByPort readCounters(State& state, std::vector<std::string>& failures)
{
    CountersByPort ports;
    for (const Object& statistics : instancesOf(state, "TVRHBA_FCPortStatistics", failures))
    {
        const std::string id = textOf(statistics, "InstanceID");
        const std::string port = id.substr(id.rfind(':') + 1);
        for (const Property& property : statistics.properties)
        {
            if (property.value.isNull() || property.value.type() != CMPI_uint64)
                continue;
            const std::uint64_t value = property.value.asUnsigned();
            const CounterRow* row = counterRow(property.name);
            const bool hasGrown = row && row->isError && state.growth.hasGrown(port, property.name, value);
            ports[port].push_back({property.name, row, value, hasGrown});
        }
    }
    return ports;
}

// --- problems -----------------------------------------------------------------------------------------------------

struct FoundProblem
{
    bool critical;
    std::string text;
    const HostNode* node;
};

void findProblems(const HostNode& node, const CountersByPort& counters, std::vector<FoundProblem>& found)
{
    for (const Problem& problem : node.problems)
        found.push_back({problem.critical, problem.text, &node});
    if (const auto own = counters.find(node.name); own != counters.end() && node.kind == portKind)
        for (const Counter& counter : own->second)
            if (counter.hasGrown)
                found.push_back({false, inCapitals(counter.row->label) + " GROW", &node});
    for (const HostNode& child : node.children)
        findProblems(child, counters, found);
}

/// The worst first.
Json problemsOf(const HostNode& root, const CountersByPort& counters)
{
    std::vector<FoundProblem> found;
    findProblems(root, counters, found);
    std::ranges::stable_sort(found, std::greater(), &FoundProblem::critical);
    Json problems = Json::array();
    for (const FoundProblem& problem : found)
        problems.push_back({{"severity", severity(problem.critical)},
                            {"text", problem.text},
                            {"kind", problem.node->kind},
                            {"name", problem.node->name},
                            {"path", pathJson(problem.node->path)}});
    return problems;
}

/// As of one refresh of the provider's cache: one that ends meanwhile would have parts of the host without what led to
/// them.
HostReport reportOf(State& state)
{
    const auto before = observe(state.broker);
    HostReport report(state.broker, state.nameSpace);
    const auto after = observeSettled(state.broker);
    const bool isOfOne = !before || !after || before->refreshes == 0 || before->refreshes == after->refreshes;
    return isOfOne ? report : HostReport(state.broker, state.nameSpace);
}

std::string readHost(State& state)
{
    const HostReport report = reportOf(state);
    std::vector<std::string> failures = report.failures();
    const CountersByPort counters = readCounters(state, failures);
    return jsonText({{"problems", problemsOf(report.root(), counters)},
                     {"failures", std::move(failures)},
                     {"root", treeOf(report.root())}});
}

// --- ports --------------------------------------------------------------------------------------------------------

constexpr std::array<std::string_view, 6> portParts{"Card",       "Chip", "Connector", portKind, "Port controller",
                                                    "Transceiver"};

/// What an element is a part of, over any number of steps.
using Wholes = std::map<const Element*, const Element*>;

bool isOfKind(const Element& element, std::string_view kind)
{
    return kind == element.kind->name;
}

const Element* wholeOf(const Wholes& wholes, const Element* element, std::string_view kind)
{
    for (auto found = wholes.find(element); found != wholes.end(); found = wholes.find(found->second))
        if (isOfKind(*found->second, kind))
            return found->second;
    return nullptr;
}

/// As bad as the worst of what the port's state means.
const char* severityOf(const Element& port)
{
    const std::vector<Problem> problems = port.kind->problems(port.object);
    if (problems.empty())
        return "ok";
    return severity(std::ranges::any_of(problems, &Problem::critical));
}

const char* stateOf(const Object& object, const Measure& measure)
{
    switch (excessOf(object, measure).value_or(Excess::none))
    {
    case Excess::aboveAlarm:
    case Excess::belowAlarm:
        return "critical";
    case Excess::aboveWarning:
    case Excess::belowWarning:
        return "warning";
    case Excess::none:
        break;
    }
    return "ok";
}

void addMeasures(Json& measures, const State& state, const Element& element, std::span<const Measure> rows)
{
    const ClassInfo* info = state.broker.classes().find(element.object.path.className);
    for (const Measure& row : rows)
    {
        const auto value = numberOf(element.object, row.value);
        if (!value || !info)
            continue;
        const Limits limits = limitsOf(element.object, row).value_or(Limits{});
        measures.push_back({{"label", inSentence(element.kind->name) + " " + row.name},
                            {"value", *value},
                            {"unit", unitText(unitOf(*info, row.value))},
                            {"lowAlarm", orNull(limits.lowAlarm)},
                            {"lowWarning", orNull(limits.lowWarning)},
                            {"highWarning", orNull(limits.highWarning)},
                            {"highAlarm", orNull(limits.highAlarm)},
                            {"state", stateOf(element.object, row)}});
    }
}

/// Of the port's own transceiver, and of the chips of its card.
Json measuresOf(const State& state, const Element& port, const Element* card)
{
    Json measures = Json::array();
    for (const Part& controller : port.parts)
        for (const Part& part : controller.element->parts)
            if (isOfKind(*part.element, "Transceiver"))
                addMeasures(measures, state, *part.element, transceiverMeasures);
    if (card)
        for (const Part& part : card->parts)
            if (isOfKind(*part.element, "Chip"))
                addMeasures(measures, state, *part.element, chipMeasures);
    return measures;
}

Json countersJson(const std::vector<Counter>& counters)
{
    Json list = Json::array();
    for (const Counter& counter : counters)
        list.push_back({{"name", counter.name},
                        {"label", counter.row ? counter.row->label : counter.name},
                        {"value", counter.value},
                        {"isError", counter.row && counter.row->isError},
                        {"grows", counter.hasGrown},
                        {"unit", counter.row ? counter.row->unit : "events"}});
    return list;
}

std::string readPorts(State& state)
{
    HostGraph graph(state.broker, state.nameSpace, portParts);
    std::vector<std::string> failures = graph.failures();
    CountersByPort counters = readCounters(state, failures);
    Wholes wholes;
    for (const Element& element : graph.elements())
        for (const Part& part : element.parts)
            wholes.emplace(part.element, &element);
    Json list = Json::array();
    for (const Element& element : graph.elements())
    {
        if (!isOfKind(element, portKind))
            continue;
        const Element* card = wholeOf(wholes, &element, "Card");
        const PortState* known = portState(element.object);
        const std::string name = oneLine(textOf(element.object, "DeviceID"));
        const std::uint64_t speed = unsignedOf(element.object, "Speed").value_or(0);
        list.push_back({{"path", pathJson(element.object.path)},
                        {"name", name},
                        {"card", card ? Json(oneLine(textOf(card->object, card->kind->nameProperty))) : Json()},
                        {"state", known ? known->text : "state unknown"},
                        {"up", known && known->up},
                        {"severity", severityOf(element)},
                        {"speed", speed == 0 ? Json() : Json(speed)},
                        {"speedText", speed == 0 ? Json() : Json(speedText(speed))},
                        {"counters", countersJson(counters[textOf(element.object, "DeviceID")])},
                        {"measures", measuresOf(state, element, card)}});
    }
    return jsonText({{"ports", std::move(list)}, {"failures", std::move(failures)}});
}

} // namespace

std::string host(const Question& question)
{
    Query(question.request.params, {});
    State& state = question.state;
    return state.texts.get("host", keptFor, [&] { return std::make_shared<Text>(Text{readHost(state)}); })->text;
}

std::string ports(const Question& question)
{
    Query(question.request.params, {});
    State& state = question.state;
    return state.texts.get("ports", liveFor, [&] { return std::make_shared<Text>(Text{readPorts(state)}); })->text;
}

} // namespace web
