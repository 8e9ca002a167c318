#include "foundation/HbaAttributes.h"

#include "foundation/CommonHelpers.h"
#include "foundation/Text.h"

#include <algorithm>
#include <cstdio>

namespace cimple
{

void copyAdapterAttributes(HBA_ADAPTERATTRIBUTES& out, const HBA_ADAPTERATTRIBUTES& in)
{
    copyField(out.Manufacturer, in.Manufacturer);
    copyField(out.SerialNumber, in.SerialNumber);
    copyField(out.Model, in.Model);
    copyField(out.ModelDescription, in.ModelDescription);
    out.NodeWWN = in.NodeWWN;
    copyField(out.NodeSymbolicName, in.NodeSymbolicName);
    copyField(out.HardwareVersion, in.HardwareVersion);
    copyField(out.DriverVersion, in.DriverVersion);
    copyField(out.OptionROMVersion, in.OptionROMVersion);
    copyField(out.FirmwareVersion, in.FirmwareVersion);
    out.VendorSpecificID = in.VendorSpecificID;
    out.NumberOfPorts = in.NumberOfPorts;
    copyField(out.DriverName, in.DriverName);
}

void copyPortAttributes(HBA_PORTATTRIBUTES& out, const HBA_PORTATTRIBUTES& in)
{
    out.NodeWWN = in.NodeWWN;
    out.PortWWN = in.PortWWN;
    out.PortFcId = in.PortFcId;
    out.PortType = in.PortType;
    out.PortState = in.PortState;
    out.PortSupportedClassofService = in.PortSupportedClassofService;
    out.PortSupportedFc4Types = in.PortSupportedFc4Types;
    out.PortActiveFc4Types = in.PortActiveFc4Types;
    copyField(out.PortSymbolicName, in.PortSymbolicName);
    copyField(out.OSDeviceName, in.OSDeviceName);
    out.PortSupportedSpeed = in.PortSupportedSpeed;
    out.PortSpeed = in.PortSpeed;
    out.PortMaxFrameSize = in.PortMaxFrameSize;
    out.FabricName = in.FabricName;
    out.NumberofDiscoveredPorts = in.NumberofDiscoveredPorts;
}

void formatNodeAttributes(const HBA_ADAPTERATTRIBUTES* attributes, std::span<char> out)
{
    out[0] = '\0';
    if (!attributes)
        return;
    const struct
    {
        const char* label;
        String value;
    } lines[] = {
        {"Manufacturer: ", fieldText(attributes->Manufacturer)},
        {"NodeWWN: ", wwnToUpperHex(attributes->NodeWWN.wwn)},
        {"ModelDescription: ", fieldText(attributes->ModelDescription)},
        {"NodeSymbolicName: ", fieldText(attributes->NodeSymbolicName)},
        {"HardwareVersion: ", fieldText(attributes->HardwareVersion)},
        {"DriverVersion: ", fieldText(attributes->DriverVersion)},
        {"FirmwareVersion: ", fieldText(attributes->FirmwareVersion)},
        {"DriverName: ", fieldText(attributes->DriverName)},
    };
    std::size_t used = 0;
    for (const auto& line : lines)
    {
        const int size = std::snprintf(&out[used], out.size() - used, "%s%s\n", line.label, line.value.c_str());
        used = std::min(used + static_cast<std::size_t>(size), out.size() - 1);
    }
}

} // namespace cimple
