// The PCI device of a port, from the registers that the RM library reads.
#include "agent/Build.h"
#include "device/Bindings.h"
#include "device/TVR_MethodWrapper.h"
#include "model/PhysicalModel.h"
#include "model/VitalProductData.h"
#include "schema/TVRHBA_PCIDevice.h"
#include "schema/TVRHBA_PCIElementConformsToProfile.h"
#include "schema/TVRHBA_RegisteredProfile.h"
#include "schema/TVRHBA_SystemDevice.h"

namespace cimple
{

namespace
{

using Device = TVRHBA_PCIDevice;

/// Little-endian values of the configuration header (PCI Local Bus 3.0, 6.1).
std::uint8_t byteAt(const RM_PciRegisters& registers, unsigned offset)
{
    return registers.header[offset];
}
std::uint16_t wordAt(const RM_PciRegisters& registers, unsigned offset)
{
    return static_cast<std::uint16_t>(byteAt(registers, offset) | byteAt(registers, offset + 1) << 8);
}
std::uint32_t longAt(const RM_PciRegisters& registers, unsigned offset)
{
    return wordAt(registers, offset) | static_cast<std::uint32_t>(wordAt(registers, offset + 2)) << 16;
}

void fillHeader(Device& device, const RM_PciRegisters& registers)
{
    device.VendorID.set(wordAt(registers, 0));
    device.Command.set(wordAt(registers, 4));
    device.PCIStatus.set(wordAt(registers, 6));
    device.RevisionID.set(byteAt(registers, 8));
    device.ProgIf.set(byteAt(registers, 9));
    device.SubClass.set(byteAt(registers, 10));
    device.BaseClass.set(byteAt(registers, 11));
    device.CacheLineSize.set(byteAt(registers, 12));
    device.LatencyTimer.set(byteAt(registers, 13));
    device.HeaderType.set(byteAt(registers, 14));
    device.BuiltInSelfTest.set(byteAt(registers, 15));
    device.BaseAddresses0.set(longAt(registers, 16));
    device.BaseAddresses1.set(longAt(registers, 20));
    device.BaseAddresses2.set(longAt(registers, 24));
    device.BaseAddresses3.set(longAt(registers, 28));
    device.BaseAddresses4.set(longAt(registers, 32));
    device.BaseAddresses5.set(longAt(registers, 36));
    device.CIS.set(longAt(registers, 40));
    device.SubVendorID.set(wordAt(registers, 44));
    device.SubsystemID.set(wordAt(registers, 46));
    device.ExpansionROMBaseAddress.set(longAt(registers, 48));
    device.CapabilitiesPtr.set(byteAt(registers, 52));
    device.InterruptLine.set(byteAt(registers, 60));
    device.InterruptPin.set(byteAt(registers, 61));
    device.MinimumGrant.set(byteAt(registers, 62));
    device.MaximumLatency.set(byteAt(registers, 63));
    device.PCIType.set(registers.pciType);
}

/// A word of the chip-dependent area and the property it fills.
struct WordRow
{
    unsigned word;
    Property<std::uint32_t> Device::*property;
};

constexpr WordRow ondrialWords[] = {
    {0, &Device::FeatureEnable}, {1, &Device::PCIXCommand}, {2, &Device::PCIXStatus}, {3, &Device::PwrMgtCaps},
    {4, &Device::PwrMgtCtrl},    {5, &Device::MSICtrl},     {6, &Device::MSILowAddr}, {7, &Device::MSIHighAddr},
    {8, &Device::MSIData},       {9, &Device::VPDAddr},
};

constexpr WordRow solmarWords[] = {
    {0, &Device::FeatureEnable},    {1, &Device::PCIXCommand},     {2, &Device::PCIXStatus},
    {3, &Device::ECCControlStatus}, {4, &Device::ECCFirstAddress}, {5, &Device::ECCSecondAddress},
    {6, &Device::ECCAttribute},     {7, &Device::PwrMgtCaps},      {8, &Device::PwrMgtCtrl},
    {9, &Device::MSICtrl},          {10, &Device::MSILowAddr},     {11, &Device::MSIHighAddr},
    {12, &Device::MSIData},         {13, &Device::VPDAddr},        {15, &Device::HotSwap},
};

constexpr WordRow pcieWords[] = {
    {0, &Device::FeatureEnable},
    {6, &Device::PwrMgtCaps},
    {7, &Device::PwrMgtCtrl},
    {8, &Device::MSICtrl},
    {9, &Device::MSILowAddr},
    {10, &Device::MSIHighAddr},
    {11, &Device::MSIData},
    {48, &Device::EnhancedCapHdrAER},
    {49, &Device::UncorrectableErrStat},
    {50, &Device::UncorrectableErrMask},
    {51, &Device::UncorrectableErrSeverity},
    {52, &Device::CorrectableErrStat},
    {53, &Device::CorrectableErrMask},
    {54, &Device::AdvErrCapCtl},
    {55, &Device::HeaderLog0x0},
    {56, &Device::HeaderLog0x4},
    {57, &Device::HeaderLog0x8},
    {58, &Device::HeaderLog0xC},
    {59, &Device::EnhancedCapHdrPBUDG},
    {60, &Device::DataSelectReg},
    {61, &Device::DataReg},
    {62, &Device::PowerBudget},
};

constexpr WordRow ostrelWords[] = {
    {1, &Device::PCIECap},           {2, &Device::PCIEDeviceCapReg},         {3, &Device::PCIEDeviceStatusCtrl},
    {4, &Device::PCIEDeviceLinkCap}, {5, &Device::PCIEDeviceLinkStatusCtrl}, {12, &Device::VPDAddr},
};

constexpr WordRow calderWords[] = {
    {12, &Device::MSIMaskBits},
    {13, &Device::MSIPendingBits},
    {14, &Device::MSIXCtrl},
    {15, &Device::MSIXTableOffset},
    {16, &Device::MSIXPBAOffset},
    {17, &Device::VPDAddr},
    {21, &Device::PCIECap},
    {22, &Device::PCIEDeviceCapReg},
    {23, &Device::PCIEDeviceStatusCtrl},
    {24, &Device::PCIEDeviceLinkCap},
    {25, &Device::PCIEDeviceLinkStatusCtrl},
    {26, &Device::SlotCap},
    {27, &Device::SlotStatusCtrlReg},
    {28, &Device::RootCapCtrlReg},
    {29, &Device::RootStatusReg},
    {30, &Device::DeviceCap2Reg},
    {31, &Device::DeviceStatusCtl2Reg},
    {32, &Device::LinkCap2Reg},
    {33, &Device::LinkStatus2Ctl2Reg},
    {34, &Device::SlotCap2Reg},
    {35, &Device::SlotStatusCtl2Reg},
};

template <std::size_t count>
void fillWords(Device& device, const RM_PciRegisters& registers, const WordRow (&rows)[count])
{
    for (const WordRow& row : rows)
        (device.*row.property).set(registers.area[row.word]);
}

void appendVpdData(Device& device, const RM_PciRegisters& registers, unsigned firstWord, unsigned count)
{
    for (unsigned word = firstWord; word < firstWord + count; word++)
        device.VPDData.value.append(registers.area[word]);
    device.VPDData.null = 0;
}

/// The chip-dependent area; its form is told by the selector.
void fillArea(Device& device, const RM_PciRegisters& registers)
{
    switch (registers.pciType)
    {
    case 0:
        return;
    case 1:
    case 2:
        TVR_LOG(TVR_DBG, "Creating TVRHBA_PCIDevice for Ondrial");
        fillWords(device, registers, ondrialWords);
        appendVpdData(device, registers, 10, 1);
        if (registers.pciType == 2)
        {
            TVR_LOG(TVR_DBG, "Creating TVRHBA_PCIDevice for VARN");
            device.HotSwap.set(registers.area[11]);
        }
        return;
    case 3:
        TVR_LOG(TVR_DBG, "Creating TVRHBA_PCIDevice for Solmar");
        fillWords(device, registers, solmarWords);
        appendVpdData(device, registers, 14, 1);
        return;
    case 4:
        TVR_LOG(TVR_DBG, "Creating TVRHBA_PCIDevice for Ostrel ");
        fillWords(device, registers, pcieWords);
        fillWords(device, registers, ostrelWords);
        appendVpdData(device, registers, 13, 1);
        return;
    default:
        TVR_LOG(TVR_DBG, "Creating TVRHBA_PCIDevice for Calder ");
        fillWords(device, registers, pcieWords);
        fillWords(device, registers, calderWords);
        appendVpdData(device, registers, 18, 3);
    }
}

/// The port's registers; all zero when the library does not give them.
RM_PciRegisters readRegisters(const HBA_WWN& wwpn)
{
    RM_PciRegisters registers = {};
    const RM_STATUS status = LRM_DiagReadPCIRegistersV2(wwpn, &registers);
    if (status != 0)
    {
        TVR_LOG(TVR_CRIT, "RM_DiagReadPCIRegistersV2 call failedi with %d", status);
        registers = {};
    }
    return registers;
}

Ref<Device> makeDevice(const PortContext& port, const RM_PciRegisters& registers)
{
    Ref<Device> made = fresh<Device>();
    const FCAdapterAttributes& attributes = port.on.attributes;
    const unsigned pciDeviceId = wordAt(registers, 2);
    setSystem(*made, *port.host.system);
    made->CreationClassName.set(className<Device>());
    made->DeviceID.set(formatText("%s:0x%04X", port.port.name.c_str(), pciDeviceId));
    made->ElementName.set(formatText("Tavrin:FCAdapter%d", static_cast<int>(port.on.index)));
    made->HealthState.set(5);
    made->EnabledState.set(5);
    made->RequestedState.set(5);
    made->PrimaryStatus.set(5);
    made->FunctionNumber.set(static_cast<std::uint8_t>(attributes.pciFunctionNumber));
    made->BusNumber.set(static_cast<std::uint8_t>(attributes.pciBusNumber));
    fillHeader(*made, registers);
    fillArea(*made, registers);
    return made;
}

std::uint32_t associateDevice(HostContext& host, const Device* device)
{
    using Conforms = TVRHBA_PCIElementConformsToProfile;
    switch (join<Conforms>(host.agent, &Conforms::ConformantStandard, host.profiles.find("PCI Device"),
                           &Conforms::ManagedElement, device,
                           "Insert Failed : m_TVRHBA_PCIElementConformsToProfile_map"))
    {
    case Joined::Made:
        break;
    case Joined::Refused:
        return BUILD_FAILED;
    default:
        return failed("Failed to create TVRHBA_PCIElementConformsToProfile", BUILD_NO_INSTANCE);
    }

    using OfSystem = TVRHBA_SystemDevice;
    switch (join<OfSystem>(host.agent, &OfSystem::GroupComponent, host.system, &OfSystem::PartComponent, device,
                           "Insert Failed : m_TVRHBA_SystemDevice_map"))
    {
    case Joined::Made:
        return BUILD_DONE;
    case Joined::Refused:
        return BUILD_FAILED;
    default:
        return failed("Failed to create TVRHBA_SystemDevice", BUILD_NO_INSTANCE);
    }
}

} // namespace

std::uint32_t createPCIDeviceInstance(PortContext& port)
{
    const std::string& name = port.port.name;
    TVR_LOG(TVR_DBG, "MAC address in std::string format = %s and size = %zu", name.c_str(), name.size());
    char hbaName[24];
    HBA_WWN wwpn;
    if (TVR_MethodWrapper::Id2HBAName(hbaName, name.c_str()) != 0)
        return failed({TVR_DBG, "TVRHBA_PCIPort Id2HBAName failed"});
    if (TVR_MethodWrapper::str2HBAName(&wwpn, hbaName) != 0)
        return failed({TVR_ERR, "::str2HBAName failed"});
    const RM_PciRegisters registers = readRegisters(wwpn);

    const Ref<Device> made = unlessOutOfMemory([&] { return makeDevice(port, registers); });
    if (!made)
        return failed("Failed to create TVRHBA_PCIDevice", BUILD_NO_INSTANCE);
    const Device* device = mapOf<Device>(port.host.agent).insert(made, "Insert Failed : m_TVRHBA_PCIDevice_map");
    if (!device)
        return BUILD_FAILED;
    const std::uint32_t status = associateDevice(port.host, device);
    if (status == BUILD_DONE)
        createPortVpd(port, device);
    return status;
}

} // namespace cimple
