#include "model/Services.h"

#include "device/CurlLibrary.h"
#include "foundation/WebLaunchConfig.h"
#include "model/Affects.h"
#include "model/Profiles.h"
#include "schema/TVRHBA_BootBIOSService.h"
#include "schema/TVRHBA_BootBIOSServiceAffectsFCPort.h"
#include "schema/TVRHBA_BootBIOSServiceAffectsSystem.h"
#include "schema/TVRHBA_ElementCapabilities.h"
#include "schema/TVRHBA_FCHBADriverParamService.h"
#include "schema/TVRHBA_FCHBADriverParamServiceAffectsFCPort.h"
#include "schema/TVRHBA_FCHBAWWNService.h"
#include "schema/TVRHBA_FCHBAWWNServiceAffectsFCPort.h"
#include "schema/TVRHBA_FCHBAWWNServiceAffectsSystem.h"
#include "schema/TVRHBA_FCPort.h"
#include "schema/TVRHBA_FCTagService.h"
#include "schema/TVRHBA_FCTagServiceAffectsPort.h"
#include "schema/TVRHBA_HostedBootBIOSService.h"
#include "schema/TVRHBA_HostedFCHBADriverParamService.h"
#include "schema/TVRHBA_HostedFCHBAWWNService.h"
#include "schema/TVRHBA_HostedFCTagService.h"
#include "schema/TVRHBA_HostedInstallationService.h"
#include "schema/TVRHBA_InstallServiceAffectsSystem.h"
#include "schema/TVRHBA_InstallServiceConformsToProfile.h"
#include "schema/TVRHBA_RemoteHostedAccessPoint.h"
#include "schema/TVRHBA_RemoteServiceAccessPoint.h"
#include "schema/TVRHBA_SAPAvailableForElement.h"
#include "schema/TVRHBA_SoftwareInstallationService.h"
#include "schema/TVRHBA_SoftwareInstallationServiceCapabilities.h"

namespace cimple
{

namespace
{

constexpr std::uint16_t enabled = 2; // CIM_EnabledLogicalElement.EnabledState
constexpr std::uint16_t ok = 2;      // CIM_ManagedSystemElement.OperationalStatus
constexpr std::uint16_t healthy = 5; // CIM_ManagedSystemElement.HealthState

/// What an element that the computer system hosts is keyed by, and that it is at work.
template <class Element> Ref<Element> makeHosted(const HostContext& host, const String& name)
{
    Ref<Element> element = fresh<Element>();
    element->SystemCreationClassName.set(host.system->CreationClassName.value);
    element->SystemName.set(host.system->Name.value);
    element->CreationClassName.set(className<Element>());
    element->Name.set(name);
    element->EnabledState.set(enabled);
    element->OperationalStatus.set({ok});
    element->HealthState.set(healthy);
    return element;
}

/// A refused association ends the step.
std::uint32_t statusOf(Joined joined)
{
    return joined == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

template <class Hosting, class Element>
std::uint32_t host(const HostContext& by, const Element* element, const LogText& refused)
{
    return statusOf(join<Hosting>(by.agent, &Hosting::Antecedent, by.system, &Hosting::Dependent, element, refused));
}

struct ServiceRow
{
    const char* name;
    const char* elementName;
    const char* description;
};

/// Makes a service that the computer system hosts.
template <class Hosting, class Service>
std::uint32_t start(HostContext& by, Service*& service, const ServiceRow& row, const LogText& refused,
                    const LogText& notHosted)
{
    Ref<Service> made = makeHosted<Service>(by, row.name);
    made->ElementName.set(row.elementName);
    made->Description.set(row.description);
    made->Started.set(true);
    made->StartMode.set("Automatic");
    service = mapOf<Service>(by.agent).insert(made, refused);
    return service ? host<Hosting>(by, service, notHosted) : BUILD_FAILED;
}

// --- software installation

Ref<TVRHBA_SoftwareInstallationServiceCapabilities> makeInstallationCapabilities()
{
    constexpr std::uint16_t noneSupported = 2;
    constexpr std::uint16_t fromByteStream = 4;
    constexpr std::uint16_t fromUri = 5;
    constexpr std::uint16_t notApplicable = 2;
    constexpr std::uint16_t fileScheme = 3;
    Ref<TVRHBA_SoftwareInstallationServiceCapabilities> made = fresh<TVRHBA_SoftwareInstallationServiceCapabilities>();
    made->InstanceID.set("TVR FC HBA:Software Installation Service Capabilities");
    made->ElementName.set("TVR FC HBA Software Installation Service Capabilities");
    made->Description.set("What the installation service of the Fibre Channel HBAs takes.");
    made->SupportedAsynchronousActions.set({noneSupported});
    made->SupportedSynchronousActions.set({fromByteStream, fromUri});
    made->SupportedTargetTypes.set({"TVRHBA_FCPort"});
    made->SupportedExtendedResourceTypes.set({notApplicable});
    made->CanAddToCollection.set(false);
    made->SupportedInstallOptions.set({2, 4, 5, 6, 7, 11, 32768});
    made->SupportedURISchemes.set({fileScheme});
    UpdateCURLCapabilities(made->SupportedURISchemes.value);
    return made;
}

std::uint32_t createInstallationCapabilities(HostContext& on)
{
    const auto* capabilities = mapOf<TVRHBA_SoftwareInstallationServiceCapabilities>(on.agent).insert(
        makeInstallationCapabilities(), "Insert Failed : m_TVRHBA_SoftwareInstallationServiceCapabilities_map");
    if (!capabilities)
        return BUILD_FAILED;
    using Has = TVRHBA_ElementCapabilities;
    constexpr std::uint16_t current = 3;
    return statusOf(join<Has>(on.agent, &Has::ManagedElement, on.installationService, &Has::Capabilities, capabilities,
                              "Insert Failed : m_TVRHBA_ElementCapabilities_map",
                              [](Has& has) { has.Characteristics.set({current}); }));
}

std::uint32_t conformToSoftwareUpdate(HostContext& on)
{
    using Conforms = TVRHBA_InstallServiceConformsToProfile;
    return statusOf(join<Conforms>(on.agent, &Conforms::ConformantStandard,
                                   createRegisteredProfile(on, profileRow("Software Update")),
                                   &Conforms::ManagedElement, on.installationService,
                                   "Insert Failed : m_TVRHBA_InstallServiceConformsToProfile_map"));
}

// --- remote access point

Ref<TVRHBA_RemoteServiceAccessPoint> makeAccessPoint(const HostContext& host, const String& url)
{
    constexpr std::uint16_t formatUrl = 200;
    constexpr std::uint16_t managementService = 10;
    const String label("Fabricore WebLaunch URL");
    Ref<TVRHBA_RemoteServiceAccessPoint> point = makeHosted<TVRHBA_RemoteServiceAccessPoint>(host, label);
    point->ElementName.set(label);
    point->Description.set("The page from which the Fibre Channel HBAs of this host are managed.");
    point->AccessInfo.set(url);
    point->InfoFormat.set(formatUrl);
    point->AccessContext.set(managementService);
    return point;
}

} // namespace

std::uint32_t createSoftwareInstallationService(HostContext& on)
{
    std::uint32_t status = start<TVRHBA_HostedInstallationService>(
        on, on.installationService,
        {"TVRHBA_FCSoftwareInstallationService", "TVR FC HBA Software Installation Service",
         "Installs firmware and boot code on the Fibre Channel HBAs."},
        "Insert Failed : m_TVRHBA_SoftwareInstallationService_map",
        "Insert Failed : m_TVRHBA_HostedInstallationService_map");
    if (status == BUILD_DONE)
        status = createInstallationCapabilities(on);
    if (status == BUILD_DONE)
        status = statusOf(affect<TVRHBA_InstallServiceAffectsSystem>(
            on.agent, on.installationService, on.system, "Insert Failed : m_TVRHBA_InstallServiceAffectsSystem_map"));
    return status == BUILD_DONE ? conformToSoftwareUpdate(on) : status;
}

std::uint32_t createWWNService(HostContext& on)
{
    const std::uint32_t status = start<TVRHBA_HostedFCHBAWWNService>(
        on, on.wwnService,
        {"TVRHBA_FCHBAWWNService", "TVR FC HBA WWN Management Service",
         "Reads, changes and restores the World Wide Names of Fibre Channel ports."},
        "Insert Failed : m_TVRHBA_FCHBAWWNService_map", "Insert Failed : m_TVRHBA_HostedFCHBAWWNService_map");
    if (status != BUILD_DONE)
        return status;
    return statusOf(affect<TVRHBA_FCHBAWWNServiceAffectsSystem>(
        on.agent, on.wwnService, on.system, "Insert Failed : m_TVRHBA_FCHBAWWNServiceAffectsSystem_map"));
}

std::uint32_t createFCTagService(HostContext& on)
{
    return start<TVRHBA_HostedFCTagService>(
        on, on.tagService,
        {"TVRHBA_FCTagService", "TVR FC HBA Tag Service",
         "Gives the frames between two Fibre Channel ports a tag for quality of service."},
        "Insert Failed : m_TVRHBA_FCTagService_map", "Insert Failed : m_TVRHBA_HostedFCTagService_map");
}

std::uint32_t createBootBIOSService(HostContext& on)
{
    const std::uint32_t status = start<TVRHBA_HostedBootBIOSService>(
        on, on.bootService,
        {"TVRHBA_BootBIOSService", "TVR FC HBA Boot BIOS Service",
         "Enables and disables the boot code of the Fibre Channel HBAs."},
        "Insert Failed : m_TVRHBA_BootBIOSService_map", "Insert Failed : m_TVRHBA_HostedBootBIOSService_map");
    if (status != BUILD_DONE)
        return status;
    return statusOf(affect<TVRHBA_BootBIOSServiceAffectsSystem>(
        on.agent, on.bootService, on.system, "Insert Failed : m_TVRHBA_BootBIOSServiceAffectsSystem_map"));
}

std::uint32_t createDriverParameterService(HostContext& on)
{
    return start<TVRHBA_HostedFCHBADriverParamService>(on, on.parameterService,
                                                       {"TVRHBA_FCHBADriverParamService",
                                                        "TVR FC HBA Driver Parameter Service",
                                                        "Sets the parameters of the Fibre Channel driver."},
                                                       "Insert Failed : m_TVRHBA_FCHBADriverParamService_map",
                                                       "Insert Failed : m_TVRHBA_HostedFCHBADriverParamService_map");
}

std::uint32_t createRemoteAccessPoint(HostContext& on)
{
    const String url = WebLaunchConfig().getUrl();
    if (url.empty())
        return BUILD_DONE;
    const auto* point = mapOf<TVRHBA_RemoteServiceAccessPoint>(on.agent).insert(
        makeAccessPoint(on, url), "Insert Failed : m_TVRHBA_RemoteServiceAccessPoint_map");
    if (!point)
        return BUILD_FAILED;
    using Available = TVRHBA_SAPAvailableForElement;
    join<Available>(on.agent, &Available::AvailableSAP, point, &Available::ManagedElement, on.system,
                    "Insert Failed : m_TVRHBA_SAPAvailableForElement_map");
    return host<TVRHBA_RemoteHostedAccessPoint>(on, point, "Insert Failed : m_TVRHBA_RemoteHostedAccessPoint_map");
}

std::uint32_t createPortServiceAssociations(PortContext& port)
{
    const HostContext& on = port.host;
    affect<TVRHBA_FCHBAWWNServiceAffectsFCPort>(on.agent, on.wwnService, port.fcPort,
                                                "Insert Failed : m_TVRHBA_FCHBAWWNServiceAffectsFCPort_map");
    affect<TVRHBA_FCTagServiceAffectsPort>(on.agent, on.tagService, port.fcPort,
                                           "Insert Failed : m_TVRHBA_FCTagServiceAffectsPort_map");
    affect<TVRHBA_BootBIOSServiceAffectsFCPort>(on.agent, on.bootService, port.fcPort,
                                                "Insert Failed : m_TVRHBA_BootBIOSServiceAffectsFCPort_map");
    affect<TVRHBA_FCHBADriverParamServiceAffectsFCPort>(
        on.agent, on.parameterService, port.fcPort,
        "Insert Failed : m_TVRHBA_FCHBADriverParamServiceAffectsFCPort_map");
    return BUILD_DONE;
}

} // namespace cimple
