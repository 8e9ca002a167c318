#include "model/SanModel.h"

#include "device/ForeignText.h"
#include "model/FcpEndpoint.h"
#include "model/LogicalDevices.h"
#include "runtime/base/Bulk.h"
#include "schema/TVRHBA_LocalHostedAccessPoint.h"

#include <optional>
#include <string_view>
#include <tuple>

namespace cimple
{

namespace
{

/// A text that is often the same as the last one: equal ones share their characters.
class RepeatedText
{
public:
    const String& of(std::string_view text)
    {
        if (_last.view() != text)
            _last = String(text);
        return _last;
    }

private:
    String _last;
};

Prototype<TVRHBA_SCSIProtocolEndpoint> endpointPrototype(const CIM_ComputerSystem& system)
{
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint =
        makeFcpEndpoint<TVRHBA_SCSIProtocolEndpoint>(system, EndpointRole::Target);
    endpoint->IdentifyingDescriptions.set({"OS Device Name"});
    return Prototype<TVRHBA_SCSIProtocolEndpoint>(endpoint);
}

/// What the instances of a unit take, about.
constexpr std::size_t bytesOfUnit = 2500;

std::size_t unitsOf(const Data& data)
{
    std::size_t units = 0;
    for (const Port* port : data.ports)
        units += port->getTargetCount();
    return units;
}

/// What the units of all ports have in common.
struct SanContext
{
    explicit SanContext(HostContext& host)
        : host(host), system(shared_end(host.system)), endpoint(endpointPrototype(*system)), devices(*system),
          bulk(bytesOfUnit * unitsOf(*host.agent.m_pData))
    {}
    HostContext& host;
    Ref<CIM_ComputerSystem> system;
    Prototype<TVRHBA_SCSIProtocolEndpoint> endpoint;
    DevicePrototypes devices;
    RepeatedText targetWwpn, targetWwnn, product;
    const Target* lastTarget = nullptr; ///< that an inquiry text was made of
    String inquiry;
    Bulk bulk; ///< of all that is made for the units
};

/// A port with the initiator endpoint that stands for it.
struct InitiatorPort
{
    SanContext& san;
    FCPort& port;
    Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> initiator;
};

Ref<TVRHBA_SCSIProtocolEndpoint> makeEndpoint(SanContext& san, const LogicalUnit& unit, const String& name)
{
    const Target& target = unit.target;
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint = san.endpoint.copy();
    endpoint->TargetWWPN.set(san.targetWwpn.of(target.portWWN));
    endpoint->TargetWWNN.set(san.targetWwnn.of(target.nodeWWN));
    endpoint->Description.set(unit.description);
    endpoint->ElementName.set(san.product.of(target.product));
    endpoint->Name.set(name);
    endpoint->FCID.set(target.fcId);
    endpoint->SCSIBusNumber.set(target.scsiBusNumber);
    endpoint->SCSITargetNumber.set(target.scsiTargetNumber);
    endpoint->OtherIdentifyingInfo.set({unit.osDeviceName});
    return endpoint;
}

/// The endpoint of a unit and what hosts it.
std::uint32_t createEndpoint(SanContext& san, LogicalUnit& unit, const String& name)
{
    unit.endpoint = makeEndpoint(san, unit, name);
    if (!mapOf<TVRHBA_SCSIProtocolEndpoint>(unit.agent)
             .insert(unit.endpoint, "Insert Failed : m_TVRHBA_SCSIProtocolEndpoint_map"))
        return BUILD_FAILED;
    TVR_LOG(TVR_DBG, "Generating TVRHBA_LocalHostedAccessPoint (Local Hosted Access Point %s)", name.c_str());
    using Hosted = TVRHBA_LocalHostedAccessPoint;
    const Joined hosted = insertFilled(mapOf<Hosted>(unit.agent), "Insert Failed : m_TVRHBA_LocalHostedAccessPoint_map",
                                       [&](Hosted& association)
                                       {
                                           association.Antecedent = Ref(unit.system).release();
                                           association.Dependent = Ref(unit.endpoint).release();
                                       });
    return hosted == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

std::string_view cut(const std::string& text, std::size_t size)
{
    return std::string_view(text).substr(0, size);
}

/// What the units before said of themselves often holds for the next one.
const String& inquiryText(SanContext& san, const Target& target)
{
    const auto product = [](const Target& of) { return std::tie(of.vendor, of.product, of.revision); };
    if (!san.lastTarget || product(*san.lastTarget) != product(target))
        san.inquiry =
            joinTexts({cut(target.vendor, 8), " ", cut(target.product, 16), " Revision ", cut(target.revision, 4)});
    return san.inquiry;
}

/// Notes a pair of ports. The units of a target follow each other.
void noteRemotePort(SanContext& san, const std::string& wwpn, const Target& target, unsigned index)
{
    if (index == 0 || san.lastTarget->portWWN != target.portWWN)
        san.host.remotePorts.insert(wwpn + "|" + target.portWWN);
}

std::uint32_t createLogicalUnit(const InitiatorPort& on, unsigned index)
{
    SanContext& san = on.san;
    const Target& target = *on.port.getTarget(index);
    const std::string& wwpn = on.port.name;
    char lun[17];
    lunToText(target.fcpLun, lun);
    noteRemotePort(san, wwpn, target, index);
    LogicalUnit unit{san.host.agent, san.devices, target, san.system, on.initiator, inquiryText(san, target)};
    san.lastTarget = &target;
    unit.description = joinTexts({unit.inquiry.view(), " Serial Number ", cut(target.serialNumber, 40)});
    unit.osDeviceName = target.osDeviceName;
    const String name = joinTexts({wwpn, ":", target.portWWN, ":", lun});
    if (const std::uint32_t status = createEndpoint(san, unit, name); status != BUILD_DONE)
        return status;
    TVR_LOG(TVR_DBG, "Target %d is of type %d.", static_cast<int>(index), static_cast<int>(target.deviceType));
    descriptorToString(unit.identifier, &target.designator);
    unit.deviceId = joinTexts({wwpn, "_", target.portWWN, "_", unit.identifier, "_", lun});
    return createLogicalDevice(unit);
}

std::uint32_t createUnitsOfPort(HostContext& host, std::optional<SanContext>& san, FCPort& port)
{
    const auto* initiator = mapOf<TVRHBA_SCSIProtocolInitiatorEndpoint>(host.agent)
                                .findFirst([&](const auto& known) { return known.Name.value == port.name.c_str(); });
    if (!initiator || !host.system)
        return failed({TVR_ERR, "Could not find TVRHBA_SCSIProtocolEndpoint Initiator instance."});
    if (!san)
        san.emplace(host);
    const InitiatorPort on{*san, port, shared_end(initiator)};
    for (unsigned index = 0; index < port.getTargetCount(); index++)
    {
        TVR_LOG(TVR_DBG, "Creating classes for target %d of %d.", static_cast<int>(index),
                static_cast<int>(port.getTargetCount()));
        if (const std::uint32_t status = createLogicalUnit(on, index); status != BUILD_DONE)
            return status;
    }
    return BUILD_DONE;
}

} // namespace

std::uint32_t createLogicalUnits(HostContext& host)
{
    std::optional<SanContext> san; // made with the first port
    for (Adapter* adapter : host.agent.m_pData->adapters)
    {
        if (adapter->adapterType != Adapter::fibreChannel)
        {
            TVR_LOG(TVR_DBG, "Skippping Adapter [%s] since it is not an FC Adapter", adapter->getName().c_str());
            continue;
        }
        auto& fcAdapter = dynamic_cast<FCAdapter&>(*adapter);
        TVR_LOG(TVR_DBG, "%s", fcAdapter.getName().c_str());
        for (unsigned index = 0; index < fcAdapter.getPortCount(); index++)
        {
            TVR_LOG(TVR_DBG, "Creating classes for port %d.", static_cast<int>(index));
            auto& port = dynamic_cast<FCPort&>(*fcAdapter.getPort(index));
            if (const std::uint32_t status = createUnitsOfPort(host, san, port); status != BUILD_DONE)
                return status;
        }
    }
    return BUILD_DONE;
}

} // namespace cimple
