#include "foundation/HbaAttributes.h"

#include "foundation/CommonHelpers.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

namespace cimple
{

namespace
{

template <std::size_t N> void copyField(char (&out)[N], const char (&in)[N])
{
    const std::size_t size = strnlen(in, N - 1);
    std::memcpy(out, in, size);
    out[size] = '\0';
}

} // namespace

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
    HBA_ADAPTERATTRIBUTES ended;
    copyAdapterAttributes(ended, *attributes);
    char nodeWWN[17];
    wwnToUpperHex(ended.NodeWWN.wwn, nodeWWN);
    const struct
    {
        const char* label;
        const char* value;
    } lines[] = {
        {"Manufacturer: ", ended.Manufacturer},         {"NodeWWN: ", nodeWWN},
        {"ModelDescription: ", ended.ModelDescription}, {"NodeSymbolicName: ", ended.NodeSymbolicName},
        {"HardwareVersion: ", ended.HardwareVersion},   {"DriverVersion: ", ended.DriverVersion},
        {"FirmwareVersion: ", ended.FirmwareVersion},   {"DriverName: ", ended.DriverName},
    };
    std::size_t used = 0;
    for (const auto& line : lines)
    {
        const int size = std::snprintf(&out[used], out.size() - used, "%s%s\n", line.label, line.value);
        used = std::min(used + static_cast<std::size_t>(size), out.size() - 1);
    }
}

} // namespace cimple
