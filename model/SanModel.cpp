#include "model/SanModel.h"

#include "device/ForeignText.h"
#include "model/LogicalDevices.h"
#include "schema/TVRHBA_LocalHostedAccessPoint.h"

#include <cstdio>
#include <optional>
#include <string_view>

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
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint = fresh<TVRHBA_SCSIProtocolEndpoint>();
    setSystem(*endpoint, system);
    endpoint->CreationClassName.set(className<TVRHBA_SCSIProtocolEndpoint>());
    endpoint->ProtocolType.set(18);
    endpoint->ProtocolIFType.set(56);
    endpoint->ConnectionType.set(2);
    endpoint->Role.set(3);
    endpoint->EnabledDefault.set(5);
    endpoint->EnabledState.set(0);
    endpoint->RequestedState.set(0);
    endpoint->OperationalStatus.set({0});
    endpoint->IdentifyingDescriptions.set({"OS Device Name"});
    return Prototype<TVRHBA_SCSIProtocolEndpoint>(endpoint);
}

/// What the units of all ports have in common.
struct SanContext
{
    explicit SanContext(HostContext& host)
        : host(host), system(shared_end(host.system)), endpoint(endpointPrototype(*system)), devices(*system)
    {}
    HostContext& host;
    Ref<CIM_ComputerSystem> system;
    Prototype<TVRHBA_SCSIProtocolEndpoint> endpoint;
    DevicePrototypes devices;
    RepeatedText targetWwpn, targetWwnn, product, inquiry;
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

/// "%.8s %.16s Revision %.4s" of vendor, product and revision.
const String& inquiryText(SanContext& san, const Target& target)
{
    char text[8 + 1 + 16 + 10 + 4 + 1];
    const int size = std::snprintf(text, sizeof text, "%.8s %.16s Revision %.4s", target.vendor.c_str(),
                                   target.product.c_str(), target.revision.c_str());
    return san.inquiry.of({text, static_cast<std::size_t>(size)});
}

/// Notes a pair of ports. The units of a target follow each other.
void noteRemotePort(HostContext& host, const std::string& wwpn, const std::string& remote)
{
    const std::string pair = wwpn + "|" + remote;
    if (host.remotePorts.empty() || *host.remotePorts.rbegin() != pair)
        host.remotePorts.insert(pair);
}

std::uint32_t createLogicalUnit(const InitiatorPort& on, unsigned index)
{
    SanContext& san = on.san;
    const Target& target = *on.port.getTarget(index);
    noteRemotePort(san.host, on.port.name, target.portWWN);
    const std::string lun = lunText(target.fcpLun);
    const std::string& wwpn = on.port.name;
    LogicalUnit unit{san.host.agent, san.devices, target, san.system, on.initiator, inquiryText(san, target)};
    unit.description =
        joinTexts({unit.inquiry.view(), " Serial Number ", std::string_view(target.serialNumber).substr(0, 40)});
    unit.osDeviceName = target.osDeviceName;
    if (const std::uint32_t status = createEndpoint(san, unit, joinTexts({wwpn, ":", target.portWWN, ":", lun}));
        status != BUILD_DONE)
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
