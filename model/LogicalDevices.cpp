#include "model/LogicalDevices.h"

#include "model/UnitNames.h"
#include "schema/TVRHBA_LogicalDiskSystemDevice.h"
#include "schema/TVRHBA_SCSIArbitraryLogicalUnitSystemDevice.h"
#include "schema/TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath.h"
#include "schema/TVRHBA_SCSIInitiatorTargetLogicalDiskPath.h"
#include "schema/TVRHBA_SCSIInitiatorTargetStorageExtentPath.h"
#include "schema/TVRHBA_SCSIInitiatorTargetStorageVolumePath.h"
#include "schema/TVRHBA_SCSIInitiatorTargetTapeDrivePath.h"
#include "schema/TVRHBA_StorageExtentSystemDevice.h"
#include "schema/TVRHBA_StorageVolumeSystemDevice.h"
#include "schema/TVRHBA_TapeDriveSystemDevice.h"

#include <algorithm>
#include <span>

namespace cimple
{

namespace
{

// --- names ------------------------------------------------------------------------------------------------

/// A value for some types and the text that stands for it; texts may take a number.
struct NameRow
{
    std::uint32_t deviceType;
    const char* text;
};

constexpr const char* unknownDevice = "Unknown device %d";

constexpr NameRow arbitraryUnitNames[] = {
    {12, "Storage array controller %d"},
    {13, "Enclosure services %d"},
    {16, "Bridge controller %d"},
};

constexpr NameRow extentNames[] = {
    {2, "Printer %d"},
    {3, "Processor %d"},
    {4, "Write-once device %d"},
    {5, "CD/DVD %d"},
    {6, "Scanner %d"},
    {7, "Optical memory device %d"},
    {8, "Jukebox %d"},
    {9, "Communications device %d"},
    {15, "Optical card reader/writer %d"},
    {17, "Object-based storage device %d"},
};

int osLun(const LogicalUnit& unit)
{
    return static_cast<int>(unit.target.scsiOSLun);
}

String nameByType(std::span<const NameRow> names, const LogicalUnit& unit)
{
    const auto row = std::ranges::find(names, unit.target.deviceType, &NameRow::deviceType);
    return formatText(row == names.end() ? unknownDevice : row->text, osLun(unit));
}

// --- properties -------------------------------------------------------------------------------------------

template <class Device>
Prototype<Device> makePrototype(const CIM_ComputerSystem& system, const char* firstDescription,
                                const char* secondDescription)
{
    Ref<Device> device = fresh<Device>();
    setSystem(*device, system);
    device->CreationClassName.set(className<Device>());
    device->OperationalStatus.set({0});
    device->IdentifyingDescriptions.set({firstDescription, secondDescription});
    return Prototype<Device>(device);
}

/// What all devices have.
template <class Device> Ref<Device> makeDevice(const Prototype<Device>& prototype, const LogicalUnit& unit)
{
    Ref<Device> device = prototype.copy();
    device->Description.set(unit.description);
    device->DeviceID.set(unit.deviceId);
    return device;
}

/// Read Capacity tells the last block; without an answer there is no block size.
std::uint64_t numberOfBlocks(const Target& target)
{
    return target.blockLength ? target.lastLba + 1 : 0;
}

template <class Device> void setCapacity(Device& device, const LogicalUnit& unit)
{
    const std::uint64_t blocks = numberOfBlocks(unit.target);
    if (blocks == 0)
        return;
    device.Capacity.set(unit.target.blockLength * blocks);
    device.CapacityUnit.set(unit.prototypes.capacityUnit);
}

template <class Device> void setBlocks(Device& device, const LogicalUnit& unit)
{
    const std::uint64_t blocks = numberOfBlocks(unit.target);
    if (blocks == 0)
        return;
    device.BlockSize.set(unit.target.blockLength);
    device.NumberOfBlocks.set(blocks);
}

std::uint16_t deviceType(const LogicalUnit& unit)
{
    return static_cast<std::uint16_t>(unit.target.deviceType);
}

// --- insertion --------------------------------------------------------------------------------------------

/// What the log says of the devices of a class.
struct DeviceTexts
{
    LogText deviceRefused;
    const char* generating; ///< of the association with the system, with the DeviceID
    LogText systemDeviceRefused;
    LogText creating; ///< of the path
    LogText pathRefused;
};

/// Puts the device in its map, and what it is associated with.
template <class SystemDevice, class Path, class Device>
std::uint32_t insertDevice(const LogicalUnit& unit, const Ref<Device>& made, const DeviceTexts& texts)
{
    if (!mapOf<Device>(unit.agent).insert(made, texts.deviceRefused))
        return BUILD_FAILED;
    TVR_LOG(TVR_DBG, texts.generating, unit.deviceId.c_str());
    if (insertFilled(mapOf<SystemDevice>(unit.agent), texts.systemDeviceRefused,
                     [&](SystemDevice& association)
                     {
                         association.GroupComponent = Ref(unit.system).release();
                         association.PartComponent = Ref(made).release();
                     }) == Joined::Refused)
        return BUILD_FAILED;
    texts.creating.log();
    const Joined path = insertFilled(mapOf<Path>(unit.agent), texts.pathRefused,
                                     [&](Path& association)
                                     {
                                         association.Initiator = Ref(unit.initiator).release();
                                         association.Target = Ref(unit.endpoint).release();
                                         association.LogicalUnit = Ref(made).release();
                                     });
    return path == Joined::Refused ? BUILD_FAILED : BUILD_DONE;
}

// --- one function a class -----------------------------------------------------------------------------------

std::uint32_t createStorageVolume(const LogicalUnit& unit)
{
    Ref<TVRHBA_StorageVolume> volume = makeDevice(unit.prototypes.volume, unit);
    volume->ElementName.set(joinTexts({"Storage Volume: ", std::to_string(osLun(unit))}));
    volume->Name.set(refinedName(unit.target.designator, unit.identifier));
    setNameFormat(*volume, unit.target.designator);
    setBlocks(*volume, unit);
    setCapacity(*volume, unit);
    volume->DeviceType.set(deviceType(unit));
    volume->OtherIdentifyingInfo.set({unit.osDeviceName, unit.inquiry});
    return insertDevice<TVRHBA_StorageVolumeSystemDevice, TVRHBA_SCSIInitiatorTargetStorageVolumePath>(
        unit, volume,
        {
            "Insert Failed : m_TVRHBA_StorageVolume_map",
            "Generating TVRHBA_StorageVolumeSystemDevice (Storage Volume: %s)",
            "Insert Failed : m_TVRHBA_StorageVolumeSystemDevice_map",
            {TVR_DBG, "creating TVRHBA_SCSIInitiatorTargetStorageVolumePath - Storage Volume"},
            "Insert Failed : m_TVRHBA_SCSIInitiatorTargetStorageVolumePath_map",
        });
}

std::uint32_t createTapeDrive(const LogicalUnit& unit)
{
    const Target& target = unit.target;
    Ref<TVRHBA_TapeDrive> tape = makeDevice(unit.prototypes.tape, unit);
    tape->ElementName.set(formatText("Tape Drive %d", osLun(unit)));
    tape->Name.set(unit.osDeviceName);
    setCapacity(*tape, unit);
    tape->DeviceType.set(deviceType(unit));
    tape->OtherIdentifyingInfo.set(
        {unit.osDeviceName, joinTexts({target.vendor, " ", target.product, " ", target.revision})});
    return insertDevice<TVRHBA_TapeDriveSystemDevice, TVRHBA_SCSIInitiatorTargetTapeDrivePath>(
        unit, tape,
        {
            "Insert Failed : m_TVRHBA_TapeDrive_map",
            "Generating TVRHBA_TapeDriveSystemDevice (Tape Drive: %s)",
            "Insert Failed : m_TVRHBA_TapeDriveSystemDevice_map",
            {TVR_DBG, "creating TVRHBA_SCSIInitiatorTargetTapeDrivePath - Tape Drive"},
            "Insert Failed : m_TVRHBA_SCSIInitiatorTargetTapeDrivePath_map",
        });
}

std::uint32_t createLogicalDisk(const LogicalUnit& unit)
{
    constexpr std::uint16_t runningFullPower = 3; // it has just answered an Inquiry
    Ref<TVRHBA_LogicalDisk> disk = makeDevice(unit.prototypes.disk, unit);
    disk->ElementName.set(formatText("Object-based storage device: %d", osLun(unit)));
    disk->Name.set(refinedName(unit.target.designator, unit.identifier));
    setBlocks(*disk, unit);
    setCapacity(*disk, unit);
    disk->AdditionalAvailability.set({runningFullPower});
    disk->OtherIdentifyingInfo.set({unit.osDeviceName, unit.inquiry});
    return insertDevice<TVRHBA_LogicalDiskSystemDevice, TVRHBA_SCSIInitiatorTargetLogicalDiskPath>(
        unit, disk,
        {
            "Insert Failed : m_TVRHBA_LogicalDisk_map",
            "Generating TVRHBA_LogicalDiskSystemDevice (Logical Disk: %s)",
            "Insert Failed : m_TVRHBA_LogicalDiskSystemDevice_map",
            {TVR_DBG, "creating TVRHBA_SCSIInitiatorTargetLogicalDiskPath - Logical Disk"},
            "Insert Failed : m_TVRHBA_SCSIInitiatorTargetLogicalDiskPath_map",
        });
}

std::uint32_t createArbitraryLogicalUnit(const LogicalUnit& unit)
{
    Ref<TVRHBA_SCSIArbitraryLogicalUnit> device = makeDevice(unit.prototypes.arbitrary, unit);
    device->ElementName.set(nameByType(arbitraryUnitNames, unit));
    device->Name.set(refinedName(unit.target.designator, unit.identifier));
    device->OtherDeviceType.set(formatText("Peripheral devices type is 0x%02X", unit.target.deviceType));
    device->OtherIdentifyingInfo.set({unit.osDeviceName, unit.inquiry});
    return insertDevice<TVRHBA_SCSIArbitraryLogicalUnitSystemDevice,
                        TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath>(
        unit, device,
        {
            "Insert Failed : m_TVRHBA_SCSIArbitraryLogicalUnit_map",
            "Generating TVRHBA_SCSIArbitraryLogicalUnitSystemDevice (SCSI Arbitrary Logical Unit: %s)",
            "Insert Failed : m_TVRHBA_SCSIArbitraryLogicalUnitSystemDevice_map",
            {TVR_DBG, "creating TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath - SCSI Arbitrary Logical Unit"},
            "Insert Failed : m_TVRHBA_SCSIInitiatorTargetArbitraryLogicalUnitPath_map",
        });
}

std::uint32_t createStorageExtent(const LogicalUnit& unit)
{
    Ref<TVRHBA_StorageExtent> extent = makeDevice(unit.prototypes.extent, unit);
    extent->ElementName.set(nameByType(extentNames, unit));
    extent->Name.set(refinedName(unit.target.designator, unit.identifier));
    setBlocks(*extent, unit);
    setCapacity(*extent, unit);
    extent->DeviceType.set(deviceType(unit));
    extent->OtherIdentifyingInfo.set({unit.osDeviceName, unit.inquiry});
    return insertDevice<TVRHBA_StorageExtentSystemDevice, TVRHBA_SCSIInitiatorTargetStorageExtentPath>(
        unit, extent,
        {
            "Insert Failed : m_TVRHBA_StorageExtent_map",
            "Generating TVRHBA_StorageExtentSystemDevice (Storage Extent: %s)",
            "Insert Failed : m_TVRHBA_StorageExtentSystemDevice_map",
            {TVR_DBG, "creating TVRHBA_SCSIInitiatorTargetStorageExtentPath - Storage Extent"},
            "Insert Failed : m_TVRHBA_SCSIInitiatorTargetStorageExtentPath_map",
        });
}

/// The devices that are not extents, by peripheral device type.
struct DeviceRow
{
    std::uint32_t type;
    std::uint32_t (*create)(const LogicalUnit& unit);
};

constexpr DeviceRow devices[] = {
    {0, createStorageVolume},         {14, createStorageVolume},        {1, createTapeDrive},
    {12, createArbitraryLogicalUnit}, {13, createArbitraryLogicalUnit}, {16, createArbitraryLogicalUnit},
    {17, createLogicalDisk},
};

} // namespace

DevicePrototypes::DevicePrototypes(const CIM_ComputerSystem& system)
    : volume(makePrototype<TVRHBA_StorageVolume>(system, "OS Device Name", "Standard SCSI inquiry data")),
      tape(makePrototype<TVRHBA_TapeDrive>(system, "OS Device Name", "standard SCSI Inquery data")),
      disk(makePrototype<TVRHBA_LogicalDisk>(system, "OS Device Name", "Standard SCSI inquiry data")),
      arbitrary(makePrototype<TVRHBA_SCSIArbitraryLogicalUnit>(system, "OS Device Name", "Standard SCSI inquiry data")),
      // Clients know the two descriptions in this order, which is not that of the values.
      extent(makePrototype<TVRHBA_StorageExtent>(system, "Standard SCSI inquiry data", "OS Device Name"))
{}

std::uint32_t createLogicalDevice(const LogicalUnit& unit)
{
    const auto row = std::ranges::find(devices, unit.target.deviceType, &DeviceRow::type);
    return row == std::end(devices) ? createStorageExtent(unit) : row->create(unit);
}

} // namespace cimple
