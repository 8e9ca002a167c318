#include "broker/tvrcim/Topology.h"

#include "broker/tvrcim/Printing.h"
#include "broker/tvrcim/ReadableText.h"

#include <algorithm>
#include <iterator>
#include <map>
#include <set>
#include <vector>

namespace tvrcim
{

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
    if (node.isUnit)
        return &unitStyle;
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
    texts.insert(texts.end(), node.problems.begin(), node.problems.end());
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
        for (auto& [name, target] : _targets)
            drawUnits(target);
        return "digraph host {\n"
               "  graph [rankdir=LR, nodesep=0.15, ranksep=0.8, fontname=\"Helvetica\"]\n"
               "  node [style=filled, fontname=\"Helvetica\", fontsize=10, color=\"#667788\", margin=\"0.12,0.06\"]\n"
               "  edge [arrowhead=none, fontname=\"Helvetica\", fontsize=9, color=\"#667788\"]\n" +
               _text + columns() + "}\n";
    }

private:
    /// A target as all ports together see it.
    struct Target
    {
        std::string id;
        std::vector<const HostNode*> units;
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
        const auto isTarget = [](const HostNode& child) { return child.kind == targetKind; };
        const auto targets = static_cast<std::size_t>(std::ranges::count_if(node.children, isTarget));
        const bool folds = !_all && targets > drawnTargets;
        if (folds)
            line(id, _columns[targetKind].emplace_back(box(sumOf(node, targets), foldedTargets, false)),
                 edgeOf(isWrong));
        for (const HostNode& child : node.children)
        {
            if (!isTarget(child))
                drawInside(child, id, isWrong);
            else if (!folds)
                drawTarget(child, id, isWrong);
        }
    }

    void drawInside(const HostNode& node, const std::string& parent, bool isWrong)
    {
        const StyleRow* style = styleOf(node);
        if (!style)
            return drawBelow(node, parent, isWrong);
        const bool hasProblem = !node.problems.empty();
        const std::string id = _columns[node.kind].emplace_back(box(labelOf(node), *style, hasProblem));
        line(parent, id, edgeOf(hasProblem));
        drawBelow(node, id, hasProblem);
    }

    void drawTarget(const HostNode& node, const std::string& port, bool isWrong)
    {
        Target& target = _targets[node.name];
        if (target.id.empty())
            target.id = _columns[node.kind].emplace_back(
                box({node.kind + " " + node.name}, *styleOf(node), !node.problems.empty()));
        for (const HostNode& unit : node.children)
            if (target.identities.insert(unit.identity).second)
                target.units.push_back(&unit);
        line(port, target.id, edgeOf(isWrong, countText(node.units, "unit", "units")));
    }

    void drawUnits(const Target& target)
    {
        if (!_all && target.units.size() > drawnUnits)
            return line(target.id, box(sumOf(target.units), foldedUnits, false));
        for (const HostNode* unit : target.units)
            line(target.id, box(labelOf(*unit), unitStyle, !unit->problems.empty()));
    }

    static std::string edgeOf(bool isWrong, const std::string& label = "")
    {
        std::string attributes = isWrong ? "style=dashed, color=\"#cc0000\"" : "";
        if (!label.empty())
            attributes += (attributes.empty() ? "" : ", ") + ("label=" + quoted({label}));
        return attributes;
    }

    /// The targets of a port.
    static std::vector<std::string> sumOf(const HostNode& port, std::size_t targets)
    {
        HostNode sum;
        for (const HostNode& child : port.children)
            if (child.kind == targetKind)
            {
                sum.units += child.units;
                sum.bytes += child.bytes;
            }
        return {countText(targets, "target", "targets"), unitsText(sum)};
    }

    static std::vector<std::string> sumOf(const std::vector<const HostNode*>& units)
    {
        HostNode sum;
        std::map<std::string, std::size_t> counts;
        for (const HostNode* unit : units)
        {
            sum.units += unit->units;
            sum.bytes += unit->bytes;
            ++counts[unit->kind];
        }
        std::vector<std::string> texts = {unitsText(sum)};
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
