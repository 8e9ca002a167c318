// The elements of a host and what the associations between them say. Each class is asked for once, and the ends of the
// associations are found by the texts of their paths: tens of thousands of units do not mean as many requests.
#pragma once

#include "broker/core/Broker.h"
#include "broker/host/HostKinds.h"

#include <deque>
#include <map>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

namespace broker
{

struct Element;

struct Part
{
    const char* association;
    Element* element;
};

struct Element
{
    const KindRow* kind;
    Object object;
    std::vector<Part> parts = {};
};

class HostGraph
{
public:
    /// Asks the broker. A class that cannot be enumerated is left out and told by failures(); throws CimError when that
    /// is true of all.
    HostGraph(Broker& broker, const std::string& nameSpace);
    /// Of these kinds alone, and what joins them; so the rest costs nothing.
    HostGraph(Broker& broker, const std::string& nameSpace, std::span<const std::string_view> wanted);
    HostGraph(const HostGraph&) = delete;
    HostGraph& operator=(const HostGraph&) = delete;

    /// The computer system; without a name when no adapter belongs to one.
    Element& host() { return _elements.front(); }
    /// The computer system and all others.
    std::deque<Element>& elements() { return _elements; }
    /// A class and a CIM status each.
    const std::vector<std::string>& failures() const { return _failures; }

private:
    bool answered(const std::string& className, const Outcome& outcome);
    /// Of the class of a kind, with those of all kinds of that class.
    void takeElements(const KindRow& first);
    void takeParts(const std::string& association);
    void join(const EdgeRow& row, const Path& association);
    Element* find(const Path& path) const;
    /// The target behind an initiator that an endpoint is of, new or existing.
    /// A new one has the path of this endpoint, which is of one of its units.
    Element& targetOf(Element& initiator, const char* association, const Path& endpoint);
    void nameHost(const Path& path);
    void findChassis();
    void take(std::span<const std::string_view> wanted);

    Broker& _broker;
    std::string _nameSpace;
    std::deque<Element> _elements;
    std::unordered_map<std::string, Element*> _byPath;
    std::map<std::pair<const Element*, std::string>, Element*> _targets; ///< by initiator and WWPN
    std::vector<std::string> _failures;
    std::optional<CimError> _firstFailure;
    bool _anyAnswered = false;
};

} // namespace broker
