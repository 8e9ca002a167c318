// A port of an adapter of the device model, whatever its technology.
#pragma once

#include "device/Target.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace cimple
{

class Adapter;

class PortAttributes
{
public:
    virtual ~PortAttributes() = default;
};

class PortStatistics
{
public:
    virtual ~PortStatistics() = default;
};

/// Owns its attributes, statistics and targets.
class Port
{
public:
    Port(const Port&) = delete;
    Port& operator=(const Port&) = delete;
    virtual ~Port();
    virtual PortAttributes* getAttributes() const = 0;
    /// Fetches new statistics. False, with the old ones kept, if the library does not give them.
    virtual bool updateStatistics() = 0;
    virtual Adapter* getAdapter() const = 0;
    /// Replaces the targets by what the adapter maps to this port. Throws std::exception if it cannot be opened.
    virtual void rescanTargets(Adapter& owner) = 0;
    virtual std::vector<Target*>& getTargets() = 0;
    /// Throws std::out_of_range.
    virtual Target* getTarget(unsigned index) const = 0;
    virtual unsigned getTargetCount() const = 0;

    std::string name; ///< WWPN, 16 upper-case hexadecimal digits
    std::uint32_t portIndex = 0;
    std::unique_ptr<PortAttributes> attributes;
    std::unique_ptr<PortStatistics> statistics; ///< null until fetched
    std::vector<Target*> targets;               ///< owned
    Adapter* adapter = nullptr;                 ///< not owned
    std::string nodeName;                       ///< WWNN, in the form of `name`

protected:
    Port() = default;
    void freeTargets() noexcept;
};

} // namespace cimple
