// The host and its adapters as a tree: what contains what, by the associations that the provider serves.
#pragma once

#include "broker/core/Broker.h"
#include "broker/host/HostKinds.h"
#include "broker/values/Json.h"

#include <cstdint>
#include <ostream>
#include <string>
#include <vector>

namespace broker
{

struct HostFact
{
    std::string label;
    std::string text;
    unsigned place = below;
};

/// An element of the host.
struct HostNode
{
    std::string kind; ///< "Card", "Chip", ...
    std::string name;
    std::string association = {}; ///< class of the association that leads here from the parent
    std::vector<HostFact> facts = {};
    std::vector<Problem> problems = {};
    std::vector<HostNode> children = {};
    std::string identity = {}; ///< of a unit: what it has in common with itself behind another port
    bool isUnit = false;
    Path path = {};          ///< without a class for what no instance stands for
    std::uint64_t units = 0; ///< at it and below
    std::uint64_t bytes = 0; ///< what these hold

    void count(const HostNode& part)
    {
        units += part.units;
        bytes += part.bytes;
    }
};

/// How a tree is printed.
struct TreeStyle
{
    bool colour = false;
    bool all = false; ///< each target and unit, not their numbers where they are many
};

class HostReport
{
public:
    /// Asks the broker. Throws CimError when it answers nothing.
    HostReport(Broker& broker, const std::string& nameSpace);

    const HostNode& root() const { return _root; }
    /// Classes that could not be enumerated, with a CIM status each.
    const std::vector<std::string>& failures() const { return _failures; }
    void print(std::ostream& out, const TreeStyle& style) const;
    Json json() const;

private:
    HostNode _root;
    std::vector<std::string> _failures;
};

/// A node with its facts in aligned columns and its children as branches.
void printTree(std::ostream& out, const HostNode& root, bool colour = false);

/// Targets of a port, and units of a target, that are listed; more than that are counted.
inline constexpr std::size_t listedTargets = 64;
inline constexpr std::size_t listedUnits = 8;

/// "2 units, 600 GiB"
std::string unitsText(const HostNode& node);
/// The facts at a place, with their labels where these belong to them; not what a problem says already.
std::vector<std::string> factTexts(const HostNode& node, Place place);

} // namespace broker
