#include "broker/tvrcim/HostReport.h"

#include "broker/tvrcim/Commands.h"
#include "broker/tvrcim/Printing.h"
#include "broker/values/PathText.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <array>
#include <cstdio>
#include <map>

namespace tvrcim
{

using namespace broker;

namespace
{

enum class Show
{
    plain,
    hexadecimal,
};

/// A property that a node shows, under a label for people.
struct FactRow
{
    const char* label;
    const char* property;
    Show show = Show::plain;
};

/// How the elements of one class appear.
struct KindRow
{
    const char* className;
    const char* kind;
    const char* nameProperty;
    std::vector<FactRow> facts;
};

const std::array<KindRow, 5> kinds{{
    {"TVRHBA_Product",
     "Product",
     "Name",
     {{"description", "Description"},
      {"vendor", "Vendor"},
      {"serial number", "IdentifyingNumber"},
      {"hardware version", "Version"}}},
    {"TVRHBA_Card",
     "Card",
     "ElementName",
     {{"model", "Model"},
      {"part number", "PartNumber"},
      {"serial number", "SerialNumber"},
      {"version", "Version"},
      {"SLI mode", "SLIMode"}}},
    {"TVRHBA_Chip",
     "Chip",
     "ElementName",
     {{"tag", "Tag"},
      {"temperature", "BoardTemperature"},
      {"warning at", "ThresholdWarningTemp"},
      {"critical at", "ThresholdCriticalTemp"},
      {"unit", "TemperatureUnit"}}},
    {"TVRHBA_PhysicalConnector", "Connector", "ElementName", {{"WWPN", "Tag"}, {"port", "OtherIdentifyingInfo"}}},
    {"TVRHBA_PCIDevice",
     "PCI device",
     "DeviceID",
     {{"element", "ElementName"},
      {"bus", "BusNumber"},
      {"function", "FunctionNumber"},
      {"vendor", "VendorID", Show::hexadecimal},
      {"subsystem", "SubsystemID", Show::hexadecimal},
      {"revision", "RevisionID"}}},
}};

std::string factText(const Object& object, const FactRow& row)
{
    const Value& value = object.get(row.property);
    if (row.show == Show::hexadecimal && !value.isNull())
    {
        std::array<char, 32> text{};
        std::snprintf(text.data(), text.size(), "0x%04llX", static_cast<unsigned long long>(value.asUnsigned()));
        return text.data();
    }
    return value.isNull() ? std::string() : oneLine(valueText(value));
}

HostNode describe(const KindRow& row, const Object& object, const char* association)
{
    HostNode node{row.kind, oneLine(valueText(object.get(row.nameProperty))), association};
    for (const FactRow& fact : row.facts)
        if (std::string text = factText(object, fact); !text.empty())
            node.facts.emplace_back(fact.label, std::move(text));
    return node;
}

/// The elements of the host by class, and what the associations say about them.
class Host
{
public:
    Host(Broker& broker, const std::string& nameSpace) : _broker(broker), _nameSpace(nameSpace)
    {
        for (const KindRow& row : kinds)
            _objects[row.className] = enumerate(row.className);
    }

    std::vector<Object> enumerate(const std::string& className)
    {
        Reply reply = _broker.enumerateInstances(_nameSpace, className);
        if (!reply.ok())
            throw CimError(reply);
        return std::move(reply.objects);
    }

    const std::vector<Object>& all(const KindRow& row) const { return _objects.at(row.className); }

    /// Paths at the other end of an association.
    std::vector<Path> associated(const Path& path, const char* association)
    {
        NamesReply reply = _broker.associatorNames(path, {.assocClass = association});
        if (!reply.ok())
            throw CimError(reply);
        return std::move(reply.paths);
    }

    /// Nodes of the elements of one kind that an association joins to a path.
    std::vector<HostNode> nodes(const KindRow& row, const Path& path, const char* association,
                                std::vector<HostNode> (Host::*children)(const Object& object) = nullptr)
    {
        std::vector<HostNode> result;
        for (const Path& other : associated(path, association))
        {
            const std::vector<Object>& objects = all(row);
            const auto found = std::find_if(objects.begin(), objects.end(),
                                            [&](const Object& object) { return sameObject(object.path, other); });
            if (found == objects.end())
                continue;
            result.push_back(describe(row, *found, association));
            if (children)
                result.back().children = (this->*children)(*found);
        }
        return result;
    }

    std::vector<HostNode> connectorsOf(const Object& card)
    {
        std::vector<HostNode> result = nodes(kinds[3], card.path, "TVRHBA_CardContainsConnector");
        const std::vector<Path> paths = associated(card.path, "TVRHBA_CardContainsConnector");
        for (std::size_t i = 0; i < std::min(result.size(), paths.size()); ++i)
        {
            for (const Path& chip : associated(paths[i], "TVRHBA_ConnectorDependsOnChip"))
            {
                const Value* tag = chip.key("Tag");
                result[i].facts.emplace_back("depends on chip", tag ? valueText(*tag) : pathText(chip));
            }
        }
        return result;
    }

    std::vector<HostNode> partsOfCard(const Object& card)
    {
        std::vector<HostNode> result = nodes(kinds[2], card.path, "TVRHBA_CardContainsChip");
        std::vector<HostNode> connectors = connectorsOf(card);
        std::move(connectors.begin(), connectors.end(), std::back_inserter(result));
        return result;
    }

    std::vector<HostNode> partsOfProduct(const Object& product)
    {
        return nodes(kinds[1], product.path, "TVRHBA_ProductPhysicalComponent", &Host::partsOfCard);
    }

private:
    Broker& _broker;
    std::string _nameSpace;
    std::map<std::string, std::vector<Object>> _objects;
};

std::string keyText(const Path& path, const char* key)
{
    const Value* value = path.key(key);
    return value ? oneLine(valueText(*value)) : pathText(path);
}

/// The computer system that the PCI devices belong to, with the chassis that holds the cards.
HostNode computerSystem(Host& host)
{
    HostNode node{"Computer system", "(none that an adapter belongs to)", ""};
    for (const Object& device : host.enumerate("TVRHBA_SystemDevice"))
    {
        const Value& system = device.get("GroupComponent");
        if (system.type() == CMPI_ref && !system.isNull())
        {
            node.name = keyText(system.asPath(), "Name");
            node.facts.emplace_back("class", system.asPath().className);
            node.facts.emplace_back("namespace", system.asPath().nameSpace);
            break;
        }
    }
    for (const Object& containment : host.enumerate("TVRHBA_ChassisContainsCard"))
    {
        const Value& chassis = containment.get("GroupComponent");
        if (chassis.type() == CMPI_ref && !chassis.isNull())
        {
            node.facts.emplace_back("chassis", keyText(chassis.asPath(), "Tag"));
            break;
        }
    }
    return node;
}

std::string countText(std::size_t count, const char* singular)
{
    return std::to_string(count) + " " + singular + (count == 1 ? "" : "s");
}

/// One line of a tree: `first` in front of the node's own line, `rest` in front of all that follows it.
void printNode(std::ostream& out, const HostNode& node, const std::string& first, const std::string& rest)
{
    constexpr std::size_t associationColumn = 72;
    std::string line = first + node.kind + "  " + node.name;
    if (!node.association.empty())
        line = padded(line, associationColumn) + "  " + node.association;
    out << line << '\n';
    std::size_t width = 0;
    for (const auto& [label, text] : node.facts)
        width = std::max(width, label.size());
    const std::string stem = rest + (node.children.empty() ? "    " : "│   ");
    for (const auto& [label, text] : node.facts)
        out << stem << padded(label, width) << "  " << text << '\n';
    for (const HostNode& child : node.children)
    {
        const bool last = &child == &node.children.back();
        printNode(out, child, rest + (last ? "└── " : "├── "), rest + (last ? "    " : "│   "));
    }
}

Json toJson(const HostNode& node)
{
    Json json{{"kind", node.kind}, {"name", node.name}};
    if (!node.association.empty())
        json["association"] = node.association;
    for (const auto& [label, text] : node.facts)
        json["facts"][label] = text;
    for (const HostNode& child : node.children)
        json["parts"].push_back(toJson(child));
    return json;
}

} // namespace

HostReport::HostReport(Broker& broker, const std::string& nameSpace)
{
    Host host(broker, nameSpace);
    _root = computerSystem(host);
    std::string summary;
    for (const KindRow& row : kinds)
    {
        std::string kind = row.kind;
        std::transform(kind.begin(), kind.begin() + 1, kind.begin(),
                       [&](char c) { return kind.starts_with("PCI") ? c : static_cast<char>(std::tolower(c)); });
        summary += (summary.empty() ? "" : ", ") + countText(host.all(row).size(), kind.c_str());
    }
    _root.facts.emplace_back("contents", summary);
    for (const Object& product : host.all(kinds[0]))
    {
        _root.children.push_back(describe(kinds[0], product, ""));
        _root.children.back().children = host.partsOfProduct(product);
    }
    for (const Object& device : host.all(kinds[4]))
    {
        const bool joined = !host.associated(device.path, "TVRHBA_SystemDevice").empty();
        _root.children.push_back(describe(kinds[4], device, joined ? "TVRHBA_SystemDevice" : ""));
    }
}

void HostReport::print(std::ostream& out) const
{
    printTree(out, _root);
}

Json HostReport::json() const
{
    return toJson(_root);
}

void printTree(std::ostream& out, const HostNode& root)
{
    printNode(out, root, "", "");
}

} // namespace tvrcim
