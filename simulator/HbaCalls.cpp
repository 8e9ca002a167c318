// The simulated host through the HBA API.
#include "simulator/SimulatedHost.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

/// The common library passes on no more than the low 16 bits of a handle.
constexpr HBA_HANDLE maximumHandle = 0xFFFF;

void describe(const Adapter& adapter, HBA_ADAPTERATTRIBUTES& out)
{
    setText(out.Manufacturer, adapter.manufacturer);
    setText(out.SerialNumber, adapter.serialNumber);
    setText(out.Model, adapter.model);
    setText(out.ModelDescription, adapter.modelDescription);
    out.NodeWWN = toHba(adapter.nodeWwn);
    setText(out.NodeSymbolicName, adapter.nodeSymbolicName);
    setText(out.HardwareVersion, adapter.hardwareVersion);
    setText(out.DriverVersion, adapter.driverVersion);
    setText(out.OptionROMVersion, adapter.optionRomVersion);
    setText(out.FirmwareVersion, adapter.firmwareVersion);
    out.VendorSpecificID = adapter.vendorSpecificId;
    out.NumberOfPorts = static_cast<HBA_UINT32>(adapter.ports.size());
    setText(out.DriverName, adapter.driverName);
}

void describe(const Port& port, HBA_PORTATTRIBUTES& out)
{
    out.NodeWWN = toHba(port.wwnn);
    out.PortWWN = toHba(port.wwpn);
    out.PortFcId = port.fcId;
    out.PortType = port.type;
    out.PortState = port.state;
    out.PortSupportedClassofService = port.supportedClasses;
    std::ranges::copy(port.supportedFc4Types, out.PortSupportedFc4Types.bits);
    std::ranges::copy(port.activeFc4Types, out.PortActiveFc4Types.bits);
    setText(out.PortSymbolicName, port.symbolicName);
    setText(out.OSDeviceName, port.osDeviceName);
    out.PortSupportedSpeed = port.supportedSpeed;
    out.PortSpeed = port.speed;
    out.PortMaxFrameSize = port.maxFrameSize;
    out.FabricName = toHba(port.fabricName);
    out.NumberofDiscoveredPorts = port.discoveredPorts;
}

HBA_FCPSCSIENTRY mappingEntry(const Port& port, std::size_t number, const Target& target, const LogicalUnit& unit,
                              const std::string& osDeviceName)
{
    HBA_FCPSCSIENTRY entry{};
    setText(entry.ScsiId.OSDeviceName, osDeviceName);
    entry.ScsiId.ScsiBusNumber = port.scsiBus;
    entry.ScsiId.ScsiTargetNumber = static_cast<HBA_UINT32>(number);
    entry.ScsiId.ScsiOSLun = unit.number;
    entry.FcpId.FcId = target.fcId;
    entry.FcpId.NodeWWN = toHba(target.wwnn);
    entry.FcpId.PortWWN = toHba(target.wwpn);
    entry.FcpId.FcpLun = encodeLun(unit.number);
    return entry;
}

} // namespace

HBA_STATUS SimulatedHost::loadLibrary()
{
    std::lock_guard lock(_mutex);
    if (_libraryLoaded)
        return HBA_STATUS_ERROR;
    _libraryLoaded = true;
    return HBA_STATUS_OK;
}

HBA_STATUS SimulatedHost::freeLibrary()
{
    std::lock_guard lock(_mutex);
    const HBA_STATUS status = _libraryLoaded ? HBA_STATUS_OK : HBA_STATUS_ERROR;
    _libraryLoaded = false;
    _handles.clear();
    return status;
}

std::uint32_t SimulatedHost::adapterCount() const
{
    std::lock_guard lock(_mutex);
    return _libraryLoaded ? static_cast<std::uint32_t>(_scenario.adapters.size()) : 0;
}

HBA_STATUS SimulatedHost::adapterName(std::uint32_t index, std::string& name) const
{
    std::lock_guard lock(_mutex);
    if (!_libraryLoaded)
        return HBA_STATUS_ERROR;
    if (index >= _scenario.adapters.size())
        return HBA_STATUS_ERROR_ILLEGAL_INDEX;
    name = _scenario.adapters[index].name;
    return HBA_STATUS_OK;
}

HBA_HANDLE SimulatedHost::openAdapter(const std::string& name)
{
    std::lock_guard lock(_mutex);
    if (!_libraryLoaded || !_adapterByName.contains(name) || _handles.size() >= maximumHandle)
        return 0;
    do
        _lastHandle = _lastHandle % maximumHandle + 1;
    while (_handles.contains(_lastHandle));
    _handles.emplace(_lastHandle, name);
    return _lastHandle;
}

void SimulatedHost::closeAdapter(HBA_HANDLE handle)
{
    std::lock_guard lock(_mutex);
    _handles.erase(handle);
}

void SimulatedHost::refreshInformation(HBA_HANDLE handle)
{
    std::lock_guard lock(_mutex);
    if (const auto open = _handles.find(handle); open != _handles.end())
        if (const auto place = _adapterByName.find(open->second); place != _adapterByName.end())
            _scenario.adapters[place->second].stale = false;
}

HBA_STATUS SimulatedHost::adapterAttributes(HBA_HANDLE handle, HBA_ADAPTERATTRIBUTES& out) const
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = adapterAt(handle);
    if (!adapter)
        return HBA_STATUS_ERROR_INVALID_HANDLE;
    if (adapter->stale)
        return HBA_STATUS_ERROR_STALE_DATA;
    describe(*adapter, out);
    return HBA_STATUS_OK;
}

HBA_STATUS SimulatedHost::portAttributes(HBA_HANDLE handle, std::uint32_t index, HBA_PORTATTRIBUTES& out) const
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = adapterAt(handle);
    if (!adapter)
        return HBA_STATUS_ERROR_INVALID_HANDLE;
    if (index >= adapter->ports.size())
        return HBA_STATUS_ERROR_ILLEGAL_INDEX;
    if (adapter->stale)
        return HBA_STATUS_ERROR_STALE_DATA;
    describe(adapter->ports[index], out);
    return HBA_STATUS_OK;
}

HBA_STATUS SimulatedHost::targetMapping(HBA_HANDLE handle, std::vector<HBA_FCPSCSIENTRY>& out) const
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = adapterAt(handle);
    if (!adapter)
        return HBA_STATUS_ERROR_INVALID_HANDLE;
    if (adapter->stale)
        return HBA_STATUS_ERROR_STALE_DATA;
    for (const Port& port : adapter->ports)
    {
        if (port.state != HBA_PORTSTATE_ONLINE)
            continue;
        for (std::size_t number = 0; number < port.targets.size(); ++number)
        {
            const Target& target = _scenario.targets[port.targets[number]];
            const std::vector<std::string>& names = _osDeviceNames.at(port.wwpn)[number];
            for (std::size_t unit = 0; unit < target.units.size(); ++unit)
                out.push_back(mappingEntry(port, number, target, target.units[unit], names[unit]));
        }
    }
    return HBA_STATUS_OK;
}

HBA_STATUS SimulatedHost::scsi(HBA_HANDLE handle, Wwn target, HBA_UINT64 lun, const ScsiCommand& command,
                               ScsiReply& out)
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = adapterAt(handle);
    if (!adapter)
        return HBA_STATUS_ERROR_INVALID_HANDLE;
    for (const Port& port : adapter->ports)
        if (const std::optional<std::size_t> place = reach(port.state, port.targets, target))
        {
            out = execute(_scenario.targets[*place], lun, command);
            return out.status;
        }
    return HBA_STATUS_ERROR_ILLEGAL_WWN;
}

} // namespace tvrsim
