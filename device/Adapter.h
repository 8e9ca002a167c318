// An adapter of the device model, whatever its technology.
#pragma once

#include "device/Port.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace cimple
{

class AdapterAttributes
{
public:
    virtual ~AdapterAttributes() = default;
};

class AdapterStatistics
{
public:
    virtual ~AdapterStatistics() = default;
};

/// Owns its attributes, statistics and ports.
class Adapter
{
public:
    Adapter(const Adapter&) = delete;
    Adapter& operator=(const Adapter&) = delete;
    virtual ~Adapter();

    static constexpr std::uint32_t fibreChannel = 1; ///< a value of adapterType

    virtual const std::string& getName() const = 0;
    /// Index in the HBA API.
    virtual const std::uint32_t& getAdapterNumber() const = 0;
    virtual const std::uint32_t& getFunctionType() const = 0;
    virtual AdapterAttributes* getAttributes() const = 0;
    virtual AdapterStatistics* getStatistics() const = 0;
    virtual unsigned getPortCount() const = 0;
    virtual std::vector<Port*>& getPorts() = 0;
    /// Throws std::out_of_range.
    virtual Port* getPort(unsigned index) const = 0;
    /// Replaces the targets of every port; a port that fails is passed over.
    virtual void rescanTargets() = 0;

    std::unique_ptr<AdapterAttributes> attributes;
    std::unique_ptr<AdapterStatistics> statistics;
    std::vector<Port*> ports; ///< owned
    std::string name;
    std::uint32_t adapterNumber;
    std::uint32_t functionType = 0;
    std::uint32_t adapterType;

protected:
    Adapter(const std::string& adapterName, std::uint32_t number, std::uint32_t type);
};

} // namespace cimple
