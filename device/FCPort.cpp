#include "device/FCPort.h"

#include "device/Adapter.h"
#include "device/AttributeBlock.h"
#include "device/ForeignText.h"
#include "device/HbaAdapter.h"
#include "device/TargetMapping.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <exception>

namespace cimple
{

namespace
{

/// A library that reports stale data for ever must not hold the refresh for ever; a working one needs one try.
constexpr unsigned maxRefreshes = 1000;

template <std::size_t Size> std::array<std::uint8_t, Size> bytesOf(const HBA_UINT8 (&bits)[Size])
{
    std::array<std::uint8_t, Size> out;
    std::copy_n(bits, Size, out.begin());
    return out;
}

struct CounterRow
{
    std::uint32_t id;
    std::uint64_t FCPortStatistics::*field;
};

constexpr CounterRow counterRows[] = {
    {RM_PS_SECONDS_SINCE_LAST_RESET, &FCPortStatistics::secondsSinceLastReset},
    {RM_PS_TX_BYTES, &FCPortStatistics::txBytes},
    {RM_PS_RX_BYTES, &FCPortStatistics::rxBytes},
    {RM_PS_TX_SEQUENCES, &FCPortStatistics::txSequences},
    {RM_PS_RX_SEQUENCES, &FCPortStatistics::rxSequences},
    {RM_PS_TX_FRAMES, &FCPortStatistics::txFrames},
    {RM_PS_RX_FRAMES, &FCPortStatistics::rxFrames},
    {RM_PS_TX_WORDS, &FCPortStatistics::txWords},
    {RM_PS_RX_WORDS, &FCPortStatistics::rxWords},
    {RM_PS_LIP_COUNT, &FCPortStatistics::lipCount},
    {RM_PS_NOS_COUNT, &FCPortStatistics::nosCount},
    {RM_PS_ERROR_FRAMES, &FCPortStatistics::errorFrames},
    {RM_PS_DUMPED_FRAMES, &FCPortStatistics::dumpedFrames},
    {RM_PS_LINK_FAILURES, &FCPortStatistics::linkFailures},
    {RM_PS_LOSS_OF_SYNC, &FCPortStatistics::lossOfSync},
    {RM_PS_LOSS_OF_SIGNAL, &FCPortStatistics::lossOfSignal},
    {RM_PS_PRIMITIVE_SEQUENCE_ERRORS, &FCPortStatistics::primitiveSequenceErrors},
    {RM_PS_INVALID_TX_WORDS, &FCPortStatistics::invalidTxWords},
    {RM_PS_INVALID_CRCS, &FCPortStatistics::invalidCrcs},
    {RM_PS_ADDRESS_ERRORS, &FCPortStatistics::addressErrors},
    {RM_PS_PORT_BUSY_FRAMES, &FCPortStatistics::portBusyFrames},
    {RM_PS_FABRIC_BUSY_FRAMES, &FCPortStatistics::fabricBusyFrames},
    {RM_PS_LINK_RESETS_RECEIVED, &FCPortStatistics::linkResetsReceived},
    {RM_PS_LINK_RESETS_TRANSMITTED, &FCPortStatistics::linkResetsTransmitted},
    {RM_PS_DELIMITER_ERRORS, &FCPortStatistics::delimiterErrors},
};

} // namespace

FCPortAttributes::FCPortAttributes(const std::string& adapterName, std::uint32_t portIndex)
{
    HBA_PORTATTRIBUTES record;
    HBA_STATUS status;
    {
        const HbaAdapter adapter(adapterName);
        status = readPortAttributes(adapter, portIndex, record, maxRefreshes);
    }
    if (status != HBA_STATUS_OK)
    {
        TVR_LOG(TVR_ERR, "(portIndex=%d) failed with hbaStatus %d", portIndex, status);
        throw std::exception();
    }
    copyFields(record);
    TVR_LOG(TVR_DBG, "Port's WWPN: %s", portWWN.c_str());
    readRmAttributes();
}

void FCPortAttributes::copyFields(const HBA_PORTATTRIBUTES& record)
{
    nodeWWN = wwnText(record.NodeWWN);
    portWWN = wwnText(record.PortWWN);
    portFcId = record.PortFcId;
    portType = record.PortType;
    portState = record.PortState;
    supportedClassOfService = record.PortSupportedClassofService;
    supportedFc4Types = bytesOf(record.PortSupportedFc4Types.bits);
    activeFc4Types = bytesOf(record.PortActiveFc4Types.bits);
    symbolicName = foreignText(record.PortSymbolicName);
    osDeviceName = foreignText(record.OSDeviceName);
    supportedSpeed = record.PortSupportedSpeed;
    speed = record.PortSpeed;
    maxFrameSize = record.PortMaxFrameSize;
    fabricName = wwnText(record.FabricName);
    numberOfDiscoveredPorts = record.NumberofDiscoveredPorts;
}

void FCPortAttributes::readRmAttributes()
{
    AttributeBlock block(RM_PORT_ATTRIBUTES_SIZE);
    if (const RM_STATUS status = block.fetch(LRM_GetPortAttributes, wwnOf(portWWN)); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "RM_GetPortAttributes call failed (%d)\n", status);
        throw std::exception();
    }
    readPortNumber(block, RM_PA_PORT_STATE, "_PortState", portState);
    TVR_LOG(TVR_DBG, "Physical port state for FC Port: %d", portState);
    readPortNumber(block, RM_PA_FEC_STATE, "_FECState", fecState);
    TVR_LOG(TVR_DBG, "FEC state for FC Port: %d", fecState);
}

FCPortStatistics::FCPortStatistics(const std::string& wwpn)
{
    AttributeBlock block(RM_PORT_STATISTICS_SIZE);
    if (const RM_STATUS status = block.fetch(LRM_GetPortStatistics, wwnOf(wwpn)); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "ERROR: RM_GetPortStatistics call failed (%d)", status);
        throw std::exception();
    }
    for (const CounterRow& row : counterRows)
    {
        std::uint64_t value = 0;
        // All ones in either form says that the library does not count this.
        if (block.counter(row.id, value) == RM_OK && ((value >> 32) & value & 0xFFFFFFFF) != 0xFFFFFFFF)
            this->*row.field = value;
    }
}

FCPort::FCPort(Adapter& owner, std::uint32_t index)
{
    auto facts = std::make_unique<FCPortAttributes>(owner.name, index);
    name = facts->portWWN;
    nodeName = facts->nodeWWN;
    portIndex = index;
    adapter = &owner;
    attributes = std::move(facts);
}

FCPort::~FCPort()
{
    TVR_LOG(TVR_DBG, "~FCPort");
}

bool FCPort::updateStatistics()
{
    try
    {
        statistics = std::make_unique<FCPortStatistics>(name);
        return true;
    }
    catch (...)
    {
        TVR_LOG(TVR_DBG, "FC Port statistics error occurred,retain the old statistics !!!");
        return false;
    }
}

void FCPort::rescanTargets(Adapter& owner)
{
    TVR_LOG(TVR_DBG, "FCPort::rescanTargets");
    freeTargets();
    const HbaAdapter hba(owner.name);
    const TargetMapping mapping(hba);
    targets.reserve(mapping.entries().size());
    for (const HBA_FCPSCSIENTRY& entry : mapping.entries())
        try
        {
            targets.push_back(new Target(owner.name, entry));
        }
        catch (...)
        {
            note_missing_memory();
            TVR_LOG(TVR_ERR, "target creation failed - moving to the next target");
        }
}

} // namespace cimple
