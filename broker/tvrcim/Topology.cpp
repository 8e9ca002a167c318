#include "broker/tvrcim/Topology.h"

#include "broker/host/ReadableText.h"
#include "broker/tvrcim/Printing.h"

#include <algorithm>
#include <iterator>
#include <map>
#include <set>
#include <vector>

namespace tvrcim
{

using namespace broker;

namespace
{

/// More of one sort than that become one box, so that the picture can be read.
constexpr std::size_t drawnTargets = 8; ///< of a port
constexpr std::size_t drawnUnits = 4;   ///< of a target

constexpr std::size_t lineLength = 36;

struct StyleRow
{
    const char* kind;
    const char* shape;
    const char* fill;
};

/// Kinds that are drawn; what is inside the others is drawn as if it were inside what these are in.
constexpr StyleRow styles[] = {
    {hostKind, "box", "#d9dee8"},       {"Card", "box", "#cfe2f3"},     {"FC port", "box", "#d9ead3"},
    {"Virtual port", "box", "#e8f4e4"}, {targetKind, "box", "#fff2cc"},
};
constexpr StyleRow unitStyle = {"", "cylinder", "#f3e6d8"};
constexpr StyleRow foldedUnits = {"", "box3d", "#f3e6d8"};
constexpr StyleRow foldedTargets = {"", "box3d", "#fff2cc"};
constexpr const char* wrong = "#f4b6b6"; ///< fill of what has a problem

const StyleRow* styleOf(const HostNode& node)
{
    const auto* row = std::ranges::find(styles, node.kind, &StyleRow::kind);
    return row == std::end(styles) ? nullptr : row;
}

/// A text as part of a quoted label. Graphviz knows escapes by backslash and entities by ampersand.
std::string escaped(const std::string& text)
{
    std::string result;
    for (const char c : text)
    {
        if (c == '\\' || c == '"')
            result += '\\';
        result += c;
        if (c == '&')
            result += "amp;";
    }
    return result;
}

/// The texts as a label, each on a line of its own or several.
std::string quoted(const std::vector<std::string>& texts)
{
    std::string label;
    for (const std::string& text : texts)
        for (const std::string& line : lines(text, lineLength))
            label += (label.empty() ? "" : "\\n") + escaped(line);
    return "\"" + label + "\"";
}

/// The facts, as many on a line as fit.
std::vector<std::string> labelOf(const HostNode& node)
{
    std::vector<std::string> texts = {node.isUnit ? node.name : node.kind + " " + node.name};
    for (const Problem& problem : node.problems)
        texts.push_back(problem.text);
    const std::size_t heading = texts.size();
    for (const std::string& fact : factTexts(node, pictured))
    {
        if (texts.size() > heading && displayWidth(texts.back() + ", " + fact) <= lineLength)
            texts.back() += ", " + fact;
        else
            texts.push_back(fact);
    }
    return texts;
}

class Drawing
{
public:
    explicit Drawing(bool all) : _all(all) {}

    std::string of(const HostNode& host)
    {
        drawBelow(host, box(labelOf(host), *styleOf(host), false), false);
        for (const auto& [name, target] : _targets)
            drawUnits(target.units, target.id);
        return "digraph host {\n"
               "  graph [rankdir=LR, nodesep=0.15, ranksep=0.8, fontname=\"Helvetica\"]\n"
               "  node [style=filled, fontname=\"Helvetica\", fontsize=10, color=\"#667788\", margin=\"0.12,0.06\"]\n"
               "  edge [arrowhead=none, fontname=\"Helvetica\", fontsize=9, color=\"#667788\"]\n" +
               _text + columns() + "}\n";
    }

private:
    using Nodes = std::vector<const HostNode*>;

    /// A target as all ports together see it.
    struct Target
    {
        std::string id;
        Nodes units;
        std::set<std::string> identities;
    };

    /// Boxes of a kind stand below each other.
    std::string columns() const
    {
        std::string text;
        for (const auto& [kind, ids] : _columns)
        {
            text += "  {rank=same";
            for (const std::string& id : ids)
                text += "; " + id;
            text += "}\n";
        }
        return text;
    }

    std::string box(const std::vector<std::string>& texts, const StyleRow& style, bool isWrong)
    {
        const std::string id = "n" + std::to_string(_boxes++);
        _text += "  " + id + " [shape=" + style.shape + ", fillcolor=\"" + (isWrong ? wrong : style.fill) +
                 "\", label=" + quoted(texts) + "]\n";
        return id;
    }

    void line(const std::string& from, const std::string& to, const std::string& attributes = "")
    {
        _text += "  " + from + " -> " + to + (attributes.empty() ? "" : " [" + attributes + "]") + "\n";
    }

    /// What is inside the node hangs on the box with this id.
    void drawBelow(const HostNode& node, const std::string& id, bool isWrong)
    {
        Nodes targets;
        Nodes units; // which no target has
        for (const HostNode& child : node.children)
        {
            if (child.kind == targetKind)
                targets.push_back(&child);
            else if (child.isUnit)
                units.push_back(&child);
            else
                drawInside(child, id, isWrong);
        }
        drawTargets(targets, id, isWrong);
        drawUnits(units, id);
    }

    void drawInside(const HostNode& node, const std::string& parent, bool isWrong)
    {
        const StyleRow* style = styleOf(node);
        if (!style)
            return drawBelow(node, parent, isWrong);
        const bool isCritical = std::ranges::any_of(node.problems, &Problem::critical);
        const std::string id = _columns[node.kind].emplace_back(box(labelOf(node), *style, !node.problems.empty()));
        line(parent, id, edgeOf(isCritical));
        drawBelow(node, id, isCritical);
    }

    void drawTargets(const Nodes& targets, const std::string& port, bool isWrong)
    {
        if (!_all && targets.size() > drawnTargets)
        {
            const std::vector<std::string> texts = {countText(targets.size(), "target", "targets"),
                                                    unitsText(sumOf(targets))};
            line(port, _columns[targetKind].emplace_back(box(texts, foldedTargets, false)), edgeOf(isWrong));
            return;
        }
        for (const HostNode* target : targets)
            drawTarget(*target, port, isWrong);
    }

    void drawTarget(const HostNode& node, const std::string& port, bool isWrong)
    {
        Target& target = _targets[node.name];
        if (target.id.empty())
            target.id = _columns[node.kind].emplace_back(box({node.kind + " " + node.name}, *styleOf(node), false));
        for (const HostNode& unit : node.children)
            if (target.identities.insert(unit.identity).second)
                target.units.push_back(&unit);
        line(port, target.id, edgeOf(isWrong, countText(node.units, "unit", "units")));
    }

    void drawUnits(const Nodes& units, const std::string& id)
    {
        if (!_all && units.size() > drawnUnits)
            return line(id, box(kindsOf(units), foldedUnits, false));
        for (const HostNode* unit : units)
            line(id, box(labelOf(*unit), unitStyle, false));
    }

    static std::string edgeOf(bool isWrong, const std::string& label = "")
    {
        std::string attributes = isWrong ? "style=dashed, color=\"#cc0000\"" : "";
        if (!label.empty())
            attributes += (attributes.empty() ? "" : ", ") + ("label=" + quoted({label}));
        return attributes;
    }

    static HostNode sumOf(const Nodes& nodes)
    {
        HostNode sum;
        for (const HostNode* node : nodes)
            sum.count(*node);
        return sum;
    }

    static std::vector<std::string> kindsOf(const Nodes& units)
    {
        std::map<std::string, std::size_t> counts;
        for (const HostNode* unit : units)
            ++counts[unit->kind];
        std::vector<std::string> texts = {unitsText(sumOf(units))};
        for (const auto& [kind, count] : counts)
            texts.push_back(countText(count, inSentence(kind).c_str(), kindNamed(kind).plural));
        return texts;
    }

    bool _all;
    std::string _text;
    std::size_t _boxes = 0;
    std::map<std::string, Target> _targets;
    std::map<std::string, std::vector<std::string>> _columns; ///< ids by kind
};

} // namespace

std::string topologyDot(const HostNode& host, bool all)
{
    return Drawing(all).of(host);
}

} // namespace tvrcim
