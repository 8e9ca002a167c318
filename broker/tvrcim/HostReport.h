// The host and its adapters as a tree: what contains what, by the associations that the provider serves.
#pragma once

#include "broker/core/Broker.h"
#include "broker/values/Json.h"

#include <ostream>
#include <string>
#include <utility>
#include <vector>

namespace tvrcim
{

/// An element of the host.
struct HostNode
{
    std::string kind; ///< "Card", "Chip", ...
    std::string name;
    std::string association; ///< class of the association that leads here from the parent
    std::vector<std::pair<std::string, std::string>> facts = {};
    std::vector<HostNode> children = {};
};

class HostReport
{
public:
    /// Asks the broker. Throws CimError when an enumeration fails.
    HostReport(broker::Broker& broker, const std::string& nameSpace);

    const HostNode& root() const { return _root; }
    void print(std::ostream& out) const;
    broker::Json json() const;

private:
    HostNode _root;
};

/// A node with its facts in aligned columns and its children as branches.
void printTree(std::ostream& out, const HostNode& root);

} // namespace tvrcim
