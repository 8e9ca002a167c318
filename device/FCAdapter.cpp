#include "device/FCAdapter.h"

#include "device/AttributeBlock.h"
#include "device/FCPort.h"
#include "device/ForeignText.h"
#include "device/HbaAdapter.h"
#include "foundation/Log.h"
#include "runtime/base/Memory.h"

#include <algorithm>
#include <exception>

namespace cimple
{

namespace
{

/// The largest cards have four ports; a count beyond this is no count.
constexpr std::uint32_t maxPorts = 256;

using Attributes = FCAdapterAttributes;

struct Source
{
    HBA_WWN wwpn;
    AttributeBlock block;
};

struct AttributeRow
{
    std::uint32_t id; ///< 0 for what has a call of its own
    const char* label;
    void (*read)(Attributes& to, const Source& from, const AttributeRow& row);
};

template <std::uint32_t Attributes::*Field> void number(Attributes& to, const Source& from, const AttributeRow& row)
{
    readAdapterNumber(from.block, row.id, row.label, to.*Field);
}

template <std::string Attributes::*Field> void text(Attributes& to, const Source& from, const AttributeRow& row)
{
    readText(from.block, row.id, row.label, to.*Field);
}

void boardTemperature(Attributes& to, const Source& from, const AttributeRow& row)
{
    std::uint32_t word = 0;
    if (readAdapterNumber(from.block, row.id, row.label, word) != RM_OK)
        return;
    to.boardTemperature = word & 0xFF;
    to.boardTemperatureThreshold = word >> 8 & 0xFF;
    to.boardTemperatureState = word >> 16 & 0xFF;
}

void bootCodeEnabled(Attributes& to, const Source& from, const AttributeRow& row)
{
    std::uint32_t enabled = 0;
    to.bootCodeEnabled = readAdapterNumber(from.block, row.id, row.label, enabled) == RM_OK && enabled != 0;
}

void ieeeAddress(Attributes& to, const Source& from, const AttributeRow& row)
{
    readMacAddress(from.block, row.id, row.label, to.ieeeAddress);
}

void driverType(Attributes& to, const Source& from, const AttributeRow& row)
{
    std::uint32_t type = 0;
    const RM_STATUS status = LRM_GetDriverType(from.wwpn, &type);
    if (logAdapterNumber(status, row.label, type) == RM_OK)
        to.driverType = type;
}

constexpr AttributeRow attributeRows[] = {
    {RM_HA_NODE_SYMBOLIC_NAME, "_NodeSymbolicName", text<&Attributes::nodeSymbolicName>},
    {RM_HA_OPTION_ROM_VERSION, "_OptionROMVersion", text<&Attributes::optionROMVersion>},
    {RM_HA_BOARD_TEMPERATURE, "_BoardTemperature", boardTemperature},
    {RM_HA_DEVICE_ID, "_DeviceID", number<&Attributes::deviceID>},
    {RM_HA_MODEL_ID, "_ModelID", number<&Attributes::modelID>},
    {0, "_DriverType", driverType},
    {RM_HA_DIAG_VERSION, "_DiagVersion", number<&Attributes::diagVersion>},
    {RM_HA_PORT_NUMBER, "_PortNumber", number<&Attributes::portNumber>},
    {RM_HA_FUNCTION_TYPE, "_FunctionType", number<&Attributes::functionType>},
    {RM_HA_SLI_MODE, "_SLIMode", number<&Attributes::sliMode>},
    {RM_HA_PCI_FUNCTION_NUMBER, "_PCIFunctionNumber", number<&Attributes::pciFunctionNumber>},
    {RM_HA_PCI_BUS_NUMBER, "_PCIBusNumber", number<&Attributes::pciBusNumber>},
    {RM_HA_IEEE_ADDRESS, "_IEEE_ADDRESS", ieeeAddress},
    {RM_HA_BOOT_BIOS_VERSION, "_BOOTBIOS_VERSION", text<&Attributes::bootBiosVersion>},
    {RM_HA_KERNEL_VERSION, "_KERNEL_VERSION", text<&Attributes::kernelVersion>},
    {RM_HA_INITIAL_FIRMWARE, "INITIAL_FW_LOAD", text<&Attributes::initialFirmware>},
    {RM_HA_OPERATIONAL_FIRMWARE, "Operational Firmware", text<&Attributes::operationalFirmware>},
    {RM_HA_FIRMWARE_ON_FLASH, "_FirmwareOnFlash", text<&Attributes::firmwareOnFlash>},
    {RM_HA_FC_UNIVERSAL_VERSION, "_FCUniversalVersion", text<&Attributes::fcUniversalVersion>},
    {RM_HA_FC_X86_BIOS_VERSION, "FC_X86_BIOSVersion", text<&Attributes::fcX86BiosVersion>},
    {RM_HA_FC_EFI_VERSION, "_FC_EFIVersion", text<&Attributes::fcEfiVersion>},
    {RM_HA_FC_FCODE_VERSION, "_FC_FCODEVersion", text<&Attributes::fcFcodeVersion>},
    {RM_HA_ULP_FIRMWARE_VERSION, "_ULPFirmwareVersion", text<&Attributes::ulpFirmwareVersion>},
    {RM_HA_ULP_FIRMWARE_NAME, "_ULPFirmwareName", text<&Attributes::ulpFirmwareName>},
    {RM_HA_SP_FIRMWARE_VERSION, "_SPFirmwareVersion", text<&Attributes::spFirmwareVersion>},
    {RM_HA_SP_FIRMWARE_NAME, "_SPFirmwareName", text<&Attributes::spFirmwareName>},
    {RM_HA_SLI1_FIRMWARE_NAME, "_SLI1FirmwareName", text<&Attributes::sli1FirmwareName>},
    {RM_HA_SLI2_FIRMWARE_NAME, "_SLI2FirmwareName", text<&Attributes::sli2FirmwareName>},
    {RM_HA_SLI3_FIRMWARE_NAME, "_SLI3FirmwareName", text<&Attributes::sli3FirmwareName>},
    {RM_HA_SUBADAPTER_ID, "_SubadapterID", text<&Attributes::subadapterID>},
    {RM_HA_BOOT_CODE_ENABLED, "_BootCodeEnabled", bootCodeEnabled},
};

void copyFields(Attributes& to, const HBA_ADAPTERATTRIBUTES& from)
{
    to.manufacturer = foreignText(from.Manufacturer);
    to.serialNumber = foreignText(from.SerialNumber);
    to.model = foreignText(from.Model);
    to.modelDescription = foreignText(from.ModelDescription);
    to.nodeSymbolicName = foreignText(from.NodeSymbolicName);
    to.hardwareVersion = foreignText(from.HardwareVersion);
    to.driverVersion = foreignText(from.DriverVersion);
    to.firmwareVersion = foreignText(from.FirmwareVersion);
    to.driverName = foreignText(from.DriverName);
    to.nodeWWN = wwnText(from.NodeWWN);
    to.vendorSpecificID = from.VendorSpecificID;
    to.numberOfPorts = from.NumberOfPorts;
}

} // namespace

FCAdapterAttributes::FCAdapterAttributes(const std::string& adapterName)
{
    TVR_LOG(TVR_DBG, "FCAdapterName:%s", adapterName.c_str());
    readHbaAttributes(adapterName);
    readRmAttributes();
}

void FCAdapterAttributes::readHbaAttributes(const std::string& adapterName)
{
    const HbaAdapter adapter(adapterName);
    HBA_ADAPTERATTRIBUTES record;
    HBA_STATUS status =
        readRefreshed(adapter, record, 1,
                      [&](HBA_ADAPTERATTRIBUTES* out) { return HBA_GetAdapterAttributes(adapter.handle(), out); });
    if (status == HBA_STATUS_OK)
        copyFields(*this, record);
    else
        TVR_LOG(TVR_ERR, "Error hbaStatus=%d, skipping Adapter %s", status, adapterName.c_str());

    HBA_PORTATTRIBUTES port0;
    status = readPortAttributes(adapter, 0, port0, 1);
    if (status != HBA_STATUS_OK)
    {
        TVR_LOG(TVR_ERR, "(portIndex = %d) failed with hbaStatus %d", 0, status);
        throw std::exception();
    }
    port0WWPN = wwnText(port0.PortWWN);
    TVR_LOG(TVR_DBG, "Port 0's WWPN: %s", port0WWPN.c_str());
}

void FCAdapterAttributes::readRmAttributes()
{
    Source source{wwnOf(port0WWPN), AttributeBlock(RM_HBA_ATTRIBUTES_SIZE)};
    if (const RM_STATUS status = source.block.fetch(LRM_GetHBAAttributes, source.wwpn); status != RM_OK)
    {
        TVR_LOG(TVR_ERR, "ERROR: RM_GetHBAAttributes call failed (%d)", status);
        throw std::exception();
    }
    for (const AttributeRow& row : attributeRows)
        row.read(*this, source, row);
}

FCAdapter::FCAdapter(const std::string& adapterName, std::uint32_t number) : Adapter(adapterName, number, fibreChannel)
{
    auto facts = std::make_unique<FCAdapterAttributes>(name);
    functionType = facts->functionType;
    const std::uint32_t portCount = std::min(facts->numberOfPorts, maxPorts);
    attributes = std::move(facts);
    statistics = std::make_unique<FCAdapterStatistics>();
    ports.reserve(portCount);
    for (std::uint32_t index = 0; index < portCount; ++index)
        try
        {
            ports.push_back(new FCPort(*this, index));
        }
        catch (...)
        {
            note_missing_memory();
            TVR_LOG(TVR_ERR, "Failed to fetch information for port: [%d] on adapter: [%s]", index, name.c_str());
        }
}

FCAdapter::~FCAdapter()
{
    TVR_LOG(TVR_DBG, "~FCAdapter");
}

void FCAdapter::rescanTargets()
{
    TVR_LOG(TVR_DBG, "FCAdapter::rescanTargets");
    for (Port* port : ports)
        try
        {
            port->rescanTargets(*this);
        }
        catch (...)
        {
            note_missing_memory();
            TVR_LOG(TVR_ERR, "Issue with Target Rescan - moving to the next Port");
        }
}

} // namespace cimple
