// The simulated host through the RM library.
#include "simulator/SimulatedHost.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

struct StatusRow
{
    RM_STATUS status;
    const char* text;
};

constexpr StatusRow statusTexts[] = {
    {RM_OK, "The operation succeeded"},
    {RM_ERROR, "The operation failed"},
    {RM_ERROR_NOT_SUPPORTED, "The operation is not supported"},
    {RM_ERROR_INVALID_WWN, "There is no port of this name"},
    {RM_ERROR_MORE_DATA, "The buffer is too small for the data"},
    {RM_ERROR_NO_MEMORY, "Out of memory"},
    {RM_ERROR_CHECK_CONDITION, "The SCSI command ended with a check condition"},
    {RM_ERROR_NO_SFP, "There is no transceiver in the port"},
    {RM_ERROR_DIRECTORY_NOT_OPENED, "The dump directory cannot be opened"},
    {RM_ERROR_TEST_RUNNING, "The test has not finished"},
    {RM_ERROR_TOO_MANY_TESTS, "Too many tests are waiting or running"},
    {RM_ERROR_DIAGNOSTICS_NOT_AVAILABLE, "Diagnostics are not available"},
    {RM_ERROR_ADAPTER_BUSY, "The adapter is busy with something else"},
    {RM_ERROR_WWN_NOT_SUPPORTED, "The WWN operation is not supported"},
    {RM_ERROR_DUPLICATE_WWN, "The WWN is in use"},
    {RM_ERROR_WWN_NOT_AVAILABLE, "WWN management is not available on this adapter"},
    {RM_ERROR_BUSY, "The adapter is busy"},
    {RM_ERROR_MAILBOX_FAILED, "The mailbox command failed"},
    {RM_ERROR_MAILBOX_TIMEOUT, "The mailbox command timed out"},
    {RM_ERROR_MAILBOX_BUSY, "The mailbox is busy"},
    {RM_ERROR_CONFIGURATION_NOT_READ, "The configuration file cannot be read"},
    {RM_ERROR_CONFIGURATION_NOT_OPENED, "The configuration file cannot be opened"},
    {RM_ERROR_PORT_NOT_SUPPORTED, "The port does not support the operation"},
    {RM_ERROR_BUFFER_TOO_SMALL, "The list is too small for the entries"},
    {RM_ERROR_DPORT_SWITCH, "The switch does not support the test of the link"},
    {RM_ERROR_NO_CABLE, "No cable connects the port to a switch"},
    {RM_ERROR_NO_RESET, "The firmware is written and waits for a restart of the host"},
    {notFirmware, "The file is no firmware"},
    {firmwareOfAnother, "The firmware is for another family of adapters"},
    {firmwareDamaged, "The firmware does not have its checksum"},
    {RM_ERROR_HARDWARE_LACKS, "The hardware does not have the function"},
    {RM_ERROR_FIRMWARE_LACKS, "The firmware does not have the function"},
    {RM_ERROR_PORT_DISABLED, "The port is disabled"},
};

/// What attributes follow from the members of the scenario, and over them those that it lists.
AttributeList withListed(AttributeList derived, const AttributeList& listed)
{
    for (const Attribute& attribute : listed)
        setAttribute(derived, attribute);
    return derived;
}

} // namespace

RM_STATUS SimulatedHost::statusText(RM_STATUS status, std::string& out) const
{
    const auto row = std::ranges::find(statusTexts, status, &StatusRow::status);
    if (row == std::end(statusTexts))
        return RM_ERROR;
    out = row->text;
    return RM_OK;
}

RM_STATUS SimulatedHost::libraryVersion(std::string& out) const
{
    std::lock_guard lock(_mutex);
    out = _scenario.libraryVersion;
    return RM_OK;
}

RM_STATUS SimulatedHost::miliVersion(std::string& out) const
{
    std::lock_guard lock(_mutex);
    out = _scenario.miliVersion;
    return RM_OK;
}

RM_STATUS SimulatedHost::isLocal(Wwn wwpn, std::uint32_t& out) const
{
    std::lock_guard lock(_mutex);
    out = findPort(wwpn) ? 1 : 0;
    return RM_OK;
}

template <class Use> RM_STATUS SimulatedHost::onAdapter(Wwn wwpn, Use use) const
{
    std::lock_guard lock(_mutex);
    const Adapter* adapter = findAdapter(wwpn);
    return adapter ? use(*adapter) : RM_ERROR_INVALID_WWN;
}

template <class Use> RM_STATUS SimulatedHost::onPort(Wwn wwpn, Use use) const
{
    std::lock_guard lock(_mutex);
    const Port* port = findPort(wwpn);
    return port ? use(*port) : RM_ERROR_INVALID_WWN;
}

template <class Use> RM_STATUS SimulatedHost::onVport(Wwn wwpn, Wwn vport, Use use) const
{
    return onPort(wwpn,
                  [&](const Port& port) -> RM_STATUS
                  {
                      const auto place = std::ranges::find(port.virtualPorts, vport, &VirtualPort::wwpn);
                      return place == port.virtualPorts.end() ? RM_ERROR_INVALID_WWN : use(port, *place);
                  });
}

RM_STATUS SimulatedHost::driverType(Wwn wwpn, std::uint32_t& out) const
{
    return onAdapter(wwpn,
                     [&](const Adapter& adapter)
                     {
                         out = adapter.driverType;
                         return RM_OK;
                     });
}

RM_STATUS SimulatedHost::feature(Wwn wwpn, std::uint32_t tag, std::uint32_t& out) const
{
    return onAdapter(wwpn,
                     [&](const Adapter& adapter)
                     {
                         const auto place = std::ranges::find(adapter.features, tag, &RM_Feature::tag);
                         out = place == adapter.features.end() ? 0 : place->value;
                         return RM_OK;
                     });
}

RM_STATUS SimulatedHost::features(Wwn wwpn, std::vector<RM_Feature>& out) const
{
    return onAdapter(wwpn,
                     [&](const Adapter& adapter)
                     {
                         out = adapter.features;
                         return RM_OK;
                     });
}

RM_STATUS SimulatedHost::qos(Wwn wwpn, RM_QosInfo& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      out = port.qos.value_or(RM_QosInfo{});
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::pciRegisters(Wwn wwpn, RM_PciRegisters& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      if (!port.pci)
                          return RM_ERROR_NOT_SUPPORTED;
                      out = *port.pci;
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::vpd(Wwn wwpn, RM_VpdArea& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      if (!port.vpd)
                          return RM_ERROR_NOT_SUPPORTED;
                      out = *port.vpd;
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::transceiver(Wwn wwpn, RM_SffData& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      if (!port.transceiver)
                          return RM_ERROR_NOT_SUPPORTED;
                      out = *port.transceiver;
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::flash(Wwn wwpn, RM_FlashList& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      if (port.flash.empty())
                          return RM_ERROR_NOT_SUPPORTED;
                      out.count = static_cast<std::uint32_t>(port.flash.size() + 1);
                      std::ranges::copy(port.flash, out.entry);
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::beacon(Wwn wwpn, std::uint32_t& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      if (!port.beacon)
                          return RM_ERROR_NOT_SUPPORTED;
                      out = *port.beacon;
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::setBeacon(Wwn wwpn, std::uint32_t state)
{
    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return RM_ERROR_INVALID_WWN;
    std::optional<std::uint32_t>& beacon = _scenario.adapters[place->second.adapter].ports[place->second.port].beacon;
    if (!beacon)
        return RM_ERROR_NOT_SUPPORTED;
    if (state != RM_BEACON_OFF && state != RM_BEACON_ON)
        return RM_ERROR;
    beacon = state;
    return RM_OK;
}

RM_STATUS SimulatedHost::hbaAttributes(Wwn wwpn, AttributeList& out) const
{
    return onAdapter(wwpn,
                     [&](const Adapter& adapter)
                     {
                         out = withListed({textAttribute(RM_HA_NODE_SYMBOLIC_NAME, adapter.nodeSymbolicName),
                                           textAttribute(RM_HA_OPTION_ROM_VERSION, adapter.optionRomVersion)},
                                          adapter.attributes);
                         return RM_OK;
                     });
}

RM_STATUS SimulatedHost::portAttributes(Wwn wwpn, AttributeList& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      const HBA_WWN fabric = toHba(port.fabricName);
                      out = withListed(
                          {numberAttribute(RM_PA_PORT_TYPE, port.type), numberAttribute(RM_PA_PORT_STATE, port.state),
                           Attribute{RM_PA_FABRIC_NAME, AttributeForm::bytes,
                                     std::string(reinterpret_cast<const char*>(fabric.wwn), sizeof fabric.wwn)}},
                          port.attributes);
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::portStatistics(Wwn wwpn, AttributeList& out)
{
    std::lock_guard lock(_mutex);
    const auto place = _portByName.find(wwpn);
    if (place == _portByName.end())
        return RM_ERROR_INVALID_WWN;
    Port& port = _scenario.adapters[place->second.adapter].ports[place->second.port];
    out = port.statistics;
    growCounters(port.statistics, port.growth);
    return RM_OK;
}

RM_STATUS SimulatedHost::serverAttributes(Wwn wwpn, AttributeList& out) const
{
    std::lock_guard lock(_mutex);
    if (!findPort(wwpn))
        return RM_ERROR_INVALID_WWN;
    out = _scenario.serverAttributes;
    return RM_OK;
}

RM_STATUS SimulatedHost::luns(Wwn wwpn, Wwn target, std::vector<RM_Lun>& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      const std::optional<std::size_t> place = reach(port.state, port.targets, target);
                      if (!place)
                          return RM_ERROR_INVALID_WWN;
                      for (const LogicalUnit& unit : _scenario.targets[*place].units)
                          out.push_back({encodeLun(unit.number), unit.number, unit.blocks ? unit.blockLength : 0});
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::scsi(Wwn wwpn, Wwn target, HBA_UINT64 lun, const ScsiCommand& command, ScsiReply& out)
{
    return onPort(wwpn,
                  [&](const Port& port) -> RM_STATUS
                  {
                      const std::optional<std::size_t> place = reach(port.state, port.targets, target);
                      if (!place)
                          return RM_ERROR_INVALID_WWN;
                      out = execute(_scenario.targets[*place], lun, command);
                      return static_cast<RM_STATUS>(out.status);
                  });
}

RM_STATUS SimulatedHost::vports(Wwn wwpn, std::vector<RM_VPortEntry>& out) const
{
    return onPort(wwpn,
                  [&](const Port& port)
                  {
                      for (const VirtualPort& vport : port.virtualPorts)
                          out.push_back({toHba(vport.wwpn), toHba(vport.wwnn), vport.fcId, vport.state});
                      return RM_OK;
                  });
}

RM_STATUS SimulatedHost::vportAttributes(Wwn wwpn, Wwn vport, RM_VPortAttributes& out) const
{
    return onVport(wwpn, vport,
                   [&](const Port&, const VirtualPort& found)
                   {
                       out.wwpn = toHba(found.wwpn);
                       out.wwnn = toHba(found.wwnn);
                       out.fabricName = toHba(found.fabricName);
                       out.fcId = found.fcId;
                       out.state = found.state;
                       out.targetCount = static_cast<std::uint32_t>(found.targets.size());
                       setText(out.symbolicName, found.symbolicName);
                       return RM_OK;
                   });
}

RM_STATUS SimulatedHost::vportTargets(Wwn wwpn, Wwn vport, std::vector<RM_VPortTarget>& out) const
{
    return onVport(wwpn, vport,
                   [&](const Port& port, const VirtualPort& found)
                   {
                       for (std::uint32_t number = 0; number < found.targets.size(); ++number)
                       {
                           const Target& target = _scenario.targets[found.targets[number]];
                           out.push_back({toHba(target.wwpn), toHba(target.wwnn), target.fcId, port.scsiBus, number});
                       }
                       return RM_OK;
                   });
}

RM_STATUS SimulatedHost::vportMachine(Wwn wwpn, Wwn vport, RM_VirtualMachine& out) const
{
    return onVport(wwpn, vport,
                   [&](const Port&, const VirtualPort& found)
                   {
                       if (!found.machine)
                           return RM_ERROR_NOT_SUPPORTED;
                       out = *found.machine;
                       return RM_OK;
                   });
}

RM_STATUS SimulatedHost::vportScsi(Wwn wwpn, Wwn vport, Wwn target, HBA_UINT64 lun, const ScsiCommand& command,
                                   ScsiReply& out)
{
    return onVport(wwpn, vport,
                   [&](const Port&, const VirtualPort& found) -> RM_STATUS
                   {
                       const std::optional<std::size_t> place = reach(found.state, found.targets, target);
                       if (!place)
                           return RM_ERROR_INVALID_WWN;
                       out = execute(_scenario.targets[*place], lun, command);
                       return static_cast<RM_STATUS>(out.status);
                   });
}

} // namespace tvrsim
