#include "model/PortModel.h"

#include "agent/Build.h"
#include "model/FcpEndpoint.h"
#include "model/PortFacts.h"
#include "model/PortValues.h"
#include "schema/TVRHBA_Card.h"
#include "schema/TVRHBA_Chip.h"
#include "schema/TVRHBA_ControlledBy.h"
#include "schema/TVRHBA_DeviceSAPImplementation.h"
#include "schema/TVRHBA_ElementStatisticalData.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_FCPortConformsToProfile.h"
#include "schema/TVRHBA_FCPortStatistics.h"
#include "schema/TVRHBA_FCPortSystemDevice.h"
#include "schema/TVRHBA_FCRealizes.h"
#include "schema/TVRHBA_LocalHostedInitiatorAccessPoint.h"
#include "schema/TVRHBA_LogicalPortGroup.h"
#include "schema/TVRHBA_MemberOfCollection.h"
#include "schema/TVRHBA_PHYConnectorRealizesPortController.h"
#include "schema/TVRHBA_PhysicalConnector.h"
#include "schema/TVRHBA_PortController.h"
#include "schema/TVRHBA_PortControllerConformsToProfile.h"
#include "schema/TVRHBA_PortControllerSystemDevice.h"
#include "schema/TVRHBA_Product.h"
#include "schema/TVRHBA_ProductElementComponent.h"
#include "schema/TVRHBA_ProtocolControllerForPort.h"
#include "schema/TVRHBA_Realizes.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SCSIProtocolController.h"
#include "schema/TVRHBA_SCSIProtocolControllerSystemDevice.h"
#include "schema/TVRHBA_SCSIProtocolInitiatorEndpoint.h"

#include <span>

namespace cimple
{

namespace
{

/// The status of a step whose associations were made or passed over, or refused because their keys are there.
BuildStatus doneUnless(bool refused)
{
    return refused ? BUILD_NO_INSTANCE : BUILD_DONE;
}

void setStatus(auto& element, const ValueText& status)
{
    element.OperationalStatus.set({status.value});
    element.StatusDescriptions.set({status.text});
}

Ref<TVRHBA_FCPort> makeFCPort(const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    const String wwpn(port.port.name);
    Ref<TVRHBA_FCPort> made = empty<TVRHBA_FCPort>();
    made->PortNumber.set(static_cast<std::uint16_t>(adapter.portNumber));
    made->Description.set(adapter.modelDescription);
    setSystem(*made, *port.host.system);
    made->CreationClassName.set(className<TVRHBA_FCPort>());
    made->Name.set(wwpn);
    made->DeviceID.set(wwpn);
    made->UsageRestriction.set(4);
    made->OperationalFirmware.set(adapter.operationalFirmware);
    made->AdapterName.set(port.on.adapter.getName());
    made->LinkTechnology.set(4);
    made->PermanentAddress.set(wwpn);
    made->NetworkAddresses.set({wwpn});
    made->FWDownloadStatus.set(0);
    setPortIdentifiers(*made, port);
    setPortFacts(*made, *port.port.getAttributes());
    setBeacon(*made);
    return made;
}

struct ConformanceRow
{
    const char* profile;
    const char* logged;
};

constexpr ConformanceRow portProfiles[] = {
    {"Physical Package", "Physical Package"},
    {"Host Discovered Resources", "Host Discovered Resource"},
    {"FC Initiator Ports", "FC Initiator Port"},
    {"Access Points", "Access Points"},
};

constexpr ConformanceRow controllerProfiles[] = {
    {"Storage HBA", "Storage HBA"},
    {"FC HBA", "FC HBA"},
};

/// Relates an element of the port, of a kind that the log names, to its profiles. A refused one is logged.
template <class Conforms, class Element>
void conform(const PortContext& port, std::span<const ConformanceRow> profiles, const char* kind,
             const Element* element, const LogText& refused)
{
    for (const ConformanceRow& row : profiles)
    {
        TVR_LOG(TVR_DBG, "Generating %s (%s %s:%s, %s)", Conforms::static_meta_class.name, kind,
                port.on.attributes.model.c_str(), port.port.name.c_str(), row.logged);
        join<Conforms>(port.host.agent, &Conforms::ConformantStandard, port.host.profiles.find(row.profile),
                       &Conforms::ManagedElement, element, refused);
    }
}

Ref<TVRHBA_FCPortStatistics> makeStatistics(const String& wwpn)
{
    Ref<TVRHBA_FCPortStatistics> made = empty<TVRHBA_FCPortStatistics>();
    made->ElementName.set(wwpn);
    made->Description.set("Statistics for the FC port.");
    made->InstanceID.set(formatText("TVR FC HBA:HBA Statistics:%s", wwpn.c_str()));
    return made;
}

Ref<TVRHBA_SCSIProtocolController> makeSCSIProtocolController(const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    const String wwpn(port.port.name);
    Ref<TVRHBA_SCSIProtocolController> made = fresh<TVRHBA_SCSIProtocolController>();
    made->Description.set(adapter.modelDescription);
    setSystem(*made, *port.host.system);
    made->CreationClassName.set(className<TVRHBA_SCSIProtocolController>());
    made->Name.set(wwpn);
    made->DeviceID.set(wwpn);
    made->ElementName.set(adapter.nodeSymbolicName);
    setStatus(*made, controllerStatus(port.port.getAttributes()->portState));
    made->NameFormat.set(2);
    made->MaxUnitsControlled.set(adapter.numberOfPorts);
    return made;
}

Ref<TVRHBA_PortController> makePortController(const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    const String nodeName(adapter.nodeSymbolicName);
    Ref<TVRHBA_PortController> made = fresh<TVRHBA_PortController>();
    made->Description.set(adapter.modelDescription);
    made->ElementName.set(nodeName);
    made->Name.set(nodeName);
    setSystem(*made, *port.host.system);
    made->CreationClassName.set(className<TVRHBA_PortController>());
    made->DeviceID.set(port.port.name);
    made->ControllerType.set(4);
    made->ProtocolSupported.set(10);
    made->MaxNumberControlled.set(adapter.numberOfPorts);
    made->ProtocolDescription.set("SCSI Fibre Channel Protocol");
    made->Availability.set(3);
    made->EnabledState.set(5);
    made->RequestedState.set(5);
    made->EnabledDefault.set(2);
    setStatus(*made, controllerStatus(port.port.getAttributes()->portState));
    return made;
}

Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> makeInitiatorEndpoint(const PortContext& port)
{
    const FCAdapterAttributes& adapter = port.on.attributes;
    Ref<TVRHBA_SCSIProtocolInitiatorEndpoint> made =
        makeFcpEndpoint<TVRHBA_SCSIProtocolInitiatorEndpoint>(*port.host.system, EndpointRole::Initiator);
    made->Description.set(adapter.modelDescription);
    made->ElementName.set(adapter.nodeSymbolicName);
    made->Name.set(port.port.name);
    return made;
}

/// CIM_ControlledBy.AccessState by the state of the port: active, inactive or unknown.
std::uint16_t accessState(std::uint32_t portState)
{
    return portState == 1 ? 0 : portState == 2 ? 1 : 2;
}

} // namespace

std::uint32_t createFCPort(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    port.fcPort = mapOf<TVRHBA_FCPort>(agent).insert(makeFCPort(port), "Insert Failed : m_TVRHBA_FCPort_map");
    if (!port.fcPort)
        return BUILD_NO_INSTANCE;
    conform<TVRHBA_FCPortConformsToProfile>(port, portProfiles, "FC Port", port.fcPort,
                                            "Insert Failed : m_TVRHBA_FCPortConformsToProfile_map");

    using OfSystem = TVRHBA_FCPortSystemDevice;
    using Member = TVRHBA_MemberOfCollection;
    using Realizes = TVRHBA_FCRealizes;
    return doneUnless(join<OfSystem>(agent, &OfSystem::GroupComponent, port.host.system, &OfSystem::PartComponent,
                                     port.fcPort,
                                     "Insert Failed : m_TVRHBA_FCPortSystemDevice_map") == Joined::Refused ||
                      join<Member>(agent, &Member::Collection, port.on.group, &Member::Member, port.fcPort,
                                   "Insert Failed : m_TVRHBA_MemberOfCollection_map") == Joined::Refused ||
                      join<Realizes>(agent, &Realizes::Antecedent, port.connector, &Realizes::Dependent, port.fcPort,
                                     "Insert Failed : m_TVRHBA_FCRealizes_map") == Joined::Refused);
}

std::uint32_t createFCPortStatistics(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    const TVRHBA_FCPortStatistics* statistics = mapOf<TVRHBA_FCPortStatistics>(agent).insert(
        makeStatistics(String(port.port.name)), "Insert Failed : m_TVRHBA_FCPortStatistics_map");
    if (!statistics)
        return BUILD_NO_INSTANCE;
    using OfPort = TVRHBA_ElementStatisticalData;
    return doneUnless(join<OfPort>(agent, &OfPort::ManagedElement, port.fcPort, &OfPort::Stats, statistics,
                                   "Insert Failed : m_TVRHBA_ElementStatisticalData_map") == Joined::Refused);
}

std::uint32_t createSCSIProtocolController(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    const TVRHBA_SCSIProtocolController* controller = mapOf<TVRHBA_SCSIProtocolController>(agent).insert(
        makeSCSIProtocolController(port), "Insert Failed : m_TVRHBA_SCSIProtocolController_map");
    if (!controller)
        return BUILD_NO_INSTANCE;
    using ForPort = TVRHBA_ProtocolControllerForPort;
    using OfSystem = TVRHBA_SCSIProtocolControllerSystemDevice;
    return doneUnless(join<ForPort>(agent, &ForPort::Antecedent, controller, &ForPort::Dependent, port.fcPort,
                                    "Insert Failed : m_TVRHBA_ProtocolControllerForPort_map") == Joined::Refused ||
                      join<OfSystem>(agent, &OfSystem::GroupComponent, port.host.system, &OfSystem::PartComponent,
                                     controller, "Insert Failed : m_TVRHBA_SCSIProtocolControllerSystemDevice_map") ==
                          Joined::Refused);
}

std::uint32_t createPortController(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    port.controller = mapOf<TVRHBA_PortController>(agent).insert(makePortController(port),
                                                                 "Insert Failed : m_TVRHBA_PortController_map");
    if (!port.controller)
        return BUILD_NO_INSTANCE;
    using OfProduct = TVRHBA_ProductElementComponent;
    using Realizes = TVRHBA_PHYConnectorRealizesPortController;
    if (join<OfProduct>(agent, &OfProduct::GroupComponent, port.on.product, &OfProduct::PartComponent, port.controller,
                        "Insert Failed : m_TVRHBA_ProductElementComponent_map") == Joined::Refused ||
        join<Realizes>(agent, &Realizes::Antecedent, port.connector, &Realizes::Dependent, port.controller,
                       "Insert Failed (HBA): m_TVRHBA_PHYConnectorRealizesPortController_map") == Joined::Refused)
        return BUILD_NO_INSTANCE;
    conform<TVRHBA_PortControllerConformsToProfile>(port, controllerProfiles, "Port Controller", port.controller,
                                                    "Insert Failed : m_TVRHBA_PortControllerConformsToProfile_map");
    return BUILD_DONE;
}

std::uint32_t createPortControllerAssociations(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    using Controlled = TVRHBA_ControlledBy;
    using Realizes = TVRHBA_Realizes;
    using OfSystem = TVRHBA_PortControllerSystemDevice;
    return doneUnless(
        join<Controlled>(agent, &Controlled::Antecedent, port.controller, &Controlled::Dependent, port.fcPort,
                         "Insert Failed : m_TVRHBA_ControlledBy_map",
                         [&](Controlled& controlled) {
                             controlled.AccessState.set(accessState(port.port.getAttributes()->portState));
                         }) == Joined::Refused ||
        join<Realizes>(agent, &Realizes::Antecedent, port.on.card, &Realizes::Dependent, port.controller,
                       "Insert Failed : m_TVRHBA_Realizes_map") == Joined::Refused ||
        join<OfSystem>(agent, &OfSystem::GroupComponent, port.host.system, &OfSystem::PartComponent, port.controller,
                       "Insert Failed : m_TVRHBA_PortControllerSystemDevice_map") == Joined::Refused);
}

std::uint32_t createInitiatorEndpoint(PortContext& port)
{
    ProviderAgent& agent = port.host.agent;
    port.endpoint = mapOf<TVRHBA_SCSIProtocolInitiatorEndpoint>(agent).insert(
        makeInitiatorEndpoint(port), "Insert Failed : m_TVRHBA_SCSIProtocolInitiatorEndpoint_map");
    if (!port.endpoint)
        return BUILD_NO_INSTANCE;
    using OfPort = TVRHBA_DeviceSAPImplementation;
    using OfSystem = TVRHBA_LocalHostedInitiatorAccessPoint;
    return doneUnless(join<OfPort>(agent, &OfPort::Antecedent, port.fcPort, &OfPort::Dependent, port.endpoint,
                                   "Insert Failed : m_TVRHBA_DeviceSAPImplementation_map") == Joined::Refused ||
                      join<OfSystem>(agent, &OfSystem::Antecedent, port.host.system, &OfSystem::Dependent,
                                     port.endpoint, "Insert Failed : m_TVRHBA_LocalHostedInitiatorAccessPoint_map") ==
                          Joined::Refused);
}

} // namespace cimple
