// A Fibre Channel port.
#pragma once

#include "device/Port.h"
#include "device/RmApi.h"

#include <array>

namespace cimple
{

/// Port facts, from the HBA API and the RM library. The constructor throws std::exception if either refuses.
class FCPortAttributes : public PortAttributes
{
public:
    FCPortAttributes(const std::string& adapterName, std::uint32_t portIndex);

    std::string nodeWWN; ///< 16 upper-case hexadecimal digits, as the other names
    std::string portWWN;
    std::uint32_t portFcId = 0;
    std::uint32_t portType = 1;  ///< the HBA API's number; 1 is unknown
    std::uint32_t portState = 1; ///< physical port state, or the HBA API's if the RM library does not give it
    std::uint32_t supportedClassOfService = 0;
    std::array<std::uint8_t, 32> supportedFc4Types{};
    std::array<std::uint8_t, 32> activeFc4Types{};
    std::string symbolicName;
    std::string osDeviceName;
    std::uint32_t supportedSpeed = 0;
    std::uint32_t speed = 0;
    std::uint32_t maxFrameSize = 0;
    std::string fabricName;
    std::uint32_t numberOfDiscoveredPorts = 0;
    std::uint32_t fecState = 2;

private:
    void copyFields(const HBA_PORTATTRIBUTES& record);
    void readRmAttributes();
};

/// Counters of a port. The constructor throws std::exception if the RM library refuses.
class FCPortStatistics : public PortStatistics
{
public:
    static constexpr std::uint64_t notReported = 0xFFFFFFFF;

    explicit FCPortStatistics(const std::string& wwpn);

    std::uint64_t secondsSinceLastReset = notReported;
    std::uint64_t txFrames = notReported;
    std::uint64_t txWords = notReported;
    std::uint64_t rxFrames = notReported;
    std::uint64_t rxWords = notReported;
    std::uint64_t lipCount = notReported;
    std::uint64_t nosCount = notReported;
    std::uint64_t errorFrames = notReported;
    std::uint64_t dumpedFrames = notReported;
    std::uint64_t linkFailures = notReported;
    std::uint64_t lossOfSync = notReported;
    std::uint64_t lossOfSignal = notReported;
    std::uint64_t primitiveSequenceErrors = notReported;
    std::uint64_t invalidTxWords = notReported;
    std::uint64_t invalidCrcs = notReported;
    std::uint64_t txSequences = notReported;
    std::uint64_t rxSequences = notReported;
    std::uint64_t txBytes = notReported;
    std::uint64_t rxBytes = notReported;
    std::uint64_t fabricBusyFrames = notReported;
    std::uint64_t portBusyFrames = notReported;
    std::uint64_t linkResetsTransmitted = notReported;
    std::uint64_t addressErrors = notReported;
    std::uint64_t linkResetsReceived = notReported;
    std::uint64_t delimiterErrors = notReported;
};

class FCPort : public Port
{
public:
    /// Throws std::exception if the port's attributes cannot be read. `owner` outlives the port.
    FCPort(Adapter& owner, std::uint32_t index);
    ~FCPort() override;
    FCPortAttributes* getAttributes() const override { return static_cast<FCPortAttributes*>(attributes.get()); }
    FCPortStatistics* getStatistics() const { return static_cast<FCPortStatistics*>(statistics.get()); }
    bool updateStatistics() override;
    Adapter* getAdapter() const override { return adapter; }
    void rescanTargets(Adapter& owner) override;
    std::vector<Target*>& getTargets() override { return targets; }
    Target* getTarget(unsigned index) const override { return targets.at(index); }
    unsigned getTargetCount() const override { return static_cast<unsigned>(targets.size()); }
};

} // namespace cimple
