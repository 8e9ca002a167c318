#include "broker/host/HostReport.h"

#include "broker/host/HostGraph.h"
#include "broker/host/ReadableText.h"
#include "broker/values/ValueText.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <map>
#include <set>

namespace broker
{

namespace
{

// --- from the elements to the tree ------------------------------------------------------------------------------

/// DeviceID of a unit is initiator, target, designator and number of the unit with underscores between.
std::string identityOfUnit(const Object& unit)
{
    const Value& id = unit.get("DeviceID");
    const std::string text = id.isNull() ? "" : valueText(id);
    const std::size_t initiator = text.find('_');
    const std::size_t target = initiator == std::string::npos ? initiator : text.find('_', initiator + 1);
    return target == std::string::npos ? text : text.substr(target + 1);
}

/// Takes the element's path along.
HostNode describe(Element& element, const char* association)
{
    const KindRow& kind = *element.kind;
    const Value& name = element.object.get(kind.nameProperty);
    HostNode node{kind.name, name.isNull() ? "" : oneLine(valueText(name)), association};
    for (const FactRow& row : kind.facts)
        if (const std::string text = row.text(element.object, row); !text.empty())
            node.facts.push_back({row.label, oneLine(text), row.place});
    if (kind.problems)
        node.problems = kind.problems(element.object);
    if (kind.appears == Appears::unit)
    {
        const Value& capacity = element.object.get("Capacity");
        node.identity = identityOfUnit(element.object);
        node.isUnit = true;
        node.units = 1;
        node.bytes = capacity.isNull() || integerBits(capacity.type()) == 0 ? 0 : capacity.asUnsigned();
    }
    node.path = std::move(element.object.path);
    return node;
}

/// Firmware of a port is its controller's.
void addWaitingFirmware(HostNode& node, const Element& port)
{
    std::vector<const Object*> software;
    for (const Part& controller : port.parts)
        for (const Part& part : controller.element->parts)
            software.push_back(&part.element->object);
    if (const std::string version = waitingFirmware(software); !version.empty())
        node.problems.push_back({"FIRMWARE " + oneLine(version) + " WAITS FOR A RESET"});
}

/// Makes the nodes of elements, each once: the first way that leads to an element is that on which it is shown.
class TreeMaker
{
public:
    explicit TreeMaker(HostGraph& graph) : _graph(graph) {}

    HostNode tree()
    {
        HostNode root = describe(_graph.host(), "");
        if (root.name.empty())
            root.name = "(none that an adapter belongs to)";
        addParts(root, _graph.host());
        // What nothing leads to stands directly under the host; containers come first and take their contents along.
        for (const KindRow& kind : kinds())
            for (Element& element : _graph.elements())
                if (element.kind == &kind && &element != &_graph.host())
                    add(root, element, "");
        std::ranges::stable_sort(root.children, {}, [](const HostNode& node) { return &kindNamed(node.kind); });
        return root;
    }

private:
    void add(HostNode& parent, Element& element, const char* association)
    {
        if (!_shown.insert(&element).second)
            return;
        if (element.kind->appears == Appears::through)
            return addParts(parent, element);
        HostNode node = describe(element, association);
        if (node.kind == portKind)
            addWaitingFirmware(node, element);
        addParts(node, element);
        if (element.kind->appears == Appears::summed)
            node.facts.push_back({"contents", unitsText(node), inLine | pictured});
        parent.count(node);
        parent.children.push_back(std::move(node));
    }

    void addParts(HostNode& node, const Element& element)
    {
        for (const Part& part : element.parts)
            add(node, *part.element, part.association);
    }

    HostGraph& _graph;
    std::set<const Element*> _shown;
};

std::string contentsText(const std::deque<Element>& elements)
{
    std::map<const KindRow*, std::size_t> counts; // in the order of the table
    for (const KindRow& kind : kinds())
        if (kind.className && kind.appears != Appears::through)
            counts[&kind] = 0;
    for (const Element& element : elements)
        if (const auto count = counts.find(element.kind); count != counts.end())
            ++count->second;
    std::string text;
    for (const auto& [kind, count] : counts)
        if (count > 0)
            text += (text.empty() ? "" : ", ") + countText(count, inSentence(kind->name).c_str(), kind->plural);
    return text.empty() ? "nothing" : text;
}

void collectProblems(const HostNode& node, std::vector<HostFact>& facts)
{
    for (const Problem& problem : node.problems)
        facts.push_back({"attention", node.kind + " " + node.name + ": " + problem.text, isProblem});
    for (const HostNode& child : node.children)
        collectProblems(child, facts);
}

// --- many of one sort ---------------------------------------------------------------------------------------------

bool isTarget(const HostNode& node)
{
    return node.kind == targetKind;
}

bool isUnit(const HostNode& node)
{
    return node.isUnit;
}

/// Puts one node in the place of those of a sort, where they are too many. Whether it did.
bool fold(HostNode& node, bool (*isOfSort)(const HostNode&), std::size_t limit, const char* sort)
{
    std::vector<HostNode>& children = node.children;
    const auto first = std::ranges::find_if(children, isOfSort);
    const auto count = static_cast<std::size_t>(std::ranges::count_if(children, isOfSort));
    if (count <= limit)
        return false;
    const std::ptrdiff_t place = first - children.begin();
    HostNode sum{sort, std::to_string(count)};
    for (const HostNode& child : children)
        if (isOfSort(child))
            sum.count(child);
    sum.facts.push_back({"contents", unitsText(sum), inLine});
    children.erase(std::remove_if(first + 1, children.end(), isOfSort), children.end());
    if (isTarget(node)) // which has the sum in its own line
        children.erase(children.begin() + place);
    else
        children[static_cast<std::size_t>(place)] = std::move(sum);
    return true;
}

bool foldBelow(HostNode& node)
{
    bool folded = fold(node, isTarget, listedTargets, "Targets");
    folded = fold(node, isUnit, listedUnits, "Units") || folded;
    for (HostNode& child : node.children)
        folded = foldBelow(child) || folded;
    return folded;
}

// --- printing ---------------------------------------------------------------------------------------------------

class TreePrinter
{
public:
    TreePrinter(std::ostream& out, bool colour) : _out(out), _colour(colour) {}

    /// `first` in front of the node's own line, `rest` in front of all that follows it.
    void print(const HostNode& node, const std::string& first, const std::string& rest)
    {
        _out << first << node.kind << "  " << node.name;
        for (const Problem& problem : node.problems)
            _out << "  " << warning(problem.text);
        std::string line;
        for (const std::string& text : factTexts(node, inLine))
            line += (line.empty() ? "  " : ", ") + text;
        _out << line << '\n';
        printFacts(node, rest + (node.children.empty() ? "    " : "│   "));
        for (const HostNode& child : node.children)
        {
            const bool last = &child == &node.children.back();
            print(child, rest + (last ? "└── " : "├── "), rest + (last ? "    " : "│   "));
        }
    }

private:
    void printFacts(const HostNode& node, const std::string& stem)
    {
        std::size_t width = 0;
        for (const HostFact& fact : node.facts)
            if (!(fact.place & inLine))
                width = std::max(width, fact.label.size());
        for (const HostFact& fact : node.facts)
            if (!(fact.place & inLine))
                _out << stem << padded(fact.label, width) << "  "
                     << (fact.place & isProblem ? warning(fact.text) : fact.text) << '\n';
    }

    std::string warning(const std::string& text) const { return _colour ? "\x1b[1;31m" + text + "\x1b[0m" : text; }

    std::ostream& _out;
    bool _colour;
};

Json toJson(const HostNode& node)
{
    Json json{{"kind", node.kind}, {"name", node.name}};
    if (!node.association.empty())
        json["association"] = node.association;
    for (const HostFact& fact : node.facts)
    {
        if (fact.place & isProblem)
            json[fact.label].push_back(fact.text);
        else
            json["facts"][fact.label] = fact.text;
    }
    for (const Problem& problem : node.problems)
        json["problems"].push_back(problem.text);
    for (const HostNode& child : node.children)
        json["parts"].push_back(toJson(child));
    return json;
}

} // namespace

HostReport::HostReport(Broker& broker, const std::string& nameSpace)
{
    HostGraph graph(broker, nameSpace);
    _root = TreeMaker(graph).tree();
    _root.facts.push_back({"contents", contentsText(graph.elements())});
    _failures = graph.failures();
    for (const std::string& failure : _failures)
        _root.facts.push_back({"attention", failure, isProblem});
    for (const HostNode& child : _root.children)
        collectProblems(child, _root.facts);
}

void HostReport::print(std::ostream& out, const TreeStyle& style) const
{
    if (style.all)
        return printTree(out, _root, style.colour);
    HostNode folded = _root;
    const bool hasFolded = foldBelow(folded);
    printTree(out, folded, style.colour);
    if (hasFolded)
        out << "(--all lists each target and unit)\n";
}

Json HostReport::json() const
{
    return toJson(_root);
}

void printTree(std::ostream& out, const HostNode& root, bool colour)
{
    TreePrinter(out, colour).print(root, "", "");
}

std::string unitsText(const HostNode& node)
{
    return countText(node.units, "unit", "units") + (node.bytes ? ", " + sizeText(node.bytes) : "");
}

std::vector<std::string> factTexts(const HostNode& node, Place place)
{
    std::vector<std::string> texts;
    const auto isSaid = [&](const std::string& text) {
        return std::ranges::any_of(node.problems, [&](const Problem& problem) { return sameName(problem.text, text); });
    };
    for (const HostFact& fact : node.facts)
        if (fact.place & place && !isSaid(fact.text))
            texts.push_back((fact.place & labelled ? fact.label + " " : "") + fact.text);
    return texts;
}

} // namespace broker
