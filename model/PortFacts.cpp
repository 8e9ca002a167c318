#include "model/PortFacts.h"

#include "agent/Build.h"
#include "agent/RefreshContext.h"
#include "device/TVR_MethodWrapper.h"
#include "model/PortValues.h"
#include "runtime/base/Time.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_FCPortStatistics.h"

namespace cimple
{

namespace
{

struct CounterRow
{
    std::uint64_t FCPortStatistics::*counter;
    Property<std::uint64_t> TVRHBA_FCPortStatistics::*property;
};

/// Frames are the packets of a network port. Sequences have no property in the class.
constexpr CounterRow counters[] = {
    {&FCPortStatistics::txFrames, &TVRHBA_FCPortStatistics::PacketsTransmitted},
    {&FCPortStatistics::rxFrames, &TVRHBA_FCPortStatistics::PacketsReceived},
    {&FCPortStatistics::lipCount, &TVRHBA_FCPortStatistics::LIPCount},
    {&FCPortStatistics::nosCount, &TVRHBA_FCPortStatistics::NOSCount},
    {&FCPortStatistics::errorFrames, &TVRHBA_FCPortStatistics::ErrorFrames},
    {&FCPortStatistics::dumpedFrames, &TVRHBA_FCPortStatistics::DumpedFrames},
    {&FCPortStatistics::linkFailures, &TVRHBA_FCPortStatistics::LinkFailures},
    {&FCPortStatistics::lossOfSync, &TVRHBA_FCPortStatistics::LossOfSyncCounter},
    {&FCPortStatistics::lossOfSignal, &TVRHBA_FCPortStatistics::LossOfSignalCounter},
    {&FCPortStatistics::primitiveSequenceErrors, &TVRHBA_FCPortStatistics::PrimitiveSeqProtocolErrCount},
    {&FCPortStatistics::invalidTxWords, &TVRHBA_FCPortStatistics::InvalidTransmissionWords},
    {&FCPortStatistics::invalidCrcs, &TVRHBA_FCPortStatistics::CRCErrors},
    {&FCPortStatistics::fabricBusyFrames, &TVRHBA_FCPortStatistics::FBSYFrames},
    {&FCPortStatistics::portBusyFrames, &TVRHBA_FCPortStatistics::PBSYFrames},
    {&FCPortStatistics::linkResetsTransmitted, &TVRHBA_FCPortStatistics::LinkResetsTransmitted},
    {&FCPortStatistics::linkResetsReceived, &TVRHBA_FCPortStatistics::LinkResetsReceived},
    {&FCPortStatistics::addressErrors, &TVRHBA_FCPortStatistics::AddressErrors},
    {&FCPortStatistics::delimiterErrors, &TVRHBA_FCPortStatistics::DelimiterErrors},
};

void setCounter(Property<std::uint64_t>& property, std::uint64_t value)
{
    if (value == FCPortStatistics::notReported)
        property.set_null();
    else
        property.set(value);
}

/// Bytes, or the words of 4 bytes (FC-FS) of a port that counts these alone.
std::uint64_t bytesOf(std::uint64_t bytes, std::uint64_t words)
{
    const bool wordsAlone = bytes == FCPortStatistics::notReported && words != FCPortStatistics::notReported;
    return wordsAlone ? 4 * words : bytes;
}

/// When the values were read, and since when they count.
void setTimes(TVRHBA_FCPortStatistics& instance, std::uint64_t secondsSinceLastReset)
{
    constexpr std::uint64_t second = 1'000'000;
    const std::uint64_t now = Time::now();
    instance.StatisticTime.set(Datetime::timestamp(now, 0));
    if (secondsSinceLastReset == FCPortStatistics::notReported || secondsSinceLastReset > now / second)
        instance.StartStatisticTime.set_null();
    else
        instance.StartStatisticTime.set(Datetime::timestamp(now - secondsSinceLastReset * second, 0));
}

/// Adds one value and its description.
void identify(TVRHBA_FCPort& instance, const String& value, const String& description)
{
    instance.OtherIdentifyingInfo.value.append(value);
    instance.IdentifyingDescriptions.value.append(description);
}

} // namespace

void setPortIdentifiers(TVRHBA_FCPort& instance, const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    instance.OtherIdentifyingInfo.null = 0;
    instance.IdentifyingDescriptions.null = 0;
    for (const VpdField& field : port.vpd)
        identify(instance, field.value, vpdName(field.keyword));
    identify(instance, port.port.getAttributes()->osDeviceName, "OS Device Name");
    identify(instance, adapter.ieeeAddress, "TAVRIN:IEEE_ADDRESS");
    // A chip is told apart by the same text.
    identify(instance, port.chip->Tag.value, "SerialNumber + Sub-AdapterID");
    identify(instance, port.port.nodeName, "NodeWWN");
    identify(instance, adapter.nodeSymbolicName, "NodeSymbolicName");
}

void setPortFacts(TVRHBA_FCPort& instance, const FCPortAttributes& facts)
{
    const ValueText type = portType(facts.portType);
    const ValueText status = portStatus(facts.portState);
    const Array<std::uint16_t> classes = classesOfService(facts.supportedClassOfService);
    // The active types follow the supported ones; ActiveFC4Types stays null.
    Array<std::uint16_t> fc4Types;
    appendFc4Types(facts.supportedFc4Types, fc4Types);
    appendFc4Types(facts.activeFc4Types, fc4Types);
    instance.ElementName.set(facts.symbolicName);
    instance.FCID.set(facts.portFcId);
    instance.NumberOfDiscoveredPorts.set(facts.numberOfDiscoveredPorts);
    instance.FabricName.set(facts.fabricName);
    instance.PortType.set(type.value);
    instance.OtherPortType.set(type.text);
    instance.OperationalStatus.set({status.value});
    instance.StatusDescriptions.set({status.text});
    instance.SupportedCOS.set(classes);
    instance.ActiveCOS.set(classes);
    instance.SupportedFC4Types.set(fc4Types);
    instance.Speed.set(portSpeed(facts.speed));
    instance.MaxSpeed.set(fastestSpeed(facts.supportedSpeed));
    instance.SupportedMaximumTransmissionUnit.set(facts.maxFrameSize);
    instance.ActiveMaximumTransmissionUnit.set(facts.maxFrameSize);
    instance.FECState.set(static_cast<std::uint8_t>(facts.fecState));
}

void setBeacon(TVRHBA_FCPort& instance)
{
    std::uint16_t state = 0;
    if (TVR_MethodWrapper::GetBeaconState(instance.DeviceID.value.c_str(), &state) == 0)
        instance.LocationIndicator.set(state);
}

void setCounters(TVRHBA_FCPortStatistics& instance, const FCPortStatistics& values)
{
    setTimes(instance, values.secondsSinceLastReset);
    setCounter(instance.BytesTransmitted, bytesOf(values.txBytes, values.txWords));
    setCounter(instance.BytesReceived, bytesOf(values.rxBytes, values.rxWords));
    for (const CounterRow& row : counters)
        setCounter(instance.*row.property, values.*row.counter);
}

} // namespace cimple
