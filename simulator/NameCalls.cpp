// World Wide Names of the simulated ports, and boot code.
#include "simulator/SimulatedHost.h"

#include <algorithm>

namespace tvrsim
{

namespace
{

PortNames inForce(const Port& port)
{
    return {port.wwpn, port.wwnn};
}

PortNames configured(const Port& port)
{
    return port.names.volatileNames.value_or(*port.names.nonVolatile);
}

bool isWaiting(const Port& port)
{
    return configured(port) != inForce(port);
}

/// When the configured names come into force.
std::uint32_t activationOf(const Port& port)
{
    const NameManagement& names = port.names;
    if (names.activation)
        return *names.activation;
    const bool ofVolatile = names.volatileNames || names.volatileInForce;
    if (isWaiting(port) && (names.capability & RM_WWN_NEEDS_REBOOT))
        return ofVolatile ? RM_WWN_AT_REBOOT_VOLATILE_UNTIL : RM_WWN_AT_REBOOT;
    if (isWaiting(port) && (names.capability & RM_WWN_NEEDS_RESET))
        return ofVolatile ? RM_WWN_AT_RESET_VOLATILE_UNTIL : RM_WWN_AT_RESET;
    return RM_WWN_ACTIVE;
}

RM_STATUS fill(RM_WwnNames& out, const PortNames& names, RM_WwnKind kind)
{
    out.wwpn = toHba(names.wwpn);
    out.wwnn = toHba(names.wwnn);
    out.kind = kind;
    return RM_OK;
}

RM_STATUS fillWithout(RM_WwnNames& out, RM_WwnKind kind)
{
    out.kind = kind;
    return RM_OK;
}

/// Whether names of the kind can be changed; RM_OK or why not.
RM_STATUS changeable(const NameManagement& names, std::uint32_t type)
{
    if (!names.available)
        return RM_ERROR_WWN_NOT_AVAILABLE;
    if (type > RM_WWN_TYPE_NON_VOLATILE)
        return RM_ERROR;
    const std::uint32_t needed =
        type == RM_WWN_TYPE_VOLATILE ? RM_WWN_CAN_CHANGE_VOLATILE : RM_WWN_CAN_CHANGE_NON_VOLATILE;
    const bool can = (names.capability & needed) && !(names.capability & RM_WWN_READ_ONLY);
    return can ? RM_OK : RM_ERROR_WWN_NOT_SUPPORTED;
}

} // namespace

void SimulatedHost::completeNames()
{
    for (Adapter& adapter : _scenario.adapters)
        for (Port& port : adapter.ports)
        {
            NameManagement& names = port.names;
            names.factory = names.factory.value_or(inForce(port));
            names.nonVolatile = names.nonVolatile.value_or(inForce(port));
            names.volatileInForce = names.volatileNames == inForce(port);
            names.waitsFor = activationOf(port);
        }
}

bool SimulatedHost::isTaken(Wwn wwpn, const Port& except) const
{
    if (_targetByName.contains(wwpn))
        return true;
    for (const Adapter& adapter : _scenario.adapters)
        for (const Port& port : adapter.ports)
        {
            if (std::ranges::find(port.virtualPorts, wwpn, &VirtualPort::wwpn) != port.virtualPorts.end())
                return true;
            const NameManagement& names = port.names;
            if (&port != &except &&
                (port.wwpn == wwpn || names.factory->wwpn == wwpn || names.nonVolatile->wwpn == wwpn ||
                 (names.volatileNames && names.volatileNames->wwpn == wwpn)))
                return true;
        }
    return false;
}

bool SimulatedHost::activateNames(Adapter& adapter, Port& port)
{
    const PortNames before = inForce(port);
    const PortNames now = configured(port);
    port.names.volatileInForce = port.names.volatileNames.has_value();
    port.names.waitsFor = RM_WWN_ACTIVE;
    if (now == before)
        return false;
    port.wwpn = now.wwpn;
    port.wwnn = now.wwnn;
    if (adapter.nodeWwn == before.wwnn)
        adapter.nodeWwn = now.wwnn;
    if (auto devices = _osDeviceNames.extract(before.wwpn))
    {
        devices.key() = now.wwpn;
        _osDeviceNames.insert(std::move(devices));
    }
    return true;
}

void SimulatedHost::activateNames(Adapter& adapter, bool isReboot)
{
    bool changed = false;
    for (Port& port : adapter.ports)
    {
        const std::uint32_t moment = port.names.waitsFor;
        if (isReboot || moment == RM_WWN_AT_RESET || moment == RM_WWN_AT_RESET_VOLATILE_UNTIL)
            changed |= activateNames(adapter, port);
    }
    if (changed)
        index();
}

std::uint32_t SimulatedHost::settleNames(Adapter& adapter, Port& port)
{
    const std::uint32_t activation = activationOf(port);
    port.names.waitsFor = activation;
    if (activation == RM_WWN_ACTIVE && activateNames(adapter, port))
        index();
    return activation;
}

std::uint32_t SimulatedHost::localPortCount() const
{
    std::lock_guard lock(_mutex);
    std::uint32_t count = 0;
    for (const Adapter& adapter : _scenario.adapters)
        for (const Port& port : adapter.ports)
            count += port.listedTwice ? 2 : 1;
    return count;
}

RM_STATUS SimulatedHost::localPort(std::uint32_t index, RM_LocalHBAInfo& out) const
{
    std::lock_guard lock(_mutex);
    std::uint32_t handle = 0;
    std::uint32_t next = 0;
    for (const Adapter& adapter : _scenario.adapters)
    {
        ++handle;
        for (const Port& port : adapter.ports)
        {
            next += port.listedTwice ? 2 : 1;
            if (index >= next)
                continue;
            out.wwpn = toHba(port.wwpn);
            out.wwnn = toHba(port.wwnn);
            out.handle = handle;
            setText(out.model, adapter.model);
            setText(out.serialNumber, adapter.serialNumber);
            return RM_OK;
        }
    }
    return RM_ERROR;
}

RM_STATUS SimulatedHost::validateName(Wwn name) const
{
    constexpr std::uint64_t ieee = 1, extended = 2, registered = 5, firstMapped = 0xC;
    const std::uint64_t authority = name >> 60;
    const bool isKnown =
        authority == ieee || authority == extended || authority == registered || authority >= firstMapped;
    return isKnown ? RM_OK : RM_ERROR_INVALID_WWN;
}

RM_STATUS SimulatedHost::nameCapability(Wwn wwpn, std::uint32_t& out) const
{
    std::lock_guard lock(_mutex);
    const Port* port = findPort(wwpn);
    if (!port)
        return RM_ERROR_INVALID_WWN;
    out = port->names.capability;
    return port->names.available ? RM_OK : RM_ERROR_WWN_NOT_AVAILABLE;
}

RM_STATUS SimulatedHost::changeNames(Wwn wwpn, const PortNames& names, std::uint32_t type, std::uint32_t& activation)
{
    return changePort(wwpn,
                      [&](Adapter& adapter, Port& port) -> RM_STATUS
                      {
                          if (const RM_STATUS refused = changeable(port.names, type); refused != RM_OK)
                              return refused;
                          if (validateName(names.wwpn) != RM_OK || validateName(names.wwnn) != RM_OK)
                              return RM_ERROR_INVALID_WWN;
                          if (isTaken(names.wwpn, port))
                              return RM_ERROR_DUPLICATE_WWN;
                          (type == RM_WWN_TYPE_VOLATILE ? port.names.volatileNames : port.names.nonVolatile) = names;
                          activation = settleNames(adapter, port);
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::restoreNames(Wwn wwpn, std::uint32_t type, std::uint32_t& activation)
{
    return changePort(wwpn,
                      [&](Adapter& adapter, Port& port) -> RM_STATUS
                      {
                          constexpr std::uint32_t toFactory = 0;
                          if (!port.names.available)
                              return RM_ERROR_WWN_NOT_AVAILABLE;
                          if (port.names.capability & RM_WWN_READ_ONLY)
                              return RM_ERROR_WWN_NOT_SUPPORTED;
                          if (type > 1)
                              return RM_ERROR;
                          if (type == toFactory)
                              port.names.nonVolatile = port.names.factory;
                          port.names.volatileNames.reset();
                          activation = settleNames(adapter, port);
                          return RM_OK;
                      });
}

RM_STATUS SimulatedHost::readNames(Wwn wwpn, std::uint32_t type, RM_WwnNames& out) const
{
    std::lock_guard lock(_mutex);
    const Port* port = findPort(wwpn);
    if (!port)
        return RM_ERROR_INVALID_WWN;
    const NameManagement& names = port->names;
    if (!names.available)
        return RM_ERROR_WWN_NOT_AVAILABLE;
    const auto kindOf = [](bool isVolatile) { return isVolatile ? RM_WWN_KIND_VOLATILE : RM_WWN_KIND_NON_VOLATILE; };
    switch (type)
    {
    case RM_WWN_TYPE_VOLATILE:
        if (!(names.capability & RM_WWN_CAN_CHANGE_VOLATILE))
            return fillWithout(out, RM_WWN_KIND_NOT_SUPPORTED);
        return names.volatileNames ? fill(out, *names.volatileNames, RM_WWN_KIND_VOLATILE)
                                   : fillWithout(out, RM_WWN_KIND_NONE);
    case RM_WWN_TYPE_NON_VOLATILE:
        return fill(out, *names.nonVolatile, RM_WWN_KIND_NON_VOLATILE);
    case RM_WWN_TYPE_FACTORY:
        return fill(out, *names.factory, RM_WWN_KIND_NON_VOLATILE);
    case RM_WWN_TYPE_CURRENT:
        return fill(out, inForce(*port), kindOf(names.volatileInForce));
    case RM_WWN_TYPE_CONFIGURED:
        if (!isWaiting(*port))
            return fill(out, inForce(*port), RM_WWN_KIND_NONE);
        out.activation = names.waitsFor;
        return fill(out, configured(*port), kindOf(names.volatileNames.has_value()));
    default:
        return RM_ERROR;
    }
}

RM_STATUS SimulatedHost::setBootCode(Wwn wwpn, bool enabled)
{
    return changePort(wwpn,
                      [&](Adapter& adapter, Port&)
                      {
                          setAttribute(adapter.attributes, numberAttribute(RM_HA_BOOT_CODE_ENABLED, enabled));
                          return RM_OK;
                      });
}

void SimulatedHost::reboot(bool powerDown)
{
    std::lock_guard lock(_mutex);
    _tests.clear();
    for (Adapter& adapter : _scenario.adapters)
    {
        if (powerDown)
            for (Port& port : adapter.ports)
                port.names.volatileNames.reset();
        activateFirmware(adapter);
        activateNames(adapter, true);
    }
    loadDriver();
}

} // namespace tvrsim
