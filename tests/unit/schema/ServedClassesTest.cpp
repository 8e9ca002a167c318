// The served classes against what is known of them: superclass, keys, counts of features, ends of associations.
#include "schema/AllClasses.h"
#include "schema/Repository.h"

#include <gmock/gmock.h>

#include <numeric>
#include <string>
#include <vector>

namespace cimple
{

namespace
{

const Meta_Class& class_named(const std::string& name)
{
    const Meta_Class* mc = find_class(&the_repository, name.c_str());
    if (!mc)
    {
        throw std::runtime_error("no class " + name);
    }
    return *mc;
}

/// Names of the features that have a flag, with blanks between.
std::string names_with(const Meta_Class& mc, std::uint32_t flag)
{
    std::string names;
    for (std::size_t i = 0; i < mc.num_meta_features; i++)
    {
        if (mc.meta_features[i]->flags & flag)
        {
            names += (names.empty() ? "" : " ") + std::string(mc.meta_features[i]->name);
        }
    }
    return names;
}

struct ClassRow
{
    const char* name; ///< behind "TVRHBA_"
    const char* superclass;
    const char* keys;
    std::size_t total; ///< features
    unsigned own;      ///< of them declared or overridden by the class
};

constexpr const char* instance_keys = "InstanceID";
constexpr const char* physical_keys = "Tag CreationClassName";
constexpr const char* service_keys = "Name SystemCreationClassName SystemName CreationClassName";
constexpr const char* device_keys = "SystemCreationClassName SystemName CreationClassName DeviceID";
constexpr const char* product_keys = "Name IdentifyingNumber Vendor Version";

constexpr ClassRow plain_classes[] = {
    {"BootBIOSService", "CIM_Service", service_keys, 36, 3},
    {"Card", "CIM_Card", physical_keys, 53, 5},
    {"Chip", "CIM_Chip", physical_keys, 40, 6},
    {"ConcreteJob", "CIM_ConcreteJob", instance_keys, 46, 3},
    {"DiagnosticCompletionRecord", "CIM_DiagnosticCompletionRecord", instance_keys, 35, 14},
    {"DiagnosticIdentity", "CIM_SoftwareIdentity", instance_keys, 40, 0},
    {"DiagnosticServiceRecord", "CIM_DiagnosticServiceRecord", instance_keys, 33, 14},
    {"DiagnosticSettingDataRecord", "CIM_DiagnosticSettingDataRecord", instance_keys, 16, 0},
    {"DiagnosticsLog", "CIM_DiagnosticsLog", instance_keys, 28, 0},
    {"DriverParamGlobal", "CIM_SettingData", instance_keys, 16, 9},
    {"DriverParams", "CIM_SettingData", instance_keys, 18, 11},
    {"DumpData", "CIM_SettingData", instance_keys, 9, 2},
    {"DumpService", "CIM_Service", service_keys, 36, 3},
    {"EnabledRecordLogCapabilities", "CIM_EnabledLogicalElementCapabilities", instance_keys, 12, 1},
    {"FCDriverLogEntry", "CIM_LogEntry", instance_keys, 17, 0},
    {"FCHBADiagnosticServiceCapabilities", "CIM_FCHBADiagnosticServiceCapabilities", instance_keys, 19, 0},
    {"FCHBADiagnosticSettingData", "CIM_FCHBADiagnosticSettingData", instance_keys, 32, 1},
    {"FCHBADiagnosticTest", "CIM_FCHBADiagnosticTest", service_keys, 47, 0},
    {"FCHBADriverParamService", "CIM_Service", service_keys, 35, 2},
    {"FCHBAWWNService", "CIM_Service", service_keys, 37, 4},
    {"FCPort", "CIM_FCPort", device_keys, 75, 8},
    {"FCPortStatistics", "CIM_FCPortStatistics", instance_keys, 55, 0},
    {"FCTagService", "CIM_Service", service_keys, 37, 4},
    {"FRUVitalProductData", "CIM_SettingData", instance_keys, 9, 2},
    {"FlashImageSoftwareIdentity", "CIM_SoftwareIdentity", instance_keys, 49, 9},
    {"HelpService", "CIM_HelpService", service_keys, 40, 0},
    {"JobSettingData", "CIM_JobSettingData", instance_keys, 10, 0},
    {"LogEntry", "CIM_LogEntry", instance_keys, 18, 1},
    {"LogicalDisk", "CIM_LogicalDisk", device_keys, 78, 2},
    {"LogicalPortGroup", "CIM_LogicalPortGroup", instance_keys, 8, 0},
    {"PCIDevice", "CIM_PCIDevice", device_keys, 145, 71},
    {"PhysicalConnector", "CIM_PhysicalConnector", physical_keys, 38, 0},
    {"PortController", "CIM_PortController", device_keys, 54, 0},
    {"Product", "CIM_Product", product_keys, 13, 0},
    {"ProviderConfigSetting", "CIM_SettingData", instance_keys, 12, 5},
    {"RecordLog", "CIM_RecordLog", instance_keys, 32, 4},
    {"RegisteredProfile", "CIM_RegisteredProfile", instance_keys, 15, 0},
    {"RemoteServiceAccessPoint", "CIM_RemoteServiceAccessPoint", service_keys, 31, 0},
    {"ResourcePool", "CIM_ResourcePool", instance_keys, 26, 0},
    {"SCSIArbitraryLogicalUnit", "CIM_SCSIArbitraryLogicalUnit", device_keys, 49, 0},
    {"SCSIProtocolController", "CIM_SCSIProtocolController", device_keys, 50, 0},
    {"SCSIProtocolEndpoint", "CIM_SCSIProtocolEndpoint", service_keys, 43, 7},
    {"SCSIProtocolInitiatorEndpoint", "CIM_SCSIProtocolEndpoint", service_keys, 36, 0},
    {"SoftwareIdentity", "CIM_SoftwareIdentity", instance_keys, 42, 2},
    {"SoftwareInstallationService", "CIM_SoftwareInstallationService", service_keys, 41, 4},
    {"SoftwareInstallationServiceCapabilities", "CIM_SoftwareInstallationServiceCapabilities", instance_keys, 18, 0},
    {"StorageExtent", "CIM_StorageExtent", device_keys, 77, 3},
    {"StorageVolume", "CIM_StorageVolume", device_keys, 83, 3},
    {"TapeDrive", "CIM_TapeDrive", device_keys, 78, 3},
    {"Transceiver", "CIM_PhysicalComponent", physical_keys, 65, 32},
    {"VirtualFCPort", "CIM_FCPort", device_keys, 67, 0},
    {"VirtualSCSIProtocolTargetEndpoint", "CIM_SCSIProtocolEndpoint", service_keys, 36, 0},
    {"VirtualStorageVolume", "CIM_StorageVolume", device_keys, 82, 2},
    {"VitalProductData", "CIM_SettingData", instance_keys, 9, 2},
};

struct AssociationRow
{
    const char* name; ///< behind "TVRHBA_"
    const char* superclass;
    bool aggregation;
    const char* ends; ///< role=class
};

constexpr AssociationRow associations[] = {
    {"AffectedJobElement", "CIM_AffectedJobElement", false,
     "AffectedElement=TVRHBA_PortController AffectingElement=TVRHBA_ConcreteJob"},
    {"AvailableDiagnosticService", "CIM_AvailableDiagnosticService", false,
     "ServiceProvided=TVRHBA_FCHBADiagnosticTest UserOfService=TVRHBA_PortController"},
    {"BaseServerReferencedProfile", "CIM_ReferencedProfile", false,
     "Antecedent=TVRHBA_RegisteredProfile Dependent=CIM_RegisteredProfile"},
    {"BootBIOSServiceAffectsFCPort", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_FCPort AffectingElement=TVRHBA_BootBIOSService"},
    {"BootBIOSServiceAffectsSystem", "CIM_ServiceAffectsElement", false,
     "AffectedElement=CIM_ComputerSystem AffectingElement=TVRHBA_BootBIOSService"},
    {"CardConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_Card"},
    {"CardContainsChip", "CIM_Container", true, "GroupComponent=TVRHBA_Card PartComponent=TVRHBA_Chip"},
    {"CardContainsConnector", "CIM_Container", true,
     "GroupComponent=TVRHBA_Card PartComponent=TVRHBA_PhysicalConnector"},
    {"ChassisContainsCard", "CIM_Container", true, "GroupComponent=CIM_Chassis PartComponent=TVRHBA_Card"},
    {"ComputerSystemConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=CIM_ComputerSystem"},
    {"ConnectorDependsOnChip", "CIM_ConcreteDependency", false,
     "Antecedent=TVRHBA_PhysicalConnector Dependent=TVRHBA_Chip"},
    {"ControlledBy", "CIM_ControlledBy", false, "Antecedent=TVRHBA_PortController Dependent=TVRHBA_FCPort"},
    {"CorrespondingSettingDataRecord", "CIM_CorrespondingSettingDataRecord", false,
     "DataRecord=CIM_DiagnosticServiceRecord SettingsRecord=TVRHBA_DiagnosticSettingDataRecord"},
    {"DeviceSAPImplementation", "CIM_DeviceSAPImplementation", false,
     "Antecedent=TVRHBA_FCPort Dependent=TVRHBA_SCSIProtocolInitiatorEndpoint"},
    {"DiagElementCapabilities", "CIM_ElementCapabilities", false,
     "ManagedElement=TVRHBA_FCHBADiagnosticTest Capabilities=TVRHBA_FCHBADiagnosticServiceCapabilities"},
    {"DiagElementSettingData", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_FCHBADiagnosticTest SettingData=TVRHBA_FCHBADiagnosticSettingData"},
    {"DiagElementSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_DiagnosticIdentity Dependent=TVRHBA_FCHBADiagnosticTest"},
    {"DiagHostedService", "CIM_HostedService", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_FCHBADiagnosticTest"},
    {"DiagServiceConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_FCHBADiagnosticTest"},
    {"DriverParamAffectsVirtualFCPort", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_VirtualFCPort SettingData=TVRHBA_DriverParams"},
    {"DriverParameterAffectsFCPort", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_FCPort SettingData=TVRHBA_DriverParams"},
    {"DriverRecordLogManagesRecord", "CIM_LogManagesRecord", true,
     "Log=TVRHBA_RecordLog Record=TVRHBA_FCDriverLogEntry"},
    {"DriverServiceElementSettingData", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_FCHBADriverParamService SettingData=TVRHBA_DriverParams"},
    {"DumpServiceAffectsElement", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_PortController AffectingElement=TVRHBA_DumpService"},
    {"ElementAllocatedFromPool", "CIM_ElementAllocatedFromPool", false,
     "Antecedent=TVRHBA_ResourcePool Dependent=TVRHBA_VirtualFCPort"},
    {"ElementCapabilities", "CIM_ElementCapabilities", false,
     "ManagedElement=TVRHBA_SoftwareInstallationService Capabilities=TVRHBA_SoftwareInstallationServiceCapabilities"},
    {"ElementDumpData", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_PortController SettingData=TVRHBA_DumpData"},
    {"ElementFlashImageSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_FlashImageSoftwareIdentity Dependent=TVRHBA_PortController"},
    {"ElementSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_SoftwareIdentity Dependent=TVRHBA_PortController"},
    {"ElementStatisticalData", "CIM_ElementStatisticalData", false,
     "ManagedElement=TVRHBA_FCPort Stats=TVRHBA_FCPortStatistics"},
    {"ElementVPD", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_PCIDevice SettingData=TVRHBA_VitalProductData"},
    {"FCDriverServiceAffectsDriver", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_SoftwareIdentity AffectingElement=TVRHBA_FCHBADriverParamService"},
    {"FCHBADriverParamServiceAffectsFCPort", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_FCPort AffectingElement=TVRHBA_FCHBADriverParamService"},
    {"FCHBAWWNServiceAffectsFCPort", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_FCPort AffectingElement=TVRHBA_FCHBAWWNService"},
    {"FCHBAWWNServiceAffectsSystem", "CIM_ServiceAffectsElement", false,
     "AffectedElement=CIM_ComputerSystem AffectingElement=TVRHBA_FCHBAWWNService"},
    {"FCPortConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_FCPort"},
    {"FCPortSystemDevice", "CIM_SystemDevice", true, "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_FCPort"},
    {"FCRealizes", "CIM_Realizes", false, "Antecedent=TVRHBA_PhysicalConnector Dependent=TVRHBA_FCPort"},
    {"FCTagElementSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_SoftwareIdentity Dependent=TVRHBA_FCTagService"},
    {"FCTagServiceAffectsPort", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_FCPort AffectingElement=TVRHBA_FCTagService"},
    {"FRUElementVPD", "CIM_ElementSettingData", false,
     "ManagedElement=CIM_ManagedElement SettingData=TVRHBA_FRUVitalProductData"},
    {"FirmwareElementSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_SoftwareIdentity Dependent=TVRHBA_PortController"},
    {"GlobalDriverServiceElementSettingData", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_FCHBADriverParamService SettingData=TVRHBA_DriverParamGlobal"},
    {"HostedBootBIOSService", "CIM_HostedService", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_BootBIOSService"},
    {"HostedCollection", "CIM_HostedCollection", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_LogicalPortGroup"},
    {"HostedDumpService", "CIM_HostedService", false, "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_DumpService"},
    {"HostedFCHBADriverParamService", "CIM_HostedService", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_FCHBADriverParamService"},
    {"HostedFCHBAWWNService", "CIM_HostedService", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_FCHBAWWNService"},
    {"HostedFCTagService", "CIM_HostedService", false, "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_FCTagService"},
    {"HostedInstallationService", "CIM_HostedService", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_SoftwareInstallationService"},
    {"HostedResourcePool", "CIM_HostedResourcePool", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_ResourcePool"},
    {"HostedService", "CIM_HostedService", false, "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_HelpService"},
    {"InstallServiceAffectsChip", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_Chip AffectingElement=TVRHBA_SoftwareInstallationService"},
    {"InstallServiceAffectsFirmwareIdentity", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_SoftwareIdentity AffectingElement=TVRHBA_SoftwareInstallationService"},
    {"InstallServiceAffectsSystem", "CIM_ServiceAffectsElement", false,
     "AffectedElement=CIM_ComputerSystem AffectingElement=TVRHBA_SoftwareInstallationService"},
    {"InstallServiceConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_SoftwareInstallationService"},
    {"InstalledSoftwareIdentity", "CIM_InstalledSoftwareIdentity", false,
     "System=CIM_ComputerSystem InstalledSoftware=TVRHBA_SoftwareIdentity"},
    {"JobElementSettingData", "CIM_ElementSettingData", false,
     "ManagedElement=TVRHBA_FCHBADiagnosticTest SettingData=TVRHBA_JobSettingData"},
    {"LocalHostedAccessPoint", "CIM_HostedAccessPoint", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_SCSIProtocolEndpoint"},
    {"LocalHostedInitiatorAccessPoint", "CIM_HostedAccessPoint", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_SCSIProtocolInitiatorEndpoint"},
    {"LogManagesRecord", "CIM_LogManagesRecord", true, "Log=TVRHBA_DiagnosticsLog Record=CIM_DiagnosticRecord"},
    {"LogicalDiskSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_LogicalDisk"},
    {"MemberOfCollection", "CIM_MemberOfCollection", true, "Collection=TVRHBA_LogicalPortGroup Member=TVRHBA_FCPort"},
    {"OwningJobElement", "CIM_OwningJobElement", false,
     "OwningElement=TVRHBA_FCHBADiagnosticTest OwnedElement=TVRHBA_ConcreteJob"},
    {"PCIElementConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_PCIDevice"},
    {"PHYConnectorRealizesPortController", "CIM_Realizes", false,
     "Antecedent=TVRHBA_PhysicalConnector Dependent=TVRHBA_PortController"},
    {"PortControllerConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_PortController"},
    {"PortControllerSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_PortController"},
    {"ProductElementComponent", "CIM_ProductElementComponent", true,
     "GroupComponent=TVRHBA_Product PartComponent=TVRHBA_PortController"},
    {"ProductPhysicalComponent", "CIM_ProductPhysicalComponent", true,
     "GroupComponent=TVRHBA_Product PartComponent=TVRHBA_Card"},
    {"ProductPhysicalConnector", "CIM_ProductPhysicalComponent", true,
     "GroupComponent=TVRHBA_Product PartComponent=TVRHBA_PhysicalConnector"},
    {"ProtocolControllerForPort", "CIM_ProtocolControllerForPort", false,
     "Antecedent=TVRHBA_SCSIProtocolController Dependent=TVRHBA_FCPort"},
    {"ProviderElementSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_SoftwareIdentity Dependent=TVRHBA_Card"},
    {"ProviderSoftwareIdentity", "CIM_ElementSoftwareIdentity", false,
     "Antecedent=TVRHBA_SoftwareIdentity Dependent=CIM_ComputerSystem"},
    {"ProviderUseOfLog", "CIM_UseOfLog", false, "Antecedent=TVRHBA_RecordLog Dependent=TVRHBA_SoftwareIdentity"},
    {"Realizes", "CIM_Realizes", false, "Antecedent=TVRHBA_Card Dependent=TVRHBA_PortController"},
    {"RecordAppliesToElement", "CIM_RecordAppliesToElement", false,
     "Antecedent=CIM_DiagnosticRecord Dependent=TVRHBA_PortController"},
    {"RecordLogCapabilities", "CIM_ElementCapabilities", false,
     "ManagedElement=TVRHBA_RecordLog Capabilities=TVRHBA_EnabledRecordLogCapabilities"},
    {"RecordLogConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_RecordLog"},
    {"RecordLogManagesRecord", "CIM_LogManagesRecord", true, "Log=TVRHBA_RecordLog Record=TVRHBA_LogEntry"},
    {"ReferencedProfile", "CIM_ReferencedProfile", false,
     "Antecedent=TVRHBA_RegisteredProfile Dependent=TVRHBA_RegisteredProfile"},
    {"RemoteHostedAccessPoint", "CIM_HostedAccessPoint", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_RemoteServiceAccessPoint"},
    {"SAPAvailableForElement", "CIM_SAPAvailableForElement", false,
     "AvailableSAP=TVRHBA_RemoteServiceAccessPoint ManagedElement=CIM_ComputerSystem"},
    {"SCSIArbitraryLogicalUnitSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_SCSIArbitraryLogicalUnit"},
    {"SCSIInitiatorTargetArbitraryLogicalUnitPath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_SCSIProtocolEndpoint "
     "LogicalUnit=TVRHBA_SCSIArbitraryLogicalUnit"},
    {"SCSIInitiatorTargetLogicalDiskPath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_SCSIProtocolEndpoint "
     "LogicalUnit=TVRHBA_LogicalDisk"},
    {"SCSIInitiatorTargetStorageExtentPath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_SCSIProtocolEndpoint "
     "LogicalUnit=TVRHBA_StorageExtent"},
    {"SCSIInitiatorTargetStorageVolumePath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_SCSIProtocolEndpoint "
     "LogicalUnit=TVRHBA_StorageVolume"},
    {"SCSIInitiatorTargetTapeDrivePath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_SCSIProtocolEndpoint LogicalUnit=TVRHBA_TapeDrive"},
    {"SCSIProtocolControllerSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_SCSIProtocolController"},
    {"ServiceAffectsElement", "CIM_ServiceAffectsElement", false,
     "AffectedElement=TVRHBA_PortController AffectingElement=TVRHBA_FCHBADiagnosticTest"},
    {"ServiceAvailableToElement", "CIM_ServiceAvailableToElement", false,
     "ServiceProvided=TVRHBA_HelpService UserOfService=TVRHBA_FCHBADiagnosticTest"},
    {"SoftwareConformsToProfile", "CIM_ElementConformsToProfile", false,
     "ConformantStandard=TVRHBA_RegisteredProfile ManagedElement=TVRHBA_SoftwareIdentity"},
    {"StorageExtentSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_StorageExtent"},
    {"StorageVolumeSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_StorageVolume"},
    {"SystemDevice", "CIM_SystemDevice", true, "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_PCIDevice"},
    {"TapeDriveSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_TapeDrive"},
    {"TransceiverComponent", "CIM_ConcreteComponent", true,
     "GroupComponent=TVRHBA_PortController PartComponent=TVRHBA_Transceiver"},
    {"UseOfLog", "CIM_UseOfLog", false, "Antecedent=TVRHBA_DiagnosticsLog Dependent=TVRHBA_FCHBADiagnosticTest"},
    {"VMSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_VirtualFCPort"},
    {"VPortHostedDependency", "CIM_HostedDependency", false, "Antecedent=TVRHBA_FCPort Dependent=TVRHBA_VirtualFCPort"},
    {"VirtualDeviceSAPImplementation", "CIM_DeviceSAPImplementation", false,
     "Antecedent=TVRHBA_VirtualFCPort Dependent=CIM_SCSIProtocolEndpoint"},
    {"VirtualLocalHostedAccessPoint", "CIM_HostedAccessPoint", false,
     "Antecedent=CIM_ComputerSystem Dependent=TVRHBA_VirtualSCSIProtocolTargetEndpoint"},
    {"VirtualSCSIInitiatorTargetLogicalUnitPath", "CIM_SCSIInitiatorTargetLogicalUnitPath", true,
     "Initiator=TVRHBA_SCSIProtocolInitiatorEndpoint Target=TVRHBA_VirtualSCSIProtocolTargetEndpoint "
     "LogicalUnit=TVRHBA_VirtualStorageVolume"},
    {"VirtualStorageVolumeSystemDevice", "CIM_SystemDevice", true,
     "GroupComponent=CIM_ComputerSystem PartComponent=TVRHBA_VirtualStorageVolume"},
};

TEST(ServedClasses, HaveTheirSuperclassKeysAndFeatures)
{
    for (const ClassRow& row : plain_classes)
    {
        SCOPED_TRACE(row.name);
        const Meta_Class& mc = class_named(std::string("TVRHBA_") + row.name);
        EXPECT_EQ(mc.flags, META_CLASS);
        EXPECT_STREQ(mc.super_meta_class->name, row.superclass);
        EXPECT_EQ(mc.num_meta_features, row.total);
        EXPECT_EQ(std::accumulate(mc.locals, mc.locals + mc.num_meta_features, 0u), row.own);
        EXPECT_EQ(names_with(mc, META_KEY), row.keys);
    }
}

TEST(ServedAssociations, HaveTheirSuperclassFlagsAndEnds)
{
    for (const AssociationRow& row : associations)
    {
        SCOPED_TRACE(row.name);
        const Meta_Class& mc = class_named(std::string("TVRHBA_") + row.name);
        EXPECT_EQ(mc.flags, row.aggregation ? META_ASSOCIATION | META_AGGREGATION : META_ASSOCIATION);
        EXPECT_STREQ(mc.super_meta_class->name, row.superclass);
        std::string ends;
        for (std::size_t i = 0; i < mc.num_meta_features; i++)
        {
            if (const Meta_Reference* mr = as_reference(mc.meta_features[i]))
            {
                EXPECT_TRUE(mr->flags & META_KEY) << mr->name;
                ends += (ends.empty() ? "" : " ") + std::string(mr->name) + "=" + mr->meta_class->name;
            }
        }
        EXPECT_EQ(ends, row.ends);
    }
}

TEST(ServedClasses, AreAllListedHere)
{
    EXPECT_EQ(std::size(plain_classes), 54u);
    EXPECT_EQ(std::size(associations), 105u);
    EXPECT_EQ(std::count_if(std::begin(associations), std::end(associations),
                            [](const AssociationRow& row) { return row.aggregation; }),
              29);
}

} // namespace

} // namespace cimple
