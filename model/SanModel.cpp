#include "model/SanModel.h"

#include "device/ForeignText.h"
#include "model/LogicalDevices.h"
#include "schema/TVRHBA_LocalHostedAccessPoint.h"

namespace cimple
{

namespace
{

/// A port with the initiator endpoint that stands for it.
struct InitiatorPort
{
    HostContext& host;
    FCPort& port;
    String wwpn;
    Ref<CIM_ComputerSystem> system;
    Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> initiator;
};

String inquiryText(const Target& target)
{
    return formatText("%.8s %.16s Revision %.4s", target.vendor.c_str(), target.product.c_str(),
                      target.revision.c_str());
}

String identifierText(const Target& target)
{
    char text[33];
    descriptorToString(text, &target.designator);
    return text;
}

Ref<TVRHBA_SCSIProtocolEndpoint> makeEndpoint(const LogicalUnit& unit, const String& name)
{
    const Target& target = unit.target;
    Ref<TVRHBA_SCSIProtocolEndpoint> endpoint = fresh<TVRHBA_SCSIProtocolEndpoint>();
    endpoint->TargetWWPN.set(target.portWWN);
    endpoint->TargetWWNN.set(target.nodeWWN);
    endpoint->Description.set(unit.description);
    endpoint->SystemCreationClassName = unit.system->CreationClassName;
    endpoint->SystemName = unit.system->Name;
    endpoint->CreationClassName.set(className<TVRHBA_SCSIProtocolEndpoint>());
    endpoint->ElementName.set(target.product);
    endpoint->Name.set(name);
    endpoint->ProtocolType.set(18);
    endpoint->ProtocolIFType.set(56);
    endpoint->ConnectionType.set(2);
    endpoint->Role.set(3);
    endpoint->EnabledDefault.set(5);
    endpoint->EnabledState.set(0);
    endpoint->RequestedState.set(0);
    endpoint->OperationalStatus.set({0});
    endpoint->FCID.set(target.fcId);
    endpoint->SCSIBusNumber.set(target.scsiBusNumber);
    endpoint->SCSITargetNumber.set(target.scsiTargetNumber);
    endpoint->OtherIdentifyingInfo.set({unit.osDeviceName});
    endpoint->IdentifyingDescriptions.set({"OS Device Name"});
    return endpoint;
}

/// The endpoint of a unit and what hosts it. Its copy is left in the unit, for the path.
std::uint32_t createEndpoint(LogicalUnit& unit, const String& name)
{
    const TVRHBA_SCSIProtocolEndpoint* endpoint =
        mapOf<TVRHBA_SCSIProtocolEndpoint>(unit.agent)
            .insert(makeEndpoint(unit, name), "Insert Failed : m_TVRHBA_SCSIProtocolEndpoint_map");
    if (!endpoint)
        return BUILD_FAILED;
    unit.endpoint.reset(clone_of(endpoint));
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

std::uint32_t createLogicalUnit(const InitiatorPort& on, unsigned index)
{
    const Target& target = *on.port.getTarget(index);
    on.host.remotePorts.insert(on.port.name + "|" + target.portWWN);
    const std::string lun = lunText(target.fcpLun);
    LogicalUnit unit{on.host.agent, target, on.system, on.initiator};
    unit.osDeviceName = target.osDeviceName;
    unit.inquiry = inquiryText(target);
    unit.description = formatText("%s Serial Number %.40s", unit.inquiry.c_str(), target.serialNumber.c_str());
    const String name = formatText("%s:%s:%s", on.wwpn.c_str(), target.portWWN.c_str(), lun.c_str());
    if (const std::uint32_t status = createEndpoint(unit, name); status != BUILD_DONE)
        return status;
    TVR_LOG(TVR_DBG, "Target %d is of type %d.", static_cast<int>(index), static_cast<int>(target.deviceType));
    unit.identifier = identifierText(target);
    unit.deviceId =
        formatText("%s_%s_%s_%s", on.wwpn.c_str(), target.portWWN.c_str(), unit.identifier.c_str(), lun.c_str());
    return createLogicalDevice(unit);
}

std::uint32_t createUnitsOfPort(HostContext& host, FCPort& port)
{
    const auto* initiator = mapOf<TVRHBA_SCSIProtocolInitiatorEndpoint>(host.agent)
                                .findFirst([&](const auto& known) { return known.Name.value == port.name.c_str(); });
    if (!initiator || !host.system)
        return failed({TVR_ERR, "Could not find TVRHBA_SCSIProtocolEndpoint Initiator instance."});
    const InitiatorPort on{host, port, port.name, shared_end(host.system), shared_end(initiator)};
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
            if (const std::uint32_t status = createUnitsOfPort(host, port); status != BUILD_DONE)
                return status;
        }
    }
    return BUILD_DONE;
}

} // namespace cimple
